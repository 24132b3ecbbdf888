#include "CmpiValues.h"
#include "IndicationBuilding.h"
#include "IndicationTrace.h"
#include "Instrumentation.h"
#include "SELIndication.h"

#include <cstdint>
#include <exception>
#include <iostream>

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
    traceEntry(function, __LINE__);
    bool found = false;
    try
    {
        Instrumentation node;
        node.selectNode(NodeLexicon::ManagementController);
        if (node)
        {
            logPath = node.convertPathToString(nodePath);
            static_cast<void>(node.getPathToParentNode());
            const std::string controllerPath = node.getPathToNode();
            node.selectNode(NodeLexicon::EventLog);
            if (node)
            {
                node.setFilter(NodeLexicon::Parent, controllerPath);
                if (node.getPathToNode() == nodePath)
                {
                    const unsigned status = node.getNodeStatus();
                    traceVariable(function, __LINE__, "newStatus", status);
                    if (status == NodeLexicon::EventLogStatusAlmostFull)
                    {
                        condition = "Warning";
                        found = true;
                    }
                    else if (status == NodeLexicon::EventLogStatusFull)
                    {
                        condition = "Critical";
                        found = true;
                    }
                    else if (status == NodeLexicon::EventLogStatusCleared)
                    {
                        bool empty = false;
                        if (!node.getProperty(NodeLexicon::IsEmpty, empty))
                        {
                            traceMessage(function, __LINE__, LOG_LEVEL_FAILURE,
                                         "Failed while reading Empty "
                                         "property.");
                        }
                        else
                        {
                            traceVariable(function, __LINE__, "empty",
                                          static_cast<unsigned>(empty));
                            if (empty)
                            {
                                condition = "IsEmpty";
                                found = true;
                            }
                        }
                    }
                }
            }
        }
    }
    catch (const std::exception& error)
    {
        std::cerr << error.what() << std::endl;
        found = false;
    }
    traceExit(function, __LINE__);
    return found;
}

CMPIInstance* createLogClearIndicationInstance(std::string logPath,
                                               DateTime time)
{
    constexpr const char* function = "createLogClearIndicationInstance";
    traceEntry(function, __LINE__);
    const CMPIBroker* const broker = _alertSELBroker.load();
    CMPIInstance* instance =
        broker != nullptr
            ? newEventInstance(broker, LOG_CLEAR_EVENT_CLASS, function, nullptr)
            : nullptr;
    if (!isUsable(instance))
    {
        traceExit(function, __LINE__);
        return instance;
    }
    CMPIDateTime* const alertTime = newAlertTime(broker, time);
    setTextProperty(instance, "IndicationIdentifier", logEventLogName);
    const std::string eventId = "Log Clear Event: " + logPath;
    setTextProperty(instance, "EventID", eventId.c_str());
    CMPIObjectPath* const element = newLogElementPath(broker, function);
    if (element == nullptr)
    {
        traceExit(function, __LINE__);
        return nullptr;
    }
    const std::string elementText = pathText(element);
    setTextProperty(instance, "AlertingManagedElement", elementText.c_str());
    setTypedProperty(instance, "IndicationTime", alertTime);
    setTypedProperty(instance, "EventTime", alertTime);
    setNoCorrelatedIndications(broker, instance);
    setTypedProperty(instance, "PerceivedSeverity", std::uint16_t{2});
    traceMessage(function, __LINE__, LOG_LEVEL_PROVIDER, "Before NLS");
    const std::string message = localizedMessage(L"MSGID_SEL_LOG_CLEARED");
    setTextProperty(instance, "Message", message.c_str());
    setTextProperty(instance, "Description", message.c_str());
    setTypedProperty(instance, "AlertingElementFormat", std::uint16_t{2});
    setTypedProperty(instance, "AlertType", std::uint16_t{5});
    setTypedProperty(instance, "ProbableCause", std::uint16_t{1});
    setCommonTail(instance);
    traceExit(function, __LINE__);
    return instance;
}

CMPIInstance* createLogFullIndicationInstance(std::string logPath,
                                              DateTime time,
                                              std::string condition)
{
    constexpr const char* function = "createLogFullIndicationInstance";
    traceEntry(function, __LINE__);
    const CMPIBroker* const broker = _alertSELBroker.load();
    CMPIInstance* instance =
        broker != nullptr
            ? newEventInstance(broker, LOG_FULL_EVENT_CLASS, function, nullptr)
            : nullptr;
    if (!isUsable(instance))
    {
        traceExit(function, __LINE__);
        return instance;
    }
    CMPIDateTime* const alertTime = newAlertTime(broker, time);
    const std::string identifier = "IMPI SEL Log Full : " + logPath;
    setTextProperty(instance, "IndicationIdentifier", identifier.c_str());
    const std::string eventId =
        "IPMI Log Full " + condition + " Event" + " : " + logPath;
    setTextProperty(instance, "EventID", eventId.c_str());
    traceMessage(function, __LINE__, LOG_LEVEL_PROVIDER,
                 "Before creatin objectPAth for LOG class");
    CMPIObjectPath* const element = newLogElementPath(broker, function);
    if (element == nullptr)
    {
        traceExit(function, __LINE__);
        return nullptr;
    }
    traceMessage(function, __LINE__, LOG_LEVEL_PROVIDER,
                 "success creatin objectPAth for LOG class");
    const std::string elementText = pathText(element);
    setTextProperty(instance, "AlertingManagedElement", elementText.c_str());
    setTypedProperty(instance, "IndicationTime", alertTime);
    setTypedProperty(instance, "EventTime", alertTime);
    setNoCorrelatedIndications(broker, instance);
    setTypedProperty(instance, "PerceivedSeverity", fullSeverity(condition));
    traceMessage(function, __LINE__, LOG_LEVEL_PROVIDER, "Before NLS");
    const std::string message =
        localizedMessage(L"MSGID_SEL_LOG_FULL", fullPercentage(condition));
    setTextProperty(instance, "Message", message.c_str());
    setTextProperty(instance, "Description", message.c_str());
    setTypedProperty(instance, "AlertingElementFormat", std::uint16_t{2});
    setTypedProperty(instance, "AlertType", std::uint16_t{3});
    setTypedProperty(instance, "ProbableCause", std::uint16_t{1});
    setCommonTail(instance);
    traceExit(function, __LINE__);
    return instance;
}

} // namespace QX::SELComposite
