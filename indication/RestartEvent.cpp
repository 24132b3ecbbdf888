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

/** RestartCause value of a restart by the hardware watchdog. */
constexpr unsigned watchdogRestartCause = 4;

} // namespace

bool getAutoServerInstrumentation(std::string nodePath, std::string& logPath,
                                  std::string& restartCause)
{
    constexpr const char* function = "getAutoServerInstrumentation";
    traceEntry(function, __LINE__);
    bool found = false;
    try
    {
        Instrumentation node;
        node.selectNode(nodePath);
        if (node)
        {
            logPath = node.convertPathToString(nodePath);
            static_cast<void>(node.getNodeStatus());
            found = true;
            unsigned int cause = 0;
            if (node.getProperty(NodeLexicon::RestartCause, cause))
            {
                restartCause =
                    cause == watchdogRestartCause ? "Watchdog" : "Other";
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

CMPIInstance*
createAutoServerRestartIndicationInstance(std::string logPath, DateTime time,
                                          std::string restartCause)
{
    constexpr const char* function =
        "createAutoServerRestartIndicationInstance";
    traceEntry(function, __LINE__);
    const CMPIBroker* const broker = _alertSELBroker.load();
    CMPIObjectPath* eventPath = nullptr;
    CMPIInstance* instance =
        broker != nullptr ? newEventInstance(broker, SERVER_RESTART_EVENT_CLASS,
                                             function, &eventPath)
                          : nullptr;
    if (!isUsable(instance))
    {
        traceExit(function, __LINE__);
        return instance;
    }
    CMPIDateTime* const alertTime = newAlertTime(broker, time);
    // Swapped letters and no blank after the colon, as consoles know it.
    const std::string identifier = "IMPI SEL Log:" + logPath;
    setTextProperty(instance, "IndicationIdentifier", identifier.c_str());
    const std::string eventId = "AutoServerRestart Event : " + logPath;
    setTextProperty(instance, "EventID", eventId.c_str());
    // The event names itself as the alerting element.
    const std::string elementText = pathText(eventPath);
    setTextProperty(instance, "AlertingManagedElement", elementText.c_str());
    setTypedProperty(instance, "IndicationTime", alertTime);
    setTypedProperty(instance, "EventTime", alertTime);
    setNoCorrelatedIndications(broker, instance);
    const bool byWatchdog = restartCause == "Watchdog";
    const std::string message = localizedMessage(
        byWatchdog ? L"MSGID_SP_WATCHDOG_ALRT" : L"MSGID_SP_WATCHDOG_NORMAL");
    setTextProperty(instance, "Message", message.c_str());
    setTextProperty(instance, "Description", message.c_str());
    setTypedProperty(
        instance, "PerceivedSeverity",
        std::uint16_t{byWatchdog ? std::uint16_t{4} : std::uint16_t{2}});
    setTypedProperty(instance, "AlertingElementFormat", std::uint16_t{2});
    setTypedProperty(instance, "AlertType", std::uint16_t{3});
    setTypedProperty(instance, "ProbableCause", std::uint16_t{1});
    setCommonTail(instance);
    traceExit(function, __LINE__);
    return instance;
}

} // namespace QX::SELComposite
