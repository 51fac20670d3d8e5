#pragma once
#include <algorithm>
#include <cstddef>
#include <cstring>
#include <memory>
#include <utility>

// Text formatted ahead of writing: grows as needed, keeps its room between
// uses, and leaves the bytes it has not yet written uninitialised (a block
// of a million lines is formatted straight into it).
class ZonCloudTextBuffer {
public:
    // Room for at least n more characters; write them at the pointer
    // returned, then Commit the end.
    char* Reserve(std::size_t n)
    {
        if (_capacity - _size < n) Grow(n);
        return _data.get() + _size;
    }
    void Commit(const char* end) { _size = static_cast<std::size_t>(end - _data.get()); }
    void Append(const char* text, std::size_t n)
    {
        std::memcpy(Reserve(n), text, n);
        _size += n;
    }
    void Clear() { _size = 0; }
    const char* Data() const { return _data.get(); }
    std::size_t Size() const { return _size; }

private:
    void Grow(std::size_t n)
    {
        const std::size_t capacity = std::max(_size + n, 2 * _capacity);
        std::unique_ptr<char[]> data(new char[capacity]);
        if (_size) std::memcpy(data.get(), _data.get(), _size);
        _data = std::move(data);
        _capacity = capacity;
    }

    std::unique_ptr<char[]> _data;
    std::size_t _size = 0;
    std::size_t _capacity = 0;
};
