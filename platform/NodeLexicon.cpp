#include "NodeLexicon.h"

#include <ctime>

namespace QX::NodeLexicon
{

const char* nodeTypeName(unsigned kind)
{
    switch (kind)
    {
        case ManagementController:
            return "ManagementController";
        case EventLog:
            return "EventLog";
        case Watchdog:
            return "Watchdog";
        case EventLogEntry:
            return "EventLogEntry";
        default:
            return nullptr;
    }
}

const char* propertyName(unsigned property)
{
    switch (property)
    {
        case MaxRecords:
            return "MaxRecords";
        case Timestamp:
            return "Timestamp";
        case RecordData:
            return "RecordData";
        case DataFormat:
            return "DataFormat";
        case RecordId:
            return "RecordId";
        case Name:
            return "Name";
        case OverwritePolicy:
            return "OverwritePolicy";
        case RestartCause:
            return "RestartCause";
        case IsEmpty:
            return "IsEmpty";
        case Command:
            return "Command";
        default:
            return nullptr;
    }
}

std::string timestampText(std::time_t when)
{
    std::tm fields{};
    gmtime_r(&when, &fields);
    char text[32];
    std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", &fields);
    return text;
}

} // namespace QX::NodeLexicon
