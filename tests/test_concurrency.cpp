// Imports of every format side by side: one fixture per reader imported on
// four threads at once, again and again, each result the same as the
// one-thread import. Readers share no state; the host's registry, catalogs
// and settings are read from every thread.
#include <gtest/gtest.h>

#include <cstring>
#include <map>
#include <sstream>
#include <thread>

#include "ZonCldBody.h"
#include "ZonCldImportServices.h"
#include "ZonCldScan.h"
#include "ZonCldSetOfScans.h"
#include "ZonGeoFactoryProtected.h"
#include "ZonReaderFixtures.h"

namespace {

// Counts, box, statistics and every coordinate's bits: equal summaries mean equal bodies.
std::string Summary(const std::string& path)
{
    ZonGeoFactoryProtected geometry;
    const ZonMathTransformation placement;
    ZonMathTransformation inverse;
    ZonMathBox box;
    std::vector<ZonString> messages;
    std::shared_ptr<ZonCldBody> body;
    try {
        body = ZonCldImportServices::BuildCldBodyFromFile(geometry, ZonUnicodeString(path), placement, inverse, box,
                                                          messages);
    } catch (const ZonError& error) {
        return "error " + error.GetMessageKey();
    }
    std::ostringstream text;
    text << body->GetTypeOfDigitization() << " " << body->GetNumberOfPoints() << " " << body->GetNumberOfScans() << " "
         << body->GetNumberOfGridRows() << " " << body->GetNumberOfValidGridNodes() << " "
         << body->GetNumberOfTriangles() << "\n";
    std::uint64_t hash = 1469598103934665603ull;
    const auto add = [&](const ZonCldPointArray& points) {
        for (std::size_t i = 0; i < points.GetNumberOfPoints(); ++i) {
            const ZonMathPoint p = points.GetPoint(i);
            for (int axis = 0; axis < 3; ++axis) {
                std::uint64_t bits;
                const double v = p[axis];
                std::memcpy(&bits, &v, sizeof bits);
                hash = (hash ^ bits) * 1099511628211ull;
            }
        }
    };
    for (const auto& cloud : body->GetClouds()) add(cloud->Points());
    for (const auto& set : body->GetSetsOfScans())
        for (const auto& scan : set->GetScans()) add(scan->Points());
    for (const auto& polygon : body->GetPolygons()) add(polygon->Vertices());
    text << hash << "\n";
    for (const ZonString& message : messages) text << message << "\n";
    return text.str();
}

class Concurrency : public zontest::FilesTest {};

TEST_F(Concurrency, EveryFormatOnFourThreadsGivesTheOneThreadResult)
{
    zontest::WriteUserFormatDescription(Path("columns.fdf"));
    std::vector<std::string> files;
    std::map<std::string, std::string> expected;
    for (const auto& fixture : zontest::EveryReaderFixture()) {
        // A build of some readers only (the thread-sanitizer build) runs the rows it has.
        if (ZonCldImportServices::FormatsOfFile(ZonUnicodeString(fixture.fileName)).empty()) continue;
        const std::string path = Write(fixture.fileName, fixture.bytes());
        const std::string summary = Summary(path);
        ASSERT_NE(summary.rfind("error", 0), 0u) << fixture.reader << ": " << summary;
        files.push_back(path);
        expected[path] = summary;
    }

    ASSERT_FALSE(files.empty());
    constexpr int Threads = 4, Rounds = 8;
    std::vector<std::vector<std::string>> differences(Threads);
    std::vector<std::thread> threads;
    for (int t = 0; t < Threads; ++t)
        threads.emplace_back([&, t] {
            for (int round = 0; round < Rounds; ++round)
                // Each thread starts at another file, so different readers overlap.
                for (std::size_t i = 0; i < files.size(); ++i) {
                    const std::string& path = files[(i + static_cast<std::size_t>(t) * 3) % files.size()];
                    const std::string summary = Summary(path);
                    if (summary != expected.at(path)) differences[t].push_back(path + ":\n" + summary);
                }
        });
    for (auto& thread : threads) thread.join();
    for (int t = 0; t < Threads; ++t)
        for (const auto& difference : differences[t]) ADD_FAILURE() << "thread " << t << ", " << difference;
}

}  // namespace
