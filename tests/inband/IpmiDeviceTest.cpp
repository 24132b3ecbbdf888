// The simulated IPMI device node itself, through the process's open(),
// ioctl(), poll() and close(), as FreeIPMI's driver uses them.

#include "IpmiDevice.h"

#include <array>
#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <linux/ipmi.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <gtest/gtest.h>

namespace
{

using inbandsim::IpmiDevice;

class IpmiDeviceTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        fd = ::open(device.path().c_str(), O_RDWR);
        ASSERT_GE(fd, 0);
    }
    void TearDown() override
    {
        if (fd >= 0)
        {
            ::close(fd);
        }
    }

    /** Sends Get Device ID with message id @p msgid. */
    int sendGetDeviceId(long msgid)
    {
        ipmi_system_interface_addr address{};
        address.addr_type = IPMI_SYSTEM_INTERFACE_ADDR_TYPE;
        address.channel = IPMI_BMC_CHANNEL;
        ipmi_req request{};
        request.addr = reinterpret_cast<unsigned char*>(&address);
        request.addr_len = sizeof address;
        request.msgid = msgid;
        request.msg.netfn = inbandsim::netFnApp;
        request.msg.cmd = 0x01;
        return ::ioctl(fd, IPMICTL_SEND_COMMAND, &request);
    }
    bool readable() const
    {
        pollfd entry{fd, POLLIN, 0};
        return ::poll(&entry, 1, 0) == 1 && (entry.revents & POLLIN) != 0;
    }

    IpmiDevice device{
        (std::filesystem::temp_directory_path() / "selprov-no-such-ipmi0")
            .string()};
    int fd = -1;
    ipmi_addr answerAddress{};
    std::array<unsigned char, 64> answerData{};
    ipmi_recv answer{0,
                     reinterpret_cast<unsigned char*>(&answerAddress),
                     sizeof answerAddress,
                     0,
                     {0, 0, static_cast<unsigned short>(answerData.size()),
                      answerData.data()}};
};

TEST_F(IpmiDeviceTest, AnswerArrivesWithTheRequestsIdAndResponseNetFn)
{
    EXPECT_FALSE(readable());
    ASSERT_EQ(sendGetDeviceId(41), 0);
    EXPECT_TRUE(readable());
    ASSERT_EQ(::ioctl(fd, IPMICTL_RECEIVE_MSG_TRUNC, &answer), 0);
    EXPECT_EQ(answer.recv_type, IPMI_RESPONSE_RECV_TYPE);
    EXPECT_EQ(answer.msgid, 41);
    EXPECT_EQ(answer.msg.netfn, inbandsim::netFnApp + 1);
    EXPECT_EQ(answer.msg.cmd, 0x01);
    ASSERT_GE(answer.msg.data_len, 1);
    EXPECT_EQ(answerData[0], 0x00) << "completion code";
    EXPECT_FALSE(readable());
    EXPECT_EQ(device.requests(), 1u);
}

TEST_F(IpmiDeviceTest, ReceiveWithoutAnAnswerIsEagain)
{
    errno = 0;
    EXPECT_EQ(::ioctl(fd, IPMICTL_RECEIVE_MSG_TRUNC, &answer), -1);
    EXPECT_EQ(errno, EAGAIN);
}

TEST_F(IpmiDeviceTest, SilentBmcHoldsTheRequestUntilItAnswersAgain)
{
    device.stopAnswering();
    ASSERT_EQ(sendGetDeviceId(7), 0);
    pollfd entry{fd, POLLIN, 0};
    EXPECT_EQ(::poll(&entry, 1, 50), 0) << "an answer from a silent BMC";
    device.resumeAnswering();
    EXPECT_TRUE(readable());
    ASSERT_EQ(::ioctl(fd, IPMICTL_RECEIVE_MSG_TRUNC, &answer), 0);
    EXPECT_EQ(answer.msgid, 7);
}

TEST_F(IpmiDeviceTest, UnknownRequestIsRefusedAndNoted)
{
    int value = 0;
    errno = 0;
    EXPECT_EQ(::ioctl(fd, IPMICTL_REGISTER_FOR_CMD, &value), -1);
    EXPECT_EQ(errno, ENOTTY);
    ASSERT_EQ(device.unknownRequests().size(), 1u);
    EXPECT_EQ(device.unknownRequests()[0],
              static_cast<unsigned long>(IPMICTL_REGISTER_FOR_CMD));
}

TEST_F(IpmiDeviceTest, OtherPathsAndDescriptorsReachTheSystem)
{
    const int other = ::open("/dev/null", O_RDONLY);
    ASSERT_GE(other, 0);
    EXPECT_EQ(device.openDescriptors(), 1u);
    int pending = -1;
    // /dev/null is no terminal: the system refuses, not the device.
    errno = 0;
    EXPECT_EQ(::ioctl(other, TIOCINQ, &pending), -1);
    EXPECT_EQ(errno, ENOTTY);
    EXPECT_TRUE(device.unknownRequests().empty());
    EXPECT_EQ(::close(other), 0);

    EXPECT_EQ(::close(fd), 0);
    fd = -1;
    EXPECT_EQ(device.openDescriptors(), 0u);
}

} // namespace
