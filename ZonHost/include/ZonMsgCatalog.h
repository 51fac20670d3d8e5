#pragma once
#include <string>
#include <string_view>
#include <vector>

#include "ZonHostExport.h"

// Message catalogs: named tables of key -> text. Catalog files are embedded
// into the libraries at build time and registered when they load, so the
// tool finds its texts from any working directory.
//
// File format, one entry per line:   Key = "Text with \n escapes and {1} parameters";
// Lines starting with "//" and blank lines are ignored.
class ZON_HOST_API ZonMsgCatalog {
public:
    // Adds (or extends) a catalog from the text of a catalog file.
    static void RegisterEmbedded(std::string_view catalogName, std::string_view fileText);
    // Sets one text at run time (used for texts that come from the C library).
    static void SetText(std::string_view catalogName, std::string_view key, std::string_view text);

    // True when a catalog of that name is known.
    static bool Load(std::string_view catalogName);
    // The text of key, or "" when the catalog or key is unknown.
    static std::string Lookup(std::string_view catalogName, std::string_view key);
    static bool Has(std::string_view catalogName, std::string_view key);
    // The text with {1}, {2}, ... replaced by the parameters.
    static std::string Build(std::string_view catalogName, std::string_view key,
                             const std::vector<std::string>& parameters = {});
    // Every key of a catalog, sorted.
    static std::vector<std::string> Keys(std::string_view catalogName);
};
