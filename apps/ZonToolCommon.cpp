#include <charconv>
#include <cmath>
#include <exception>
#include <fstream>
#include <iostream>

#include "ZonCldBody.h"
#include "ZonCldImportServices.h"
#include "ZonCldImporter.h"
#include "ZonCldSettings.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudTool.h"

void ZonToolReaderOptions::AddTo(CLI::App& command)
{
    command.add_option("FILE", file, "File to read")->required();
    command.add_option("--format", format, "Format name (skips the choice by extension)")
        ->check(
            [](const std::string& name) {
                return ZonCldImporter::GetFactory(ZonUnicodeString(name)) ? std::string()
                                                                         : "no format is named " + name;
            },
            "FORMAT");
    command.add_option("--sampling", sampling, "Sampling percent, 0 to 100");
    command.add_flag("--double", doublePrecision, "Read in double precision");
    command.add_option("--box", box, "XMIN YMIN ZMIN XMAX YMAX ZMAX")->expected(6);
    formatOptions.AddTo(command, ZonToolReaderSettings());
}

void ZonToolReaderOptions::ApplyToSettings() const
{
    auto& settings = ZonCldSettings::Instance();
    if (sampling) settings.SetImportSampling(*sampling);
    settings.SetImportDoublePrecision(doublePrecision);
    formatOptions.ApplyToSettings();
}

ZonMathBox ZonToolReaderOptions::Box() const
{
    return ZonMathBox(box[0], box[3], box[1], box[4], box[2], box[5]);
}

std::string ZonToolReaderOptions::FormatName() const
{
    if (!format.empty()) return format;
    if (!_readAsText.empty()) return _readAsText;
    return ZonCldImportServices::FindFormatOfFile(ZonUnicodeString(file)).ToUtf8();
}

namespace {

// The reader of plain point text, which many programs write under extensions
// that name a binary format here (".xyz").
constexpr const char* TextFormat = "ASCII FREE";

// Whether `bytes` are UTF-8; a sequence cut by the end of a partial read is not held against them.
bool IsUtf8(const unsigned char* bytes, std::size_t size, bool cut)
{
    for (std::size_t i = 0; i < size;) {
        const unsigned char lead = bytes[i];
        const std::size_t length = lead < 0x80 ? 1 : (lead >> 5) == 0x6 ? 2 : (lead >> 4) == 0xe ? 3 : (lead >> 3) == 0x1e ? 4 : 0;
        if (length == 0) return false;
        for (std::size_t k = 1; k < length; ++k) {
            if (i + k >= size) return cut;
            if ((bytes[i + k] & 0xc0) != 0x80) return false;
        }
        i += length;
    }
    return true;
}

// The file's first 4 KB hold no NUL and are UTF-8. False when it cannot be
// read: a missing or unreadable file keeps the error its reader gave.
bool LooksLikeText(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    if (!in) return false;
    unsigned char head[4096];
    in.read(reinterpret_cast<char*>(head), sizeof head);
    if (in.bad()) return false;
    const auto size = static_cast<std::size_t>(in.gcount());
    if (size == 0 && !in.eof()) return false;  // a directory opens, but does not read
    for (std::size_t i = 0; i < size; ++i)
        if (head[i] == 0) return false;
    return IsUtf8(head, size, size == sizeof head);
}

}  // namespace

template <class Attempt>
auto ZonToolReaderOptions::WithTextFallback(Attempt attempt) const
{
    try {
        return attempt(std::string());
    } catch (const ZonError& error) {
        const std::exception_ptr first = std::current_exception();
        if (!format.empty() || !LooksLikeText(file)) std::rethrow_exception(first);
        std::string chosen;
        try {
            chosen = FormatName();
        } catch (const ZonError&) {
            std::rethrow_exception(first);  // no reader claims the extension: nothing refused the file
        }
        if (chosen == TextFormat) std::rethrow_exception(first);
        try {
            auto result = attempt(std::string(TextFormat));
            _readAsText = TextFormat;
            std::cerr << "zoncloud: " << file << ": the " << chosen << " reader refused it ("
                      << error.GetNLSMessage() << "); read as text by the " << TextFormat << " reader\n";
            return result;
        } catch (const ZonError&) {
            std::rethrow_exception(first);
        }
    }
}

std::string ZonToolReaderOptions::ChoiceNote() const
{
    if (!format.empty()) return {};
    const std::vector<ZonUnicodeString> claiming = ZonCldImportServices::FormatsOfFile(ZonUnicodeString(file));
    if (claiming.size() < 2) return {};
    std::string others;
    for (std::size_t i = 1; i < claiming.size(); ++i) others += (i > 1 ? ", " : "") + claiming[i].ToUtf8();
    return "note: " + ZonCldImportServices::ExtensionOf(ZonUnicodeString(file)).ToUtf8() + " is read as " +
           claiming.front().ToUtf8() + " (also claimed by " + others + "; choose with --format)";
}

ZonICloudReadFile_var ZonToolReaderOptions::CreateReader(std::string& formatName) const
{
    if (const std::string note = ChoiceNote(); !note.empty()) std::cerr << note << "\n";
    ZonICloudReadFile_var reader = WithTextFallback([&](const std::string& name) {
        ZonCldImporter importer{ZonUnicodeString(name.empty() ? FormatName() : name)};
        if (!importer.GetFactory()) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_UnknownExtension");
        ZonICloudReadFile_var created = importer.CreateReader(ZonUnicodeString(file));
        if (!created) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_Failure");
        created->SetSamplingPercent(static_cast<float>(ZonCldSettings::Instance().GetImportSampling()));
        created->SetDoublePrecision(doublePrecision);
        // The analysis runs now, so that a file the reader refuses is known here.
        created->GetTypeOfDigitization();
        return created;
    });
    formatName = FormatName();
    return reader;
}

// JSON has no NaN or infinity: such a coordinate is written as null.
nlohmann::json ZonToolNumber(float value)
{
    if (!std::isfinite(value)) return nullptr;
    // The double nearest to the float's shortest text is printed as that text
    // and reads back, narrowed, to the same float.
    char buffer[32];
    const auto [end, ec] = std::to_chars(buffer, buffer + sizeof buffer, value);
    double widened = value;
    if (ec == std::errc()) std::from_chars(buffer, end, widened);
    return widened;
}

// The JSON writer prints a double's shortest round-trip text.
nlohmann::json ZonToolNumber(double value) { return std::isfinite(value) ? nlohmann::json(value) : nullptr; }

nlohmann::json ZonToolBoxJson(const ZonMathBox& box)
{
    if (box.IsEmpty()) return nullptr;
    const ZonMathPoint& low = box.GetLow();
    const ZonMathPoint& high = box.GetHigh();
    nlohmann::json list = nlohmann::json::array();
    for (double v : {low[0], low[1], low[2], high[0], high[1], high[2]}) list.push_back(ZonToolNumber(v));
    return list;
}

nlohmann::json ZonToolErrorJson(const ZonError& error)
{
    return {{"catalog", error.GetCatalogName()},
            {"key", error.GetMessageKey()},
            {"severity", error.GetSeverity()},
            {"message", error.GetNLSMessage()}};
}

std::shared_ptr<ZonCldBody> ZonToolReaderOptions::Import(ZonGeoFactoryProtected& geometry,
                                                         std::vector<ZonString>& messages) const
{
    const ZonMathTransformation placement;
    const ZonUnicodeString fileName(file);
    if (const std::string note = ChoiceNote(); !note.empty()) std::cerr << note << "\n";
    ZonToolProgress progress(file);
    return WithTextFallback([&](const std::string& name) {
        ZonMathTransformation inverse;
        ZonMathBox importBox = HasBox() ? Box() : ZonMathBox();
        // The notes of a reading that fails are not the file's.
        std::vector<ZonString> noted;
        std::shared_ptr<ZonCldBody> body;
        if (name.empty() && format.empty())
            body = ZonCldImportServices::BuildCldBodyFromFile(geometry, fileName, placement, inverse, importBox, noted);
        else
            body = ZonCldImportServices::BuildCldBodyWithFormat(geometry, ZonUnicodeString(name.empty() ? format : name),
                                                                fileName, placement, inverse, importBox, noted);
        messages.insert(messages.end(), noted.begin(), noted.end());
        return body;
    });
}
