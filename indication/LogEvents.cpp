#include "CmpiValues.h"
#include "IndicationBuilding.h"
#include "IndicationTrace.h"
#include "Instrumentation.h"
#include "SELIndication.h"

#include <cstdint>

namespace QX::SELComposite
{

using namespace indication;

namespace
{

// Spelt with two letters swapped in the log events' keys and identifiers;
// object managers and consoles match on it as it is.
constexpr const char* logEventLogName = "IMPI SEL Log";

/** The log's own path as the alerting element of a log event; null after
 *  tracing the failure when it cannot be made. */
CMPIObjectPath* newLogElementPath(const CMPIBroker* broker,
                                  const char* function)
{
    CMPIObjectPath* const element =
        newAlertingElementPath(broker, "ZAN_MgmtHwLog", function);
    if (element == nullptr)
    {
        return nullptr;
    }
    keepNamespaceAndSetHost(element);
    addTextKey(element, "CreationClassName", "ZAN_MgmtHwLog");
    addTextKey(element, "Name", logEventLogName);
    return element;
}

/** "AlertingManagedElement": the string form of the log's path. */
void setAlertingElement(CMPIInstance* instance, const CMPIObjectPath* element)
{
    const std::string elementText = pathText(element);
    setTextProperty(instance, "AlertingManagedElement", elementText.c_str());
}

std::uint16_t fullSeverity(const std::string& condition)
{
    if (condition == "Critical")
    {
        return 6;
    }
    return condition == "Warning" ? 3 : 2;
}

int fullPercentage(const std::string& condition)
{
    if (condition == "Critical")
    {
        return 100;
    }
    return condition == "Warning" ? 75 : 0;
}

} // namespace

bool getLogInstrumentation(std::string nodePath, std::string& logPath,
                           std::string& condition)
{
    constexpr const char* function = "getLogInstrumentation";
    return walkInstrumentation(
        function,
        [&](Instrumentation& node)
        {
            node.selectNode(NodeLexicon::ManagementController);
            if (!node)
            {
                return false;
            }
            logPath = node.convertPathToString(nodePath);
            static_cast<void>(node.getPathToParentNode());
            const std::string controllerPath = node.getPathToNode();
            node.selectNode(NodeLexicon::EventLog);
            if (!node)
            {
                return false;
            }
            node.setFilter(NodeLexicon::Parent, controllerPath);
            if (node.getPathToNode() != nodePath)
            {
                return false;
            }
            const unsigned status = node.getNodeStatus();
            traceVariable(function, __LINE__, "newStatus", status);
            if (status == NodeLexicon::EventLogStatusAlmostFull)
            {
                condition = "Warning";
                return true;
            }
            if (status == NodeLexicon::EventLogStatusFull)
            {
                condition = "Critical";
                return true;
            }
            if (status != NodeLexicon::EventLogStatusCleared)
            {
                return false;
            }
            bool empty = false;
            if (!node.getProperty(NodeLexicon::IsEmpty, empty))
            {
                traceMessage(function, __LINE__, LOG_LEVEL_FAILURE,
                             "Failed while reading Empty property.");
                return false;
            }
            traceVariable(function, __LINE__, "empty",
                          static_cast<unsigned>(empty));
            if (empty)
            {
                condition = "IsEmpty";
            }
            return empty;
        });
}

CMPIInstance* createLogClearIndicationInstance(std::string logPath,
                                               DateTime time)
{
    constexpr const char* function = "createLogClearIndicationInstance";
    return buildEvent(
        function, LOG_CLEAR_EVENT_CLASS, nullptr, time,
        [&](const CMPIBroker* broker, CMPIInstance* instance,
            CMPIDateTime* alertTime)
        {
            setTextProperty(instance, "IndicationIdentifier", logEventLogName);
            const std::string eventId = "Log Clear Event: " + logPath;
            setTextProperty(instance, "EventID", eventId.c_str());
            CMPIObjectPath* const element = newLogElementPath(broker, function);
            if (element == nullptr)
            {
                return false;
            }
            setAlertingElement(instance, element);
            setAlertTimes(instance, alertTime);
            setNoCorrelatedIndications(broker, instance);
            setTypedProperty(instance, "PerceivedSeverity", std::uint16_t{2});
            // Only the entry and the full events note "Before NLS".
            setMessage(instance, localizedMessage(L"MSGID_SEL_LOG_CLEARED"));
            setAlertTail(instance, 5);
            return true;
        });
}

CMPIInstance* createLogFullIndicationInstance(std::string logPath,
                                              DateTime time,
                                              std::string condition)
{
    constexpr const char* function = "createLogFullIndicationInstance";
    return buildEvent(
        function, LOG_FULL_EVENT_CLASS, nullptr, time,
        [&](const CMPIBroker* broker, CMPIInstance* instance,
            CMPIDateTime* alertTime)
        {
            const std::string identifier = "IMPI SEL Log Full : " + logPath;
            setTextProperty(instance, "IndicationIdentifier",
                            identifier.c_str());
            const std::string eventId =
                "IPMI Log Full " + condition + " Event" + " : " + logPath;
            setTextProperty(instance, "EventID", eventId.c_str());
            traceMessage(function, __LINE__, LOG_LEVEL_PROVIDER,
                         "Before creatin objectPAth for LOG class");
            CMPIObjectPath* const element = newLogElementPath(broker, function);
            if (element == nullptr)
            {
                return false;
            }
            traceMessage(function, __LINE__, LOG_LEVEL_PROVIDER,
                         "success creatin objectPAth for LOG class");
            setAlertingElement(instance, element);
            setAlertTimes(instance, alertTime);
            setNoCorrelatedIndications(broker, instance);
            setTypedProperty(instance, "PerceivedSeverity",
                             fullSeverity(condition));
            traceMessage(function, __LINE__, LOG_LEVEL_PROVIDER, "Before NLS");
            setMessage(instance, localizedMessage(L"MSGID_SEL_LOG_FULL",
                                                  fullPercentage(condition)));
            setAlertTail(instance, 3);
            return true;
        });
}

} // namespace QX::SELComposite
