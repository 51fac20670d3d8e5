#include "ZonCloudBlockWriter.h"

#include <algorithm>
#include <vector>

#include "ZonCloudWorkerPool.h"

void ZonCloudBlockWriter::Write(ZonCloudOutputFile& file, std::size_t count, std::size_t perBlock, const Format& format)
{
    if (count == 0) return;
    perBlock = std::max<std::size_t>(perBlock, 1);
    const std::size_t blocks = (count + perBlock - 1) / perBlock;
    const auto range = [&](std::size_t block, ZonCloudTextBuffer& text) {
        text.Clear();
        format(text, block * perBlock, std::min(count, (block + 1) * perBlock));
    };
    // Asking for the thread count costs a system call: a single line must not.
    const unsigned threads = blocks == 1 ? 1 : ZonCloudWorkerPool::ThreadCount();
    if (threads <= 1) {
        // A line at a time is the common small case: no allocation per call.
        thread_local ZonCloudTextBuffer text;
        for (std::size_t block = 0; block < blocks; ++block) {
            range(block, text);
            file.Write(text.Data(), text.Size());
        }
        return;
    }
    // Two blocks per worker keep the workers busy while one is written.
    const std::size_t window = 2 * static_cast<std::size_t>(threads);
    std::vector<ZonCloudTextBuffer> texts(std::min(window, blocks));
    ZonCloudWorkerPool::Ordered(
        blocks, [&](std::size_t block) { range(block, texts[block % texts.size()]); },
        [&](std::size_t block) {
            const ZonCloudTextBuffer& text = texts[block % texts.size()];
            file.Write(text.Data(), text.Size());
        },
        window, threads);
}
