#pragma once
#include "ZonHostExport.h"

// Colours of the points of a tessellated face, offered by faces that carry
// points (clouds, scans, grids) next to ZonIExchTessFace: either one colour
// per point or one colour for the whole representation.
class ZON_HOST_API ZonIExchPointColors {
public:
    virtual ~ZonIExchPointColors();
    // R, G, B per point of the face's coordinate array; null when the points
    // have no colours of their own.
    virtual const unsigned char* GetPointColors(unsigned& pointCount) = 0;
    // The representation's one colour; false when it has none.
    virtual bool GetSingleColor(unsigned char rgb[3]) = 0;
};
