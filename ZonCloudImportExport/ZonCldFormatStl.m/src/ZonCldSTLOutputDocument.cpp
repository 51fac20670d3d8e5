#include "ZonCldSTLOutputDocument.h"

#include <algorithm>

#include "ZonCldSTLBinaryFormat.h"
#include "ZonCloudExportOutcome.h"
#include "ZonCloudLineFormat.h"
#include "ZonCloudPrintFormat.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudScanFormat.h"
#include "ZonIExchInstance.h"
#include "ZonIExchProductStructure.h"
#include "ZonObjectRegistry.h"

namespace {

const ZonRegistration CldRegistration("CLD_STL_OutputDocument", ZonIExchOutputDocument::InterfaceName,
                                      [] { return std::make_shared<ZonCldSTLOutputDocument>(); });
const ZonRegistration MuxeRegistration("MUXE_STL_OutputDocument", ZonIExchOutputDocument::InterfaceName,
                                       [] { return std::make_shared<ZonCldSTLOutputDocument>(); });

// Product structures and node trees are walked recursively; a document that
// nests deeper than this (or instantiates itself) is refused.
constexpr int MaxDepth = 256;

// The alias name is a format without arguments: "%%" gives one per cent
// sign. Any other directive is written as it stands rather than reading an
// argument that is not there.
std::string ExpandAlias(const std::string& alias)
{
    std::string text;
    for (std::size_t i = 0; i < alias.size(); ++i) {
        text += alias[i];
        if (alias[i] == '%' && i + 1 < alias.size() && alias[i + 1] == '%') ++i;
    }
    return text;
}

[[noreturn]] void RaiseInput(const char* code) { ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, code); }

const ZonCloudLineFormat Facet("  facet normal %e %e %e\n"
                               "    outer loop\n"
                               "      vertex %e %e %e\n"
                               "      vertex %e %e %e\n"
                               "      vertex %e %e %e\n"
                               "    endloop\n"
                               "  endfacet\n");

}  // namespace

ZonCldSTLOutputDocument::ZonCldSTLOutputDocument()
    : _facets(12, [](ZonCloudTextBuffer& out, const double* facet) {
          out.Commit(Facet.Print(out.Reserve(Facet.Bound()), facet));
      })
{
}

ZonHResult ZonCldSTLOutputDocument::SetFileName(const ZonUnicodeString& fileName)
{
    _fileName = fileName;
    return ZON_S_OK;
}

ZonHResult ZonCldSTLOutputDocument::SetOptions(const ZonListValZonString& names, const ZonListValZonString& values)
{
    if (names.size() != values.size()) return ZON_E_FAIL;
    for (std::size_t i = 0; i < names.size(); ++i) {
        const std::string& value = values[i];
        if (names[i] == "Precision") {
            _precision = value.empty() ? "precUnknown" : value;
        } else if (names[i] == "Scaling") {
            // Option values are in the "C" notation; an unreadable one leaves the factor as it was.
            if (!value.empty()) ZonScan(value.c_str(), '.', "%le", &_scale);
        } else if (names[i] == "BinaryState") {
            int state = _binary ? 1 : 0;
            if (!value.empty() && ZonScan(value.c_str(), '.', "%d", &state) == 1) _binary = state != 0;
        }
    }
    return ZON_S_OK;
}

ZonHResult ZonCldSTLOutputDocument::Open()
{
    // Binary files are opened for update: each face rewrites the count.
    _facets.Discard();
    if (!_output.Open(_fileName, _binary ? "w+b" : "wt")) return ZON_E_FAIL;
    _headerPending = _binary;
    return ZON_S_OK;
}

ZonHResult ZonCldSTLOutputDocument::Write(const ZonIExchInputDocument_var& document)
{
    if (!document) return ZON_E_FAIL;
    if (!_binary) {
        if (!_output.IsOpen()) RaiseInput("No File");
        _facets.Flush(_output);
        _output.Print("solid %s \n", ExpandAlias(document->GetAliasName().ToUtf8()).c_str());
    }
    if (document->HasRepresentation(ZonIExchProductStructure::RepresentationType)) {
        auto structure = ZonQueryInterface<ZonIExchProductStructure>(
            document->GetRepresentation(ZonIExchProductStructure::RepresentationType));
        if (!structure || structure->GetNumberOfRoots() == 0) return ZON_E_FAIL;
        for (unsigned r = 0; r < structure->GetNumberOfRoots(); ++r) {
            ZonIExchProduct_var root = structure->GetRoot(r);
            if (!root) return ZON_E_FAIL;
            WriteProduct(*root, ZonMathTransformation(), 0);
        }
    } else if (document->HasRepresentation(ZonIExchTessRep::RepresentationType)) {
        auto rep = ZonQueryInterface<ZonIExchTessRep>(document->GetRepresentation(ZonIExchTessRep::RepresentationType));
        if (!rep) RaiseInput("No TessellatedRep");
        WriteRepresentation(*rep, ZonMathTransformation());
    }
    return ZON_S_OK;
}

void ZonCldSTLOutputDocument::WriteProduct(ZonIExchProduct& product, const ZonMathTransformation& placement,
                                           int depth)
{
    if (depth > MaxDepth) RaiseInput("ERR_Failure");
    if (product.HasTessellatedRep()) {
        ZonIExchTessRep_var rep = product.GetTessellatedRep();
        if (!rep) RaiseInput("No TessellatedRep");
        WriteRepresentation(*rep, placement);
    }
    for (unsigned i = 0; i < product.GetNumberOfInstances(); ++i) {
        ZonIExchInstance_var instance = product.GetInstance(i);
        if (!instance) continue;
        ZonIExchProduct_var child = instance->GetProduct();
        if (child) WriteProduct(*child, placement * instance->GetPosition(), depth + 1);
    }
}

void ZonCldSTLOutputDocument::WriteRepresentation(ZonIExchTessRep& rep, const ZonMathTransformation& placement)
{
    _readDouble = _precision == "precDouble" && rep.HasDoublePrecision();
    for (unsigned i = 0; i < rep.GetNumberOfTopNodes(); ++i) {
        ZonIExchTessNode_var node = rep.GetTopNode(i);
        if (node) WriteTopNode(*node, placement, 0);
    }
}

// Groups (types 1 and 5) are walked; bodies (2 to 4) give their own faces
// and then their child nodes one by one; a face node (6) and every other
// kind are written as nodes.
void ZonCldSTLOutputDocument::WriteTopNode(ZonIExchTessNode& node, const ZonMathTransformation& parent, int depth)
{
    if (depth > MaxDepth) RaiseInput("ERR_Failure");
    const ZonMathTransformation placement = parent * node.GetPositionTransformation();
    switch (node.GetType()) {
        case ZonExchNodeGroup:
        case ZonExchNodeLayer:
            for (unsigned i = 0; i < node.GetNumberOfChildren(); ++i) {
                ZonIExchTessNode_var child = node.GetChild(i);
                if (child) WriteTopNode(*child, placement, depth + 1);
            }
            break;
        case ZonExchNodeSolid:
        case ZonExchNodeShell:
        case ZonExchNodeSurface:
            WriteNode(node, placement);
            for (unsigned i = 0; i < node.GetNumberOfChildren(); ++i) {
                ZonIExchTessNode_var child = node.GetChild(i);
                if (child) WriteNode(*child, placement * child->GetPositionTransformation());
            }
            break;
        default: WriteNode(node, placement); break;
    }
}

void ZonCldSTLOutputDocument::WriteNode(ZonIExchTessNode& node, const ZonMathTransformation& placement)
{
    switch (node.GetType()) {
        case ZonExchNodeGroup:
        case ZonExchNodeSolid:
        case ZonExchNodeShell:
        case ZonExchNodeSurface:
        case ZonExchNodeLayer:
        case ZonExchNodeFace:
            _meshFound = true;
            WriteFaces(node, placement);
            break;
        case ZonExchNodeScan: _scanSkipped = true; break;
        case ZonExchNodeCloud: _cloudSkipped = true; break;
        case ZonExchNodeGrid: _gridSkipped = true; break;
        default: break;
    }
}

void ZonCldSTLOutputDocument::WriteFaces(ZonIExchTessNode& node, const ZonMathTransformation& placement)
{
    for (unsigned i = 0; i < node.GetNumberOfFaces(); ++i) {
        ZonIExchTessFace_var face = node.GetFace(i);
        if (!face) RaiseInput("Fail to get the Face");
        WriteFace(*face, placement);
    }
}

void ZonCldSTLOutputDocument::WriteFace(ZonIExchTessFace& face, const ZonMathTransformation& placement)
{
    unsigned valueCount = 0;
    if (_readDouble) {
        const double* coords = face.GetCoordsDouble(valueCount);
        WriteFacets(face, coords, valueCount, placement);
    } else {
        const float* coords = face.GetCoords(valueCount);
        WriteFacets(face, coords, valueCount, placement);
    }
}

template <class T>
void ZonCldSTLOutputDocument::WriteFacets(ZonIExchTessFace& face, const T* coords, unsigned valueCount,
                                          const ZonMathTransformation& placement)
{
    unsigned triangleCount = 0;
    const unsigned* triangles = face.GetTriangles(triangleCount);
    if (!triangles) triangleCount = 0;
    const unsigned strips = face.GetNumberOfStrips();
    const unsigned fans = face.GetNumberOfFans();
    if (triangleCount == 0 && strips == 0 && fans == 0) return;
    _facetsWritten = true;

    if (_binary) {
        std::uint64_t count = triangleCount;
        for (unsigned s = 0; s < strips; ++s) {
            unsigned length = 0;
            if (face.GetStrip(s, length) && length > 2) count += length - 2;
        }
        for (unsigned f = 0; f < fans; ++f) {
            unsigned length = 0;
            if (face.GetFan(f, length) && length > 2) count += length - 2;
        }
        if (!_output.IsOpen()) RaiseInput("No File");
        ZonCldSTLBinaryFormat::AnnounceTriangles(_output, _headerPending, count, _reverseBytes);
    }

    const std::uint64_t vertexCount = valueCount / 3;
    // Indices are offsets into the coordinate array; the vertex is the offset / 3.
    auto vertex = [&](unsigned index) {
        if (!coords) RaiseInput("No Coords");
        const std::uint64_t v = index / 3;
        if (v >= vertexCount) RaiseInput("ERR_Failure");
        return placement.Apply(ZonMathPoint(coords[3 * v], coords[3 * v + 1], coords[3 * v + 2]));
    };
    auto facet = [&](unsigned a, unsigned b, unsigned c) { WriteFacet(vertex(a), vertex(b), vertex(c)); };

    for (unsigned t = 0; t < triangleCount; ++t) facet(triangles[3 * t], triangles[3 * t + 1], triangles[3 * t + 2]);
    // Strips alternate their orientation: (i0 i1 i2), (i2 i1 i3), (i2 i3 i4), (i4 i3 i5) ...
    for (unsigned s = 0; s < strips; ++s) {
        unsigned length = 0;
        const unsigned* strip = face.GetStrip(s, length);
        if (!strip || length < 3) continue;
        unsigned a = strip[0], b = strip[1];
        for (unsigned k = 2; k < length; ++k) {
            const unsigned c = strip[k];
            facet(a, b, c);
            if (k % 2 == 1) b = c;
            else a = c;
        }
    }
    // Fans turn around their first index: (i0 i1 i2), (i0 i2 i3) ...
    for (unsigned f = 0; f < fans; ++f) {
        unsigned length = 0;
        const unsigned* fan = face.GetFan(f, length);
        if (!fan || length < 3) continue;
        const unsigned a = fan[0];
        unsigned b = fan[1];
        for (unsigned k = 2; k < length; ++k) {
            facet(a, b, fan[k]);
            b = fan[k];
        }
    }
}

void ZonCldSTLOutputDocument::WriteFacet(const ZonMathPoint& a, const ZonMathPoint& b, const ZonMathPoint& c)
{
    if (!_output.IsOpen()) RaiseInput("No File");
    double vertices[9] = {a[0], a[1], a[2], b[0], b[1], b[2], c[0], c[1], c[2]};
    if (_scale != 1.0)
        for (double& value : vertices) value *= _scale;
    double normal[3];
    ZonCldSTLBinaryFormat::Normal(vertices, normal);
    if (_binary) {
        float n[3], v[9];
        for (int i = 0; i < 3; ++i) n[i] = static_cast<float>(normal[i]);
        for (int i = 0; i < 9; ++i) v[i] = static_cast<float>(vertices[i]);
        ZonCldSTLBinaryFormat::WriteFacet(_output, n, v, _reverseBytes);
        return;
    }
    double* facet = _facets.Add(_output);
    std::copy(normal, normal + 3, facet);
    std::copy(vertices, vertices + 9, facet + 3);
}

ZonHResult ZonCldSTLOutputDocument::Close()
{
    if (!_output.IsOpen()) return ZON_S_OK;
    if (!_binary) {
        _facets.Flush(_output);
        _output.Print("endsolid\n");
    }
    _output.Close();
    return ZON_S_OK;
}

const char* ZonCldSTLOutputDocument::GetOutcomeCode() const
{
    if (_cloudSkipped && _scanSkipped && _gridSkipped) return "ERR_NotInMeshFile_Cloud_Scan_Grid";
    if (_cloudSkipped && _scanSkipped) return "ERR_NotInMeshFile_Cloud_Scan";
    if (_cloudSkipped && _gridSkipped) return "ERR_NotInMeshFile_Cloud_Grid";
    if (_scanSkipped && _gridSkipped) return "ERR_NotInMeshFile_Scan_Grid";
    if (_cloudSkipped) return "ERR_NotInMeshFile_Cloud";
    if (_scanSkipped) return "ERR_NotInMeshFile_Scan";
    if (_gridSkipped) return "ERR_NotInMeshFile_Grid";
    if (!_meshFound) return "ERR_FILESUCCESSFULL";
    if (!_facetsWritten) return "ERR_NoActivePolygons";
    return nullptr;
}

int ZonCldSTLOutputDocument::GetOutcomeLevel() const
{
    const char* code = GetOutcomeCode();
    if (!code) return 0;
    return std::string_view(code) == "ERR_FILESUCCESSFULL" ? 1 : 4;
}

ZonHResult ZonCldSTLOutputDocument::Release()
{
    Close();
    if (_output.HasFailed()) return ZON_E_FAIL;
    if (!_meshFound && !_fileName.IsNull()) std::remove(_fileName.c_str());
    const char* code = GetOutcomeCode();
    if (!code) return ZON_S_OK;
    ZonCloudExportOutcome::Report({code, _facetsWritten ? "Partial" : "Empty"}, _fileName, GetOutcomeLevel());
    return ZON_S_OK;
}
