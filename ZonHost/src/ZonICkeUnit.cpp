#include "ZonICkeUnit.h"

#include <strings.h>

std::shared_ptr<const ZonICkeUnit> ZonICkeUnit::FromName(const std::string& name)
{
    static const ZonICkeUnit_var units[] = {
        std::make_shared<const ZonICkeUnit>("mm", 1.0),
        std::make_shared<const ZonICkeUnit>("Inch", 25.4),
        std::make_shared<const ZonICkeUnit>("m", 1000.0),
    };
    for (const auto& unit : units)
        if (strcasecmp(unit->Name().c_str(), name.c_str()) == 0) return unit;
    return nullptr;
}
