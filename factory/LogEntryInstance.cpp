#include "CmpiValues.h"
#include "InstanceFrame.h"
#include "PropertySelection.h"
#include "SELObjectFactory.h"

namespace QX::SELComposite
{

namespace
{

const char* logEntryKeys[] = {
    "RecordID",         "CreationClassName", "LogCreationClassName",
    "MessageTimestamp", "LogName",           nullptr};

} // namespace

CMPIInstance* SELObjectFactory::makeMgmtHwLogEntryInstance(
    const CMPIBroker* broker, const CMPIObjectPath* objectPath,
    MgmtHwLogEntry entry, const char** properties, bool keysOnly,
    CMPIStatus* status)
{
    return buildInstance(
        "makeMgmtHwLogEntryInstance", broker, objectPath, LOG_ENTRY_CLASS_NAME,
        logEntryKeys, properties, keysOnly, status,
        [&](CMPIInstance* instance, const PropertySelection& selection)
        {
            setTextProperty(instance, "CreationClassName",
                            LOG_ENTRY_CLASS_NAME);
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
                setTextProperty(instance, "LogCreationClassName",
                                LOG_CLASS_NAME);
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
                setTextProperty(instance, "RecordData",
                                entry.recordData.c_str());
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
                setTextProperty(instance, "DataFormat",
                                entry.dataFormat.c_str());
            }
            if (selection.wants("Node"))
            {
                setTypedProperty(instance, "Node", entry.getNode());
            }
            if (selection.wants("Source"))
            {
                setTextProperty(instance, "Source", entry.getSource().c_str());
            }
        });
}

} // namespace QX::SELComposite
