#include "ZonCldSTLBinaryFormat.h"

#include <bit>
#include <cstdio>
#include <cstring>
#include <limits>

#include "ZonCloudReadNLSTool.h"

static_assert(std::endian::native == std::endian::little, "STL output assumes a little-endian machine");

namespace {

std::uint32_t Ordered(std::uint32_t value, bool reverseBytes) { return reverseBytes ? __builtin_bswap32(value) : value; }

}  // namespace

std::array<char, ZonCldSTLBinaryFormat::HeaderSize> ZonCldSTLBinaryFormat::Header()
{
    std::array<char, HeaderSize> header{};
    const std::string text = "STL " + ZonCloudReadNLSTool::GeneratedBy().ToUtf8();
    std::memcpy(header.data(), text.data(), std::min(text.size(), HeaderSize - 1));
    return header;
}

void ZonCldSTLBinaryFormat::AnnounceTriangles(ZonCloudOutputFile& file, bool& headerPending, std::uint64_t count,
                                              bool reverseBytes)
{
    if (count > std::numeric_limits<std::uint32_t>::max())
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    if (headerPending) {
        const auto header = Header();
        file.Write(header.data(), header.size());
        const std::uint32_t stored = Ordered(static_cast<std::uint32_t>(count), reverseBytes);
        file.Write(&stored, sizeof stored);
        headerPending = false;
        return;
    }
    file.Seek(CountOffset, SEEK_SET);
    std::uint32_t stored = 0;
    file.Read(&stored, sizeof stored);
    const std::uint64_t total = Ordered(stored, reverseBytes) + count;
    // The count field holds 32 bits; a file past that could not be read back.
    if (total > std::numeric_limits<std::uint32_t>::max())
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    stored = Ordered(static_cast<std::uint32_t>(total), reverseBytes);
    // A stream opened for update needs a seek between reading and writing.
    file.Seek(CountOffset, SEEK_SET);
    file.Write(&stored, sizeof stored);
    file.Seek(0, SEEK_END);
}

void ZonCldSTLBinaryFormat::WriteFacet(ZonCloudOutputFile& file, const float normal[3], const float vertices[9],
                                       bool reverseBytes)
{
    unsigned char record[FacetSize] = {};
    std::uint32_t words[12];
    for (int i = 0; i < 3; ++i) words[i] = std::bit_cast<std::uint32_t>(normal[i]);
    for (int i = 0; i < 9; ++i) words[3 + i] = std::bit_cast<std::uint32_t>(vertices[i]);
    for (auto& word : words) word = Ordered(word, reverseBytes);
    std::memcpy(record, words, sizeof words);  // the last two bytes stay 0
    file.Write(record, sizeof record);
}
