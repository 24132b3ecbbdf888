#include "AtomicFile.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <stdexcept>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace QX::Ipmi
{

namespace
{

// Closes a descriptor on every way out.
class Descriptor
{
  public:
    explicit Descriptor(int fd) : fd_(fd) {}
    ~Descriptor()
    {
        if (fd_ >= 0)
        {
            ::close(fd_);
        }
    }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;

    int get() const
    {
        return fd_;
    }
    /** Closes now; false (errno set) when the close failed. */
    bool close()
    {
        const int fd = fd_;
        fd_ = -1;
        return ::close(fd) == 0;
    }

  private:
    int fd_;
};

[[noreturn]] void fail(const std::string& what, const std::string& path,
                       int error)
{
    throw std::runtime_error(what + " " + path + ": " + std::strerror(error));
}

} // namespace

void writeFileAtomically(const std::string& path, std::string_view content)
{
    const std::filesystem::path target(path);
    const std::filesystem::path directory = target.parent_path();
    if (!directory.empty())
    {
        std::error_code ignored;
        std::filesystem::create_directories(directory, ignored);
    }
    // mkostemp creates the file with mode 0600 and a name of its own.
    std::string pattern = path + ".XXXXXX";
    std::vector<char> name(pattern.begin(), pattern.end());
    name.push_back('\0');
    Descriptor file(::mkostemp(name.data(), O_CLOEXEC));
    const std::string temporary(name.data());
    if (file.get() < 0)
    {
        fail("cannot create", temporary, errno);
    }
    const auto discard = [&temporary](const char* what)
    {
        const int error = errno;
        ::unlink(temporary.c_str());
        fail(what, temporary, error);
    };
    std::size_t written = 0;
    while (written < content.size())
    {
        const ssize_t put = ::write(file.get(), content.data() + written,
                                    content.size() - written);
        if (put < 0 && errno == EINTR)
        {
            continue;
        }
        if (put < 0)
        {
            discard("cannot write");
        }
        written += static_cast<std::size_t>(put);
    }
    if (::fchmod(file.get(), S_IRUSR | S_IWUSR) != 0)
    {
        discard("cannot set the mode of");
    }
    if (::fsync(file.get()) != 0)
    {
        discard("cannot flush");
    }
    if (!file.close())
    {
        discard("cannot close");
    }
    if (::rename(temporary.c_str(), path.c_str()) != 0)
    {
        const int error = errno;
        ::unlink(temporary.c_str());
        fail("cannot rename to", path, error);
    }
    // The rename itself lasts once the directory is on the disk.
    const std::string dirName = directory.empty() ? "." : directory.string();
    Descriptor dir(::open(dirName.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (dir.get() >= 0)
    {
        ::fsync(dir.get());
    }
}

std::optional<std::string>
readSmallFile(const std::string& path, std::size_t limit, std::string& problem)
{
    Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (file.get() < 0)
    {
        problem = std::strerror(errno);
        return std::nullopt;
    }
    std::string text;
    char buffer[16384];
    for (;;)
    {
        const ssize_t got = ::read(file.get(), buffer, sizeof buffer);
        if (got < 0 && errno == EINTR)
        {
            continue;
        }
        if (got < 0)
        {
            problem = std::strerror(errno);
            return std::nullopt;
        }
        if (got == 0)
        {
            break;
        }
        text.append(buffer, static_cast<std::size_t>(got));
        if (text.size() > limit)
        {
            problem = "the file is too long";
            return std::nullopt;
        }
    }
    return text;
}

} // namespace QX::Ipmi
