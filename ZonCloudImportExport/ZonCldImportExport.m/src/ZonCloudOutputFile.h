#pragma once
#include <cstdarg>
#include <cstddef>
#include <cstdio>

#include "ZonCldExport.h"
#include "ZonUnicodeString.h"

// The file a writer or an output document writes. Every print, write, read
// back, seek and the close is checked: a full disk or a file-size limit
// often shows only when a buffer is flushed, so the close counts as much as
// any line. The first failure closes the stream, removes the half-written
// file and raises the system's error (type 3, key from errno), so that no
// caller can take a truncated file for a good one.
class ZON_CLD_API ZonCloudOutputFile {
public:
    ZonCloudOutputFile() = default;
    // A stream still open is closed here; nothing can be raised from a
    // destructor, so a close that fails only removes the file.
    ~ZonCloudOutputFile();
    ZonCloudOutputFile(const ZonCloudOutputFile&) = delete;
    ZonCloudOutputFile& operator=(const ZonCloudOutputFile&) = delete;

    // Closes the stream in use (checked) and opens name with mode: false,
    // errno telling why, when it cannot be opened or has no name.
    bool Open(const ZonUnicodeString& name, const char* mode);
    bool IsOpen() const { return _stream != nullptr; }
    // From a failure until the next Open: the file is gone.
    bool HasFailed() const { return _failed; }

    // printf with '.' as decimal point whatever the locale.
    void Print(const char* format, ...) __attribute__((format(printf, 2, 3)));
    void PrintV(const char* format, std::va_list args);
    void Write(const void* data, std::size_t size);
    void Read(void* data, std::size_t size);
    void Seek(long offset, int whence);
    long Tell();
    // Hands what is buffered to the system, so its refusal shows now.
    void Flush();
    // Flushes and closes; nothing to do when no stream is open.
    void Close();

private:
    [[noreturn]] void Fail();

    std::FILE* _stream = nullptr;
    ZonUnicodeString _name;
    bool _failed = false;
};
