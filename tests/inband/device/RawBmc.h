#pragma once

// A BMC that answers raw IPMI requests (network function, command, data)
// the way a server's management controller does: device identity, the
// System Event Log, the restart cause, an empty SDR repository, and
// "invalid command" for everything else.

#include <array>
#include <cstdint>
#include <optional>
#include <vector>

namespace inbandsim
{

using Record = std::array<std::uint8_t, 16>;

/** Network functions (requests) the BMC knows. */
constexpr std::uint8_t netFnChassis = 0x00;
constexpr std::uint8_t netFnApp = 0x06;
constexpr std::uint8_t netFnStorage = 0x0A;

/**
 * @brief The SEL and identity of one simulated BMC.
 *
 * answer() gives the response bytes: the completion code, then the data.
 * Not thread-safe: the device that owns it serializes every call.
 */
class RawBmc
{
  public:
    /** The answer to one request. */
    std::vector<std::uint8_t> answer(std::uint8_t netFn, std::uint8_t command,
                                     const std::vector<std::uint8_t>& data);

    /** Adds a record as the BMC's own event logging does: it gets the next
     *  record id (bytes 0-1) and the addition time changes. Returns the
     *  id. */
    std::uint16_t add(Record record);
    const std::vector<Record>& records() const
    {
        return sel_;
    }
    /** What Get System Restart Cause answers; nothing: C1h. */
    std::optional<std::uint8_t> restartCause;
    /** SEL capacity in records. */
    std::size_t capacity = 512;

  private:
    std::vector<std::uint8_t> selInfo() const;
    std::vector<std::uint8_t> selEntry(const std::vector<std::uint8_t>& data);
    std::vector<std::uint8_t> addEntry(const std::vector<std::uint8_t>& data);
    std::vector<std::uint8_t> clear(const std::vector<std::uint8_t>& data);
    bool reserved(const std::vector<std::uint8_t>& data) const;

    std::vector<Record> sel_;
    std::uint16_t nextId_ = 1;
    std::uint16_t reservation_ = 0;
    std::uint32_t clock_ = 0x65e58000; // seconds, advanced by each change
    std::uint32_t lastAddition_ = 0;
    std::uint32_t lastErase_ = 0;
};

} // namespace inbandsim
