#pragma once
#include <cstdint>

#include "ZonCloudWriteFile.h"
#include "ZonICloudWritePolygonFile.h"

// Writes triangles into a binary STL file. Each announcement of a number of
// triangles adds to the count in the header, so a polygon at a time can be
// written; the reversed byte order of the writer base writes every number
// byte-swapped.
class ZON_CLD_API ZonCloudWriteStl : public ZonCloudWriteFile, public ZonICloudWritePolygonFile {
public:
    explicit ZonCloudWriteStl(const ZonUnicodeString& fileName);

    // ZonICloudWriteFile: the file is opened for update, as the count is
    // read back at each announcement.
    ZonHResult BeginMultiWrite() override;

    // ZonICloudWritePolygonFile
    // Opens the file at the first announcement.
    void BeginWriteTriangles(const unsigned& count) override;
    // Nine floats: the three vertices' x, y, z.
    void WriteTriangle(const float vertices[9]) override;
    // Raises "ERR_Failure" when announced triangles were not all written, and
    // the system's error when the triangles cannot be flushed to the file.
    void EndWriteTriangles() override;

private:
    bool _headerPending = true;
    std::uint64_t _expected = 0;  // announced triangles still to come
};
