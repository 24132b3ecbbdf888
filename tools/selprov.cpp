// selprov: load the SEL provider into the in-process host and run one CIM
// operation on it, printing the result as MOF-like text or JSON.
#include "CommandLine.h"
#include "Host.h"
#include "Platform.h"
#include "Printing.h"
#include "ResultSpool.h"
#include "SelClasses.h"
#include "StatusText.h"
#include "Watch.h"
#include "ipmi/IpmiSource.h"

#include <cerrno>
#include <chrono>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <iomanip>
#include <iostream>
#include <string>
#include <unistd.h>
#include <vector>

namespace
{

constexpr int exitFailed = 1;
constexpr int exitUsage = 2;
constexpr int exitLoad = 3;

std::string executableDirectory()
{
    std::vector<char> buf(PATH_MAX + 1);
    const ssize_t n = readlink("/proc/self/exe", buf.data(), buf.size() - 1);
    if (n <= 0)
    {
        return ".";
    }
    const std::string exe(buf.data(), static_cast<std::size_t>(n));
    const auto slash = exe.rfind('/');
    return slash == std::string::npos ? "." : exe.substr(0, slash);
}

// The provider library where the installation puts it (relative to this
// executable's directory, or absolute), else where the build tree has it;
// the installed location when neither exists, so that the load error
// names it.
std::string defaultLibrary()
{
    const std::string installed = SELPROV_INSTALLED_LIBRARY;
    const std::string dir = executableDirectory();
    std::string installedPath = !installed.empty() && installed.front() == '/'
                                    ? installed
                                    : dir + "/" + installed;
    const std::string buildTreePath = dir + "/../lib/libSELProvider.so";
    for (const std::string& candidate : {installedPath, buildTreePath})
    {
        if (access(candidate.c_str(), F_OK) == 0)
        {
            return candidate;
        }
    }
    return installedPath;
}

host::ObjectPath targetPath(const selprov::Options& o)
{
    const host::Schema schema = selclasses::schema();
    host::ObjectPath path;
    try
    {
        path = host::ObjectPath::parse(o.target, &schema);
    }
    catch (const std::invalid_argument& e)
    {
        throw selprov::UsageError(e.what());
    }
    if (path.nameSpace.empty())
    {
        path.nameSpace = o.nameSpace;
    }
    return path;
}

host::ObjectPath classPath(const selprov::Options& o,
                           const std::string& className)
{
    host::ObjectPath path;
    path.nameSpace = o.nameSpace;
    path.className = className;
    return path;
}

void printReturnValue(const selprov::Options& o, const host::Outcome& out)
{
    if (out.data.empty())
    {
        return;
    }
    const host::Value& rv = out.data.front();
    if (o.json)
    {
        std::cout << "{\"ReturnValue\": " << selprov::jsonValue(rv) << "}\n";
    }
    else
    {
        std::cout << "ReturnValue = " << rv.toString() << "\n";
    }
}

// With --timing on a BMC: the IPMI requests the process has sent so far.
void printIpmiRequests()
{
    try
    {
        const auto ipmi = std::dynamic_pointer_cast<QX::Ipmi::IpmiSource>(
            QX::Platform::currentSource());
        if (ipmi)
        {
            std::cerr << "selprov: IPMI requests so far "
                      << ipmi->requestCount() << "\n";
        }
    }
    catch (const std::exception&)
    {
        // No source to ask: the request has said why.
    }
}

// Calls the provider; with --timing, writes how long the call took (the
// provider's work, the broker's and the formatting of the results, without
// printing) to standard error, and the IPMI requests sent so far.
template <typename Call>
host::Outcome timed(const selprov::Options& o, Call call)
{
    const auto began = std::chrono::steady_clock::now();
    host::Outcome out = call();
    if (o.timing)
    {
        const std::chrono::duration<double, std::milli> took =
            std::chrono::steady_clock::now() - began;
        std::cerr << "selprov: request took " << std::fixed
                  << std::setprecision(3) << took.count() << " ms\n";
        printIpmiRequests();
    }
    return out;
}

// Runs the command; returns the operation's outcome (already printed when
// it succeeded).
host::Outcome run(const selprov::Options& o, host::Host& h)
{
    using selprov::Command;
    host::Outcome out;
    switch (o.command)
    {
        case Command::EnumerateNames:
        {
            selprov::ResultSpool spool(o.json);
            out = timed(o,
                        [&] {
                            return h.enumerateInstanceNames(
                                classPath(o, o.target), spool.handlers());
                        });
            if (out.rc == CMPI_RC_OK)
            {
                spool.print(std::cout);
            }
            break;
        }
        case Command::Enumerate:
        {
            selprov::ResultSpool spool(o.json);
            out = timed(o,
                        [&]
                        {
                            return h.enumerateInstances(
                                classPath(o, o.target),
                                o.properties ? &*o.properties : nullptr,
                                spool.handlers());
                        });
            if (out.rc == CMPI_RC_OK)
            {
                spool.print(std::cout);
            }
            break;
        }
        case Command::Get:
        {
            selprov::ResultSpool spool(o.json);
            out = timed(o,
                        [&]
                        {
                            return h.getInstance(targetPath(o),
                                                 o.properties ? &*o.properties
                                                              : nullptr,
                                                 spool.handlers());
                        });
            if (out.rc == CMPI_RC_OK)
            {
                spool.print(std::cout);
            }
            break;
        }
        case Command::ClearLog:
        {
            const host::ObjectPath logClass = classPath(o, "ZAN_MgmtHwLog");
            host::Outcome names = h.enumerateInstanceNames(logClass);
            if (names.rc != CMPI_RC_OK)
            {
                return names;
            }
            out = timed(o,
                        [&]
                        {
                            return h.invokeMethod(names.paths.empty()
                                                      ? logClass
                                                      : names.paths.front(),
                                                  "ClearLog");
                        });
            if (out.rc == CMPI_RC_OK)
            {
                printReturnValue(o, out);
            }
            break;
        }
        case Command::Invoke:
            out = h.invokeMethod(targetPath(o), o.method);
            if (out.rc == CMPI_RC_OK)
            {
                printReturnValue(o, out);
            }
            break;
        case Command::Watch:
        case Command::Raise:
        case Command::Batch:
        case Command::Help:
            break;
    }
    return out;
}

int report(const host::Outcome& out)
{
    if (out.rc != CMPI_RC_OK)
    {
        std::cerr << "selprov: " << host::describeStatus(out.rc, out.message)
                  << "\n";
        return exitFailed;
    }
    std::cout.flush();
    return std::cout ? 0 : exitFailed;
}

// Runs one command and gives its exit code.
int execute(const selprov::Options& o, host::Host& h)
{
    if (o.command == selprov::Command::Watch)
    {
        return selprov::watch(o, h);
    }
    if (o.command == selprov::Command::Raise)
    {
        return selprov::raise(o);
    }
    return report(run(o, h));
}

// Runs one command a line from standard input on the one loaded provider,
// so that later commands see what earlier ones changed. Every line runs;
// the exit code is that of the first line that failed.
int runBatch(const selprov::Options& batch, host::Host& h)
{
    int result = 0;
    std::string line;
    while (std::getline(std::cin, line))
    {
        int code = 0;
        try
        {
            std::vector<std::string> args = batch.globalArgs;
            const std::vector<std::string> words =
                selprov::splitBatchLine(line);
            if (words.empty() || words.front().rfind('#', 0) == 0)
            {
                continue;
            }
            args.insert(args.end(), words.begin(), words.end());
            const selprov::Options options = selprov::parseCommandLine(args);
            if (options.command == selprov::Command::Batch ||
                options.command == selprov::Command::Help)
            {
                throw selprov::UsageError("not a request: \"" + line + "\"");
            }
            code = execute(options, h);
        }
        catch (const selprov::UsageError& e)
        {
            std::cerr << "selprov: " << e.what() << "\n";
            code = exitUsage;
        }
        if (result == 0)
        {
            result = code;
        }
    }
    return result;
}

} // namespace

int main(int argc, char** argv)
{
    selprov::Options options;
    try
    {
        options = selprov::parseCommandLine(
            std::vector<std::string>(argv + 1, argv + argc));
        if (options.command == selprov::Command::Help)
        {
            std::cout << selprov::usageText();
            return 0;
        }
        if (options.command == selprov::Command::Get ||
            options.command == selprov::Command::Invoke)
        {
            targetPath(options); // reject a bad path before loading
        }
        if (options.config)
        {
            if (access(options.config->c_str(), R_OK) != 0)
            {
                throw selprov::UsageError("cannot read config file " +
                                          *options.config + ": " +
                                          std::strerror(errno));
            }
            setenv("QX_PLATFORM_CONFIG", options.config->c_str(), 1);
        }
    }
    catch (const selprov::UsageError& e)
    {
        std::cerr << "selprov: " << e.what() << "\n" << selprov::usageText();
        return exitUsage;
    }

    try
    {
        host::Host h(selclasses::hostOptions(
            options.library.value_or(defaultLibrary())));
        if (options.command == selprov::Command::Batch)
        {
            return runBatch(options, h);
        }
        return execute(options, h);
    }
    catch (const host::LoadError& e)
    {
        std::cerr << "selprov: " << e.what() << "\n";
        return exitLoad;
    }
    catch (const std::exception& e)
    {
        std::cerr << "selprov: " << e.what() << "\n";
        return exitFailed;
    }
}
