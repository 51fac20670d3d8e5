#include "ZonCloudReadDicom.h"

#include <algorithm>
#include <cfloat>
#include <climits>
#include <cmath>
#include <mutex>

#include "ZonCloudSampler.h"
#include "ZonCloudWorkerPool.h"
#include "ZonZipReader.h"

namespace {

using Tool = ZonCloudReadNLSTool;

constexpr const char* DensityLabel = "Density = ";

// A double as the integer a C cast would give, for values that fit; others
// (from absurd windows) give 0 rather than undefined behaviour.
std::int64_t Truncate(double value)
{
    if (!(value > -9.0e18 && value < 9.0e18)) return 0;
    return static_cast<std::int64_t>(value);
}

// A coordinate as a float; beyond the float range it becomes infinite, as a
// conversion may not be left to do.
float ToFloat(double value)
{
    if (std::fabs(value) > static_cast<double>(FLT_MAX) && std::isfinite(value))
        return value > 0 ? INFINITY : -INFINITY;
    return static_cast<float>(value);
}

bool NameIsArchive(const ZonUnicodeString& name)
{
    return name.ToLower().ToUtf8().find(".dcz") != std::string::npos;
}

}  // namespace

ZonCloudReadDicom::ZonCloudReadDicom(const ZonUnicodeString& fileName) : ZonCloudReadFile(fileName)
{
    _digitizationType = DigitizationCloud;
}

ZonCloudReadDicom::~ZonCloudReadDicom() = default;

unsigned char ZonCloudReadDicom::Grey(const ZonCloudDicomSlice& slice, std::int32_t raw, std::int32_t least,
                                      std::int32_t greatest)
{
    if (!slice.HasWindow()) {
        if (greatest == least) return 0;
        const double grey = (static_cast<double>(raw) - least) * 255.0 / (static_cast<double>(greatest) - least);
        return static_cast<unsigned char>(Truncate(grey));
    }
    const double lo = slice.windowCentre - slice.windowWidth / 2.0;
    const double hi = slice.windowCentre + slice.windowWidth / 2.0;
    double d = static_cast<double>(Truncate(static_cast<double>(raw) * slice.slope + slice.intercept));
    d = std::max(d, lo);
    d = std::min(d, hi);
    const double offset = lo < 0.0 ? -lo : 0.0;
    // Stored as a cast stores it: a grey above 255 keeps its low 8 bits.
    return static_cast<unsigned char>(static_cast<std::uint64_t>(Truncate((d + offset) / ((hi - lo) / 255.0))));
}

void ZonCloudReadDicom::AnalyseFile()
{
    _points.clear();
    _colors.clear();
    _densities.clear();
    _texts.clear();
    _textsMade = false;
    _slices.clear();
    _sliceCount = 0;
    _numberOfPoints = 0;
    _boundingBox.SetToEmpty();
    Guarded([this] {
        if (NameIsArchive(_fileName))
            ReadArchive();
        else
            ReadSingle();
        BuildCloud();
    });
}

void ZonCloudReadDicom::ReadSingle()
{
    ZonCloudDicomSlice slice;
    if (!slice.Read(Source())) Tool::Raise(Tool::Data, "ERR_DicomNoMarker");
    CloseSource();
    _slices.push_back(std::move(slice));
}

void ZonCloudReadDicom::ReadArchive()
{
    // Opening the source first gives a missing or unreadable archive the system's own error.
    ZonCloudByteSource& source = Source();
    const bool inMemory = source.IsMemory();
    CloseSource();
    const ZonZipReader archive = inMemory ? ZonZipReader(_memory, _memorySize) : ZonZipReader(_fileName.ToUtf8());

    struct Stacked {
        std::size_t member;
        ZonCloudDicomSlice slice;
    };
    std::vector<Stacked> stacked;
    std::uint64_t inflated = 0;
    for (const ZonZipReader::Member& member : archive.Members()) {
        if (member.isDirectory) continue;
        std::vector<unsigned char> bytes = archive.Extract(member, ArchiveLimit - inflated);
        inflated += bytes.size();
        ZonCloudByteSource memberSource;
        memberSource.OpenMemory(bytes.data(), bytes.size());
        ZonCloudDicomSlice slice;
        if (!slice.Read(memberSource)) continue;  // a read-me, an index: not a slice
        stacked.push_back({stacked.size(), std::move(slice)});
    }
    std::sort(stacked.begin(), stacked.end(), [](const Stacked& a, const Stacked& b) {
        if (a.slice.instanceNumber != b.slice.instanceNumber) return a.slice.instanceNumber < b.slice.instanceNumber;
        const double pa = a.slice.PositionAlongNormal(), pb = b.slice.PositionAlongNormal();
        if (pa != pb) return pa < pb;
        return a.member < b.member;
    });
    Reserve(_slices, stacked.size());
    for (Stacked& s : stacked) _slices.push_back(std::move(s.slice));
}

void ZonCloudReadDicom::BuildCloud()
{
    _sliceCount = _slices.size();
    // Where each slice's kept points start, and the sampling rule's state
    // there: the rule runs over the whole series, so the slices can then be
    // made on the workers, each into its own place.
    struct Start {
        std::uint64_t point;
        ZonCloudSampler sampler;
    };
    ZonCloudSampler sampler(_samplingPercent);
    std::vector<Start> starts;
    Reserve(starts, _slices.size() + 1);
    std::uint64_t kept = 0;
    for (const ZonCloudDicomSlice& slice : _slices) {
        starts.push_back({kept, sampler});
        if (slice.pixels.empty()) continue;
        for (std::uint64_t i = 0; i < slice.PixelCount(); ++i) kept += sampler.Keep();
    }
    if (kept == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    if (kept > static_cast<std::uint64_t>(INT_MAX)) RaiseMemoryError();
    Resize(_points, 3 * kept);
    Resize(_colors, 3 * kept);
    Resize(_densities, kept);

    float low[3] = {INFINITY, INFINITY, INFINITY}, high[3] = {-INFINITY, -INFINITY, -INFINITY};
    std::mutex mutex;
    ZonCloudWorkerPool::Run(_slices.size(), [&](std::size_t s) {
        ZonCloudDicomSlice& slice = _slices[s];
        if (slice.pixels.empty()) return;
        ZonCloudSampler keep = starts[s].sampler;
        // One grey per possible stored value, so the pixels below need no arithmetic of their own.
        std::int32_t least = INT32_MAX, greatest = INT32_MIN;
        for (std::size_t i = 0; i < slice.pixels.size(); ++i) {
            least = std::min(least, slice.Raw(i));
            greatest = std::max(greatest, slice.Raw(i));
        }
        std::vector<unsigned char> greys(65536);
        if (slice.pixels.size() >= greys.size()) {
            for (std::size_t bits = 0; bits < greys.size(); ++bits) {
                const auto raw = slice.pixelSigned ? static_cast<std::int32_t>(static_cast<std::int16_t>(bits))
                                                   : static_cast<std::int32_t>(bits);
                greys[bits] = Grey(slice, raw, least, greatest);
            }
        } else {
            // A small slice: only its own values need a grey.
            for (std::size_t j = 0; j < slice.pixels.size(); ++j)
                greys[slice.pixels[j]] = Grey(slice, slice.Raw(j), least, greatest);
        }
        const double* along = slice.orientation;     // column index grows this way
        const double* down = slice.orientation + 3;  // row index grows this way
        const double columnStep[3] = {along[0] * slice.spacing[1], along[1] * slice.spacing[1],
                                      along[2] * slice.spacing[1]};
        float lo[3] = {INFINITY, INFINITY, INFINITY}, hi[3] = {-INFINITY, -INFINITY, -INFINITY};
        const std::size_t first = static_cast<std::size_t>(starts[s].point);
        float* point = _points.data() + 3 * first;
        unsigned char* colour = _colors.data() + 3 * first;
        std::int32_t* density = _densities.data() + first;
        std::size_t i = 0;
        for (std::uint32_t row = 0; row < slice.rows; ++row) {
            const double rowStart[3] = {slice.position[0] + row * slice.spacing[0] * down[0],
                                        slice.position[1] + row * slice.spacing[0] * down[1],
                                        slice.position[2] + row * slice.spacing[0] * down[2]};
            for (std::uint32_t column = 0; column < slice.columns; ++column, ++i) {
                if (!keep.Keep()) continue;
                for (int k = 0; k < 3; ++k) {
                    const float v = ToFloat(rowStart[k] + column * columnStep[k]);
                    lo[k] = std::min(lo[k], v);
                    hi[k] = std::max(hi[k], v);
                    *point++ = v;
                }
                const unsigned char grey = greys[slice.pixels[i]];
                colour[0] = colour[1] = colour[2] = grey;
                colour += 3;
                *density++ = slice.Raw(i);
            }
        }
        // The pixels are now points.
        std::vector<std::uint16_t>().swap(slice.pixels);
        std::lock_guard lock(mutex);
        for (int k = 0; k < 3; ++k) {
            low[k] = std::min(low[k], lo[k]);
            high[k] = std::max(high[k], hi[k]);
        }
    });
    _numberOfPoints = static_cast<int>(_densities.size());
    _boundingBox.SetLowHigh(ZonMathPoint(low[0], low[1], low[2]), ZonMathPoint(high[0], high[1], high[2]));
    _slices.clear();
}

const float* ZonCloudReadDicom::GetPoints(unsigned& count)
{
    Analyse();
    count = static_cast<unsigned>(_densities.size());
    return _points.data();
}

const unsigned char* ZonCloudReadDicom::GetPointColors(unsigned& count)
{
    Analyse();
    count = static_cast<unsigned>(_densities.size());
    return _colors.data();
}

const std::int32_t* ZonCloudReadDicom::GetPointTextValues(unsigned& count, ZonUnicodeString& label)
{
    Analyse();
    label = ZonUnicodeString(DensityLabel);
    count = static_cast<unsigned>(_densities.size());
    return _densities.data();
}

const void* ZonCloudReadDicom::GetPointAttributes3(unsigned& count)
{
    Analyse();
    if (!_textsMade) {
        Reserve(_texts, _densities.size());
        Allocating([this] {
            for (std::int32_t density : _densities) _texts.push_back(DensityLabel + std::to_string(density));
        });
        _textsMade = true;
    }
    count = static_cast<unsigned>(_texts.size());
    return _texts.data();
}

std::vector<std::pair<std::string, std::uint64_t>> ZonCloudReadDicom::GetFileCounts()
{
    Analyse();
    return {{"Slices", _sliceCount}};
}

ZonICkeUnit_var ZonCloudReadDicom::GetLengthUnit() { return ZonICkeUnit::FromName("mm"); }
