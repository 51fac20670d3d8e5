#pragma once
#include <exception>
#include <string>
#include <vector>

#include "ZonHostExport.h"

// The host's error object: a message key in a named catalog, a severity, and
// where it was raised. The text is looked up when it is shown.
class ZON_HOST_API ZonError : public std::exception {
public:
    ZonError(std::string key, std::string catalog);
    ~ZonError() override;

    const std::string& GetMessageKey() const { return key_; }
    const std::string& GetCatalogName() const { return catalog_; }
    int GetSeverity() const { return severity_; }
    void SetSeverity(int severity) { severity_ = severity; }
    void SetParameters(std::vector<std::string> parameters) { parameters_ = std::move(parameters); }
    const std::vector<std::string>& GetParameters() const { return parameters_; }
    void SetSource(const char* file, int line) { file_ = file ? file : ""; line_ = line; }
    const std::string& GetSourceFile() const { return file_; }
    int GetSourceLine() const { return line_; }

    // The catalog text with its parameters, or the key when the catalog has no text.
    std::string GetNLSMessage() const;
    const char* what() const noexcept override;

private:
    std::string key_;
    std::string catalog_;
    int severity_ = 0;
    std::vector<std::string> parameters_;
    std::string file_;
    int line_ = 0;
    mutable std::string what_;
};

// The error class the cloud module raises.
class ZON_HOST_API ZonCloudOperError : public ZonError {
public:
    using ZonError::ZonError;
    ~ZonCloudOperError() override;
};
