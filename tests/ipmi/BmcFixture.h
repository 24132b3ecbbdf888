#pragma once

// The provider library loaded through its exported factories, as an
// object manager loads it, on a platform whose instrumentation source is
// the IPMI source talking to OpenIPMI's BMC simulator over LAN 2.0.

#include "Host.h"
#include "InstrumentationSource.h"
#include "SimulatedBmc.h"
#include "ipmi/IpmiSettings.h"

#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace bmctest
{

/** One record of ipmitool's view of the SEL. */
struct IpmitoolRecord
{
    unsigned id = 0;
    std::string bytes; // 16 lower-case hex pairs, blank separated
};

class BmcTest : public ::testing::Test
{
  protected:
    void SetUp() override;
    void TearDown() override;

    /** Starts the simulator, then the IPMI source and the provider. */
    void start(bmcsim::Options options, unsigned timeoutMs = 2000);
    /** Unloads the provider and ends the IPMI source, as when the object
     *  manager stops; the simulator keeps running. */
    void stopProvider();
    /** A new IPMI source (same state directory) and the provider loaded
     *  again, as when the object manager starts again. */
    void startProvider(unsigned timeoutMs = 2000);
    /** The settings the source is made with (LAN 2.0 to the simulator). */
    QX::Ipmi::Settings settings(unsigned timeoutMs) const;

    host::Host& host()
    {
        return *host_;
    }
    bmcsim::SimulatedBmc& bmc()
    {
        return *bmc_;
    }
    host::Outcome enumerate(const std::string& className);
    host::Outcome clearLog();

    /** Runs ipmitool against the simulator (TZ=UTC), returns its output. */
    std::string ipmitool(const std::string& arguments) const;
    /** The SEL as ipmitool reads it: every record, raw. */
    std::vector<IpmitoolRecord> ipmitoolRecords() const;
    unsigned ipmitoolEntries() const;

    std::shared_ptr<QX::InstrumentationSource> source;
    /** How often the source's monitoring polls the simulator. */
    unsigned pollIntervalMs = 5000;

  private:
    std::unique_ptr<bmcsim::SimulatedBmc> bmc_;
    std::unique_ptr<host::Host> host_;
};

/** Text property of an instance, "" when absent. */
std::string text(const host::Instance& instance, const std::string& name);
/** Unsigned property of an instance; fails the test when absent. */
std::uint64_t number(const host::Instance& instance, const std::string& name);

} // namespace bmctest
