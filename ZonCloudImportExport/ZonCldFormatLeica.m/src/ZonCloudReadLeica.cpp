#include "ZonCloudReadLeica.h"

#include <algorithm>

#include "ZonCloudScanFormat.h"

namespace {

unsigned char ColorByte(int value) { return static_cast<unsigned char>(std::clamp(value, 0, 255)); }

}  // namespace

ZonCloudReadLeica::ZonCloudReadLeica(const ZonUnicodeString& fileName) : ZonCloudReadPointLines(fileName)
{
    _keepColors = true;
}

void ZonCloudReadLeica::SetKeepColors(bool keep)
{
    if (keep == _keepColors) return;
    _keepColors = keep;
    Discard();
}

bool ZonCloudReadLeica::ScanLine(const char* first, const char* last, char decimalPoint, double xyz[3],
                                 unsigned char rgb[3])
{
    static const ZonCloudScanFormat singleFormat("%f%f%f%d%d%d%d");
    static const ZonCloudScanFormat doubleFormat("%lf%lf%lf%d%d%d%d");

    int c[4] = {-1, -1, -1, -1};
    int values;
    if (_loadedAsDouble) {
        values = Scan(doubleFormat, first, last, decimalPoint, &xyz[0], &xyz[1], &xyz[2], &c[0], &c[1], &c[2], &c[3]);
    } else {
        float single[3] = {0.0f, 0.0f, 0.0f};
        values = Scan(singleFormat, first, last, decimalPoint, &single[0], &single[1], &single[2], &c[0], &c[1], &c[2],
                      &c[3]);
        std::copy(single, single + 3, xyz);
    }
    if (values < 3) return false;

    // The colour is the last three integers when they are a colour; six
    // values may be x y z R G B; anything else is white.
    if (values >= 6) {
        if (c[1] <= 255 && c[2] <= 255 && static_cast<unsigned>(c[3]) < 256u) {
            rgb[0] = ColorByte(c[1]);
            rgb[1] = ColorByte(c[2]);
            rgb[2] = ColorByte(c[3]);
        } else if (values == 6 && c[3] == -1 && static_cast<unsigned>(c[0]) < 256u) {
            rgb[0] = ColorByte(c[0]);
            rgb[1] = ColorByte(c[1]);
            rgb[2] = ColorByte(c[2]);
        }
    }
    return true;
}

const float* ZonCloudReadLeica::GetPoints(unsigned& count)
{
    count = 0;
    if (!_analysed || _loadedAsDouble) Load(false);
    count = static_cast<unsigned>(_count);
    return _points.data();
}

const double* ZonCloudReadLeica::GetPointsDouble(unsigned& count)
{
    count = 0;
    if (!_analysed || !_loadedAsDouble) Load(true);
    count = static_cast<unsigned>(_count);
    return _pointsDouble.data();
}

const unsigned char* ZonCloudReadLeica::GetPointColors(unsigned& count)
{
    count = 0;
    Analyse();
    if (!_keepColors) return nullptr;
    count = static_cast<unsigned>(_count);
    return _colors.data();
}
