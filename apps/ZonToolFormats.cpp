#include <iostream>

#include "ZonCldImporter.h"
#include "ZonCloudExporter.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudTool.h"

namespace {

// The body parts a writer holds, by name.
nlohmann::json AcceptedParts(unsigned accepts)
{
    nlohmann::json parts = nlohmann::json::array();
    const std::pair<unsigned, const char*> kinds[] = {{ZonCloudExporter::Clouds, "clouds"},
                                                      {ZonCloudExporter::Scans, "scans"},
                                                      {ZonCloudExporter::Grids, "grids"},
                                                      {ZonCloudExporter::Meshes, "meshes"}};
    for (const auto& [bit, name] : kinds)
        if (accepts & bit) parts.push_back(name);
    return parts;
}

std::string Joined(const nlohmann::json& list, const char* separator)
{
    std::string text;
    for (const auto& item : list) text += (text.empty() ? "" : separator) + item.get<std::string>();
    return text;
}

}  // namespace

ZonToolRun ZonToolAddFormats(CLI::App& app)
{
    auto* command = app.add_subcommand("formats", "List the formats that can be read and those that can be written");
    auto json = std::make_shared<bool>(false);
    command->add_flag("--json", *json, "Answer as JSON");
    return [json] {
        ZonListValZonUnicodeString names;
        ZonListValZonString filters;
        ZonCldImporter::GetAvailableFormats(names, filters, true);
        nlohmann::json readers = nlohmann::json::array();
        for (std::size_t i = 0; i < names.size(); ++i) {
            const auto factory = ZonCldImporter::GetFactory(names[i]);
            const char* registry = factory ? factory->GetRegistryName() : "";
            readers.push_back({{"name", names[i].ToUtf8()},
                               {"display", ZonCloudReadNLSTool::NameOfFormat(registry).ToUtf8()},
                               {"registry", registry},
                               {"filter", filters[i]},
                               {"sampling", ZonCldImporter::IsFormatWithSampling(names[i])},
                               {"unit", ZonCldImporter::IsFormatWithLengthUnit(names[i])},
                               {"options", ZonCldImporter::IsFormatWithOptions(names[i])}});
        }
        nlohmann::json writers = nlohmann::json::array();
        for (const auto& exporter : ZonCloudExporter::GetAll())
            writers.push_back({{"extensions", exporter->GetExtensions()},
                               {"display", ZonCloudReadNLSTool::NameOfFormat(exporter->GetRegistryName()).ToUtf8()},
                               {"registry", exporter->GetRegistryName()},
                               {"accepts", AcceptedParts(exporter->GetAccepts())}});
        if (*json) {
            std::cout << nlohmann::json{{"readers", readers}, {"writers", writers}}.dump(2) << "\n";
            return 0;
        }
        std::cout << "Read:\n";
        for (const auto& format : readers)
            std::printf("  %-20s %-24s %s\n", format["name"].get<std::string>().c_str(),
                        format["display"].get<std::string>().c_str(), format["filter"].get<std::string>().c_str());
        std::cout << "Written (by the extension of the file to write):\n";
        for (const auto& format : writers)
            std::printf("  %-20s %-24s %s\n", Joined(format["extensions"], " ").c_str(),
                        format["display"].get<std::string>().c_str(), Joined(format["accepts"], ", ").c_str());
        return 0;
    };
}
