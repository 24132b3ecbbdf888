#pragma once

#include <ctime>
#include <string>

namespace QX::NodeLexicon
{

/** Kinds of instrumentation nodes. The numbers are the platform's own. */
enum NodeType : unsigned
{
    ManagementController = 13,
    EventLog = 35,
    Watchdog = 40,
    EventLogEntry = 47,
};

/** Node properties. Each has one value type: text, unsigned or boolean. */
enum Properties : unsigned
{
    MaxRecords = 37,       // unsigned, EventLog
    Timestamp = 79,        // text, EventLogEntry: "YYYY-MM-DD hh:mm:ss"
    RecordData = 81,       // text, EventLogEntry
    DataFormat = 84,       // text, EventLog
    RecordId = 89,         // unsigned, EventLogEntry
    Name = 108,            // text, EventLog
    OverwritePolicy = 114, // unsigned 0..2, EventLog
    RestartCause = 166,    // unsigned, Watchdog: 4 = watchdog expiry
    IsEmpty = 167,         // boolean, EventLog
    Command = 191,         // unsigned, written to ManagementController
};

/** Path relations usable as cursor filters. */
enum PathType : unsigned
{
    Parent = 1,
};

/** Commands written to the Command property of a ManagementController. */
constexpr unsigned ClearEventLogCommand = 9;

/** Alert codes passed to monitor callbacks, by the kind of node alerting. */
constexpr unsigned AlertOnEventLog = 0;
constexpr unsigned AlertOnWatchdog = 1;
constexpr unsigned AlertOnEventLogEntry = 2;

/** Node statuses an EventLog reports with an alert. */
constexpr unsigned EventLogStatusCleared = 14;
constexpr unsigned EventLogStatusAlmostFull = 21;
constexpr unsigned EventLogStatusFull = 24;

/** Text name of a node kind or property ("EventLog", "RecordId"), or
 *  nullptr for a number the lexicon does not know. */
const char* nodeTypeName(unsigned kind);
const char* propertyName(unsigned property);

/** The text of a Timestamp property for @p when: "YYYY-MM-DD hh:mm:ss" in
 *  UTC. */
std::string timestampText(std::time_t when);

} // namespace QX::NodeLexicon
