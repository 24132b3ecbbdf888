// Arbitrary bytes cut into 16-byte SEL records (a short tail is padded with
// zeros), interpreted as the IPMI source interprets them: FreeIPMI's event
// text with and without the sensor names of an SDR cache, the entry's
// timestamp and raw data, and the entry nodes of the source's tree, read
// from a BMC that holds exactly these records.
//
// Checked: every description is non-empty, free of NUL and bounded; every
// timestamp is "YYYY-MM-DD hh:mm:ss", the unknown time exactly when the
// record has no usable time of its own, and otherwise the record's UTC
// time; the raw data is the plain hexadecimal rebuilding; the source has
// one entry per record with these texts.
#include "CVLogger.h"
#include "ipmi/FreeIpmiDescriber.h"
#include "ipmi/IpmiError.h"
#include "ipmi/IpmiSession.h"
#include "ipmi/IpmiSource.h"
#include "ipmi/SelRecordText.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <memory>
#include <string>
#include <vector>

namespace
{

using namespace QX;
using namespace QX::Ipmi;

constexpr std::size_t maxRecords = 32;
// FreeIPMI writes into a 2,048-byte buffer; the OEM prefix adds 32 at most.
constexpr std::size_t longestDescription = 2048 + 32;

[[noreturn]] void fail(const char* what, const std::string& detail)
{
    std::fprintf(stderr, "sel_record: %s: \"%s\"\n", what, detail.c_str());
    std::abort();
}

// A BMC whose SEL holds the fuzzed records, ids 1..n in SEL order.
class RecordsBmc : public BmcCommands
{
  public:
    explicit RecordsBmc(std::vector<SelRecordBytes> records) :
        records_(std::move(records))
    {
    }

    SelInfo getSelInfo() override
    {
        SelInfo info;
        info.entries = static_cast<std::uint16_t>(records_.size());
        info.freeSpace = 0x100;
        info.mostRecentAddition = 0x65000000;
        info.reserveSupported = true;
        return info;
    }
    std::uint16_t reserveSel() override
    {
        return 1;
    }
    SelEntry getSelEntry(std::uint16_t, std::uint16_t recordId) override
    {
        const std::size_t index = recordId == firstRecordId ? 0 : recordId - 1u;
        if (index >= records_.size())
        {
            throw IpmiError("Get SEL Entry", ErrorCategory::Other, "no record",
                            completionRecordNotPresent);
        }
        SelEntry entry;
        entry.data = records_[index];
        entry.nextRecordId = index + 1 == records_.size()
                                 ? lastRecordId
                                 : static_cast<std::uint16_t>(index + 2);
        return entry;
    }
    void initiateSelErase(std::uint16_t) override {}
    bool selEraseCompleted(std::uint16_t) override
    {
        return true;
    }
    std::optional<std::uint8_t> getSystemRestartCause() override
    {
        return std::nullopt;
    }
    std::uint64_t sessionGeneration() const override
    {
        return 1;
    }
    std::chrono::steady_clock::time_point lastActivity() const override
    {
        return std::chrono::steady_clock::now();
    }

  private:
    std::vector<SelRecordBytes> records_;
};

// Lends a describer to a source, which owns the one it is given.
class LentDescriber : public RecordDescriber
{
  public:
    explicit LentDescriber(RecordDescriber& describer) : describer_(describer)
    {
    }
    bool refreshSensorNames() override
    {
        return false;
    }
    std::string describe(const SelRecordBytes& record) override
    {
        return describer_.describe(record);
    }

  private:
    RecordDescriber& describer_;
};

struct Describers
{
    // Never opened: the describers only interpret records here.
    IpmiSession session{SessionParameters{}};
    FreeIpmiDescriber byNumber{session, "", 0, 0};
    FreeIpmiDescriber byName{session, "", 0, 0};
    FreeIpmiDescriber assumingSystemEvents{
        session, "", 0, IPMI_SEL_FLAGS_ASSUME_SYTEM_EVENT_RECORDS};

    Describers()
    {
        CVLog::CVLogger::setSink(nullptr);
        if (!byName.openCacheFile(SELPROV_FUZZ_SDR_CACHE) ||
            !assumingSystemEvents.openCacheFile(SELPROV_FUZZ_SDR_CACHE))
        {
            fail("cannot open the SDR cache", SELPROV_FUZZ_SDR_CACHE);
        }
    }
};

Describers& describers()
{
    static Describers instance;
    return instance;
}

void checkDescription(const std::string& text)
{
    if (text.empty() || text.size() > longestDescription ||
        text.find('\0') != std::string::npos)
    {
        fail("bad description", text);
    }
}

std::string expectedHex(const SelRecordBytes& record)
{
    std::string text;
    for (std::size_t i = 0; i < record.size(); ++i)
    {
        char pair[4];
        std::snprintf(pair, sizeof pair, i == 0 ? "%02x" : " %02x", record[i]);
        text += pair;
    }
    return text;
}

// The UTC time of a system event (02h) or timestamped OEM (C0h-DFh)
// record whose time is past the pre-init range and not FFFFFFFFh.
std::string expectedUtcTimestamp(const SelRecordBytes& record)
{
    const std::uint8_t type = record[2];
    const std::uint32_t raw = record[3] | record[4] << 8 | record[5] << 16 |
                              static_cast<std::uint32_t>(record[6]) << 24;
    const bool timed = type == 0x02 || (type >= 0xC0 && type <= 0xDF);
    if (!timed || raw <= 0x20000000 || raw == 0xFFFFFFFF)
    {
        return unknownTimestamp;
    }
    const std::time_t seconds = raw;
    std::tm fields{};
    gmtime_r(&seconds, &fields);
    char text[32];
    std::snprintf(text, sizeof text, "%04d-%02d-%02d %02d:%02d:%02d",
                  fields.tm_year + 1900, fields.tm_mon + 1, fields.tm_mday,
                  fields.tm_hour, fields.tm_min, fields.tm_sec);
    return text;
}

void checkTimestampForm(const std::string& text)
{
    static const char shape[] = "dddd-dd-dd dd:dd:dd";
    bool good = text.size() == sizeof shape - 1;
    for (std::size_t i = 0; good && i < text.size(); ++i)
    {
        good = shape[i] == 'd' ? text[i] >= '0' && text[i] <= '9'
                               : text[i] == shape[i];
    }
    if (!good)
    {
        fail("timestamp not in its fixed form", text);
    }
}

std::string textProperty(const NodeRecord& node, NodeLexicon::Properties name)
{
    const PropertyValue* value = node.find(name);
    if (value == nullptr || !std::holds_alternative<std::string>(*value))
    {
        fail("entry property missing", node.path);
    }
    return std::get<std::string>(*value);
}

// @p descriptions: what @p describer made of each record.
void checkSource(const std::vector<SelRecordBytes>& records,
                 RecordDescriber& describer,
                 const std::vector<std::string>& descriptions)
{
    Settings settings;
    IpmiSource source(std::make_unique<RecordsBmc>(records),
                      std::make_unique<LentDescriber>(describer), settings,
                      "fuzzed BMC");
    const auto tree = source.snapshot();
    const auto& entries = tree->nodesOfKind(NodeLexicon::EventLogEntry);
    if (entries.size() != records.size())
    {
        fail("entry count differs", std::to_string(entries.size()));
    }
    for (std::size_t i = 0; i < records.size(); ++i)
    {
        const NodeRecord& node = tree->node(entries[i]);
        checkDescription(node.description);
        if (node.description != descriptions[i] ||
            textProperty(node, NodeLexicon::RecordData) !=
                expectedHex(records[i]) ||
            textProperty(node, NodeLexicon::Timestamp) !=
                expectedUtcTimestamp(records[i]))
        {
            fail("entry node differs from its record", node.path);
        }
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data,
                                      std::size_t size)
{
    Describers& all = describers();
    std::vector<SelRecordBytes> records;
    for (std::size_t at = 0; at < size && records.size() < maxRecords; at += 16)
    {
        SelRecordBytes record{};
        for (std::size_t i = 0; i < 16 && at + i < size; ++i)
        {
            record[i] = data[at + i];
        }
        records.push_back(record);
    }

    // The source below describes with sensor names for even sizes.
    const bool named = size % 2 == 0;
    std::vector<std::string> descriptions;
    for (const SelRecordBytes& record : records)
    {
        const std::string byName = all.byName.describe(record);
        checkDescription(byName);
        const std::string byNumber = all.byNumber.describe(record);
        checkDescription(byNumber);
        checkDescription(all.assumingSystemEvents.describe(record));
        descriptions.push_back(named ? byName : byNumber);
        checkDescription(fallbackDescription(record));
        const std::string utc = timestampText(record, SelClock::Utc);
        if (utc != expectedUtcTimestamp(record))
        {
            fail("UTC timestamp differs", utc);
        }
        checkTimestampForm(utc);
        checkTimestampForm(timestampText(record, SelClock::Local));
        if (hexText(record) != expectedHex(record))
        {
            fail("raw data differs", hexText(record));
        }
        // Only a system event record can say the log was cleared.
        if (isLogClearedRecord(record) && record[2] != 0x02)
        {
            fail("log-cleared record of another type", hexText(record));
        }
    }
    if (!records.empty())
    {
        checkSource(records,
                    named ? static_cast<RecordDescriber&>(all.byName)
                          : all.byNumber,
                    descriptions);
    }
    return 0;
}
