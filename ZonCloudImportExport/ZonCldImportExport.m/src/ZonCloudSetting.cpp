#include "ZonCloudSetting.h"

#include <charconv>
#include <cstring>

#include "ZonCldSettings.h"

std::string ZonCloudSetting::Read() const { return ZonCldSettings::Instance().GetString(key, fallback); }

// Fallbacks are declared as "1" or "0".
bool ZonCloudSetting::ReadBool() const
{
    return ZonCldSettings::Instance().GetBool(key, std::strcmp(fallback, "1") == 0);
}

int ZonCloudSetting::ReadInt() const
{
    int value = 0;
    std::from_chars(fallback, fallback + std::strlen(fallback), value);
    return ZonCldSettings::Instance().GetInt(key, value);
}

double ZonCloudSetting::ReadDouble() const
{
    double value = 0.0;
    std::from_chars(fallback, fallback + std::strlen(fallback), value);
    return ZonCldSettings::Instance().GetDouble(key, value);
}
