#include "SELObjectFactory.h"

#include "CIMDateTime.h"
#include "Support.h"
#include "sdk/qxlib/include/Trace.h"

namespace QX::SELComposite
{

namespace
{

/** The file name the factory's trace lines give, whatever this file is
 *  called. */
constexpr const char* unitFile = "SELObjectFactory.cpp";

/** Scratch size of the factory's own datetime conversion. */
constexpr std::size_t factoryScratchSize = 5;

void traceEdge(const char* function, int line, MessageType type)
{
    logFunctionEdge(function, unitFile, line, loggerSELObjectFactory, type);
}

} // namespace

SELObjectFactory::SELObjectFactory(const char* className)
{
    constexpr const char* function = "SELObjectFactory";
    traceEdge(function, __LINE__, ENTRY_TRACE);
    if (textEqual(className, LOG_CLASS_NAME))
    {
        if (getMgmtHwLogInstances(logRecords) == 0)
        {
            numberOfInstances = static_cast<std::uint32_t>(logRecords.size());
        }
    }
    else if (textEqual(className, LOG_ENTRY_CLASS_NAME))
    {
        if (getMgmtHwLogEntryInstances(entryRecords) == 0)
        {
            numberOfInstances = static_cast<std::uint32_t>(entryRecords.size());
        }
    }
    traceEdge(function, __LINE__, EXIT_TRACE);
}

SELObjectFactory::~SELObjectFactory() = default;

std::uint32_t SELObjectFactory::getNumberOfInstances() const
{
    return numberOfInstances;
}

unsigned SELObjectFactory::getAllSELCMPIInstances(
    const CMPIBroker* broker, const CMPIContext* /*context*/,
    const CMPIObjectPath* objectPath, const char* className,
    const char** properties, bool keysOnly,
    std::vector<CMPIInstance*>& instances, CMPIStatus* status)
{
    constexpr const char* function = "getAllSELCMPIInstances";
    traceEdge(function, __LINE__, ENTRY_TRACE);
    if (textEqual(className, LOG_CLASS_NAME))
    {
        for (const auto& [key, record] : logRecords)
        {
            instances.push_back(makeMgmtHwLogInstance(
                broker, objectPath, record, properties, keysOnly, status));
        }
    }
    else if (textEqual(className, LOG_ENTRY_CLASS_NAME))
    {
        for (const auto& [key, record] : entryRecords)
        {
            instances.push_back(makeMgmtHwLogEntryInstance(
                broker, objectPath, record, properties, keysOnly, status));
        }
    }
    else
    {
        if (broker != nullptr)
        {
            broker->eft->trace(broker, CMPI_LEV_WARNING, "SELProvider",
                               "***No instance found***", nullptr);
        }
        logMessage(function, unitFile, __LINE__, loggerSELObjectFactory,
                   LOG_LEVEL_FAILURE, "No instance found");
        traceEdge(function, __LINE__, EXIT_TRACE);
        return 1;
    }
    traceEdge(function, __LINE__, EXIT_TRACE);
    return 0;
}

int SELObjectFactory::executeClearLog()
{
    return clearLog();
}

std::string SELObjectFactory::convertCIMDateTime(DateTime value)
{
    return formatCIMDateTime(value, factoryScratchSize);
}

std::string SELObjectFactory::addZero(unsigned char count)
{
    return SELComposite::addZero(count);
}

} // namespace QX::SELComposite
