#include "MgmtHwLog.h"

#include "Support.h"

#include <ctime>

namespace QX::SELComposite
{

namespace
{

/** CIM EnabledState "Enabled". */
constexpr std::uint16_t enabledStateEnabled = 2;

DateTime currentTime()
{
    return DateTime(std::time(nullptr), 3);
}

} // namespace

std::string MgmtHwLog::getName()
{
    return stripSpaces(name);
}

bool MgmtHwLog::setName(const std::string& text)
{
    name = text;
    return true;
}

std::string MgmtHwLog::getElementName()
{
    return stripSpaces(elementName);
}

bool MgmtHwLog::setElementName(const std::string& text)
{
    elementName = text;
    return true;
}

std::uint16_t MgmtHwLog::getNode()
{
    return node;
}

bool MgmtHwLog::setNode(unsigned short value)
{
    node = value;
    return true;
}

std::string MgmtHwLog::getOtherEnableState()
{
    return stripSpaces(otherEnableState);
}

std::string MgmtHwLog::getHeaderFormat()
{
    headerFormat = "";
    return stripSpaces(headerFormat);
}

std::string MgmtHwLog::getRecordHeaderFormat()
{
    recordHeaderFormat = "2 byte Record ID and 1 byte Record Type";
    return stripSpaces(recordHeaderFormat);
}

std::string MgmtHwLog::getOtherPolicyDescription()
{
    otherPolicyDescription = "";
    return stripSpaces(otherPolicyDescription);
}

std::string MgmtHwLog::getStatus()
{
    status = enabledState == enabledStateEnabled ? "OK" : "Unknown";
    return status;
}

std::uint16_t MgmtHwLog::getCharacterSet()
{
    characterSet = 7;
    return characterSet;
}

std::uint16_t MgmtHwLog::getEnableDefault()
{
    enableDefault = 2;
    return enableDefault;
}

std::uint64_t MgmtHwLog::getMaxLogSize()
{
    maxLogSize = 10240;
    return maxLogSize;
}

std::uint64_t MgmtHwLog::getSizeOfHeader()
{
    sizeOfHeader = 0;
    return sizeOfHeader;
}

std::uint64_t MgmtHwLog::getMaxRecordSize()
{
    maxRecordSize = 0;
    return maxRecordSize;
}

std::uint64_t MgmtHwLog::getSizeOfRecordHeader()
{
    sizeOfRecordHeader = 0;
    return sizeOfRecordHeader;
}

std::uint64_t MgmtHwLog::getRecordLastChanged()
{
    recordLastChanged = 0;
    return recordLastChanged;
}

bool MgmtHwLog::getIsFrozen()
{
    isFrozen = false;
    return isFrozen;
}

std::uint8_t MgmtHwLog::getPercentageNearFull()
{
    if (maxNumberOfRecords == 0)
    {
        percentageNearFull = 0;
    }
    else
    {
        // Unsigned 64-bit arithmetic, truncated, then cut to 8 bits.
        percentageNearFull = static_cast<std::uint8_t>(
            (currentNumberOfRecords * 100) / maxNumberOfRecords);
    }
    return percentageNearFull;
}

std::vector<std::uint16_t> MgmtHwLog::getOperationalStatus()
{
    operationalStatus.clear();
    if (enabledState == enabledStateEnabled)
    {
        operationalStatus.push_back(2);  // OK
        operationalStatus.push_back(11); // In Service
    }
    else
    {
        operationalStatus.push_back(0); // Unknown
    }
    return operationalStatus;
}

std::vector<std::uint16_t> MgmtHwLog::getCapabilities()
{
    capabilities.clear();
    capabilities.push_back(6); // Can Be Cleared
    return capabilities;
}

std::vector<std::string> MgmtHwLog::getStatusDescriptions()
{
    statusDescriptions.clear();
    if (enabledState == enabledStateEnabled)
    {
        statusDescriptions.push_back("OK");
        statusDescriptions.push_back("Service");
    }
    else
    {
        statusDescriptions.push_back("Unknown");
    }
    return statusDescriptions;
}

DateTime MgmtHwLog::getInstallDate()
{
    installDate = currentTime();
    return installDate;
}

DateTime MgmtHwLog::getTimeWhenOutdated()
{
    timeWhenOutdated = currentTime();
    return timeWhenOutdated;
}

DateTime MgmtHwLog::getTimeOfLastChange()
{
    timeOfLastChange = currentTime();
    return timeOfLastChange;
}

} // namespace QX::SELComposite
