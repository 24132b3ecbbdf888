// A machine without an in-band BMC, as a virtual machine with the package
// installed is: every request finds nothing, and the probe for a BMC is
// not repeated on every request (FreeIPMI's probe leaks memory each time
// it finds nothing, and opens every device it knows).

#include "InbandFixture.h"
#include "SelRequests.h"

#include <filesystem>

#include <gtest/gtest.h>

namespace
{

using namespace inbandtest;

constexpr const char* kernelDevice = "/dev/ipmi0";

TEST_F(InbandTest, AMachineWithoutABmcIsNotProbedOnEveryRequest)
{
    std::error_code error;
    if (std::filesystem::exists(kernelDevice, error))
    {
        GTEST_SKIP() << "this machine has an in-band IPMI device";
    }
    loadProbing();
    const std::size_t before =
        inbandsim::IpmiDevice::passedOnOpens(kernelDevice);
    const host::Outcome first = enumerate("ZAN_MgmtHwLogEntry");
    const std::size_t probed =
        inbandsim::IpmiDevice::passedOnOpens(kernelDevice);
    ASSERT_GT(probed, before) << "the first request did not look for a BMC";

    const host::Outcome second = enumerate("ZAN_MgmtHwLogEntry");
    const host::Outcome log = enumerate("ZAN_MgmtHwLog");
    EXPECT_EQ(inbandsim::IpmiDevice::passedOnOpens(kernelDevice), probed);
    for (const host::Outcome* outcome : {&first, &second, &log})
    {
        EXPECT_TRUE(outcome->instances.empty());
        EXPECT_EQ(outcome->rc, first.rc);
    }
    EXPECT_EQ(device().requests(), 0u);
}

} // namespace
