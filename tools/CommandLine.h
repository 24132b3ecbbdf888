#pragma once

#include "SelClasses.h"

#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

namespace selprov
{

// A command line that cannot be run; selprov exits 2 with the usage text.
class UsageError : public std::runtime_error
{
  public:
    using std::runtime_error::runtime_error;
};

enum class Command
{
    EnumerateNames,
    Enumerate,
    Get,
    ClearLog,
    Invoke,
    Watch,
    Raise,
    Batch,
    Help,
};

// The indication classes watch subscribes to when none are named.
const std::vector<std::string>& indicationClasses();

struct Options
{
    std::optional<std::string> library;
    std::optional<std::string> config;
    std::string nameSpace = selclasses::nameSpace;
    bool json = false;
    bool timing = false; // write each request's time to standard error
    Command command = Command::Help;
    std::string target; // class name or object path
    std::string method; // invoke
    std::optional<std::vector<std::string>> properties;
    // watch: the classes to subscribe to, how many indications to wait
    // for, for how long (seconds), and the alerts to raise once subscribed.
    std::vector<std::string> classes;
    std::optional<unsigned> count;
    std::optional<double> timeout;
    // watch --raise and raise: simulated alert names (entry, clear, ...).
    std::vector<std::string> alerts;
    // The options given before the command, as typed; a batch applies them
    // to each of its lines.
    std::vector<std::string> globalArgs;
};

// Throws UsageError on anything malformed.
Options parseCommandLine(const std::vector<std::string>& args);
const char* usageText();

// Splits one line of a batch into words at blanks outside double quotes;
// quotes and backslash escapes stay in the word (object paths need them).
// Throws UsageError for an unterminated quote.
std::vector<std::string> splitBatchLine(const std::string& line);

} // namespace selprov
