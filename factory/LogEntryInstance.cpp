#include "CmpiValues.h"
#include "InstanceFrame.h"
#include "PropertySelection.h"
#include "SELObjectFactory.h"
#include "sdk/qxlib/include/Trace.h"

namespace QX::SELComposite
{

namespace
{

constexpr const char* unitFile = "SELObjectFactory.cpp";

const char* logEntryKeys[] = {
    "RecordID",         "CreationClassName", "LogCreationClassName",
    "MessageTimestamp", "LogName",           nullptr};

} // namespace

CMPIInstance* SELObjectFactory::makeMgmtHwLogEntryInstance(
    const CMPIBroker* broker, const CMPIObjectPath* objectPath,
    MgmtHwLogEntry entry, const char** properties, bool keysOnly,
    CMPIStatus* status)
{
    constexpr const char* function = "makeMgmtHwLogEntryInstance";
    logFunctionEdge(function, unitFile, __LINE__, loggerSELObjectFactory,
                    ENTRY_TRACE);
    const PropertySelection selection(properties, keysOnly);
    const InstanceFrame frame =
        newInstanceFrame(broker, objectPath, LOG_ENTRY_CLASS_NAME, status);
    if (frame.usable)
    {
        CMPIInstance* instance = frame.instance;
        if (!keysOnly)
        {
            instance->ft->setPropertyFilter(instance, properties, logEntryKeys);
        }
        setTextProperty(instance, "CreationClassName", LOG_ENTRY_CLASS_NAME);
        if (selection.wants("Caption"))
        {
            setTextProperty(instance, "Caption", "IPMI SEL LOG");
        }
        if (selection.wants("Description"))
        {
            setTextProperty(instance, "Description",
                            entry.getDescription().c_str());
        }
        if (selection.wants("ElementName"))
        {
            setTextProperty(instance, "ElementName",
                            entry.getElementName().c_str());
        }
        if (selection.wants("LogCreationClassName"))
        {
            setTextProperty(instance, "LogCreationClassName", LOG_CLASS_NAME);
        }
        if (selection.wants("LogName"))
        {
            setTextProperty(instance, "LogName", entry.logName.c_str());
        }
        if (selection.wants("RecordID"))
        {
            setTextProperty(instance, "RecordID", entry.recordID.c_str());
        }
        if (selection.wants("RecordData"))
        {
            setTextProperty(instance, "RecordData", entry.recordData.c_str());
        }
        if (selection.wants("MessageTimestamp"))
        {
            CMPIStatus local{CMPI_RC_OK, nullptr};
            CMPIDateTime* timestamp = broker->eft->newDateTimeFromChars(
                broker, entry.messageTimestamp.c_str(), &local);
            if (local.rc == CMPI_RC_OK)
            {
                setTypedProperty(instance, "MessageTimestamp", timestamp);
            }
        }
        if (selection.wants("DataFormat"))
        {
            setTextProperty(instance, "DataFormat", entry.dataFormat.c_str());
        }
        if (selection.wants("Node"))
        {
            setTypedProperty(instance, "Node", entry.getNode());
        }
        if (selection.wants("Source"))
        {
            setTextProperty(instance, "Source", entry.getSource().c_str());
        }
    }
    logFunctionEdge(function, unitFile, __LINE__, loggerSELObjectFactory,
                    EXIT_TRACE);
    return frame.instance;
}

} // namespace QX::SELComposite
