#pragma once
#include <cstdint>
#include <string>

#include "ZonCloudLineFormat.h"
#include "ZonCloudWritePointLines.h"

// Writes points as fixed-width text columns for the ASCII user format: an
// optional header and name, an optional point number column, optional column
// separators and optional row separator lines. Every line besides the points
// begins with "!", so the user-format reader takes it for a comment.
//
// Lines end with CR LF, as the format's files always have: the reader drops
// the character before each newline, so a file written this way reads back
// whole with an FDF naming its columns (LABEL for the point number,
// USELESS_INFO for each column separator, X Y Z, and R G B with colours).
//
// Settings (SetWriteSettings / GetWriteSettings), exactly seven texts:
//   1 Header        header text, or "N" for none
//   2 Name          name text, or "N" for none
//   3 SepRowChar    row separator text, or "N" for none
//   4 SepColChar    column separator text, or "N" for none
//   5 PointNumber   "Y" for a point number column, else "N"
//   6 ColumWidth    column width W, an integer
//   7 DecimalPlace  decimal places D, an integer
// A list of another length is ignored.
class ZON_CLD_API ZonCloudWriteAsciiUserFormat : public ZonCloudWritePointLines {
public:
    explicit ZonCloudWriteAsciiUserFormat(const ZonUnicodeString& fileName);

    // ZonICloudWriteFile
    void SetWriteSettings(const ZonListValZonString& settings) override;
    void GetWriteSettings(ZonListValZonString& settings) override;
    // A multi-part file gets its header when opened and its closing row
    // separator when completed.
    ZonHResult BeginMultiWrite() override;
    ZonHResult EndMultiWrite() override;

    // ZonICloudWritePointFile
    void BeginWritePoints(const unsigned& count) override;
    void EndWritePoints() override;

    // The printf format of a point line for the current settings.
    std::string LineTemplate(bool withColor) const;
    // "!" followed by the row separator text taken four times the column width.
    std::string RowSeparatorLine() const;

protected:
    // The first line's number is its place in the file, from 1.
    std::uint64_t TakeLines(std::uint64_t lines) override;
    void FormatLine(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char* rgb,
                    std::uint64_t number) const override;

private:
    void WriteHeader();
    // Builds the point line templates and the row separator for the settings in force.
    void PrepareLines();
    // Writes text with CR LF line ends.
    void Emit(const std::string& text);

    std::string _header;
    std::string _name;
    std::string _rowSeparator;
    std::string _columnSeparator;
    bool _headerGiven = false;
    bool _nameGiven = false;
    bool _rowSeparatorGiven = false;
    bool _columnSeparatorGiven = false;
    bool _pointNumber = false;
    int _width = 12;
    int _decimals = 3;

    std::string _templatePlain;
    std::string _templateColor;
    // The same with CR LF line ends, decoded once.
    ZonCloudLineFormat _linePlain;
    ZonCloudLineFormat _lineColor;
    std::string _pointSeparator;  // with CR LF line ends

    std::uint64_t _total = 0;     // points announced
    std::uint64_t _expected = 0;  // points still to come
};
