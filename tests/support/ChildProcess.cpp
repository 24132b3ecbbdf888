#include "ChildProcess.h"

#include <array>
#include <cstdio>
#include <sys/wait.h>

namespace testsupport
{

CommandRun runCommand(const std::string& commandLine)
{
    CommandRun run;
    // The shell runs the command as a user would, with its output
    // redirected as the command line says.
    // NOLINTNEXTLINE(cert-env33-c)
    FILE* pipe = ::popen(commandLine.c_str(), "r");
    if (pipe == nullptr)
    {
        return run;
    }
    run.started = true;
    std::array<char, 4096> buffer{};
    std::size_t read = 0;
    while ((read = std::fread(buffer.data(), 1, buffer.size(), pipe)) > 0)
    {
        run.output.append(buffer.data(), read);
    }
    const int status = ::pclose(pipe);
    run.exitCode = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    return run;
}

} // namespace testsupport
