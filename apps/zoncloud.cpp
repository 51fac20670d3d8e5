// zoncloud: reads, inspects and converts point-cloud and mesh files with the module.
#include <cstdio>
#include <iostream>
#include <map>

#include "ZonCloudTool.h"
#include "ZonIReporter.h"

int main(int argc, char** argv)
{
    CLI::App app{"zoncloud: point-cloud and mesh files read, inspected and converted"};
    app.set_version_flag("--version", std::string("zoncloud ") + ZON_VERSION);
    app.require_subcommand(1);
    std::map<CLI::App*, ZonToolRun> runs;
    auto add = [&](ZonToolRun run) { runs[app.get_subcommands({}).back()] = std::move(run); };
    add(ZonToolAddFormats(app));
    add(ZonToolAddInfo(app));
    add(ZonToolAddDump(app));
    add(ZonToolAddConvert(app));

    try {
        app.parse(argc, argv);
    } catch (const CLI::CallForHelp& e) {
        return app.exit(e);
    } catch (const CLI::CallForAllHelp& e) {
        return app.exit(e);
    } catch (const CLI::CallForVersion& e) {
        return app.exit(e);
    } catch (const CLI::ParseError& e) {
        app.exit(e);
        return 2;  // usage errors
    }

    for (auto& [command, run] : runs) {
        if (!command->parsed()) continue;
        try {
            return run();
        } catch (const ZonError& error) {
            // The command says whether it reports as JSON; otherwise the host reporter shows it.
            if (command->get_option_no_throw("--json") && command->get_option("--json")->as<bool>()) {
                std::cout << nlohmann::json{{"error", ZonToolErrorJson(error)}}.dump() << "\n";
            } else {
                ZonStderrReporter().Report(error);
            }
            return 1;
        }
    }
    return 2;
}
