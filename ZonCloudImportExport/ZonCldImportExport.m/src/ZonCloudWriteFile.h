#pragma once
#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonCloudOutputFile.h"
#include "ZonICloudWriteFile.h"

// Base of every writer: the file name, the output file it owns (closed by
// the destructor at the latest), the multi-part flag and the byte order of
// binary output. Text goes through Print, which writes '.' as decimal point
// whatever the process locale, so files read back everywhere. Every write
// and the close are checked: a failure removes the file and raises the
// system's error (see ZonCloudOutputFile).
class ZON_CLD_API ZonCloudWriteFile : public ZonBaseUnknown, public ZonICloudWriteFile {
public:
    explicit ZonCloudWriteFile(const ZonUnicodeString& fileName);
    ~ZonCloudWriteFile() override = default;
    ZonCloudWriteFile(const ZonCloudWriteFile&) = delete;
    ZonCloudWriteFile& operator=(const ZonCloudWriteFile&) = delete;

    // ZonICloudWriteFile
    void GetFileName(ZonUnicodeString& name) override;
    void SetWriteSettings(const ZonListValZonString&) override {}
    void GetWriteSettings(ZonListValZonString&) override {}
    // By default a multi-part file is simply kept open between the pieces;
    // writers whose headers carry totals complete them in EndMultiWrite. A
    // file that cannot be completed raises rather than returning a failure,
    // as any other write does.
    ZonHResult BeginMultiWrite() override;
    ZonHResult EndMultiWrite() override;
    void SetReverseByteOrder(bool reversed) override { _reverseBytes = reversed; }

    bool IsMultiWrite() const { return _multiWrite; }
    bool IsReverseByteOrder() const { return _reverseBytes; }

protected:
    // Closes any open stream and opens the file with mode; a failure raises
    // type 3 with the errno message.
    void OpenStream(const char* mode);
    // The same without raising: false when the file cannot be opened.
    bool TryOpenStream(const char* mode);
    void CloseStream() { _file.Close(); }

    // fprintf to the file with '.' as decimal point.
    void Print(const char* format, ...) __attribute__((format(printf, 2, 3)));

    ZonUnicodeString _fileName;
    ZonCloudOutputFile _file;
    bool _multiWrite = false;
    bool _reverseBytes = false;
};
