#pragma once
#include <string>

#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonCloudOutputFile.h"
#include "ZonCloudPendingLines.h"
#include "ZonIExchOutputDocument.h"
#include "ZonIExchProduct.h"
#include "ZonIExchTessRep.h"
#include "ZonMath.h"

// Writes the meshes of an exchange document as one STL file, binary or text
// (registered as "CLD_STL_OutputDocument" and "MUXE_STL_OutputDocument").
// Product structures are walked through their instances, composing the
// placements; tessellated nodes give their faces, whose separate triangles,
// strips and fans become facets. Clouds, scans and grids cannot go into a
// mesh file: they are noted and reported on release. A write or close that
// fails removes the file and raises the system's error.
class ZON_CLD_API ZonCldSTLOutputDocument : public ZonBaseUnknown, public ZonIExchOutputDocument {
public:
    ZonCldSTLOutputDocument();
    ~ZonCldSTLOutputDocument() override = default;
    ZonCldSTLOutputDocument(const ZonCldSTLOutputDocument&) = delete;
    ZonCldSTLOutputDocument& operator=(const ZonCldSTLOutputDocument&) = delete;

    ZonHResult SetFileName(const ZonUnicodeString& fileName) override;
    // "Precision" ("precDouble" reads double-precision representations in
    // double), "Scaling" (factor on every coordinate), "BinaryState" (1
    // binary, 0 text); unknown names are ignored.
    ZonHResult SetOptions(const ZonListValZonString& names, const ZonListValZonString& values) override;
    ZonHResult Open() override;
    ZonHResult Write(const ZonIExchInputDocument_var& document) override;
    ZonHResult Close() override;
    // Deletes the target when no mesh was met, then reports the outcome; a
    // file lost to a failed write reports nothing and fails.
    ZonHResult Release() override;

    // The outcome Release reports: the code after "ZonCldExportCmd." and its
    // level, or null when all went into the file.
    const char* GetOutcomeCode() const;
    int GetOutcomeLevel() const;

    bool IsBinary() const { return _binary; }
    double GetScale() const { return _scale; }
    const std::string& GetPrecision() const { return _precision; }
    bool IsMeshFound() const { return _meshFound; }
    bool AreFacetsWritten() const { return _facetsWritten; }

private:
    void WriteProduct(ZonIExchProduct& product, const ZonMathTransformation& placement, int depth);
    void WriteRepresentation(ZonIExchTessRep& rep, const ZonMathTransformation& placement);
    void WriteTopNode(ZonIExchTessNode& node, const ZonMathTransformation& parent, int depth);
    void WriteNode(ZonIExchTessNode& node, const ZonMathTransformation& placement);
    void WriteFaces(ZonIExchTessNode& node, const ZonMathTransformation& placement);
    void WriteFace(ZonIExchTessFace& face, const ZonMathTransformation& placement);
    template <class T>
    void WriteFacets(ZonIExchTessFace& face, const T* coords, unsigned valueCount,
                     const ZonMathTransformation& placement);
    void WriteFacet(const ZonMathPoint& a, const ZonMathPoint& b, const ZonMathPoint& c);

    ZonUnicodeString _fileName;
    ZonCloudOutputFile _output;
    // Text facets (normal and three vertices) waiting to be formatted.
    ZonCloudPendingLines _facets;
    bool _binary = true;
    bool _headerPending = true;
    bool _reverseBytes = false;  // never set here; the layout allows it
    std::string _precision;
    double _scale = 1.0;
    bool _meshFound = false;
    bool _facetsWritten = false;
    bool _cloudSkipped = false;
    bool _scanSkipped = false;
    bool _gridSkipped = false;
    bool _readDouble = false;  // the representation being written is read in double precision
};
