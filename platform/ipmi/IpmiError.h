#pragma once

#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>

namespace QX::Ipmi
{

/** How an IPMI exchange failed. Timeouts, session failures and a busy BMC
 *  may pass; the others are answers the BMC will give again. */
enum class ErrorCategory
{
    Timeout,        // no answer in time (network, driver or BMC)
    Session,        // the session could not be opened or was lost
    Busy,           // the BMC or the driver is busy, or another request is
    CompletionCode, // the BMC answered with a completion code other than 0
    Other,          // configuration, local system or library failures
};

/** "timeout", "session", "busy", "completion code" or "other". */
const char* categoryName(ErrorCategory category);

/**
 * @brief A failed IPMI exchange: the FreeIPMI call that failed, the error
 *        category, the completion code when the BMC answered with one, and
 *        FreeIPMI's message.
 *
 * what() reads "<call>: <category>: <detail>", with the completion code
 * in hexadecimal before the detail when there is one. No text of this
 * error ever holds a password.
 */
class IpmiError : public std::runtime_error
{
  public:
    IpmiError(std::string call, ErrorCategory category, std::string detail,
              std::optional<std::uint8_t> completionCode = std::nullopt);

    const std::string& call() const
    {
        return call_;
    }
    ErrorCategory category() const
    {
        return category_;
    }
    const std::string& detail() const
    {
        return detail_;
    }
    std::optional<std::uint8_t> completionCode() const
    {
        return completionCode_;
    }
    /** True for timeouts and session failures: the session is no longer
     *  usable and must be opened again. */
    bool sessionLost() const
    {
        return category_ == ErrorCategory::Timeout ||
               category_ == ErrorCategory::Session;
    }

  private:
    std::string call_;
    ErrorCategory category_;
    std::string detail_;
    std::optional<std::uint8_t> completionCode_;
};

/** Completion codes the SEL code acts on, and the simulated BMCs of the
 *  tests answer with. */
enum CompletionCode : std::uint8_t
{
    completionOk = 0x00,
    completionEraseInProgress = 0x81,
    completionInvalidCommand = 0xC1,
    completionTimedOut = 0xC3,
    completionReservationCancelled = 0xC5,
    completionRequestLengthInvalid = 0xC7,
    completionRecordNotPresent = 0xCB,
    completionInvalidDataField = 0xCC,
    completionInsufficientPrivilege = 0xD4,
};

} // namespace QX::Ipmi
