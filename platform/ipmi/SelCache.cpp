#include "SelCache.h"

#include "IpmiError.h"
#include "SelRecordText.h"

#include <algorithm>
#include <string>

namespace QX::Ipmi
{

namespace
{

// Whether @p records hold nothing but the "log cleared" record BMCs write
// after an erase.
bool emptied(const std::vector<SelRecordBytes>& records)
{
    return std::all_of(records.begin(), records.end(), isLogClearedRecord);
}

} // namespace

SelChange SelCache::refresh(BmcCommands& bmc, RecordDescriber& describer)
{
    const SelInfo info = bmc.getSelInfo();
    bool namesChanged = false;
    try
    {
        namesChanged = describer.refreshSensorNames();
    }
    catch (const IpmiError& error)
    {
        // An SDR the BMC will not hand out costs sensor names, not the SEL.
        if (error.category() != ErrorCategory::CompletionCode)
        {
            throw;
        }
    }
    // Loaded after the sensor names, so that its texts have them.
    useKept(describer);
    const bool verifyDue =
        verifyEvery_.count() > 0 &&
        std::chrono::steady_clock::now() - lastWholeRead_ >= verifyEvery_;

    SelChange change = SelChange::Replaced;
    // The first and the last branch both read everything, for different
    // reasons.
    if (!trusted_ || verifyDue)
    { // NOLINT(bugprone-branch-clone)
        change = readAll(bmc, info, describer) ? SelChange::Replaced
                                               : SelChange::None;
    }
    else if (unchanged(bmc, info))
    {
        info_ = info;
        change = SelChange::None;
    }
    else if (info.mostRecentErase == info_.mostRecentErase &&
             info.entries > info_.entries && !records_.empty() &&
             readAdded(bmc, info, describer))
    {
        change = SelChange::Appended;
    }
    else
    {
        change = readAll(bmc, info, describer) ? SelChange::Replaced
                                               : SelChange::None;
    }

    if (keptUnshown_)
    {
        // Every record of a loaded copy is new to whoever shows it, also
        // when the refresh that loaded it failed half-way.
        keptUnshown_ = false;
        firstNew_ = 0;
        change = SelChange::Replaced;
    }
    if (namesChanged && change != SelChange::Replaced)
    {
        for (CachedRecord& record : records_)
        {
            record.description = describer.describe(record.bytes);
        }
        change = SelChange::Replaced;
    }
    if (change != SelChange::None)
    {
        ++version_;
    }
    return change;
}

bool SelCache::useKept(RecordDescriber& describer)
{
    if (!kept_)
    {
        return false;
    }
    KeptSel kept = std::move(*kept_);
    kept_.reset();
    if (trusted_ || !records_.empty() ||
        lastWholeRead_ != std::chrono::steady_clock::time_point{})
    {
        return false; // this process has read the SEL itself
    }
    // Texts made under the same names are used as they are; describing
    // every record is most of what loading a large copy costs.
    const std::string textsKey = describer.textsKey();
    const bool textsFit = !textsKey.empty() && kept.textsKey == textsKey &&
                          kept.texts.size() == kept.records.size();
    records_.reserve(kept.records.size());
    for (std::size_t i = 0; i < kept.records.size(); ++i)
    {
        if (textsFit)
        {
            append(kept.records[i], std::move(kept.texts[i]));
        }
        else
        {
            append(kept.records[i], describer);
        }
    }
    info_ = kept.info;
    clearSeen_ = kept.clearSeen;
    // From here on the kept copy is checked as a copy read by this
    // process: the refresh that loaded it compares it with the BMC.
    trusted_ = true;
    keptUnshown_ = true;
    lastWholeRead_ = std::chrono::steady_clock::now();
    return true;
}

std::optional<KeptSel> SelCache::keep(const std::string& textsKey) const
{
    if (!trusted_)
    {
        return std::nullopt;
    }
    KeptSel kept;
    kept.info = info_;
    kept.clearSeen = clearSeen_;
    kept.records.reserve(records_.size());
    for (const CachedRecord& record : records_)
    {
        kept.records.push_back(record.bytes);
    }
    if (!textsKey.empty())
    {
        kept.textsKey = textsKey;
        kept.texts.reserve(records_.size());
        for (const CachedRecord& record : records_)
        {
            kept.texts.push_back(record.description);
        }
    }
    return kept;
}

void SelCache::erase(BmcCommands& bmc)
{
    // The copy no longer matches the SEL, whatever happens below.
    trusted_ = false;
    reader_.erase(bmc);
    clearSeen_ = true;
}

bool SelCache::unchanged(BmcCommands& bmc, const SelInfo& info)
{
    if (!info.sameRecordsAs(info_))
    {
        return false;
    }
    if (info.entries == 0 && records_.empty())
    {
        return true;
    }
    // Same count and times; the newest record tells whether records were
    // replaced all the same.
    const std::optional<SelRecordBytes> newest = reader_.newest(bmc);
    return records_.empty() ? !newest
                            : newest && *newest == records_.back().bytes;
}

bool SelCache::readAdded(BmcCommands& bmc, const SelInfo& info,
                         RecordDescriber& describer)
{
    const CachedRecord& last = records_.back();
    const std::optional<SelWalk> added =
        reader_.readAfter(bmc, info, last.id, last.bytes);
    if (!added || !added->complete)
    {
        return false;
    }
    SelInfo after = info;
    if (records_.size() + added->records.size() != info.entries)
    {
        // Records may have arrived during the walk: then the SEL info
        // says so now.
        after = bmc.getSelInfo();
        if (after.mostRecentErase != info_.mostRecentErase ||
            records_.size() + added->records.size() != after.entries)
        {
            return false;
        }
    }
    firstNew_ = records_.size();
    for (const SelRecordBytes& bytes : added->records)
    {
        append(bytes, describer);
    }
    if (!emptied(added->records))
    {
        clearSeen_ = false;
    }
    info_ = after;
    return true;
}

bool SelCache::readAll(BmcCommands& bmc, SelInfo info,
                       RecordDescriber& describer)
{
    trusted_ = false;
    const bool firstRead =
        lastWholeRead_ == std::chrono::steady_clock::time_point{};
    SelWalk walk;
    for (unsigned attempt = 1;; ++attempt)
    {
        walk = reader_.readAll(bmc, info);
        const SelInfo after = bmc.getSelInfo();
        const bool consistent =
            after.sameRecordsAs(info) || after.entries == walk.records.size();
        if (consistent || attempt >= walkAttempts)
        {
            // When the SEL kept changing, or the chain could not be
            // followed to its end, keep what was read but read it all
            // again next time.
            info_ = after;
            trusted_ = consistent && walk.complete;
            break;
        }
        info = after;
    }
    lastWholeRead_ = std::chrono::steady_clock::now();

    const bool same =
        std::equal(records_.begin(), records_.end(), walk.records.begin(),
                   walk.records.end(),
                   [](const CachedRecord& kept, const SelRecordBytes& read)
                   { return kept.bytes == read; });
    if (same)
    {
        return firstRead;
    }
    const bool hadRecords =
        std::any_of(records_.begin(), records_.end(),
                    [](const CachedRecord& record)
                    { return !isLogClearedRecord(record.bytes); });
    if (emptied(walk.records))
    {
        clearSeen_ = clearSeen_ || hadRecords;
    }
    else
    {
        clearSeen_ = false;
    }
    records_.clear();
    records_.reserve(walk.records.size());
    firstNew_ = 0;
    for (const SelRecordBytes& bytes : walk.records)
    {
        append(bytes, describer);
    }
    return true;
}

void SelCache::append(const SelRecordBytes& bytes, RecordDescriber& describer)
{
    std::string description;
    try
    {
        description = describer.describe(bytes);
    }
    catch (const std::exception&)
    {
        // A record nothing can interpret keeps its bytes and a plain text.
        description = fallbackDescription(bytes);
    }
    append(bytes, std::move(description));
}

void SelCache::append(const SelRecordBytes& bytes, std::string description)
{
    CachedRecord record;
    record.id = recordIdOf(bytes);
    record.bytes = bytes;
    if (!records_.empty())
    {
        const CachedRecord& previous = records_.back();
        record.run = previous.run + (record.id <= previous.id ? 1 : 0);
    }
    record.description = std::move(description);
    records_.push_back(std::move(record));
}

} // namespace QX::Ipmi
