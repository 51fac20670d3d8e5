#pragma once
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudReadFile.h"
#include "ZonICloudReadOptColor.h"
#include "ZonICloudReadOptUserFormat.h"
#include "ZonCloudOwnedArrays.h"

class ZonCloudLineSource;
class ZonCloudSampler;

// Reads an ASCII user format file: a text point file whose columns are named,
// in order, by the first line of a separate format description file (FDF).
// The whole file is loaded at once into per-point arrays and handed out as
// one cloud.
//
// Per-point arrays, all indexed by delivered point:
//   GetPoints / GetPointsDouble  x, y, z
//   GetPointColors               R, G, B as bytes, when the file gives colours
//   GetPointAttributes1          alpha, one std::int32_t per point ("A" column)
//   GetPointAttributes2          symbol index, one std::int32_t per point ("SYMBOL")
//   GetPointAttributes3          text, one std::string per point ("TEXT"); a point
//                                with two TEXT columns carries "/first%/second%"
// Each attribute array is returned only when some point of the file set it.
class ZON_CLD_API ZonCloudReadAsciiUserFormat : public ZonCloudReadFile,
                                               public ZonICloudReadOptColor,
                                               public ZonICloudReadOptUserFormat {
public:
    // Field codes: 1-based positions in the FDF vocabulary.
    enum Field : int {
        FieldX = 1,
        FieldY,
        FieldZ,
        FieldDX,
        FieldDY,
        FieldDZ,
        FieldR,
        FieldG,
        FieldB,
        FieldA,
        FieldColor,
        FieldSymbol,
        FieldLabel,
        FieldText,
        FieldUselessInfo,
    };
    // The code of an FDF word (exact, case-sensitive), or 0 for a word that is not a keyword.
    static int FieldCodeOf(std::string_view word);

    explicit ZonCloudReadAsciiUserFormat(const ZonUnicodeString& fileName);

    // ZonICloudReadOptUserFormat. Only the first FDF read fixes the columns;
    // a later path is stored and forces a reload, but the columns stay.
    void SetFDFile(const ZonUnicodeString& path) override;
    void GetFDFile(ZonUnicodeString& path) override;

    // ZonICloudReadOptColor. The getter answers whether the loaded points carry colours.
    void SetKeepColors(bool keep) override;
    bool GetKeepColors() override;

    // ZonICloudReadFile
    void SetSamplingPercent(float percent) override;
    const float* GetPoints(unsigned& count) override;
    const double* GetPointsDouble(unsigned& count) override;
    bool HasDoublePrecision() override { return true; }
    const unsigned char* GetPointColors(unsigned& count) override;
    const void* GetPointAttributes1(unsigned& count) override;
    const void* GetPointAttributes2(unsigned& count) override;
    const void* GetPointAttributes3(unsigned& count) override;

    const std::vector<int>& GetFieldList() const { return _fields; }
    // Offset of the first line after the leading lines that gave no point.
    long GetDataStartOffset() const { return _dataStart; }
    // Room of the point arrays, in points (what the size estimate and growth gave).
    std::uint64_t GetCapacity() const { return _capacity; }

protected:
    // What an importer may take over at the end of an import.
    void ListOwnedArrays(ZonCloudOwnedArrays& arrays) override
    {
        arrays.Add(_points);
        arrays.Add(_pointsDouble);
        arrays.Add(_colors);
        arrays.Add(_alphas);
        arrays.Add(_symbols);
    }
    // Loads the file when an FDF was read; without one there is nothing to read.
    void AnalyseFile() override;

private:
    struct LineValues;

    void ReadFDF();
    void Load(bool asDouble);
    void Discard();
    // The common entry of every array access: false when no FDF was read.
    bool Prepare(bool wantDouble);
    std::uint64_t EstimateCapacity(ZonCloudLineSource& lines, std::uint64_t fileSize);
    void ReadLines(ZonCloudLineSource& lines);
    // The same on every core, over the mapped file `text`.
    void ReadLinesInChunks(const unsigned char* text);
    void FinishLines(const ZonMathBox& box);
    void ParseLine(const char* first, const char* last, LineValues& values, bool& complete) const;
    // Applies one parsed line in file order: the indices it sets, its checks, its point.
    void TakeLine(LineValues& values, bool complete, std::uint64_t nextOffset, ZonCloudSampler& sampler,
                  ZonMathBox& box);
    void StorePoint(const LineValues& values);
    void Grow();

    ZonUnicodeString _fdfPath;
    bool _fdfRead = false;
    std::vector<int> _fields;
    bool _keepColors = true;
    bool _loadedAsDouble = false;

    // What the field list can fill, so that arrays no column feeds stay empty.
    bool _fieldsHaveColor = false;
    bool _fieldsHaveAlpha = false;
    bool _fieldsHaveSymbol = false;
    bool _fieldsHaveText = false;

    std::vector<float> _points;
    std::vector<double> _pointsDouble;
    std::vector<unsigned char> _colors;
    std::vector<std::int32_t> _alphas;
    std::vector<std::int32_t> _symbols;
    std::vector<std::string> _texts;
    std::uint64_t _count = 0;
    std::uint64_t _capacity = 0;
    std::uint64_t _estimate = 0;
    bool _hasColor = false;
    bool _hasAlpha = false;
    bool _hasSymbol = false;
    bool _hasText = false;
    std::int64_t _completeLines = 0;
    long _dataStart = 0;

    // Kept across lines while loading, as the format wants.
    std::int32_t _colorIndex = 3;
    std::int32_t _symbolIndex = 0;
};
