#include "IpmiDevice.h"

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstring>
#include <linux/ipmi.h>
#include <stdexcept>
#include <sys/eventfd.h>
#include <sys/ioctl.h>
#include <unistd.h>

namespace inbandsim
{

namespace
{

std::atomic<IpmiDevice*> installed{nullptr};

std::vector<std::uint8_t> bytes(const unsigned char* data, std::size_t length)
{
    if (data == nullptr || length == 0)
    {
        return {};
    }
    return {data, data + length};
}

int failWith(int error)
{
    errno = error;
    return -1;
}

} // namespace

IpmiDevice::IpmiDevice(std::string path) : path_(std::move(path))
{
    IpmiDevice* expected = nullptr;
    if (!installed.compare_exchange_strong(expected, this))
    {
        throw std::logic_error("a simulated IPMI device is installed already");
    }
}

IpmiDevice::~IpmiDevice()
{
    installed.store(nullptr);
}

void IpmiDevice::stopAnswering()
{
    const std::lock_guard lock(mutex_);
    answering_ = false;
}

void IpmiDevice::resumeAnswering()
{
    const std::lock_guard lock(mutex_);
    answering_ = true;
    for (const auto& [fd, request] : held_)
    {
        if (channels_.contains(fd))
        {
            deliver(fd, request);
        }
    }
    held_.clear();
}

std::size_t IpmiDevice::requests() const
{
    const std::lock_guard lock(mutex_);
    return requests_;
}

std::size_t IpmiDevice::openDescriptors() const
{
    const std::lock_guard lock(mutex_);
    return channels_.size();
}

std::vector<unsigned long> IpmiDevice::unknownRequests() const
{
    const std::lock_guard lock(mutex_);
    return unknown_;
}

bool IpmiDevice::claims(const char* path)
{
    const IpmiDevice* device = installed.load();
    return device != nullptr && path != nullptr && device->path_ == path;
}

namespace
{

std::mutex passedOnMutex;
std::map<std::string, std::size_t> passedOnCounts;

} // namespace

void IpmiDevice::passedOn(const char* path)
{
    // Device nodes only: the count is of probes, not of every file the
    // process opens.
    if (path != nullptr && std::strncmp(path, "/dev/", 5) == 0)
    {
        const std::lock_guard lock(passedOnMutex);
        ++passedOnCounts[path];
    }
}

std::size_t IpmiDevice::passedOnOpens(const std::string& path)
{
    const std::lock_guard lock(passedOnMutex);
    const auto found = passedOnCounts.find(path);
    return found == passedOnCounts.end() ? 0 : found->second;
}

int IpmiDevice::open()
{
    IpmiDevice* device = installed.load();
    if (device == nullptr)
    {
        return failWith(ENOENT);
    }
    const int fd = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    if (fd < 0)
    {
        return -1;
    }
    const std::lock_guard lock(device->mutex_);
    device->channels_[fd] = Channel{};
    return fd;
}

bool IpmiDevice::owns(int fd)
{
    IpmiDevice* device = installed.load();
    if (device == nullptr)
    {
        return false;
    }
    const std::lock_guard lock(device->mutex_);
    return device->channels_.contains(fd);
}

void IpmiDevice::closed(int fd)
{
    IpmiDevice* device = installed.load();
    if (device == nullptr)
    {
        return;
    }
    const std::lock_guard lock(device->mutex_);
    device->channels_.erase(fd);
    std::erase_if(device->held_,
                  [fd](const auto& held) { return held.first == fd; });
}

int IpmiDevice::ioctl(int fd, unsigned long request, void* argument)
{
    IpmiDevice* device = installed.load();
    if (device == nullptr)
    {
        return failWith(EBADF);
    }
    if (argument == nullptr)
    {
        return failWith(EFAULT);
    }
    switch (request)
    {
        case IPMICTL_SEND_COMMAND:
            return device->send(fd, argument);
        case IPMICTL_RECEIVE_MSG_TRUNC:
            return device->receive(fd, argument, true);
        case IPMICTL_RECEIVE_MSG:
            return device->receive(fd, argument, false);
        case IPMICTL_SET_GETS_EVENTS_CMD:
        case IPMICTL_SET_MY_ADDRESS_CMD:
            return 0;
        case IPMICTL_GET_MY_ADDRESS_CMD:
            *static_cast<unsigned int*>(argument) = 0x20;
            return 0;
        default:
        {
            const std::lock_guard lock(device->mutex_);
            device->unknown_.push_back(request);
            return failWith(ENOTTY);
        }
    }
}

int IpmiDevice::send(int fd, const void* argument)
{
    const auto* request = static_cast<const ipmi_req*>(argument);
    if (request->addr == nullptr ||
        request->addr_len < sizeof(ipmi_system_interface_addr) ||
        request->addr_len > sizeof(ipmi_addr) ||
        (request->msg.data_len != 0 && request->msg.data == nullptr))
    {
        return failWith(EINVAL);
    }
    ipmi_system_interface_addr address{};
    std::memcpy(&address, request->addr, sizeof address);
    if (address.addr_type != IPMI_SYSTEM_INTERFACE_ADDR_TYPE)
    {
        // Only the BMC itself is simulated: nothing behind it on IPMB.
        return failWith(EINVAL);
    }
    Message message;
    message.address = bytes(request->addr, request->addr_len);
    message.msgid = request->msgid;
    message.netFn = request->msg.netfn;
    message.command = request->msg.cmd;
    message.data = bytes(request->msg.data, request->msg.data_len);

    const std::lock_guard lock(mutex_);
    if (!channels_.contains(fd))
    {
        return failWith(EBADF);
    }
    ++requests_;
    if (!answering_)
    {
        held_.emplace_back(fd, std::move(message));
        return 0;
    }
    deliver(fd, message);
    return 0;
}

void IpmiDevice::deliver(int fd, const Message& request)
{
    Message answer;
    answer.address = request.address;
    answer.msgid = request.msgid;
    answer.netFn = static_cast<std::uint8_t>(request.netFn | 1);
    answer.command = request.command;
    answer.data = bmc_.answer(request.netFn, request.command, request.data);
    Channel& channel = channels_.at(fd);
    channel.answers.push_back(std::move(answer));
    signal(fd, true);
}

int IpmiDevice::receive(int fd, void* argument, bool truncate)
{
    auto* out = static_cast<ipmi_recv*>(argument);
    const std::lock_guard lock(mutex_);
    const auto channel = channels_.find(fd);
    if (channel == channels_.end())
    {
        return failWith(EBADF);
    }
    if (channel->second.answers.empty())
    {
        return failWith(EAGAIN);
    }
    const Message& answer = channel->second.answers.front();
    if (out->addr == nullptr || out->addr_len < answer.address.size())
    {
        return failWith(EINVAL);
    }
    const bool tooLong = answer.data.size() > out->msg.data_len;
    if (tooLong && !truncate)
    {
        return failWith(EMSGSIZE);
    }
    const std::size_t length =
        std::min<std::size_t>(answer.data.size(), out->msg.data_len);
    if (length != 0 && out->msg.data == nullptr)
    {
        return failWith(EFAULT);
    }
    out->recv_type = IPMI_RESPONSE_RECV_TYPE;
    std::memcpy(out->addr, answer.address.data(), answer.address.size());
    out->addr_len = static_cast<unsigned>(answer.address.size());
    out->msgid = answer.msgid;
    out->msg.netfn = answer.netFn;
    out->msg.cmd = answer.command;
    out->msg.data_len = static_cast<unsigned short>(length);
    if (length != 0)
    {
        std::memcpy(out->msg.data, answer.data.data(), length);
    }
    channel->second.answers.pop_front();
    if (channel->second.answers.empty())
    {
        signal(fd, false);
    }
    return tooLong ? failWith(EMSGSIZE) : 0;
}

void IpmiDevice::signal(int fd, bool ready)
{
    // The eventfd counter is the "answer waiting" flag: 1 or 0.
    eventfd_t value = 0;
    ::eventfd_read(fd, &value);
    if (ready)
    {
        ::eventfd_write(fd, 1);
    }
}

} // namespace inbandsim
