#pragma once
#include <functional>
#include <string>
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonHostExport.h"

// The host's meta-object registry: classes declare the interfaces they
// implement and can be created by their type name.
class ZON_HOST_API ZonObjectRegistry {
public:
    using Creator = std::function<ZonBaseUnknown_var()>;

    static void Register(const std::string& className, const std::string& interfaceName, Creator creator);
    // True once any class has declared that interface.
    static bool IsInterfaceKnown(const std::string& interfaceName);
    // Implementers sorted by class name, so the order does not depend on load order.
    static std::vector<std::string> ListImplementations(const std::string& interfaceName);
    // A new object of that class, or null.
    static ZonBaseUnknown_var CreateByLateType(const std::string& className);
};

// Registers a class at load time: `static ZonRegistration reg("Name", "Interface", [] { ... });`
struct ZON_HOST_API ZonRegistration {
    ZonRegistration(const std::string& className, const std::string& interfaceName, ZonObjectRegistry::Creator creator);
};
