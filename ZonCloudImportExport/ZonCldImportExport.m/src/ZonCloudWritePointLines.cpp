#include "ZonCloudWritePointLines.h"

#include <vector>

#include "ZonCloudBlockWriter.h"

namespace {
// About half a megabyte of text per block.
constexpr std::size_t PointsPerBlock = 16384;
}  // namespace

void ZonCloudWritePointLines::WritePoints(const Run& run)
{
    std::uint64_t lines = run.count;
    if (run.valid) {
        lines = 0;
        for (std::size_t i = 0; i < run.count; ++i) lines += run.valid[i] != 0;
    }
    if (lines == 0) return;
    WriteLines(run, TakeLines(lines));
}

void ZonCloudWritePointLines::WriteLines(const Run& run, std::uint64_t first)
{
    // The number of each block's first line, when holes shift them.
    std::vector<std::uint64_t> starts;
    if (run.valid) {
        std::uint64_t number = first;
        for (std::size_t i = 0; i < run.count; ++i) {
            if (i % PointsPerBlock == 0) starts.push_back(number);
            number += run.valid[i] != 0;
        }
    }
    ZonCloudBlockWriter::Write(_file, run.count, PointsPerBlock, [&](ZonCloudTextBuffer& text, std::size_t begin, std::size_t end) {
        std::uint64_t number = run.valid ? starts[begin / PointsPerBlock] : first + begin;
        for (std::size_t i = begin; i < end; ++i) {
            if (run.valid && !run.valid[i]) continue;
            double xyz[3];
            if (run.dual) {
                for (int k = 0; k < 3; ++k) xyz[k] = run.dual[3 * i + k];
            } else {
                for (int k = 0; k < 3; ++k) xyz[k] = run.single[3 * i + k];
            }
            FormatLine(text, xyz, run.rgb ? run.rgb + 3 * i : run.defaultRgb, number++);
        }
    });
}
