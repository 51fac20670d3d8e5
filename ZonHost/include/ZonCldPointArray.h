#pragma once
#include <cstddef>
#include <vector>

#include "ZonHostExport.h"
#include "ZonMath.h"

// The points of one cloud entity: x, y, z triples held in single precision,
// or in double precision when the import asked for it and the reader had it.
class ZON_HOST_API ZonCldPointArray {
public:
    // Replaces the content with count points of xyz, each coordinate multiplied by factor.
    void AssignScaled(const float* xyz, std::size_t count, double factor);
    void AssignScaled(const double* xyz, std::size_t count, double factor);
    // Takes xyz over (three values per point), each multiplied by factor in place.
    void AdoptScaled(std::vector<float>&& xyz, double factor);
    void AdoptScaled(std::vector<double>&& xyz, double factor);
    // Keeps only the points at the given indices, in that order.
    void Select(const std::vector<std::size_t>& indices);

    std::size_t GetNumberOfPoints() const { return _double ? _doubles.size() / 3 : _floats.size() / 3; }
    bool IsDoublePrecision() const { return _double; }
    ZonMathPoint GetPoint(std::size_t index) const;
    const std::vector<float>& GetFloats() const { return _floats; }
    const std::vector<double>& GetDoubles() const { return _doubles; }
    // Box of the points whose flag is set (every point when flags is null).
    void AddToBox(ZonMathBox& box, const unsigned char* flags = nullptr) const;

private:
    std::vector<float> _floats;
    std::vector<double> _doubles;
    bool _double = false;
};
