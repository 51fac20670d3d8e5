#include "ZonCld3MFOutputDocument.h"

#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstdio>

#include "ZonCloudExportOutcome.h"
#include "ZonCloudNumberPrinter.h"
#include "ZonCloudPrintFormat.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudScanFormat.h"
#include "ZonCloudVertexTable.h"
#include "ZonIExchInstance.h"
#include "ZonIExchProductStructure.h"
#include "ZonObjectRegistry.h"

namespace {

const ZonRegistration Registration("MUXE_3MF_OutputDocument", ZonIExchOutputDocument::InterfaceName,
                                   [] { return std::make_shared<ZonCld3MFOutputDocument>(); });

constexpr int MaxDepth = 256;  // deeper product or node trees (or cycles) are refused
constexpr std::size_t FlushSize = std::size_t{1} << 20;

const char* const Declaration = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n";
const char* const ModelPart = "3D/3dmodel.model";

const std::string ContentTypes = std::string(Declaration) +
    "<Types xmlns=\"http://schemas.openxmlformats.org/package/2006/content-types\">\n"
    "<Default Extension=\"rels\" ContentType=\"application/vnd.openxmlformats-package.relationships+xml\" />\n"
    "<Default Extension=\"model\" ContentType=\"application/vnd.ms-package.3dmanufacturing-3dmodel+xml\" />\n"
    "</Types> \n";
const std::string PackageRelationships = std::string(Declaration) +
    "<Relationships xmlns=\"http://schemas.openxmlformats.org/package/2006/relationships\">\n"
    "<Relationship Target=\"/3D/3dmodel.model\" Id=\"rel0\" "
    "Type=\"http://schemas.microsoft.com/3dmanufacturing/2013/01/3dmodel\" />\n"
    "</Relationships> \n";
// Unlike the package's, this one ends without a blank before the line end.
const std::string ModelRelationships = std::string(Declaration) +
    "<Relationships xmlns=\"http://schemas.openxmlformats.org/package/2006/relationships\">\n"
    "</Relationships>\n";

[[noreturn]] void RaiseInput(const char* code) { ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, code); }
[[noreturn]] void RaiseSystem(int reason)
{
    errno = reason != 0 ? reason : EIO;
    ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, nullptr);
}

// Names go into attributes and text: the characters markup reserves are escaped.
std::string Escaped(const std::string& text)
{
    std::string out;
    out.reserve(text.size());
    for (const char c : text) {
        switch (c) {
            case '&': out += "&amp;"; break;
            case '<': out += "&lt;"; break;
            case '>': out += "&gt;"; break;
            case '"': out += "&quot;"; break;
            default: out += c; break;
        }
    }
    return out;
}

// "%f" of the value, as printf prints it under "C".
void AppendFixed(std::string& out, double value)
{
    char text[400];
    out.append(text, ZonCloudNumberPrinter::Fixed(text, value, 6));
}

void AppendNumber(std::string& out, std::uint64_t value)
{
    char text[24];
    out.append(text, std::to_chars(text, text + sizeof text, value).ptr);
}

}  // namespace

ZonHResult ZonCld3MFOutputDocument::SetFileName(const ZonUnicodeString& fileName)
{
    _fileName = fileName;
    return ZON_S_OK;
}

ZonHResult ZonCld3MFOutputDocument::SetOptions(const ZonListValZonString& names, const ZonListValZonString& values)
{
    if (names.size() != values.size()) return ZON_E_FAIL;
    bool unitGiven = false;
    for (std::size_t i = 0; i < names.size(); ++i) {
        const std::string& value = values[i];
        if (names[i] == "ExportUnit") {
            unitGiven = true;
            _unit = value.empty() ? "millimeter" : value;
        } else if (names[i] == "Scaling") {
            if (!value.empty()) ZonScan(value.c_str(), '.', "%le", &_scale);
        } else if (names[i] == "Strict") {
            int strict = 0;
            if (ZonScan(value.c_str(), '.', "%d", &strict) == 1) _strict = strict != 0;
        }
    }
    return unitGiven ? ZON_S_OK : ZON_E_FAIL;
}

ZonHResult ZonCld3MFOutputDocument::Open() { return _fileName.IsNull() ? ZON_E_FAIL : ZON_S_OK; }

std::string ZonCld3MFOutputDocument::PackageDirectoryOf(const std::string& target)
{
    const std::size_t slash = target.rfind('/');
    const std::size_t start = slash == std::string::npos ? 0 : slash + 1;
    std::string base = target.substr(start);
    // A leading dot starts the name, not an extension.
    if (const std::size_t dot = base.rfind('.'); dot != std::string::npos && dot > 0) base.resize(dot);
    return target.substr(0, start) + (base.empty() ? "Export_3MF" : base) + "_Zip_my_contained";
}

void ZonCld3MFOutputDocument::CreateDirectory(const std::string& path)
{
    if (::mkdir(path.c_str(), 0777) == 0) {
        _createdDirectories.push_back(path);
        return;
    }
    const int reason = errno;
    struct stat status;
    if (reason == EEXIST && ::stat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode)) return;
    RaiseSystem(reason);
}

void ZonCld3MFOutputDocument::OpenPart(const std::string& name)
{
    if (!_output.Open(_packageDirectory + "/" + name, "wt")) RaiseSystem(errno);
    _parts.push_back(name);
    _buffer.clear();
}

void ZonCld3MFOutputDocument::FlushBuffer()
{
    if (_buffer.empty()) return;
    _output.Write(_buffer.data(), _buffer.size());
    _buffer.clear();
}

void ZonCld3MFOutputDocument::ClosePart()
{
    FlushBuffer();
    _output.Close();
}

void ZonCld3MFOutputDocument::WritePart(const std::string& name, const char* text)
{
    OpenPart(name);
    Emit(text);
    ClosePart();
}

ZonHResult ZonCld3MFOutputDocument::Write(const ZonIExchInputDocument_var& document)
{
    if (!document || _fileName.IsNull()) return ZON_E_FAIL;
    ZonIExchProductStructure_var structure;
    ZonIExchTessRep_var rep;
    if (document->HasRepresentation(ZonIExchProductStructure::RepresentationType)) {
        structure = ZonQueryInterface<ZonIExchProductStructure>(
            document->GetRepresentation(ZonIExchProductStructure::RepresentationType));
        if (!structure || structure->GetNumberOfRoots() == 0) return ZON_E_FAIL;
    } else if (document->HasRepresentation(ZonIExchTessRep::RepresentationType)) {
        rep = ZonQueryInterface<ZonIExchTessRep>(document->GetRepresentation(ZonIExchTessRep::RepresentationType));
        if (!rep) RaiseInput("No TessellatedRep");
    } else {
        return ZON_E_FAIL;
    }

    _packageDirectory = PackageDirectoryOf(_fileName.ToUtf8());
    CreateDirectory(_packageDirectory);
    for (const char* directory : {"_rels", "3D", "Metadata", "3D/_rels"})
        CreateDirectory(_packageDirectory + "/" + directory);
    WritePart("[Content_Types].xml", ContentTypes.c_str());
    WritePart("_rels/.rels", PackageRelationships.c_str());
    WritePart("3D/_rels/3dmodel.model.rels", ModelRelationships.c_str());

    OpenPart(ModelPart);
    Emit(Declaration);
    Emit("<model unit=\"" + Escaped(_unit) +
         "\" xml:lang=\"en-US\" xmlns=\"http://schemas.microsoft.com/3dmanufacturing/core/2015/02\">\n");
    const std::string alias = document->GetAliasName().ToUtf8();
    if (!alias.empty())
        Emit((_strict ? "<metadata name=\"Title\">" : "<metadata type=\"name\">") + Escaped(alias) + "</metadata>\n");
    Emit("<resources>\n");
    if (structure) {
        for (unsigned r = 0; r < structure->GetNumberOfRoots(); ++r) {
            ZonIExchProduct_var root = structure->GetRoot(r);
            if (!root) return ZON_E_FAIL;
            WriteProduct(*root, ZonMathTransformation(), 0);
        }
    } else {
        WriteRepresentation(*rep, ZonMathTransformation(), alias);
    }
    Emit("</resources>\n");
    Emit("<build>\n");
    for (const std::string& item : _items) Emit(item);
    Emit("</build>\n");
    Emit("</model>\n");
    ClosePart();
    return ZON_S_OK;
}

void ZonCld3MFOutputDocument::WriteProduct(ZonIExchProduct& product, const ZonMathTransformation& placement,
                                           int depth)
{
    if (depth > MaxDepth) RaiseInput("ERR_Failure");
    if (product.HasTessellatedRep()) {
        ZonIExchTessRep_var rep = product.GetTessellatedRep();
        if (!rep) RaiseInput("No TessellatedRep");
        WriteRepresentation(*rep, placement, product.GetName().ToUtf8());
    }
    for (unsigned i = 0; i < product.GetNumberOfInstances(); ++i) {
        ZonIExchInstance_var instance = product.GetInstance(i);
        if (!instance) continue;
        ZonIExchProduct_var child = instance->GetProduct();
        if (child) WriteProduct(*child, placement * instance->GetPosition(), depth + 1);
    }
}

void ZonCld3MFOutputDocument::WriteRepresentation(ZonIExchTessRep& rep, const ZonMathTransformation& placement,
                                                  const std::string& name)
{
    for (unsigned i = 0; i < rep.GetNumberOfTopNodes(); ++i) {
        ZonIExchTessNode_var node = rep.GetTopNode(i);
        if (node) WriteTopNode(*node, placement, name, 0);
    }
}

// Groups are walked; a body is one object, and each of its child nodes
// another; a face node on its own is an object too.
void ZonCld3MFOutputDocument::WriteTopNode(ZonIExchTessNode& node, const ZonMathTransformation& parent,
                                           const std::string& name, int depth)
{
    if (depth > MaxDepth) RaiseInput("ERR_Failure");
    const ZonMathTransformation placement = parent * node.GetPositionTransformation();
    switch (node.GetType()) {
        case ZonExchNodeGroup:
        case ZonExchNodeLayer:
            for (unsigned i = 0; i < node.GetNumberOfChildren(); ++i) {
                ZonIExchTessNode_var child = node.GetChild(i);
                if (child) WriteTopNode(*child, placement, name, depth + 1);
            }
            break;
        case ZonExchNodeSolid:
        case ZonExchNodeShell:
        case ZonExchNodeSurface:
            WriteNode(node, placement, name);
            for (unsigned i = 0; i < node.GetNumberOfChildren(); ++i) {
                ZonIExchTessNode_var child = node.GetChild(i);
                if (child) WriteNode(*child, placement * child->GetPositionTransformation(), name);
            }
            break;
        default: WriteNode(node, placement, name); break;
    }
}

void ZonCld3MFOutputDocument::WriteNode(ZonIExchTessNode& node, const ZonMathTransformation& placement,
                                        const std::string& name)
{
    switch (node.GetType()) {
        case ZonExchNodeGroup:
        case ZonExchNodeSolid:
        case ZonExchNodeShell:
        case ZonExchNodeSurface:
        case ZonExchNodeLayer:
        case ZonExchNodeFace:
            WriteObject(node, placement, name);
            break;
        case ZonExchNodeScan: _scanSkipped = true; break;
        case ZonExchNodeCloud: _cloudSkipped = true; break;
        case ZonExchNodeGrid: _gridSkipped = true; break;
        default: break;
    }
}

// Two passes over the faces: the vertices (each distinct triple once,
// numbered in order of first appearance), then the triangles, strips and
// fans through the numbers the first pass gave.
void ZonCld3MFOutputDocument::WriteObject(ZonIExchTessNode& node, const ZonMathTransformation& placement,
                                          const std::string& name)
{
    struct Face {
        ZonIExchTessFace_var face;
        std::vector<std::uint32_t> numbers;  // vertex of the face -> vertex of the object
    };
    std::vector<Face> faces(node.GetNumberOfFaces());
    std::size_t corners = 0;
    for (unsigned i = 0; i < faces.size(); ++i) {
        faces[i].face = node.GetFace(i);
        if (!faces[i].face) RaiseInput("Fail to get the Face");
        unsigned valueCount = 0;
        if (faces[i].face->GetCoords(valueCount)) corners += valueCount / 3;
    }

    std::vector<float> vertices;
    ZonCloudVertexTable<float> table(vertices, corners);
    bool started = false;
    for (Face& face : faces) {
        unsigned valueCount = 0;
        const float* coords = face.face->GetCoords(valueCount);
        if (!coords) continue;
        face.numbers.resize(valueCount / 3);
        for (std::size_t v = 0; v < face.numbers.size(); ++v) {
            const std::size_t before = table.DistinctCount();
            const std::uint32_t number = table.Index(coords + 3 * v);
            face.numbers[v] = number;
            if (number != before) continue;
            if (!started) {
                started = true;
                const unsigned id = _strict ? _objectCount + 1 : _objectCount;
                ++_objectCount;
                Emit("<object id=\"" + std::to_string(id) + "\"" +
                     (name.empty() ? std::string() : " name=\"" + Escaped(name) + "\"") + ">\n");
                Emit("<mesh>\n");
                Emit("<vertices>\n");
                std::string item = "<item objectid=\"" + std::to_string(id) + "\"";
                if (!placement.IsIdentity()) {
                    // Row vectors times the matrix: its columns first, then the translation.
                    const auto& m = placement.GetMatrix();
                    const auto& t = placement.GetTranslation();
                    item += " transform=\"";
                    for (const int k : {0, 3, 6, 1, 4, 7, 2, 5, 8}) ZonPrint(item, "%g ", m[k]);
                    for (const double value : t) ZonPrint(item, "%g ", value * _scale);
                    item += "\"";
                }
                _items.push_back(item + "/> \n");
            }
            const float* p = coords + 3 * v;
            _buffer += "<vertex x=\"";
            AppendFixed(_buffer, _scale == 1.0 ? p[0] : p[0] * _scale);
            _buffer += "\" y=\"";
            AppendFixed(_buffer, _scale == 1.0 ? p[1] : p[1] * _scale);
            _buffer += "\" z=\"";
            AppendFixed(_buffer, _scale == 1.0 ? p[2] : p[2] * _scale);
            _buffer += "\" />\n";
            if (_buffer.size() >= FlushSize) FlushBuffer();
        }
    }
    if (!started) return;
    Emit("</vertices>\n");
    Emit("<triangles>\n");

    for (const Face& face : faces) {
        const std::vector<std::uint32_t>& numbers = face.numbers;
        // Indices are offsets into the coordinate array; the vertex is the offset / 3.
        auto vertex = [&](unsigned index) {
            const std::size_t v = index / 3;
            if (v >= numbers.size()) RaiseInput("ERR_Failure");
            return numbers[v];
        };
        auto triangle = [&](unsigned a, unsigned b, unsigned c) {
            const std::uint32_t va = vertex(a), vb = vertex(b), vc = vertex(c);
            _buffer += "<triangle v1=\"";
            AppendNumber(_buffer, va);
            _buffer += "\" v2=\"";
            AppendNumber(_buffer, vb);
            _buffer += "\" v3=\"";
            AppendNumber(_buffer, vc);
            _buffer += "\" />\n";
            if (_buffer.size() >= FlushSize) FlushBuffer();
        };
        ZonIExchTessFace& f = *face.face;
        unsigned triangleCount = 0;
        const unsigned* triangles = f.GetTriangles(triangleCount);
        if (!triangles) triangleCount = 0;
        for (unsigned t = 0; t < triangleCount; ++t)
            triangle(triangles[3 * t], triangles[3 * t + 1], triangles[3 * t + 2]);
        // Strips alternate their orientation: (i0 i1 i2), (i2 i1 i3), (i2 i3 i4), (i4 i3 i5) ...
        for (unsigned s = 0; s < f.GetNumberOfStrips(); ++s) {
            unsigned length = 0;
            const unsigned* strip = f.GetStrip(s, length);
            if (!strip || length < 3) continue;
            unsigned a = strip[0], b = strip[1];
            for (unsigned k = 2; k < length; ++k) {
                const unsigned c = strip[k];
                triangle(a, b, c);
                if (k % 2 == 1) b = c;
                else a = c;
            }
        }
        // Fans turn around their first index: (i0 i1 i2), (i0 i2 i3) ...
        for (unsigned n = 0; n < f.GetNumberOfFans(); ++n) {
            unsigned length = 0;
            const unsigned* fan = f.GetFan(n, length);
            if (!fan || length < 3) continue;
            unsigned b = fan[1];
            for (unsigned k = 2; k < length; ++k) {
                triangle(fan[0], b, fan[k]);
                b = fan[k];
            }
        }
    }
    Emit("</triangles>\n");
    Emit("</mesh>\n");
    Emit("</object>\n");
}

ZonHResult ZonCld3MFOutputDocument::Close()
{
    if (!_output.IsOpen()) return ZON_S_OK;
    ClosePart();
    return ZON_S_OK;
}

void ZonCld3MFOutputDocument::RemovePackageDirectory()
{
    if (_packageDirectory.empty()) return;
    for (const std::string& part : _parts) std::remove((_packageDirectory + "/" + part).c_str());
    // Deepest first; a directory that holds something we did not write stays.
    for (auto directory = _createdDirectories.rbegin(); directory != _createdDirectories.rend(); ++directory)
        ::rmdir(directory->c_str());
    _parts.clear();
    _createdDirectories.clear();
}

const char* ZonCld3MFOutputDocument::GetOutcomeCode() const
{
    if (_cloudSkipped && _scanSkipped && _gridSkipped) return "ERR_NotInMeshFile_Cloud_Scan_Grid";
    if (_cloudSkipped && _scanSkipped) return "ERR_NotInMeshFile_Cloud_Scan";
    if (_cloudSkipped && _gridSkipped) return "ERR_NotInMeshFile_Cloud_Grid";
    if (_scanSkipped && _gridSkipped) return "ERR_NotInMeshFile_Scan_Grid";
    if (_cloudSkipped) return "ERR_NotInMeshFile_Cloud";
    if (_scanSkipped) return "ERR_NotInMeshFile_Scan";
    if (_gridSkipped) return "ERR_NotInMeshFile_Grid";
    // No package is made without an object, so an empty document is not reported as written.
    if (_objectCount == 0) return "ERR_NoActivePolygons";
    return nullptr;
}

ZonHResult ZonCld3MFOutputDocument::Release()
{
    Close();
    const char* code = GetOutcomeCode();
    if (!code) return ZON_S_OK;
    ZonCloudExportOutcome::Report({code, _objectCount > 0 ? "Partial" : "Empty"}, _fileName,
                                  ZonCloudExportOutcome::NotWritten);
    return ZON_S_OK;
}
