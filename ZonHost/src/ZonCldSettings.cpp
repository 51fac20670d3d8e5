#include "ZonCldSettings.h"

#include <charconv>
#include <cstdio>

ZonCldSettings& ZonCldSettings::Instance()
{
    static ZonCldSettings settings;
    return settings;
}

std::optional<std::string> ZonCldSettings::GetValue(const std::string& key) const
{
    std::lock_guard lock(mutex_);
    const auto it = values_.find(key);
    if (it == values_.end()) return std::nullopt;
    return it->second;
}

void ZonCldSettings::SetValue(const std::string& key, const std::string& value)
{
    std::lock_guard lock(mutex_);
    values_[key] = value;
}

void ZonCldSettings::Unset(const std::string& key)
{
    std::lock_guard lock(mutex_);
    values_.erase(key);
}

void ZonCldSettings::ResetAll()
{
    std::lock_guard lock(mutex_);
    values_.clear();
}

std::string ZonCldSettings::GetString(const std::string& key, const std::string& fallback) const
{
    return GetValue(key).value_or(fallback);
}

bool ZonCldSettings::GetBool(const std::string& key, bool fallback) const
{
    const auto value = GetValue(key);
    if (!value) return fallback;
    return *value == "1" || *value == "true" || *value == "Y";
}

int ZonCldSettings::GetInt(const std::string& key, int fallback) const
{
    const auto value = GetValue(key);
    if (!value) return fallback;
    int result = fallback;
    const auto [end, ec] = std::from_chars(value->data(), value->data() + value->size(), result);
    return ec == std::errc() ? result : fallback;
}

double ZonCldSettings::GetDouble(const std::string& key, double fallback) const
{
    const auto value = GetValue(key);
    if (!value) return fallback;
    double result = fallback;
    const auto [end, ec] = std::from_chars(value->data(), value->data() + value->size(), result);
    return ec == std::errc() ? result : fallback;
}

void ZonCldSettings::SetDouble(const std::string& key, double value)
{
    char buffer[64];
    const auto [end, ec] = std::to_chars(buffer, buffer + sizeof buffer, value);
    SetValue(key, std::string(buffer, ec == std::errc() ? end : buffer));
}
