// Object paths in WBEM text form: [//host/]namespace:Class.Key=value,...
#include "WbemText.h"

#include "Names.h"
#include "Schema.h"
#include "Values.h"

#include <algorithm>
#include <charconv>
#include <cstdio>
#include <limits>
#include <stdexcept>
#include <system_error>

namespace host
{

std::string quoted(std::string_view text)
{
    std::string out = "\"";
    for (const char c : text)
    {
        switch (c)
        {
            case '"':
                out += "\\\"";
                break;
            case '\\':
                out += "\\\\";
                break;
            case '\n':
                out += "\\n";
                break;
            case '\r':
                out += "\\r";
                break;
            case '\t':
                out += "\\t";
                break;
            default:
                if (static_cast<unsigned char>(c) < 0x20)
                {
                    char buf[8];
                    std::snprintf(buf, sizeof buf, "\\x%02X",
                                  static_cast<unsigned>(c));
                    out += buf;
                }
                else
                {
                    out += c;
                }
        }
    }
    return out + "\"";
}

std::string realText(double value)
{
    char buf[64];
    const auto result = std::to_chars(buf, buf + sizeof buf, value);
    return std::string(buf, result.ptr);
}

namespace
{

std::string keyText(const Value& v)
{
    switch (v.type)
    {
        case CMPI_char16:
            return quoted(std::string(1, static_cast<char>(v.unsignedValue())));
        default:
            return v.toString();
    }
}

class PathParser
{
  public:
    PathParser(std::string_view text, const Schema* schema) :
        text_(text), schema_(schema)
    {
    }

    ObjectPath parse()
    {
        ObjectPath path;
        if (text_.empty())
        {
            fail("empty object path");
        }
        if (text_.substr(0, 2) == "//")
        {
            pos_ = 2;
            const auto slash = text_.find('/', pos_);
            if (slash == std::string_view::npos || slash == pos_)
            {
                fail("host part must be //host/");
            }
            path.host = std::string(text_.substr(pos_, slash - pos_));
            pos_ = slash + 1;
        }
        const auto colon = text_.find(':', pos_);
        const auto stop = text_.find_first_of(".=\"", pos_);
        if (colon != std::string_view::npos &&
            (stop == std::string_view::npos || colon < stop))
        {
            path.nameSpace = text_.substr(pos_, colon - pos_);
            checkNameSpace(path.nameSpace);
            pos_ = colon + 1;
        }
        path.className = identifier("class name");
        if (atEnd())
        {
            return path;
        }
        expect('.');
        const ClassKeys* keys =
            schema_ ? schema_->find(path.className) : nullptr;
        for (;;)
        {
            std::string name = identifier("key name");
            expect('=');
            Value value = keyValue();
            if (path.key(name))
            {
                fail("duplicate key " + name);
            }
            if (keys)
            {
                value = applySchema(*keys, name, std::move(value));
            }
            path.keys.edit().emplace_back(std::move(name), std::move(value));
            if (atEnd())
            {
                return path;
            }
            expect(',');
        }
    }

  private:
    [[noreturn]] void fail(const std::string& why) const
    {
        throw std::invalid_argument(
            "invalid object path \"" + std::string(text_) + "\": " + why +
            " (at offset " + std::to_string(pos_) + ")");
    }

    bool atEnd() const
    {
        return pos_ >= text_.size();
    }

    void expect(char c)
    {
        if (atEnd() || text_[pos_] != c)
        {
            fail(std::string("expected '") + c + "'");
        }
        ++pos_;
    }

    void checkNameSpace(std::string_view ns) const
    {
        const bool ok = !ns.empty() && ns.front() != '/' && ns.back() != '/' &&
                        std::all_of(ns.begin(), ns.end(),
                                    [](char c)
                                    {
                                        return c == '/' || c == '_' ||
                                               (c >= '0' && c <= '9') ||
                                               (c >= 'a' && c <= 'z') ||
                                               (c >= 'A' && c <= 'Z');
                                    });
        if (!ok)
        {
            fail("bad namespace \"" + std::string(ns) + "\"");
        }
    }

    std::string identifier(const char* what)
    {
        std::size_t end = pos_;
        while (end < text_.size() &&
               (text_[end] == '_' || (text_[end] >= '0' && text_[end] <= '9') ||
                (text_[end] >= 'a' && text_[end] <= 'z') ||
                (text_[end] >= 'A' && text_[end] <= 'Z')))
        {
            ++end;
        }
        std::string name(text_.substr(pos_, end - pos_));
        if (!isIdentifier(name))
        {
            fail(std::string("expected a ") + what);
        }
        pos_ = end;
        return name;
    }

    Value keyValue()
    {
        if (!atEnd() && text_[pos_] == '"')
        {
            return Value::string(quotedText());
        }
        std::size_t end = pos_;
        while (end < text_.size() && text_[end] != ',')
        {
            ++end;
        }
        const std::string_view word = text_.substr(pos_, end - pos_);
        if (word.empty())
        {
            fail("missing key value");
        }
        if (sameName(word, "TRUE") || sameName(word, "FALSE"))
        {
            pos_ = end;
            return Value::boolean(sameName(word, "TRUE"));
        }
        Value v;
        std::from_chars_result r{};
        if (word.front() == '-')
        {
            std::int64_t n = 0;
            r = std::from_chars(word.data(), word.data() + word.size(), n);
            v = Value::signedInt(CMPI_sint64, n);
        }
        else
        {
            std::uint64_t n = 0;
            r = std::from_chars(word.data(), word.data() + word.size(), n);
            v = Value::unsignedInt(CMPI_uint64, n);
        }
        if (r.ec == std::errc::result_out_of_range)
        {
            fail("integer key value out of range");
        }
        if (r.ec != std::errc() || r.ptr != word.data() + word.size())
        {
            fail("key value must be quoted, TRUE, FALSE or an integer");
        }
        pos_ = end;
        return v;
    }

    std::string quotedText()
    {
        ++pos_; // opening quote
        std::string out;
        while (!atEnd())
        {
            const char c = text_[pos_++];
            if (c == '"')
            {
                return out;
            }
            if (c == '\0')
            {
                --pos_;
                fail("NUL in a quoted value");
            }
            if (c != '\\')
            {
                out += c;
                continue;
            }
            if (atEnd())
            {
                break;
            }
            const char e = text_[pos_++];
            switch (e)
            {
                case '"':
                case '\\':
                    out += e;
                    break;
                case 'n':
                    out += '\n';
                    break;
                case 'r':
                    out += '\r';
                    break;
                case 't':
                    out += '\t';
                    break;
                case 'x':
                    out += hexEscape();
                    break;
                default:
                    --pos_;
                    fail(std::string("unknown escape \\") + e);
            }
        }
        fail("unterminated quoted value");
    }

    // \xNN, as quoted() writes the other control characters; NUL cannot
    // travel in a CMPI string and is refused.
    char hexEscape()
    {
        unsigned code = 0;
        const char* const digits = text_.data() + pos_;
        const auto r = std::from_chars(
            digits, digits + std::min<std::size_t>(2, text_.size() - pos_),
            code, 16);
        if (r.ec != std::errc() || r.ptr != digits + 2 || code == 0)
        {
            fail("\\x must be followed by two hex digits other than 00");
        }
        pos_ += 2;
        return static_cast<char>(code);
    }

    // Keys of a known class take the class's type when the text fits it;
    // otherwise the parsed type is kept so a provider sees the wrong type.
    Value applySchema(const ClassKeys& keys, const std::string& name,
                      Value value) const
    {
        for (const auto& [keyName, type] : keys.keys)
        {
            if (!sameName(keyName, name))
            {
                continue;
            }
            const bool isText = value.type == CMPI_string;
            if ((type == CMPI_dateTime || type == CMPI_string) && isText)
            {
                value.type = type;
            }
            else if (type == CMPI_boolean && value.type == CMPI_boolean)
            {
            }
            else if (type < 0x100 && (type & CMPI_UINT) &&
                     value.type == CMPI_uint64 && (type & 0xC0) == 0x80)
            {
                const unsigned bits = 8u << ((type - CMPI_uint8) >> 4);
                if (bits < 64 &&
                    value.unsignedValue() >= (std::uint64_t{1} << bits))
                {
                    fail("key " + name + " out of range for its type");
                }
                value.type = type;
            }
            else if (type < 0x100 && (type & 0xC0) == 0xC0 &&
                     (value.type == CMPI_sint64 ||
                      (value.type == CMPI_uint64 &&
                       value.unsignedValue() <=
                           static_cast<std::uint64_t>(
                               std::numeric_limits<std::int64_t>::max()))))
            {
                if (value.type == CMPI_uint64)
                {
                    value.setSigned(
                        static_cast<std::int64_t>(value.unsignedValue()));
                }
                const unsigned bits = 8u << ((type - CMPI_sint8) >> 4);
                if (bits < 64)
                {
                    const std::int64_t limit = std::int64_t{1} << (bits - 1);
                    if (value.signedValue() < -limit ||
                        value.signedValue() >= limit)
                    {
                        fail("key " + name + " out of range for its type");
                    }
                }
                value.type = type;
            }
        }
        return value;
    }

    std::string_view text_;
    const Schema* schema_;
    std::size_t pos_ = 0;
};

} // namespace

std::string ObjectPath::toString() const
{
    std::string out;
    if (!host.empty())
    {
        out += "//" + host + "/";
    }
    if (!nameSpace.empty())
    {
        out += nameSpace + ":";
    }
    out += className;
    std::vector<const NamedValues::value_type*> sorted;
    for (const auto& k : keys)
    {
        sorted.push_back(&k);
    }
    std::stable_sort(sorted.begin(), sorted.end(),
                     [](const auto* a, const auto* b)
                     { return nameLess(a->first, b->first); });
    for (std::size_t i = 0; i < sorted.size(); ++i)
    {
        out += (i ? "," : ".") + sorted[i]->first + "=" +
               keyText(sorted[i]->second);
    }
    return out;
}

ObjectPath ObjectPath::parse(std::string_view text, const Schema* schema)
{
    return PathParser(text, schema).parse();
}

} // namespace host
