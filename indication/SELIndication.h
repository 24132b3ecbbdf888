#pragma once

#include "AlertHandOver.h"
#include "DateTime.h"

#include <cmpidt.h>
#include <cmpift.h>

#include <atomic>
#include <chrono>
#include <cstdint>
#include <string>
#include <string_view>

namespace QX::SELComposite
{

/** Logger component of the indication code. A constant, not a string object:
 * threads still tracing while the library's statics are destroyed read it. */
inline constexpr std::string_view loggerSELIndication = "Corvane.SELProvider";

/** The namespace indications are delivered into. */
constexpr const char* INDICATION_NAMESPACE = "root/zanqx";

/** The indication classes and their ids; 15 stands for any other name. */
constexpr const char* SERVER_RESTART_EVENT_CLASS =
    "ZANx_AutomaticServerRestartEvent";
constexpr const char* LOG_CLEAR_EVENT_CLASS = "ZAN_MgmtHwLogClearEvent";
constexpr const char* LOG_ENTRY_EVENT_CLASS = "ZAN_MgmtHwLogEntryEvent";
constexpr const char* LOG_FULL_EVENT_CLASS = "ZAN_MgmtHwLogFullEvent";
constexpr unsigned short SERVER_RESTART_INDICATION_ID = 2;
constexpr unsigned short LOG_CLEAR_INDICATION_ID = 3;
constexpr unsigned short LOG_ENTRY_INDICATION_ID = 4;
constexpr unsigned short LOG_FULL_INDICATION_ID = 5;
constexpr unsigned short UNKNOWN_INDICATION_ID = 15;

// The shared indication state. Every value but the hand-over record is an
// atomic: the object manager's threads, the instrumentation's monitoring
// threads and the delivery threads all read and write it without a lock.
// The record keeps its own lock (AlertHandOver).

extern std::atomic<std::uint32_t> subscriberCountServerIndication;
extern std::atomic<std::uint32_t> subscriberCountLogEntryIndication;
extern std::atomic<std::uint32_t> subscriberCountLogFullIndication;
extern std::atomic<std::uint32_t> subscriberCountLogClearIndication;
/** Indications enabled; alert handlers drop every alert while false. */
extern std::atomic<bool> _enabledSEL;
/** Broker and attachable context saved for delivery, or null. */
extern std::atomic<const CMPIBroker*> _alertSELBroker;
extern std::atomic<const CMPIContext*> _alertSELContext;
extern std::atomic<bool> _alertSELContextAvailable;
/** The alert handed from an alert handler to its delivery thread. */
extern AlertHandOver indicationSELData;
/** Handle of the last delivery thread started for each kind of alert. */
extern std::atomic<CMPI_THREAD_TYPE> ind_thread_id_server;
extern std::atomic<CMPI_THREAD_TYPE> ind_thread_id_log;
extern std::atomic<CMPI_THREAD_TYPE> ind_thread_id_entry;

// Subscriptions.

/** The id of an indication class name (exact, byte for byte); false and
 *  15 for any other name. */
bool getSELIndicationId(const char* className, unsigned short& id);
/** Keeps the broker and context for delivery from threads of our own. */
void saveSELIndicationContext(const CMPIBroker* broker,
                              const CMPIContext* context);
void clearSELIndicationContext();
/** One more subscriber; the first starts watching the hardware. */
void subscribeForSELIndication(unsigned int id);
/** One subscriber less: the counter minus 1, where 0 becomes 1 (so 1
 *  stays 1 and 0 wraps to 4294967295); clears the saved context when every
 *  counter is 0. */
void unsubscribeForSELIndication(unsigned int id);
void setSELEnable();
/** Clears the enable flag and stops the watches of counters at 1. */
void disableSELIndication();

// Alert handlers, called by the instrumentation on its own threads.

void AutoServerRestartAlertHandler(unsigned int alertCode, DateTime time,
                                   std::string nodePath, const void* context);
void LogEntryAlertHandler(unsigned int alertCode, DateTime time,
                          std::string nodePath, const void* context);
void LogAlertHandler(unsigned int alertCode, DateTime time,
                     std::string nodePath, const void* context);

// Delivery handlers, run by the delivery threads.

void AutoServerRestartHandler(DateTime time, std::string nodePath);
void LogEntryHandler(DateTime time, std::string nodePath);
void LogHandler(DateTime time, std::string nodePath);

// Reading the alerting node.

bool getLogEntryInstrumentation(std::string nodePath, std::string& description,
                                bool& isSelEntry, std::string& recordId);
/** @p condition becomes "IsEmpty", "Warning" or "Critical". */
bool getLogInstrumentation(std::string nodePath, std::string& logPath,
                           std::string& condition);
/** @p restartCause becomes "Watchdog" or "Other" when the cause is read. */
bool getAutoServerInstrumentation(std::string nodePath, std::string& logPath,
                                  std::string& restartCause);

// Building the indication instances through the saved broker; null when
// the object path cannot be made.

CMPIInstance* createLogEntryIndicationInstance(std::string description,
                                               DateTime time,
                                               std::string recordId);
CMPIInstance* createLogClearIndicationInstance(std::string logPath,
                                               DateTime time);
CMPIInstance* createLogFullIndicationInstance(std::string logPath,
                                              DateTime time,
                                              std::string condition);
CMPIInstance*
createAutoServerRestartIndicationInstance(std::string logPath, DateTime time,
                                          std::string restartCause);

/**
 * Waits until no alert handler and no delivery thread of this library is
 * running; false when @p timeout ran out first. Unloading the library does
 * this by itself.
 */
bool awaitIndicationThreads(std::chrono::milliseconds timeout);

} // namespace QX::SELComposite
