#include "ZonIReporter.h"

namespace {
std::unique_ptr<ZonSession>& SessionSlot()
{
    static std::unique_ptr<ZonSession> session = std::make_unique<ZonSession>();
    return session;
}
}  // namespace

ZonSession* ZonSession::GetPtrSession() { return SessionSlot().get(); }
void ZonSession::CloseSession() { SessionSlot().reset(); }
void ZonSession::OpenSession()
{
    if (!SessionSlot()) SessionSlot() = std::make_unique<ZonSession>();
}

ZonIReporter_var ZonSession::GetReporter() const
{
    std::lock_guard lock(mutex_);
    return reporter_;
}

void ZonSession::SetReporter(ZonIReporter_var reporter)
{
    std::lock_guard lock(mutex_);
    reporter_ = std::move(reporter);
}
