#pragma once
#include <array>
#include <vector>

#include "ZonExchMemoryTessFace.h"
#include "ZonHostExport.h"
#include "ZonIExchPointColors.h"

// A face of points held in memory, with colours per point or one colour.
class ZON_HOST_API ZonExchMemoryPointFace : public ZonExchMemoryTessFace, public ZonIExchPointColors {
public:
    // R, G, B per point.
    void SetPointColors(std::vector<unsigned char> rgb) { _colors = std::move(rgb); }
    void SetSingleColor(unsigned char r, unsigned char g, unsigned char b)
    {
        _single = {r, g, b};
        _hasSingle = true;
    }

    const unsigned char* GetPointColors(unsigned& pointCount) override;
    bool GetSingleColor(unsigned char rgb[3]) override;

private:
    std::vector<unsigned char> _colors;
    std::array<unsigned char, 3> _single{};
    bool _hasSingle = false;
};
using ZonExchMemoryPointFace_var = std::shared_ptr<ZonExchMemoryPointFace>;
