#pragma once

// Configuration texts and files for the platform tests.

#include "Configuration.h"

#include <cstdio>
#include <fstream>
#include <stdexcept>
#include <string>
#include <sys/stat.h>
#include <unistd.h>

namespace QX::test
{

/** The error that parsing @p text as "platform.conf" reports, or an empty
 *  text when it parses. */
inline std::string configurationError(const std::string& text)
{
    try
    {
        Platform::parseConfiguration(text, "platform.conf");
    }
    catch (const std::runtime_error& error)
    {
        return error.what();
    }
    return "";
}

/** A file in the temporary directory with @p text and @p mode, removed at
 *  the end of the test. */
class TempFile
{
  public:
    explicit TempFile(const std::string& text, mode_t mode = 0600)
    {
        char name[] = "/tmp/qx-platform-test-XXXXXX";
        const int fd = mkstemp(name);
        if (fd < 0)
        {
            throw std::runtime_error("mkstemp failed");
        }
        close(fd);
        path_ = name;
        std::ofstream(path_) << text;
        chmod(path_.c_str(), mode);
    }
    ~TempFile()
    {
        std::remove(path_.c_str());
    }
    TempFile(const TempFile&) = delete;
    TempFile& operator=(const TempFile&) = delete;

    const std::string& path() const
    {
        return path_;
    }

  private:
    std::string path_;
};

} // namespace QX::test
