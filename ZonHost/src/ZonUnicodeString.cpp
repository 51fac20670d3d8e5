#include "ZonUnicodeString.h"

int ZonUnicodeString::SearchBackward(char ch) const
{
    const auto pos = text_.rfind(ch);
    return pos == std::string::npos ? -1 : static_cast<int>(pos);
}

ZonUnicodeString ZonUnicodeString::SubString(std::size_t start, std::size_t length) const
{
    if (start >= text_.size()) return {};
    return ZonUnicodeString(text_.substr(start, length));
}

ZonUnicodeString ZonUnicodeString::ToLower() const
{
    std::string lower = text_;
    for (char& c : lower)
        if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
    return ZonUnicodeString(std::move(lower));
}
