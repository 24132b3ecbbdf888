#pragma once

// OpenIPMI's BMC simulator (ipmi_sim) as a test bench: configuration files
// written here, a free loopback UDP port, a clean state directory, SEL
// records seeded through the simulator's persist file, and the process
// stopped by its PID.

#include "SelBehaviour.h"

#include <array>
#include <cstdint>
#include <string>
#include <sys/types.h>
#include <vector>

namespace bmcsim
{

/** A sensor named in the simulator's SDR (a compact sensor record). */
struct Sensor
{
    std::uint8_t number;
    std::uint8_t type;
    std::uint8_t eventReadingType;
    std::string name; // at most 16 characters
};

struct Options
{
    /** Where configuration, state and log go; a fresh temporary directory
     *  (removed at the end) when empty. */
    std::string directory;
    unsigned maxRecords = 64;
    /** Records in the SEL at start (their bytes 0-1 are the record ids). */
    std::vector<Record> records;
    /** Set the SEL clock to the host's clock after start; otherwise its
     *  timestamps are "pre-init" seconds since the simulator started. */
    bool setSelTime = true;
    std::uint32_t lastEraseTime = 0;
    /** Sensors besides the watchdog (sensor 0, "Watchdog"). */
    std::vector<Sensor> sensors;
    std::string user = "admin";
    std::string password = "password";
    /** Load the project's simulator module (restart cause, watchdog
     *  actions) when it was built. */
    bool restartModule = true;
    /** The SEL of a chosen real BMC in place of the simulator's own (needs
     *  the SEL module); the records above seed it. */
    SelBehaviour selBehaviour;
};

/** Watchdog actions of Set Watchdog Timer. */
enum class WatchdogAction : std::uint8_t
{
    HardReset = 1,
    PowerDown = 2,
    PowerCycle = 3,
};

/**
 * @brief One ipmi_sim process on 127.0.0.1.
 *
 * start() picks free ports, writes lan.conf, the emulator file and the
 * persist file, starts ipmi_sim and waits (bounded) until it answers over
 * IPMI. The destructor stops it unless released. Only the process started
 * here is ever signalled, by its PID.
 */
class SimulatedBmc
{
  public:
    explicit SimulatedBmc(Options options);
    ~SimulatedBmc();
    SimulatedBmc(const SimulatedBmc&) = delete;
    SimulatedBmc& operator=(const SimulatedBmc&) = delete;

    /** Whether an ipmi_sim executable is on the PATH. */
    static bool available();
    /** Whether the simulator module was built (restart cause, watchdog). */
    static bool moduleAvailable();

    void start();
    /** SIGTERM, up to 5 s to exit, then SIGKILL. */
    void stop();
    /** SIGKILL at once. */
    void kill();
    void freeze(); // SIGSTOP
    void thaw();   // SIGCONT
    /** Stops and starts again on the same ports, keeping the SEL. */
    void restart();
    /** Leaves the process running after this object is gone. */
    void release();

    /** Adds records over IPMI (Add SEL Entry); returns their ids. */
    std::vector<std::uint16_t> addRecords(const std::vector<Record>& records);
    void setSelTime(std::uint32_t secondsSinceEpoch);
    /** Clears the SEL over IPMI (Clear SEL). */
    void clearSel();
    /** Sets the watchdog (SMS/OS use) to @p action after @p tenths of a
     *  second and starts it; it expires by itself, logs a Watchdog 2
     *  record and (with the module) sets the restart cause to watchdog. */
    void startWatchdog(WatchdogAction action, unsigned tenths);

    pid_t pid() const
    {
        return pid_;
    }
    /** "127.0.0.1:PORT", as FreeIPMI takes it. */
    std::string host() const;
    std::uint16_t lanPort() const
    {
        return lanPort_;
    }
    const std::string& directory() const
    {
        return directory_;
    }
    const Options& options() const
    {
        return options_;
    }
    /** The ipmitool command line prefix for this simulator. */
    std::string ipmitool() const;
    /** The SEL as the SEL module holds it (oldest first), read from its
     *  file rather than over IPMI; empty without the module. */
    std::vector<Record> moduleSel() const;

  private:
    void writeFiles(bool seedSel) const;
    std::string selFile() const;
    std::string moduleLine() const;
    void launch();
    void waitUntilAnswering();
    bool reap(int waitMs);

    Options options_;
    std::string directory_;
    bool ownDirectory_ = false;
    std::uint16_t lanPort_ = 0;
    std::uint16_t consolePort_ = 0;
    pid_t pid_ = -1;
    bool released_ = false;
};

/** Adds records over IPMI to the simulator at @p host; returns their ids.
 *  Throws std::runtime_error when the BMC refuses one (a full SEL). */
std::vector<std::uint16_t> addRecordsAt(const std::string& host,
                                        const std::string& user,
                                        const std::string& password,
                                        const std::vector<Record>& records);

/** Sets the SEL clock of the simulator at @p host. */
void setSelTimeAt(const std::string& host, const std::string& user,
                  const std::string& password, std::uint32_t secondsSinceEpoch);

/** Clears the SEL of the simulator at @p host (with reservation 0 where
 *  Reserve SEL is refused); the erase may go on in the background. */
void clearSelAt(const std::string& host, const std::string& user,
                const std::string& password);

/** Starts the watchdog of the simulator at @p host (see
 *  SimulatedBmc::startWatchdog). */
void startWatchdogAt(const std::string& host, const std::string& user,
                     const std::string& password, WatchdogAction action,
                     unsigned tenths);

/** @p count system event records with ids from @p firstId and times
 *  ending at @p lastTime, cycling through a few sensor events. */
std::vector<Record> generatedRecords(unsigned count, std::uint16_t firstId,
                                     std::uint32_t lastTime);

/** The RecordData of every entry in a fixture file ("" for the built-in
 *  sample SEL). */
std::vector<Record> fixtureRecords(const std::string& fixtureFile);

/** The sensors the sample SEL's records name. */
std::vector<Sensor> sampleSensors();

/** Parses 16 hexadecimal pairs separated by blanks. */
Record parseRecord(const std::string& hex);

} // namespace bmcsim
