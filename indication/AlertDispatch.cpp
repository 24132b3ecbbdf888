#include "CmpiValues.h"
#include "Indication.h"
#include "IndicationTrace.h"
#include "SELIndication.h"

#include <exception>
#include <iostream>

namespace QX::SELComposite
{

using namespace indication;

namespace
{

/** One kind of alert: the code its handler acts on, the thread body it
 *  starts and where that thread's handle is kept. */
struct AlertChain
{
    const char* handlerName;
    unsigned code;
    void* (*threadBody)(void*);
    std::atomic<CMPI_THREAD_TYPE>* handle;
};

/** Writes what an exception says where a thread of ours ends it: on
 *  standard error and, as a failure, in the log. */
void reportEscaped(const char* function, const std::exception* error) noexcept
{
    try
    {
        const char* const what =
            error != nullptr ? error->what() : "unknown exception";
        std::cerr << what << std::endl;
        traceMessage(function, __LINE__, LOG_LEVEL_FAILURE, what);
    }
    catch (...)
    {
    }
}

/**
 * The record an alert handler holds in the hand-over, from filling it
 * until its delivery thread has delivered (or never started): the record
 * is let go when this goes, however the handler ends.
 */
class HeldRecord
{
  public:
    HeldRecord(const DateTime& time, const std::string& nodePath) :
        ticket_(indicationSELData.put(time, nodePath))
    {
    }
    ~HeldRecord()
    {
        indicationSELData.release(ticket_);
    }
    HeldRecord(const HeldRecord&) = delete;
    HeldRecord& operator=(const HeldRecord&) = delete;

    /** Waits (bounded) until its delivery thread has delivered. */
    void awaitDelivered() const
    {
        indicationSELData.awaitDelivered(ticket_);
    }

  private:
    AlertHandOver::Ticket ticket_;
};

/** Reports a delivery thread's alert delivered however its handler ends. */
class DeliveryReport
{
  public:
    explicit DeliveryReport(AlertHandOver::Ticket ticket) : ticket_(ticket) {}
    ~DeliveryReport()
    {
        indicationSELData.delivered(ticket_);
    }
    DeliveryReport(const DeliveryReport&) = delete;
    DeliveryReport& operator=(const DeliveryReport&) = delete;

  private:
    AlertHandOver::Ticket ticket_;
};

/** Hands the alert to a new detached thread started through the saved
 *  broker, from this thread attached to a context prepared for it. */
void startDeliveryThread(const AlertChain& chain, const DateTime& time,
                         const std::string& nodePath)
{
    const CMPIBroker* const broker = _alertSELBroker.load();
    const CMPIContext* const saved = _alertSELContext.load();
    if (broker == nullptr)
    {
        // Nothing saved to reach the object manager through.
        return;
    }
    const HeldRecord held(time, nodePath);
    // A broker dereferences the context it is given: never hand it null.
    CMPIContext* const context =
        saved != nullptr ? broker->bft->prepareAttachThread(broker, saved)
                         : nullptr;
    if (context != nullptr)
    {
        broker->bft->attachThread(broker, context);
    }
    CMPI_THREAD_TYPE handle = nullptr;
    if (indicationActivity.threadStarting())
    {
        handle = broker->xft != nullptr
                     ? broker->xft->newThread(chain.threadBody, nullptr, 1)
                     : nullptr;
        if (handle == nullptr)
        {
            indicationActivity.threadNotStarted();
        }
    }
    chain.handle->store(handle);
    if (context != nullptr)
    {
        broker->bft->detachThread(broker, context);
    }
    if (handle == nullptr)
    {
        traceMessage(chain.handlerName, __LINE__, LOG_LEVEL_FAILURE,
                     "Error creating thread");
        return;
    }
    // Alerts come one after another from the source's dispatcher thread:
    // waiting here for this delivery keeps the indications in that order.
    held.awaitDelivered();
}

void runAlertHandler(const AlertChain& chain, unsigned int alertCode,
                     const DateTime& time, const std::string& nodePath,
                     bool tracesAlert) noexcept
{
    try
    {
        const HandlerActivity activity(indicationActivity);
        traceEntry(chain.handlerName, __LINE__);
        if (tracesAlert)
        {
            traceVariable(chain.handlerName, __LINE__, "indicationClass",
                          alertCode);
            traceVariable(chain.handlerName, __LINE__, "_enabledSEL",
                          static_cast<unsigned>(_enabledSEL.load()));
        }
        if (_enabledSEL.load() && alertCode == chain.code)
        {
            startDeliveryThread(chain, time, nodePath);
        }
        traceExit(chain.handlerName, __LINE__);
    }
    catch (const std::exception& error)
    {
        reportEscaped(chain.handlerName, &error);
    }
    catch (...)
    {
        reportEscaped(chain.handlerName, nullptr);
    }
}

/** The body of every delivery thread: take the alert, deliver it, end. */
void runDeliveryThread(const char* name,
                       void (*deliveryHandler)(DateTime, std::string)) noexcept
{
    try
    {
        traceEntry(name, __LINE__);
        auto [record, ticket] = indicationSELData.take();
        {
            const DeliveryReport report(ticket);
            deliveryHandler(record.time, std::move(record.nodePath));
        }
        traceExit(name, __LINE__);
    }
    catch (const std::exception& error)
    {
        reportEscaped(name, &error);
    }
    catch (...)
    {
        reportEscaped(name, nullptr);
    }
    indicationActivity.threadFinishing();
}

void* ServerAlertThread(void*)
{
    runDeliveryThread("ServerAlertThread", &AutoServerRestartHandler);
    return nullptr;
}

void* LogEntryAlertThread(void*)
{
    runDeliveryThread("LogEntryAlertThread", &LogEntryHandler);
    return nullptr;
}

void* LogAlertThread(void*)
{
    runDeliveryThread("LogAlertThread", &LogHandler);
    return nullptr;
}

const AlertChain serverChain{"AutoServerRestartAlertHandler",
                             NodeLexicon::AlertOnWatchdog, &ServerAlertThread,
                             &ind_thread_id_server};
const AlertChain entryChain{"LogEntryAlertHandler",
                            NodeLexicon::AlertOnEventLogEntry,
                            &LogEntryAlertThread, &ind_thread_id_entry};
const AlertChain logChain{"LogAlertHandler", NodeLexicon::AlertOnEventLog,
                          &LogAlertThread, &ind_thread_id_log};

/** Before- and after-delivery lines of a delivery handler. */
struct DeliveryTexts
{
    const char* before;
    const char* after;
};

/**
 * Attaches this thread to a context prepared from the saved one, builds
 * the indication with @p build and delivers it into root/zanqx.
 */
template <typename Build>
void deliver(const char* function, const DeliveryTexts& texts, Build build)
{
    const CMPIBroker* const broker = _alertSELBroker.load();
    const CMPIContext* const saved = _alertSELContext.load();
    if (broker == nullptr || saved == nullptr)
    {
        return;
    }
    CMPIContext* const context =
        broker->bft->prepareAttachThread(broker, saved);
    if (context == nullptr)
    {
        return;
    }
    const CMPIStatus attached = broker->bft->attachThread(broker, context);
    if (attached.rc != CMPI_RC_OK)
    {
        return;
    }
    CMPIInstance* const instance = build();
    if (isUsable(instance))
    {
        traceMessage(function, __LINE__, LOG_LEVEL_PROVIDER, texts.before);
        const CMPIStatus delivered = broker->bft->deliverIndication(
            broker, context, INDICATION_NAMESPACE, instance);
        if (delivered.rc != CMPI_RC_OK)
        {
            constexpr const char* notSent = "Could not send the Indication";
            const CMPIStatus failure{
                CMPI_RC_ERR_FAILED,
                broker->eft->newString(broker, notSent, nullptr)};
            static_cast<void>(failure); // reported on the broker's trace
            broker->eft->trace(broker, CMPI_LEV_INFO, "SELProvider", notSent,
                               nullptr);
        }
        traceMessage(function, __LINE__, LOG_LEVEL_PROVIDER, texts.after);
    }
    broker->bft->detachThread(broker, context);
}

} // namespace

void AutoServerRestartAlertHandler(unsigned int alertCode, DateTime time,
                                   std::string nodePath, const void*)
{
    runAlertHandler(serverChain, alertCode, time, nodePath, false);
}

void LogEntryAlertHandler(unsigned int alertCode, DateTime time,
                          std::string nodePath, const void*)
{
    runAlertHandler(entryChain, alertCode, time, nodePath, false);
}

void LogAlertHandler(unsigned int alertCode, DateTime time,
                     std::string nodePath, const void*)
{
    runAlertHandler(logChain, alertCode, time, nodePath, true);
}

void AutoServerRestartHandler(DateTime time, std::string nodePath)
{
    constexpr const char* function = "AutoServerRestartHandler";
    traceEntry(function, __LINE__);
    std::string logPath;
    std::string restartCause;
    if (getAutoServerInstrumentation(nodePath, logPath, restartCause) &&
        _alertSELContextAvailable.load())
    {
        deliver(function,
                {"AutoServerRestartHandler : Calling CB Deliver Indication ",
                 "AutoServerRestartHandler : CB Deliver Indication done"},
                [&]
                {
                    return createAutoServerRestartIndicationInstance(
                        logPath, time, restartCause);
                });
    }
    traceExit(function, __LINE__);
}

void LogEntryHandler(DateTime time, std::string nodePath)
{
    constexpr const char* function = "LogEntryHandler";
    traceEntry(function, __LINE__);
    std::string description;
    bool isSelEntry = false;
    std::string recordId;
    if (getLogEntryInstrumentation(nodePath, description, isSelEntry,
                                   recordId) &&
        _alertSELContextAvailable.load() && isSelEntry)
    {
        deliver(function,
                {"LogEntryHandler : Calling CB Deliver Indication ",
                 "LogEntryHandler : CB Deliver Indication done"},
                [&] {
                    return createLogEntryIndicationInstance(description, time,
                                                            recordId);
                });
    }
    traceExit(function, __LINE__);
}

void LogHandler(DateTime time, std::string nodePath)
{
    handleLogAlert(time, std::move(nodePath), &getLogInstrumentation);
}

void handleLogAlert(DateTime time, std::string nodePath, LogReader read)
{
    constexpr const char* function = "LogHandler";
    traceEntry(function, __LINE__);
    std::string logPath;
    std::string condition;
    if (read(nodePath, logPath, condition))
    {
        traceVariable(function, __LINE__, "message", condition.c_str());
        if (_alertSELContextAvailable.load())
        {
            deliver(function,
                    {"LogHandler : Calling CB Deliver Indication ",
                     "LogHandler : CB Deliver Indication done"},
                    [&]
                    {
                        return condition == "IsEmpty"
                                   ? createLogClearIndicationInstance(logPath,
                                                                      time)
                                   : createLogFullIndicationInstance(
                                         logPath, time, condition);
                    });
        }
    }
    traceExit(function, __LINE__);
}

} // namespace QX::SELComposite
