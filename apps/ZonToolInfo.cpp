// zoncloud info: imports a file as the host would and summarises the body.
#include <iostream>

#include "ZonCldBody.h"
#include "ZonCldImportServices.h"
#include "ZonCloudTool.h"
#include "ZonGeoFactoryProtected.h"

namespace {
const char* TypeName(int type)
{
    switch (type) {
        case DigitizationCloud: return "cloud";
        case DigitizationScans: return "scans";
        case DigitizationGrids: return "grids";
        case DigitizationPolygons: return "polygons";
        default: return "unknown";
    }
}

}  // namespace

ZonToolRun ZonToolAddInfo(CLI::App& app)
{
    auto* command = app.add_subcommand("info", "Import a file as the host would and summarise what it holds");
    auto options = std::make_shared<ZonToolReaderOptions>();
    auto json = std::make_shared<bool>(false);
    options->AddTo(*command);
    command->add_flag("--json", *json, "Answer as JSON");
    return [options, json]() -> int {
        options->ApplyToSettings();
        ZonGeoFactoryProtected geometry;
        std::vector<ZonString> messages;
        const std::shared_ptr<ZonCldBody> body = options->Import(geometry, messages);
        // The statistics text comes last; anything before it is a note of the import.
        const std::string statistics = messages.empty() ? std::string() : messages.back();
        if (!messages.empty()) messages.pop_back();

        nlohmann::json summary = {
            {"file", options->file},
            {"format", options->FormatName()},
            {"type", body->GetTypeOfDigitization()},
            {"points", body->GetNumberOfPoints()},
            {"sets", body->GetSetsOfScans().size()},
            {"scans", body->GetNumberOfScans()},
            {"grids", body->GetNumberOfGrids()},
            {"rows", body->GetNumberOfGridRows()},
            {"valid", body->GetNumberOfValidGridNodes()},
            {"polygons", body->GetPolygons().size()},
            {"triangles", body->GetNumberOfTriangles()},
            {"bbox", ZonToolBoxJson(body->GetBox())},
            {"unit", body->GetUnitName()},
            {"messages", messages},
            {"statistics", statistics},
        };
        if (*json) {
            std::cout << summary.dump(2, ' ', false, nlohmann::json::error_handler_t::replace) << "\n";
            return 0;
        }
        std::cout << "file:      " << options->file << "\n"
                  << "format:    " << summary["format"].get<std::string>() << "\n"
                  << "type:      " << body->GetTypeOfDigitization() << " ("
                  << TypeName(body->GetTypeOfDigitization()) << ")\n"
                  << "points:    " << body->GetNumberOfPoints() << "\n"
                  << "sets:      " << body->GetSetsOfScans().size() << "\n"
                  << "scans:     " << body->GetNumberOfScans() << "\n"
                  << "grids:     " << body->GetNumberOfGrids() << " (" << body->GetNumberOfGridRows() << " rows, "
                  << body->GetNumberOfValidGridNodes() << " valid nodes)\n"
                  << "polygons:  " << body->GetPolygons().size() << "\n"
                  << "triangles: " << body->GetNumberOfTriangles() << "\n"
                  << "bbox:      " << summary["bbox"].dump() << "\n"
                  << "unit:      " << body->GetUnitName() << "\n";
        for (const ZonString& message : messages) std::cout << message << "\n";
        std::cout << "\n" << statistics;
        return 0;
    };
}
