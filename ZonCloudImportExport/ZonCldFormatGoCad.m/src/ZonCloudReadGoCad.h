#pragma once
#include <cstdint>
#include <string>
#include <vector>

#include "ZonCloudPolygonCursor.h"
#include "ZonCloudReadFile.h"
#include "ZonCloudSubMesh.h"
#include "ZonICloudReadOptTriangles.h"
#include "ZonICloudReadPolygonFile.h"
#include "ZonICloudReadPolygonParts.h"
#include "ZonCloudOwnedArrays.h"

class ZonCloudLineSource;

// Triangulated surfaces of GoCad text files ("GOCAD TSurf" blocks), merged
// into one polygon: the vertices of all surfaces in file order and their
// triangles, with each surface's name and end as a part of the polygon, and
// the label "CNXYZ" of control nodes. Blocks of other object types are
// skipped. Vertices are numbered by the file within each surface; a
// surface's numbers index a map as large as its vertex and atom lines, and a
// line whose number falls outside it is skipped.
//
// The analysis reads the file twice, once to count and once to read; the
// file is closed after it.
class ZON_CLD_API ZonCloudReadGoCad : public ZonCloudReadFile,
                                      public ZonICloudReadPolygonFile,
                                      public ZonICloudReadPolygonParts,
                                      public ZonICloudReadOptTriangles {
public:
    explicit ZonCloudReadGoCad(const ZonUnicodeString& fileName);
    ~ZonCloudReadGoCad() override;

    // ZonICloudReadFile: the vertices as a cloud.
    const float* GetPoints(unsigned& count) override;
    const double* GetPointsDouble(unsigned& count) override;
    bool HasDoublePrecision() override { return true; }

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

    // ZonICloudReadPolygonParts: the surfaces, and the control nodes' labels.
    const std::vector<ZonCloudPolygonPart>& GetPolygonParts() override;
    const std::vector<std::string>& GetVertexLabels() override;

    // ZonICloudReadOptTriangles: stored for the importer.
    void SetTriangles(bool create) override { _createTriangles = create; }
    void GetTriangles(bool& create) override { create = _createTriangles; }

    unsigned GetNumberOfControlNodes();

protected:
    // What an importer may take over at the end of an import.
    void ListOwnedArrays(ZonCloudOwnedArrays& arrays) override
    {
        arrays.Add(_vertices);
        arrays.Add(_verticesDouble);
        arrays.Add(_triangles);
    }
    void AnalyseFile() override;

private:
    struct SurfaceCount {
        std::uint64_t entries = 0;  // vertex and atom lines: the numbers its map holds
    };
    class Counting;
    template <class T>
    class Reading;
    template <class Pass>
    static void Walk(ZonCloudLineSource& lines, Pass& pass);
    template <class T>
    void Read(ZonCloudByteSource& source, const Counting& counts, std::vector<T>& vertices);
    const float* FloatVertices();
    const double* DoubleVertices();

    bool _inDouble = false;  // the precision the vertices were read in
    std::size_t _vertexCount = 0;
    std::vector<float> _vertices;
    std::vector<double> _verticesDouble;
    std::vector<std::uint32_t> _triangles;
    std::vector<ZonCloudPolygonPart> _parts;
    std::vector<std::string> _labels;
    unsigned _controlNodes = 0;
    bool _createTriangles = true;
    ZonCloudSubMesh _sub;
    ZonCloudPolygonCursor _cursor;
};
