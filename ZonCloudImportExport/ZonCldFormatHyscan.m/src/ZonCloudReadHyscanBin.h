#pragma once
#include <cstdint>
#include <vector>

#include "ZonCloudReadFile.h"
#include "ZonCloudSampler.h"
#include "ZonTieCloudReadFile.h"

// Profile files of a laser line scanner: a 96-byte header, then groups of
// profiles, each profile a run of points. The file is one set of scans, one
// scan per profile, or the cloud of all points; its length unit is in the
// header ("Inch" or "mm").
//
// Files come in either byte order: a header word that reads as a multiple of
// 65536 above it was written the other way round, and every 32-bit value is
// then reversed. A point stores one, two or three of its coordinates; the
// others are 0. The analysis walks the group and profile headers (counts,
// and where each profile's values start, so that scans and the cloud read
// them back directly); the box is worked out from the points when asked.
class ZonCloudReadHyscanBin : public ZonCloudReadFile, public ZonTieCloudReadScanFile<ZonCloudReadHyscanBin> {
public:
    // What a point stores, named by the header's axis letters.
    enum AxisKind { UnknownAxes = 0, AxesXYZ = 1, AxesYZ = 2, AxesXZ = 3, AxesXY = 4, AxisZ = 5, AxisY = 6, AxisX = 7 };

    explicit ZonCloudReadHyscanBin(const ZonUnicodeString& fileName);

    // ZonICloudReadFile: every point, sampled over the whole file.
    void SetSamplingPercent(float percent) override;
    const float* GetPoints(unsigned& count) override;
    ZonICkeUnit_var GetLengthUnit() override;
    void GetBoundingBox(ZonMathBox& box) override;

    // ZonICloudReadScanFile: one set, one scan per profile. The sampling runs
    // on from one scan to the next, as over the whole file.
    void BeginGetSetOfScans() override;
    bool NextSetOfScans() override;
    void BeginGetScan() override;
    bool NextScan() override;
    const float* GetScanPoints(unsigned& count) override;
    using ZonCloudReadFile::GetScanPointsInBox;
    using ZonCloudReadFile::GetScanPointsInBoxDouble;

    bool IsByteReversed();
    AxisKind GetAxisKind();
    unsigned GetValuesPerPoint();
    std::size_t GetNumberOfProfiles();

protected:
    void AnalyseFile() override;

private:
    struct Profile {
        std::uint64_t values = 0;  // offset of the first value
        std::uint32_t points = 0;
    };

    void ReadHeader();
    // Calls visit(xyz, n) for the profile's points, n at a time as x, y, z triples.
    template <class Visit>
    void ForEachChunk(const Profile& profile, Visit visit);
    // Appends the profile's points, those the sampler keeps.
    void AppendSampled(const Profile& profile, ZonCloudSampler& sampler, std::vector<float>& out);
    std::uint32_t Word(const unsigned char* bytes) const;
    void RequireScans();

    std::vector<Profile> _profiles;
    bool _reversed = false;
    bool _inch = false;
    AxisKind _kind = UnknownAxes;
    unsigned _valuesPerPoint = 0;
    int _axes[3] = {};  // the axis of each stored value
    std::vector<unsigned char> _buffer;
    std::vector<float> _decoded;  // a chunk of points as triples
    bool _boxKnown = false;

    std::vector<float> _cloud;
    bool _cloudRead = false;

    bool _setBegun = false, _setGiven = false, _scanBegun = false, _hasScan = false, _scanRead = false;
    std::size_t _nextProfile = 0, _profile = 0;
    ZonCloudSampler _scanSampler{100.0f};  // runs on over the scans of one walk
    std::vector<float> _scan;
};
