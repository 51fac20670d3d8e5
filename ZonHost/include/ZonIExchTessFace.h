#pragma once
#include <memory>

#include "ZonHostExport.h"

// One face of a tessellated node: a coordinate array (x, y, z per vertex, in
// single and, where the representation has it, double precision) and its
// triangles given three ways: separate triangles, strips and fans. Every
// index in those lists is an offset into the coordinate array, so the vertex
// number is the index divided by 3.
class ZON_HOST_API ZonIExchTessFace {
public:
    virtual ~ZonIExchTessFace();
    // Number of values (three per vertex); null when the face has no such array.
    virtual const float* GetCoords(unsigned& valueCount) = 0;
    virtual const double* GetCoordsDouble(unsigned& valueCount) = 0;
    // Three indices per triangle.
    virtual const unsigned* GetTriangles(unsigned& triangleCount) = 0;
    virtual unsigned GetNumberOfStrips() = 0;
    virtual const unsigned* GetStrip(unsigned strip, unsigned& length) = 0;
    virtual unsigned GetNumberOfFans() = 0;
    virtual const unsigned* GetFan(unsigned fan, unsigned& length) = 0;
};
using ZonIExchTessFace_var = std::shared_ptr<ZonIExchTessFace>;
