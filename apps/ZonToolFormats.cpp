#include <iostream>

#include "ZonCldImporter.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudTool.h"

ZonToolRun ZonToolAddFormats(CLI::App& app)
{
    auto* command = app.add_subcommand("formats", "List the formats that can be read");
    auto json = std::make_shared<bool>(false);
    command->add_flag("--json", *json, "Answer as JSON");
    return [json] {
        ZonListValZonUnicodeString names;
        ZonListValZonString filters;
        ZonCldImporter::GetAvailableFormats(names, filters, true);
        nlohmann::json list = nlohmann::json::array();
        for (std::size_t i = 0; i < names.size(); ++i) {
            const auto factory = ZonCldImporter::GetFactory(names[i]);
            const char* registry = factory ? factory->GetRegistryName() : "";
            list.push_back({{"name", names[i].ToUtf8()},
                            {"display", ZonCloudReadNLSTool::NameOfFormat(registry).ToUtf8()},
                            {"registry", registry},
                            {"filter", filters[i]},
                            {"sampling", ZonCldImporter::IsFormatWithSampling(names[i])},
                            {"unit", ZonCldImporter::IsFormatWithLengthUnit(names[i])},
                            {"options", ZonCldImporter::IsFormatWithOptions(names[i])}});
        }
        if (*json) {
            std::cout << list.dump(2) << "\n";
        } else {
            for (const auto& format : list)
                std::printf("%-20s %-24s %s\n", format["name"].get<std::string>().c_str(),
                            format["display"].get<std::string>().c_str(), format["filter"].get<std::string>().c_str());
        }
        return 0;
    };
}
