#pragma once
#include <memory>
#include <string>
#include <vector>

#include "ZonCldExport.h"
#include "ZonMath.h"
#include "ZonUnicodeString.h"

class ZonCldBody;
class ZonGeoFactoryProtected;

// The one door through which a file is imported as a cloud body.
//
// The box is both ways: on entry the import box in the file's own
// coordinates (empty: take everything), on return the box of what was
// created, in the document's millimetres. The caller's transformation becomes
// the body's placement; transformationOut receives its inverse (the identity
// when it is the identity), which maps document positions back to the file.
// `messages` receives the engine's notes, then the statistics text last.
class ZON_CLD_API ZonCldImportServices {
public:
    // The lower-cased extension of a path, dot included ("" when there is none).
    static ZonUnicodeString ExtensionOf(const ZonUnicodeString& fileName);
    // The name of the first format (in the list order of the importer) whose
    // filter holds "*" followed by the file's extension; raises
    // "ERR_UnknownExtension", naming the known extensions, when none does.
    static ZonUnicodeString FindFormatOfFile(const ZonUnicodeString& fileName);
    // Every format whose filter holds the file's extension, in the same order
    // (the first is the one FindFormatOfFile takes).
    static std::vector<ZonUnicodeString> FormatsOfFile(const ZonUnicodeString& fileName);
    // The extensions of every format that can be read, lower-cased, each once: ".asc .stl ...".
    static std::string KnownExtensions();

    static std::shared_ptr<ZonCldBody> BuildCldBodyFromFile(ZonGeoFactoryProtected& factory,
                                                            const ZonUnicodeString& fileName,
                                                            const ZonMathTransformation& transformationIn,
                                                            ZonMathTransformation& transformationOut, ZonMathBox& box,
                                                            std::vector<ZonString>& messages);
    // The same with the format named by the caller instead of the extension's.
    static std::shared_ptr<ZonCldBody> BuildCldBodyWithFormat(ZonGeoFactoryProtected& factory,
                                                              const ZonUnicodeString& formatName,
                                                              const ZonUnicodeString& fileName,
                                                              const ZonMathTransformation& transformationIn,
                                                              ZonMathTransformation& transformationOut,
                                                              ZonMathBox& box, std::vector<ZonString>& messages);
    // Reports a module error to the session's reporter instead of raising it,
    // and then appends nothing. `statistics` receives the messages, one a line.
    static void BuildCldBodyListFromFile(ZonGeoFactoryProtected& factory, const ZonUnicodeString& fileName,
                                         const ZonMathTransformation& transformationIn,
                                         ZonMathTransformation& transformationOut, ZonMathBox& box,
                                         std::vector<std::shared_ptr<ZonCldBody>>& bodies, ZonString& statistics);
    static ZonString GetNLSStatFromKey(const ZonString& key);
};
