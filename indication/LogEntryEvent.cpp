#include "CmpiValues.h"
#include "IndicationBuilding.h"
#include "IndicationTrace.h"
#include "Instrumentation.h"
#include "SELIndication.h"

#include <cstdint>
#include <exception>
#include <iostream>
#include <sstream>

namespace QX::SELComposite
{

using namespace indication;

bool getLogEntryInstrumentation(std::string nodePath, std::string& description,
                                bool& isSelEntry, std::string& recordId)
{
    constexpr const char* function = "getLogEntryInstrumentation";
    traceEntry(function, __LINE__);
    bool found = false;
    try
    {
        Instrumentation node;
        node.selectNode(nodePath);
        if (node)
        {
            const std::string parentPath = node.getPathToParentNode();
            description = node.getNodeDescription();
            unsigned int id = 0;
            node.getProperty(NodeLexicon::RecordId, id);
            traceVariable(function, __LINE__, "Id", id);
            std::ostringstream digits;
            digits << id;
            recordId = digits.str();
            node.selectNode(NodeLexicon::ManagementController);
            if (node)
            {
                const std::string controllerPath = node.getPathToNode();
                node.selectNode(NodeLexicon::EventLog);
                if (node)
                {
                    node.setFilter(NodeLexicon::Parent, controllerPath);
                    if (node.getPathToNode() == parentPath)
                    {
                        isSelEntry = true;
                        found = true;
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

CMPIInstance* createLogEntryIndicationInstance(std::string description,
                                               DateTime time,
                                               std::string recordId)
{
    constexpr const char* function = "createLogEntryIndicationInstance";
    traceEntry(function, __LINE__);
    const CMPIBroker* const broker = _alertSELBroker.load();
    CMPIInstance* instance =
        broker != nullptr
            ? newEventInstance(broker, LOG_ENTRY_EVENT_CLASS, function, nullptr)
            : nullptr;
    if (!isUsable(instance))
    {
        traceExit(function, __LINE__);
        return instance;
    }
    CMPIDateTime* const alertTime = newAlertTime(broker, time);
    setTextProperty(instance, "IndicationIdentifier", description.c_str());
    const std::string eventId = "LogEntry Creation Event: " + description;
    setTextProperty(instance, "EventID", eventId.c_str());
    setTypedProperty(instance, "IndicationTime", alertTime);
    setTypedProperty(instance, "EventTime", alertTime);

    CMPIObjectPath* const element =
        newAlertingElementPath(broker, "ZAN_MgmtHwLogEntry", function);
    if (element == nullptr)
    {
        traceExit(function, __LINE__);
        return nullptr;
    }
    traceMessage(function, __LINE__, LOG_LEVEL_PROGRESS,
                 "Success to create ObjectPath for Alerting Managed Element");
    keepNamespaceAndSetHost(element);
    addTextKey(element, "LogCreationClassName", "ZAN_MgmtHwLog");
    addTextKey(element, "CreationClassName", "ZAN_MgmtHwLogEntry");
    addTextKey(element, "LogName", "IPMI SEL Log");
    addTextKey(element, "RecordID", recordId.c_str());
    CMPIValue timestamp{};
    timestamp.dateTime = alertTime;
    element->ft->addKey(element, "MessageTimestamp", &timestamp, CMPI_dateTime);
    const std::string elementText = pathText(element);
    setTextProperty(instance, "AlertingManagedElement", elementText.c_str());

    setNoCorrelatedIndications(broker, instance);
    traceMessage(function, __LINE__, LOG_LEVEL_PROGRESS, "Before NLS");
    const std::string message = localizedMessage(L"MSGID_SEL_PROBABLE_CAUSE");
    setTextProperty(instance, "Message", message.c_str());
    setTextProperty(instance, "Description", message.c_str());
    setTypedProperty(instance, "PerceivedSeverity", std::uint16_t{2});
    setTypedProperty(instance, "AlertingElementFormat", std::uint16_t{2});
    setTypedProperty(instance, "AlertType", std::uint16_t{4});
    setTypedProperty(instance, "ProbableCause", std::uint16_t{1});
    setCommonTail(instance);
    traceExit(function, __LINE__);
    return instance;
}

} // namespace QX::SELComposite
