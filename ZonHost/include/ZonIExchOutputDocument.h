#pragma once
#include <memory>

#include "ZonHResult.h"
#include "ZonHostExport.h"
#include "ZonIExchInputDocument.h"
#include "ZonUnicodeString.h"

// A format's output document, driven in this order: file name, options,
// open, write, close, release. Failures of the steps come back as results;
// errors met while writing are raised.
class ZON_HOST_API ZonIExchOutputDocument {
public:
    static constexpr const char* InterfaceName = "ZonIExchOutputDocument";

    virtual ~ZonIExchOutputDocument();
    virtual ZonHResult SetFileName(const ZonUnicodeString& fileName) = 0;
    virtual ZonHResult SetOptions(const ZonListValZonString& names, const ZonListValZonString& values) = 0;
    virtual ZonHResult Open() = 0;
    virtual ZonHResult Write(const ZonIExchInputDocument_var& document) = 0;
    virtual ZonHResult Close() = 0;
    // Reports the outcome of the export to the session's reporter.
    virtual ZonHResult Release() = 0;
};
using ZonIExchOutputDocument_var = std::shared_ptr<ZonIExchOutputDocument>;
