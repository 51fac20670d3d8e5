#pragma once
#include <string>
#include <vector>

#include "ZonCldExport.h"
#include "ZonError.h"
#include "ZonUnicodeString.h"

// Raises and reports the module's errors, and reads the display texts of the
// module's catalog.
class ZON_CLD_API ZonCloudReadNLSTool {
public:
    enum ErrorType : int {
        Usage = 0,  // wrong calling order or wrong interface
        Input = 1,  // failed read, seek or parse of the file
        Other = 2,
        Data = 3,   // what the content makes impossible; failed opens
    };

    // Raises a ZonCloudOperError for types 0 to 3 (severity type + 1). With a
    // null code the key comes from errno in "ZonCldResOperError". Any other
    // type returns without raising.
    static void Throw(int type, const char* code);
    // The same for callers that know the type is valid: never returns.
    [[noreturn]] static void Raise(ErrorType type, const char* code);
    // The same with the texts that fill the message's {1}, {2}, ... (what the
    // file holds that cannot be read, named to the user).
    [[noreturn]] static void Raise(ErrorType type, const char* code, std::vector<std::string> parameters);

    // Hands a caught error to the session's reporter (nothing without a session or reporter).
    static void FullReporterErrorList(ZonError* error);
    // Builds an error as Throw does and reports it without raising it.
    static void FullReporterErrorList(int type, const char* code);

    static ZonUnicodeString NameOfFormat(const char* factoryName);
    static ZonUnicodeString GeneratedBy();
    static const char* Catalog() { return "ZonCloudImportExport"; }

    // The catalog's two languages; kept for reference, nothing consults it.
    static constexpr const char* Languages[2] = {"French", "English"};

private:
    static ZonCloudOperError Build(const char* code);
};
