#pragma once
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonCloudSetting.h"
#include "ZonObjectRegistry.h"
#include "ZonUnicodeString.h"

class ZonCldBody;

// Base of the exporters: each writes a whole body in one format. An exporter
// registers itself from its own source file with ZON_REGISTER_CLOUD_EXPORTER,
// as the reader factories do, so a front end finds it by the target's
// extension and offers the settings it declares without naming the format.
class ZON_CLD_API ZonCloudExporter : public ZonBaseUnknown {
public:
    static constexpr const char* InterfaceName = "ZonCloudExporter";

    // The parts of a body the format holds (a bit set). Parts it does not hold
    // are skipped, and the exporter says so.
    enum Kind : unsigned { Clouds = 1, Scans = 2, Grids = 4, Meshes = 8, EveryKind = 15 };

    struct Description {
        const char* registryName;  // "CloudExporter..."
        const char* fileFilter;    // "*.ext;*.ext2", lower case
        unsigned accepts;          // Kind bits
        ZonCloudSettings settings = {};
    };

    struct Request {
        const ZonCldBody& body;
        ZonUnicodeString fileName;
        std::string documentName;      // the name the file gives its content
        bool doublePrecision = false;  // take the body's points in double precision
    };

    explicit ZonCloudExporter(const Description& description) : _description(description) {}

    const char* GetRegistryName() const { return _description.registryName; }
    const char* GetFileFilter() const { return _description.fileFilter; }
    // The extensions of the filter, with their dot: ".asc".
    std::vector<std::string> GetExtensions() const;
    unsigned GetAccepts() const { return _description.accepts; }
    ZonCloudSettings GetSettings() const { return _description.settings; }

    // Writes the file with the exporter's settings read from the settings
    // store, and reports the outcome with ZonCloudExportOutcome. Answers what
    // was written ("3 points (Cgo)"), or nothing when the file was not written.
    virtual std::optional<std::string> Export(const Request& request) = 0;

    // Every registered exporter, by registry name.
    static std::vector<std::shared_ptr<ZonCloudExporter>> GetAll();
    // The exporter whose filter holds the file's extension (compared in lower
    // case); raises ERR_UnknownExtension, naming the extensions written, when there is none.
    static std::shared_ptr<ZonCloudExporter> ForFile(const ZonUnicodeString& fileName);

private:
    Description _description;
};
using ZonCloudExporter_var = std::shared_ptr<ZonCloudExporter>;

// Registers an exporter class with the host registry from the exporter's own source file.
#define ZON_REGISTER_CLOUD_EXPORTER(ExporterClass, registryName)                                  \
    namespace {                                                                                   \
    const ZonRegistration ExporterClass##Registration(registryName, ZonCloudExporter::InterfaceName, \
                                                      [] { return std::make_shared<ExporterClass>(); }); \
    }
