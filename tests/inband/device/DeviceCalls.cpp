// The process's open(), ioctl() and close(), defined in the test
// executable so that they come before the C library's for every shared
// library it loads (FreeIPMI among them). Calls for the simulated device
// go to IpmiDevice; all others go on to the next definition, which is the
// sanitizer runtime's in sanitizer builds, else the C library's.

#include "IpmiDevice.h"

#include <cstdarg>
#include <dlfcn.h>
#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

namespace
{

template <typename Function>
Function next(const char* name)
{
    // NOLINTNEXTLINE(cppcoreguidelines-pro-type-reinterpret-cast)
    return reinterpret_cast<Function>(::dlsym(RTLD_NEXT, name));
}

} // namespace

extern "C"
{

    int open(const char* path, int flags, ...)
    {
        mode_t mode = 0;
        if ((flags & O_CREAT) != 0 || (flags & O_TMPFILE) == O_TMPFILE)
        {
            va_list arguments;
            va_start(arguments, flags);
            mode = va_arg(arguments, mode_t);
            va_end(arguments);
        }
        if (inbandsim::IpmiDevice::claims(path))
        {
            return inbandsim::IpmiDevice::open();
        }
        inbandsim::IpmiDevice::passedOn(path);
        static const auto forward =
            next<int (*)(const char*, int, ...)>("open");
        return forward(path, flags, mode);
    }

    int ioctl(int fd, unsigned long request, ...)
    {
        va_list arguments;
        va_start(arguments, request);
        void* argument = va_arg(arguments, void*);
        va_end(arguments);
        if (inbandsim::IpmiDevice::owns(fd))
        {
            return inbandsim::IpmiDevice::ioctl(fd, request, argument);
        }
        static const auto forward =
            next<int (*)(int, unsigned long, ...)>("ioctl");
        return forward(fd, request, argument);
    }

    int close(int fd)
    {
        inbandsim::IpmiDevice::closed(fd);
        static const auto forward = next<int (*)(int)>("close");
        return forward(fd);
    }

} // extern "C"
