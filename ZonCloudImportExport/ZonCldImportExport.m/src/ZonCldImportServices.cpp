#include "ZonCldImportServices.h"

#include "ZonCldImporter.h"
#include "ZonCloudReadNLSTool.h"

ZonUnicodeString ZonCldImportServices::ExtensionOf(const ZonUnicodeString& fileName)
{
    const std::string& path = fileName.ToUtf8();
    const auto slash = path.find_last_of('/');
    const std::string name = slash == std::string::npos ? path : path.substr(slash + 1);
    const auto dot = name.rfind('.');
    if (dot == std::string::npos) return {};
    return ZonUnicodeString(name.substr(dot)).ToLower();
}

namespace {
// A filter holds an extension when one of its ";"-separated patterns is "*" + extension.
bool FilterHolds(const ZonString& filter, const std::string& extension)
{
    std::size_t start = 0;
    while (start <= filter.size()) {
        const auto end = std::min(filter.find(';', start), filter.size());
        std::string pattern = filter.substr(start, end - start);
        for (char& c : pattern)
            if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
        if (pattern.size() == extension.size() + 1 && pattern[0] == '*' && pattern.compare(1, std::string::npos, extension) == 0)
            return true;
        start = end + 1;
    }
    return false;
}
}  // namespace

ZonUnicodeString ZonCldImportServices::FindFormatOfFile(const ZonUnicodeString& fileName)
{
    const std::string extension = ExtensionOf(fileName).ToUtf8();
    ZonListValZonUnicodeString names;
    ZonListValZonString filters;
    ZonCldImporter::GetAvailableFormats(names, filters, true);
    if (!extension.empty())
        for (std::size_t i = 0; i < names.size(); ++i)
            if (FilterHolds(filters[i], extension)) return names[i];
    ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_UnknownExtension");
}
