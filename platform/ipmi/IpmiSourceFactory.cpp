#include "IpmiSourceFactory.h"

#include "FreeIpmiDescriber.h"
#include "IpmiLog.h"
#include "IpmiSession.h"
#include "IpmiSource.h"

#include <algorithm>
#include <map>
#include <stdexcept>

namespace QX::Ipmi
{

namespace
{

struct Workaround
{
    unsigned inBand = 0;
    unsigned lan = 0;
    int sdrCreate = 0;
    unsigned sel = 0;
};

const std::map<std::string, Workaround>& workaroundFlags()
{
    static const std::map<std::string, Workaround> flags{
        {"assumeio", {IPMI_WORKAROUND_FLAGS_INBAND_ASSUME_IO_BASE_ADDRESS}},
        {"spinpoll", {IPMI_WORKAROUND_FLAGS_INBAND_SPIN_POLL}},
        {"authcap",
         {0, IPMI_WORKAROUND_FLAGS_OUTOFBAND_2_0_AUTHENTICATION_CAPABILITIES}},
        {"intel20", {0, IPMI_WORKAROUND_FLAGS_OUTOFBAND_2_0_INTEL_2_0_SESSION}},
        {"supermicro20",
         {0, IPMI_WORKAROUND_FLAGS_OUTOFBAND_2_0_SUPERMICRO_2_0_SESSION}},
        {"sun20", {0, IPMI_WORKAROUND_FLAGS_OUTOFBAND_2_0_SUN_2_0_SESSION}},
        {"opensesspriv",
         {0, IPMI_WORKAROUND_FLAGS_OUTOFBAND_2_0_OPEN_SESSION_PRIVILEGE}},
        {"integritycheckvalue",
         {0,
          IPMI_WORKAROUND_FLAGS_OUTOFBAND_2_0_NON_EMPTY_INTEGRITY_CHECK_VALUE}},
        {"nochecksumcheck",
         {0, IPMI_WORKAROUND_FLAGS_OUTOFBAND_2_0_NO_CHECKSUM_CHECK}},
        {"assumemaxsdrrecordcount",
         {0, 0, IPMI_SDR_CACHE_CREATE_FLAGS_ASSUME_MAX_SDR_RECORD_COUNT}},
        {"assumesystemevent",
         {0, 0, 0, IPMI_SEL_FLAGS_ASSUME_SYTEM_EVENT_RECORDS}},
    };
    return flags;
}

ipmi_driver_type_t driverType(const std::string& name)
{
    static const std::map<std::string, ipmi_driver_type_t> drivers{
        {"auto", IPMI_DEVICE_UNKNOWN},  {"kcs", IPMI_DEVICE_KCS},
        {"ssif", IPMI_DEVICE_SSIF},     {"openipmi", IPMI_DEVICE_OPENIPMI},
        {"sunbmc", IPMI_DEVICE_SUNBMC}, {"inteldcmi", IPMI_DEVICE_INTELDCMI},
    };
    return drivers.at(name);
}

std::uint8_t privilegeLevel(const std::string& name)
{
    if (name == "user")
    {
        return IPMI_PRIVILEGE_LEVEL_USER;
    }
    return name == "admin" ? IPMI_PRIVILEGE_LEVEL_ADMIN
                           : IPMI_PRIVILEGE_LEVEL_OPERATOR;
}

SessionParameters sessionParameters(const Settings& settings, Workaround& all)
{
    SessionParameters parameters;
    parameters.lan = settings.interface == Interface::Lan;
    for (const std::string& name : settings.workarounds)
    {
        const Workaround& flags = workaroundFlags().at(name);
        if ((parameters.lan && flags.inBand != 0) ||
            (!parameters.lan && flags.lan != 0))
        {
            throw std::runtime_error(
                "ipmi.workarounds: " + name + " does not apply to the " +
                (parameters.lan ? "LAN" : "in-band") + " interface");
        }
        all.inBand |= flags.inBand;
        all.lan |= flags.lan;
        all.sdrCreate |= flags.sdrCreate;
        all.sel |= flags.sel;
    }
    parameters.driver = driverType(settings.driver);
    parameters.driverDevice = settings.driverDevice;
    parameters.host = settings.host;
    parameters.user = settings.user;
    parameters.password = settings.password;
    parameters.privilege = privilegeLevel(settings.privilege);
    parameters.cipherSuite =
        static_cast<std::uint8_t>(settings.cipherSuite.value_or(3));
    parameters.sessionTimeoutMs = settings.timeoutMs;
    parameters.retransmissionTimeoutMs = settings.retransmissionTimeoutMs;
    parameters.workaroundFlags = parameters.lan ? all.lan : all.inBand;
    return parameters;
}

/** A configured suite, or the automatic choice remembered per BMC in the
 *  state directory. */
CipherSuiteChoice cipherSuiteChoice(const Settings& settings)
{
    if (settings.cipherSuite)
    {
        return CipherSuiteChoice::fixed(
            static_cast<std::uint8_t>(*settings.cipherSuite));
    }
    return CipherSuiteChoice::automatic(settings.stateDirectory);
}

} // namespace

std::shared_ptr<InstrumentationSource>
makeIpmiSource(Settings settings, const std::string& configurationFile)
{
    try
    {
        completeSettings(settings, configurationFile);
        Workaround flags;
        auto session = std::make_unique<IpmiSession>(
            sessionParameters(settings, flags), cipherSuiteChoice(settings));
        auto describer = std::make_unique<FreeIpmiDescriber>(
            *session, settings.stateDirectory, flags.sdrCreate, flags.sel);
        const std::string peer = session->peerName();
        const std::string alertState =
            settings.stateDirectory.empty()
                ? std::string()
                : settings.stateDirectory + "/sel-alerts-" + session->peerKey();
        SelCopyPlace selCopy;
        if (!settings.stateDirectory.empty())
        {
            selCopy.bmcKey = session->peerKey();
            selCopy.file =
                settings.stateDirectory + "/sel-copy-" + selCopy.bmcKey;
        }
        auto source = std::make_shared<IpmiSource>(
            std::move(session), std::move(describer), settings,
            "Baseboard Management Controller, " + peer, alertState,
            std::move(selCopy));
        const unsigned sessionIdleMs = std::min(settings.timeoutMs / 2, 15000u);
        if (settings.interface == Interface::Lan &&
            settings.pollIntervalMs >= sessionIdleMs)
        {
            logLine(logLevelInfo, "makeIpmiSource", __LINE__,
                    "ipmi.poll-interval " +
                        std::to_string(settings.pollIntervalMs) +
                        " ms is not below " + std::to_string(sessionIdleMs) +
                        " ms: every poll opens a new LAN session");
        }
        logLine(logLevelInfo, "makeIpmiSource", __LINE__,
                "IPMI instrumentation: " + peer + ", privilege " +
                    settings.privilege + ", timeout " +
                    std::to_string(settings.timeoutMs) + " ms");
        return source;
    }
    catch (const std::exception& error)
    {
        logLine(logLevelFailure, "makeIpmiSource", __LINE__,
                std::string("IPMI instrumentation refused: ") + error.what());
        throw;
    }
}

} // namespace QX::Ipmi
