#pragma once
#include "ZonCldBody.h"
#include "ZonHostExport.h"

// The document's geometric factory: every cloud entity of an import is made here.
class ZON_HOST_API ZonGeoFactoryProtected {
public:
    virtual ~ZonGeoFactoryProtected();
    virtual ZonCldBody_var CreateCldBody();
    virtual ZonCldCloud_var CreateCloud();
    virtual ZonCldSetOfScans_var CreateSetOfScans();
    virtual ZonCldScan_var CreateScan();
    virtual ZonCldSetOfGrids_var CreateSetOfGrids();
    virtual ZonCldGrid_var CreateGrid();
    virtual ZonCldPolygon_var CreatePolygon();
    // How many entities this factory has made.
    std::size_t GetNumberOfCreated() const { return _created; }

private:
    template <class T>
    std::shared_ptr<T> Make();
    std::size_t _created = 0;
};
