#pragma once

#include "BmcCommands.h"

#include <chrono>
#include <cstdint>
#include <optional>
#include <vector>

namespace QX::Ipmi
{

/** The records one walk of the next-record chain gave. */
struct SelWalk
{
    std::vector<SelRecordBytes> records;
    /** False when the walk stopped before the chain's end: a loop in the
     *  chain, more records than the SEL can hold, a record that went away
     *  on every attempt. What was read is kept all the same. */
    bool complete = true;
};

/**
 * @brief The exchanges that read and erase the SEL, made safe against
 *        what real BMCs answer.
 *
 * Walks follow the next-record ids from a start id and end at FFFFh. A
 * next id of 0000h, the current id again or an id already visited is
 * asked once more (some BMCs answer it once by mistake); if the BMC keeps
 * it, the walk ends there. A walk never takes more steps than the SEL's
 * entry count plus a margin. Reservations fall back to 0 on BMCs that
 * lack or refuse Reserve SEL (C1h, D4h); a cancelled reservation (C5h)
 * starts the walk again from the first record with a new one, as does a
 * record that went away (CBh). While the BMC erases (81h), requests are
 * repeated until the erase wait ends.
 *
 * Not thread-safe: the caller holds exclusive access to the BMC.
 */
class SelReader
{
  public:
    static constexpr unsigned walkAttempts = 3;
    static constexpr std::chrono::milliseconds defaultEraseWait{30000};

    explicit SelReader(std::chrono::milliseconds eraseWait = defaultEraseWait) :
        eraseWait_(eraseWait)
    {
    }

    /** A reservation for reading, or 0 where the BMC has none to give. */
    std::uint16_t reserve(BmcCommands& bmc, const SelInfo& info);

    /** The newest record (Get SEL Entry FFFFh, reservation 0); nothing
     *  when the SEL is empty or being erased. */
    std::optional<SelRecordBytes> newest(BmcCommands& bmc);

    /** Every record from the first on, in SEL order. */
    SelWalk readAll(BmcCommands& bmc, const SelInfo& info);

    /** Reads the record with id @p known again and, when its bytes are
     *  still @p bytes, the records after it; nothing when that record
     *  changed or went away. */
    std::optional<SelWalk> readAfter(BmcCommands& bmc, const SelInfo& info,
                                     std::uint16_t known,
                                     const SelRecordBytes& bytes);

    /** Clears the SEL and waits, at most the erase wait, until the BMC
     *  reports the erasure done. Throws IpmiError. */
    void erase(BmcCommands& bmc);

    /** Whether the BMC refused Reserve SEL, so reads use reservation 0. */
    bool reservationRefused() const
    {
        return reservationRefused_;
    }

  private:
    using Deadline = std::chrono::steady_clock::time_point;

    SelEntry fetch(BmcCommands& bmc, std::uint16_t reservation,
                   std::uint16_t id, const Deadline& deadline);
    std::uint16_t reserveUntil(BmcCommands& bmc, const SelInfo& info,
                               const Deadline& deadline);
    /** Goes on from @p entry, the record with id @p current, to the end
     *  of the chain; @p asked marks the ids requested so far. */
    void walkFrom(BmcCommands& bmc, std::uint16_t reservation,
                  const SelInfo& info, SelEntry entry, std::uint16_t current,
                  std::vector<bool>& asked, SelWalk& walk,
                  const Deadline& deadline);
    Deadline deadline() const
    {
        return std::chrono::steady_clock::now() + eraseWait_;
    }

    std::chrono::milliseconds eraseWait_;
    bool reservationRefused_ = false;
};

} // namespace QX::Ipmi
