#pragma once
#include <compare>
#include <string>
#include <string_view>
#include <vector>

#include "ZonHostExport.h"

// Text held as UTF-8. The host's wide-character plumbing is not needed here.
class ZON_HOST_API ZonUnicodeString {
public:
    ZonUnicodeString() = default;
    ZonUnicodeString(const char* utf8) : text_(utf8 ? utf8 : "") {}
    ZonUnicodeString(std::string utf8) : text_(std::move(utf8)) {}
    ZonUnicodeString(std::string_view utf8) : text_(utf8) {}

    const std::string& ToUtf8() const { return text_; }
    const char* ConvertToChar() const { return text_.c_str(); }
    const char* c_str() const { return text_.c_str(); }
    std::size_t GetLengthInChar() const { return text_.size(); }
    bool IsNull() const { return text_.empty(); }
    void Reset() { text_.clear(); }

    // Byte position of the last occurrence of ch, or -1.
    int SearchBackward(char ch) const;
    ZonUnicodeString SubString(std::size_t start, std::size_t length = std::string::npos) const;
    ZonUnicodeString ToLower() const;  // ASCII letters only, as file extensions need

    ZonUnicodeString& operator+=(const ZonUnicodeString& other) { text_ += other.text_; return *this; }
    friend ZonUnicodeString operator+(ZonUnicodeString a, const ZonUnicodeString& b) { return a += b; }
    friend bool operator==(const ZonUnicodeString&, const ZonUnicodeString&) = default;
    friend std::strong_ordering operator<=>(const ZonUnicodeString& a, const ZonUnicodeString& b) {
        return a.text_.compare(b.text_) <=> 0;
    }

private:
    std::string text_;
};

using ZonString = std::string;
using ZonListValZonUnicodeString = std::vector<ZonUnicodeString>;
using ZonListValZonString = std::vector<ZonString>;
