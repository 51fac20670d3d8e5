#include <charconv>
#include <cmath>

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
    return ZonCldImportServices::FindFormatOfFile(ZonUnicodeString(file)).ToUtf8();
}

ZonICloudReadFile_var ZonToolReaderOptions::CreateReader(std::string& formatName) const
{
    formatName = FormatName();
    ZonCldImporter importer{ZonUnicodeString(formatName)};
    if (!importer.GetFactory()) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_UnknownExtension");
    ZonICloudReadFile_var reader = importer.CreateReader(ZonUnicodeString(file));
    if (!reader) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_Failure");
    reader->SetSamplingPercent(static_cast<float>(ZonCldSettings::Instance().GetImportSampling()));
    reader->SetDoublePrecision(doublePrecision);
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
    ZonMathTransformation inverse;
    ZonMathBox importBox = HasBox() ? Box() : ZonMathBox();
    const ZonUnicodeString fileName(file);
    if (format.empty())
        return ZonCldImportServices::BuildCldBodyFromFile(geometry, fileName, placement, inverse, importBox, messages);
    return ZonCldImportServices::BuildCldBodyWithFormat(geometry, ZonUnicodeString(format), fileName, placement,
                                                        inverse, importBox, messages);
}
