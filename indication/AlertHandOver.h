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
 * There is no queue: the slot holds one record. A handler waits (bounded)
 * for the slot to be free, fills it and, once its thread has started,
 * waits (bounded) until the thread has copied the record out, so alerts
 * raised one after another are each handed over once, with their own data.
 * When a wait runs out the record is simply overwritten, and two threads
 * may then copy the same, later, alert.
 *
 * Every record gets a ticket, in the order the records were put in; a
 * delivery thread waits (bounded) for the threads of earlier tickets to
 * finish before it delivers, so indications leave in the order the alerts
 * came in. No lock is held while the caller does anything else.
 */
class AlertHandOver
{
  public:
    using Ticket = std::uint64_t;

    /** How long a handler waits for the slot, and for its thread. */
    static constexpr std::chrono::milliseconds handOverWait{1000};
    /** How long a delivery thread waits for the threads before it. */
    static constexpr std::chrono::milliseconds turnWait{2000};

    /** Handler side: waits for a free slot, then fills it. */
    Ticket put(const DateTime& time, const std::string& nodePath);
    /** Handler side: whether the thread took the record within the wait. */
    bool awaitTaken(Ticket ticket);
    /** Handler side: no thread will take the record; free the slot. */
    void withdraw(Ticket ticket);

    /** Thread side: copies the record out and frees the slot. */
    std::pair<AlertRecord, Ticket> take();
    /** Thread side: waits until every earlier ticket has finished. */
    void awaitTurn(Ticket ticket);
    /** Thread side: this ticket is done, delivered or not. */
    void finish(Ticket ticket);

    /** The record as it stands, full or not. */
    AlertRecord current() const;
    bool isFull() const;

  private:
    void finishLocked(Ticket ticket);
    /** Counts every ticket up to @p ticket as finished. */
    void skipTo(Ticket ticket);
    /** Moves finished_ over the tickets finished ahead of it. */
    void collapse();

    mutable std::mutex mutex_;
    std::condition_variable changed_;
    AlertRecord record_;
    bool full_ = false;
    Ticket written_ = 0;  // ticket of the record in the slot
    Ticket taken_ = 0;    // highest ticket copied out
    Ticket finished_ = 0; // every ticket up to this one is done
    // Tickets finished out of order, waiting for the ones before them.
    std::uint64_t finishedAhead_ = 0; // bit i: ticket finished_ + 1 + i
};

} // namespace QX::SELComposite
