#include <iostream>

#include "ZonCloudReadNLSTool.h"
#include "ZonCloudTool.h"

ZonToolRun ZonToolAddConvert(CLI::App& app)
{
    auto* command = app.add_subcommand("convert", "Read a file and write it in another format");
    auto options = std::make_shared<ZonToolReaderOptions>();
    auto output = std::make_shared<std::string>();
    options->AddTo(*command);
    command->add_option("OUT", *output, "File to write")->required();
    return [options]() -> int {
        options->ApplyToSettings();
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_FormatNotImplemented");
    };
}
