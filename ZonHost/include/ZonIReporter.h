#pragma once
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "ZonError.h"
#include "ZonHostExport.h"

// Where caught errors are shown to the user.
class ZON_HOST_API ZonIReporter {
public:
    virtual ~ZonIReporter();
    virtual void BeginReport() = 0;
    virtual void Report(const ZonError& error) = 0;
};
using ZonIReporter_var = std::shared_ptr<ZonIReporter>;

// Prints catalog, key and text of each error to standard error.
class ZON_HOST_API ZonStderrReporter : public ZonIReporter {
public:
    void BeginReport() override {}
    void Report(const ZonError& error) override;
};

// Keeps every reported error, for tests and for the tool's JSON output.
class ZON_HOST_API ZonCollectingReporter : public ZonIReporter {
public:
    struct Entry {
        std::string catalog, key, message;
        int severity;
        std::vector<std::string> parameters;
    };
    void BeginReport() override {}
    void Report(const ZonError& error) override;
    std::vector<Entry> Entries() const;
    void Clear();

private:
    mutable std::mutex mutex_;
    std::vector<Entry> entries_;
};

// The host session: owns the reporter and the terrain-modelling flag.
class ZON_HOST_API ZonSession {
public:
    // The process's session; null after CloseSession (nothing is reported then).
    static ZonSession* GetPtrSession();
    static void CloseSession();
    static void OpenSession();

    ZonIReporter_var GetReporter() const;
    void SetReporter(ZonIReporter_var reporter);
    bool IsTerrainMode() const { return terrainMode_; }
    void SetTerrainMode(bool on) { terrainMode_ = on; }

private:
    mutable std::mutex mutex_;
    ZonIReporter_var reporter_ = std::make_shared<ZonStderrReporter>();
    bool terrainMode_ = false;
};
