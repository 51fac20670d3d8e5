#pragma once
#include <memory>

#include "ZonCldExport.h"
#include "ZonHResult.h"
#include "ZonUnicodeString.h"

// Every writer: the target file, and the multi-part mode in which several
// pieces (clouds, scans) go into one file opened once.
class ZON_CLD_API ZonICloudWriteFile {
public:
    virtual ~ZonICloudWriteFile();
    virtual void GetFileName(ZonUnicodeString& name) = 0;
    // Format-specific settings as a list of texts (the user-format writer's
    // layout, for instance); writers without settings ignore them.
    virtual void SetWriteSettings(const ZonListValZonString& settings) = 0;
    virtual void GetWriteSettings(ZonListValZonString& settings) = 0;
    // Opens the file for several pieces; ZON_E_FAIL when it cannot be created.
    virtual ZonHResult BeginMultiWrite() = 0;
    // Completes and closes the multi-part file.
    virtual ZonHResult EndMultiWrite() = 0;
    // Binary writers: write numbers byte-reversed (the other byte order).
    virtual void SetReverseByteOrder(bool reversed) = 0;
};
using ZonICloudWriteFile_var = std::shared_ptr<ZonICloudWriteFile>;
