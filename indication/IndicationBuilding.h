#pragma once

// The frame every indication instance shares: its object path, the alert
// time as a CMPI datetime, the localised message and the constant tail of
// properties.

#include "DateTime.h"

#include <cmpidt.h>
#include <cmpift.h>

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>

namespace QX
{
class Instrumentation;
}

namespace QX::SELComposite::indication
{

/**
 * @brief A new instance of @p className in root/zanqx, on an object path
 *        that carries this system's host name.
 *
 * When the object path cannot be made, traces "Failed to create
 * ObjectPath" for @p function at level 6000 and gives null. @p path
 * receives the object path when there is one.
 */
CMPIInstance* newEventInstance(const CMPIBroker* broker, const char* className,
                               const char* function, CMPIObjectPath** path);

/** The alert time as a CMPI datetime, through its CIM datetime text. */
CMPIDateTime* newAlertTime(const CMPIBroker* broker, const DateTime& time);

/**
 * @brief An object path of @p className in root/zanqx for the alerting
 *        element: its namespace set again to the one it reports, and this
 *        system's host name.
 *
 * When it cannot be made, traces "Failed to create ObjectPath for Alerting
 * Managed Element" at level 6000 and gives null.
 */
CMPIObjectPath* newAlertingElementPath(const CMPIBroker* broker,
                                       const char* className,
                                       const char* function);

/** Sets the path's namespace to the one it already reports (a no-op kept
 *  as object managers have always seen it) and this system's host name. */
void keepNamespaceAndSetHost(CMPIObjectPath* path);

/** The object path's string form, as the broker writes it; empty when
 *  the broker gives none. */
std::string pathText(const CMPIObjectPath* path);

void addTextKey(CMPIObjectPath* path, const char* name, const char* value);

/** "CorrelatedIndications": a new, empty array of strings. */
void setNoCorrelatedIndications(const CMPIBroker* broker,
                                CMPIInstance* instance);

/** The last five properties of every indication, the system and the
 *  provider: "SystemCreationClassName", "SystemName", "OwningEntity",
 *  "ProviderName" and "UniqueSystemID". */
void setCommonTail(CMPIInstance* instance);

/** "IndicationTime" and "EventTime", both the alert time. */
void setAlertTimes(CMPIInstance* instance, CMPIDateTime* alertTime);

/** "Message" and "Description", both the localised message. */
void setMessage(CMPIInstance* instance, const std::string& message);

/** "AlertingElementFormat" 2, "AlertType" @p alertType, "ProbableCause" 1,
 *  then the common tail: how every indication ends. */
void setAlertTail(CMPIInstance* instance, std::uint16_t alertType);

/** Fills a new event instance: the broker, the instance and the alert time;
 *  false when the instance must not be delivered. */
using EventFill =
    std::function<bool(const CMPIBroker*, CMPIInstance*, CMPIDateTime*)>;

/**
 * @brief Builds one indication instance of @p className, framed by the
 *        ENTERING and EXITING lines of @p function.
 *
 * Without an alert broker gives null; when the instance cannot be made
 * gives what the broker gave. Otherwise makes the alert time from @p time
 * and hands both to @p fill; gives the instance, or null when @p fill
 * refuses it. @p path receives the instance's object path when there is
 * one.
 */
CMPIInstance* buildEvent(const char* function, const char* className,
                         CMPIObjectPath** path, const DateTime& time,
                         const EventFill& fill);

/**
 * @brief Runs @p walk over a fresh instrumentation cursor, framed by the
 *        ENTERING and EXITING lines of @p function, and gives its answer;
 *        an exception is written to standard error and gives false.
 */
bool walkInstrumentation(const char* function,
                         const std::function<bool(Instrumentation&)>& walk);

/** Wide buffer sizes of the localised messages. */
constexpr std::size_t messageBufferSize = 512;
constexpr std::size_t fullMessageBufferSize = 256;

/** The text of @p identifier in the current language, formatted without
 *  arguments into a buffer of 512 wide characters, as UTF-8. The text
 *  must hold no conversion. */
std::string localizedMessage(const wchar_t* identifier);

/** The text of @p identifier used as a format with the one integer
 *  @p argument, in a buffer of 256 wide characters; empty when the text
 *  is. The text must hold at most that one integer conversion. */
std::string localizedMessage(const wchar_t* identifier, int argument);

} // namespace QX::SELComposite::indication
