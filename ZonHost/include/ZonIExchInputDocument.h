#pragma once
#include <memory>
#include <string>

#include "ZonBaseUnknown.h"
#include "ZonHostExport.h"
#include "ZonUnicodeString.h"

// A document of the data-exchange framework as an exporter reads it: its
// representations by type ("ProductStructureRepresentation",
// "TessellatedRepresentation"; query the object for ZonIExchProductStructure
// or ZonIExchTessRep), its alias (display) name, and named attributes that an
// exporter may set to tell the framework what it needs.
class ZON_HOST_API ZonIExchInputDocument {
public:
    virtual ~ZonIExchInputDocument();
    virtual bool HasRepresentation(const std::string& representationType) = 0;
    // Null when the document has none of that type, or it cannot be obtained.
    virtual ZonBaseUnknown_var GetRepresentation(const std::string& representationType) = 0;
    virtual ZonUnicodeString GetAliasName() = 0;
    virtual void SetAttribute(const std::string& name, const std::string& value) = 0;
    // "" when the attribute is not set.
    virtual std::string GetAttribute(const std::string& name) = 0;
};
using ZonIExchInputDocument_var = std::shared_ptr<ZonIExchInputDocument>;
