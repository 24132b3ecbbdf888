#pragma once

// The provider library loaded through its exported factories, as an
// object manager loads it, on a platform configured (through its
// configuration file) for the in-band interface: FreeIPMI's driver for the
// kernel's IPMI device, here a simulated device node answered by a
// simulated BMC.

#include "Host.h"
#include "IndicationInbox.h"
#include "IpmiDevice.h"

#include <chrono>
#include <memory>
#include <set>
#include <string>

#include <gtest/gtest.h>

namespace inbandtest
{

/** What a test waits at most for something that should happen. */
constexpr std::chrono::seconds patience{10};

class InbandTest : public ::testing::Test
{
  protected:
    void SetUp() override;
    void TearDown() override;

    /** Writes the configuration and loads the provider. */
    void load(unsigned timeoutMs = 1000, unsigned pollMs = 150);
    /** Loads the provider on a platform that probes for an in-band BMC
     *  itself, as an installed one does. */
    void loadProbing();
    /** Unloads the provider as an object manager does, then ends the
     *  platform's source, as unloading the platform library does. */
    void unload();

    host::Host& host()
    {
        return *host_;
    }
    inbandsim::IpmiDevice& device()
    {
        return *device_;
    }
    /** Adds @p count temperature records to the simulated BMC; returns the
     *  last record id. */
    std::uint16_t addRecords(unsigned count);
    /** Adds @p record with Add SEL Entry through a FreeIPMI context of
     *  its own on the device, as another agent on the server would;
     *  returns the record id the BMC gave it. */
    std::uint16_t addThroughDriver(const inbandsim::Record& record);

    host::Outcome enumerate(const std::string& className);
    /** Adds @p records records, loads the provider and enumerates
     *  @p className, expecting the request to succeed. */
    host::Outcome loadAndEnumerate(unsigned records,
                                   const std::string& className);
    host::Outcome clearLog();

    std::string directory;
    std::string devicePath;

  private:
    /** Writes @p settings as the configuration and loads the provider. */
    void loadWith(const std::string& settings);

    std::unique_ptr<inbandsim::IpmiDevice> device_;
    std::unique_ptr<host::Host> host_;
};

/** A temperature event record (the BMC sets id and time). */
inbandsim::Record temperatureRecord(std::uint8_t reading);

/** Thread ids of this process named as the in-band exchange worker. */
std::set<std::string> exchangeWorkerIds();
/** How many threads of this process are named as the exchange worker. */
std::size_t exchangeWorkers();
/** Exchange workers left after a short grace: a joined thread may still
 *  be listed for a moment while the kernel takes it down. */
std::size_t exchangeWorkersAfterGrace();

/** Text property of an instance, "" when absent. */
std::string text(const host::Instance& instance, const std::string& name);

} // namespace inbandtest
