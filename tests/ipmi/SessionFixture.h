#pragma once

// A FreeIPMI session of the platform's own against a freshly started
// simulated BMC, below the provider.

#include "SimulatedBmc.h"
#include "ipmi/IpmiSession.h"

#include <memory>

#include <gtest/gtest.h>

namespace bmctest
{

class SessionTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        if (!bmcsim::SimulatedBmc::available())
        {
            GTEST_SKIP() << "ipmi_sim is not installed (Debian package "
                            "openipmi): the BMC simulator tests are skipped";
        }
        bmc = std::make_unique<bmcsim::SimulatedBmc>(bmcsim::Options{});
        bmc->start();
    }

    /** A LAN session as administrator, with @p timeoutMs of session
     *  timeout and 200 ms between retransmissions. */
    QX::Ipmi::SessionParameters parameters(unsigned timeoutMs = 1000) const
    {
        QX::Ipmi::SessionParameters p;
        p.lan = true;
        p.host = bmc->host();
        p.user = "admin";
        p.password = "password";
        p.privilege = IPMI_PRIVILEGE_LEVEL_ADMIN;
        p.sessionTimeoutMs = timeoutMs;
        p.retransmissionTimeoutMs = 200;
        p.workaroundFlags =
            IPMI_WORKAROUND_FLAGS_OUTOFBAND_2_0_OPEN_SESSION_PRIVILEGE;
        return p;
    }

    std::unique_ptr<bmcsim::SimulatedBmc> bmc;
};

} // namespace bmctest
