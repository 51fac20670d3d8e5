#include "ZonCldBody.h"

ZonCldBody::~ZonCldBody() = default;

std::size_t ZonCldBody::GetNumberOfScans() const
{
    std::size_t n = 0;
    for (const auto& set : _setsOfScans) n += set->GetNumberOfScans();
    return n;
}

std::size_t ZonCldBody::GetNumberOfGrids() const
{
    std::size_t n = 0;
    for (const auto& set : _setsOfGrids) n += set->GetNumberOfGrids();
    return n;
}

std::size_t ZonCldBody::GetNumberOfGridRows() const
{
    std::size_t n = 0;
    for (const auto& set : _setsOfGrids)
        for (const auto& grid : set->GetGrids()) n += grid->GetNumberOfRows();
    return n;
}

std::size_t ZonCldBody::GetNumberOfValidGridNodes() const
{
    std::size_t n = 0;
    for (const auto& set : _setsOfGrids) n += set->GetNumberOfValidPoints();
    return n;
}

std::size_t ZonCldBody::GetNumberOfTriangles() const
{
    std::size_t n = 0;
    for (const auto& polygon : _polygons) n += polygon->GetNumberOfTriangles();
    return n;
}

std::size_t ZonCldBody::GetNumberOfPoints() const
{
    std::size_t n = 0;
    for (const auto& cloud : _clouds) n += cloud->GetNumberOfPoints();
    for (const auto& set : _setsOfScans) n += set->GetNumberOfPoints();
    for (const auto& set : _setsOfGrids) n += set->GetNumberOfValidPoints();
    for (const auto& polygon : _polygons) n += polygon->GetNumberOfVertices();
    return n;
}

ZonMathBox ZonCldBody::GetBox() const
{
    std::lock_guard lock(_boxMutex);
    if (_box) return *_box;
    ZonMathBox& box = _box.emplace();
    for (const auto& cloud : _clouds) cloud->Points().AddToBox(box);
    for (const auto& set : _setsOfScans)
        for (const auto& scan : set->GetScans()) scan->Points().AddToBox(box);
    for (const auto& set : _setsOfGrids)
        for (const auto& grid : set->GetGrids())
            for (const auto& row : grid->GetRows()) row.points.AddToBox(box, row.valid.data());
    for (const auto& polygon : _polygons) polygon->Vertices().AddToBox(box);
    return box;
}
