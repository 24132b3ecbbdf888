#include "CommandLine.h"

#include "Names.h"
#include "SimulatedAlert.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdlib>

namespace selprov
{
namespace
{

std::vector<std::string> splitProperties(const std::string& list)
{
    std::vector<std::string> names;
    if (list.empty())
    {
        return names;
    }
    std::size_t start = 0;
    for (;;)
    {
        const std::size_t comma = list.find(',', start);
        std::string name = list.substr(start, comma - start);
        if (!host::isIdentifier(name))
        {
            throw UsageError("bad property name \"" + name +
                             "\" in --properties");
        }
        names.push_back(std::move(name));
        if (comma == std::string::npos)
        {
            return names;
        }
        start = comma + 1;
    }
}

std::vector<std::string> splitList(const std::string& list, const char* what)
{
    std::vector<std::string> items;
    std::size_t start = 0;
    for (;;)
    {
        const std::size_t comma = list.find(',', start);
        std::string item = list.substr(start, comma - start);
        if (item.empty())
        {
            throw UsageError(std::string("empty item in ") + what);
        }
        items.push_back(std::move(item));
        if (comma == std::string::npos)
        {
            return items;
        }
        start = comma + 1;
    }
}

std::vector<std::string> watchedClasses(const std::string& list)
{
    std::vector<std::string> classes = splitList(list, "--classes");
    for (const std::string& name : classes)
    {
        const auto& known = indicationClasses();
        if (std::find(known.begin(), known.end(), name) == known.end())
        {
            throw UsageError("not an indication class of the provider: \"" +
                             name + "\"");
        }
    }
    return classes;
}

std::vector<std::string> alertNames(const std::string& list, const char* what)
{
    std::vector<std::string> alerts = splitList(list, what);
    for (const std::string& name : alerts)
    {
        if (!QX::simulatedAlertFromName(name))
        {
            throw UsageError("unknown alert \"" + name + "\" (one of " +
                             QX::simulatedAlertNames() + ")");
        }
    }
    return alerts;
}

unsigned positiveCount(const std::string& text)
{
    if (text.empty() || text.size() > 9 ||
        text.find_first_not_of("0123456789") != std::string::npos ||
        std::stoul(text) == 0)
    {
        throw UsageError("--count needs a whole number from 1 to 999999999, "
                         "not \"" +
                         text + "\"");
    }
    return static_cast<unsigned>(std::stoul(text));
}

double positiveSeconds(const std::string& text)
{
    // Digits with at most one point: no signs, exponents or blanks.
    const bool shaped =
        !text.empty() && text.size() <= 12 &&
        text.find_first_not_of("0123456789.") == std::string::npos &&
        std::count(text.begin(), text.end(), '.') <= 1 && text != ".";
    const double seconds = shaped ? std::strtod(text.c_str(), nullptr) : 0;
    if (!shaped || !(seconds > 0) || seconds > 1e6)
    {
        throw UsageError("--timeout needs a number of seconds above 0 (at "
                         "most 1000000), not \"" +
                         text + "\"");
    }
    return seconds;
}

class Reader
{
  public:
    explicit Reader(const std::vector<std::string>& args) : args_(args) {}
    bool done() const
    {
        return pos_ >= args_.size();
    }
    const std::string& peek() const
    {
        return args_[pos_];
    }
    std::string next(const char* what)
    {
        if (done())
        {
            throw UsageError(std::string("missing ") + what);
        }
        return args_[pos_++];
    }
    // The value of --name VALUE or --name=VALUE, if this argument is it.
    std::optional<std::string> option(const std::string& name)
    {
        const std::string& arg = peek();
        if (arg == name)
        {
            ++pos_;
            if (done())
            {
                throw UsageError(name + " needs a value");
            }
            return args_[pos_++];
        }
        if (arg.rfind(name + "=", 0) == 0)
        {
            ++pos_;
            return arg.substr(name.size() + 1);
        }
        return std::nullopt;
    }

    std::size_t position() const
    {
        return pos_;
    }

  private:
    const std::vector<std::string>& args_;
    std::size_t pos_ = 0;
};

void setOnce(std::optional<std::string>& slot, std::string value,
             const char* name)
{
    if (slot)
    {
        throw UsageError(std::string(name) + " given twice");
    }
    slot = std::move(value);
}

} // namespace

const std::vector<std::string>& indicationClasses()
{
    static const std::vector<std::string> classes = {
        "ZAN_MgmtHwLogEntryEvent", "ZAN_MgmtHwLogClearEvent",
        "ZAN_MgmtHwLogFullEvent", "ZANx_AutomaticServerRestartEvent"};
    return classes;
}

const char* usageText()
{
    return "usage: selprov [--library PATH] [--config FILE] [--namespace NS] "
           "[--json] [--timing] COMMAND ...\n"
           "commands:\n"
           "  enumerate-names CLASS\n"
           "  enumerate CLASS [--properties P1,P2]\n"
           "  get OBJECTPATH [--properties P1,P2]\n"
           "  clear-log\n"
           "  invoke OBJECTPATH METHOD\n"
           "  watch [--classes C1,C2] [--count N] [--timeout S] "
           "[--raise KIND,...] [--json]\n"
           "                    (subscribe, print indications as they "
           "arrive, unsubscribe)\n"
           "  raise KIND[,KIND...]   (have the simulated BMC raise alerts)\n"
           "  batch             (commands from standard input, one a line, "
           "in one process)\n"
           "  help\n"
           "OBJECTPATH is WBEM text, e.g. "
           "'root/zanqx:ZAN_MgmtHwLog.CreationClassName=\"ZAN_MgmtHwLog\","
           "Name=\"IPMI SEL\"'\n"
           "(the namespace may be left out). --properties \"\" asks for no "
           "properties.\n"
           "KIND is entry, clear, warning, full or restart. watch "
           "subscribes to all four\n"
           "indication classes unless --classes names some, and runs "
           "until N indications\n"
           "arrived, S seconds passed or Ctrl-C.\n"
           "--library defaults to the installed provider library, or to "
           "../lib/libSELProvider.so beside the executable in a build "
           "tree;\n--config sets QX_PLATFORM_CONFIG; --timing writes each "
           "request's time to standard error.\n";
}

Options parseCommandLine(const std::vector<std::string>& args)
{
    Options o;
    Reader in(args);
    std::optional<std::string> nameSpace;
    while (!in.done() && in.peek().rfind('-', 0) == 0)
    {
        if (auto v = in.option("--library"))
        {
            setOnce(o.library, *v, "--library");
        }
        else if (auto c = in.option("--config"))
        {
            setOnce(o.config, *c, "--config");
        }
        else if (auto n = in.option("--namespace"))
        {
            setOnce(nameSpace, *n, "--namespace");
        }
        else if (in.peek() == "--json")
        {
            in.next("--json");
            o.json = true;
        }
        else if (in.peek() == "--timing")
        {
            in.next("--timing");
            o.timing = true;
        }
        else if (in.peek() == "--help" || in.peek() == "-h")
        {
            in.next("--help");
            o.command = Command::Help;
            return o;
        }
        else
        {
            throw UsageError("unknown option " + in.peek());
        }
    }
    o.globalArgs.assign(args.begin(),
                        args.begin() +
                            static_cast<std::ptrdiff_t>(in.position()));
    if (o.library && o.library->empty())
    {
        throw UsageError("--library needs a path");
    }
    if (o.config && o.config->empty())
    {
        throw UsageError("--config needs a file");
    }
    if (nameSpace)
    {
        if (nameSpace->empty())
        {
            throw UsageError("--namespace needs a namespace");
        }
        o.nameSpace = *nameSpace;
    }
    const std::string command = in.next("command");
    bool takesProperties = false;
    if (command == "enumerate-names" || command == "enumerate")
    {
        o.command = command == "enumerate" ? Command::Enumerate
                                           : Command::EnumerateNames;
        o.target = in.next("class name");
        if (!host::isIdentifier(o.target))
        {
            throw UsageError("bad class name \"" + o.target + "\"");
        }
        takesProperties = o.command == Command::Enumerate;
    }
    else if (command == "get")
    {
        o.command = Command::Get;
        o.target = in.next("object path");
        takesProperties = true;
    }
    else if (command == "clear-log")
    {
        o.command = Command::ClearLog;
    }
    else if (command == "invoke")
    {
        o.command = Command::Invoke;
        o.target = in.next("object path");
        o.method = in.next("method name");
        if (!host::isIdentifier(o.method))
        {
            throw UsageError("bad method name \"" + o.method + "\"");
        }
    }
    else if (command == "watch")
    {
        o.command = Command::Watch;
        o.classes = indicationClasses();
        bool classesGiven = false;
        while (!in.done())
        {
            if (auto classes = in.option("--classes"))
            {
                if (classesGiven)
                {
                    throw UsageError("--classes given twice");
                }
                classesGiven = true;
                o.classes = watchedClasses(*classes);
            }
            else if (auto count = in.option("--count"))
            {
                if (o.count)
                {
                    throw UsageError("--count given twice");
                }
                o.count = positiveCount(*count);
            }
            else if (auto timeout = in.option("--timeout"))
            {
                if (o.timeout)
                {
                    throw UsageError("--timeout given twice");
                }
                o.timeout = positiveSeconds(*timeout);
            }
            else if (auto raise = in.option("--raise"))
            {
                if (!o.alerts.empty())
                {
                    throw UsageError("--raise given twice");
                }
                o.alerts = alertNames(*raise, "--raise");
            }
            else if (in.peek() == "--json")
            {
                in.next("--json");
                o.json = true;
            }
            else
            {
                throw UsageError("unexpected argument \"" + in.peek() + "\"");
            }
        }
    }
    else if (command == "raise")
    {
        o.command = Command::Raise;
        o.alerts = alertNames(in.next("alert kinds"), "raise");
    }
    else if (command == "batch")
    {
        o.command = Command::Batch;
    }
    else if (command == "help")
    {
        o.command = Command::Help;
    }
    else
    {
        throw UsageError("unknown command \"" + command + "\"");
    }
    while (!in.done())
    {
        std::optional<std::string> list;
        if (takesProperties && (list = in.option("--properties")))
        {
            if (o.properties)
            {
                throw UsageError("--properties given twice");
            }
            o.properties = splitProperties(*list);
        }
        else
        {
            throw UsageError("unexpected argument \"" + in.peek() + "\"");
        }
    }
    return o;
}

std::vector<std::string> splitBatchLine(const std::string& line)
{
    std::vector<std::string> words;
    std::string word;
    bool inWord = false;
    bool quoted = false;
    for (std::size_t i = 0; i < line.size(); ++i)
    {
        const char c = line[i];
        if (!quoted && (c == ' ' || c == '\t' || c == '\r'))
        {
            if (inWord)
            {
                words.push_back(std::move(word));
                word.clear();
                inWord = false;
            }
            continue;
        }
        inWord = true;
        word += c;
        if (quoted && c == '\\' && i + 1 < line.size())
        {
            word += line[++i];
        }
        else if (c == '"')
        {
            quoted = !quoted;
        }
    }
    if (quoted)
    {
        throw UsageError("unterminated quote in \"" + line + "\"");
    }
    if (inWord)
    {
        words.push_back(std::move(word));
    }
    return words;
}

} // namespace selprov
