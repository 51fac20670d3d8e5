#pragma once
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonCldCloud.h"
#include "ZonCldPolygon.h"
#include "ZonCldSetOfGrids.h"
#include "ZonCldSetOfScans.h"
#include "ZonHostExport.h"
#include "ZonMath.h"

// What one imported file becomes in the document: its clouds, sets of scans,
// sets of grids and polygons, with the length unit the points were converted
// from and the placement the caller gave.
class ZON_HOST_API ZonCldBody : public ZonBaseUnknown {
public:
    ~ZonCldBody() override;

    void AddCloud(ZonCldCloud_var cloud)
    {
        _clouds.push_back(std::move(cloud));
        Changed();
    }
    void AddSetOfScans(ZonCldSetOfScans_var set)
    {
        _setsOfScans.push_back(std::move(set));
        Changed();
    }
    void AddSetOfGrids(ZonCldSetOfGrids_var set)
    {
        _setsOfGrids.push_back(std::move(set));
        Changed();
    }
    void AddPolygon(ZonCldPolygon_var polygon)
    {
        _polygons.push_back(std::move(polygon));
        Changed();
    }

    const std::vector<ZonCldCloud_var>& GetClouds() const { return _clouds; }
    const std::vector<ZonCldSetOfScans_var>& GetSetsOfScans() const { return _setsOfScans; }
    const std::vector<ZonCldSetOfGrids_var>& GetSetsOfGrids() const { return _setsOfGrids; }
    const std::vector<ZonCldPolygon_var>& GetPolygons() const { return _polygons; }

    std::size_t GetNumberOfScans() const;
    std::size_t GetNumberOfGrids() const;
    // Rows of all grids, and their nodes that are not holes.
    std::size_t GetNumberOfGridRows() const;
    std::size_t GetNumberOfValidGridNodes() const;
    std::size_t GetNumberOfTriangles() const;
    // Cloud and scan points, valid grid points and polygon vertices.
    std::size_t GetNumberOfPoints() const;
    // Box of those points (empty when there is none). Computed once: an
    // entity is complete when it is added, and adding one forgets the box.
    ZonMathBox GetBox() const;
    bool IsEmpty() const { return GetNumberOfPoints() == 0; }

    // The reader's type of digitization (1 cloud, 2 scans, 3 grids, 4 polygons).
    int GetTypeOfDigitization() const { return _typeOfDigitization; }
    void SetTypeOfDigitization(int type) { _typeOfDigitization = type; }
    // Name of the length unit the file's coordinates were read in.
    const std::string& GetUnitName() const { return _unitName; }
    void SetUnitName(std::string name) { _unitName = std::move(name); }
    const ZonMathTransformation& GetPlacement() const { return _placement; }
    void SetPlacement(const ZonMathTransformation& placement) { _placement = placement; }

private:
    void Changed()
    {
        std::lock_guard lock(_boxMutex);
        _box.reset();
    }

    std::vector<ZonCldCloud_var> _clouds;
    std::vector<ZonCldSetOfScans_var> _setsOfScans;
    std::vector<ZonCldSetOfGrids_var> _setsOfGrids;
    std::vector<ZonCldPolygon_var> _polygons;
    int _typeOfDigitization = 0;
    std::string _unitName;
    ZonMathTransformation _placement;
    // Walking every point for the box is the slow part of a summary; two
    // threads may ask at once.
    mutable std::mutex _boxMutex;
    mutable std::optional<ZonMathBox> _box;
};
using ZonCldBody_var = std::shared_ptr<ZonCldBody>;
