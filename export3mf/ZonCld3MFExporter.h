#pragma once
#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonIExchExporter.h"

// The 3MF exporter ("3MFExporter"): drives the output document
// "MUXE_3MF_OutputDocument", then packs the tree it wrote into the target
// and removes the tree. The first step that fails ends the export; an error
// raised on the way is reported, and neither the target nor the tree is
// left behind.
class ZON_CLD_API ZonCld3MFExporter : public ZonBaseUnknown, public ZonIExchExporter {
public:
    // Parameters read: "Scaling" (factor on every coordinate) and "Strict"
    // ("1": the numbering and naming strict readers demand).
    ZonHResult Export(const ZonIExchInputDocument_var& document, const ZonUnicodeString& fileName,
                      const Parameters& parameters) override;
};
