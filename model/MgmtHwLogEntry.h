#pragma once

#include <cstdint>
#include <string>

namespace QX::SELComposite
{

/**
 * @brief One record of the hardware event log.
 *
 * The record's real time and data travel in the public fields
 * messageTimestamp and recordData; the getters for timestamp, datestamp,
 * source and original record data answer with fixed texts.
 */
class MgmtHwLogEntry
{
  public:
    MgmtHwLogEntry() = default;

    std::string getElementName();
    /** Stores the text; false when it is empty. */
    bool setElementName(std::string text);
    std::string getDescription();
    /** Stores the text; false when it is empty. */
    bool setDescription(std::string text);
    std::uint16_t getNode();
    bool setNode(unsigned short value);
    std::string getSeverity();
    std::uint16_t getSeverityNumber();
    std::string getOriginalRecordData();
    std::string getMessageTimestampstr();
    std::string getMessageDatestampstr();
    std::string getSource();

  private:
    std::string elementName;
    std::string description;
    std::string severity;
    std::string originalRecordData;
    std::string messageTimestampStr;
    std::string messageDatestampStr;
    std::string source;

  public:
    // Written by the gatherer, read directly by the instance builder.
    std::string recordID;
    std::string logName;
    std::string recordData;
    std::string dataFormat;
    std::string messageTimestamp; // CIM datetime text

  private:
    std::uint16_t node = 0;
    std::uint16_t severityNumber = 0;
};

} // namespace QX::SELComposite
