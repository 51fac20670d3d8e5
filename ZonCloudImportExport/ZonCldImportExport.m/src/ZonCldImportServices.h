#pragma once
#include <memory>
#include <vector>

#include "ZonCldExport.h"
#include "ZonMath.h"
#include "ZonUnicodeString.h"

class ZonCldBody;
class ZonGeoFactoryProtected;

// The one door through which a file is imported as a cloud body.
class ZON_CLD_API ZonCldImportServices {
public:
    // The lower-cased extension of a path, dot included ("" when there is none).
    static ZonUnicodeString ExtensionOf(const ZonUnicodeString& fileName);
    // The name of the first format (in the list order of the importer) whose
    // filter holds "*" followed by the file's extension; raises
    // "ERR_UnknownExtension" when none does.
    static ZonUnicodeString FindFormatOfFile(const ZonUnicodeString& fileName);

    static std::shared_ptr<ZonCldBody> BuildCldBodyFromFile(ZonGeoFactoryProtected& factory,
                                                            const ZonUnicodeString& fileName,
                                                            const ZonMathTransformation& transformationIn,
                                                            ZonMathTransformation& transformationOut, ZonMathBox& box,
                                                            std::vector<ZonString>& messages);
    static void BuildCldBodyListFromFile(ZonGeoFactoryProtected& factory, const ZonUnicodeString& fileName,
                                         const ZonMathTransformation& transformationIn,
                                         ZonMathTransformation& transformationOut, ZonMathBox& box,
                                         std::vector<std::shared_ptr<ZonCldBody>>& bodies, ZonString& statistics);
    static ZonString GetNLSStatFromKey(const ZonString& key);
};
