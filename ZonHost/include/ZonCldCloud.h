#pragma once
#include <cstdint>
#include <string>
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonCldPointArray.h"
#include "ZonHostExport.h"
#include "ZonUnicodeString.h"

// An unstructured cloud of points, with the per-point data a file may give:
// colours (R, G, B, 0 to 255), alpha, symbol index and text. Each per-point
// array is either empty or holds one entry per point. Texts are held either
// one per point, or as one label and one integer per point ("Density = " and
// the density), made into text only when one is asked for: a large cloud then
// holds four bytes per text instead of a string.
class ZON_HOST_API ZonCldCloud : public ZonBaseUnknown {
public:
    ~ZonCldCloud() override;

    ZonCldPointArray& Points() { return _points; }
    const ZonCldPointArray& Points() const { return _points; }
    std::size_t GetNumberOfPoints() const { return _points.GetNumberOfPoints(); }

    std::vector<unsigned char>& Colors() { return _colors; }  // 3 per point
    std::vector<std::int32_t>& Alphas() { return _alphas; }
    std::vector<std::int32_t>& Symbols() { return _symbols; }
    std::vector<ZonUnicodeString>& Texts() { return _texts; }
    const std::vector<unsigned char>& Colors() const { return _colors; }
    const std::vector<std::int32_t>& Alphas() const { return _alphas; }
    const std::vector<std::int32_t>& Symbols() const { return _symbols; }
    const std::vector<ZonUnicodeString>& Texts() const { return _texts; }
    bool HasColors() const { return !_colors.empty(); }

    // Texts as a label and one value per point; replaces any texts held.
    void SetTextValues(std::string label, std::vector<std::int32_t> values);
    // How many texts the cloud holds, in either form, and the text of point i.
    std::size_t GetNumberOfTexts() const;
    ZonUnicodeString GetText(std::size_t i) const;

private:
    ZonCldPointArray _points;
    std::vector<unsigned char> _colors;
    std::vector<std::int32_t> _alphas;
    std::vector<std::int32_t> _symbols;
    std::vector<ZonUnicodeString> _texts;
    std::string _textLabel;
    std::vector<std::int32_t> _textValues;
};
using ZonCldCloud_var = std::shared_ptr<ZonCldCloud>;
