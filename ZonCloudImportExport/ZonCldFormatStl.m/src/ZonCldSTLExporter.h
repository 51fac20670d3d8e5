#pragma once
#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonIExchExporter.h"

// The STL exporter ("STLExporter"): drives the output document
// "CLD_STL_OutputDocument" through its steps with options taken from the
// export parameters, and stops at the first step that fails.
class ZON_CLD_API ZonCldSTLExporter : public ZonBaseUnknown, public ZonIExchExporter {
public:
    // Parameters read: "Precision" (empty or missing: "precUnknown"),
    // "Scaling" (passed on when present), "BinaryState" ("0", text, when
    // the option control gave none). An error raised while writing or
    // closing is reported, the half-written target removed, and the failure
    // returned.
    ZonHResult Export(const ZonIExchInputDocument_var& document, const ZonUnicodeString& fileName,
                      const Parameters& parameters) override;
};
