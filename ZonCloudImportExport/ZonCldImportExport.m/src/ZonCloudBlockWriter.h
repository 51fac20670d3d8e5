#pragma once
#include <cstddef>
#include <functional>

#include "ZonCldExport.h"
#include "ZonCloudOutputFile.h"
#include "ZonCloudTextBuffer.h"

// Writes text made of many independent items (point lines, facets) in their
// order: a large count is cut into blocks that the worker pool formats while
// the calling thread writes the finished ones, a few blocks ahead at most.
class ZON_CLD_API ZonCloudBlockWriter {
public:
    // Appends the text of items [begin, end) to the buffer. Runs on worker
    // threads, several blocks at a time: it may only read shared state.
    using Format = std::function<void(ZonCloudTextBuffer& text, std::size_t begin, std::size_t end)>;

    // Formats items [0, count) in blocks of perBlock and writes them to file
    // in order; a failure to format or write raises once the blocks under
    // way have ended, and what was written stays for the file to remove.
    static void Write(ZonCloudOutputFile& file, std::size_t count, std::size_t perBlock, const Format& format);
};
