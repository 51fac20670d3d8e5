#include "ZonCloudReadTextTool.h"

#include <cerrno>
#include <string>

#include "ZonCloudReadNLSTool.h"

std::uint64_t ZonCloudReadTextTool::FileSize(std::FILE* file)
{
    errno = 0;
    if (std::fseek(file, 0, SEEK_END) != 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
    const long size = std::ftell(file);
    if (size < 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
    return static_cast<std::uint64_t>(size);
}

std::uint64_t ZonCloudReadTextTool::AverageLineLength(std::FILE* file, int lines, int lineSize)
{
    std::string line(static_cast<std::size_t>(lineSize), '\0');
    std::uint64_t read = 0;
    long offset = 0;
    while (read < static_cast<std::uint64_t>(lines) && std::fgets(line.data(), lineSize, file)) {
        ++read;
        offset = std::ftell(file);
    }
    std::clearerr(file);
    return read > 0 && offset > 0 ? static_cast<std::uint64_t>(offset) / read : 0;
}

long ZonCloudReadTextTool::LineEnd(std::FILE* file)
{
    const long offset = std::ftell(file);
    if (offset >= 0) return offset;
    std::clearerr(file);
    return 0;
}
