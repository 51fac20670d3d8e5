#include "ZonCloudOperErrorTool.h"

#include <cstring>

#include "ZonError.h"
#include "ZonMsgCatalog.h"

std::string ZonCloudOperErrorTool::KeyFromErrno(int errorNumber)
{
    const char* name = errorNumber != 0 ? strerrorname_np(errorNumber) : nullptr;
    std::string key = "ZonCloudOperErrorTool.ERR_";
    key += name ? name : (errorNumber == 0 ? "NoError" : "E" + std::to_string(errorNumber));
    if (!ZonMsgCatalog::Has(Catalog, key)) {
        char buffer[256];
        // GNU strerror_r returns the message, not necessarily in buffer.
        const char* message = strerror_r(errorNumber, buffer, sizeof buffer);
        ZonMsgCatalog::SetText(Catalog, key, message);
    }
    return key;
}

void ZonCloudOperErrorTool::ThrowInsufficientMemory()
{
    ZonCloudOperError error(InsufficientMemoryKey, Catalog);
    error.SetSeverity(4);
    error.SetSource(__FILE__, __LINE__);
    throw error;
}
