#pragma once
#include <initializer_list>

#include "ZonCldExport.h"
#include "ZonUnicodeString.h"

// The one place where an export's outcome is told: each code becomes the
// message "ZonCldExportCmd.<code>" of the export catalog, with the file name
// as its parameter, handed to the session's reporter.
class ZON_CLD_API ZonCloudExportOutcome {
public:
    enum Level : int { Written = 1, NotWritten = 4 };

    // Several codes form one report (an outcome and its detail).
    static void Report(std::initializer_list<const char*> codes, const ZonUnicodeString& fileName, int level);
    static void Report(const char* code, const ZonUnicodeString& fileName, int level)
    {
        Report({code}, fileName, level);
    }
};
