#include <algorithm>
#include <cstring>

#include "ZonCldImporter.h"
#include "ZonCldSettings.h"
#include "ZonCloudExporter.h"
#include "ZonCloudPrintFormat.h"
#include "ZonCloudReadFileFactory.h"
#include "ZonCloudTool.h"

namespace {

std::vector<std::string> Choices(const char* choices)
{
    std::vector<std::string> list;
    std::string rest = choices;
    for (std::size_t bar; (bar = rest.find('|')) != std::string::npos; rest.erase(0, bar + 1))
        list.push_back(rest.substr(0, bar));
    list.push_back(rest);
    return list;
}

}  // namespace

void ZonToolSettingOptions::AddTo(CLI::App& command, const std::vector<ZonCloudSetting>& settings)
{
    for (const ZonCloudSetting& setting : settings) {
        if (!setting.option) continue;
        const auto same = [&](const std::unique_ptr<Entry>& entry) {
            return std::strcmp(entry->settings.front().option, setting.option) == 0;
        };
        const auto found = std::find_if(_entries.begin(), _entries.end(), same);
        if (found == _entries.end()) {
            _entries.push_back(std::make_unique<Entry>());
            _entries.back()->settings.push_back(setting);
            continue;
        }
        // Formats that read the same key share the option.
        auto& shared = (*found)->settings;
        if (std::none_of(shared.begin(), shared.end(),
                         [&](const ZonCloudSetting& s) { return std::strcmp(s.key, setting.key) == 0; }))
            shared.push_back(setting);
    }

    for (const auto& entry : _entries) {
        if (entry->option) continue;  // added by an earlier call
        const ZonCloudSetting& first = entry->settings.front();
        const std::string name = std::string("--") + first.option;
        const bool several = entry->settings.size() > 1;
        switch (first.kind) {
            case ZonCloudSetting::Kind::Flag: entry->option = command.add_flag(name, entry->flag, first.help); break;
            case ZonCloudSetting::Kind::Integer:
                entry->option = command.add_option(name, entry->integer, first.help);
                break;
            case ZonCloudSetting::Kind::Number: entry->option = command.add_option(name, entry->number, first.help); break;
            case ZonCloudSetting::Kind::Position: entry->option = command.add_option(name, entry->text, first.help); break;
            case ZonCloudSetting::Kind::Text:
                entry->option = several ? command.add_option(name, entry->texts, first.help)->expected(
                                              static_cast<int>(entry->settings.size()))
                                        : command.add_option(name, entry->text, first.help);
                break;
        }
        if (first.choices) entry->option->check(CLI::IsMember(Choices(first.choices)));
        if (first.low < first.high) entry->option->check(CLI::Range(first.low, first.high));
    }

    // Flags that store different values in one key exclude each other.
    for (std::size_t a = 0; a < _entries.size(); ++a)
        for (std::size_t b = a + 1; b < _entries.size(); ++b) {
            const ZonCloudSetting& x = _entries[a]->settings.front();
            const ZonCloudSetting& y = _entries[b]->settings.front();
            if (x.kind == ZonCloudSetting::Kind::Flag && y.kind == ZonCloudSetting::Kind::Flag &&
                std::strcmp(x.key, y.key) == 0 && std::strcmp(x.given, y.given) != 0)
                _entries[a]->option->excludes(_entries[b]->option);
        }
}

void ZonToolSettingOptions::ApplyToSettings() const
{
    auto& store = ZonCldSettings::Instance();
    for (const auto& entry : _entries) {
        if (!entry->option || entry->option->count() == 0) continue;
        const ZonCloudSetting& first = entry->settings.front();
        switch (first.kind) {
            case ZonCloudSetting::Kind::Flag:
                if (!entry->flag) break;
                for (const ZonCloudSetting& setting : entry->settings) store.SetValue(setting.key, setting.given);
                break;
            case ZonCloudSetting::Kind::Integer:
                for (const ZonCloudSetting& setting : entry->settings) store.SetInt(setting.key, entry->integer);
                break;
            // As many digits as bring back the same double.
            case ZonCloudSetting::Kind::Number:
                for (const ZonCloudSetting& setting : entry->settings)
                    store.SetValue(setting.key, ZonFormat("%.17g", entry->number));
                break;
            case ZonCloudSetting::Kind::Text:
                if (entry->settings.size() == 1) {
                    store.SetValue(first.key, entry->text);
                    break;
                }
                for (std::size_t i = 0; i < entry->settings.size() && i < entry->texts.size(); ++i)
                    store.SetValue(entry->settings[i].key, entry->texts[i]);
                break;
            case ZonCloudSetting::Kind::Position: {
                const auto choices = Choices(first.choices);
                const auto at = std::find(choices.begin(), choices.end(), entry->text);
                for (const ZonCloudSetting& setting : entry->settings)
                    store.SetInt(setting.key, static_cast<int>(at - choices.begin()));
                break;
            }
        }
    }
}

std::vector<ZonCloudSetting> ZonToolReaderSettings()
{
    std::vector<ZonCloudSetting> settings;
    for (const auto& factory : ZonCldImporter::GetAllFactories())
        if (const auto declared = ZonQueryInterface<ZonCloudReadFileFactory>(factory))
            settings.insert(settings.end(), declared->GetSettings().begin(), declared->GetSettings().end());
    return settings;
}

std::vector<ZonCloudSetting> ZonToolExporterSettings()
{
    std::vector<ZonCloudSetting> settings;
    for (const auto& exporter : ZonCloudExporter::GetAll())
        settings.insert(settings.end(), exporter->GetSettings().begin(), exporter->GetSettings().end());
    return settings;
}
