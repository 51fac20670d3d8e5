#include "ZonExchMemoryDocument.h"

void ZonExchMemoryDocument::SetRepresentation(const std::string& representationType,
                                              ZonBaseUnknown_var representation)
{
    _representations[representationType] = std::move(representation);
}

bool ZonExchMemoryDocument::HasRepresentation(const std::string& representationType)
{
    return _representations.count(representationType) != 0;
}

ZonBaseUnknown_var ZonExchMemoryDocument::GetRepresentation(const std::string& representationType)
{
    const auto found = _representations.find(representationType);
    return found == _representations.end() ? nullptr : found->second;
}

std::string ZonExchMemoryDocument::GetAttribute(const std::string& name)
{
    const auto found = _attributes.find(name);
    return found == _attributes.end() ? std::string() : found->second;
}
