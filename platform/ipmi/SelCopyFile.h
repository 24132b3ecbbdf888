#pragma once

#include "BmcCommands.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace QX::Ipmi
{

/**
 * @brief The SEL copy as kept on disk between processes: the record bytes
 *        and what change detection compares them with, for one BMC.
 *
 * The event texts are kept with the key of what they depend on besides
 * the bytes (RecordDescriber::textsKey): a process whose describer gives
 * the same key uses them as they are, any other makes them again.
 */
struct KeptSel
{
    /** The BMC the copy was read from (IpmiSession::peerKey). */
    std::string bmcKey;
    /** Get SEL Info as it was when the records were last confirmed. */
    SelInfo info;
    /** The SEL was seen emptied and holds nothing newer (SelCache). */
    bool clearSeen = false;
    std::vector<SelRecordBytes> records;
    /** RecordDescriber::textsKey of the texts; empty: no texts kept. */
    std::string textsKey;
    /** One text per record, or none. */
    std::vector<std::string> texts;

    bool operator==(const KeptSel&) const = default;
};

/** Where the copy of one BMC's SEL is kept, and the BMC's key. */
struct SelCopyPlace
{
    std::string file;
    std::string bmcKey;
};

/** The format version written; a file of another version is not used. */
constexpr std::uint32_t selCopyVersion = 2;
/** The most records a SEL can hold (16-bit ids, FFFFh reserved). */
constexpr std::size_t maxKeptRecords = 65535;
/** The longest BMC key kept. */
constexpr std::size_t maxBmcKey = 255;
/** The longest texts key and the longest text kept; a copy with a longer
 *  text keeps no texts. */
constexpr std::size_t maxTextsKey = 1024;
constexpr std::size_t maxKeptText = 1024;

/** The file's bytes for @p copy. Throws std::invalid_argument when the
 *  copy exceeds the bounds above. */
std::string formatSelCopy(const KeptSel& copy);

/**
 * Parses the file's bytes. Anything but a complete, intact file of this
 * version for the BMC @p bmcKey gives nothing and says why in @p problem.
 */
std::optional<KeptSel> parseSelCopy(std::string_view bytes,
                                    const std::string& bmcKey,
                                    std::string& problem);

/** Reads and parses the file at @p path; nothing, with the reason in
 *  @p problem, when it is missing, unreadable or not valid. */
std::optional<KeptSel> readSelCopy(const std::string& path,
                                   const std::string& bmcKey,
                                   std::string& problem);

/** Replaces the file at @p path atomically (writeFileAtomically), owner
 *  readable only. Throws std::runtime_error, std::invalid_argument. */
void writeSelCopy(const std::string& path, const KeptSel& copy);

} // namespace QX::Ipmi
