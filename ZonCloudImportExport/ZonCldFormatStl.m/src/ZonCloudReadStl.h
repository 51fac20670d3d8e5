#pragma once
#include <cstdint>
#include <vector>

#include "ZonCloudPolygonCursor.h"
#include "ZonCloudReadFile.h"
#include "ZonCloudSubMesh.h"
#include "ZonICloudReadOptBinMachine.h"
#include "ZonICloudReadOptFreeEdges.h"
#include "ZonICloudReadOptTriangles.h"
#include "ZonICloudReadPolygonFile.h"
#include "ZonCloudOwnedArrays.h"

// Reads stereolithography files, text or binary, as one triangle mesh: the
// distinct vertices in order of first appearance and the triangles in file
// order. Normals and attribute words are read past. The analysis finds the
// form, the triangle count and the box; the mesh itself is read on the first
// request for vertices or triangles, and the stream is closed after that.
class ZON_CLD_API ZonCloudReadStl : public ZonCloudReadFile,
                                   public ZonICloudReadPolygonFile,
                                   public ZonICloudReadOptBinMachine,
                                   public ZonICloudReadOptFreeEdges,
                                   public ZonICloudReadOptTriangles {
public:
    explicit ZonCloudReadStl(const ZonUnicodeString& fileName);
    ~ZonCloudReadStl() override;

    // ZonICloudReadFile: the mesh's distinct vertices as a cloud.
    int GetNumberOfPoints() override;
    const float* GetPoints(unsigned& count) override;
    const double* GetPointsDouble(unsigned& count) override;
    bool HasDoublePrecision() override { return true; }

    // ZonICloudReadPolygonFile: one polygon per file.
    void BeginGetPolygon() override;
    bool NextPolygon() override;
    bool IsClosedPolygon() override { return false; }
    bool IsOrientedPolygon() override { return false; }
    const float* GetPolygonPoints(unsigned& count) override;
    const unsigned* NextTriangle() override;
    const unsigned* NextTriangleInBox() override;
    const unsigned* GetTriangles(unsigned& count) override;
    const unsigned* GetTrianglesInBox(const ZonMathBox& box, unsigned& count, const float*& vertices,
                                      unsigned& vertexCount) override;
    // From the analysis, without reading the mesh.
    unsigned GetNumberOfTriangles() override;

    // ZonICloudReadOptBinMachine. Detection overrides the value on analysis;
    // afterwards the getter tells what was detected (1 or 2).
    void SetBinaryFrom(int from) override;
    void GetBinaryFrom(int& from) override { from = _byteOrder; }
    // ZonICloudReadOptFreeEdges and ZonICloudReadOptTriangles: stored for the importer.
    void SetFreeEdges(bool create) override { _freeEdges = create; }
    void GetFreeEdges(bool& create) override { create = _freeEdges; }
    void SetTriangles(bool create) override { _createTriangles = create; }
    void GetTriangles(bool& create) override { create = _createTriangles; }

    // Runs the analysis if needed.
    bool IsTextFile();

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
    void Reset();
    bool IsTextCandidate();
    bool HasVertexLineNearStart();
    void AnalyseText();
    // What a text analysis keeps, on both paths: counts from the corners
    // found (none is an error), the box and the decimal separator used.
    void KeepTextAnalysis(std::uint64_t corners, const ZonMathBox& box, bool separatorSwitched);
    void AnalyseBinary();
    // Large files, read on every core from the mapped file: the analysis
    // merges the mesh on the way, so the file is read once.
    template <class T>
    void AnalyseTextInChunks(const unsigned char* text, std::vector<T>& vertices);
    void AnalyseBinaryInChunks(const unsigned char* mapped, std::uint64_t records);
    void LoadMesh();
    template <class T>
    void ReadTextMesh(std::vector<T>& vertices);
    void ReadBinaryMesh();
    const float* FloatVertices();
    const double* DoubleVertices();
    unsigned DistinctCount() const { return static_cast<unsigned>(_distinctCount); }

    bool _isText = false;
    bool _separatorSwitched = false;
    bool _nativeOrder = true;
    int _byteOrder = Unknown;
    std::uint32_t _vertexCount = 0;    // corners before merging: 3 x triangles
    std::uint32_t _triangleCount = 0;  // from the analysis
    bool _freeEdges = false;
    bool _createTriangles = true;

    // The mesh, read once. It is merged in the precision asked at reading
    // time; the other precision is a converted copy made on request.
    bool _meshLoaded = false;
    bool _meshInDouble = false;
    // The analysis already merged the mesh, in this precision.
    bool _premerged = false;
    bool _premergedInDouble = false;
    std::size_t _distinctCount = 0;
    std::vector<float> _vertices;
    std::vector<double> _verticesDouble;
    std::vector<std::uint32_t> _triangles;
    ZonCloudSubMesh _sub;
    ZonCloudPolygonCursor _cursor;
};
