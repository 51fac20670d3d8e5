#include "ZonCloudReadHyscanBin.h"

#include <algorithm>
#include <bit>
#include <cerrno>
#include <cstring>
#include <limits>

#include "ZonCloudReadNLSTool.h"

namespace {

using Tool = ZonCloudReadNLSTool;

constexpr std::uint64_t HeaderSize = 96;
constexpr std::uint64_t GroupHeaderSize = 122;
constexpr std::uint64_t ProfileHeaderSize = 40;
constexpr std::uint64_t ValueSize = 4;
constexpr std::uint64_t Chunk = std::uint64_t{1} << 20;

// Header fields.
constexpr std::size_t WordA = 0;
constexpr std::size_t AxesFirst = 8, AxesLast = 21;  // the descriptor's characters
constexpr std::size_t StoredAxes = 19;               // the three that name the stored axes
constexpr std::size_t UnitText = 23;
constexpr std::size_t WordC = 68;
constexpr std::size_t GroupProfiles = 94;
constexpr std::size_t ProfilePoints = 36;

// A count the file announces that it does not hold: the reading would run
// past its end.
[[noreturn]] void ShortRead()
{
    errno = ENODATA;
    Tool::Raise(Tool::Input, nullptr);
}

// The kind is told by the sum of the codes of the three axis characters, a
// missing axis being a NUL.
ZonCloudReadHyscanBin::AxisKind KindOfSum(unsigned sum)
{
    using R = ZonCloudReadHyscanBin;
    switch (sum) {
        case 'X' + 'Y' + 'Z': return R::AxesXYZ;
        case 'Y' + 'Z': return R::AxesYZ;
        case 'X' + 'Z': return R::AxesXZ;
        case 'X' + 'Y': return R::AxesXY;
        case 'Z': return R::AxisZ;
        case 'Y': return R::AxisY;
        case 'X': return R::AxisX;
        default: return R::UnknownAxes;
    }
}

}  // namespace

ZonCloudReadHyscanBin::ZonCloudReadHyscanBin(const ZonUnicodeString& fileName) : ZonCloudReadFile(fileName) {}

void ZonCloudReadHyscanBin::SetSamplingPercent(float percent)
{
    const float before = _samplingPercent;
    ZonCloudReadFile::SetSamplingPercent(percent);
    if (_samplingPercent != before) _cloudRead = false;
}

bool ZonCloudReadHyscanBin::IsByteReversed()
{
    Analyse();
    return _reversed;
}

ZonCloudReadHyscanBin::AxisKind ZonCloudReadHyscanBin::GetAxisKind()
{
    Analyse();
    return _kind;
}

unsigned ZonCloudReadHyscanBin::GetValuesPerPoint()
{
    Analyse();
    return _valuesPerPoint;
}

std::size_t ZonCloudReadHyscanBin::GetNumberOfProfiles()
{
    Analyse();
    return _profiles.size();
}

ZonICkeUnit_var ZonCloudReadHyscanBin::GetLengthUnit()
{
    Analyse();
    return ZonICkeUnit::FromName(_inch ? "Inch" : "mm");
}

std::uint32_t ZonCloudReadHyscanBin::Word(const unsigned char* bytes) const
{
    const auto word = ZonCloudByteSource::LoadLittle<std::uint32_t>(bytes);
    return _reversed ? __builtin_bswap32(word) : word;
}

// ---- Analysis ---------------------------------------------------------------

void ZonCloudReadHyscanBin::ReadHeader()
{
    unsigned char header[HeaderSize];
    Source().Read(header, sizeof header);

    // Word A tells the byte order (word C when A is 0): written the other
    // way round, a small number reads as a multiple of 65536.
    std::uint32_t probe = ZonCloudByteSource::LoadLittle<std::uint32_t>(header + WordA);
    if (probe == 0) probe = ZonCloudByteSource::LoadLittle<std::uint32_t>(header + WordC);
    _reversed = probe > 65536 && probe % 65536 == 0;

    unsigned sum = 0;
    for (std::size_t i = StoredAxes; i <= AxesLast; ++i) sum += header[i];
    _kind = KindOfSum(sum);
    if (_kind == UnknownAxes) Tool::Raise(Tool::Data, "ERR_FormatNotImplemented");
    // Values per point: the descriptor's characters up to its NUL that are not "-".
    _valuesPerPoint = 0;
    for (std::size_t i = AxesFirst; i <= AxesLast && header[i] != 0; ++i)
        if (header[i] != '-') ++_valuesPerPoint;

    static constexpr int Axes[8][3] = {{}, {0, 1, 2}, {1, 2}, {0, 2}, {0, 1}, {2}, {1}, {0}};
    std::copy(Axes[_kind], Axes[_kind] + 3, _axes);
    _inch = std::memcmp(header + UnitText, "INCH", 4) == 0;
}

void ZonCloudReadHyscanBin::AnalyseFile()
{
    _profiles.clear();
    _numberOfPoints = 0;
    _boundingBox = ZonMathBox();
    _boxKnown = false;
    _cloud.clear();
    _cloudRead = false;
    _setBegun = _setGiven = _scanBegun = _hasScan = false;

    ReadHeader();
    ZonCloudByteSource& source = Source();
    const unsigned expected = _kind == AxesXYZ ? 3u : _kind <= AxesXY ? 2u : 1u;
    std::uint64_t total = 0;
    std::uint64_t offset = HeaderSize;
    unsigned char group[GroupHeaderSize];
    unsigned char profileHeader[ProfileHeaderSize];
    // The file ends where no further whole group header can be read.
    while (source.Fits(offset, 1, GroupHeaderSize)) {
        source.Seek(offset);
        source.Read(group, sizeof group);
        offset += GroupHeaderSize;
        const std::uint32_t profiles = Word(group + GroupProfiles);
        // Each profile needs its header at least: a count the file cannot hold
        // fails here, before any profile is kept.
        if (!source.Fits(offset, profiles, ProfileHeaderSize)) ShortRead();
        for (std::uint32_t p = 0; p < profiles; ++p) {
            source.Seek(offset);
            source.Read(profileHeader, sizeof profileHeader);
            offset += ProfileHeaderSize;
            if (_valuesPerPoint != expected) Tool::Raise(Tool::Input, "ERR_UnknownData");
            const Profile profile{offset, Word(profileHeader + ProfilePoints)};
            // The values are all there: later reads of them cannot come short.
            if (!source.Fits(offset, std::uint64_t{profile.points} * _valuesPerPoint, ValueSize)) ShortRead();
            offset += std::uint64_t{profile.points} * _valuesPerPoint * ValueSize;
            total += profile.points;
            if (total > static_cast<std::uint64_t>(std::numeric_limits<int>::max()))
                Tool::Raise(Tool::Data, "ERR_UnknownData");
            Allocating([&] { _profiles.push_back(profile); });
        }
    }
    if (total == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    _numberOfPoints = static_cast<int>(total);
    _digitizationType = DigitizationScans;
}

void ZonCloudReadHyscanBin::GetBoundingBox(ZonMathBox& box)
{
    Analyse();
    if (!_boxKnown) {
        float low[3], high[3];
        for (int a = 0; a < 3; ++a) {
            low[a] = std::numeric_limits<float>::infinity();
            high[a] = -std::numeric_limits<float>::infinity();
        }
        Guarded([&] {
            for (const Profile& profile : _profiles)
                ForEachChunk(profile, [&](const float* xyz, std::uint64_t n) {
                    for (const float* p = xyz; p != xyz + 3 * n; p += 3)
                        for (int a = 0; a < 3; ++a) {
                            low[a] = p[a] < low[a] ? p[a] : low[a];
                            high[a] = p[a] > high[a] ? p[a] : high[a];
                        }
                });
        });
        _boundingBox = ZonMathBox();
        if (low[0] <= high[0] && low[1] <= high[1] && low[2] <= high[2])
            _boundingBox = ZonMathBox(low[0], high[0], low[1], high[1], low[2], high[2]);
        _boxKnown = true;
    }
    box = _boundingBox;
}

template <class Visit>
void ZonCloudReadHyscanBin::ForEachChunk(const Profile& profile, Visit visit)
{
    if (profile.points == 0) return;
    ZonCloudByteSource& source = Source();
    source.Seek(profile.values);
    const std::uint64_t pointSize = _valuesPerPoint * ValueSize;
    const std::uint64_t perChunk = Chunk / pointSize;
    const std::uint64_t most = std::min<std::uint64_t>(profile.points, perChunk);
    Resize(_buffer, most * pointSize);
    Resize(_decoded, 3 * most);
    const bool straight = _kind == AxesXYZ && !_reversed && std::endian::native == std::endian::little;
    for (std::uint64_t left = profile.points; left > 0;) {
        const std::uint64_t n = std::min(left, perChunk);
        float* out = _decoded.data();
        if (straight) {
            // Stored as the triples are held: read into them directly.
            source.Read(out, static_cast<std::size_t>(n * pointSize));
        } else {
            source.Read(_buffer.data(), static_cast<std::size_t>(n * pointSize));
            const unsigned char* bytes = _buffer.data();
            std::fill(out, out + 3 * n, 0.0f);
            for (std::uint64_t i = 0; i < n; ++i, out += 3)
                for (unsigned v = 0; v < _valuesPerPoint; ++v, bytes += ValueSize)
                    out[_axes[v]] = std::bit_cast<float>(Word(bytes));
        }
        visit(static_cast<const float*>(_decoded.data()), n);
        left -= n;
    }
}

void ZonCloudReadHyscanBin::AppendSampled(const Profile& profile, ZonCloudSampler& sampler, std::vector<float>& out)
{
    const bool all = sampler.Step() >= 1.0f;
    ForEachChunk(profile, [&](const float* xyz, std::uint64_t n) {
        if (all) {
            out.insert(out.end(), xyz, xyz + 3 * n);
            return;
        }
        for (const float* p = xyz; p != xyz + 3 * n; p += 3)
            if (sampler.Keep()) out.insert(out.end(), p, p + 3);
    });
}

// ---- Reading ----------------------------------------------------------------

const float* ZonCloudReadHyscanBin::GetPoints(unsigned& count)
{
    count = 0;
    Analyse();
    if (!_cloudRead) {
        _cloud.clear();
        ZonCloudSampler sampler(_samplingPercent);
        Guarded([&] {
            const auto total = static_cast<std::uint64_t>(_numberOfPoints);
            const auto capacity = static_cast<std::uint64_t>(static_cast<float>(total) * sampler.Step()) + 1;
            Reserve(_cloud, 3 * std::min(total, capacity));
            for (const Profile& profile : _profiles) AppendSampled(profile, sampler, _cloud);
        });
        _cloudRead = true;
    }
    count = static_cast<unsigned>(_cloud.size() / 3);
    return _cloud.empty() ? nullptr : _cloud.data();
}

void ZonCloudReadHyscanBin::RequireScans()
{
    Analyse();
    if (_digitizationType != DigitizationScans) Tool::Raise(Tool::Usage, "ERR_NotAScanDigit");
}

void ZonCloudReadHyscanBin::BeginGetSetOfScans()
{
    RequireScans();
    _setBegun = true;
    _setGiven = _scanBegun = _hasScan = false;
}

bool ZonCloudReadHyscanBin::NextSetOfScans()
{
    RequireScans();
    if (!_setBegun) Tool::Raise(Tool::Data, "ERR_BeginGetSetOfScansNotDone");
    _scanBegun = _hasScan = false;
    if (_setGiven) return false;
    _setGiven = true;
    return true;
}

void ZonCloudReadHyscanBin::BeginGetScan()
{
    RequireScans();
    if (!_setGiven || !_setBegun) Tool::Raise(Tool::Usage, "ERR_NextSetOfScansNotDone");
    _scanBegun = true;
    _hasScan = false;
    _nextProfile = 0;
    _scanSampler = ZonCloudSampler(_samplingPercent);
}

bool ZonCloudReadHyscanBin::NextScan()
{
    RequireScans();
    if (!_scanBegun) Tool::Raise(Tool::Usage, "ERR_BeginGetScanNotDone");
    _hasScan = _nextProfile < _profiles.size();
    _scanRead = false;
    if (_hasScan) _profile = _nextProfile++;
    return _hasScan;
}

const float* ZonCloudReadHyscanBin::GetScanPoints(unsigned& count)
{
    count = 0;
    RequireScans();
    if (!_scanBegun) Tool::Raise(Tool::Usage, "ERR_BeginGetScanNotDone");
    if (!_hasScan) return nullptr;
    // Read once per scan: asking again must not move the sampling on.
    if (!_scanRead) {
        _scan.clear();
        Guarded([&] {
            Reserve(_scan, 3 * std::uint64_t{_profiles[_profile].points});
            AppendSampled(_profiles[_profile], _scanSampler, _scan);
        });
        _scanRead = true;
    }
    count = static_cast<unsigned>(_scan.size() / 3);
    return _scan.empty() ? nullptr : _scan.data();
}
