#pragma once
#include "ZonCldExport.h"
#include "ZonICloudReadFileFactory.h"

// Finds formats through the factories registered with the host registry.
// Nothing here names a format: a new one registers its factory and appears.
class ZON_CLD_API ZonCldImporter {
public:
    explicit ZonCldImporter(const ZonUnicodeString& formatName);

    ZonICloudReadFileFactory_var GetFactory() const { return _factory; }
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName);
    ZonICloudReadFile_var GetReader() const { return _reader; }

    static ZonICloudReadFileFactory_var GetFactory(const ZonUnicodeString& formatName);
    // Names and filters in the same order: by name, names that begin with a digit last.
    static void GetAvailableFormats(ZonListValZonUnicodeString& names, ZonListValZonString& filters, bool flag);
    static bool IsFormatWithSampling(const ZonUnicodeString& formatName);
    static bool IsFormatWithLengthUnit(const ZonUnicodeString& formatName);
    static bool IsFormatWithOptions(const ZonUnicodeString& formatName);
    static ZonOptionFrame* GetOptionsOfFormat(const ZonUnicodeString& formatName, ZonDialog* parent,
                                              ZonNotification*& notification);
    static void SetFormatForEdition(const ZonUnicodeString& formatName);
    static ZonUnicodeString GetFormatForEdition();

    // Every registered factory, in registry order (one object each).
    static std::vector<ZonICloudReadFileFactory_var> GetAllFactories();

private:
    ZonICloudReadFileFactory_var _factory;
    ZonICloudReadFile_var _reader;
};
