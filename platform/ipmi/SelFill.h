#pragma once

#include "IpmiSettings.h"
#include "SelCache.h"

#include <vector>

namespace QX::Ipmi
{

/** What the log node shows of the SEL as a whole. */
struct LogState
{
    unsigned maxRecords = 0;
    unsigned overwritePolicy = 0;
    bool isEmpty = true;
    unsigned status = 0; // node status: 1, 14 cleared, 21 filling, 24 full
    bool operator==(const LogState&) const = default;
};

/** A SEL is expected to hold at least this many records: a free space
 *  that leaves room for fewer in all is not believed. */
constexpr unsigned smallestSel = 8;

/**
 * The log's state from Get SEL Info and the records.
 *
 * Get SEL Info's free space is believed only when it is not FFFFh (which
 * some BMCs give however full the SEL is) and leaves room for at least
 * smallestSel records (some give 0 with two records in the SEL). The
 * "SEL full" and "SEL almost full" records since the last "log cleared"
 * record are a fill signal of their own, the only one where Get SEL Info
 * cannot be believed; the fuller of the two signals wins. An empty SEL
 * (or one holding only the "log cleared" record) counts as cleared when
 * the last-erase time says so or @p clearSeen.
 */
LogState logStateOf(const SelInfo& info,
                    const std::vector<CachedRecord>& records, bool clearSeen,
                    const Settings& settings);

} // namespace QX::Ipmi
