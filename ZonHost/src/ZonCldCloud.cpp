#include "ZonCldCloud.h"

// Out of line: anchors the class's type information in the host library.
ZonCldCloud::~ZonCldCloud() = default;

void ZonCldCloud::SetTextValues(std::string label, std::vector<std::int32_t> values)
{
    _texts.clear();
    _textLabel = std::move(label);
    _textValues = std::move(values);
}

std::size_t ZonCldCloud::GetNumberOfTexts() const { return _texts.empty() ? _textValues.size() : _texts.size(); }

ZonUnicodeString ZonCldCloud::GetText(std::size_t i) const
{
    if (!_texts.empty()) return _texts.at(i);
    return ZonUnicodeString(_textLabel + std::to_string(_textValues.at(i)));
}
