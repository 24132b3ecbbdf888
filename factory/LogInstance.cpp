#include "CmpiValues.h"
#include "InstanceFrame.h"
#include "PropertySelection.h"
#include "SELObjectFactory.h"

#include <string>
#include <vector>

namespace QX::SELComposite
{

namespace
{

const char* logKeys[] = {"Name", "CreationClassName", nullptr};

/** Sets a 16-bit array property; left out when the broker cannot make the
 *  array, set partly filled when an element fails. */
void setUint16Array(const CMPIBroker* broker, const CMPIInstance* instance,
                    const char* name, const std::vector<std::uint16_t>& values)
{
    if (values.empty())
    {
        return;
    }
    CMPIStatus local{CMPI_RC_OK, nullptr};
    CMPIArray* array = broker->eft->newArray(
        broker, static_cast<CMPICount>(values.size()), CMPI_uint16, &local);
    if (local.rc != CMPI_RC_OK || array == nullptr)
    {
        return;
    }
    for (CMPICount i = 0; i < values.size() && local.rc == CMPI_RC_OK; ++i)
    {
        local = setTypedElement(array, i, values[i]);
    }
    setArrayProperty(instance, name, array, CMPI_uint16A);
}

/** Sets a string array property, with the same failure rules. */
void setStringArray(const CMPIBroker* broker, const CMPIInstance* instance,
                    const char* name, const std::vector<std::string>& values)
{
    if (values.empty())
    {
        return;
    }
    CMPIStatus local{CMPI_RC_OK, nullptr};
    CMPIArray* array = broker->eft->newArray(
        broker, static_cast<CMPICount>(values.size()), CMPI_string, &local);
    if (local.rc != CMPI_RC_OK || array == nullptr)
    {
        return;
    }
    for (CMPICount i = 0; i < values.size() && local.rc == CMPI_RC_OK; ++i)
    {
        CMPIString* text =
            broker->eft->newString(broker, values[i].c_str(), &local);
        if (local.rc == CMPI_RC_OK)
        {
            local = setTypedElement(array, i, text);
        }
    }
    setArrayProperty(instance, name, array, CMPI_stringA);
}

} // namespace

CMPIInstance* SELObjectFactory::makeMgmtHwLogInstance(
    const CMPIBroker* broker, const CMPIObjectPath* objectPath, MgmtHwLog log,
    const char** properties, bool keysOnly, CMPIStatus* status)
{
    return buildInstance(
        "makeMgmtHwLogInstance", broker, objectPath, LOG_CLASS_NAME, logKeys,
        properties, keysOnly, status,
        [&](CMPIInstance* instance, const PropertySelection& selection)
        {
            setTextProperty(instance, "Name", log.getName().c_str());
            setTextProperty(instance, "CreationClassName", LOG_CLASS_NAME);
            if (selection.wants("Caption"))
            {
                setTextProperty(instance, "Caption", "IPMI SEL LOG");
            }
            if (selection.wants("Description"))
            {
                setTextProperty(
                    instance, "Description",
                    "Intelligent platform Management Interface SEL");
            }
            if (selection.wants("ElementName"))
            {
                setTextProperty(instance, "ElementName",
                                log.getElementName().c_str());
            }
            if (selection.wants("Status"))
            {
                setTextProperty(instance, "Status", log.getStatus().c_str());
            }
            if (selection.wants("Node"))
            {
                setTypedProperty(instance, "Node", log.getNode());
            }
            if (selection.wants("MaxNumberOfRecords"))
            {
                setTypedProperty(instance, "MaxNumberOfRecords",
                                 log.maxNumberOfRecords);
            }
            if (selection.wants("CurrentNumberOfRecords"))
            {
                setTypedProperty(instance, "CurrentNumberOfRecords",
                                 log.currentNumberOfRecords);
            }
            if (selection.wants("OverWritePolicy"))
            {
                setTypedProperty(instance, "OverWritePolicy",
                                 log.overwritePolicy);
            }
            if (selection.wants("EnabledState"))
            {
                setTypedProperty(instance, "EnabledState", log.enabledState);
            }
            if (selection.wants("RequestedState"))
            {
                setTypedProperty(instance, "RequestedState",
                                 log.requestedState);
            }
            if (selection.wants("CharacterSet"))
            {
                setTypedProperty(instance, "CharacterSet",
                                 log.getCharacterSet());
            }
            if (selection.wants("MaxLogSize"))
            {
                setTypedProperty(instance, "MaxLogSize", log.getMaxLogSize());
            }
            if (selection.wants("PercentageNearFull"))
            {
                setTypedProperty(instance, "PercentageNearFull",
                                 log.getPercentageNearFull());
            }
            if (selection.wants("IsFrozen"))
            {
                setTypedProperty(instance, "IsFrozen", log.getIsFrozen());
            }
            if (selection.wants("OperationalStatus"))
            {
                setUint16Array(broker, instance, "OperationalStatus",
                               log.getOperationalStatus());
            }
            if (selection.wants("Capabilities"))
            {
                setUint16Array(broker, instance, "Capabilities",
                               log.getCapabilities());
            }
            if (selection.wants("StatusDescriptions"))
            {
                setStringArray(broker, instance, "StatusDescriptions",
                               log.getStatusDescriptions());
            }
        });
}

} // namespace QX::SELComposite
