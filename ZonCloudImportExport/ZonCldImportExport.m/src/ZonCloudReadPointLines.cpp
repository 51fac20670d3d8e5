#include "ZonCloudReadPointLines.h"

#include <algorithm>
#include <cerrno>
#include <limits>
#include <string_view>

#include "DecimalPointGuard.h"
#include "ZonCloudChunkedText.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudSampler.h"

namespace {

constexpr int SampleLines = 20;
constexpr std::uint64_t GrowthStep = 8192;
// Unknown lines in a row after which the other decimal point is tried.
constexpr int UnknownLinesBeforeSwap = 201;
// A point line holds three numbers, so at least five characters ("1-2-3"):
// no file holds more points than a fifth of its size. Small files get a
// little room beyond that, so that a count line is honoured as written.
constexpr std::uint64_t MinimumRoom = 4096;

}  // namespace

ZonCloudReadPointLines::ZonCloudReadPointLines(const ZonUnicodeString& fileName) : ZonCloudReadFile(fileName)
{
    _digitizationType = DigitizationCloud;
}

void ZonCloudReadPointLines::SetSamplingPercent(float percent)
{
    const float before = _samplingPercent;
    ZonCloudReadFile::SetSamplingPercent(percent);
    if (_samplingPercent != before) Discard();
}

void ZonCloudReadPointLines::Discard()
{
    std::vector<float>().swap(_points);
    std::vector<double>().swap(_pointsDouble);
    std::vector<unsigned char>().swap(_colors);
    _count = 0;
    _capacity = 0;
    _pointLines = 0;
    _numberOfPoints = 0;
    _boundingBox.SetToEmpty();
    _analysed = false;
    ClearBoxCaches();
}

void ZonCloudReadPointLines::AnalyseFile()
{
    Load(_doublePrecision);
}

bool ZonCloudReadPointLines::IsEndOfCloud(const char* first, const char* last)
{
    std::string_view text(first, static_cast<std::size_t>(last - first));
    text = text.substr(0, text.find('\0'));
    return text.find("**end cloud**") != std::string_view::npos;
}

void ZonCloudReadPointLines::MakeRoom(std::uint64_t capacity)
{
    capacity = std::min(capacity, _mostPoints);
    if (capacity <= _capacity) capacity = _capacity + 1;
    if (_loadedAsDouble)
        Reserve(_pointsDouble, 3 * capacity);
    else
        Reserve(_points, 3 * capacity);
    if (_keepColors) Reserve(_colors, 3 * capacity);
    _capacity = capacity;
}

void ZonCloudReadPointLines::Load(bool asDouble)
{
    Discard();
    _loadedAsDouble = asDouble;
    _decimalSwapped = false;
    Guarded([this] {
        ZonCloudByteSource& source = Source();
        if (source.Size() < 0) {
            // A stream without a size (a pipe) cannot be estimated nor read twice.
            errno = ESPIPE;
            ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
        }
        const auto size = static_cast<std::uint64_t>(source.Size());
        _mostPoints = std::max<std::uint64_t>(size / 5 + 1, MinimumRoom);

        // The estimate: the file size over the average length of the first lines.
        ZonCloudLineSource lines(LinePiece);
        lines.Start(source, 0);
        const char* first = nullptr;
        const char* last = nullptr;
        std::uint64_t sampled = 0;
        while (sampled < SampleLines && lines.Next(first, last)) ++sampled;
        const std::uint64_t average = sampled > 0 ? lines.NextOffset() / sampled : 0;
        _estimate = average > 0 ? size / average : 0;

        DecimalPointGuard guard;
        const unsigned char* text = ZonCloudChunkedText::MapIfWorth(source, 0);
        const auto pass = [&] {
            if (text) return ReadPassInChunks(text, guard.DecimalPoint());
            lines.Start(source, 0);
            return ReadPass(lines, guard.DecimalPoint());
        };
        while (!pass()) {
            // Too many lines not understood: once, try the other decimal point.
            if (_decimalSwapped || !guard.Switch())
                ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_TooManyUnknownData");
            _decimalSwapped = true;
        }
        // Everything is in memory now.
        CloseSource();
    });

    if (_pointLines == 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_NoPointFound");
    _numberOfPoints = static_cast<int>(std::min<std::int64_t>(_pointLines, std::numeric_limits<int>::max()));
    _analysed = true;
}

struct ZonCloudReadPointLines::PassState {
    ZonMathBox box;
    ZonCloudSampler sampler;
    int unknownInRow = 0;
};

void ZonCloudReadPointLines::StartPass()
{
    _points.clear();
    _pointsDouble.clear();
    _colors.clear();
    _count = 0;
    _capacity = 0;
    _pointLines = 0;
    _dataStart = 0;
}

int ZonCloudReadPointLines::Announced(const char* first, const char* last, char decimalPoint) const
{
    static const ZonCloudScanFormat countFormat("%d");
    int announced = 0;
    if (Scan(countFormat, first, last, decimalPoint, &announced) == 1 && announced >= 1) return announced;
    return 0;
}

void ZonCloudReadPointLines::TakePoint(const double xyz[3], const unsigned char rgb[3], PassState& state)
{
    state.unknownInRow = 0;
    ++_pointLines;
    state.box.AddPoint(xyz[0], xyz[1], xyz[2]);
    if (!state.sampler.Keep()) return;

    if (_count >= std::numeric_limits<unsigned>::max()) RaiseMemoryError();
    if (_count == _capacity) MakeRoom(_capacity == 0 && _estimate != 0 ? _estimate : _capacity + GrowthStep);
    if (_loadedAsDouble) {
        _pointsDouble.insert(_pointsDouble.end(), xyz, xyz + 3);
    } else {
        _points.insert(_points.end(),
                       {static_cast<float>(xyz[0]), static_cast<float>(xyz[1]), static_cast<float>(xyz[2])});
    }
    if (_keepColors) _colors.insert(_colors.end(), rgb, rgb + 3);
    ++_count;
}

ZonCloudReadPointLines::Next ZonCloudReadPointLines::TakeOtherLine(int announced, bool endOfCloud,
                                                                  std::uint64_t nextOffset, PassState& state)
{
    if (_pointLines == 0) _dataStart = static_cast<long>(nextOffset);
    if (announced >= 1) {
        MakeRoom(static_cast<std::uint64_t>(announced));
        return Next::Go;
    }
    if (endOfCloud) return Next::Stop;
    if (++state.unknownInRow == UnknownLinesBeforeSwap) return Next::Retry;
    return Next::Go;
}

bool ZonCloudReadPointLines::ReadPass(ZonCloudLineSource& lines, char decimalPoint)
{
    StartPass();
    PassState state{ZonMathBox(), ZonCloudSampler::InDouble(_samplingPercent)};
    bool firstLine = true;

    const char* first = nullptr;
    const char* last = nullptr;
    while (lines.Next(first, last)) {
        const bool isFirstLine = firstLine;
        firstLine = false;
        double xyz[3] = {0.0, 0.0, 0.0};
        unsigned char rgb[3] = {255, 255, 255};
        if (ScanLine(first, last, decimalPoint, xyz, rgb)) {
            TakePoint(xyz, rgb, state);
            continue;
        }
        const int announced = isFirstLine ? Announced(first, last, decimalPoint) : 0;
        const Next next =
            TakeOtherLine(announced, announced == 0 && IsEndOfCloud(first, last), lines.NextOffset(), state);
        if (next == Next::Stop) break;
        if (next == Next::Retry) return false;
    }
    if (_pointLines > 0) _boundingBox = state.box;
    return true;
}

namespace {

// What a worker makes of one chunk: its point lines (coordinates as scanned,
// colours when kept) and a mark for each other line.
struct PointLinesChunk {
    struct Mark {
        std::uint32_t pointsBefore;
        int announced;
        bool endOfCloud;
        std::uint64_t nextOffset;
    };
    std::vector<double> xyz;
    std::vector<unsigned char> rgb;
    std::vector<Mark> marks;
    std::uint32_t count = 0;
};

}  // namespace

bool ZonCloudReadPointLines::ReadPassInChunks(const unsigned char* text, char decimalPoint)
{
    StartPass();
    PassState state{ZonMathBox(), ZonCloudSampler::InDouble(_samplingPercent)};
    const bool keepColors = _keepColors;
    bool retry = false;

    const auto parse = [&](ZonCloudChunkLines& lines, PointLinesChunk& chunk) {
        const char* first = nullptr;
        const char* last = nullptr;
        std::uint32_t n = 0;
        while (lines.Next(first, last)) {
            double xyz[3] = {0.0, 0.0, 0.0};
            unsigned char rgb[3] = {255, 255, 255};
            if (ScanLine(first, last, decimalPoint, xyz, rgb)) {
                chunk.xyz.insert(chunk.xyz.end(), xyz, xyz + 3);
                if (keepColors) chunk.rgb.insert(chunk.rgb.end(), rgb, rgb + 3);
                ++n;
                continue;
            }
            const int announced = lines.LineOffset() == 0 ? Announced(first, last, decimalPoint) : 0;
            chunk.marks.push_back({n, announced, announced == 0 && IsEndOfCloud(first, last), lines.NextOffset()});
        }
        chunk.count = n;
    };

    static const unsigned char white[3] = {255, 255, 255};
    const auto stitch = [&](PointLinesChunk& chunk) {
        std::uint32_t taken = 0;
        const auto takePoints = [&](std::uint32_t upTo) {
            for (; taken < upTo; ++taken)
                TakePoint(chunk.xyz.data() + 3 * std::size_t{taken},
                          keepColors ? chunk.rgb.data() + 3 * std::size_t{taken} : white, state);
        };
        for (const PointLinesChunk::Mark& mark : chunk.marks) {
            takePoints(mark.pointsBefore);
            const Next next = TakeOtherLine(mark.announced, mark.endOfCloud, mark.nextOffset, state);
            if (next == Next::Stop) return false;
            if (next == Next::Retry) {
                retry = true;
                return false;
            }
        }
        takePoints(chunk.count);
        return true;
    };

    ZonCloudChunkedText::Run<PointLinesChunk>(_source, text, 0, LinePiece, parse, stitch);
    if (retry) return false;
    if (_pointLines > 0) _boundingBox = state.box;
    return true;
}
