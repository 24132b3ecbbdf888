// bmcsim: start, seed and stop OpenIPMI's BMC simulator for the main job
// and the benchmark.
//
//   bmcsim start --dir DIR [--max-records N] [--no-sel-time]
//                [--fixture FILE | --sample | --generate N]
//                [--sel-behaviour frozen-ring | background-clear |
//                                 reserve-c1 | reserve-d4]
//                [--sel-delay-ms N]
//       starts ipmi_sim on a free loopback port with the project's
//       configuration in DIR and prints "host=127.0.0.1:PORT" and
//       "pid=PID"; the simulator keeps running. --sel-behaviour gives it
//       the SEL of some real BMCs (the SEL module): a full ring buffer
//       whose Get SEL Info never changes, a Clear SEL that erases for 3 s
//       in the background, or Reserve SEL refused with C1h or D4h
//       --sel-delay-ms N: the SEL module answers every SEL command N ms
//       late, as a real BMC over a LAN does (with any SEL behaviour)
//   bmcsim add --dir DIR --count N     adds N records over IPMI
//   bmcsim clear --dir DIR             clears the SEL over IPMI
//   bmcsim watchdog --dir DIR [--tenths N]
//       starts the watchdog with action hard reset; it expires after N
//       tenths of a second (default 10) and logs a Watchdog 2 record
//   bmcsim stop --dir DIR              stops the simulator started in DIR
#include "SimulatedBmc.h"

#include <chrono>
#include <csignal>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <map>
#include <thread>
#include <unistd.h>

namespace
{

constexpr const char* usage =
    "usage: bmcsim start --dir DIR [--max-records N] [--no-sel-time]\n"
    "                    [--fixture FILE | --sample | --generate N]\n"
    "                    [--sel-behaviour frozen-ring | background-clear |\n"
    "                                     reserve-c1 | reserve-d4]\n"
    "                    [--sel-delay-ms N]\n"
    "       bmcsim add --dir DIR --count N\n"
    "       bmcsim clear --dir DIR\n"
    "       bmcsim watchdog --dir DIR [--tenths N]\n"
    "       bmcsim stop --dir DIR\n";

struct UsageError : std::runtime_error
{
    using std::runtime_error::runtime_error;
};

unsigned number(const std::string& text)
{
    if (text.empty() || text.size() > 6 ||
        text.find_first_not_of("0123456789") != std::string::npos)
    {
        throw UsageError("not a number: \"" + text + "\"");
    }
    return static_cast<unsigned>(std::stoul(text));
}

bmcsim::SelBehaviour selBehaviour(const std::string& name)
{
    if (name == "frozen-ring")
    {
        return bmcsim::SelBehaviour::frozenRing();
    }
    if (name == "background-clear")
    {
        return bmcsim::SelBehaviour::backgroundClear(3000);
    }
    if (name == "reserve-c1" || name == "reserve-d4")
    {
        return bmcsim::SelBehaviour::reserveRefused(
            name == "reserve-c1" ? 0xC1 : 0xD4);
    }
    throw UsageError("unknown SEL behaviour \"" + name + "\"");
}

std::string readLine(const std::string& path)
{
    std::ifstream in(path);
    std::string line;
    if (!std::getline(in, line))
    {
        throw std::runtime_error("cannot read " + path);
    }
    return line;
}

// Signals only our own simulator: the PID must still be an ipmi_sim
// started with this directory's configuration.
bool isOurSimulator(pid_t pid, const std::string& dir)
{
    std::ifstream in("/proc/" + std::to_string(pid) + "/cmdline",
                     std::ios::binary);
    std::string cmdline((std::istreambuf_iterator<char>(in)),
                        std::istreambuf_iterator<char>());
    return cmdline.find("ipmi_sim") != std::string::npos &&
           cmdline.find(dir + "/lan.conf") != std::string::npos;
}

bool waitGone(pid_t pid, int ms)
{
    for (int waited = 0; waited < ms; waited += 20)
    {
        if (::kill(pid, 0) != 0)
        {
            return true;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    return ::kill(pid, 0) != 0;
}

int stop(const std::string& dir)
{
    const pid_t pid = static_cast<pid_t>(number(readLine(dir + "/bmcsim.pid")));
    if (!isOurSimulator(pid, dir))
    {
        std::cerr << "bmcsim: no simulator of " << dir << " is running\n";
        return 0;
    }
    ::kill(pid, SIGCONT);
    ::kill(pid, SIGTERM);
    if (!waitGone(pid, 5000))
    {
        ::kill(pid, SIGKILL);
        waitGone(pid, 2000);
    }
    return 0;
}

} // namespace

int main(int argc, char** argv)
{
    try
    {
        if (argc < 2)
        {
            throw UsageError("no command");
        }
        const std::string command = argv[1];
        std::map<std::string, std::string> options;
        for (int i = 2; i < argc; ++i)
        {
            const std::string word = argv[i];
            if (word == "--no-sel-time" || word == "--sample")
            {
                options[word] = "";
            }
            else if (word.starts_with("--") && i + 1 < argc)
            {
                options[word] = argv[++i];
            }
            else
            {
                throw UsageError("unexpected \"" + word + "\"");
            }
        }
        if (!options.count("--dir"))
        {
            throw UsageError("--dir is required");
        }
        const std::string dir = std::filesystem::absolute(options["--dir"]);
        if (command == "stop")
        {
            return stop(dir);
        }
        if (command == "add")
        {
            if (!options.count("--count"))
            {
                throw UsageError("add needs --count");
            }
            const bmcsim::Options defaults;
            bmcsim::addRecordsAt(
                readLine(dir + "/bmcsim.host"), defaults.user,
                defaults.password,
                bmcsim::generatedRecords(
                    number(options["--count"]), 1,
                    static_cast<std::uint32_t>(std::time(nullptr))));
            return 0;
        }
        if (command == "clear")
        {
            const bmcsim::Options defaults;
            bmcsim::clearSelAt(readLine(dir + "/bmcsim.host"), defaults.user,
                               defaults.password);
            return 0;
        }
        if (command == "watchdog")
        {
            const bmcsim::Options defaults;
            bmcsim::startWatchdogAt(
                readLine(dir + "/bmcsim.host"), defaults.user,
                defaults.password, bmcsim::WatchdogAction::HardReset,
                options.count("--tenths") ? number(options["--tenths"]) : 10);
            return 0;
        }
        if (command != "start")
        {
            throw UsageError("unknown command \"" + command + "\"");
        }
        bmcsim::Options settings;
        settings.directory = dir;
        if (options.count("--max-records"))
        {
            settings.maxRecords = number(options["--max-records"]);
        }
        settings.setSelTime = !options.count("--no-sel-time");
        if (options.count("--fixture"))
        {
            settings.records = bmcsim::fixtureRecords(options["--fixture"]);
        }
        else if (options.count("--sample"))
        {
            settings.records = bmcsim::fixtureRecords("");
        }
        else if (options.count("--generate"))
        {
            settings.records = bmcsim::generatedRecords(
                number(options["--generate"]), 1,
                static_cast<std::uint32_t>(std::time(nullptr)));
        }
        if (options.count("--sel-behaviour"))
        {
            settings.selBehaviour = selBehaviour(options["--sel-behaviour"]);
        }
        if (options.count("--sel-delay-ms"))
        {
            // The SEL module's SEL, answering each SEL command late.
            settings.selBehaviour.replaced = true;
            settings.selBehaviour.delayMs = number(options["--sel-delay-ms"]);
        }
        settings.sensors = bmcsim::sampleSensors();
        bmcsim::SimulatedBmc bmc(settings);
        bmc.start();
        bmc.release();
        std::ofstream(dir + "/bmcsim.pid") << bmc.pid() << "\n";
        std::ofstream(dir + "/bmcsim.host") << bmc.host() << "\n";
        std::cout << "host=" << bmc.host() << "\npid=" << bmc.pid() << "\n";
        return 0;
    }
    catch (const UsageError& error)
    {
        std::cerr << "bmcsim: " << error.what() << "\n" << usage;
        return 2;
    }
    catch (const std::exception& error)
    {
        std::cerr << "bmcsim: " << error.what() << "\n";
        return 1;
    }
}
