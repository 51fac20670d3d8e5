#include "ZonCldImportServices.h"

#include <algorithm>
#include <charconv>

#include "ZonCldImportEngine.h"
#include "ZonCldImporter.h"
#include "ZonCldSettings.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonGeoFactoryProtected.h"
#include "ZonICkeUnit.h"
#include "ZonICloudReadOptTriangles.h"
#include "ZonIReporter.h"
#include "ZonMsgCatalog.h"

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

std::vector<ZonUnicodeString> ZonCldImportServices::FormatsOfFile(const ZonUnicodeString& fileName)
{
    const std::string extension = ExtensionOf(fileName).ToUtf8();
    ZonListValZonUnicodeString names;
    ZonListValZonString filters;
    ZonCldImporter::GetAvailableFormats(names, filters, true);
    std::vector<ZonUnicodeString> claiming;
    if (!extension.empty())
        for (std::size_t i = 0; i < names.size(); ++i)
            if (FilterHolds(filters[i], extension)) claiming.push_back(names[i]);
    return claiming;
}

ZonUnicodeString ZonCldImportServices::FindFormatOfFile(const ZonUnicodeString& fileName)
{
    const std::vector<ZonUnicodeString> claiming = FormatsOfFile(fileName);
    if (claiming.empty())
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_UnknownExtension", {KnownExtensions()});
    return claiming.front();
}

std::string ZonCldImportServices::KnownExtensions()
{
    ZonListValZonUnicodeString names;
    ZonListValZonString filters;
    ZonCldImporter::GetAvailableFormats(names, filters, true);
    std::vector<std::string> extensions;
    for (const ZonString& filter : filters)
        for (std::size_t start = 0; start <= filter.size();) {
            const std::size_t end = std::min(filter.find(';', start), filter.size());
            const ZonUnicodeString pattern(filter.substr(start, end - start));
            const std::string lower = pattern.ToLower().ToUtf8();
            if (lower.size() > 2 && lower.compare(0, 2, "*.") == 0) extensions.push_back(lower.substr(1));
            start = end + 1;
        }
    std::sort(extensions.begin(), extensions.end());
    extensions.erase(std::unique(extensions.begin(), extensions.end()), extensions.end());
    std::string list;
    for (const std::string& extension : extensions) list += (list.empty() ? "" : " ") + extension;
    return list;
}

namespace {
std::string StatText(const char* prefix, const char* key)
{
    return ZonMsgCatalog::Build(ZonCloudReadNLSTool::Catalog(), std::string(prefix) + ".StatWindow." + key);
}

// "%g" with a '.' whatever the process's locale.
std::string ShortNumber(double value)
{
    char buffer[64];
    const auto [end, ec] = std::to_chars(buffer, buffer + sizeof buffer, value, std::chars_format::general, 6);
    return ec == std::errc() ? std::string(buffer, end) : std::string();
}

// Frames the engine's counts with the title, the file and the reader's own
// answers, as the statistics window shows them.
std::string CompleteStatistics(const std::string& engineText, const ZonUnicodeString& fileName,
                               const ZonUnicodeString& formatName, ZonICloudReadFile& reader, double sampling)
{
    const ZonSession* session = ZonSession::GetPtrSession();
    const char* prefix = session && session->IsTerrainMode() ? "ZonCldImportTerrainBuild" : "ZonCldImportBuild";
    std::string text = StatText(prefix, "Title") + "\n";
    text += StatText(prefix, "File") + fileName.ToUtf8() + "\n";
    text += StatText(prefix, "DocumentHeader") + "\n";
    text += "  " + ZonCldImportServices::GetNLSStatFromKey("Format") + ": " + formatName.ToUtf8() + "\n";
    text += "  " + ZonCldImportServices::GetNLSStatFromKey("Points") + ": " +
            std::to_string(reader.GetNumberOfPoints()) + "\n";
    text += StatText(prefix, "DumpHeader") + "\n";
    text += engineText;
    text += StatText(prefix, "Sampling") + " (" + ShortNumber(sampling) + ")\n";
    return text;
}

// The engine's statistics labels, from this module's catalog.
std::string EngineLabel(const std::string& key)
{
    return ZonMsgCatalog::Lookup(ZonCloudReadNLSTool::Catalog(), "ZonCldImportBuild.StatWindow." + key);
}

// Mesh readers keep the format's triangles option for the importer; every
// other reader's structure is taken whole.
bool CreatesTriangles(const ZonICloudReadFile_var& reader)
{
    bool create = true;
    if (const auto option = ZonQueryInterface<ZonICloudReadOptTriangles>(reader)) option->GetTriangles(create);
    return create;
}
}  // namespace

std::shared_ptr<ZonCldBody> ZonCldImportServices::BuildCldBodyFromFile(ZonGeoFactoryProtected& factory,
                                                                       const ZonUnicodeString& fileName,
                                                                       const ZonMathTransformation& transformationIn,
                                                                       ZonMathTransformation& transformationOut,
                                                                       ZonMathBox& box,
                                                                       std::vector<ZonString>& messages)
{
    std::string extension = ExtensionOf(fileName).ToUtf8();
    if (extension == ".mrp") extension = ".kovo";
    // Meshes in OBJ files and the host's own packages take host routes that this build has not.
    if (extension == ".obj" || extension == ".kovo")
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_FormatNotImplemented");
    const ZonUnicodeString formatName = FindFormatOfFile(fileName);
    return BuildCldBodyWithFormat(factory, formatName, fileName, transformationIn, transformationOut, box, messages);
}

std::shared_ptr<ZonCldBody> ZonCldImportServices::BuildCldBodyWithFormat(
    ZonGeoFactoryProtected& factory, const ZonUnicodeString& formatName, const ZonUnicodeString& fileName,
    const ZonMathTransformation& transformationIn, ZonMathTransformation& transformationOut, ZonMathBox& box,
    std::vector<ZonString>& messages)
{
    const ZonCldSettings& settings = ZonCldSettings::Instance();
    const double scale = settings.GetImportScaleFactor();
    const double sampling = settings.GetImportSampling();
    const ZonICkeUnit_var unit = ZonICkeUnit::FromName(settings.GetImportFileUnit());
    const bool doublePrecision = settings.GetImportDoublePrecision();

    ZonCldImporter importer(formatName);
    const ZonICloudReadFile_var reader = importer.CreateReader(fileName);
    if (!reader) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_Failure");
    reader->SetSamplingPercent(static_cast<float>(sampling));

    std::shared_ptr<ZonCldBody> body = factory.CreateCldBody();
    std::string engineText;
    ZonCldImportEngine::InsertFile(*body, factory, reader, doublePrecision, unit, box, scale, messages, engineText,
                                   CreatesTriangles(reader), EngineLabel);
    // Nothing in the file, or nothing in the part asked for.
    if (body->IsEmpty()) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_NoPointFound");

    body->SetPlacement(transformationIn);
    transformationOut = transformationIn.IsIdentity() ? ZonMathTransformation() : transformationIn.ComputeInverse();
    box = body->GetBox();
    messages.push_back(CompleteStatistics(engineText, fileName, formatName, *reader, sampling));
    return body;
}

void ZonCldImportServices::BuildCldBodyListFromFile(ZonGeoFactoryProtected& factory, const ZonUnicodeString& fileName,
                                                    const ZonMathTransformation& transformationIn,
                                                    ZonMathTransformation& transformationOut, ZonMathBox& box,
                                                    std::vector<std::shared_ptr<ZonCldBody>>& bodies,
                                                    ZonString& statistics)
{
    statistics.clear();
    box.SetToEmpty();
    std::vector<ZonString> messages;
    std::shared_ptr<ZonCldBody> body;
    try {
        body = BuildCldBodyFromFile(factory, fileName, transformationIn, transformationOut, box, messages);
    } catch (ZonError& error) {
        ZonCloudReadNLSTool::FullReporterErrorList(&error);
        return;
    }
    for (const ZonString& message : messages) {
        if (!statistics.empty() && statistics.back() != '\n') statistics += '\n';
        statistics += message;
    }
    if (body) bodies.push_back(std::move(body));
}

ZonString ZonCldImportServices::GetNLSStatFromKey(const ZonString& key)
{
    return ZonMsgCatalog::Build(ZonCloudReadNLSTool::Catalog(), "ZonCldImportBuild.StatWindow." + key);
}
