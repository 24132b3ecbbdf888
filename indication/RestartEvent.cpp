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

/** RestartCause value of a restart by the hardware watchdog. */
constexpr unsigned watchdogRestartCause = 4;

} // namespace

bool getAutoServerInstrumentation(std::string nodePath, std::string& logPath,
                                  std::string& restartCause)
{
    return walkInstrumentation(
        "getAutoServerInstrumentation",
        [&](Instrumentation& node)
        {
            node.selectNode(nodePath);
            if (!node)
            {
                return false;
            }
            logPath = node.convertPathToString(nodePath);
            static_cast<void>(node.getNodeStatus());
            unsigned int cause = 0;
            if (node.getProperty(NodeLexicon::RestartCause, cause))
            {
                restartCause =
                    cause == watchdogRestartCause ? "Watchdog" : "Other";
            }
            return true;
        });
}

CMPIInstance*
createAutoServerRestartIndicationInstance(std::string logPath, DateTime time,
                                          std::string restartCause)
{
    constexpr const char* function =
        "createAutoServerRestartIndicationInstance";
    CMPIObjectPath* eventPath = nullptr;
    return buildEvent(
        function, SERVER_RESTART_EVENT_CLASS, &eventPath, time,
        [&](const CMPIBroker* broker, CMPIInstance* instance,
            CMPIDateTime* alertTime)
        {
            // Swapped letters, no blank after the colon: as consoles know it.
            const std::string identifier = "IMPI SEL Log:" + logPath;
            setTextProperty(instance, "IndicationIdentifier",
                            identifier.c_str());
            const std::string eventId = "AutoServerRestart Event : " + logPath;
            setTextProperty(instance, "EventID", eventId.c_str());
            // The event names itself as the alerting element.
            const std::string elementText = pathText(eventPath);
            setTextProperty(instance, "AlertingManagedElement",
                            elementText.c_str());
            setAlertTimes(instance, alertTime);
            setNoCorrelatedIndications(broker, instance);
            const bool byWatchdog = restartCause == "Watchdog";
            setMessage(instance, localizedMessage(
                                     byWatchdog ? L"MSGID_SP_WATCHDOG_ALRT"
                                                : L"MSGID_SP_WATCHDOG_NORMAL"));
            setTypedProperty(instance, "PerceivedSeverity",
                             std::uint16_t{byWatchdog ? std::uint16_t{4}
                                                      : std::uint16_t{2}});
            setAlertTail(instance, 3);
            return true;
        });
}

} // namespace QX::SELComposite
