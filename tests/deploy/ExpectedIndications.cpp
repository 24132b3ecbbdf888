#include "ExpectedIndications.h"

#include <string>

namespace deploy
{

namespace
{

constexpr const char* nameSpace = "root/zanqx";
constexpr const char* someTime = "20240304081522.000000+000";

host::Value text(std::string value)
{
    return host::Value::string(std::move(value));
}

host::Value number(std::uint64_t value)
{
    return host::Value::unsignedInt(CMPI_uint16, value);
}

host::ObjectPath pathOf(const std::string& className)
{
    host::ObjectPath path;
    path.nameSpace = nameSpace;
    path.className = className;
    path.host = "server.example";
    return path;
}

// The alerting element of a log entry event: the new record.
std::string entryPath()
{
    host::ObjectPath path = pathOf("ZAN_MgmtHwLogEntry");
    path.setKey("LogCreationClassName", text("ZAN_MgmtHwLog"));
    path.setKey("CreationClassName", text("ZAN_MgmtHwLogEntry"));
    path.setKey("LogName", text("IPMI SEL Log"));
    path.setKey("RecordID", text("42"));
    path.setKey("MessageTimestamp", host::Value::dateTime(someTime));
    return path.toString();
}

// The alerting element of the clear and full events: the log.
std::string logPath()
{
    host::ObjectPath path = pathOf("ZAN_MgmtHwLog");
    path.setKey("CreationClassName", text("ZAN_MgmtHwLog"));
    path.setKey("Name", text("IMPI SEL Log"));
    return path.toString();
}

// Every builder sets the same seventeen properties with the same types;
// they differ in their values and in the element they name.
host::Instance indication(const std::string& className,
                          const std::string& alertingElement)
{
    host::Instance i;
    i.path = pathOf(className);
    i.setProperty("IndicationIdentifier", text("IPMI SEL Log"));
    i.setProperty("EventID", text("event"));
    i.setProperty("IndicationTime", host::Value::dateTime(someTime));
    i.setProperty("EventTime", host::Value::dateTime(someTime));
    i.setProperty("AlertingManagedElement", text(alertingElement));
    i.setProperty("CorrelatedIndications", host::Value::array(CMPI_string, {}));
    i.setProperty("Message", text("message"));
    i.setProperty("Description", text("message"));
    i.setProperty("PerceivedSeverity", number(2));
    i.setProperty("AlertingElementFormat", number(2));
    i.setProperty("AlertType", number(3));
    i.setProperty("ProbableCause", number(1));
    i.setProperty("SystemCreationClassName", text("ZANKOR_ComputerSystem"));
    i.setProperty("SystemName", text("server.example"));
    i.setProperty("OwningEntity", text("ZAN"));
    i.setProperty("ProviderName", text("SELProvider"));
    i.setProperty("UniqueSystemID",
                  text("00000000-0000-0000-0000-000000000000"));
    return i;
}

} // namespace

std::vector<host::Instance> expectedIndications()
{
    const std::string restartEvent = "ZANx_AutomaticServerRestartEvent";
    return {
        indication("ZAN_MgmtHwLogEntryEvent", entryPath()),
        indication("ZAN_MgmtHwLogClearEvent", logPath()),
        indication("ZAN_MgmtHwLogFullEvent", logPath()),
        // The restart event names its own class.
        indication(restartEvent, pathOf(restartEvent).toString()),
    };
}

} // namespace deploy
