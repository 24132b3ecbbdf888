#include "MgmtHwLogEntry.h"

#include "Support.h"

#include <utility>

namespace QX::SELComposite
{

std::string MgmtHwLogEntry::getElementName()
{
    return stripSpaces(elementName);
}

bool MgmtHwLogEntry::setElementName(std::string text)
{
    elementName = std::move(text);
    return !elementName.empty();
}

std::string MgmtHwLogEntry::getDescription()
{
    return stripSpaces(description);
}

bool MgmtHwLogEntry::setDescription(std::string text)
{
    description = std::move(text);
    return !description.empty();
}

std::uint16_t MgmtHwLogEntry::getNode()
{
    return node;
}

bool MgmtHwLogEntry::setNode(unsigned short value)
{
    node = value;
    return true;
}

std::string MgmtHwLogEntry::getSeverity()
{
    return stripSpaces(severity);
}

std::uint16_t MgmtHwLogEntry::getSeverityNumber()
{
    severityNumber = 0;
    return severityNumber;
}

std::string MgmtHwLogEntry::getOriginalRecordData()
{
    originalRecordData = "On/Off Source assert State Asserted";
    return originalRecordData;
}

std::string MgmtHwLogEntry::getMessageTimestampstr()
{
    messageTimestampStr = "04:48:11";
    return stripSpaces(messageTimestampStr);
}

std::string MgmtHwLogEntry::getMessageDatestampstr()
{
    messageDatestampStr = "2008-05-23";
    return stripSpaces(messageDatestampStr);
}

std::string MgmtHwLogEntry::getSource()
{
    source = "IPMI";
    return source;
}

} // namespace QX::SELComposite
