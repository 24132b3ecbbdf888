#pragma once

#include "DateTime.h"

#include <cstdint>
#include <string>
#include <vector>

namespace QX::SELComposite
{

/**
 * @brief One hardware event log as the provider reports it.
 *
 * Several getters answer with a fixed value (which they also store), some
 * derive their answer from the counters and the enabled state, and the
 * three time getters read the clock: the CIM properties of the log are
 * defined by these answers, not by the hardware.
 */
class MgmtHwLog
{
  public:
    MgmtHwLog() = default;

    std::string getName();
    bool setName(const std::string& text);
    std::string getElementName();
    bool setElementName(const std::string& text);
    std::uint16_t getNode();
    bool setNode(unsigned short value);

    std::string getOtherEnableState();
    std::string getHeaderFormat();
    std::string getRecordHeaderFormat();
    std::string getOtherPolicyDescription();
    std::string getStatus();
    std::uint16_t getCharacterSet();
    std::uint16_t getEnableDefault();
    std::uint64_t getMaxLogSize();
    std::uint64_t getSizeOfHeader();
    std::uint64_t getMaxRecordSize();
    std::uint64_t getSizeOfRecordHeader();
    std::uint64_t getRecordLastChanged();
    bool getIsFrozen();
    std::uint8_t getPercentageNearFull();
    std::vector<std::uint16_t> getOperationalStatus();
    std::vector<std::uint16_t> getCapabilities();
    std::vector<std::string> getStatusDescriptions();
    DateTime getInstallDate();
    DateTime getTimeWhenOutdated();
    DateTime getTimeOfLastChange();

    // Written by the gatherer, read directly by the instance builder.
    std::uint16_t overwritePolicy = 0;
    std::uint16_t enabledState = 0;
    std::uint16_t requestedState = 0;
    std::uint64_t maxNumberOfRecords = 0;
    std::uint64_t currentNumberOfRecords = 0;

  private:
    std::string name;
    std::string elementName;
    std::string otherEnableState;
    std::string headerFormat;
    std::string recordHeaderFormat;
    std::string otherPolicyDescription;
    std::string status;
    std::uint16_t node = 0;
    std::uint16_t characterSet = 0;
    std::vector<std::uint16_t> operationalStatus;
    std::vector<std::uint16_t> capabilities;
    std::vector<std::string> statusDescriptions;
    std::uint8_t percentageNearFull = 0;
    std::uint16_t enableDefault = 0;
    std::uint64_t sizeOfHeader = 0;
    std::uint64_t maxRecordSize = 0;
    std::uint64_t sizeOfRecordHeader = 0;
    std::uint64_t recordLastChanged = 0;
    std::uint64_t maxLogSize = 0;
    bool isFrozen = false;
    DateTime installDate;
    DateTime timeWhenOutdated;
    DateTime timeOfLastChange;
};

} // namespace QX::SELComposite
