#include "SEL.h"

#include "Instrumentation.h"
#include "ProviderException.h"
#include "sdk/qxlib/include/Trace.h"

#include <array>
#include <charconv>
#include <cstring>
#include <exception>
#include <iostream>
#include <utility>

namespace QX::SELComposite
{

namespace
{

constexpr const char* unitFile = "SEL.cpp";

using NodeLexicon::EventLog;
using NodeLexicon::EventLogEntry;
using NodeLexicon::ManagementController;
using NodeLexicon::Parent;

/** Raw OverwritePolicy 0..2 to the CIM overwrite policy. */
constexpr std::array<std::uint16_t, 3> OVERWRITE_POLICY_MAP = {0, 2, 7};

/** Node status 0..16 to the CIM enabled and requested states. */
constexpr std::array<std::uint16_t, 17> ENABLED_STATE_MAP = {
    0, 2, 10, 5, 5, 5, 5, 5, 5, 5, 5, 5, 6, 5, 5, 5, 3};
constexpr std::array<std::uint16_t, 17> REQUESTED_STATE_MAP = {
    0, 2, 12, 12, 12, 12, 12, 12, 12, 11, 12, 12, 6, 12, 12, 12, 3};
constexpr std::uint16_t enabledStateOther = 5;
constexpr std::uint16_t requestedStateOther = 12;

/** Size of the timestamp working buffer, terminator included. */
constexpr std::size_t timestampBufferSize = 64;
/** What follows the date and time digits of an entry's CIM timestamp. */
constexpr std::string_view cimTimestampTail = ".000000+000";

// Callers pass fixed line numbers on purpose: trace lines stay as they are.
void traceEdge(const char* function, int line, MessageType type)
{
    logFunctionEdge(function, unitFile, line, loggerSEL, type);
}

void reportCaught(const std::exception& error)
{
    std::cerr << error.what() << std::endl;
}

} // namespace

int getMgmtHwLogInstances(LogMap& logs)
{
    constexpr const char* function = "getMgmtHwLogInstances";
    traceEdge(function, 364, ENTRY_TRACE);
    int status = 1;
    try
    {
        Instrumentation logCursor;
        Instrumentation entryCursor;
        logCursor.selectNode(ManagementController);
        if (logCursor)
        {
            const std::string controllerPath = logCursor.getPathToNode();
            logCursor.selectNode(EventLog);
            if (logCursor)
            {
                logCursor.setFilter(Parent, controllerPath);
                std::string key;
                std::uint16_t ordinal = 0;
                while (logCursor)
                {
                    MgmtHwLog log;
                    ++ordinal;
                    // A log whose name cannot be read keeps the previous
                    // log's key, so its record replaces the previous one.
                    if (logCursor.getProperty(NodeLexicon::Name, key))
                    {
                        log.setElementName(key);
                        log.setName(key);
                    }
                    unsigned maxRecords = 0;
                    if (logCursor.getProperty(NodeLexicon::MaxRecords,
                                              maxRecords))
                    {
                        log.maxNumberOfRecords = maxRecords;
                    }
                    entryCursor.selectNode(EventLogEntry);
                    entryCursor.setFilter(Parent, logCursor.getPathToNode());
                    std::uint64_t records = 0;
                    while (entryCursor)
                    {
                        ++records;
                        ++entryCursor;
                    }
                    log.currentNumberOfRecords = records;
                    unsigned policy = 0;
                    if (logCursor.getProperty(NodeLexicon::OverwritePolicy,
                                              policy))
                    {
                        log.overwritePolicy =
                            policy < OVERWRITE_POLICY_MAP.size()
                                ? OVERWRITE_POLICY_MAP[policy]
                                : 0;
                    }
                    const unsigned nodeStatus = logCursor.getNodeStatus();
                    const bool known = nodeStatus < ENABLED_STATE_MAP.size();
                    log.enabledState = known ? ENABLED_STATE_MAP[nodeStatus]
                                             : enabledStateOther;
                    log.requestedState = known ? REQUESTED_STATE_MAP[nodeStatus]
                                               : requestedStateOther;
                    if (!log.setNode(ordinal))
                    {
                        throw ProviderException(
                            "Failed while setting Node Property");
                    }
                    logs[key] = std::move(log);
                    ++logCursor;
                }
                status = 0;
            }
        }
    }
    catch (const std::exception& error)
    {
        reportCaught(error);
        return 1;
    }
    traceEdge(function, 540, EXIT_TRACE);
    return status;
}

int getMgmtHwLogEntryInstances(EntryMap& entries)
{
    constexpr const char* function = "getMgmtHwLogEntryInstances";
    traceEdge(function, 548, ENTRY_TRACE);
    int status = 1;
    try
    {
        Instrumentation entryCursor;
        Instrumentation logCursor;
        entryCursor.selectNode(ManagementController);
        if (entryCursor)
        {
            const std::string controllerPath = entryCursor.getPathToNode();
            entryCursor.selectNode(EventLog);
            if (entryCursor)
            {
                entryCursor.setFilter(Parent, controllerPath);
                const std::string logPath = entryCursor.getPathToNode();
                std::string logName;
                entryCursor.getProperty(NodeLexicon::Name, logName);
                entryCursor.selectNode(EventLogEntry);
                if (entryCursor)
                {
                    entryCursor.setFilter(Parent, logPath);
                    std::uint16_t ordinal = 0;
                    std::string scratch;
                    while (entryCursor)
                    {
                        MgmtHwLogEntry entry;
                        ++ordinal;
                        std::string key = entryCursor.convertPathToString(
                            entryCursor.getPathToNode());
                        if (!entry.setElementName(key))
                        {
                            throw ProviderException(
                                "Failed while setting ElementName.");
                        }
                        if (!entry.setNode(ordinal))
                        {
                            throw ProviderException(
                                "Failed while setting Node Property");
                        }
                        if (!entry.setDescription(
                                entryCursor.getNodeDescription()))
                        {
                            throw ProviderException(
                                "Failed while setting Description");
                        }
                        unsigned recordId = 0;
                        if (entryCursor.getProperty(NodeLexicon::RecordId,
                                                    recordId))
                        {
                            entry.recordID = convertUintToString(recordId);
                        }
                        entry.logName = logName;
                        // A read stores nothing when it fails, so reading
                        // straight into the field leaves it as made, just as
                        // a copy from the scratch text after a successful
                        // read would.
                        entryCursor.getProperty(NodeLexicon::RecordData,
                                                entry.recordData);
                        logCursor.selectNode(logPath);
                        logCursor.getProperty(NodeLexicon::DataFormat,
                                              entry.dataFormat);
                        if (entryCursor.getProperty(NodeLexicon::Timestamp,
                                                    scratch))
                        {
                            entry.messageTimestamp =
                                convertTimestampToCIM(scratch);
                        }
                        // Entries come in path order, so the place for
                        // the key is nearly always the end of the map.
                        entries.insert_or_assign(entries.end(), std::move(key),
                                                 std::move(entry));
                        ++entryCursor;
                    }
                    status = 0;
                }
            }
        }
    }
    catch (const std::exception& error)
    {
        reportCaught(error);
        return 1;
    }
    traceEdge(function, 682, EXIT_TRACE);
    return status;
}

int clearLog()
{
    Instrumentation controller;
    controller.selectNode(ManagementController);
    unsigned command = CLEAR_LOG_COMMAND;
    if (controller.setProperty(NodeLexicon::Command, command))
    {
        return 0;
    }
    logMessage("clearLog", unitFile, 697, loggerSEL, LOG_LEVEL_FAILURE,
               "Failed to Clear Log\n");
    return 2;
}

std::string convertUintToString(std::uint32_t value)
{
    // Ten digits hold the largest 32-bit value.
    std::array<char, 10> digits{};
    const auto printed =
        std::to_chars(digits.data(), digits.data() + digits.size(), value);
    return {digits.data(), printed.ptr};
}

std::string convertTimestampToCIM(const std::string& timestamp)
{
    std::array<char, timestampBufferSize> buffer{};
    // Cut to what the buffer holds; an inner NUL ends the text.
    std::strncpy(buffer.data(), timestamp.c_str(), buffer.size() - 1);
    const std::string_view text(buffer.data());
    std::string result;
    result.reserve(text.size() + cimTimestampTail.size());
    std::size_t position = 0;
    while (position < text.size())
    {
        const std::size_t start = text.find_first_not_of("-: ", position);
        if (start == std::string_view::npos)
        {
            break;
        }
        const std::size_t end = text.find_first_of("-: ", start);
        result.append(text.substr(start, end - start));
        position = end == std::string_view::npos ? text.size() : end;
    }
    result.append(cimTimestampTail);
    return result;
}

} // namespace QX::SELComposite
