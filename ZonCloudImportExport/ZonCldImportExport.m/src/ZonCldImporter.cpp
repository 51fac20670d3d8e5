#include "ZonCldImporter.h"

#include <mutex>

#include "ZonObjectRegistry.h"

namespace {
std::mutex editionMutex;
ZonUnicodeString formatForEdition;

bool StartsWithDigit(const ZonUnicodeString& name)
{
    const std::string& text = name.ToUtf8();
    return !text.empty() && text[0] >= '0' && text[0] <= '9';
}
}  // namespace

ZonCldImporter::ZonCldImporter(const ZonUnicodeString& formatName) : _factory(GetFactory(formatName)) {}

ZonICloudReadFile_var ZonCldImporter::CreateReader(const ZonUnicodeString& fileName)
{
    _reader.reset();
    if (_factory) _reader = _factory->CreateReader(fileName);
    return _reader;
}

std::vector<ZonICloudReadFileFactory_var> ZonCldImporter::GetAllFactories()
{
    std::vector<ZonICloudReadFileFactory_var> factories;
    if (!ZonObjectRegistry::IsInterfaceKnown(ZonICloudReadFileFactory::InterfaceName)) return factories;
    for (const std::string& className : ZonObjectRegistry::ListImplementations(ZonICloudReadFileFactory::InterfaceName)) {
        auto factory = ZonQueryInterface<ZonICloudReadFileFactory>(ZonObjectRegistry::CreateByLateType(className));
        if (factory) factories.push_back(std::move(factory));
    }
    return factories;
}

ZonICloudReadFileFactory_var ZonCldImporter::GetFactory(const ZonUnicodeString& formatName)
{
    ZonICloudReadFileFactory_var kept;
    for (auto& factory : GetAllFactories()) {
        ZonUnicodeString name;
        factory->GetFormatName(name);
        if (name == formatName) kept = factory;
    }
    return kept;
}

void ZonCldImporter::GetAvailableFormats(ZonListValZonUnicodeString& names, ZonListValZonString& filters, bool)
{
    names.clear();
    filters.clear();
    for (auto& factory : GetAllFactories()) {
        ZonUnicodeString name;
        ZonString filter;
        factory->GetFormatName(name);
        factory->GetFileFilter(filter);
        names.push_back(name);
        filters.push_back(filter);
    }
    // Neighbour swaps keep equal names in registry order.
    for (bool swapped = true; swapped;) {
        swapped = false;
        for (std::size_t i = 1; i < names.size(); ++i) {
            if (names[i] < names[i - 1]) {
                std::swap(names[i], names[i - 1]);
                std::swap(filters[i], filters[i - 1]);
                swapped = true;
            }
        }
    }
    ZonListValZonUnicodeString digitNames;
    ZonListValZonString digitFilters;
    ZonListValZonUnicodeString otherNames;
    ZonListValZonString otherFilters;
    for (std::size_t i = 0; i < names.size(); ++i) {
        auto& targetNames = StartsWithDigit(names[i]) ? digitNames : otherNames;
        auto& targetFilters = StartsWithDigit(names[i]) ? digitFilters : otherFilters;
        targetNames.push_back(names[i]);
        targetFilters.push_back(filters[i]);
    }
    names = std::move(otherNames);
    filters = std::move(otherFilters);
    names.insert(names.end(), digitNames.begin(), digitNames.end());
    filters.insert(filters.end(), digitFilters.begin(), digitFilters.end());
}

namespace {
template <class Ask>
bool AskFactory(const ZonUnicodeString& formatName, Ask ask)
{
    const auto factory = ZonCldImporter::GetFactory(formatName);
    if (!factory) return false;
    bool answer = false;
    ask(*factory, answer);
    return answer;
}
}  // namespace

bool ZonCldImporter::IsFormatWithSampling(const ZonUnicodeString& formatName)
{
    return AskFactory(formatName, [](ZonICloudReadFileFactory& f, bool& a) { f.IsWithSampling(a); });
}

bool ZonCldImporter::IsFormatWithLengthUnit(const ZonUnicodeString& formatName)
{
    return AskFactory(formatName, [](ZonICloudReadFileFactory& f, bool& a) { f.IsWithLengthUnit(a); });
}

bool ZonCldImporter::IsFormatWithOptions(const ZonUnicodeString& formatName)
{
    return AskFactory(formatName, [](ZonICloudReadFileFactory& f, bool& a) { f.IsWithOptions(a); });
}

ZonOptionFrame* ZonCldImporter::GetOptionsOfFormat(const ZonUnicodeString& formatName, ZonDialog* parent,
                                                   ZonNotification*& notification)
{
    notification = nullptr;
    const auto factory = GetFactory(formatName);
    return factory ? factory->GetOptions(parent, notification) : nullptr;
}

void ZonCldImporter::SetFormatForEdition(const ZonUnicodeString& formatName)
{
    std::lock_guard lock(editionMutex);
    formatForEdition = formatName;
}

ZonUnicodeString ZonCldImporter::GetFormatForEdition()
{
    std::lock_guard lock(editionMutex);
    return formatForEdition;
}
