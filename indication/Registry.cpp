#include "Indication.h"
#include "IndicationTrace.h"
#include "SELIndication.h"

#include <cstring>

namespace QX::SELComposite
{

using namespace indication;

namespace
{

struct IndicationClass
{
    const char* name;
    unsigned short id;
};

// In the order names are compared.
constexpr IndicationClass indicationClasses[] = {
    {SERVER_RESTART_EVENT_CLASS, SERVER_RESTART_INDICATION_ID},
    {LOG_CLEAR_EVENT_CLASS, LOG_CLEAR_INDICATION_ID},
    {LOG_ENTRY_EVENT_CLASS, LOG_ENTRY_INDICATION_ID},
    {LOG_FULL_EVENT_CLASS, LOG_FULL_INDICATION_ID},
};

/** The counter minus 1, except that 0 becomes 1: unsubscribing alone never
 *  brings a counter to 0, and a counter at 0 wraps to 4294967295. */
void countOneLess(std::atomic<std::uint32_t>& counter)
{
    std::uint32_t current = counter.load();
    std::uint32_t next = 0;
    do
    {
        next = current - 1;
        if (next == 0)
        {
            next = 1;
        }
    } while (!counter.compare_exchange_weak(current, next));
}

/** Sets @p counter from 1 to 0; false when it held another value. */
bool takeLastSubscriber(std::atomic<std::uint32_t>& counter)
{
    std::uint32_t expected = 1;
    return counter.compare_exchange_strong(expected, 0);
}

} // namespace

bool getSELIndicationId(const char* className, unsigned short& id)
{
    constexpr const char* function = "getSELIndicationId";
    traceEntry(function, __LINE__);
    id = UNKNOWN_INDICATION_ID;
    if (className != nullptr)
    {
        for (const IndicationClass& candidate : indicationClasses)
        {
            if (std::strcmp(className, candidate.name) == 0)
            {
                id = candidate.id;
                break;
            }
        }
    }
    traceExit(function, __LINE__);
    return id != UNKNOWN_INDICATION_ID;
}

void saveSELIndicationContext(const CMPIBroker* broker,
                              const CMPIContext* context)
{
    constexpr const char* function = "saveSELIndicationContext";
    traceEntry(function, __LINE__);
    _alertSELBroker.store(broker);
    _alertSELContext.store(context);
    _alertSELContextAvailable.store(true);
    traceExit(function, __LINE__);
}

void clearSELIndicationContext()
{
    constexpr const char* function = "clearSELIndicationContext";
    traceEntry(function, __LINE__);
    _alertSELBroker.store(nullptr);
    _alertSELContext.store(nullptr);
    _alertSELContextAvailable.store(false);
    traceExit(function, __LINE__);
}

void subscribeForSELIndication(unsigned int id)
{
    constexpr const char* function = "subscribeForSELIndication";
    traceEntry(function, __LINE__);
    switch (id)
    {
        case LOG_CLEAR_INDICATION_ID:
        {
            const std::uint32_t now = ++subscriberCountLogClearIndication;
            traceVariable(function, __LINE__,
                          "subscriberCountLogClearIndication", now);
            if (now == 1 && subscriberCountLogFullIndication.load() == 0)
            {
                indicationWatches.start(NodeLexicon::EventLog,
                                        &LogAlertHandler);
            }
            break;
        }
        case SERVER_RESTART_INDICATION_ID:
            if (++subscriberCountServerIndication == 1)
            {
                indicationWatches.start(NodeLexicon::Watchdog,
                                        &AutoServerRestartAlertHandler);
            }
            break;
        case LOG_ENTRY_INDICATION_ID:
            if (++subscriberCountLogEntryIndication == 1)
            {
                indicationWatches.start(NodeLexicon::EventLogEntry,
                                        &LogEntryAlertHandler);
            }
            break;
        case LOG_FULL_INDICATION_ID:
            if (++subscriberCountLogFullIndication == 1 &&
                subscriberCountLogClearIndication.load() == 0)
            {
                indicationWatches.start(NodeLexicon::EventLog,
                                        &LogAlertHandler);
            }
            break;
        default:
            break;
    }
    traceExit(function, __LINE__);
}

void unsubscribeForSELIndication(unsigned int id)
{
    constexpr const char* function = "unsubscribeForSELIndication";
    traceEntry(function, __LINE__);
    switch (id)
    {
        case SERVER_RESTART_INDICATION_ID:
            countOneLess(subscriberCountServerIndication);
            break;
        case LOG_CLEAR_INDICATION_ID:
            countOneLess(subscriberCountLogClearIndication);
            break;
        case LOG_ENTRY_INDICATION_ID:
            countOneLess(subscriberCountLogEntryIndication);
            break;
        case LOG_FULL_INDICATION_ID:
            countOneLess(subscriberCountLogFullIndication);
            break;
        default:
            break;
    }
    if (subscriberCountLogFullIndication.load() == 0 &&
        subscriberCountLogEntryIndication.load() == 0 &&
        subscriberCountLogClearIndication.load() == 0 &&
        subscriberCountServerIndication.load() == 0)
    {
        clearSELIndicationContext();
    }
    traceExit(function, __LINE__);
}

void setSELEnable()
{
    constexpr const char* function = "setSELEnable";
    traceEntry(function, __LINE__);
    _enabledSEL.store(true);
    traceVariable(function, __LINE__, "_enabledSEL",
                  static_cast<unsigned>(_enabledSEL.load()));
    traceExit(function, __LINE__);
}

void disableSELIndication()
{
    constexpr const char* function = "disableSELIndication";
    traceEntry(function, __LINE__);
    _enabledSEL.store(false);
    if (takeLastSubscriber(subscriberCountServerIndication))
    {
        indicationWatches.stop(NodeLexicon::Watchdog,
                               &AutoServerRestartAlertHandler);
    }
    if (takeLastSubscriber(subscriberCountLogEntryIndication))
    {
        indicationWatches.stop(NodeLexicon::EventLogEntry,
                               &LogEntryAlertHandler);
    }
    if (subscriberCountLogFullIndication.load() == 1 ||
        subscriberCountLogClearIndication.load() == 1)
    {
        // Only the log full counter goes down, whichever of the two was 1.
        --subscriberCountLogFullIndication;
        indicationWatches.stop(NodeLexicon::EventLog, &LogAlertHandler);
    }
    traceExit(function, __LINE__);
}

} // namespace QX::SELComposite
