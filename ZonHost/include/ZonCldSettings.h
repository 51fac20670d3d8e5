#pragma once
#include <map>
#include <mutex>
#include <optional>
#include <string>

#include "ZonHostExport.h"

// The host's settings store for cloud import and export. Every entry is a
// named text; the typed accessors below are the import entry's, with their
// defaults. Each format declares and reads its own keys (readers through
// their factory, writers through their exporter).
class ZON_HOST_API ZonCldSettings {
public:
    static ZonCldSettings& Instance();

    // Generic access. Flags are stored as "1"/"0", numbers in the "C" notation.
    std::optional<std::string> GetValue(const std::string& key) const;
    void SetValue(const std::string& key, const std::string& value);
    void Unset(const std::string& key);
    std::string GetString(const std::string& key, const std::string& fallback) const;
    bool GetBool(const std::string& key, bool fallback) const;
    int GetInt(const std::string& key, int fallback) const;
    double GetDouble(const std::string& key, double fallback) const;
    void SetBool(const std::string& key, bool value) { SetValue(key, value ? "1" : "0"); }
    void SetInt(const std::string& key, int value) { SetValue(key, std::to_string(value)); }
    void SetDouble(const std::string& key, double value);
    // Back to the defaults (all entries removed).
    void ResetAll();

    // Import settings read by the import entry.
    double GetImportScaleFactor() const { return GetDouble("ImportScaleFactor", 1.0); }
    void SetImportScaleFactor(double v) { SetDouble("ImportScaleFactor", v); }
    double GetImportSampling() const { return GetDouble("ImportSampling", 100.0); }
    void SetImportSampling(double v) { SetDouble("ImportSampling", v); }
    std::string GetImportFileUnit() const { return GetString("ImportFileUnit", "mm"); }
    void SetImportFileUnit(const std::string& v) { SetValue("ImportFileUnit", v); }
    bool GetImportDoublePrecision() const { return GetBool("ImportDoublePrecision", false); }
    void SetImportDoublePrecision(bool v) { SetBool("ImportDoublePrecision", v); }

private:
    mutable std::mutex mutex_;
    std::map<std::string, std::string> values_;
};

// Named preference repositories of the exchange context ("ImportOptions").
class ZON_HOST_API ZonPreferenceRepository {
public:
    static ZonPreferenceRepository& Get(const std::string& repositoryName);
    std::optional<std::string> ReadPreference(const std::string& name) const;
    void WritePreference(const std::string& name, const std::string& value);
    void Clear();

private:
    mutable std::mutex mutex_;
    std::map<std::string, std::string> values_;
};
