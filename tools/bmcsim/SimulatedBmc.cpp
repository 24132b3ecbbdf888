#include "SimulatedBmc.h"

#include "Fixture.h"
#include "NodeTree.h"
#include "SystemEventRecord.h"
#include "ipmi/FreeIpmiHandles.h"

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

QX::Ipmi::SessionParameters sessionTo(const std::string& host,
                                      const std::string& user,
                                      const std::string& password,
                                      unsigned timeoutMs)
{
    QX::Ipmi::SessionParameters parameters;
    parameters.lan = true;
    parameters.host = host;
    parameters.user = user;
    parameters.password = password;
    parameters.privilege = IPMI_PRIVILEGE_LEVEL_ADMIN;
    parameters.cipherSuite = 3;
    parameters.sessionTimeoutMs = timeoutMs;
    parameters.retransmissionTimeoutMs = std::min(timeoutMs / 4, 250u);
    parameters.workaroundFlags =
        IPMI_WORKAROUND_FLAGS_OUTOFBAND_2_0_OPEN_SESSION_PRIVILEGE;
    return parameters;
}

QX::Ipmi::SessionParameters sessionTo(const SimulatedBmc& bmc,
                                      unsigned timeoutMs)
{
    return sessionTo(bmc.host(), bmc.options().user, bmc.options().password,
                     timeoutMs);
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
                  std::to_string(consolePort_) + "\n" + moduleLine());

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
            QX::Ipmi::IpmiContext probe(sessionTo(*this, 500));
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
    QX::Ipmi::IpmiContext context(sessionTo(*this, 2000));
    QX::Ipmi::FiidObject response(tmpl_cmd_set_sel_time_rs);
    context.check(
        ipmi_cmd_set_sel_time(context.get(), secondsSinceEpoch, response.get()),
        "ipmi_cmd_set_sel_time", response, IPMI_NET_FN_STORAGE_RQ);
}

std::vector<std::uint16_t>
SimulatedBmc::addRecords(const std::vector<Record>& records)
{
    return addRecordsAt(host(), options_.user, options_.password, records);
}

std::vector<std::uint16_t> addRecordsAt(const std::string& host,
                                        const std::string& user,
                                        const std::string& password,
                                        const std::vector<Record>& records)
{
    QX::Ipmi::IpmiContext context(sessionTo(host, user, password, 2000));
    std::vector<std::uint16_t> ids;
    for (const Record& record : records)
    {
        std::uint8_t request[17] = {0x44}; // Add SEL Entry
        std::memcpy(request + 1, record.data(), record.size());
        std::uint8_t response[16] = {};
        const int length =
            ipmi_cmd_raw(context.get(), 0, IPMI_NET_FN_STORAGE_RQ, request,
                         sizeof request, response, sizeof response);
        if (length < 0)
        {
            context.fail("ipmi_cmd_raw(Add SEL Entry)");
        }
        if (length < 4 || response[1] != 0)
        {
            char code[8];
            std::snprintf(code, sizeof code, "%02Xh",
                          length >= 2 ? response[1] : 0xFF);
            throw std::runtime_error(
                std::string("Add SEL Entry failed with completion code ") +
                code);
        }
        ids.push_back(
            static_cast<std::uint16_t>(response[2] | response[3] << 8));
    }
    return ids;
}

namespace
{

// Sends one raw request; throws unless the BMC answers with success.
std::vector<std::uint8_t> rawCommand(QX::Ipmi::IpmiContext& context,
                                     std::uint8_t netFn,
                                     std::vector<std::uint8_t> request,
                                     const char* what)
{
    std::uint8_t response[64] = {};
    const int length = ipmi_cmd_raw(context.get(), 0, netFn, request.data(),
                                    static_cast<unsigned>(request.size()),
                                    response, sizeof response);
    if (length < 0)
    {
        context.fail(what);
    }
    if (length < 2 || response[1] != 0)
    {
        char code[8];
        std::snprintf(code, sizeof code, "%02Xh",
                      length >= 2 ? response[1] : 0xFF);
        throw std::runtime_error(std::string(what) +
                                 " failed with completion code " + code);
    }
    return std::vector<std::uint8_t>(response, response + length);
}

} // namespace

void clearSelAt(const std::string& host, const std::string& user,
                const std::string& password)
{
    QX::Ipmi::IpmiContext context(sessionTo(host, user, password, 2000));
    const auto reserved =
        rawCommand(context, IPMI_NET_FN_STORAGE_RQ, {0x42}, "Reserve SEL");
    if (reserved.size() < 4)
    {
        throw std::runtime_error("Reserve SEL gave a short answer");
    }
    // Clear SEL: reservation, "CLR", initiate erase.
    rawCommand(context, IPMI_NET_FN_STORAGE_RQ,
               {0x47, reserved[2], reserved[3], 'C', 'L', 'R', 0xAA},
               "Clear SEL");
}

void startWatchdogAt(const std::string& host, const std::string& user,
                     const std::string& password, WatchdogAction action,
                     unsigned tenths)
{
    QX::Ipmi::IpmiContext context(sessionTo(host, user, password, 2000));
    // Set Watchdog Timer: use SMS/OS (04h), the action, no pre-timeout,
    // clear the SMS/OS expiration flag, the countdown in 100 ms.
    rawCommand(context, IPMI_NET_FN_APP_RQ,
               {0x24, 0x04, static_cast<std::uint8_t>(action), 0x00, 0x10,
                static_cast<std::uint8_t>(tenths & 0xFF),
                static_cast<std::uint8_t>(tenths >> 8)},
               "Set Watchdog Timer");
    rawCommand(context, IPMI_NET_FN_APP_RQ, {0x22}, "Reset Watchdog Timer");
}

std::vector<Record> generatedRecords(unsigned count, std::uint16_t firstId,
                                     std::uint32_t lastTime)
{
    // Sensor type, number, event type, data 1-3.
    static const EventBytes events[] = {
        {0x01, 0x30, 0x01, 0x57, 0x52, 0x50}, // temperature above threshold
        {0x01, 0x30, 0x81, 0x57, 0x4e, 0x50}, // ... and back
        {0x04, 0x43, 0x01, 0x52, 0x05, 0x06}, // fan below threshold
        {0x08, 0x52, 0x6f, 0x03, 0xff, 0xff}, // power supply AC lost
        {0x0c, 0x60, 0x6f, 0xa0, 0x00, 0x01}, // correctable ECC
        {0x23, 0x00, 0x6f, 0xc1, 0x04, 0xff}, // watchdog hard reset
    };
    std::vector<Record> records;
    records.reserve(count);
    for (unsigned i = 0; i < count; ++i)
    {
        const unsigned id = firstId + i;
        const std::uint32_t time = lastTime - (count - 1 - i);
        records.push_back(systemEventRecord(static_cast<std::uint16_t>(id),
                                            time,
                                            events[i % std::size(events)]));
    }
    return records;
}

Record parseRecord(const std::string& hex)
{
    Record record{};
    std::istringstream in(hex);
    for (std::uint8_t& byte : record)
    {
        std::string pair;
        if (!(in >> pair) || pair.size() != 2 ||
            pair.find_first_not_of("0123456789abcdefABCDEF") !=
                std::string::npos)
        {
            throw std::invalid_argument("not 16 hexadecimal bytes: \"" + hex +
                                        "\"");
        }
        byte = static_cast<std::uint8_t>(std::stoul(pair, nullptr, 16));
    }
    return record;
}

std::vector<Record> fixtureRecords(const std::string& fixtureFile)
{
    std::shared_ptr<const QX::NodeTree> tree;
    if (fixtureFile.empty())
    {
        std::istringstream sample(QX::builtinSampleFixture());
        tree = QX::parseFixture(sample, "built-in sample SEL");
    }
    else
    {
        tree = QX::loadFixtureFile(fixtureFile);
    }
    std::vector<Record> records;
    for (const auto id : tree->nodesOfKind(QX::NodeLexicon::EventLogEntry))
    {
        const QX::PropertyValue* data =
            tree->node(id).find(QX::NodeLexicon::RecordData);
        if (data != nullptr && std::holds_alternative<std::string>(*data))
        {
            records.push_back(parseRecord(std::get<std::string>(*data)));
        }
    }
    return records;
}

std::vector<Sensor> sampleSensors()
{
    return {
        {0x01, 0x10, 0x6f, "SEL"},          {0x30, 0x01, 0x01, "CPU1 Temp"},
        {0x43, 0x04, 0x01, "FAN3"},         {0x14, 0x02, 0x01, "12V"},
        {0x52, 0x08, 0x6f, "PSU2"},         {0x60, 0x0c, 0x6f, "DIMM_A1"},
        {0x11, 0x07, 0x6f, "CPU2"},         {0x71, 0x23, 0x6f, "Watchdog 2"},
        {0x83, 0x12, 0x6f, "System Event"},
    };
}

} // namespace bmcsim
