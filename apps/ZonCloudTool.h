#pragma once
#include <array>
#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>

#include "ZonCloudReadProgress.h"
#include "ZonCloudSetting.h"
#include "ZonError.h"
#include "ZonICloudReadFile.h"

class ZonCldBody;
class ZonGeoFactoryProtected;

// Offers the settings that formats declare as command-line options and writes
// the ones given into the settings store, knowing no format. Settings that
// share an option name make one option (the first declaration gives its kind
// and help); a setting without one is not offered. A flag or a number stores
// its value in every key of its option; a text option with several keys
// takes one value per key, in order.
class ZonToolSettingOptions {
public:
    // Adds the options not added yet.
    void AddTo(CLI::App& command, const std::vector<ZonCloudSetting>& settings);
    void ApplyToSettings() const;

private:
    struct Entry {
        std::vector<ZonCloudSetting> settings;  // one per key, in the order of the values
        CLI::Option* option = nullptr;
        bool flag = false;
        int integer = 0;
        double number = 0;
        std::string text;
        std::vector<std::string> texts;
    };
    std::vector<std::unique_ptr<Entry>> _entries;  // the options hold addresses into them
};

// What the registered reader factories and exporters declare.
std::vector<ZonCloudSetting> ZonToolReaderSettings();
std::vector<ZonCloudSetting> ZonToolExporterSettings();

// Reader options shared by the commands that read a file. Format options reach
// the readers through the settings store, as in the interactive import.
struct ZonToolReaderOptions {
    std::string file;
    std::string format;  // skips the choice by extension
    std::optional<double> sampling;
    bool doublePrecision = false;
    std::vector<double> box;  // xmin ymin zmin xmax ymax zmax
    ZonToolSettingOptions formatOptions;

    void AddTo(CLI::App& command);
    // Writes the options into the settings store.
    void ApplyToSettings() const;
    bool HasBox() const { return box.size() == 6; }
    ZonMathBox Box() const;
    // --format when given, else the format that claims the file's extension
    // (or the text reader that read the file in its place).
    std::string FormatName() const;
    // When the file's extension is claimed by several formats and no --format
    // was given, the line that says which one reads it; "" otherwise.
    std::string ChoiceNote() const;
    // Creates the reader: by --format when given, else by the file's extension.
    ZonICloudReadFile_var CreateReader(std::string& formatName) const;
    // Imports the file through the import entry, as the host would (by --format
    // when given), with a progress bar on a terminal; the statistics text is
    // the last message. Says on standard error which format was chosen when
    // several claim the file.
    std::shared_ptr<ZonCldBody> Import(ZonGeoFactoryProtected& geometry, std::vector<ZonString>& messages) const;

private:
    // Runs attempt("") (the format --format or the extension chooses); when
    // that reader refuses a file that is text, the free ASCII reader
    // tries it, attempt(its name), saying so on standard error; when it fails
    // too, the first reader's error is raised. --format turns this off.
    template <class Attempt>
    auto WithTextFallback(Attempt attempt) const;
    mutable std::string _readAsText;  // the text reader's name, once it read the file
};

// A progress bar on standard error while the calling thread reads `file`:
// the bytes read so far against the file's size, redrawn a few times a
// second once the work has lasted a second; nothing when standard error is
// not a terminal. Made around one import on the thread that imports.
class ZonToolProgress {
public:
    explicit ZonToolProgress(const std::string& file);
    ~ZonToolProgress();
    ZonToolProgress(const ZonToolProgress&) = delete;
    ZonToolProgress& operator=(const ZonToolProgress&) = delete;

private:
    void Paint();

    ZonCloudReadProgress _counter;
    std::uint64_t _size = 0;
    std::mutex _mutex;
    std::condition_variable _wake;
    bool _done = false;
    std::thread _painter;
};

// Writes numbers so that they read back to the same float or double.
nlohmann::json ZonToolNumber(float value);
nlohmann::json ZonToolNumber(double value);
// A box as [xmin, ymin, zmin, xmax, ymax, zmax], null when empty.
nlohmann::json ZonToolBoxJson(const ZonMathBox& box);
nlohmann::json ZonToolErrorJson(const ZonError& error);

// Each command adds itself and returns the function that runs it.
using ZonToolRun = std::function<int()>;
ZonToolRun ZonToolAddFormats(CLI::App& app);
ZonToolRun ZonToolAddInfo(CLI::App& app);
ZonToolRun ZonToolAddDump(CLI::App& app);
ZonToolRun ZonToolAddConvert(CLI::App& app);
