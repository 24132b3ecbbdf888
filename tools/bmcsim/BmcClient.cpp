#include "BmcClient.h"

#include "SimulatedBmc.h"

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <stdexcept>

namespace bmcsim
{

QX::Ipmi::SessionParameters sessionTo(const std::string& host,
                                      const std::string& user,
                                      const std::string& password,
                                      unsigned timeoutMs)
{
    QX::Ipmi::SessionParameters parameters;
    parameters.lan = true;
    parameters.host = host;
    parameters.user = user;
    parameters.password = password;
    parameters.privilege = IPMI_PRIVILEGE_LEVEL_ADMIN;
    parameters.cipherSuite = 3;
    parameters.sessionTimeoutMs = timeoutMs;
    parameters.retransmissionTimeoutMs = std::min(timeoutMs / 4, 250u);
    parameters.workaroundFlags =
        IPMI_WORKAROUND_FLAGS_OUTOFBAND_2_0_OPEN_SESSION_PRIVILEGE;
    return parameters;
}

std::vector<std::uint16_t> addRecordsAt(const std::string& host,
                                        const std::string& user,
                                        const std::string& password,
                                        const std::vector<Record>& records)
{
    QX::Ipmi::IpmiContext context(sessionTo(host, user, password, 2000));
    std::vector<std::uint16_t> ids;
    for (const Record& record : records)
    {
        std::uint8_t request[17] = {0x44}; // Add SEL Entry
        std::memcpy(request + 1, record.data(), record.size());
        std::uint8_t response[16] = {};
        const int length =
            ipmi_cmd_raw(context.get(), 0, IPMI_NET_FN_STORAGE_RQ, request,
                         sizeof request, response, sizeof response);
        if (length < 0)
        {
            context.fail("ipmi_cmd_raw(Add SEL Entry)");
        }
        if (length < 4 || response[1] != 0)
        {
            char code[8];
            std::snprintf(code, sizeof code, "%02Xh",
                          length >= 2 ? response[1] : 0xFF);
            throw std::runtime_error(
                std::string("Add SEL Entry failed with completion code ") +
                code);
        }
        ids.push_back(
            static_cast<std::uint16_t>(response[2] | response[3] << 8));
    }
    return ids;
}

namespace
{

// Sends one raw request; throws unless the BMC answers with success.
std::vector<std::uint8_t> rawCommand(QX::Ipmi::IpmiContext& context,
                                     std::uint8_t netFn,
                                     std::vector<std::uint8_t> request,
                                     const char* what)
{
    std::uint8_t response[64] = {};
    const int length = ipmi_cmd_raw(context.get(), 0, netFn, request.data(),
                                    static_cast<unsigned>(request.size()),
                                    response, sizeof response);
    if (length < 0)
    {
        context.fail(what);
    }
    if (length < 2 || response[1] != 0)
    {
        char code[8];
        std::snprintf(code, sizeof code, "%02Xh",
                      length >= 2 ? response[1] : 0xFF);
        throw std::runtime_error(std::string(what) +
                                 " failed with completion code " + code);
    }
    return std::vector<std::uint8_t>(response, response + length);
}

} // namespace

void clearSelAt(const std::string& host, const std::string& user,
                const std::string& password)
{
    QX::Ipmi::IpmiContext context(sessionTo(host, user, password, 2000));
    std::vector<std::uint8_t> reserved{0, 0, 0, 0};
    try
    {
        reserved =
            rawCommand(context, IPMI_NET_FN_STORAGE_RQ, {0x42}, "Reserve SEL");
    }
    catch (const std::runtime_error&)
    {
        // A BMC that refuses reservations takes reservation 0.
    }
    if (reserved.size() < 4)
    {
        throw std::runtime_error("Reserve SEL gave a short answer");
    }
    // Clear SEL: reservation, "CLR", initiate erase.
    rawCommand(context, IPMI_NET_FN_STORAGE_RQ,
               {0x47, reserved[2], reserved[3], 'C', 'L', 'R', 0xAA},
               "Clear SEL");
}

void startWatchdogAt(const std::string& host, const std::string& user,
                     const std::string& password, WatchdogAction action,
                     unsigned tenths)
{
    QX::Ipmi::IpmiContext context(sessionTo(host, user, password, 2000));
    // Set Watchdog Timer: use SMS/OS (04h), the action, no pre-timeout,
    // clear the SMS/OS expiration flag, the countdown in 100 ms.
    rawCommand(context, IPMI_NET_FN_APP_RQ,
               {0x24, 0x04, static_cast<std::uint8_t>(action), 0x00, 0x10,
                static_cast<std::uint8_t>(tenths & 0xFF),
                static_cast<std::uint8_t>(tenths >> 8)},
               "Set Watchdog Timer");
    rawCommand(context, IPMI_NET_FN_APP_RQ, {0x22}, "Reset Watchdog Timer");
}

void setSelTimeAt(const std::string& host, const std::string& user,
                  const std::string& password, std::uint32_t secondsSinceEpoch)
{
    QX::Ipmi::IpmiContext context(sessionTo(host, user, password, 2000));
    QX::Ipmi::FiidObject response(tmpl_cmd_set_sel_time_rs);
    context.check(
        ipmi_cmd_set_sel_time(context.get(), secondsSinceEpoch, response.get()),
        "ipmi_cmd_set_sel_time", response, IPMI_NET_FN_STORAGE_RQ);
}

} // namespace bmcsim
