#include "SimulatedBmc.h"

#include "BmcClient.h"

#include <arpa/inet.h>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <netinet/in.h>
#include <spawn.h>
#include <sstream>
#include <stdexcept>
#include <string_view>
#include <sys/socket.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

extern char** environ;

namespace bmcsim
{

namespace
{

namespace fs = std::filesystem;
using Clock = std::chrono::steady_clock;

constexpr const char* simulatorName = "selsim";

std::uint16_t freePort(int type)
{
    const int fd = ::socket(AF_INET, type, 0);
    if (fd < 0)
    {
        throw std::runtime_error("socket: " +
                                 std::string(std::strerror(errno)));
    }
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t length = sizeof address;
    if (::bind(fd, reinterpret_cast<sockaddr*>(&address), sizeof address) !=
            0 ||
        ::getsockname(fd, reinterpret_cast<sockaddr*>(&address), &length) != 0)
    {
        ::close(fd);
        throw std::runtime_error("no free port: " +
                                 std::string(std::strerror(errno)));
    }
    ::close(fd);
    return ntohs(address.sin_port);
}

void writeFile(const fs::path& path, const std::string& text)
{
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    out << text;
    if (!out)
    {
        throw std::runtime_error("cannot write " + path.string());
    }
}

std::string hexByte(unsigned value)
{
    char text[8];
    std::snprintf(text, sizeof text, "0x%02x", value & 0xFF);
    return text;
}

// A compact sensor record (SDR type 02h) that names one sensor.
std::string compactSdr(unsigned recordId, const Sensor& sensor)
{
    const std::string name = sensor.name.substr(0, 16);
    const std::vector<unsigned> body{0x20,
                                     0x00,
                                     sensor.number,
                                     0x07,
                                     0x01,
                                     0x03,
                                     0x40,
                                     sensor.type,
                                     sensor.eventReadingType,
                                     0x0f,
                                     0x00,
                                     0x00,
                                     0x00,
                                     0x0f,
                                     0x00, // event and reading masks
                                     0xc0,
                                     0x00,
                                     0x00, // units: no analog reading
                                     0x01,
                                     0x00,
                                     0x00,
                                     0x00, // sharing, hysteresis
                                     0x00,
                                     0x00,
                                     0x00,
                                     0x00, // reserved, OEM
                                     0xc0u |
                                         static_cast<unsigned>(name.size())};
    std::string line =
        "main_sdr_add 0x20 " + hexByte(recordId) + " " +
        hexByte(recordId >> 8) + " 0x51 0x02 " +
        hexByte(static_cast<unsigned>(body.size() + name.size()));
    for (const unsigned byte : body)
    {
        line += " " + hexByte(byte);
    }
    for (const char c : name)
    {
        line += " " + hexByte(static_cast<unsigned char>(c));
    }
    return line + "\n";
}

// ipmi_sim's persist file: "name:type:value" lines, read back in reverse
// order; every data byte escaped as \xx.
std::string persistFile(const std::vector<Record>& records,
                        std::uint32_t lastAdd, std::uint32_t lastErase)
{
    std::string text;
    for (auto record = records.rbegin(); record != records.rend(); ++record)
    {
        const unsigned id = (*record)[0] | (*record)[1] << 8;
        text += std::to_string(id) + ":d:";
        for (const std::uint8_t byte : *record)
        {
            char escaped[4];
            std::snprintf(escaped, sizeof escaped, "\\%02x", byte);
            text += escaped;
        }
        text += "\n";
    }
    text += "last_erase_time:i:" + std::to_string(lastErase) + "\n";
    text += "last_add_time:i:" + std::to_string(lastAdd) + "\n";
    return text;
}

std::uint32_t timestampOf(const Record& record)
{
    return record[3] | record[4] << 8 | record[5] << 16 |
           static_cast<std::uint32_t>(record[6]) << 24;
}

} // namespace

SimulatedBmc::SimulatedBmc(Options options) : options_(std::move(options))
{
    directory_ = options_.directory;
    if (directory_.empty())
    {
        char name[] = "/tmp/bmcsim-XXXXXX";
        if (::mkdtemp(name) == nullptr)
        {
            throw std::runtime_error("mkdtemp: " +
                                     std::string(std::strerror(errno)));
        }
        directory_ = name;
        ownDirectory_ = true;
    }
    fs::create_directories(directory_);
}

SimulatedBmc::~SimulatedBmc()
{
    if (!released_)
    {
        try
        {
            stop();
        }
        catch (const std::exception&)
        {
        }
        if (ownDirectory_)
        {
            std::error_code ignored;
            fs::remove_all(directory_, ignored);
        }
    }
}

bool SimulatedBmc::available()
{
    const char* path = std::getenv("PATH");
    std::istringstream directories(path != nullptr ? path : "/usr/bin:/bin");
    std::string directory;
    while (std::getline(directories, directory, ':'))
    {
        if (::access((directory + "/ipmi_sim").c_str(), X_OK) == 0)
        {
            return true;
        }
    }
    return false;
}

std::string SimulatedBmc::host() const
{
    return "127.0.0.1:" + std::to_string(lanPort_);
}

std::string SimulatedBmc::ipmitool() const
{
    return "ipmitool -I lanplus -H 127.0.0.1 -p " + std::to_string(lanPort_) +
           " -U " + options_.user + " -P " + options_.password + " -C 3";
}

void SimulatedBmc::writeFiles(bool seedSel) const
{
    const fs::path dir(directory_);
    writeFile(dir / "lan.conf",
              std::string("name \"") + simulatorName +
                  "\"\n"
                  "set_working_mc 0x20\n"
                  "startlan 1\n"
                  "  addr 127.0.0.1 " +
                  std::to_string(lanPort_) +
                  "\n"
                  "  priv_limit admin\n"
                  "  allowed_auths_callback none md2 md5 straight\n"
                  "  allowed_auths_user none md2 md5 straight\n"
                  "  allowed_auths_operator none md2 md5 straight\n"
                  "  allowed_auths_admin none md2 md5 straight\n"
                  "  guid a123456789abcdefa123456789abcdef\n"
                  "endlan\n"
                  "user 2 true \"" +
                  options_.user + "\" \"" + options_.password +
                  "\" admin 10 none md2 md5 straight\n"
                  "console 127.0.0.1 " +
                  std::to_string(consolePort_) + "\n" + moduleLine() +
                  selModuleLine(options_.selBehaviour, options_.maxRecords,
                                selFile()));

    std::string emulator = "mc_setbmc 0x20\n"
                           "mc_add 0x20 0 no-device-sdrs 0x23 9 8 0x9f 0x1291 "
                           "0xf02\n"
                           "sel_enable 0x20 " +
                           std::to_string(options_.maxRecords) +
                           " 0x0b\n"
                           "sensor_add 0x20 0 0 35 0x6f event-only\n"
                           "sensor_set_event_support 0x20 0 0 enable scanning "
                           "per-state 000000000001111 000000000000000 "
                           "000000000001111 000000000000000\n";
    emulator += compactSdr(1, Sensor{0, 0x23, 0x6f, "Watchdog"});
    unsigned recordId = 2;
    for (const Sensor& sensor : options_.sensors)
    {
        emulator += compactSdr(recordId++, sensor);
    }
    emulator += "mc_enable 0x20\n";
    writeFile(dir / "sel.emu", emulator);

    if (!seedSel)
    {
        return;
    }
    const fs::path state = dir / "state";
    fs::remove_all(state);
    if (options_.selBehaviour.replaced)
    {
        writeSelFile(selFile(), options_.records);
        return;
    }
    const fs::path persist = state / "ipmi_sim" / simulatorName;
    fs::create_directories(persist);
    std::uint32_t lastAdd = 0;
    for (const Record& record : options_.records)
    {
        lastAdd = std::max(lastAdd, timestampOf(record));
    }
    if (!options_.records.empty() || options_.lastEraseTime != 0)
    {
        writeFile(persist / "sel.20", persistFile(options_.records, lastAdd,
                                                  options_.lastEraseTime));
    }
}

void SimulatedBmc::start()
{
    if (pid_ > 0)
    {
        throw std::logic_error("the simulator is running already");
    }
    lanPort_ = freePort(SOCK_DGRAM);
    consolePort_ = freePort(SOCK_STREAM);
    writeFiles(true);
    launch();
}

void SimulatedBmc::restart()
{
    stop();
    writeFiles(false);
    launch();
}

void SimulatedBmc::launch()
{
    const std::string dir = directory_;
    const std::string log = dir + "/sim.log";
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, 0, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&actions, 1, log.c_str(),
                                     O_WRONLY | O_CREAT | O_APPEND, 0644);
    posix_spawn_file_actions_adddup2(&actions, 1, 2);
    posix_spawnattr_t attributes;
    posix_spawnattr_init(&attributes);
    // Its own process group: a terminal's signals go to the tests only.
    posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETPGROUP);
    posix_spawnattr_setpgroup(&attributes, 0);

    const std::string conf = dir + "/lan.conf";
    const std::string emu = dir + "/sel.emu";
    const std::string state = dir + "/state";
    std::vector<std::string> words{"ipmi_sim", "-c", conf,  "-f",
                                   emu,        "-s", state, "-n"};
    std::vector<char*> argv;
    argv.reserve(words.size() + 1);
    for (std::string& word : words)
    {
        argv.push_back(word.data());
    }
    argv.push_back(nullptr);
    const int rc = posix_spawnp(&pid_, "ipmi_sim", &actions, &attributes,
                                argv.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    posix_spawnattr_destroy(&attributes);
    if (rc != 0)
    {
        pid_ = -1;
        throw std::runtime_error("cannot start ipmi_sim: " +
                                 std::string(std::strerror(rc)));
    }
    waitUntilAnswering();
    if (options_.setSelTime)
    {
        setSelTime(static_cast<std::uint32_t>(std::time(nullptr)));
    }
}

void SimulatedBmc::waitUntilAnswering()
{
    const auto deadline = Clock::now() + std::chrono::seconds(10);
    std::string last;
    while (Clock::now() < deadline)
    {
        int status = 0;
        if (::waitpid(pid_, &status, WNOHANG) == pid_)
        {
            pid_ = -1;
            throw std::runtime_error("ipmi_sim exited at start; see " +
                                     directory_ + "/sim.log");
        }
        try
        {
            QX::Ipmi::IpmiContext probe(
                sessionTo(host(), options_.user, options_.password, 500));
            return;
        }
        catch (const std::exception& error)
        {
            last = error.what();
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    kill();
    throw std::runtime_error("ipmi_sim did not answer within 10 s: " + last);
}

bool SimulatedBmc::reap(int waitMs)
{
    const auto deadline = Clock::now() + std::chrono::milliseconds(waitMs);
    while (true)
    {
        int status = 0;
        const pid_t done = ::waitpid(pid_, &status, WNOHANG);
        if (done == pid_ || (done < 0 && errno == ECHILD))
        {
            pid_ = -1;
            return true;
        }
        if (Clock::now() >= deadline)
        {
            return false;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
}

void SimulatedBmc::stop()
{
    if (pid_ <= 0)
    {
        return;
    }
    ::kill(pid_, SIGCONT); // a frozen simulator cannot exit
    ::kill(pid_, SIGTERM);
    if (!reap(5000))
    {
        kill();
    }
}

void SimulatedBmc::kill()
{
    if (pid_ <= 0)
    {
        return;
    }
    ::kill(pid_, SIGKILL);
    reap(5000);
}

void SimulatedBmc::freeze()
{
    if (pid_ > 0)
    {
        ::kill(pid_, SIGSTOP);
    }
}

void SimulatedBmc::thaw()
{
    if (pid_ > 0)
    {
        ::kill(pid_, SIGCONT);
    }
}

void SimulatedBmc::release()
{
    released_ = true;
}

bool SimulatedBmc::moduleAvailable()
{
    return std::string_view(BMCSIM_RESTART_MODULE).size() > 0 &&
           fs::exists(BMCSIM_RESTART_MODULE);
}

std::string SimulatedBmc::moduleLine() const
{
    if (!options_.restartModule || !moduleAvailable())
    {
        return {};
    }
    return std::string("loadlib \"") + BMCSIM_RESTART_MODULE + "\" \"\"\n";
}

std::string SimulatedBmc::selFile() const
{
    return directory_ + "/module-sel.txt";
}

std::vector<Record> SimulatedBmc::moduleSel() const
{
    if (!options_.selBehaviour.replaced)
    {
        return {};
    }
    return readSelFile(selFile());
}

void SimulatedBmc::clearSel()
{
    clearSelAt(host(), options_.user, options_.password);
}

void SimulatedBmc::startWatchdog(WatchdogAction action, unsigned tenths)
{
    startWatchdogAt(host(), options_.user, options_.password, action, tenths);
}

void SimulatedBmc::setSelTime(std::uint32_t secondsSinceEpoch)
{
    setSelTimeAt(host(), options_.user, options_.password, secondsSinceEpoch);
}

std::vector<std::uint16_t>
SimulatedBmc::addRecords(const std::vector<Record>& records)
{
    return addRecordsAt(host(), options_.user, options_.password, records);
}

} // namespace bmcsim
