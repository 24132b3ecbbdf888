#pragma once

#include "SelRecordText.h"

#include <optional>
#include <string>
#include <vector>

namespace QX::Ipmi
{

/** Where the BMC is reached. */
enum class Interface
{
    InBand, // the local BMC, through FreeIPMI's in-band drivers
    Lan,    // IPMI 2.0 over the LAN (RMCP+)
};

/**
 * @brief The "ipmi.*" settings of the platform configuration file.
 *
 * docs/configuration.md documents every key. The
 * password is held here only to open sessions; no text made from these
 * settings (log lines, errors) ever includes it.
 */
struct Settings
{
    Interface interface = Interface::InBand;
    std::string driver = "auto"; // in-band: auto, kcs, ssif, openipmi, ...
    std::string driverDevice;    // in-band: device path, empty for default
    std::string host;            // LAN: host, host:port or [v6]:port
    std::string user;
    std::string password;
    bool passwordInConfiguration = false;
    std::string passwordFile;
    std::string privilege = "operator"; // user, operator or admin
    // LAN: a fixed RMCP+ cipher suite; empty ("auto") tries 17, then 3,
    // and remembers per BMC the one that worked.
    std::optional<unsigned> cipherSuite;
    std::vector<std::string> workarounds; // FreeIPMI's workaround names
    unsigned timeoutMs = 5000;
    unsigned retransmissionTimeoutMs = 1000;
    unsigned warningFillPercent = 75;
    unsigned pollIntervalMs = 2000; // how often monitoring asks the BMC
    SelClock selClock = SelClock::Utc;
    unsigned selCapacity = 0; // records; 0: from Get SEL Info
    bool selWraps = false;
    unsigned clearWaitMs = 30000;     // how long a clear may take to finish
    unsigned selVerifySeconds = 3600; // full re-read of the SEL; 0: never
    std::string stateDirectory = "/var/lib/qx-platform";
};

/** Whether @p key belongs to these settings ("ipmi." keys). */
bool isSettingKey(const std::string& key);

/**
 * Applies one key. Returns an empty text on success, otherwise what is
 * wrong with the value (never the value of a password key).
 */
std::string applySetting(Settings& settings, const std::string& key,
                         const std::string& value);

/**
 * Checks the settings as a whole before a session is opened: the keys
 * that belong together, and the files that hold the password. A password
 * in @p configurationFile, or a password file, that group or others may
 * read is refused. Reads the password file into settings.password.
 * Throws std::runtime_error with a text that names the key or file.
 */
void completeSettings(Settings& settings, const std::string& configurationFile);

} // namespace QX::Ipmi
