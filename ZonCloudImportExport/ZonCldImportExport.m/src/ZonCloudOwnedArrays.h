#pragma once
#include <cstddef>
#include <cstdint>
#include <vector>

#include "ZonCldExport.h"

// The whole arrays a reader owns and may give away at the end of an import
// (see ZonICloudReadHandOver): a reader lists them, and Take finds the one
// that an answer pointed into and moves it out. Only an array given whole
// matches, so a reader that answers from a cache or a part of an array keeps it.
class ZON_CLD_API ZonCloudOwnedArrays {
public:
    void Add(std::vector<float>& v) { _floats.push_back(&v); }
    void Add(std::vector<double>& v) { _doubles.push_back(&v); }
    void Add(std::vector<std::uint32_t>& v) { _indices.push_back(&v); }
    void Add(std::vector<std::int32_t>& v) { _integers.push_back(&v); }
    void Add(std::vector<unsigned char>& v) { _bytes.push_back(&v); }

    bool Take(const float* data, std::size_t count, std::vector<float>& into) { return Find(_floats, data, count, into); }
    bool Take(const double* data, std::size_t count, std::vector<double>& into) { return Find(_doubles, data, count, into); }
    bool Take(const std::uint32_t* data, std::size_t count, std::vector<std::uint32_t>& into)
    {
        return Find(_indices, data, count, into);
    }
    bool Take(const std::int32_t* data, std::size_t count, std::vector<std::int32_t>& into)
    {
        return Find(_integers, data, count, into);
    }
    bool Take(const unsigned char* data, std::size_t count, std::vector<unsigned char>& into)
    {
        return Find(_bytes, data, count, into);
    }

private:
    template <class T>
    static bool Find(const std::vector<std::vector<T>*>& arrays, const T* data, std::size_t count, std::vector<T>& into)
    {
        if (!data || count == 0) return false;
        for (std::vector<T>* array : arrays) {
            if (array->data() != data || array->size() != count) continue;
            into = std::move(*array);
            array->clear();
            array->shrink_to_fit();
            return true;
        }
        return false;
    }

    std::vector<std::vector<float>*> _floats;
    std::vector<std::vector<double>*> _doubles;
    std::vector<std::vector<std::uint32_t>*> _indices;
    std::vector<std::vector<std::int32_t>*> _integers;
    std::vector<std::vector<unsigned char>*> _bytes;
};
