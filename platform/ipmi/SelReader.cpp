#include "SelReader.h"

#include "IpmiError.h"
#include "SelRecordText.h"

#include <algorithm>
#include <string>
#include <thread>

namespace QX::Ipmi
{

namespace
{

// A SEL holds at most 65535 records (16-bit ids, 0 and FFFFh reserved).
constexpr std::size_t mostRecords = 0xFFFF;
// Steps a walk may take beyond the entry count: records added meanwhile.
constexpr std::size_t walkMargin = 64;
// Pause between two requests the BMC answered with "erase in progress".
constexpr auto erasingPause = std::chrono::milliseconds(50);
// Pause between two erasure status requests.
constexpr auto eraseStatusPause = std::chrono::milliseconds(20);

bool hasCode(const IpmiError& error, std::uint8_t code)
{
    return error.completionCode() == code;
}

void pauseOrGiveUp(const IpmiError& error,
                   const std::chrono::steady_clock::time_point& deadline)
{
    if (std::chrono::steady_clock::now() >= deadline)
    {
        throw error;
    }
    std::this_thread::sleep_for(erasingPause);
}

// A next-record id no chain may lead to from here: the first-record id,
// the record itself, or a record this walk asked for already.
bool loops(std::uint16_t next, std::uint16_t current,
           const std::vector<bool>& asked)
{
    return next == firstRecordId || next == current ||
           (next != lastRecordId && asked[next]);
}

} // namespace

std::uint16_t SelReader::reserve(BmcCommands& bmc, const SelInfo& info)
{
    return reserveUntil(bmc, info, deadline());
}

std::uint16_t SelReader::reserveUntil(BmcCommands& bmc, const SelInfo& info,
                                      const Deadline& deadline)
{
    // Reservation 0 is what BMCs without Reserve SEL take for whole-record
    // reads.
    if (!info.reserveSupported || reservationRefused_)
    {
        return 0;
    }
    for (;;)
    {
        try
        {
            return bmc.reserveSel();
        }
        catch (const IpmiError& error)
        {
            if (hasCode(error, completionInvalidCommand) ||
                hasCode(error, completionInsufficientPrivilege))
            {
                reservationRefused_ = true;
                return 0;
            }
            if (!hasCode(error, completionEraseInProgress))
            {
                throw;
            }
            pauseOrGiveUp(error, deadline);
        }
    }
}

SelEntry SelReader::fetch(BmcCommands& bmc, std::uint16_t reservation,
                          std::uint16_t id, const Deadline& deadline)
{
    for (;;)
    {
        try
        {
            return bmc.getSelEntry(reservation, id);
        }
        catch (const IpmiError& error)
        {
            if (!hasCode(error, completionEraseInProgress))
            {
                throw;
            }
            pauseOrGiveUp(error, deadline);
        }
    }
}

std::optional<SelRecordBytes> SelReader::newest(BmcCommands& bmc)
{
    try
    {
        // Reading a whole record needs no reservation.
        return bmc.getSelEntry(0, lastRecordId).data;
    }
    catch (const IpmiError& error)
    {
        if (hasCode(error, completionRecordNotPresent) ||
            hasCode(error, completionEraseInProgress))
        {
            return std::nullopt;
        }
        throw;
    }
}

void SelReader::walkFrom(BmcCommands& bmc, std::uint16_t reservation,
                         const SelInfo& info, SelEntry entry,
                         std::uint16_t current, std::vector<bool>& asked,
                         SelWalk& walk, const Deadline& deadline)
{
    const std::size_t limit =
        std::min<std::size_t>(mostRecords, info.entries + walkMargin);
    for (;;)
    {
        // The first record, asked as 0000h, naming its own id as next
        // looks like a loop too.
        const bool selfAfterFirst =
            current == firstRecordId &&
            entry.nextRecordId == recordIdOf(entry.data);
        if (selfAfterFirst || loops(entry.nextRecordId, current, asked))
        {
            // Some BMCs give a wrong next id once; asking again helps.
            entry = fetch(bmc, reservation, current, deadline);
            if (loops(entry.nextRecordId, current, asked))
            {
                walk.records.push_back(entry.data);
                walk.complete = false;
                return;
            }
        }
        walk.records.push_back(entry.data);
        if (entry.nextRecordId == lastRecordId)
        {
            return;
        }
        if (walk.records.size() >= limit)
        {
            walk.complete = false;
            return;
        }
        current = entry.nextRecordId;
        asked[current] = true;
        entry = fetch(bmc, reservation, current, deadline);
    }
}

SelWalk SelReader::readAll(BmcCommands& bmc, const SelInfo& info)
{
    const Deadline until = deadline();
    SelWalk walk;
    if (info.entries == 0)
    {
        return walk;
    }
    for (unsigned attempt = 1;; ++attempt)
    {
        walk = SelWalk{};
        try
        {
            const std::uint16_t reservation = reserveUntil(bmc, info, until);
            std::vector<bool> asked(mostRecords + 1, false);
            asked[firstRecordId] = true;
            const SelEntry first =
                fetch(bmc, reservation, firstRecordId, until);
            walkFrom(bmc, reservation, info, first, firstRecordId, asked, walk,
                     until);
            return walk;
        }
        catch (const IpmiError& error)
        {
            const bool missing = hasCode(error, completionRecordNotPresent);
            if (missing && walk.records.empty())
            {
                walk.complete = true;
                return walk; // emptied since Get SEL Info
            }
            if (!missing && !hasCode(error, completionReservationCancelled))
            {
                throw;
            }
            if (attempt >= walkAttempts)
            {
                if (!missing)
                {
                    throw;
                }
                walk.complete = false;
                return walk;
            }
        }
    }
}

std::optional<SelWalk> SelReader::readAfter(BmcCommands& bmc,
                                            const SelInfo& info,
                                            std::uint16_t known,
                                            const SelRecordBytes& bytes)
{
    const Deadline until = deadline();
    try
    {
        const std::uint16_t reservation = reserveUntil(bmc, info, until);
        const SelEntry again = fetch(bmc, reservation, known, until);
        if (again.data != bytes)
        {
            return std::nullopt;
        }
        std::vector<bool> asked(mostRecords + 1, false);
        asked[known] = true;
        SelWalk walk;
        if (again.nextRecordId == lastRecordId)
        {
            return walk;
        }
        const std::uint16_t next = again.nextRecordId;
        if (loops(next, known, asked))
        {
            return std::nullopt; // a whole read sorts it out
        }
        asked[next] = true;
        walkFrom(bmc, reservation, info, fetch(bmc, reservation, next, until),
                 next, asked, walk, until);
        return walk;
    }
    catch (const IpmiError& error)
    {
        // Let a whole read sort out cancelled reservations and records
        // that went away.
        if (hasCode(error, completionRecordNotPresent) ||
            hasCode(error, completionReservationCancelled))
        {
            return std::nullopt;
        }
        throw;
    }
}

void SelReader::erase(BmcCommands& bmc)
{
    const Deadline until = deadline();
    const SelInfo info = bmc.getSelInfo();
    std::uint16_t reservation = reserveUntil(bmc, info, until);
    for (unsigned attempt = 1;; ++attempt)
    {
        try
        {
            bmc.initiateSelErase(reservation);
            break;
        }
        catch (const IpmiError& error)
        {
            if (hasCode(error, completionEraseInProgress))
            {
                break; // an erase runs already: wait for it
            }
            // Another client reserved the SEL in between: reserve again.
            if (!hasCode(error, completionReservationCancelled) ||
                attempt >= walkAttempts)
            {
                throw;
            }
            reservation = reserveUntil(bmc, info, until);
        }
    }
    for (;;)
    {
        try
        {
            if (bmc.selEraseCompleted(reservation))
            {
                return;
            }
        }
        catch (const IpmiError& error)
        {
            // Some BMCs cancel the reservation with the clear itself.
            if (hasCode(error, completionReservationCancelled))
            {
                reservation = reserveUntil(bmc, info, until);
            }
            else if (!hasCode(error, completionEraseInProgress))
            {
                throw;
            }
        }
        if (std::chrono::steady_clock::now() >= until)
        {
            throw IpmiError("Clear SEL", ErrorCategory::Timeout,
                            "the BMC did not finish erasing within " +
                                std::to_string(eraseWait_.count()) + " ms");
        }
        std::this_thread::sleep_for(eraseStatusPause);
    }
}

} // namespace QX::Ipmi
