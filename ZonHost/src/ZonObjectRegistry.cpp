#include "ZonObjectRegistry.h"

#include <algorithm>
#include <map>
#include <mutex>

namespace {
struct RegistryData {
    std::mutex mutex;
    std::map<std::string, ZonObjectRegistry::Creator> creators;
    std::map<std::string, std::vector<std::string>> implementers;
};
RegistryData& Data()
{
    static RegistryData data;
    return data;
}
}  // namespace

void ZonObjectRegistry::Register(const std::string& className, const std::string& interfaceName, Creator creator)
{
    auto& data = Data();
    std::lock_guard lock(data.mutex);
    data.creators[className] = std::move(creator);
    auto& list = data.implementers[interfaceName];
    if (std::find(list.begin(), list.end(), className) == list.end()) {
        list.push_back(className);
        std::sort(list.begin(), list.end());
    }
}

bool ZonObjectRegistry::IsInterfaceKnown(const std::string& interfaceName)
{
    auto& data = Data();
    std::lock_guard lock(data.mutex);
    return data.implementers.count(interfaceName) != 0;
}

std::vector<std::string> ZonObjectRegistry::ListImplementations(const std::string& interfaceName)
{
    auto& data = Data();
    std::lock_guard lock(data.mutex);
    const auto it = data.implementers.find(interfaceName);
    return it == data.implementers.end() ? std::vector<std::string>{} : it->second;
}

ZonBaseUnknown_var ZonObjectRegistry::CreateByLateType(const std::string& className)
{
    Creator creator;
    {
        auto& data = Data();
        std::lock_guard lock(data.mutex);
        const auto it = data.creators.find(className);
        if (it == data.creators.end()) return nullptr;
        creator = it->second;
    }
    return creator();
}

ZonRegistration::ZonRegistration(const std::string& className, const std::string& interfaceName,
                                 ZonObjectRegistry::Creator creator)
{
    ZonObjectRegistry::Register(className, interfaceName, std::move(creator));
}
