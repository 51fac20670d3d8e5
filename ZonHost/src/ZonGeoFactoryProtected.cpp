#include "ZonGeoFactoryProtected.h"

ZonGeoFactoryProtected::~ZonGeoFactoryProtected() = default;

template <class T>
std::shared_ptr<T> ZonGeoFactoryProtected::Make()
{
    ++_created;
    return std::make_shared<T>();
}

ZonCldBody_var ZonGeoFactoryProtected::CreateCldBody() { return Make<ZonCldBody>(); }
ZonCldCloud_var ZonGeoFactoryProtected::CreateCloud() { return Make<ZonCldCloud>(); }
ZonCldSetOfScans_var ZonGeoFactoryProtected::CreateSetOfScans() { return Make<ZonCldSetOfScans>(); }
ZonCldScan_var ZonGeoFactoryProtected::CreateScan() { return Make<ZonCldScan>(); }
ZonCldSetOfGrids_var ZonGeoFactoryProtected::CreateSetOfGrids() { return Make<ZonCldSetOfGrids>(); }
ZonCldGrid_var ZonGeoFactoryProtected::CreateGrid() { return Make<ZonCldGrid>(); }
ZonCldPolygon_var ZonGeoFactoryProtected::CreatePolygon() { return Make<ZonCldPolygon>(); }
