#include "ZonMsgCatalog.h"

#include <map>
#include <mutex>

namespace {

struct CatalogStore {
    std::mutex mutex;
    std::map<std::string, std::map<std::string, std::string, std::less<>>, std::less<>> catalogs;
};

CatalogStore& Store()
{
    static CatalogStore store;
    return store;
}

std::string_view Trim(std::string_view s)
{
    while (!s.empty() && (s.front() == ' ' || s.front() == '\t' || s.front() == '\r')) s.remove_prefix(1);
    while (!s.empty() && (s.back() == ' ' || s.back() == '\t' || s.back() == '\r')) s.remove_suffix(1);
    return s;
}

// Parses the quoted text of an entry; returns false when the line is malformed.
bool ParseQuoted(std::string_view s, std::string& out)
{
    if (s.empty() || s.front() != '"') return false;
    out.clear();
    for (std::size_t i = 1; i < s.size(); ++i) {
        const char c = s[i];
        if (c == '"') return true;
        if (c == '\\' && i + 1 < s.size()) {
            const char e = s[++i];
            out += e == 'n' ? '\n' : e == 't' ? '\t' : e;
        } else {
            out += c;
        }
    }
    return false;
}

}  // namespace

void ZonMsgCatalog::RegisterEmbedded(std::string_view catalogName, std::string_view fileText)
{
    auto& store = Store();
    std::lock_guard lock(store.mutex);
    auto& catalog = store.catalogs[std::string(catalogName)];
    while (!fileText.empty()) {
        const auto end = fileText.find('\n');
        std::string_view line = Trim(fileText.substr(0, end));
        fileText = end == std::string_view::npos ? std::string_view{} : fileText.substr(end + 1);
        if (line.empty() || line.starts_with("//")) continue;
        const auto eq = line.find('=');
        if (eq == std::string_view::npos) continue;
        std::string text;
        if (!ParseQuoted(Trim(line.substr(eq + 1)), text)) continue;
        catalog[std::string(Trim(line.substr(0, eq)))] = std::move(text);
    }
}

void ZonMsgCatalog::SetText(std::string_view catalogName, std::string_view key, std::string_view text)
{
    auto& store = Store();
    std::lock_guard lock(store.mutex);
    store.catalogs[std::string(catalogName)][std::string(key)] = std::string(text);
}

bool ZonMsgCatalog::Load(std::string_view catalogName)
{
    auto& store = Store();
    std::lock_guard lock(store.mutex);
    return store.catalogs.find(catalogName) != store.catalogs.end();
}

bool ZonMsgCatalog::Has(std::string_view catalogName, std::string_view key)
{
    auto& store = Store();
    std::lock_guard lock(store.mutex);
    const auto cat = store.catalogs.find(catalogName);
    return cat != store.catalogs.end() && cat->second.find(key) != cat->second.end();
}

std::string ZonMsgCatalog::Lookup(std::string_view catalogName, std::string_view key)
{
    auto& store = Store();
    std::lock_guard lock(store.mutex);
    const auto cat = store.catalogs.find(catalogName);
    if (cat == store.catalogs.end()) return {};
    const auto entry = cat->second.find(key);
    return entry == cat->second.end() ? std::string{} : entry->second;
}

std::string ZonMsgCatalog::Build(std::string_view catalogName, std::string_view key,
                                 const std::vector<std::string>& parameters)
{
    const std::string text = Lookup(catalogName, key);
    std::string out;
    out.reserve(text.size());
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] == '{' && i + 2 < text.size() && text[i + 2] == '}' && text[i + 1] >= '1' && text[i + 1] <= '9') {
            const std::size_t index = static_cast<std::size_t>(text[i + 1] - '1');
            if (index < parameters.size()) out += parameters[index];
            i += 2;
        } else {
            out += text[i];
        }
    }
    return out;
}

std::vector<std::string> ZonMsgCatalog::Keys(std::string_view catalogName)
{
    auto& store = Store();
    std::lock_guard lock(store.mutex);
    std::vector<std::string> keys;
    const auto cat = store.catalogs.find(catalogName);
    if (cat != store.catalogs.end())
        for (const auto& [key, text] : cat->second) keys.push_back(key);
    return keys;
}
