#pragma once
#include <cstdint>
#include <string>
#include <vector>

#include "ZonCloudDicomSlice.h"
#include "ZonCloudReadFile.h"
#include "ZonICloudReadFileCounts.h"
#include "ZonICloudReadPointTextValues.h"
#include "ZonCloudOwnedArrays.h"

// Reads medical image slices as one cloud: every pixel of every slice is a
// point placed by the slice's position, orientation and pixel spacing, with
// its density as a grey colour and as the text "Density = <raw value>".
// A name containing ".dcz" is a zip archive of slices: its members are read
// into memory one by one (nothing is written to disk), members without the
// DICOM marker are skipped, and the slices are stacked by instance number,
// then by position along the slice normal. The densities are kept as
// integers; the texts are made only for a caller that asks for strings.
class ZON_CLD_API ZonCloudReadDicom : public ZonCloudReadFile,
                                     public ZonICloudReadPointTextValues,
                                     public ZonICloudReadFileCounts {
public:
    explicit ZonCloudReadDicom(const ZonUnicodeString& fileName);
    ~ZonCloudReadDicom() override;

    const float* GetPoints(unsigned& count) override;
    const unsigned char* GetPointColors(unsigned& count) override;
    const void* GetPointAttributes3(unsigned& count) override;
    ZonICkeUnit_var GetLengthUnit() override;

    // ZonICloudReadPointTextValues: "Density = " and the raw value of each point.
    const std::int32_t* GetPointTextValues(unsigned& count, ZonUnicodeString& label) override;
    // ZonICloudReadFileCounts: the slices read.
    std::vector<std::pair<std::string, std::uint64_t>> GetFileCounts() override;

    // The most an archive's members may hold together once inflated.
    static constexpr std::uint64_t ArchiveLimit = std::uint64_t{4} << 30;

    // The grey of a density by the reader's rules: with a window, the
    // clamped density over the window's width in 255 steps (offset by the
    // window's low end only when that is negative, so a grey may pass 255 and
    // is kept by its low 8 bits); without one, the density's place between
    // the slice's least and greatest.
    static unsigned char Grey(const ZonCloudDicomSlice& slice, std::int32_t raw, std::int32_t least,
                              std::int32_t greatest);

protected:
    // What an importer may take over at the end of an import.
    void ListOwnedArrays(ZonCloudOwnedArrays& arrays) override
    {
        arrays.Add(_points);
        arrays.Add(_colors);
        arrays.Add(_densities);
    }

private:
    void AnalyseFile() override;
    void ReadSingle();
    void ReadArchive();
    void BuildCloud();

    std::vector<ZonCloudDicomSlice> _slices;
    std::vector<float> _points;
    std::vector<unsigned char> _colors;
    std::vector<std::int32_t> _densities;
    std::vector<std::string> _texts;  // made on first request only
    bool _textsMade = false;
    std::uint64_t _sliceCount = 0;
};
