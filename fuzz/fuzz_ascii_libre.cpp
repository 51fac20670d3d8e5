// Any byte string as a free ASCII file: the reader must answer or raise a
// catalog error, never crash, hang or allocate beyond what the file justifies.
// Each input is read twice: as a cloud in single precision, and with the
// delimiters "G08"/"G09", sampling and double precision.
#include <unistd.h>

#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>

#include "ZonCloudReadAsciiLibre.h"
#include "ZonError.h"

namespace {

constexpr std::size_t kMaxInput = 256 * 1024;

const std::string& TempPath()
{
    static const std::string path = [] {
        char pattern[] = "/tmp/zon-fuzz-ascii-XXXXXX";
        const int fd = mkstemp(pattern);
        if (fd < 0) std::abort();
        close(fd);
        std::atexit([] { std::remove(TempPath().c_str()); });
        return std::string(pattern);
    }();
    return path;
}

void Check(bool condition)
{
    if (!condition) __builtin_trap();
}

bool Inside(const double* p, const ZonMathBox& box)
{
    for (int axis = 0; axis < 3; ++axis) {
        if (std::isnan(p[axis])) continue;
        if (p[axis] < box.GetLow()[axis] || p[axis] > box.GetHigh()[axis]) return false;
    }
    return true;
}

void ReadOnce(const std::string& path, std::size_t size, bool scans)
{
    auto reader = std::make_shared<ZonCloudReadAsciiLibre>(ZonUnicodeString(path));
    if (scans) {
        reader->SetDoublePrecision(true);
        reader->SetDelimiters("G08", "G09");
    }
    const int type = reader->GetTypeOfDigitization();
    Check(type == 1 || type == 2);
    const int count = reader->GetNumberOfPoints();
    Check(count > 0);
    ZonMathBox box;
    reader->GetBoundingBox(box);
    Check(!box.IsEmpty());

    unsigned n = 0;
    const float* points = reader->GetPoints(n);
    Check(points && n == static_cast<unsigned>(count));
    unsigned nd = 0;
    const double* doubles = reader->GetPointsDouble(nd);
    Check(doubles && nd == n);
    for (unsigned i = 0; i < n; ++i) {
        Check(Inside(doubles + 3 * i, box));
        for (int axis = 0; axis < 3; ++axis) {
            const float expected = static_cast<float>(doubles[3 * i + axis]);
            Check(points[3 * i + axis] == expected || (std::isnan(expected) && std::isnan(points[3 * i + axis])));
        }
    }
    // The file's own box gives the full array back (when its corners are
    // finite: an infinite corner is at no distance 0 from itself).
    bool finite = true;
    for (int axis = 0; axis < 3; ++axis)
        finite = finite && std::isfinite(box.GetLow()[axis]) && std::isfinite(box.GetHigh()[axis]);
    unsigned inBox = 0;
    const float* clipped = reader->GetPointsInBox(box, inBox);
    Check(!finite || (clipped == points && inBox == n));

    reader->SetSamplingPercent(50.0f);
    reader->GetPoints(n);
    Check(n <= static_cast<unsigned>(count));

    if (type == 2) {
        unsigned total = 0;
        reader->BeginGetSetOfScans();
        while (reader->NextSetOfScans()) {
            reader->BeginGetScan();
            for (int guard = 0; reader->NextScan(); ++guard) {
                // Empty scans between delimiter lines are scans too: bounded by the lines.
                Check(static_cast<std::size_t>(guard) <= size + 1);
                unsigned m = 0;
                reader->GetScanPoints(m);
                unsigned md = 0;
                reader->GetScanPointsDouble(md);
                Check(m == md);
                total += m;
                reader->GetScanPointsInBox(box, m);
            }
        }
        Check(total <= static_cast<unsigned>(count));
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size > kMaxInput) return 0;
    const std::string& path = TempPath();
    FILE* file = std::fopen(path.c_str(), "wb");
    if (!file) std::abort();
    if (size > 0 && std::fwrite(data, 1, size, file) != size) std::abort();
    std::fclose(file);
    for (const bool scans : {false, true}) {
        try {
            ReadOnce(path, size, scans);
        } catch (const ZonError&) {
            // A clear catalog error is a fine answer to a broken file.
        }
    }
    return 0;
}
