#pragma once

#include "BmcCommands.h"

#include <cstdint>
#include <optional>
#include <string>

namespace QX::Ipmi
{

/**
 * @brief What the SEL poller has announced so far, kept across restarts
 *        of the process so that nothing is announced twice or missed.
 */
struct AnnouncedState
{
    /** The newest record announced (or present when watching began);
     *  nothing when the SEL was empty then. */
    std::optional<SelRecordBytes> lastRecord;
    std::uint32_t lastAddition = 0;
    std::uint32_t lastErase = 0;
    /** The log's node status last seen (fill transitions are announced
     *  once). */
    unsigned logStatus = 0;
    /** Which watchdog restart was announced last (see SelAlertTracker). */
    std::string restartKey;

    bool operator==(const AnnouncedState&) const = default;
};

/** The 32 lower-case hex digits of @p record, as the file keeps it. */
std::string recordHex(const SelRecordBytes& record);

/** The first line of the file; a file of another version is not used. */
constexpr const char* alertStateHeader = "qx-sel-alerts 1";

/** The file's text for @p state. */
std::string formatAlertState(const AnnouncedState& state);

/**
 * Parses the file's text. Anything but a complete file of this version
 * (missing or unknown lines, bad numbers, a truncated file) gives nothing
 * and says why in @p problem.
 */
std::optional<AnnouncedState> parseAlertState(const std::string& text,
                                              std::string& problem);

/**
 * Reads the file at @p path: nothing, with the reason in @p problem, when
 * it is missing, unreadable or not a valid state file.
 */
std::optional<AnnouncedState> readAlertState(const std::string& path,
                                             std::string& problem);

/**
 * Replaces the file at @p path atomically: the text goes to a temporary
 * file in the same directory, is flushed to the disk, and is renamed over
 * the old file, so a crash leaves the old state or the new one, never a
 * mix. Creates the directory when needed. Throws std::runtime_error.
 */
void writeAlertState(const std::string& path, const AnnouncedState& state);

} // namespace QX::Ipmi
