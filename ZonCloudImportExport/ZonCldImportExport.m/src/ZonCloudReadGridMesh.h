#pragma once
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "ZonCloudPolygonCursor.h"
#include "ZonCloudReadFile.h"
#include "ZonCloudSubMesh.h"
#include "ZonICloudReadOptTriangles.h"
#include "ZonICloudReadPolygonFile.h"
#include "ZonCloudOwnedArrays.h"

// Common base of the readers of height rasters (terrain grids), which give
// their file as one polygon: a point per sample and two triangles per cell of
// four neighbouring samples. The derived reader's AnalyseFile reads the whole
// file into the points (single floats), calls BuildGridTriangles and
// FinishPoints; the base answers the cloud and polygon protocols from there.
// The source is closed once the analysis is done: everything is in memory.
class ZON_CLD_API ZonCloudReadGridMesh : public ZonCloudReadFile,
                                         public ZonICloudReadPolygonFile,
                                         public ZonICloudReadOptTriangles {
public:
    explicit ZonCloudReadGridMesh(const ZonUnicodeString& fileName);
    ~ZonCloudReadGridMesh() override;

    // ZonICloudReadFile
    const float* GetPoints(unsigned& count) override;
    const double* GetPointsDouble(unsigned& count) override;
    bool HasDoublePrecision() override { return true; }
    // One text per point when the grid has void samples: empty, or the void
    // mark for a void sample; null when every sample is valid.
    const void* GetPointAttributes3(unsigned& count) override;

    // ZonICloudReadPolygonFile: one polygon per file.
    void BeginGetPolygon() override;
    bool NextPolygon() override;
    bool IsClosedPolygon() override { return false; }
    bool IsOrientedPolygon() override { return false; }
    const float* GetPolygonPoints(unsigned& count) override { return GetPoints(count); }
    const unsigned* NextTriangle() override;
    const unsigned* NextTriangleInBox() override { return _cursor.NextTriangleInBox(); }
    const unsigned* GetTriangles(unsigned& count) override;
    const unsigned* GetTrianglesInBox(const ZonMathBox& box, unsigned& count, const float*& vertices,
                                      unsigned& vertexCount) override;
    unsigned GetNumberOfTriangles() override;

    // ZonICloudReadOptTriangles: stored for the importer.
    void SetTriangles(bool create) override { _createTriangles = create; }
    void GetTriangles(bool& create) override { create = _createTriangles; }

    // The text of a void sample.
    static constexpr const char* VoidText = "InvalidPoint";

protected:
    // What an importer may take over at the end of an import.
    void ListOwnedArrays(ZonCloudOwnedArrays& arrays) override
    {
        arrays.Add(_points);
        arrays.Add(_pointsDouble);
        arrays.Add(_triangles);
    }
    // The triangles of `rows` rows of `columns` points, in row order: for the
    // cell whose first point is b, (b, b + columns, b + 1) then
    // (b + 1, b + columns, b + columns + 1). A triangle with a corner at or
    // past `points` (a grid whose last rows are short) is left out. Raises the
    // memory error when the count would not fit in 32 bits.
    void BuildGridTriangles(std::uint64_t rows, std::uint64_t columns, std::uint64_t points);
    // Room for `count` points; the memory error when 32-bit counts cannot
    // number them. The caller has checked that the file holds them.
    void ReservePoints(std::uint64_t count);
    // Sets the point count, the box (of the stored floats; NaN widens nothing)
    // and the type; raises "ERR_NoPointFound" when there is no point.
    void FinishPoints();
    // The points in double precision. By default the floats widened; a format
    // whose coordinates are finer than floats computes them again.
    virtual void ComputeDoublePoints(std::vector<double>& points);

    std::vector<float> _points;                // x, y, z per sample
    std::vector<std::uint32_t> _triangles;     // three point indices each
    std::vector<unsigned char> _valid;         // empty, or a byte per point: 0 for a void sample

private:
    bool _createTriangles = true;
    std::vector<double> _pointsDouble;
    std::vector<std::string> _texts;
    ZonCloudSubMesh _sub;
    ZonCloudPolygonCursor _cursor;
};
