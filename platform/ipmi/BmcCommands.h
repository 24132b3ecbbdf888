#pragma once

#include <array>
#include <chrono>
#include <cstdint>
#include <optional>

namespace QX::Ipmi
{

/** The 16 bytes of one SEL record, as Get SEL Entry returns them. */
using SelRecordBytes = std::array<std::uint8_t, 16>;

/** Record ids with a meaning of their own in Get SEL Entry. */
constexpr std::uint16_t firstRecordId = 0x0000;
constexpr std::uint16_t lastRecordId = 0xFFFF;

/** The answer to Get SEL Info, field names as in the IPMI specification. */
struct SelInfo
{
    std::uint16_t entries = 0;
    std::uint16_t freeSpace = 0; // bytes; 0xFFFF means 65535 or more
    std::uint32_t mostRecentAddition = 0;
    std::uint32_t mostRecentErase = 0;
    bool overflow = false;
    bool reserveSupported = false;

    /** Same entries and timestamps: the records are very likely the same. */
    bool sameRecordsAs(const SelInfo& other) const
    {
        return entries == other.entries &&
               mostRecentAddition == other.mostRecentAddition &&
               mostRecentErase == other.mostRecentErase;
    }
    bool operator==(const SelInfo&) const = default;
};

/** One record read with Get SEL Entry. */
struct SelEntry
{
    std::uint16_t nextRecordId = lastRecordId;
    SelRecordBytes data{};
};

/**
 * @brief The IPMI exchanges the SEL code needs, one call per exchange.
 *
 * Every call either returns the BMC's answer or throws IpmiError within
 * the configured timeout. Implementations are not thread-safe: callers
 * serialize them. The FreeIPMI session (IpmiSession) implements this;
 * tests put a simulated SEL behind it.
 */
class BmcCommands
{
  public:
    virtual ~BmcCommands() = default;

    virtual SelInfo getSelInfo() = 0;
    virtual std::uint16_t reserveSel() = 0;
    /** Throws IpmiError with completion code C5h when the reservation was
     *  cancelled and CBh when there is no such record. */
    virtual SelEntry getSelEntry(std::uint16_t reservationId,
                                 std::uint16_t recordId) = 0;
    /** Starts erasing the SEL (Clear SEL, "initiate erase"). */
    virtual void initiateSelErase(std::uint16_t reservationId) = 0;
    /** Clear SEL, "get erasure status": true once erasing has finished. */
    virtual bool selEraseCompleted(std::uint16_t reservationId) = 0;
    /** Get System Restart Cause: the cause, or nothing when the BMC does
     *  not implement the command (completion code C1h). */
    virtual std::optional<std::uint8_t> getSystemRestartCause() = 0;

    /** Counts the sessions opened so far; a new session may talk to a BMC
     *  that restarted meanwhile. */
    virtual std::uint64_t sessionGeneration() const = 0;
    /** When the last exchange ended (or the last session was opened). */
    virtual std::chrono::steady_clock::time_point lastActivity() const = 0;
    /** IPMI requests sent so far (commands that open a session not
     *  counted); any thread may read it. 0 when not counted. */
    virtual std::uint64_t requestCount() const
    {
        return 0;
    }
};

} // namespace QX::Ipmi
