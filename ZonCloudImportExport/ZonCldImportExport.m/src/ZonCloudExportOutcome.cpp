#include "ZonCloudExportOutcome.h"

#include <string>

#include "ZonIReporter.h"

void ZonCloudExportOutcome::Report(std::initializer_list<const char*> codes, const ZonUnicodeString& fileName, int level)
{
    ZonSession* session = ZonSession::GetPtrSession();
    const ZonIReporter_var reporter = session ? session->GetReporter() : nullptr;
    if (!reporter) return;
    reporter->BeginReport();
    for (const char* code : codes) {
        ZonError outcome(std::string("ZonCldExportCmd.") + code, "ZonCldExportCmd");
        outcome.SetSeverity(level);
        outcome.SetParameters({fileName.ToUtf8()});
        reporter->Report(outcome);
    }
}
