#pragma once

#include "ipmi/IpmiSettings.h"

#include <string>

namespace QX::Platform
{

/** Fixed location of the platform configuration file. */
constexpr const char* defaultConfigurationPath = "/etc/qx/platform.conf";
/** Environment variable that, when set, names another configuration file. */
constexpr const char* configurationPathVariable = "QX_PLATFORM_CONFIG";

/** The settings of the platform configuration file (docs/configuration.md). */
struct Configuration
{
    /** "ipmi" (the default): the server's BMC, with the ipmi settings, in
     *  band unless they say otherwise; "memory": the in-memory source, from
     *  fixtureFile or, when that is empty, the built-in sample SEL. The
     *  sample is served only where a configuration asks for it: on a
     *  server, made-up events would pass for real ones. */
    std::string source = "ipmi";
    std::string fixtureFile;
    Ipmi::Settings ipmi;
    /** The file these settings were read from; empty for the defaults. */
    std::string file;
    /** Logger: "syslog", "stderr", "none" or "file:PATH". */
    std::string logSink = "syslog";
    /** Lowest level written on the log channel; 0 disables the channel. */
    int logLevel = 6000;
    /** Lowest level written on the trace channel; 0 disables it. */
    int traceLevel = 0;
    /** Components written, comma separated; "*" for all. */
    std::string logComponents = "*";
    /** Language of the message resources: "en", "de", or empty for the
     *  process environment (LC_ALL, LC_MESSAGES, LANG). */
    std::string locale;
};

/**
 * Parses configuration text. Unknown keys and malformed lines throw
 * std::runtime_error naming the line.
 */
Configuration parseConfiguration(const std::string& text,
                                 const std::string& sourceName);
/** Reads the file named by QX_PLATFORM_CONFIG, else the default path; a
 *  missing file gives the defaults. */
Configuration loadConfiguration();

} // namespace QX::Platform
