#include "ZonError.h"

#include "ZonMsgCatalog.h"

ZonError::ZonError(std::string key, std::string catalog) : key_(std::move(key)), catalog_(std::move(catalog)) {}

ZonError::~ZonError() = default;

std::string ZonError::GetNLSMessage() const
{
    std::string text = ZonMsgCatalog::Build(catalog_, key_, parameters_);
    return text.empty() ? key_ : text;
}

const char* ZonError::what() const noexcept
{
    try {
        what_ = catalog_ + ": " + key_ + ": " + GetNLSMessage();
    } catch (...) {
        return "ZonError";
    }
    return what_.c_str();
}
