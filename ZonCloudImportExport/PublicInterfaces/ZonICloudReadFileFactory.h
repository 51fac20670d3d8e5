#pragma once
#include <memory>

#include "ZonCldExport.h"
#include "ZonICloudReadFile.h"
#include "ZonUnicodeString.h"

class ZonDialog;
class ZonNotification;
class ZonOptionFrame;

// Each format's factory: names the format, gives its filter, creates readers.
class ZON_CLD_API ZonICloudReadFileFactory {
public:
    static constexpr const char* InterfaceName = "ZonICloudReadFileFactory";

    virtual ~ZonICloudReadFileFactory() = default;
    virtual void GetFormatName(ZonUnicodeString& name) = 0;
    virtual void GetFileFilter(ZonString& filter) = 0;
    virtual void IsWithSampling(bool& answer) = 0;
    virtual void IsWithLengthUnit(bool& answer) = 0;
    virtual void IsWithOptions(bool& answer) = 0;
    // Option frames belong to the dialog toolkit, which this build has not; null by default.
    virtual ZonOptionFrame* GetOptions(ZonDialog* /*parent*/, ZonNotification*& notification)
    {
        notification = nullptr;
        return nullptr;
    }
    // The name under which the factory class is registered ("CloudFactory..." ).
    virtual const char* GetRegistryName() = 0;
    // Creates the reader for one file, with the format's settings applied.
    virtual ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) = 0;
};
using ZonICloudReadFileFactory_var = std::shared_ptr<ZonICloudReadFileFactory>;
