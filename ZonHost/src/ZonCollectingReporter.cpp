#include "ZonIReporter.h"

void ZonCollectingReporter::Report(const ZonError& error)
{
    std::lock_guard lock(mutex_);
    entries_.push_back({error.GetCatalogName(), error.GetMessageKey(), error.GetNLSMessage(), error.GetSeverity(),
                        error.GetParameters()});
}

std::vector<ZonCollectingReporter::Entry> ZonCollectingReporter::Entries() const
{
    std::lock_guard lock(mutex_);
    return entries_;
}

void ZonCollectingReporter::Clear()
{
    std::lock_guard lock(mutex_);
    entries_.clear();
}
