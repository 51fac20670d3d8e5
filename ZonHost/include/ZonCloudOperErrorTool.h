#pragma once
#include <string>

#include "ZonHostExport.h"

// Turns C library error numbers into keys of the catalog "ZonCldResOperError".
class ZON_HOST_API ZonCloudOperErrorTool {
public:
    static constexpr const char* Catalog = "ZonCldResOperError";
    static constexpr const char* InsufficientMemoryKey = "ZonCloudOperErrorTool.ERR_InsufficientMemory";

    // "ZonCloudOperErrorTool.ERR_<errno name>"; the catalog gets the C library's
    // message for it, so the key always has a text.
    static std::string KeyFromErrno(int errorNumber);
    // Raises "ERR_InsufficientMemory" of "ZonCldResOperError" with severity 4.
    [[noreturn]] static void ThrowInsufficientMemory();
};
