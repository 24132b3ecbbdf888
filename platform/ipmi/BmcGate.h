#pragma once

#include <chrono>
#include <condition_variable>
#include <functional>
#include <mutex>

namespace QX::Ipmi
{

/**
 * @brief Exclusive access to the BMC for one request at a time.
 *
 * A request that finds the BMC taken waits while the holder makes
 * progress, that is while the holder's exchanges keep ending; once
 * @p patience has passed since the later of its own arrival and the
 * holder's last exchange, it gives up with IpmiError (Busy). So a long
 * but healthy SEL read delays other requests without failing them, and a
 * stuck one fails them within the timeout.
 */
class BmcGate
{
  public:
    using Clock = std::chrono::steady_clock;

    /** @param lastActivity when the holder's last exchange ended */
    BmcGate(std::chrono::milliseconds patience,
            std::function<Clock::time_point()> lastActivity);

    /** Holds the gate for the lifetime of the object. */
    class Access
    {
      public:
        explicit Access(BmcGate& gate);
        ~Access();
        Access(const Access&) = delete;
        Access& operator=(const Access&) = delete;

      private:
        BmcGate& gate_;
    };

  private:
    std::chrono::milliseconds patience_;
    std::function<Clock::time_point()> lastActivity_;
    std::mutex mutex_;
    std::condition_variable released_;
    bool taken_ = false;
};

} // namespace QX::Ipmi
