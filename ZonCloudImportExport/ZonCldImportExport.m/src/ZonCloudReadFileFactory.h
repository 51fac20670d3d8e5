#pragma once
#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonCloudSetting.h"
#include "ZonICloudReadFileFactory.h"
#include "ZonObjectRegistry.h"

// Common part of the format factories: each passes its registry name, format
// name (empty when the name comes from the catalog), filter and abilities, and
// implements CreateReader, applying its format's settings to the new reader.
// A factory declares the settings it reads, so front ends can offer them.
class ZON_CLD_API ZonCloudReadFileFactory : public ZonBaseUnknown, public ZonICloudReadFileFactory {
public:
    struct Description {
        const char* registryName;  // "CloudFactory..."
        const char* formatName;    // literal name, or nullptr for the catalog's display name
        const char* fileFilter;    // "*.ext;*.ext2"
        bool withSampling;
        bool withLengthUnit;
        bool withOptions;
        ZonCloudSettings settings = {};
    };
    explicit ZonCloudReadFileFactory(const Description& description) : _description(description) {}

    void GetFormatName(ZonUnicodeString& name) override;
    void GetFileFilter(ZonString& filter) override { filter = _description.fileFilter; }
    void IsWithSampling(bool& answer) override { answer = _description.withSampling; }
    void IsWithLengthUnit(bool& answer) override { answer = _description.withLengthUnit; }
    void IsWithOptions(bool& answer) override { answer = _description.withOptions; }
    const char* GetRegistryName() override { return _description.registryName; }
    ZonCloudSettings GetSettings() const { return _description.settings; }

private:
    Description _description;
};

// Registers a factory class with the host registry from the factory's own source file.
#define ZON_REGISTER_CLOUD_FACTORY(FactoryClass, registryName)                                    \
    namespace {                                                                                   \
    const ZonRegistration FactoryClass##Registration(registryName,                                \
                                                     ZonICloudReadFileFactory::InterfaceName,     \
                                                     [] { return std::make_shared<FactoryClass>(); }); \
    }
