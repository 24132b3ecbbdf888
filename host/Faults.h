#pragma once

#include <array>
#include <cstddef>
#include <mutex>
#include <optional>

namespace host
{

// Broker calls a provider makes that a test can make fail.
enum class BrokerCall
{
    NewObjectPath,
    NewInstance,
    NewArray,
    NewString,
    NewDateTimeFromChars,
    GetClassName,
    GetKeyCount,
    GetNameSpace,
    GetCharPtr,
    SetProperty,
    ToString,
    PrepareAttachThread,
    AttachThread,
    NewThread,
    DeliverIndication,
    DetachThread, // a failure still detaches, but reports CMPI_RC_ERR_FAILED
};
inline constexpr std::size_t brokerCallCount = 16;

enum class FaultMode
{
    ReturnNull, // null result, rc CMPI_RC_ERR_FAILED in the status if any
    NullHandle, // an object whose hdl is nullptr (object-returning calls)
    FailStatus, // the real result, but rc CMPI_RC_ERR_FAILED
};

// Makes broker calls fail on demand and counts the calls made. Thread-safe.
class FaultPlan
{
  public:
    // Fails calls skip+1 .. skip+count made after this (count 0: all of
    // them from skip+1 on). Replaces an earlier plan for the same call.
    void fail(BrokerCall call, FaultMode mode = FaultMode::ReturnNull,
              unsigned skip = 0, unsigned count = 1);
    // Drops every plan and resets the call counts.
    void clear();
    // How many times the provider made this call so far.
    unsigned calls(BrokerCall call) const;

    // Counts one call; returns the fault to inject, if any.
    std::optional<FaultMode> record(BrokerCall call);

  private:
    struct Rule
    {
        FaultMode mode;
        unsigned skip;
        unsigned count;
        unsigned seen = 0;
    };
    mutable std::mutex mutex_;
    std::array<unsigned, brokerCallCount> calls_{};
    std::array<std::optional<Rule>, brokerCallCount> rules_{};
};

} // namespace host
