#pragma once
#include "ZonCloudExporter.h"
#include "ZonICloudWritePointFile.h"

// Base of the exporters of point text formats: every point of the body goes
// into one cloud, in the body's order: clouds (with their colours), scans,
// the valid points of grids, and the vertices of meshes. In a file where some
// points have colours, points without one are written white, so that every
// line has the same columns.
class ZON_CLD_API ZonCloudPointExporter : public ZonCloudExporter {
public:
    // formatName ends the summary ("3 points (Cgo)"); withColors says the
    // format keeps colours, so the summary mentions them.
    ZonCloudPointExporter(const Description& description, const char* formatName, bool withColors)
        : ZonCloudExporter(description), _formatName(formatName), _withColors(withColors)
    {
    }

    std::optional<std::string> Export(const Request& request) override;

protected:
    // The format's writer of that file, with the exporter's settings applied.
    virtual ZonICloudWritePointFile_var CreateWriter(const ZonUnicodeString& fileName) = 0;

private:
    const char* _formatName;
    bool _withColors;
};
