#pragma once
#include <cstdint>
#include <string>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudByteSource.h"

// One image slice of a DICOM file: the tags that place and colour its pixels,
// and its pixel values. Read reads any source (a file or an archive member in
// memory): the file meta group in explicit-VR little endian, then the data
// set in the transfer syntax it names, explicit or implicit VR little endian.
// Other syntaxes (big endian, compressed pixel data) are refused by name.
// Elements that are not used are skipped by their length, sequences and items
// of undefined length through their delimitation items, however deep.
class ZON_CLD_API ZonCloudDicomSlice {
public:
    // False (nothing read) when the source lacks the "DICM" marker after its
    // preamble; raises on anything unreadable after the marker.
    bool Read(ZonCloudByteSource& source);

    std::uint64_t PixelCount() const { return static_cast<std::uint64_t>(rows) * columns; }
    // The stored value of pixel i, signed when the file says so.
    std::int32_t Raw(std::size_t i) const
    {
        return pixelSigned ? static_cast<std::int32_t>(static_cast<std::int16_t>(pixels[i])) : pixels[i];
    }
    // Distance of the slice along its normal, to order slices of one instance number.
    double PositionAlongNormal() const;
    bool HasWindow() const { return windowCentre != 0.0 && windowWidth != 0.0; }

    std::uint32_t rows = 0;
    std::uint32_t columns = 0;
    double position[3] = {0.0, 0.0, 0.0};
    // First triple: where the column index grows; second: where the row index grows.
    double orientation[6] = {1.0, 0.0, 0.0, 0.0, 1.0, 0.0};
    double spacing[2] = {1.0, 1.0};  // between rows, between columns
    double windowCentre = 0.0;
    double windowWidth = 0.0;
    double intercept = 0.0;
    double slope = 1.0;
    std::int64_t instanceNumber = 0;
    bool pixelSigned = false;
    // One value per pixel, the samples of a colour pixel averaged.
    std::vector<std::uint16_t> pixels;

private:
    struct Element {
        std::uint16_t group = 0;
        std::uint16_t element = 0;
        std::uint32_t length = 0;
        bool Is(std::uint16_t g, std::uint16_t e) const { return group == g && element == e; }
    };
    static constexpr std::uint32_t Undefined = 0xFFFFFFFFu;

    Element ReadHeader(bool explicitVr);
    std::string ReadText(std::uint32_t length);
    std::uint32_t ReadUnsigned16(std::uint32_t length);
    void Skip(std::uint32_t length);
    void SkipUndefinedLength();
    void ReadMeta();
    void ReadDataSet();
    void ReadPixels(std::uint32_t length);
    bool DataSetLooksExplicit();

    ZonCloudByteSource* _source = nullptr;
    bool _explicitVr = true;
    std::string _transferSyntax;
    std::string _photometric;
    bool _hasPhotometric = false;
    std::uint32_t _samplesPerPixel = 0;  // 0: not given
    std::uint32_t _planarConfiguration = 0;
    std::uint32_t _bitsAllocated = 16;
};
