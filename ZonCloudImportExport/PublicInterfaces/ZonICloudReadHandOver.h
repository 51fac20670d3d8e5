#pragma once
#include <cstddef>
#include <cstdint>
#include <vector>

#include "ZonCldExport.h"

// Optional interface of a reader that holds its answers in whole arrays: at
// the end of an import the importer may take an array over instead of copying
// it, so a large file is held once, not twice.
//
// HandOver moves the reader's array into `into` when `data` is the start of
// an array the reader owns that holds exactly `count` values, and answers
// true; otherwise it changes nothing and answers false. The reader then no
// longer holds those values: the answer that gave `data` must not be asked
// for again, so an importer hands over only what it reads last, or a grid
// row once it has it (a walk never asks for a row twice).
class ZON_CLD_API ZonICloudReadHandOver {
public:
    virtual ~ZonICloudReadHandOver() = default;
    virtual bool HandOver(const float* data, std::size_t count, std::vector<float>& into) = 0;
    virtual bool HandOver(const double* data, std::size_t count, std::vector<double>& into) = 0;
    virtual bool HandOver(const std::uint32_t* data, std::size_t count, std::vector<std::uint32_t>& into) = 0;
    virtual bool HandOver(const std::int32_t* data, std::size_t count, std::vector<std::int32_t>& into) = 0;
    virtual bool HandOver(const unsigned char* data, std::size_t count, std::vector<unsigned char>& into) = 0;
};
