#pragma once
#include <string>
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonCloudOutputFile.h"
#include "ZonIExchOutputDocument.h"
#include "ZonIExchProduct.h"
#include "ZonIExchTessRep.h"
#include "ZonMath.h"

// Writes the meshes of an exchange document as the parts of a 3MF package,
// laid out as a directory tree beside the target ("<base>_Zip_my_contained")
// that the exporter then packs into the target and removes (registered as
// "MUXE_3MF_OutputDocument"). The document is walked as for STL; each mesh
// body becomes one object whose vertices are merged on their exact
// single-precision coordinates, and its placement travels in the build item
// rather than in the coordinates. Clouds, scans and grids are noted and
// reported on release.
class ZON_CLD_API ZonCld3MFOutputDocument : public ZonBaseUnknown, public ZonIExchOutputDocument {
public:
    ZonCld3MFOutputDocument() = default;
    ~ZonCld3MFOutputDocument() override = default;
    ZonCld3MFOutputDocument(const ZonCld3MFOutputDocument&) = delete;
    ZonCld3MFOutputDocument& operator=(const ZonCld3MFOutputDocument&) = delete;

    // The target package; the tree goes into its directory.
    ZonHResult SetFileName(const ZonUnicodeString& fileName) override;
    // "ExportUnit" is required (empty: "millimeter"); "Scaling" multiplies
    // every coordinate written; "Strict" ("1") numbers objects from 1 and
    // names the document with a "Title" metadata, as strict readers demand.
    // Unequal lists or no unit fail.
    ZonHResult SetOptions(const ZonListValZonString& names, const ZonListValZonString& values) override;
    ZonHResult Open() override;
    // Creates the directories and writes the parts. Fails without a
    // document, a target or a root; a directory or part that cannot be
    // created raises the system's error.
    ZonHResult Write(const ZonIExchInputDocument_var& document) override;
    ZonHResult Close() override;
    // Reports the outcome (the same codes as STL).
    ZonHResult Release() override;

    // "<dir>/<base>_Zip_my_contained", or "<dir>/Export_3MF_Zip_my_contained" without a base name.
    static std::string PackageDirectoryOf(const std::string& target);
    const std::string& GetPackageDirectory() const { return _packageDirectory; }
    // The parts written, in order, as names inside the package ('/' separators).
    const std::vector<std::string>& GetPartNames() const { return _parts; }
    // Removes the parts and the directories this document created; anything
    // else found there is left alone.
    void RemovePackageDirectory();

    unsigned GetObjectCount() const { return _objectCount; }
    const char* GetOutcomeCode() const;
    const std::string& GetUnit() const { return _unit; }

private:
    void CreateDirectory(const std::string& path);
    void OpenPart(const std::string& name);
    void ClosePart();
    void WritePart(const std::string& name, const char* text);
    void Emit(const char* text) { _buffer += text; }
    void Emit(const std::string& text) { _buffer += text; }
    void FlushBuffer();

    void WriteProduct(ZonIExchProduct& product, const ZonMathTransformation& placement, int depth);
    void WriteRepresentation(ZonIExchTessRep& rep, const ZonMathTransformation& placement, const std::string& name);
    void WriteTopNode(ZonIExchTessNode& node, const ZonMathTransformation& parent, const std::string& name, int depth);
    void WriteNode(ZonIExchTessNode& node, const ZonMathTransformation& placement, const std::string& name);
    void WriteObject(ZonIExchTessNode& node, const ZonMathTransformation& placement, const std::string& name);

    ZonUnicodeString _fileName;
    std::string _unit;
    double _scale = 1.0;
    bool _strict = false;
    std::string _packageDirectory;
    std::vector<std::string> _createdDirectories;
    std::vector<std::string> _parts;
    ZonCloudOutputFile _output;
    std::string _buffer;  // text of the open part not yet handed to the file
    std::vector<std::string> _items;
    unsigned _objectCount = 0;
    bool _cloudSkipped = false;
    bool _scanSkipped = false;
    bool _gridSkipped = false;
};
