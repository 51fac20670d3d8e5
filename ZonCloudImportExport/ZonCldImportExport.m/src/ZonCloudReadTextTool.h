#pragma once
#include <cstdint>
#include <cstdio>
#include <new>
#include <stdexcept>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudOperErrorTool.h"

// What the readers of text point files share to size and load a file.
class ZON_CLD_API ZonCloudReadTextTool {
public:
    // Room for n elements; an allocation that fails or that no vector could
    // hold ends as the memory error, never as a standard exception.
    template <class T>
    static void Reserve(std::vector<T>& v, std::uint64_t n)
    {
        try {
            if (n > v.max_size()) ZonCloudOperErrorTool::ThrowInsufficientMemory();
            v.reserve(static_cast<std::size_t>(n));
        } catch (const std::bad_alloc&) {
            ZonCloudOperErrorTool::ThrowInsufficientMemory();
        } catch (const std::length_error&) {
            ZonCloudOperErrorTool::ThrowInsufficientMemory();
        }
    }

    // Empties the vectors and gives their memory back.
    template <class... Vectors>
    static void Free(Vectors&... vectors)
    {
        (Vectors().swap(vectors), ...);
    }

    // Size of the open file, which is left at its end; a failure raises the
    // errno message.
    static std::uint64_t FileSize(std::FILE* file);
    // Average length of the first `lines` lines (read `lineSize` bytes at a
    // time), 0 when there is none; the file's error and end flags are cleared.
    static std::uint64_t AverageLineLength(std::FILE* file, int lines, int lineSize);
    // Offset after the line just read; 0, with the error cleared, when the
    // stream cannot tell.
    static long LineEnd(std::FILE* file);

    // Closes a stream however the scope is left, and forgets it.
    struct FileCloser {
        std::FILE*& file;
        ~FileCloser()
        {
            if (file) std::fclose(file);
            file = nullptr;
        }
    };
};
