#pragma once

#include "DateTime.h"
#include "SEL.h"
#include "Support.h"

#include <cmpidt.h>
#include <cmpift.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace QX::SELComposite
{

/** Logger component of the object factory. A constant, not a string object:
 * threads still tracing while the library's statics are destroyed read it. */
inline constexpr std::string_view loggerSELObjectFactory =
    "Corvane.SELProvider";

/** CIM classes the factory serves. */
constexpr const char* LOG_CLASS_NAME = "ZAN_MgmtHwLog";
constexpr const char* LOG_ENTRY_CLASS_NAME = "ZAN_MgmtHwLogEntry";

/**
 * @brief Gathers the records of one CIM class for one request and turns
 *        them into CMPI instances.
 *
 * The constructor reads the hardware; nothing is cached between requests.
 * A factory is made, used and destroyed on one thread.
 */
class SELObjectFactory
{
  public:
    explicit SELObjectFactory(const char* className);
    ~SELObjectFactory();

    SELObjectFactory(const SELObjectFactory&) = delete;
    SELObjectFactory& operator=(const SELObjectFactory&) = delete;

    /** Records gathered for the constructor's class; 0 for an unknown
     *  class or a failed gathering. */
    std::uint32_t getNumberOfInstances() const;

    /**
     * @brief Appends one instance per gathered record of @p className, in
     *        ascending key order, to @p instances.
     * @return 0 for one of the two classes, 1 for any other name
     */
    unsigned getAllSELCMPIInstances(const CMPIBroker* broker,
                                    const CMPIContext* context,
                                    const CMPIObjectPath* objectPath,
                                    const char* className,
                                    const char** properties, bool keysOnly,
                                    std::vector<CMPIInstance*>& instances,
                                    CMPIStatus* status);

    /** Clears the hardware log: 0 on success, non-zero on failure. */
    int executeClearLog();

    CMPIInstance* makeMgmtHwLogInstance(const CMPIBroker* broker,
                                        const CMPIObjectPath* objectPath,
                                        MgmtHwLog log, const char** properties,
                                        bool keysOnly, CMPIStatus* status);
    CMPIInstance* makeMgmtHwLogEntryInstance(const CMPIBroker* broker,
                                             const CMPIObjectPath* objectPath,
                                             MgmtHwLogEntry entry,
                                             const char** properties,
                                             bool keysOnly, CMPIStatus* status);

    std::string convertCIMDateTime(DateTime value);
    std::string addZero(unsigned char count);

  private:
    std::uint32_t numberOfInstances = 0;
    LogMap logRecords;
    EntryMap entryRecords;
    // Every instance's path names this system: a request asks for the name
    // once, however many instances it builds.
    SystemNameScope oneSystemName;
};

} // namespace QX::SELComposite
