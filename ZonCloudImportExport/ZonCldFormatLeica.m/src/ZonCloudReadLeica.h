#pragma once
#include <cstdint>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudReadFile.h"
#include "ZonICloudReadOptColor.h"

// Reads RGB point files: one point per line as x y z, optionally followed by
// a colour R G B (0 to 255), or by an intensity and then the colour. An
// optional first line holds the number of points; a line "**end cloud**"
// ends the data. A file that only makes sense with the other decimal point
// ('.' or ',') is read again with it after 200 lines that are not understood.
// The whole file is loaded at once and given as one cloud; colours come
// through GetPointColors when they are kept (the default).
class ZON_CLD_API ZonCloudReadLeica : public ZonCloudReadFile, public ZonICloudReadOptColor {
public:
    explicit ZonCloudReadLeica(const ZonUnicodeString& fileName);

    // ZonICloudReadOptColor
    void SetKeepColors(bool keep) override;
    bool GetKeepColors() override { return _keepColors; }

    // ZonICloudReadFile
    void SetSamplingPercent(float percent) override;
    const float* GetPoints(unsigned& count) override;
    const double* GetPointsDouble(unsigned& count) override;
    bool HasDoublePrecision() override { return true; }
    const unsigned char* GetPointColors(unsigned& count) override;

    // Room of the point arrays, in points: the count line's number when the
    // file has one, else what the size estimate and growth gave.
    std::uint64_t GetCapacity() const { return _capacity; }
    long GetDataStartOffset() const { return _dataStart; }
    bool IsDecimalPointSwapped() const { return _decimalSwapped; }

protected:
    void Analyse() override;

private:
    void Load(bool asDouble);
    // One pass over the file; false when it must start again with the other decimal point.
    bool ReadPass(char decimalPoint, double ratio);
    void Discard();
    void Reserve(std::uint64_t capacity);

    bool _keepColors = true;
    bool _loadedAsDouble = false;
    bool _decimalSwapped = false;
    std::vector<float> _points;
    std::vector<double> _pointsDouble;
    std::vector<unsigned char> _colors;
    std::uint64_t _count = 0;
    std::uint64_t _capacity = 0;
    std::uint64_t _estimate = 0;
    std::uint64_t _mostPoints = 0;
    std::int64_t _pointLines = 0;
    long _dataStart = 0;
};
