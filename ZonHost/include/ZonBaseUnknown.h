#pragma once
#include <memory>

#include "ZonHostExport.h"

// Root of every object the registry creates. Interfaces are obtained with
// ZonQueryInterface; an object that does not offer an interface yields null.
class ZON_HOST_API ZonBaseUnknown {
public:
    virtual ~ZonBaseUnknown();
};
using ZonBaseUnknown_var = std::shared_ptr<ZonBaseUnknown>;

template <class Interface, class From>
std::shared_ptr<Interface> ZonQueryInterface(const std::shared_ptr<From>& object)
{
    return std::dynamic_pointer_cast<Interface>(object);
}
