#include "CmpiValues.h"
#include "IndicationBuilding.h"
#include "IndicationTrace.h"
#include "Instrumentation.h"
#include "SELIndication.h"

#include <cstdint>
#include <sstream>

namespace QX::SELComposite
{

using namespace indication;

bool getLogEntryInstrumentation(std::string nodePath, std::string& description,
                                bool& isSelEntry, std::string& recordId)
{
    constexpr const char* function = "getLogEntryInstrumentation";
    return walkInstrumentation(
        function,
        [&](Instrumentation& node)
        {
            node.selectNode(nodePath);
            if (!node)
            {
                return false;
            }
            const std::string parentPath = node.getPathToParentNode();
            description = node.getNodeDescription();
            unsigned int id = 0;
            node.getProperty(NodeLexicon::RecordId, id);
            traceVariable(function, __LINE__, "Id", id);
            std::ostringstream digits;
            digits << id;
            recordId = digits.str();
            node.selectNode(NodeLexicon::ManagementController);
            if (!node)
            {
                return false;
            }
            const std::string controllerPath = node.getPathToNode();
            node.selectNode(NodeLexicon::EventLog);
            if (!node)
            {
                return false;
            }
            node.setFilter(NodeLexicon::Parent, controllerPath);
            if (node.getPathToNode() != parentPath)
            {
                return false;
            }
            isSelEntry = true;
            return true;
        });
}

CMPIInstance* createLogEntryIndicationInstance(std::string description,
                                               DateTime time,
                                               std::string recordId)
{
    constexpr const char* function = "createLogEntryIndicationInstance";
    return buildEvent(
        function, LOG_ENTRY_EVENT_CLASS, nullptr, time,
        [&](const CMPIBroker* broker, CMPIInstance* instance,
            CMPIDateTime* alertTime)
        {
            setTextProperty(instance, "IndicationIdentifier",
                            description.c_str());
            const std::string eventId =
                "LogEntry Creation Event: " + description;
            setTextProperty(instance, "EventID", eventId.c_str());
            setAlertTimes(instance, alertTime);

            CMPIObjectPath* const element =
                newAlertingElementPath(broker, "ZAN_MgmtHwLogEntry", function);
            if (element == nullptr)
            {
                return false;
            }
            traceMessage(
                function, __LINE__, LOG_LEVEL_PROGRESS,
                "Success to create ObjectPath for Alerting Managed Element");
            keepNamespaceAndSetHost(element);
            addTextKey(element, "LogCreationClassName", "ZAN_MgmtHwLog");
            addTextKey(element, "CreationClassName", "ZAN_MgmtHwLogEntry");
            addTextKey(element, "LogName", "IPMI SEL Log");
            addTextKey(element, "RecordID", recordId.c_str());
            CMPIValue timestamp{};
            timestamp.dateTime = alertTime;
            element->ft->addKey(element, "MessageTimestamp", &timestamp,
                                CMPI_dateTime);
            const std::string elementText = pathText(element);
            setTextProperty(instance, "AlertingManagedElement",
                            elementText.c_str());

            setNoCorrelatedIndications(broker, instance);
            traceMessage(function, __LINE__, LOG_LEVEL_PROGRESS, "Before NLS");
            setMessage(instance, localizedMessage(L"MSGID_SEL_PROBABLE_CAUSE"));
            setTypedProperty(instance, "PerceivedSeverity", std::uint16_t{2});
            setAlertTail(instance, 4);
            return true;
        });
}

} // namespace QX::SELComposite
