#include "NodeLexicon.h"

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

} // namespace QX::NodeLexicon
