#pragma once
#include <map>
#include <memory>
#include <string>

#include "ZonHResult.h"
#include "ZonHostExport.h"
#include "ZonIExchInputDocument.h"
#include "ZonUnicodeString.h"

// An exporter of the data-exchange framework, registered under its exporter
// name ("STLExporter", ...): writes a document to a file with the export
// parameters its option control gathered (name to value).
class ZON_HOST_API ZonIExchExporter {
public:
    static constexpr const char* InterfaceName = "ZonIExchExporter";
    using Parameters = std::map<std::string, std::string>;

    virtual ~ZonIExchExporter();
    virtual ZonHResult Export(const ZonIExchInputDocument_var& document, const ZonUnicodeString& fileName,
                              const Parameters& parameters) = 0;
};
using ZonIExchExporter_var = std::shared_ptr<ZonIExchExporter>;
