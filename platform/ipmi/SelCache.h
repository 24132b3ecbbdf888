#pragma once

#include "BmcCommands.h"
#include "RecordDescriber.h"

#include <cstdint>
#include <string>
#include <vector>

namespace QX::Ipmi
{

/** One SEL record as the cache keeps it. */
struct CachedRecord
{
    std::uint16_t id = 0;
    /** How often, up to and including this record, a record id in SEL order
     *  was not above the one before it. Ids start again at 1 after some
     *  BMC restarts, so (run, id) orders the records as the SEL does. */
    std::uint32_t run = 0;
    SelRecordBytes bytes{};
    std::string description;
};

/** What a refresh changed in the cached records. */
enum class SelChange
{
    None,     // the same records (the SEL info may differ)
    Appended, // records were added after the ones held before
    Replaced, // every record was read (or described) again
};

/**
 * @brief The process's copy of the BMC's SEL, kept current with as few
 *        exchanges as the BMC allows.
 *
 * Every refresh asks Get SEL Info. When entries, last addition and last
 * erase are unchanged the records are kept (after a new session, which
 * may face a restarted BMC, the last record is read once more to check
 * it). When only entries were added, the last known record is read again
 * and the walk goes on from its next-record id, reading only the new
 * records. Anything else (an erase, deleted or overwritten records, a last
 * record that changed, a count that does not add up) reads the whole SEL
 * again. A whole read restarts when the SEL reservation is cancelled
 * (completion code C5h) or the SEL changes under it, at most
 * walkAttempts times.
 *
 * Not thread-safe: the caller holds exclusive access to the BMC.
 */
class SelCache
{
  public:
    static constexpr unsigned walkAttempts = 3;

    /** Brings the copy up to date. Throws IpmiError; the copy is then
     *  unchanged, or marked for a whole read at the next refresh. */
    SelChange refresh(BmcCommands& bmc, RecordDescriber& describer);

    /** The SEL info of the last refresh. */
    const SelInfo& info() const
    {
        return info_;
    }
    const std::vector<CachedRecord>& records() const
    {
        return records_;
    }
    /** Index of the first record added by the last refresh (Appended). */
    std::size_t firstNew() const
    {
        return firstNew_;
    }
    /** Makes the next refresh read the whole SEL. */
    void invalidate()
    {
        trusted_ = false;
    }

  private:
    bool lastRecordUnchanged(BmcCommands& bmc);
    bool readAdded(BmcCommands& bmc, const SelInfo& info,
                   RecordDescriber& describer);
    void readAll(BmcCommands& bmc, SelInfo info, RecordDescriber& describer);
    void append(const SelRecordBytes& bytes, RecordDescriber& describer);

    SelInfo info_;
    std::vector<CachedRecord> records_;
    std::size_t firstNew_ = 0;
    bool trusted_ = false;
    std::uint64_t sessionGeneration_ = 0;
};

} // namespace QX::Ipmi
