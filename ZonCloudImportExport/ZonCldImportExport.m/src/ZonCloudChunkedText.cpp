#include "ZonCloudChunkedText.h"

namespace {

std::atomic<std::uint64_t> threshold{0};
std::atomic<std::size_t> chunkSize{0};

}  // namespace

std::uint64_t ZonCloudChunkedText::Threshold()
{
    const std::uint64_t fixed = threshold.load(std::memory_order_relaxed);
    return fixed != 0 ? fixed : DefaultThreshold;
}

void ZonCloudChunkedText::SetThreshold(std::uint64_t bytes) { threshold.store(bytes, std::memory_order_relaxed); }

std::size_t ZonCloudChunkedText::ChunkSize()
{
    const std::size_t fixed = chunkSize.load(std::memory_order_relaxed);
    return fixed != 0 ? fixed : DefaultChunkSize;
}

void ZonCloudChunkedText::SetChunkSize(std::size_t bytes)
{
    // A chunk's marks count its lines in 32 bits.
    chunkSize.store(std::min<std::size_t>(bytes, std::size_t{1} << 30), std::memory_order_relaxed);
}

const unsigned char* ZonCloudChunkedText::MapIfWorth(ZonCloudByteSource& source, std::uint64_t offset)
{
    if (source.Size() <= 0) return nullptr;
    const auto size = static_cast<std::uint64_t>(source.Size());
    if (offset >= size || size - offset < Threshold()) return nullptr;
    return source.Map();
}
