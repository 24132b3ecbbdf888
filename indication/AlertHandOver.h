#pragma once

#include "DateTime.h"

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <mutex>
#include <string>
#include <utility>

namespace QX::SELComposite
{

/** One alert as an alert handler hands it to its delivery thread. */
struct AlertRecord
{
    DateTime time;
    std::string nodePath;
};

/**
 * @brief The one shared record through which an alert handler hands its
 *        alert to the delivery thread it starts.
 *
 * There is no queue: the record holds one alert. A handler holds the
 * record from put() to release(): it fills it, starts its thread and waits
 * (bounded) until that thread reports its alert delivered. The source calls
 * the handlers one after another on its one dispatcher thread, so
 * indications leave in the order the alerts came in, each with its own
 * data, and a delivery thread never waits for another one.
 *
 * Every wait is bounded. When a handler's wait runs out it lets the record
 * go, and the next alert overwrites it: a thread that had not copied the
 * record by then copies the later alert, which is then delivered twice.
 */
class AlertHandOver
{
  public:
    /** Numbers the alerts in the order they were put in, from 1. */
    using Ticket = std::uint64_t;

    /** How long a handler waits for the record to be free. */
    static constexpr std::chrono::milliseconds handOverWait{1000};
    /** How long a handler waits for its thread to deliver. */
    static constexpr std::chrono::milliseconds deliveryWait{2000};

    /** Handler side: waits for the record to be free, then fills it. */
    Ticket put(const DateTime& time, const std::string& nodePath);
    /** Handler side: waits until the alert of @p ticket was delivered;
     *  false when the wait ran out first. */
    bool awaitDelivered(Ticket ticket);
    /** Handler side: lets the record go, unless a later alert holds it. */
    void release(Ticket ticket);

    /** Thread side: a copy of the record, and its ticket. */
    std::pair<AlertRecord, Ticket> take() const;
    /** Thread side: the alert of @p ticket is delivered, or dropped. */
    void delivered(Ticket ticket);

    /** The record as it stands, held or not. */
    AlertRecord current() const;
    /** Whether a handler holds the record. */
    bool isFull() const;

  private:
    mutable std::mutex mutex_;
    std::condition_variable changed_;
    AlertRecord record_;
    bool held_ = false;
    Ticket written_ = 0;   // ticket of the record's alert
    Ticket delivered_ = 0; // highest ticket reported delivered
};

} // namespace QX::SELComposite
