#include "SelCache.h"

#include "IpmiError.h"
#include "SelRecordText.h"

#include <string>

namespace QX::Ipmi
{

namespace
{

// A SEL holds at most 65535 records (16-bit ids, 0 and FFFFh reserved);
// a walk that goes on longer loops in a faulty next-record chain.
constexpr std::size_t longestWalk = 0xFFFF;

bool reservationCancelled(const IpmiError& error)
{
    return error.completionCode() == completionReservationCancelled;
}

bool recordMissing(const IpmiError& error)
{
    return error.completionCode() == completionRecordNotPresent;
}

std::uint16_t reserve(BmcCommands& bmc, const SelInfo& info)
{
    // Reservation 0 is what BMCs without Reserve SEL take for whole-record
    // reads.
    return info.reserveSupported ? bmc.reserveSel() : 0;
}

[[noreturn]] void walkTooLong()
{
    throw IpmiError("Get SEL Entry", ErrorCategory::Other,
                    "the SEL's next-record ids do not end");
}

} // namespace

SelChange SelCache::refresh(BmcCommands& bmc, RecordDescriber& describer)
{
    const SelInfo info = bmc.getSelInfo();
    const bool newSession = bmc.sessionGeneration() != sessionGeneration_;
    const bool namesChanged = describer.refreshSensorNames();
    sessionGeneration_ = bmc.sessionGeneration();

    SelChange change = SelChange::Replaced;
    // The first and the last branch both read everything, for different
    // reasons.
    if (!trusted_)
    { // NOLINT(bugprone-branch-clone)
        readAll(bmc, info, describer);
    }
    else if (info.sameRecordsAs(info_))
    {
        if (newSession && !lastRecordUnchanged(bmc))
        {
            readAll(bmc, info, describer);
        }
        else
        {
            info_ = info;
            change = SelChange::None;
        }
    }
    else if (info.mostRecentErase == info_.mostRecentErase &&
             info.entries > info_.entries && !records_.empty() &&
             readAdded(bmc, info, describer))
    {
        change = SelChange::Appended;
    }
    else
    {
        readAll(bmc, info, describer);
    }

    if (namesChanged && change != SelChange::Replaced)
    {
        for (CachedRecord& record : records_)
        {
            record.description = describer.describe(record.bytes);
        }
        change = SelChange::Replaced;
    }
    return change;
}

bool SelCache::lastRecordUnchanged(BmcCommands& bmc)
{
    if (records_.empty())
    {
        return true;
    }
    try
    {
        const CachedRecord& last = records_.back();
        return bmc.getSelEntry(reserve(bmc, info_), last.id).data == last.bytes;
    }
    catch (const IpmiError& error)
    {
        if (recordMissing(error) || reservationCancelled(error))
        {
            return false;
        }
        throw;
    }
}

bool SelCache::readAdded(BmcCommands& bmc, const SelInfo& info,
                         RecordDescriber& describer)
{
    std::vector<SelRecordBytes> added;
    try
    {
        const std::uint16_t reservation = reserve(bmc, info);
        const CachedRecord& last = records_.back();
        const SelEntry again = bmc.getSelEntry(reservation, last.id);
        if (again.data != last.bytes)
        {
            return false;
        }
        for (std::uint16_t next = again.nextRecordId; next != lastRecordId;)
        {
            if (records_.size() + added.size() >= longestWalk)
            {
                walkTooLong();
            }
            const SelEntry entry = bmc.getSelEntry(reservation, next);
            added.push_back(entry.data);
            next = entry.nextRecordId;
        }
    }
    catch (const IpmiError& error)
    {
        // Let a whole read sort out cancelled reservations and records
        // that went away.
        if (recordMissing(error) || reservationCancelled(error))
        {
            return false;
        }
        throw;
    }

    SelInfo after = info;
    if (records_.size() + added.size() != info.entries)
    {
        // Records may have arrived during the walk: then the SEL info
        // says so now.
        after = bmc.getSelInfo();
        if (after.mostRecentErase != info_.mostRecentErase ||
            records_.size() + added.size() != after.entries)
        {
            return false;
        }
    }
    firstNew_ = records_.size();
    for (const SelRecordBytes& bytes : added)
    {
        append(bytes, describer);
    }
    info_ = after;
    return true;
}

void SelCache::readAll(BmcCommands& bmc, SelInfo info,
                       RecordDescriber& describer)
{
    trusted_ = false;
    std::vector<SelRecordBytes> walked;
    for (unsigned attempt = 1;; ++attempt)
    {
        walked.clear();
        try
        {
            if (info.entries > 0)
            {
                const std::uint16_t reservation = reserve(bmc, info);
                for (std::uint16_t next = firstRecordId; next != lastRecordId;)
                {
                    if (walked.size() >= longestWalk)
                    {
                        walkTooLong();
                    }
                    const SelEntry entry = bmc.getSelEntry(reservation, next);
                    walked.push_back(entry.data);
                    next = entry.nextRecordId;
                }
            }
        }
        catch (const IpmiError& error)
        {
            const bool emptied = recordMissing(error) && walked.empty();
            if (!emptied)
            {
                if (!reservationCancelled(error) || attempt >= walkAttempts)
                {
                    throw;
                }
                info = bmc.getSelInfo();
                continue;
            }
        }
        const SelInfo after = bmc.getSelInfo();
        const bool consistent =
            after.sameRecordsAs(info) || after.entries == walked.size();
        if (consistent || attempt >= walkAttempts)
        {
            // When the SEL kept changing, keep what was read but read it
            // all again next time.
            info_ = after;
            trusted_ = consistent;
            break;
        }
        info = after;
    }

    records_.clear();
    records_.reserve(walked.size());
    firstNew_ = 0;
    for (const SelRecordBytes& bytes : walked)
    {
        append(bytes, describer);
    }
}

void SelCache::append(const SelRecordBytes& bytes, RecordDescriber& describer)
{
    CachedRecord record;
    record.id = recordIdOf(bytes);
    record.bytes = bytes;
    if (!records_.empty())
    {
        const CachedRecord& previous = records_.back();
        record.run = previous.run + (record.id <= previous.id ? 1 : 0);
    }
    record.description = describer.describe(bytes);
    records_.push_back(std::move(record));
}

} // namespace QX::Ipmi
