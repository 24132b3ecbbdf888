#pragma once

// A simulated SEL behind the BMC command seam, counting every exchange,
// with the faults real BMCs show: cancelled reservations, missing records,
// ids that start again, refused commands.

#include "SystemEventRecord.h"
#include "ipmi/BmcCommands.h"
#include "ipmi/IpmiError.h"
#include "ipmi/RecordDescriber.h"
#include "ipmi/SelCache.h"
#include "ipmi/SelRecord.h"
#include "support/LocalBmc.h"

#include <algorithm>
#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace QX::test
{

/** A system event record with id @p id, time @p time and sensor type
 *  @p sensorType (temperature by default). */
inline Ipmi::SelRecordBytes selRecord(std::uint16_t id,
                                      std::uint32_t time = 0x65e5831a,
                                      std::uint8_t sensorType = 0x01)
{
    return bmcsim::systemEventRecord(
        id, time, {sensorType, 0x30, 0x01, 0x57, 0x52, 0x50});
}

/** The "Log Area Reset/Cleared" record BMCs write after a clear. */
inline Ipmi::SelRecordBytes logClearedRecord(std::uint16_t id)
{
    return Ipmi::SelRecord::systemEvent(id, 0x65e5831a, 0x10, 0x01, 0x6f,
                                        {0x02, 0xff, 0xff})
        .bytes();
}

/** Appends @p bytes to @p records as the SEL copy holds them: the id read
 *  from the record, the run counted on where the id does not go up. */
inline void appendCached(std::vector<Ipmi::CachedRecord>& records,
                         const Ipmi::SelRecordBytes& bytes)
{
    Ipmi::CachedRecord record;
    record.id = Ipmi::SelRecord::parse(bytes).recordId;
    if (!records.empty())
    {
        const Ipmi::CachedRecord& last = records.back();
        record.run = record.id > last.id ? last.run : last.run + 1;
    }
    record.bytes = bytes;
    records.push_back(std::move(record));
}

class FakeBmc : public LocalBmc
{
  public:
    std::vector<Ipmi::SelRecordBytes> sel;
    std::uint16_t freeSpace = 512 * 16;
    std::uint32_t lastAddition = 0x65000000;
    std::uint32_t lastErase = 0;
    bool overflow = false;
    std::optional<std::uint8_t> restartCause;

    // Faults: cancel the reservation at the n-th Get SEL Entry from now
    // (0: the next), or at every one.
    std::optional<unsigned> cancelAtEntry;
    bool cancelAlways = false;
    // Makes every exchange throw this error.
    std::optional<Ipmi::IpmiError> failure;

    unsigned selInfoCalls = 0;
    unsigned reserveCalls = 0;
    unsigned entryCalls = 0;
    unsigned eraseCalls = 0;
    unsigned restartCauseCalls = 0;

    void add(const Ipmi::SelRecordBytes& record)
    {
        sel.push_back(record);
        ++lastAddition;
        freeSpace = static_cast<std::uint16_t>(freeSpace - 16);
    }
    void resetCounters()
    {
        selInfoCalls = reserveCalls = entryCalls = eraseCalls =
            restartCauseCalls = 0;
    }
    unsigned exchanges() const
    {
        return selInfoCalls + reserveCalls + entryCalls + eraseCalls +
               restartCauseCalls;
    }

    Ipmi::SelInfo getSelInfo() override
    {
        fail();
        ++selInfoCalls;
        return Ipmi::SelInfo{.entries = static_cast<std::uint16_t>(sel.size()),
                             .freeSpace = freeSpace,
                             .mostRecentAddition = lastAddition,
                             .mostRecentErase = lastErase,
                             .overflow = overflow,
                             .reserveSupported = true};
    }
    std::uint16_t reserveSel() override
    {
        fail();
        ++reserveCalls;
        return ++reservation_;
    }
    Ipmi::SelEntry getSelEntry(std::uint16_t reservationId,
                               std::uint16_t recordId) override
    {
        fail();
        ++entryCalls;
        const bool cancelNow =
            cancelAlways || (cancelAtEntry && *cancelAtEntry == 0);
        if (cancelAtEntry)
        {
            cancelAtEntry = *cancelAtEntry == 0
                                ? std::nullopt
                                : std::optional<unsigned>(*cancelAtEntry - 1);
        }
        // Reservation 0 reads whole records without one.
        if (cancelNow || (reservationId != 0 && reservationId != reservation_))
        {
            throw Ipmi::IpmiError(
                "ipmi_cmd_get_sel_entry", Ipmi::ErrorCategory::CompletionCode,
                "reservation cancelled", Ipmi::completionReservationCancelled);
        }
        auto found = sel.begin();
        if (recordId == Ipmi::lastRecordId)
        {
            found = sel.empty() ? sel.end() : sel.end() - 1;
        }
        else if (recordId != Ipmi::firstRecordId)
        {
            found = std::find_if(sel.begin(), sel.end(),
                                 [recordId](const Ipmi::SelRecordBytes& r)
                                 { return (r[0] | r[1] << 8) == recordId; });
        }
        if (found == sel.end())
        {
            throw Ipmi::IpmiError(
                "ipmi_cmd_get_sel_entry", Ipmi::ErrorCategory::CompletionCode,
                "record not present", Ipmi::completionRecordNotPresent);
        }
        Ipmi::SelEntry entry;
        entry.data = *found;
        const auto next = found + 1;
        entry.nextRecordId =
            next == sel.end()
                ? Ipmi::lastRecordId
                : static_cast<std::uint16_t>((*next)[0] | (*next)[1] << 8);
        return entry;
    }
    void initiateSelErase(std::uint16_t reservationId) override
    {
        fail();
        ++eraseCalls;
        if (reservationId != reservation_)
        {
            throw Ipmi::IpmiError(
                "ipmi_cmd_clear_sel", Ipmi::ErrorCategory::CompletionCode,
                "reservation cancelled", Ipmi::completionReservationCancelled);
        }
        sel.clear();
        ++lastErase;
        freeSpace = 512 * 16;
        overflow = false;
    }
    bool selEraseCompleted(std::uint16_t /*reservationId*/) override
    {
        fail();
        ++eraseCalls;
        return true;
    }
    std::optional<std::uint8_t> getSystemRestartCause() override
    {
        fail();
        ++restartCauseCalls;
        return restartCause;
    }

  private:
    void fail() const
    {
        if (failure)
        {
            throw *failure;
        }
    }

    std::uint16_t reservation_ = 0;
};

/** Describes a record by its id; counts how often it was asked. */
class CountingDescriber : public Ipmi::RecordDescriber
{
  public:
    bool namesChanged = false;
    unsigned described = 0;

    bool refreshSensorNames() override
    {
        return std::exchange(namesChanged, false);
    }
    std::string describe(const Ipmi::SelRecordBytes& record) override
    {
        ++described;
        return "event " + std::to_string(record[0] | record[1] << 8);
    }
};

} // namespace QX::test
