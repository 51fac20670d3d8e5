#pragma once
#include <cstddef>
#include <cstdint>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudLineSource.h"
#include "ZonCloudReadFile.h"
#include "ZonCloudScanFormat.h"
#include "ZonCloudOwnedArrays.h"

// Base of the readers of text files with one point per line: an optional
// first line with the number of points, then point lines up to an optional
// "**end cloud**" line. A file that only makes sense with the other decimal
// point ('.' or ',') is read again with it after 200 lines in a row that are
// not understood. The file is loaded at once into one cloud, in the precision
// asked for, with a colour per point when the format gives one.
class ZON_CLD_API ZonCloudReadPointLines : public ZonCloudReadFile {
public:
    // ZonICloudReadFile
    void SetSamplingPercent(float percent) override;
    bool HasDoublePrecision() override { return true; }

    // Room of the loaded arrays, in points: the count line's number when the
    // file has one, else what the size estimate and growth gave.
    std::uint64_t GetCapacity() const { return _capacity; }
    long GetDataStartOffset() const { return _dataStart; }
    bool IsDecimalPointSwapped() const { return _decimalSwapped; }

protected:
    // What an importer may take over at the end of an import.
    void ListOwnedArrays(ZonCloudOwnedArrays& arrays) override
    {
        arrays.Add(_points);
        arrays.Add(_pointsDouble);
        arrays.Add(_colors);
    }
    explicit ZonCloudReadPointLines(const ZonUnicodeString& fileName);

    // Scans the line [first, last) in the precision being loaded: false when
    // it is no point. rgb is the point's colour, used when colours are kept.
    virtual bool ScanLine(const char* first, const char* last, char decimalPoint, double xyz[3],
                          unsigned char rgb[3]) = 0;
    // Forgets what was loaded; a format that keeps more forgets that too.
    virtual void Discard();
    void AnalyseFile() override;
    void Load(bool asDouble);

    // `format` over [first, last), which ends early at a NUL as a C string would.
    template <class... T>
    static int Scan(const ZonCloudScanFormat& format, const char* first, const char* last, char decimalPoint,
                    T*... args)
    {
        void* const pointers[sizeof...(T) + 1] = {static_cast<void*>(args)..., nullptr};
        return format.Scan(first, last, decimalPoint, pointers);
    }
    // True when the line's text (up to a NUL) holds "**end cloud**".
    static bool IsEndOfCloud(const char* first, const char* last);

    // Lines are cut after 511 characters; the rest is read as the next line.
    static constexpr std::size_t LinePiece = ZonCloudLineSource::FgetsPiece;

    bool _keepColors = false;
    bool _loadedAsDouble = false;
    std::vector<float> _points;
    std::vector<double> _pointsDouble;
    std::vector<unsigned char> _colors;
    std::uint64_t _count = 0;  // points of the loaded arrays
    std::int64_t _pointLines = 0;
    long _dataStart = 0;

private:
    // What one pass carries from line to line.
    struct PassState;
    enum class Next { Go, Stop, Retry };

    // One pass over the file; false when it must start again with the other decimal point.
    bool ReadPass(ZonCloudLineSource& lines, char decimalPoint);
    // The same on every core, over the mapped file `text`.
    bool ReadPassInChunks(const unsigned char* text, char decimalPoint);
    void StartPass();
    void TakePoint(const double xyz[3], const unsigned char rgb[3], PassState& state);
    // A line that is no point: `announced` is the count of a count line
    // (0 for any other), `endOfCloud` whether it ends the data.
    Next TakeOtherLine(int announced, bool endOfCloud, std::uint64_t nextOffset, PassState& state);
    int Announced(const char* first, const char* last, char decimalPoint) const;
    void MakeRoom(std::uint64_t capacity);

    bool _decimalSwapped = false;
    std::uint64_t _capacity = 0;
    std::uint64_t _estimate = 0;
    std::uint64_t _mostPoints = 0;
};
