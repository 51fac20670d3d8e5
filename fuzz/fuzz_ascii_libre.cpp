// Any byte string as a free ASCII file: the reader must answer or raise a
// catalog error, never crash, hang or allocate beyond what the file justifies.
// Each input is read twice: as a cloud in single precision, and with the
// delimiters "G08"/"G09", sampling and double precision.
#include <cmath>
#include <cstdint>
#include <memory>

#include "ZonCloudReadAsciiLibre.h"
#include "ZonError.h"

namespace {

void Check(bool condition) { if (!condition) __builtin_trap(); }

void ReadOnce(const std::uint8_t* data, std::size_t size, bool scans)
{
    auto reader = std::make_shared<ZonCloudReadAsciiLibre>(ZonUnicodeString("fuzz.asc"));
    reader->SetSourceMemory(data, size);
    reader->SetDoublePrecision(scans);
    if (scans) reader->SetDelimiters("G08", "G09");
    const int type = reader->GetTypeOfDigitization();
    const unsigned count = static_cast<unsigned>(reader->GetNumberOfPoints());
    ZonMathBox box;
    reader->GetBoundingBox(box);
    Check((type == DigitizationCloud || type == DigitizationScans) && count > 0 && !box.IsEmpty());

    unsigned n = 0, nd = 0;
    const float* points = reader->GetPoints(n);
    const double* doubles = reader->GetPointsDouble(nd);
    Check(points && doubles && n == count && nd == n);
    bool finite = true;
    for (unsigned i = 0; i < 3 * n; ++i) {
        // Every float is its double rounded, and inside the box (NaN is nowhere).
        const double v = doubles[i], low = box.GetLow()[i % 3], high = box.GetHigh()[i % 3];
        Check(std::isnan(v) ? std::isnan(points[i]) : points[i] == static_cast<float>(v) && low <= v && v <= high);
        finite = finite && std::isfinite(low) && std::isfinite(high);
    }
    // The file's own box gives the full array back (when its corners are
    // finite: an infinite corner is at no distance 0 from itself).
    unsigned inBox = 0;
    const float* clipped = reader->GetPointsInBox(box, inBox);
    Check(!finite || (clipped == points && inBox == n));

    reader->SetSamplingPercent(50.0f);
    reader->GetPoints(n);
    Check(n <= count);
    if (type != DigitizationScans) return;
    unsigned total = 0;
    reader->BeginGetSetOfScans();
    while (reader->NextSetOfScans()) {
        reader->BeginGetScan();
        // Empty scans between delimiter lines are scans too: bounded by the lines.
        for (std::size_t scan = 0; reader->NextScan(); ++scan) {
            unsigned m = 0, md = 0;
            reader->GetScanPoints(m);
            reader->GetScanPointsDouble(md);
            Check(scan <= size + 1 && m == md);
            total += m;
            reader->GetScanPointsInBox(box, m);
        }
    }
    Check(total <= count);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size > 256 * 1024) return 0;
    for (const bool scans : {false, true}) {
        try {
            ReadOnce(data, size, scans);
        } catch (const ZonError&) {
            // A clear catalog error is a fine answer to a broken file.
        }
    }
    return 0;
}
