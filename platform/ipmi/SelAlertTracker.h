#pragma once

#include "AlertState.h"
#include "SelCache.h"

#include <optional>
#include <set>
#include <string>
#include <vector>

namespace QX::Ipmi
{

/** What one look at the BMC found, as the tracker compares it. */
struct SelObservation
{
    const std::vector<CachedRecord>* records = nullptr;
    /** Changes whenever the records do (SelCache::version). */
    std::uint64_t version = 0;
    SelInfo info;
    unsigned logStatus = 0;
    std::optional<std::uint8_t> restartCause;
};

/** Something that happened to the SEL, as the tracker announces it. */
struct SelEvent
{
    enum class Kind
    {
        RecordAdded,     // a new record: its run and id
        LogChanged,      // cleared, or a fill transition
        WatchdogRestart, // a watchdog restart, by record or restart cause
    };
    Kind kind = Kind::LogChanged;
    std::uint32_t run = 0;
    std::uint16_t recordId = 0;
    bool operator==(const SelEvent&) const = default;
};

/** The events one comparison raises, and whether the state to keep
 *  changed. */
struct TrackerResult
{
    std::vector<SelEvent> events;
    bool stateChanged = false;
    /** Something worth a log line, or empty. */
    std::string note;
};

/**
 * @brief Turns successive views of the SEL into events: each new record
 *        once, a clear once, each fill transition once, each watchdog
 *        restart once.
 *
 * start() takes the state kept from an earlier run (or nothing: then
 * everything present counts as already announced) and announces what
 * happened meanwhile; observe() compares each later view with the one
 * before. Records are compared by their 16 bytes, which hold id and
 * timestamp, because record ids start again after some BMC restarts and
 * ring buffers reuse them; how often equal bytes occur counts too.
 *
 * A clear is announced when the last-erase time moves to a real time, or,
 * for BMCs whose Get SEL Info times never move, when every record seen
 * before is gone and the SEL is empty or its first new record is the
 * "log cleared" one. Records that were overwritten (a ring buffer) or ids
 * that started again give no clear.
 * Not thread-safe.
 */
class SelAlertTracker
{
  public:
    /** Restart cause "watchdog expired" (Get System Restart Cause). */
    static constexpr std::uint8_t restartCauseWatchdog = 0x04;

    /** Whether @p record reports a watchdog expiry that reset, powered
     *  down or power-cycled the server (Watchdog 2 sensor, offsets 1-3,
     *  asserted). */
    static bool isWatchdogRestart(const SelRecordBytes& record);

    TrackerResult start(const std::optional<AnnouncedState>& kept,
                        const SelObservation& now);
    TrackerResult observe(const SelObservation& now);

    bool started() const
    {
        return started_;
    }
    const AnnouncedState& state() const
    {
        return state_;
    }

  private:
    void announceNew(const SelObservation& now, std::vector<SelEvent>& out);
    void remember(const SelObservation& now);
    bool clearedSince(const SelObservation& now) const;
    static std::string restartKeyOf(const std::vector<CachedRecord>& records);

    bool started_ = false;
    AnnouncedState state_;
    SelInfo lastInfo_;
    std::uint64_t lastVersion_ = 0;
    std::multiset<SelRecordBytes> known_;
};

} // namespace QX::Ipmi
