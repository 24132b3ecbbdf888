/*
 * Fixture files: an instrumentation tree as text, one directive a line
 * (controller, log, entry, watchdog) with key=value tokens. The format, its
 * defaults and its errors are described in docs/fixture-format.md; every
 * error throws FixtureError("<source>:<line>: <what>").
 */
#include "Fixture.h"

#include "MemorySource.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <map>
#include <optional>

namespace QX
{

namespace
{

using NodeLexicon::Properties;

enum class ValueType
{
    Text,
    Unsigned,
    Boolean,
};

struct PropertyKey
{
    const char* name;
    Properties property;
    ValueType type;
};

constexpr PropertyKey propertyKeys[] = {
    {"Name", NodeLexicon::Name, ValueType::Text},
    {"MaxRecords", NodeLexicon::MaxRecords, ValueType::Unsigned},
    {"OverwritePolicy", NodeLexicon::OverwritePolicy, ValueType::Unsigned},
    {"DataFormat", NodeLexicon::DataFormat, ValueType::Text},
    {"IsEmpty", NodeLexicon::IsEmpty, ValueType::Boolean},
    {"RecordId", NodeLexicon::RecordId, ValueType::Unsigned},
    {"RecordData", NodeLexicon::RecordData, ValueType::Text},
    {"Timestamp", NodeLexicon::Timestamp, ValueType::Text},
    {"RestartCause", NodeLexicon::RestartCause, ValueType::Unsigned},
};

struct Directive
{
    const char* word;
    NodeLexicon::NodeType kind;
    std::vector<std::string> properties; // property keys this node accepts
};

const std::vector<Directive>& directives()
{
    static const std::vector<Directive> all = {
        {"controller", NodeLexicon::ManagementController, {}},
        {"log",
         NodeLexicon::EventLog,
         {"Name", "MaxRecords", "OverwritePolicy", "DataFormat", "IsEmpty"}},
        {"entry",
         NodeLexicon::EventLogEntry,
         {"RecordId", "RecordData", "Timestamp"}},
        {"watchdog", NodeLexicon::Watchdog, {"RestartCause"}},
    };
    return all;
}

const PropertyKey* findPropertyKey(const std::string& key)
{
    for (const PropertyKey& candidate : propertyKeys)
    {
        if (key == candidate.name)
        {
            return &candidate;
        }
    }
    return nullptr;
}

bool isBlank(char c)
{
    return c == ' ' || c == '\t' || c == '\r' || c == '\v' || c == '\f';
}

/** Reads one fixture line; knows the source name and line for errors. */
class LineReader
{
  public:
    LineReader(const std::string& sourceName, std::size_t lineNumber) :
        sourceName_(sourceName), lineNumber_(lineNumber)
    {
    }

    [[noreturn]] void fail(const std::string& what) const
    {
        throw FixtureError(sourceName_ + ":" + std::to_string(lineNumber_) +
                           ": " + what);
    }

    /** Splits the line into its directive word and its key=value map. */
    std::pair<std::string, std::map<std::string, std::string>>
    split(const std::string& line) const
    {
        std::size_t at = skipBlanks(line, 0);
        const std::size_t wordEnd = tokenEnd(line, at);
        std::string word = line.substr(at, wordEnd - at);
        at = skipBlanks(line, wordEnd);

        std::map<std::string, std::string> values;
        while (at < line.size())
        {
            const std::size_t equals = line.find('=', at);
            const std::size_t end = tokenEnd(line, at);
            if (equals == std::string::npos || equals >= end)
            {
                fail("expected key=value, found \"" +
                     line.substr(at, end - at) + "\"");
            }
            std::string key = line.substr(at, equals - at);
            if (key.empty())
            {
                fail("empty key before '='");
            }
            std::string value;
            at = readValue(line, equals + 1, value);
            if (!values.emplace(key, std::move(value)).second)
            {
                fail("duplicate key " + key);
            }
            at = skipBlanks(line, at);
        }
        return {std::move(word), std::move(values)};
    }

    unsigned parseUnsigned(const std::string& key,
                           const std::string& text) const
    {
        if (text.empty() || text.size() > 10 ||
            text.find_first_not_of("0123456789") != std::string::npos)
        {
            fail("bad unsigned value for " + key + ": \"" + text + "\"");
        }
        const unsigned long long value = std::stoull(text);
        if (value > 4294967295ULL)
        {
            fail("value for " + key + " exceeds 4294967295: " + text);
        }
        return static_cast<unsigned>(value);
    }

    bool parseBoolean(const std::string& key, const std::string& text) const
    {
        if (text == "true")
        {
            return true;
        }
        if (text == "false")
        {
            return false;
        }
        fail("bad boolean value for " + key + ": \"" + text +
             "\" (expected true or false)");
    }

  private:
    static std::size_t skipBlanks(const std::string& line, std::size_t at)
    {
        while (at < line.size() && isBlank(line[at]))
        {
            ++at;
        }
        return at;
    }

    static std::size_t tokenEnd(const std::string& line, std::size_t at)
    {
        while (at < line.size() && !isBlank(line[at]))
        {
            ++at;
        }
        return at;
    }

    /** Reads a plain or quoted value starting at @p at; returns the index
     *  just after it. */
    std::size_t readValue(const std::string& line, std::size_t at,
                          std::string& value) const
    {
        if (at >= line.size() || line[at] != '"')
        {
            const std::size_t end = tokenEnd(line, at);
            value = line.substr(at, end - at);
            return end;
        }
        for (++at; at < line.size(); ++at)
        {
            const char c = line[at];
            if (c == '"')
            {
                ++at;
                if (at < line.size() && !isBlank(line[at]))
                {
                    fail("text after closing quote");
                }
                return at;
            }
            if (c == '\\')
            {
                ++at;
                if (at >= line.size() || (line[at] != '"' && line[at] != '\\'))
                {
                    fail("bad escape in quoted value (only \\\" and \\\\)");
                }
            }
            value += line[at];
        }
        fail("unterminated quoted value");
    }

    const std::string& sourceName_;
    std::size_t lineNumber_;
};

/** Turns directives into nodes, remembering the defaults for parents. */
class TreeReader
{
  public:
    void apply(const LineReader& reader, const std::string& word,
               std::map<std::string, std::string> values)
    {
        const Directive* directive = findDirective(word);
        if (directive == nullptr)
        {
            reader.fail("unknown directive \"" + word + "\"");
        }
        for (const auto& [key, value] : values)
        {
            if (!accepts(*directive, key))
            {
                reader.fail("unknown key " + key + " for " + word);
            }
        }

        const std::string parent = parentOf(reader, *directive, values);
        std::string path = take(values, "path");
        if (path.empty() && directive->kind == NodeLexicon::EventLogEntry)
        {
            if (!values.contains("RecordId"))
            {
                reader.fail("entry needs path= or RecordId=");
            }
            path = MemorySource::entryPath(
                parent, reader.parseUnsigned("RecordId", values["RecordId"]));
        }
        if (path.empty())
        {
            reader.fail(word + " needs a non-empty path=");
        }
        if (builder_.contains(path))
        {
            reader.fail("duplicate path " + path);
        }
        const unsigned status =
            values.contains("status")
                ? reader.parseUnsigned("status", take(values, "status"))
                : 0;
        builder_.addNode(directive->kind, path, parent,
                         take(values, "description"), status);
        setProperties(reader, path, values);

        if (directive->kind == NodeLexicon::ManagementController)
        {
            lastController_ = path;
        }
        else if (directive->kind == NodeLexicon::EventLog)
        {
            lastLog_ = path;
        }
    }

    std::shared_ptr<const NodeTree> build() &&
    {
        return std::move(builder_).build();
    }

  private:
    static const Directive* findDirective(const std::string& word)
    {
        for (const Directive& directive : directives())
        {
            if (word == directive.word)
            {
                return &directive;
            }
        }
        return nullptr;
    }

    static bool accepts(const Directive& directive, const std::string& key)
    {
        if (key == "path" || key == "status" || key == "description")
        {
            return true;
        }
        if (key == "parent")
        {
            return directive.kind != NodeLexicon::ManagementController;
        }
        for (const std::string& property : directive.properties)
        {
            if (key == property)
            {
                return true;
            }
        }
        return false;
    }

    static std::string take(std::map<std::string, std::string>& values,
                            const std::string& key)
    {
        const auto found = values.find(key);
        if (found == values.end())
        {
            return {};
        }
        std::string value = std::move(found->second);
        values.erase(found);
        return value;
    }

    std::string parentOf(const LineReader& reader, const Directive& directive,
                         std::map<std::string, std::string>& values) const
    {
        if (directive.kind == NodeLexicon::ManagementController)
        {
            return {};
        }
        if (values.contains("parent"))
        {
            std::string parent = take(values, "parent");
            if (!builder_.contains(parent))
            {
                reader.fail("unknown parent " + parent);
            }
            return parent;
        }
        const bool underLog = directive.kind == NodeLexicon::EventLogEntry;
        const std::string& parent = underLog ? lastLog_ : lastController_;
        if (parent.empty())
        {
            reader.fail(std::string(directive.word) + " without parent=: no " +
                        (underLog ? "log" : "controller") + " above it");
        }
        return parent;
    }

    void setProperties(const LineReader& reader, const std::string& path,
                       const std::map<std::string, std::string>& values)
    {
        for (const auto& [key, text] : values)
        {
            const PropertyKey* property = findPropertyKey(key);
            if (property == nullptr)
            {
                reader.fail("unknown key " + key);
            }
            PropertyValue value;
            switch (property->type)
            {
                case ValueType::Text:
                    value = text;
                    break;
                case ValueType::Unsigned:
                    value = reader.parseUnsigned(key, text);
                    break;
                case ValueType::Boolean:
                    value = reader.parseBoolean(key, text);
                    break;
            }
            builder_.setProperty(path, property->property, std::move(value));
        }
    }

    NodeTreeBuilder builder_;
    std::string lastController_;
    std::string lastLog_;
};

} // namespace

std::shared_ptr<const NodeTree> parseFixture(std::istream& in,
                                             const std::string& sourceName)
{
    TreeReader tree;
    std::string line;
    for (std::size_t lineNumber = 1; std::getline(in, line); ++lineNumber)
    {
        const std::size_t first = line.find_first_not_of(" \t\r\v\f");
        if (first == std::string::npos || line[first] == '#')
        {
            continue;
        }
        const LineReader reader(sourceName, lineNumber);
        auto [word, values] = reader.split(line);
        tree.apply(reader, word, std::move(values));
    }
    if (in.bad())
    {
        throw FixtureError(sourceName + ": read error");
    }
    return std::move(tree).build();
}

std::shared_ptr<const NodeTree> loadFixtureFile(const std::string& path)
{
    std::ifstream in(path);
    if (!in)
    {
        throw FixtureError(path + ": cannot open: " + std::strerror(errno));
    }
    return parseFixture(in, path);
}

} // namespace QX
