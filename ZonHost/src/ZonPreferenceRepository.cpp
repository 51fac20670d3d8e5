#include <map>
#include <memory>

#include "ZonCldSettings.h"

ZonPreferenceRepository& ZonPreferenceRepository::Get(const std::string& repositoryName)
{
    static std::mutex mutex;
    static std::map<std::string, std::unique_ptr<ZonPreferenceRepository>> repositories;
    std::lock_guard lock(mutex);
    auto& slot = repositories[repositoryName];
    if (!slot) slot = std::make_unique<ZonPreferenceRepository>();
    return *slot;
}

std::optional<std::string> ZonPreferenceRepository::ReadPreference(const std::string& name) const
{
    std::lock_guard lock(mutex_);
    const auto it = values_.find(name);
    if (it == values_.end()) return std::nullopt;
    return it->second;
}

void ZonPreferenceRepository::WritePreference(const std::string& name, const std::string& value)
{
    std::lock_guard lock(mutex_);
    values_[name] = value;
}

void ZonPreferenceRepository::Clear()
{
    std::lock_guard lock(mutex_);
    values_.clear();
}
