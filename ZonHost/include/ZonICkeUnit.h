#pragma once
#include <memory>
#include <string>

#include "ZonHostExport.h"

// A length unit of the host ("mm", "Inch", "m"), as a factor to millimetres.
class ZON_HOST_API ZonICkeUnit {
public:
    ZonICkeUnit(std::string name, double millimetres) : name_(std::move(name)), mm_(millimetres) {}
    const std::string& Name() const { return name_; }
    double ToMillimetres() const { return mm_; }

    // The host's unit of that name (case-insensitive), or null.
    static std::shared_ptr<const ZonICkeUnit> FromName(const std::string& name);

private:
    std::string name_;
    double mm_;
};
using ZonICkeUnit_var = std::shared_ptr<const ZonICkeUnit>;
