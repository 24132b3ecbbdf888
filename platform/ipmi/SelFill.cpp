#include "SelFill.h"

#include "NodeLexicon.h"
#include "SelRecordText.h"

#include <algorithm>
#include <cstdint>

namespace QX::Ipmi
{

namespace
{

using namespace NodeLexicon;

// Get SEL Info's free space is 16 bits: FFFFh means "65535 bytes or
// more" on BMCs that tell the truth and nothing at all on others.
constexpr std::uint16_t freeSpaceUnknown = 0xFFFF;
constexpr unsigned recordBytes = 16;
constexpr std::uint32_t noEraseYet = 0xFFFFFFFF;
constexpr unsigned nodeStatusOk = 1;

// Raw OverwritePolicy values: 1 wraps when full, 2 never overwrites.
constexpr unsigned overwriteWraps = 1;
constexpr unsigned overwriteNever = 2;

unsigned severity(unsigned status)
{
    if (status == EventLogStatusFull)
    {
        return 2;
    }
    return status == EventLogStatusAlmostFull ? 1 : 0;
}

// The fill the SEL's own "Event Logging Disabled" records report since
// it was last cleared.
unsigned statusFromRecords(const std::vector<CachedRecord>& records)
{
    unsigned status = 0;
    for (const CachedRecord& record : records)
    {
        if (isLogClearedRecord(record.bytes))
        {
            status = 0;
            continue;
        }
        const FillEvent fill = fillEventOf(record.bytes);
        if (fill == FillEvent::Full)
        {
            status = EventLogStatusFull;
        }
        else if (fill == FillEvent::AlmostFull && status == 0)
        {
            status = EventLogStatusAlmostFull;
        }
    }
    return status;
}

unsigned statusFromFill(std::uint64_t count, std::uint64_t capacity,
                        bool noRoomLeft, unsigned warningPercent)
{
    if (noRoomLeft || count >= capacity)
    {
        return EventLogStatusFull;
    }
    if (count * 100 >= std::uint64_t{warningPercent} * capacity)
    {
        return EventLogStatusAlmostFull;
    }
    return 0;
}

} // namespace

LogState logStateOf(const SelInfo& info,
                    const std::vector<CachedRecord>& records, bool clearSeen,
                    const Settings& settings)
{
    const auto count = static_cast<unsigned>(records.size());
    const bool freeKnown = info.freeSpace != freeSpaceUnknown;
    const bool believable =
        freeKnown && count + info.freeSpace / recordBytes >= smallestSel;

    LogState state;
    unsigned infoStatus = 0;
    if (settings.selCapacity != 0)
    {
        state.maxRecords = std::max(settings.selCapacity, count);
        infoStatus = statusFromFill(count, settings.selCapacity, info.overflow,
                                    settings.warningFillPercent);
    }
    else if (believable)
    {
        state.maxRecords = count + info.freeSpace / recordBytes;
        infoStatus =
            statusFromFill(count, state.maxRecords,
                           info.overflow || info.freeSpace < recordBytes,
                           settings.warningFillPercent);
    }
    else
    {
        // Size unknown: only the overflow flag and the records can say
        // the SEL is full.
        state.maxRecords = freeKnown ? std::max(count, smallestSel)
                                     : count + freeSpaceUnknown / recordBytes;
        infoStatus = info.overflow ? EventLogStatusFull : 0;
    }
    const unsigned recordStatus = statusFromRecords(records);
    state.overwritePolicy = settings.selWraps ? overwriteWraps : overwriteNever;
    // BMCs log "Log Area Reset/Cleared" right after a clear: a log that
    // holds only that record has been emptied.
    state.isEmpty =
        records.empty() ||
        (records.size() == 1 && isLogClearedRecord(records.front().bytes));
    const bool erased =
        info.mostRecentErase != 0 && info.mostRecentErase != noEraseYet;

    const unsigned fill = std::max(infoStatus, recordStatus,
                                   [](unsigned a, unsigned b)
                                   { return severity(a) < severity(b); });
    if (fill != 0)
    {
        state.status = fill;
    }
    else if (state.isEmpty && (erased || clearSeen))
    {
        state.status = EventLogStatusCleared;
    }
    else
    {
        state.status = nodeStatusOk;
    }
    return state;
}

} // namespace QX::Ipmi
