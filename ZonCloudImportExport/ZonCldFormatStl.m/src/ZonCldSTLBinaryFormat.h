#pragma once
#include <array>
#include <cmath>
#include <cstdint>

#include "ZonCldExport.h"
#include "ZonCloudOutputFile.h"

// What the STL output document and the STL writer share: the binary layout
// (80-byte header, 32-bit triangle count, 50-byte facet records), the header
// text, the bookkeeping of the count over several announcements, and the
// normal rule. Every failing write, read or seek removes the file and raises
// type 3 with the system's message (the output file's own checks).
class ZON_CLD_API ZonCldSTLBinaryFormat {
public:
    static constexpr std::size_t HeaderSize = 80;
    static constexpr long CountOffset = 80;
    static constexpr std::size_t FacetSize = 50;

    // "STL " and the origin text, cut to 79 bytes and zero-padded to 80, so
    // the header always ends with a zero byte.
    static std::array<char, HeaderSize> Header();

    // Adds count triangles to the file's count. The first announcement
    // writes the header and the count and clears headerPending; each later
    // one reads the stored count back at offset 80, adds, rewrites it and
    // returns to the end of the file (the stream must be open for update).
    static void AnnounceTriangles(ZonCloudOutputFile& file, bool& headerPending, std::uint64_t count,
                                  bool reverseBytes);

    // One facet record: normal, three vertices, attribute word 0.
    static void WriteFacet(ZonCloudOutputFile& file, const float normal[3], const float vertices[9],
                           bool reverseBytes);

    // n = (B - A) x (C - A), divided by its length unless that is zero.
    template <class T>
    static void Normal(const T vertices[9], T normal[3])
    {
        const T u[3] = {vertices[3] - vertices[0], vertices[4] - vertices[1], vertices[5] - vertices[2]};
        const T v[3] = {vertices[6] - vertices[0], vertices[7] - vertices[1], vertices[8] - vertices[2]};
        normal[0] = u[1] * v[2] - u[2] * v[1];
        normal[1] = u[2] * v[0] - u[0] * v[2];
        normal[2] = u[0] * v[1] - u[1] * v[0];
        const T length = std::sqrt(normal[0] * normal[0] + normal[1] * normal[1] + normal[2] * normal[2]);
        if (length != 0) {
            normal[0] /= length;
            normal[1] /= length;
            normal[2] /= length;
        }
    }
};
