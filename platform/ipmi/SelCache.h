#pragma once

#include "BmcCommands.h"
#include "RecordDescriber.h"
#include "SelCopyFile.h"
#include "SelReader.h"

#include <chrono>
#include <cstdint>
#include <optional>
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
 * Every refresh asks Get SEL Info and reads the newest record (Get SEL
 * Entry FFFFh): many BMCs keep Get SEL Info's timestamps frozen, and a
 * full ring buffer keeps its entry count while new records replace the
 * oldest, so only the newest record's bytes tell that something changed.
 * When count, timestamps and newest record are unchanged the records are
 * kept. When the count grew and the last known record is still there, the
 * walk goes on from it and reads only the new records. Anything else (an
 * erase, replaced or deleted records, a count that does not add up) reads
 * the whole SEL again (SelReader), and so does a refresh once the verify
 * interval has passed since the last whole read. Records are told apart
 * by their 16 bytes, never by id or time.
 *
 * A copy kept from an earlier process (adopt()) stands in for the first
 * whole read: the first refresh loads it and then checks it with the BMC
 * exactly as it checks the copy of this process, so an unchanged SEL
 * costs Get SEL Info and the newest record, added records cost only
 * themselves, and anything else (a clear, a wrapped ring buffer, another
 * BMC's SEL) reads the whole SEL again.
 *
 * Not thread-safe: the caller holds exclusive access to the BMC.
 */
class SelCache
{
  public:
    static constexpr unsigned walkAttempts = SelReader::walkAttempts;

    /**
     * @param eraseWait how long an erase (and a read during one) may take
     * @param verifyEvery how often the whole SEL is read again to check
     *        the copy; zero: never
     */
    explicit SelCache(
        std::chrono::milliseconds eraseWait = SelReader::defaultEraseWait,
        std::chrono::seconds verifyEvery = std::chrono::seconds(0)) :
        reader_(eraseWait),
        verifyEvery_(verifyEvery)
    {
    }

    /** Brings the copy up to date. Throws IpmiError; the copy is then
     *  unchanged, or marked for a whole read at the next refresh. */
    SelChange refresh(BmcCommands& bmc, RecordDescriber& describer);

    /** Takes a copy kept by an earlier process; the next refresh uses it
     *  in place of a whole read, if this cache has read nothing yet. */
    void adopt(KeptSel kept)
    {
        kept_ = std::move(kept);
    }
    /** The copy to keep for a later process, its texts under
     *  @p textsKey (RecordDescriber::textsKey; empty: none): nothing while
     *  the copy is not known to match the SEL (to be read again next
     *  time). */
    std::optional<KeptSel> keep(const std::string& textsKey) const;

    /** Clears the SEL, waiting until the BMC has finished. */
    void erase(BmcCommands& bmc);

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
    /** Counts the refreshes that changed the records. */
    std::uint64_t version() const
    {
        return version_;
    }
    /** Whether the SEL was seen emptied (by an erase here, or records
     *  that all went away) and has held no record but the "log cleared"
     *  one since. */
    bool clearSeen() const
    {
        return clearSeen_;
    }
    /** Makes the next refresh read the whole SEL. */
    void invalidate()
    {
        trusted_ = false;
    }

  private:
    bool useKept(RecordDescriber& describer);
    bool unchanged(BmcCommands& bmc, const SelInfo& info);
    bool readAdded(BmcCommands& bmc, const SelInfo& info,
                   RecordDescriber& describer);
    bool readAll(BmcCommands& bmc, SelInfo info, RecordDescriber& describer);
    void append(const SelRecordBytes& bytes, RecordDescriber& describer);
    void append(const SelRecordBytes& bytes, std::string description);

    SelReader reader_;
    std::chrono::seconds verifyEvery_;
    std::chrono::steady_clock::time_point lastWholeRead_;
    SelInfo info_;
    std::vector<CachedRecord> records_;
    std::size_t firstNew_ = 0;
    std::uint64_t version_ = 0;
    bool trusted_ = false;
    bool clearSeen_ = false;
    std::optional<KeptSel> kept_;
    bool keptUnshown_ = false;
};

} // namespace QX::Ipmi
