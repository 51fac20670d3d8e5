#include <iostream>

#include "ZonCloudReadNLSTool.h"
#include "ZonCloudTool.h"

ZonToolRun ZonToolAddInfo(CLI::App& app)
{
    auto* command = app.add_subcommand("info", "Summarise what a file holds");
    auto options = std::make_shared<ZonToolReaderOptions>();
    auto json = std::make_shared<bool>(false);
    options->AddTo(*command);
    command->add_flag("--json", *json, "Answer as JSON");
    return [options, json]() -> int {
        options->ApplyToSettings();
        std::string formatName;
        ZonICloudReadFile_var reader = options->CreateReader(formatName);
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_FormatNotImplemented");
    };
}
