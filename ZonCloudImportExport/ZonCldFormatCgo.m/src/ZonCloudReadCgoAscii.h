#pragma once
#include <cstdint>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudReadFile.h"

// Reads Cgo ASCII point files: an optional first line with the number of
// points, then one point per line as three reals (anything after them is
// ignored), up to an optional "**end cloud**" line. A file that only makes
// sense with the other decimal point ('.' or ',') is read again with it
// after 200 lines that are not understood. The file is loaded in the
// precision asked for; the other precision is read again from the first
// point line when it is asked for.
class ZON_CLD_API ZonCloudReadCgoAscii : public ZonCloudReadFile {
public:
    explicit ZonCloudReadCgoAscii(const ZonUnicodeString& fileName);

    // ZonICloudReadFile
    void SetSamplingPercent(float percent) override;
    const float* GetPoints(unsigned& count) override;
    const double* GetPointsDouble(unsigned& count) override;
    bool HasDoublePrecision() override { return true; }

    // Room of the loaded point array, in points: the count line's number when
    // the file has one, else what the size estimate and growth gave.
    std::uint64_t GetCapacity() const { return _capacity; }
    long GetDataStartOffset() const { return _dataStart; }
    bool IsDecimalPointSwapped() const { return _decimalSwapped; }

protected:
    void Analyse() override;

private:
    void Load();
    // One pass over the file; false when it must start again with the other decimal point.
    bool ReadPass(char decimalPoint, double ratio);
    // Reads the points again in the precision that was not loaded.
    template <class T>
    void ReadAgain(std::vector<T>& points);
    void Discard();
    void Reserve(std::uint64_t capacity);

    bool _loadedAsDouble = false;
    bool _decimalSwapped = false;
    std::vector<float> _points;
    std::vector<double> _pointsDouble;
    std::uint64_t _count = 0;       // points of the loaded array
    std::uint64_t _otherCount = 0;  // points of the array read again
    bool _otherRead = false;
    std::uint64_t _capacity = 0;
    std::uint64_t _estimate = 0;
    std::uint64_t _mostPoints = 0;
    std::int64_t _pointLines = 0;
    long _dataStart = 0;
};
