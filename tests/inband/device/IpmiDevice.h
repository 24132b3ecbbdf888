#pragma once

// A stand-in for the kernel's IPMI device (/dev/ipmi0) at a path of the
// test's choosing, answered by a RawBmc. The process's open(), ioctl() and
// close() are interposed (DeviceCalls.cpp): calls for that path and the
// descriptors it gave go here, every other call goes on to the C library
// (or the sanitizer runtime in front of it). FreeIPMI's in-band driver
// runs unchanged against it.
//
// Each open gives a real eventfd, so that poll() and select() on it work
// without interposing: it is readable exactly while an answer waits.

#include "RawBmc.h"

#include <cstdint>
#include <deque>
#include <map>
#include <mutex>
#include <string>
#include <vector>

namespace inbandsim
{

/** One message as the device hands it over. */
struct Message
{
    std::vector<std::uint8_t> address; // struct ipmi_addr bytes
    long msgid = 0;
    std::uint8_t netFn = 0;
    std::uint8_t command = 0;
    std::vector<std::uint8_t> data;
};

/**
 * @brief The simulated device node. One at a time may be installed.
 *
 * While answering is stopped, requests are accepted and held, as a BMC
 * that no longer responds; resumeAnswering() answers them late.
 * Thread-safe.
 */
class IpmiDevice
{
  public:
    /** Installs the device at @p path; throws when one is installed. */
    explicit IpmiDevice(std::string path);
    /** Uninstalls it; descriptors still open stay with the C library. */
    ~IpmiDevice();
    IpmiDevice(const IpmiDevice&) = delete;
    IpmiDevice& operator=(const IpmiDevice&) = delete;

    const std::string& path() const
    {
        return path_;
    }

    /** Runs @p work on the BMC under the device's lock. */
    template <typename Work>
    auto withBmc(Work work)
    {
        const std::lock_guard lock(mutex_);
        return work(bmc_);
    }
    void stopAnswering();
    /** Answers every held request and answers again from now on. */
    void resumeAnswering();

    /** Requests received so far. */
    std::size_t requests() const;
    /** Descriptors of the device open now. */
    std::size_t openDescriptors() const;
    /** Request codes of ioctl calls the device does not know. */
    std::vector<unsigned long> unknownRequests() const;

    // The interposed calls (DeviceCalls.cpp) end here. Each returns the
    // call's result with errno set as the kernel would, or nothing when
    // the path or descriptor is not the device's.
    static bool claims(const char* path);
    /** Notes an open of @p path that goes on to the C library. */
    static void passedOn(const char* path);
    /** Opens of @p path that went on to the C library so far: the probes
     *  of devices that are not the simulated one. */
    static std::size_t passedOnOpens(const std::string& path);
    static int open();
    static bool owns(int fd);
    static int ioctl(int fd, unsigned long request, void* argument);
    static void closed(int fd);

  private:
    struct Channel
    {
        std::deque<Message> answers;
    };

    int send(int fd, const void* argument);
    int receive(int fd, void* argument, bool truncate);
    void deliver(int fd, const Message& request);
    static void signal(int fd, bool ready);

    std::string path_;
    mutable std::mutex mutex_;
    RawBmc bmc_;
    std::map<int, Channel> channels_;
    std::vector<std::pair<int, Message>> held_;
    bool answering_ = true;
    std::size_t requests_ = 0;
    std::vector<unsigned long> unknown_;
};

} // namespace inbandsim
