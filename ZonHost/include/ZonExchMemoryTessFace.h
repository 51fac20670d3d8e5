#pragma once
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonHostExport.h"
#include "ZonIExchTessFace.h"

// A tessellated face held in memory. Indices are offsets into the coordinate
// array (3 x the vertex number), as the interface says.
class ZON_HOST_API ZonExchMemoryTessFace : public ZonBaseUnknown, public ZonIExchTessFace {
public:
    void SetCoords(std::vector<float> coords) { _coords = std::move(coords); _hasCoords = true; }
    void SetCoordsDouble(std::vector<double> coords) { _coordsDouble = std::move(coords); _hasCoordsDouble = true; }
    // Three offsets per triangle.
    void SetTriangles(std::vector<unsigned> offsets) { _triangles = std::move(offsets); }
    void AddStrip(std::vector<unsigned> offsets) { _strips.push_back(std::move(offsets)); }
    void AddFan(std::vector<unsigned> offsets) { _fans.push_back(std::move(offsets)); }

    const float* GetCoords(unsigned& valueCount) override;
    const double* GetCoordsDouble(unsigned& valueCount) override;
    const unsigned* GetTriangles(unsigned& triangleCount) override;
    unsigned GetNumberOfStrips() override { return static_cast<unsigned>(_strips.size()); }
    const unsigned* GetStrip(unsigned strip, unsigned& length) override;
    unsigned GetNumberOfFans() override { return static_cast<unsigned>(_fans.size()); }
    const unsigned* GetFan(unsigned fan, unsigned& length) override;

private:
    std::vector<float> _coords;
    std::vector<double> _coordsDouble;
    bool _hasCoords = false;
    bool _hasCoordsDouble = false;
    std::vector<unsigned> _triangles;
    std::vector<std::vector<unsigned>> _strips;
    std::vector<std::vector<unsigned>> _fans;
};
using ZonExchMemoryTessFace_var = std::shared_ptr<ZonExchMemoryTessFace>;
