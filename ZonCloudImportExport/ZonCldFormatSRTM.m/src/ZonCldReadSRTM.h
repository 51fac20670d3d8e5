#pragma once
#include <vector>

#include "ZonCloudReadGridMesh.h"

// Reads a square tile of raw big-endian 16-bit heights, rows from north to
// south, as one mesh: the tile spans 1.0 in x and y from its south-west
// corner at (0, 0), heights in metres. A void sample (-32768) stays a point,
// at that height, with the void text; box queries leave it out. A file whose
// sample count is no square still gives every sample: rows of the side n =
// trunc(sqrt(m)) go on past the last whole row, and the triangles cover the
// first n x n samples.
class ZON_CLD_API ZonCldReadSRTM : public ZonCloudReadGridMesh {
public:
    explicit ZonCldReadSRTM(const ZonUnicodeString& fileName);

    ZonICkeUnit_var GetLengthUnit() override;
    // Samples per row, from the file size.
    unsigned GetRowLength();

protected:
    void AnalyseFile() override;
    void ComputeDoublePoints(std::vector<double>& points) override;

private:
    // x and y of the samples [from, to); z is already in place.
    template <class T>
    void Place(T* points, std::size_t from, std::size_t to) const;

    std::uint32_t _side = 0;
};
