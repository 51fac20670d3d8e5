#include "ZonIReporter.h"

#include <cstdio>

void ZonStderrReporter::Report(const ZonError& error)
{
    std::fprintf(stderr, "%s: %s: %s\n", error.GetCatalogName().c_str(), error.GetMessageKey().c_str(),
                 error.GetNLSMessage().c_str());
}
