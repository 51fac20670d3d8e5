#include "ZonExchMemoryPointFace.h"

// Anchors the colour interface's type information in the host.
ZonIExchPointColors::~ZonIExchPointColors() = default;

const unsigned char* ZonExchMemoryPointFace::GetPointColors(unsigned& pointCount)
{
    pointCount = static_cast<unsigned>(_colors.size() / 3);
    return _colors.empty() ? nullptr : _colors.data();
}

bool ZonExchMemoryPointFace::GetSingleColor(unsigned char rgb[3])
{
    if (!_hasSingle) return false;
    rgb[0] = _single[0];
    rgb[1] = _single[1];
    rgb[2] = _single[2];
    return true;
}
