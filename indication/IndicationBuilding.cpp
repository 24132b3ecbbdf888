#include "IndicationBuilding.h"

#include "CIMDateTime.h"
#include "CmpiValues.h"
#include "IndicationTrace.h"
#include "Instrumentation.h"
#include "Product.h"
#include "Resources.h"
#include "Support.h"
#include "Utf8.h"

#include <cwchar>
#include <exception>
#include <iostream>
#include <vector>

namespace QX::SELComposite::indication
{

namespace
{

/** The resource text of @p identifier in the current language. */
std::wstring resourceText(const wchar_t* identifier)
{
    const Locale::LanguageId languageId = Locale::getLanguageId();
    const Locale::ResourceLibrary library =
        Locale::getResourceLibrary(Locale::SelProviderLibrary, languageId);
    return ResourceString(library, identifier).str();
}

/** swprintf leaves the buffer unterminated when the text does not fit. */
void terminate(std::vector<wchar_t>& buffer)
{
    buffer.back() = L'\0';
}

} // namespace

CMPIInstance* newEventInstance(const CMPIBroker* broker, const char* className,
                               const char* function, CMPIObjectPath** path)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIObjectPath* eventPath = broker->eft->newObjectPath(
        broker, INDICATION_NAMESPACE, className, &status);
    if (!isUsable(eventPath))
    {
        traceMessage(function, __LINE__, LOG_LEVEL_FAILURE,
                     "Failed to create ObjectPath");
        return nullptr;
    }
    eventPath->ft->setNameSpace(eventPath, INDICATION_NAMESPACE);
    const std::string hostName = getSystemName();
    eventPath->ft->setHostname(eventPath, hostName.c_str());
    if (path != nullptr)
    {
        *path = eventPath;
    }
    return broker->eft->newInstance(broker, eventPath, &status);
}

CMPIDateTime* newAlertTime(const CMPIBroker* broker, const DateTime& time)
{
    const std::string text = convertCIMDateTime(time);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    return broker->eft->newDateTimeFromChars(broker, text.c_str(), &status);
}

CMPIObjectPath* newAlertingElementPath(const CMPIBroker* broker,
                                       const char* className,
                                       const char* function)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIObjectPath* path = broker->eft->newObjectPath(
        broker, INDICATION_NAMESPACE, className, &status);
    if (!isUsable(path))
    {
        traceMessage(function, __LINE__, LOG_LEVEL_FAILURE,
                     "Failed to create ObjectPath for Alerting Managed "
                     "Element");
        return nullptr;
    }
    return path;
}

void keepNamespaceAndSetHost(CMPIObjectPath* path)
{
    // Setting the namespace the path already reports changes nothing; it
    // is done all the same, as object managers have always seen it.
    const std::string nameSpace = [path]
    {
        const char* chars =
            charsOf(path->ft->getNameSpace(path, nullptr), nullptr);
        return std::string(chars != nullptr ? chars : "");
    }();
    path->ft->setNameSpace(path, nameSpace.c_str());
    const std::string hostName = getSystemName();
    path->ft->setHostname(path, hostName.c_str());
}

std::string pathText(const CMPIObjectPath* path)
{
    const char* chars = charsOf(path->ft->toString(path, nullptr), nullptr);
    return chars != nullptr ? chars : "";
}

void addTextKey(CMPIObjectPath* path, const char* name, const char* value)
{
    path->ft->addKey(path, name, reinterpret_cast<const CMPIValue*>(value),
                     CMPI_chars);
}

void setNoCorrelatedIndications(const CMPIBroker* broker,
                                CMPIInstance* instance)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIArray* none = broker->eft->newArray(broker, 0, CMPI_string, &status);
    setArrayProperty(instance, "CorrelatedIndications", none, CMPI_stringA);
}

void setCommonTail(CMPIInstance* instance)
{
    setTextProperty(instance, "SystemCreationClassName",
                    "ZANKOR_ComputerSystem");
    const std::string systemName = getSystemName();
    setTextProperty(instance, "SystemName", systemName.c_str());
    setTextProperty(instance, "OwningEntity", "ZAN");
    setTextProperty(instance, "ProviderName", "SELProvider");
    const std::string uid = make_string(Product::getUid());
    setTextProperty(instance, "UniqueSystemID", uid.c_str());
}

void setAlertTimes(CMPIInstance* instance, CMPIDateTime* alertTime)
{
    setTypedProperty(instance, "IndicationTime", alertTime);
    setTypedProperty(instance, "EventTime", alertTime);
}

void setMessage(CMPIInstance* instance, const std::string& message)
{
    setTextProperty(instance, "Message", message.c_str());
    setTextProperty(instance, "Description", message.c_str());
}

void setAlertTail(CMPIInstance* instance, std::uint16_t alertType)
{
    setTypedProperty(instance, "AlertingElementFormat", std::uint16_t{2});
    setTypedProperty(instance, "AlertType", alertType);
    setTypedProperty(instance, "ProbableCause", std::uint16_t{1});
    setCommonTail(instance);
}

CMPIInstance* buildEvent(const char* function, const char* className,
                         CMPIObjectPath** path, const DateTime& time,
                         const EventFill& fill)
{
    traceEntry(function, __LINE__);
    const CMPIBroker* const broker = _alertSELBroker.load();
    CMPIInstance* instance =
        broker != nullptr ? newEventInstance(broker, className, function, path)
                          : nullptr;
    if (isUsable(instance) &&
        !fill(broker, instance, newAlertTime(broker, time)))
    {
        instance = nullptr;
    }
    traceExit(function, __LINE__);
    return instance;
}

bool walkInstrumentation(const char* function,
                         const std::function<bool(Instrumentation&)>& walk)
{
    traceEntry(function, __LINE__);
    bool found = false;
    try
    {
        Instrumentation node;
        found = walk(node);
    }
    catch (const std::exception& error)
    {
        std::cerr << error.what() << std::endl;
        traceMessage(function, __LINE__, LOG_LEVEL_FAILURE, error.what());
    }
    traceExit(function, __LINE__);
    return found;
}

std::string localizedMessage(const wchar_t* identifier)
{
    // The texts are the platform's own; a unit test checks that these hold
    // no conversion, and that the full event's holds the one %d.
    std::vector<wchar_t> buffer(messageBufferSize, L'\0');
    const std::wstring text = resourceText(identifier);
    std::swprintf(buffer.data(), buffer.size(), text.c_str());
    terminate(buffer);
    return make_string(buffer.data());
}

std::string localizedMessage(const wchar_t* identifier, int argument)
{
    std::vector<wchar_t> buffer(fullMessageBufferSize, L'\0');
    const std::wstring text = resourceText(identifier);
    if (!text.empty())
    {
        std::swprintf(buffer.data(), buffer.size(), text.c_str(), argument);
        terminate(buffer);
    }
    return make_string(buffer.data());
}

} // namespace QX::SELComposite::indication
