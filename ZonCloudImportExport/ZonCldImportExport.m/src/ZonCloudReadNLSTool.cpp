#include "ZonCloudReadNLSTool.h"

#include <cerrno>
#include <cstdio>
#include <memory>

#include "ZonCloudOperErrorTool.h"
#include "ZonIReporter.h"
#include "ZonMsgCatalog.h"

ZonCloudOperError ZonCloudReadNLSTool::Build(const char* code)
{
    char key[256];
    char catalog[64];
    if (code) {
        std::snprintf(key, sizeof key, "ZonCloudReadNLSTool.%s", code);
        std::snprintf(catalog, sizeof catalog, "%s", Catalog());
    } else {
        std::snprintf(key, sizeof key, "%s", ZonCloudOperErrorTool::KeyFromErrno(errno).c_str());
        std::snprintf(catalog, sizeof catalog, "%s", ZonCloudOperErrorTool::Catalog);
    }
    return ZonCloudOperError(key, catalog);
}

void ZonCloudReadNLSTool::Throw(int type, const char* code)
{
    if (type < Usage || type > Data) return;
    Raise(static_cast<ErrorType>(type), code);
}

void ZonCloudReadNLSTool::Raise(ErrorType type, const char* code) { Raise(type, code, {}); }

void ZonCloudReadNLSTool::Raise(ErrorType type, const char* code, std::vector<std::string> parameters)
{
    ZonCloudOperError error = Build(code);
    error.SetParameters(std::move(parameters));
    error.SetSeverity(static_cast<int>(type) + 1);
    // Each type is raised from its own line so a report tells them apart.
    switch (type) {
        case Usage: error.SetSource("ZonCloudReadNLSTool", 100); break;
        case Input: error.SetSource("ZonCloudReadNLSTool", 101); break;
        case Other: error.SetSource("ZonCloudReadNLSTool", 102); break;
        default: error.SetSource("ZonCloudReadNLSTool", 103); break;
    }
    throw error;
}

void ZonCloudReadNLSTool::FullReporterErrorList(ZonError* error)
{
    if (!error) return;
    ZonSession* session = ZonSession::GetPtrSession();
    if (!session) return;
    const ZonIReporter_var reporter = session->GetReporter();
    if (!reporter) return;
    reporter->BeginReport();
    reporter->Report(*error);
}

void ZonCloudReadNLSTool::FullReporterErrorList(int, const char* code)
{
    ZonCloudOperError error = Build(code);
    FullReporterErrorList(&error);
}

namespace {
ZonUnicodeString CatalogText(const std::string& key)
{
    if (!ZonMsgCatalog::Load(ZonCloudReadNLSTool::Catalog())) return {};
    return ZonUnicodeString(ZonMsgCatalog::Build(ZonCloudReadNLSTool::Catalog(), key));
}
}  // namespace

ZonUnicodeString ZonCloudReadNLSTool::NameOfFormat(const char* factoryName)
{
    char key[256];
    std::snprintf(key, sizeof key, "%s.NameOfFormat", factoryName ? factoryName : "");
    return CatalogText(key);
}

ZonUnicodeString ZonCloudReadNLSTool::GeneratedBy() { return CatalogText("ZonCloudReadNLSTool.GeneratedBy"); }
