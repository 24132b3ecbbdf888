#pragma once

#include "BmcCommands.h"

#include <string>

namespace QX::Ipmi
{

/**
 * @brief Turns SEL records into readable event texts.
 *
 * Callers hold exclusive access to the BMC session while they call either
 * member. The FreeIPMI implementation (FreeIpmiDescriber) names sensors
 * from the BMC's SDR; tests use simpler ones.
 */
class RecordDescriber
{
  public:
    virtual ~RecordDescriber() = default;

    /** Brings the sensor names up to date with the BMC. Returns true when
     *  they may have changed since the last call, so that texts made
     *  before are to be made again. Throws IpmiError. */
    virtual bool refreshSensorNames() = 0;

    /** The event text of @p record; never empty. */
    virtual std::string describe(const SelRecordBytes& record) = 0;

    /** Names everything besides a record's bytes that its text depends on
     *  now (the sensor names in use, the interpretation flags), so that
     *  texts made under an equal key in another process can be used as
     *  they are. Empty: texts are always made again. */
    virtual std::string textsKey() const
    {
        return {};
    }
};

} // namespace QX::Ipmi
