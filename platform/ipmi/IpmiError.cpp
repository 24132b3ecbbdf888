#include "IpmiError.h"

#include <cstdio>

namespace QX::Ipmi
{

namespace
{

std::string describe(const std::string& call, ErrorCategory category,
                     const std::string& detail,
                     std::optional<std::uint8_t> completionCode)
{
    std::string text = call + ": " + categoryName(category);
    if (completionCode)
    {
        char code[8];
        std::snprintf(code, sizeof code, " %02Xh", *completionCode);
        text += code;
    }
    if (!detail.empty())
    {
        text += ": " + detail;
    }
    return text;
}

} // namespace

const char* categoryName(ErrorCategory category)
{
    switch (category)
    {
        case ErrorCategory::Timeout:
            return "timeout";
        case ErrorCategory::Session:
            return "session";
        case ErrorCategory::Busy:
            return "busy";
        case ErrorCategory::CompletionCode:
            return "completion code";
        case ErrorCategory::Other:
            break;
    }
    return "other";
}

IpmiError::IpmiError(std::string call, ErrorCategory category,
                     std::string detail,
                     std::optional<std::uint8_t> completionCode) :
    std::runtime_error(describe(call, category, detail, completionCode)),
    call_(std::move(call)), category_(category), detail_(std::move(detail)),
    completionCode_(completionCode)
{
}

} // namespace QX::Ipmi
