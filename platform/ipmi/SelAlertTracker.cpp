#include "SelAlertTracker.h"

#include "NodeLexicon.h"
#include "SelRecord.h"
#include "SelRecordText.h"

#include <algorithm>

namespace QX::Ipmi
{

namespace
{

using namespace NodeLexicon;

constexpr std::uint8_t sensorTypeWatchdog2 = 0x23;
constexpr std::uint8_t sensorSpecificReading = 0x6f;
// Watchdog 2 offsets: 1 hard reset, 2 power down, 3 power cycle.
constexpr std::uint8_t firstRestartOffset = 1;
constexpr std::uint8_t lastRestartOffset = 3;
// Restart key when the BMC reports a watchdog restart without a record.
constexpr const char* restartWithoutRecord = "cause-only";
// A last-erase time of FFFFFFFFh means "never erased" (or "not kept").
constexpr std::uint32_t noEraseTime = 0xFFFFFFFF;

SelEvent logChanged()
{
    return SelEvent{SelEvent::Kind::LogChanged, 0, 0};
}

SelEvent watchdogRestart()
{
    return SelEvent{SelEvent::Kind::WatchdogRestart, 0, 0};
}

bool isFillStatus(unsigned status)
{
    return status == EventLogStatusAlmostFull || status == EventLogStatusFull;
}

} // namespace

bool SelAlertTracker::isWatchdogRestart(const SelRecordBytes& record)
{
    const SelRecord fields = SelRecord::parse(record);
    return fields.isSystemEvent() && fields.sensorType == sensorTypeWatchdog2 &&
           fields.eventType() == sensorSpecificReading && fields.asserted() &&
           fields.offset() >= firstRestartOffset &&
           fields.offset() <= lastRestartOffset;
}

std::string
SelAlertTracker::restartKeyOf(const std::vector<CachedRecord>& records)
{
    const auto newest = std::find_if(records.rbegin(), records.rend(),
                                     [](const CachedRecord& record) {
                                         return isWatchdogRestart(record.bytes);
                                     });
    return newest == records.rend() ? restartWithoutRecord
                                    : recordHex(newest->bytes);
}

TrackerResult SelAlertTracker::start(const std::optional<AnnouncedState>& kept,
                                     const SelObservation& now)
{
    const std::vector<CachedRecord>& records = *now.records;
    TrackerResult result;
    started_ = true;
    lastInfo_ = now.info;
    known_.clear();

    if (!kept)
    {
        // Nothing known of earlier runs: what is there now is old.
        for (const CachedRecord& record : records)
        {
            known_.insert(record.bytes);
        }
        state_ = AnnouncedState{};
        state_.logStatus = now.logStatus;
        state_.restartKey = now.restartCause == restartCauseWatchdog
                                ? restartKeyOf(records)
                                : std::string();
        remember(now);
        result.stateChanged = true;
        return result;
    }

    state_ = *kept;
    if (kept->lastErase != now.info.mostRecentErase)
    {
        // Cleared meanwhile: one clear, and every record is newer.
        result.events.push_back(logChanged());
    }
    else if (kept->lastRecord)
    {
        const auto found =
            std::find_if(records.begin(), records.end(),
                         [&](const CachedRecord& record)
                         { return record.bytes == *kept->lastRecord; });
        if (found == records.end())
        {
            result.note = "the last record announced before is no longer in "
                          "the SEL: records added meanwhile are not announced";
        }
        const auto knownEnd =
            found == records.end() ? records.end() : found + 1;
        for (auto it = records.begin(); it != knownEnd; ++it)
        {
            known_.insert(it->bytes);
        }
    }
    else if (kept->lastAddition == now.info.mostRecentAddition)
    {
        // The SEL was empty and nothing was added since.
        for (const CachedRecord& record : records)
        {
            known_.insert(record.bytes);
        }
    }
    announceNew(now, result.events);

    if (now.logStatus != kept->logStatus && isFillStatus(now.logStatus))
    {
        result.events.push_back(logChanged());
    }
    if (now.restartCause == restartCauseWatchdog)
    {
        // Without a watchdog record to tell restarts apart, only the
        // first one is announced.
        const std::string key = restartKeyOf(records);
        const bool recorded = key != restartWithoutRecord;
        if (key != state_.restartKey && (recorded || state_.restartKey.empty()))
        {
            result.events.push_back(watchdogRestart());
            state_.restartKey = key;
        }
    }
    state_.logStatus = now.logStatus;
    remember(now);
    result.stateChanged = state_ != *kept;
    return result;
}

bool SelAlertTracker::clearedSince(const SelObservation& now) const
{
    if (now.info.mostRecentErase != lastInfo_.mostRecentErase &&
        now.info.mostRecentErase != noEraseTime)
    {
        return true;
    }
    if (known_.empty())
    {
        return false;
    }
    const std::vector<CachedRecord>& records = *now.records;
    const bool allGone =
        std::none_of(records.begin(), records.end(),
                     [this](const CachedRecord& record)
                     { return known_.count(record.bytes) != 0; });
    return allGone &&
           (records.empty() || isLogClearedRecord(records.front().bytes));
}

TrackerResult SelAlertTracker::observe(const SelObservation& now)
{
    TrackerResult result;
    if (now.version == lastVersion_ &&
        now.info.mostRecentErase == lastInfo_.mostRecentErase &&
        now.logStatus == state_.logStatus)
    {
        lastInfo_ = now.info;
        return result;
    }
    const AnnouncedState before = state_;
    if (clearedSince(now))
    {
        result.events.push_back(logChanged());
        known_.clear();
    }
    announceNew(now, result.events);
    if (now.logStatus != state_.logStatus && isFillStatus(now.logStatus))
    {
        result.events.push_back(logChanged());
    }
    state_.logStatus = now.logStatus;
    lastInfo_ = now.info;
    remember(now);
    result.stateChanged = state_ != before;
    return result;
}

void SelAlertTracker::announceNew(const SelObservation& now,
                                  std::vector<SelEvent>& out)
{
    // Each record seen before accounts for one of equal bytes now.
    std::multiset<SelRecordBytes> unmatched = known_;
    for (const CachedRecord& record : *now.records)
    {
        const auto seen = unmatched.find(record.bytes);
        if (seen != unmatched.end())
        {
            unmatched.erase(seen);
            continue;
        }
        out.push_back(
            SelEvent{SelEvent::Kind::RecordAdded, record.run, record.id});
        if (isWatchdogRestart(record.bytes))
        {
            out.push_back(watchdogRestart());
            state_.restartKey = recordHex(record.bytes);
        }
    }
}

void SelAlertTracker::remember(const SelObservation& now)
{
    // Records that left the SEL (deleted, overwritten) are forgotten.
    known_.clear();
    for (const CachedRecord& record : *now.records)
    {
        known_.insert(record.bytes);
    }
    if (!now.records->empty())
    {
        state_.lastRecord = now.records->back().bytes;
    }
    else
    {
        state_.lastRecord.reset();
    }
    state_.lastAddition = now.info.mostRecentAddition;
    state_.lastErase = now.info.mostRecentErase;
    lastInfo_ = now.info;
    lastVersion_ = now.version;
}

} // namespace QX::Ipmi
