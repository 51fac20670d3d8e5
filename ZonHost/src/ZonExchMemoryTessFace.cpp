#include "ZonExchMemoryTessFace.h"

namespace {
const unsigned* ListAt(const std::vector<std::vector<unsigned>>& lists, unsigned index, unsigned& length)
{
    if (index >= lists.size()) {
        length = 0;
        return nullptr;
    }
    length = static_cast<unsigned>(lists[index].size());
    return lists[index].data();
}
}  // namespace

const float* ZonExchMemoryTessFace::GetCoords(unsigned& valueCount)
{
    valueCount = static_cast<unsigned>(_coords.size());
    return _hasCoords ? _coords.data() : nullptr;
}

const double* ZonExchMemoryTessFace::GetCoordsDouble(unsigned& valueCount)
{
    valueCount = static_cast<unsigned>(_coordsDouble.size());
    return _hasCoordsDouble ? _coordsDouble.data() : nullptr;
}

const unsigned* ZonExchMemoryTessFace::GetTriangles(unsigned& triangleCount)
{
    triangleCount = static_cast<unsigned>(_triangles.size() / 3);
    return _triangles.data();
}

const unsigned* ZonExchMemoryTessFace::GetStrip(unsigned strip, unsigned& length)
{
    return ListAt(_strips, strip, length);
}

const unsigned* ZonExchMemoryTessFace::GetFan(unsigned fan, unsigned& length) { return ListAt(_fans, fan, length); }
