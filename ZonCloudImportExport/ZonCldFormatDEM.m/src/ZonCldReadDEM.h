#pragma once
#include <cstdint>
#include <vector>

#include "ZonCloudReadGridMesh.h"

// Reads a digital elevation model in fixed columns of 1024-byte records (a
// header record A, then one profile B per column of the grid, a long profile
// going on in the following records) as one mesh. Point k of a profile lies
// at the profile's x, at y = its first y + k x the y resolution, with the
// height elevation x the z resolution; no unit is converted. Triangles join
// the profiles by index as if each had as many points as the longest.
class ZON_CLD_API ZonCldReadDEM : public ZonCloudReadGridMesh {
public:
    explicit ZonCldReadDEM(const ZonUnicodeString& fileName);

    // What the header record says of the grid.
    struct Header {
        std::int32_t planimetricUnit = 0, elevationUnit = 0;
        double resolution[3] = {0, 0, 0};  // x, y, z
        std::int32_t rows = 0, profiles = 0;
    };
    const Header& GetHeader();

protected:
    void AnalyseFile() override;

private:
    void ReadHeader();

    Header _header;
};
