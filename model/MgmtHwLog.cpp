#include "MgmtHwLog.h"

#include "Support.h"

#include <ctime>
#include <type_traits>
#include <utility>

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

/** Stores a getter's answer in its field, then gives it. */
template <typename T>
T remember(T& field, std::type_identity_t<T> value)
{
    field = std::move(value);
    return field;
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
    return stripSpaces(remember(headerFormat, ""));
}

std::string MgmtHwLog::getRecordHeaderFormat()
{
    return stripSpaces(remember(recordHeaderFormat,
                                "2 byte Record ID and 1 byte Record Type"));
}

std::string MgmtHwLog::getOtherPolicyDescription()
{
    return stripSpaces(remember(otherPolicyDescription, ""));
}

std::string MgmtHwLog::getStatus()
{
    return remember(status,
                    enabledState == enabledStateEnabled ? "OK" : "Unknown");
}

std::uint16_t MgmtHwLog::getCharacterSet()
{
    return remember(characterSet, 7);
}

std::uint16_t MgmtHwLog::getEnableDefault()
{
    return remember(enableDefault, 2);
}

std::uint64_t MgmtHwLog::getMaxLogSize()
{
    return remember(maxLogSize, 10240);
}

std::uint64_t MgmtHwLog::getSizeOfHeader()
{
    return remember(sizeOfHeader, 0);
}

std::uint64_t MgmtHwLog::getMaxRecordSize()
{
    return remember(maxRecordSize, 0);
}

std::uint64_t MgmtHwLog::getSizeOfRecordHeader()
{
    return remember(sizeOfRecordHeader, 0);
}

std::uint64_t MgmtHwLog::getRecordLastChanged()
{
    return remember(recordLastChanged, 0);
}

bool MgmtHwLog::getIsFrozen()
{
    return remember(isFrozen, false);
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
    return remember(installDate, currentTime());
}

DateTime MgmtHwLog::getTimeWhenOutdated()
{
    return remember(timeWhenOutdated, currentTime());
}

DateTime MgmtHwLog::getTimeOfLastChange()
{
    return remember(timeOfLastChange, currentTime());
}

} // namespace QX::SELComposite
