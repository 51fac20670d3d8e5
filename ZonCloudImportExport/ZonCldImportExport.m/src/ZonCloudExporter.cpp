#include "ZonCloudExporter.h"

#include "ZonCldImportServices.h"
#include "ZonCloudReadNLSTool.h"

std::vector<std::string> ZonCloudExporter::GetExtensions() const
{
    std::vector<std::string> extensions;
    const std::string filter = _description.fileFilter;
    for (std::size_t at = 0; at <= filter.size();) {
        std::size_t end = filter.find(';', at);
        if (end == std::string::npos) end = filter.size();
        const std::string pattern = filter.substr(at, end - at);
        if (pattern.size() > 1 && pattern[0] == '*') extensions.push_back(pattern.substr(1));
        at = end + 1;
    }
    return extensions;
}

std::vector<ZonCloudExporter_var> ZonCloudExporter::GetAll()
{
    std::vector<ZonCloudExporter_var> exporters;
    if (!ZonObjectRegistry::IsInterfaceKnown(InterfaceName)) return exporters;
    for (const std::string& className : ZonObjectRegistry::ListImplementations(InterfaceName))
        if (auto exporter = ZonQueryInterface<ZonCloudExporter>(ZonObjectRegistry::CreateByLateType(className)))
            exporters.push_back(std::move(exporter));
    return exporters;
}

ZonCloudExporter_var ZonCloudExporter::ForFile(const ZonUnicodeString& fileName)
{
    const std::string extension = ZonCldImportServices::ExtensionOf(fileName).ToUtf8();
    if (!extension.empty())
        for (auto& exporter : GetAll())
            for (const std::string& candidate : exporter->GetExtensions())
                if (candidate == extension) return exporter;
    std::string known;
    for (auto& exporter : GetAll())
        for (const std::string& candidate : exporter->GetExtensions()) known += (known.empty() ? "" : " ") + candidate;
    ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_UnknownExtension", {known});
}
