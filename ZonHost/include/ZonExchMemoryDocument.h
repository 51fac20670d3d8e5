#pragma once
#include <map>

#include "ZonBaseUnknown.h"
#include "ZonHostExport.h"
#include "ZonIExchInputDocument.h"

// An input document held in memory. A representation set to null stands for
// one that the document announces but cannot give.
class ZON_HOST_API ZonExchMemoryDocument : public ZonBaseUnknown, public ZonIExchInputDocument {
public:
    explicit ZonExchMemoryDocument(ZonUnicodeString aliasName = {}) : _aliasName(std::move(aliasName)) {}

    void SetRepresentation(const std::string& representationType, ZonBaseUnknown_var representation);
    void SetAliasName(const ZonUnicodeString& aliasName) { _aliasName = aliasName; }

    bool HasRepresentation(const std::string& representationType) override;
    ZonBaseUnknown_var GetRepresentation(const std::string& representationType) override;
    ZonUnicodeString GetAliasName() override { return _aliasName; }
    void SetAttribute(const std::string& name, const std::string& value) override { _attributes[name] = value; }
    std::string GetAttribute(const std::string& name) override;

private:
    std::map<std::string, ZonBaseUnknown_var> _representations;
    std::map<std::string, std::string> _attributes;
    ZonUnicodeString _aliasName;
};
using ZonExchMemoryDocument_var = std::shared_ptr<ZonExchMemoryDocument>;
