// A new provider load over the SEL copy an earlier load kept in the state
// directory, on OpenIPMI's simulated BMC over LAN 2.0: the enumeration is
// the SEL ipmitool reads, and an unchanged SEL is confirmed rather than
// read again.

#include "BmcFixture.h"
#include "ipmi/IpmiSource.h"

#include <ctime>
#include <filesystem>

#include <gtest/gtest.h>

namespace
{

using bmctest::BmcTest;
using bmctest::text;

class KeptCopyOnBmcTest : public BmcTest
{
  protected:
    std::uint64_t requests()
    {
        const auto ipmi =
            std::dynamic_pointer_cast<QX::Ipmi::IpmiSource>(source);
        return ipmi ? ipmi->requestCount() : 0;
    }

    /** Enumerates the entries, checks them against ipmitool and returns
     *  the IPMI requests the enumeration cost. */
    std::uint64_t enumerateAndCompare()
    {
        const std::uint64_t before = requests();
        const auto outcome = enumerate("ZAN_MgmtHwLogEntry");
        const std::uint64_t cost = requests() - before;
        EXPECT_EQ(outcome.rc, CMPI_RC_OK);
        const auto expected = ipmitoolRecords();
        EXPECT_EQ(outcome.instances.size(), expected.size());
        for (std::size_t i = 0;
             i < expected.size() && i < outcome.instances.size(); ++i)
        {
            EXPECT_EQ(text(outcome.instances[i], "RecordID"),
                      std::to_string(expected[i].id));
            EXPECT_EQ(text(outcome.instances[i], "RecordData"),
                      expected[i].bytes);
        }
        return cost;
    }

    void reload()
    {
        stopProvider();
        startProvider();
    }

    std::string copyFile() const
    {
        for (const auto& entry :
             std::filesystem::directory_iterator(settings(2000).stateDirectory))
        {
            if (entry.path().filename().string().starts_with("sel-copy-"))
            {
                return entry.path().string();
            }
        }
        return {};
    }

    static bmcsim::Options generated(unsigned count)
    {
        bmcsim::Options options;
        options.records = bmcsim::generatedRecords(
            count, 1, static_cast<std::uint32_t>(std::time(nullptr)));
        options.sensors = bmcsim::sampleSensors();
        options.maxRecords = count + 50;
        return options;
    }
};

TEST_F(KeptCopyOnBmcTest, UnchangedSelAfterARestartCostsAWarmLook)
{
    start(generated(80));
    enumerateAndCompare();
    ASSERT_FALSE(copyFile().empty());
    const std::uint64_t warm = enumerateAndCompare();
    reload();
    // The restart cause is asked once per session besides a warm look.
    EXPECT_LE(enumerateAndCompare(), warm + 1);
}

TEST_F(KeptCopyOnBmcTest, OneEnumerationOfAnUnchangedSelAsksTheBmcOnce)
{
    start(generated(80));
    // Requests back to back, so that the session stays open: a new
    // session asks the restart cause again.
    const auto cost = [this]
    {
        const std::uint64_t before = requests();
        const auto outcome = enumerate("ZAN_MgmtHwLogEntry");
        EXPECT_EQ(outcome.rc, CMPI_RC_OK);
        EXPECT_EQ(outcome.instances.size(), 80u);
        return requests() - before;
    };
    cost(); // reads the SEL and keeps the copy
    // Get SEL Info and the newest record, once for the whole request
    // although it walks the tree with two cursors.
    EXPECT_EQ(cost(), 2u);
    reload();
    // A new load over the kept copy: the same two, and Get System Restart
    // Cause once for the new session.
    EXPECT_EQ(cost(), 3u);
    EXPECT_EQ(cost(), 2u);
    // And what it shows is the SEL ipmitool reads.
    enumerateAndCompare();
}

TEST_F(KeptCopyOnBmcTest, RecordsAddedAndAClearMeanwhileAreSeen)
{
    start(generated(60));
    const std::uint64_t cold = enumerateAndCompare();
    reload();
    bmc().addRecords(bmcsim::generatedRecords(
        10, 1, static_cast<std::uint32_t>(std::time(nullptr))));
    const std::uint64_t added = enumerateAndCompare();
    EXPECT_LT(added, cold / 2);
    reload();
    bmc().clearSel();
    const auto outcome = enumerate("ZAN_MgmtHwLogEntry");
    ASSERT_EQ(outcome.rc, CMPI_RC_OK);
    EXPECT_EQ(outcome.instances.size(), ipmitoolEntries());
    EXPECT_LT(outcome.instances.size(), 60u);
}

TEST_F(KeptCopyOnBmcTest, DamagedCopyIsAWholeRead)
{
    start(generated(40));
    const std::uint64_t cold = enumerateAndCompare();
    const std::string file = copyFile();
    ASSERT_FALSE(file.empty());
    stopProvider();
    std::filesystem::resize_file(file, std::filesystem::file_size(file) / 2);
    startProvider();
    EXPECT_GE(enumerateAndCompare(), cold - 2);
}

} // namespace
