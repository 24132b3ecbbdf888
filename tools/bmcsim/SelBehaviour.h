#pragma once

// The simulator's SEL as chosen real BMCs keep it: the project's SEL
// module takes over the SEL commands, and these options say how it
// behaves. The behaviours combine (a ring buffer with frozen times is one
// SEL).

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace bmcsim
{

using Record = std::array<std::uint8_t, 16>;

struct SelBehaviour
{
    /** Whether the module's SEL replaces the simulator's own. */
    bool replaced = false;
    /** A full SEL overwrites its oldest record; ids go round 1..max. */
    bool ring = false;
    /** Get SEL Info's last-addition and last-erase times never move. */
    bool frozenInfo = false;
    /** Clear SEL erases in the background for this long (0: at once). */
    unsigned clearMs = 0;
    /** A cleared SEL starts with a "Log Area Reset/Cleared" record. */
    bool clearRecord = false;
    /** Reserve SEL's completion code: 0 grants, C1h or D4h refuse. */
    std::uint8_t reserveRefusal = 0;
    /** Every SEL command is answered this many ms late (0: at once). */
    unsigned delayMs = 0;

    /** Ring buffer whose Get SEL Info times never change. */
    static SelBehaviour frozenRing();
    /** Clear SEL that takes @p ms in the background and leaves a
     *  "Log Area Reset/Cleared" record. */
    static SelBehaviour backgroundClear(unsigned ms);
    /** Reserve SEL refused with completion code @p code. */
    static SelBehaviour reserveRefused(std::uint8_t code);
};

/** Whether the SEL module was built (libopenipmi-dev present). */
bool selModuleAvailable();

/** The lan.conf line that loads the SEL module with @p behaviour, its
 *  SEL kept in @p selFile and holding @p maxRecords. */
std::string selModuleLine(const SelBehaviour& behaviour, unsigned maxRecords,
                          const std::string& selFile);

/** Writes @p records as the SEL module's file (ids in bytes 0-1). */
void writeSelFile(const std::string& selFile,
                  const std::vector<Record>& records);

/** The SEL as the module holds it, oldest record first. */
std::vector<Record> readSelFile(const std::string& selFile);

} // namespace bmcsim
