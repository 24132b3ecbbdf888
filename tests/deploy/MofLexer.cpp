// The lexical layer of the MOF reader: comments, identifiers, string and
// character literals with their escapes, numbers and punctuation.
#include "MofLexer.h"

#include "Mof.h"

#include <cctype>
#include <limits>

namespace mof::detail
{

std::string describe(const Token& token)
{
    switch (token.kind)
    {
        case Token::Kind::End:
            return "end of file";
        case Token::Kind::String:
            return "string \"" + token.text + "\"";
        case Token::Kind::Char:
            return "character literal";
        case Token::Kind::Punctuation:
            return "'" + token.text + "'";
        default:
            return "\"" + token.text + "\"";
    }
}

namespace
{

bool isIdentifierStart(char c)
{
    return std::isalpha(static_cast<unsigned char>(c)) != 0 || c == '_';
}

bool isIdentifierChar(char c)
{
    return std::isalnum(static_cast<unsigned char>(c)) != 0 || c == '_';
}

bool isDigit(char c)
{
    return c >= '0' && c <= '9';
}

class Lexer
{
  public:
    Lexer(std::string_view text, const std::string& source) :
        text_(text), source_(source)
    {
    }

    std::vector<Token> tokens()
    {
        std::vector<Token> result;
        for (;;)
        {
            skipBlanksAndComments();
            Token token;
            token.line = line_;
            if (at_ >= text_.size())
            {
                result.push_back(token);
                return result;
            }
            const char c = text_[at_];
            if (isIdentifierStart(c))
            {
                token.kind = Token::Kind::Identifier;
                token.text = takeWhile(isIdentifierChar);
            }
            else if (c == '"')
            {
                token.kind = Token::Kind::String;
                token.text = quoted('"');
            }
            else if (c == '\'')
            {
                token.kind = Token::Kind::Char;
                token.text = quoted('\'');
            }
            else if (startsNumber())
            {
                number(token);
            }
            else if (std::string_view("{}()[];,:=$#").find(c) !=
                     std::string_view::npos)
            {
                token.kind = Token::Kind::Punctuation;
                token.text = std::string(1, c);
                ++at_;
            }
            else
            {
                fail("unexpected character '" + std::string(1, c) + "'");
            }
            result.push_back(std::move(token));
        }
    }

  private:
    [[noreturn]] void fail(const std::string& what) const
    {
        throw MofError(source_ + ":" + std::to_string(line_) + ": " + what);
    }

    char peek(std::size_t ahead = 0) const
    {
        return at_ + ahead < text_.size() ? text_[at_ + ahead] : '\0';
    }

    void skipBlanksAndComments()
    {
        while (at_ < text_.size())
        {
            const char c = text_[at_];
            if (c == '\n')
            {
                ++line_;
                ++at_;
            }
            else if (std::isspace(static_cast<unsigned char>(c)) != 0)
            {
                ++at_;
            }
            else if (c == '/' && peek(1) == '/')
            {
                while (at_ < text_.size() && text_[at_] != '\n')
                {
                    ++at_;
                }
            }
            else if (c == '/' && peek(1) == '*')
            {
                const int opened = line_;
                at_ += 2;
                while (!(peek() == '*' && peek(1) == '/'))
                {
                    if (at_ >= text_.size())
                    {
                        line_ = opened;
                        fail("comment not closed");
                    }
                    line_ += text_[at_] == '\n' ? 1 : 0;
                    ++at_;
                }
                at_ += 2;
            }
            else
            {
                return;
            }
        }
    }

    template <typename Predicate>
    std::string takeWhile(Predicate predicate)
    {
        const std::size_t start = at_;
        while (at_ < text_.size() && predicate(text_[at_]))
        {
            ++at_;
        }
        return std::string(text_.substr(start, at_ - start));
    }

    bool startsNumber() const
    {
        const char c = peek();
        if (isDigit(c))
        {
            return true;
        }
        if (c == '+' || c == '-')
        {
            return isDigit(peek(1)) || (peek(1) == '.' && isDigit(peek(2)));
        }
        return c == '.' && isDigit(peek(1));
    }

    // Decimal, octal (leading 0), hexadecimal (0x), binary (trailing b)
    // integers and reals, each with an optional sign.
    void number(Token& token)
    {
        const std::size_t start = at_;
        if (peek() == '+' || peek() == '-')
        {
            ++at_;
        }
        while (at_ < text_.size())
        {
            const char c = text_[at_];
            const bool exponentSign =
                (c == '+' || c == '-') && at_ > start &&
                (text_[at_ - 1] == 'e' || text_[at_ - 1] == 'E') &&
                !isHexText(start);
            if (!isIdentifierChar(c) && c != '.' && !exponentSign)
            {
                break;
            }
            ++at_;
        }
        token.text = std::string(text_.substr(start, at_ - start));
        const bool negative = token.text.front() == '-';
        std::string body = token.text;
        if (body.front() == '+' || body.front() == '-')
        {
            body.erase(0, 1);
        }
        int base = 10;
        if (body.size() > 2 && body[0] == '0' &&
            (body[1] == 'x' || body[1] == 'X'))
        {
            base = 16;
            body.erase(0, 2);
        }
        else if (body.size() > 1 && (body.back() == 'b' || body.back() == 'B'))
        {
            base = 2;
            body.pop_back();
        }
        else if (body.find_first_of(".eE") != std::string::npos)
        {
            checkReal(body, token.text);
            token.kind = Token::Kind::Real;
            return;
        }
        else if (body.size() > 1 && body[0] == '0')
        {
            base = 8;
        }
        token.kind = Token::Kind::Integer;
        token.integer = integerValue(body, base, negative, token.text);
    }

    bool isHexText(std::size_t start) const
    {
        std::size_t digits = start;
        if (text_[digits] == '+' || text_[digits] == '-')
        {
            ++digits;
        }
        return digits + 1 < text_.size() && text_[digits] == '0' &&
               (text_[digits + 1] == 'x' || text_[digits + 1] == 'X');
    }

    void checkReal(const std::string& body, const std::string& written) const
    {
        std::size_t i = 0;
        std::size_t mantissaDigits = 0;
        while (i < body.size() && isDigit(body[i]))
        {
            ++i;
            ++mantissaDigits;
        }
        if (i < body.size() && body[i] == '.')
        {
            ++i;
            while (i < body.size() && isDigit(body[i]))
            {
                ++i;
                ++mantissaDigits;
            }
        }
        if (mantissaDigits > 0 && i < body.size() &&
            (body[i] == 'e' || body[i] == 'E'))
        {
            ++i;
            if (i < body.size() && (body[i] == '+' || body[i] == '-'))
            {
                ++i;
            }
            const std::size_t exponentStart = i;
            while (i < body.size() && isDigit(body[i]))
            {
                ++i;
            }
            if (i == exponentStart)
            {
                i = std::string::npos;
            }
        }
        if (mantissaDigits == 0 || i != body.size())
        {
            fail("bad number \"" + written + "\"");
        }
    }

    std::int64_t integerValue(const std::string& digits, int base,
                              bool negative, const std::string& written) const
    {
        if (digits.empty())
        {
            fail("bad number \"" + written + "\"");
        }
        // Magnitudes up to 2^64 - 1 are accepted (uint64 values); the
        // value is kept as its 64-bit two's complement pattern.
        std::uint64_t value = 0;
        for (const char c : digits)
        {
            int digit = 0;
            if (isDigit(c))
            {
                digit = c - '0';
            }
            else if (c >= 'a' && c <= 'f')
            {
                digit = c - 'a' + 10;
            }
            else if (c >= 'A' && c <= 'F')
            {
                digit = c - 'A' + 10;
            }
            else
            {
                digit = base; // not a digit at all
            }
            if (digit >= base)
            {
                fail("bad number \"" + written + "\"");
            }
            const auto b = static_cast<std::uint64_t>(base);
            if (value > (std::numeric_limits<std::uint64_t>::max() -
                         static_cast<std::uint64_t>(digit)) /
                            b)
            {
                fail("number out of range \"" + written + "\"");
            }
            value = value * b + static_cast<std::uint64_t>(digit);
        }
        if (negative)
        {
            const std::uint64_t limit =
                static_cast<std::uint64_t>(
                    std::numeric_limits<std::int64_t>::max()) +
                1;
            if (value > limit)
            {
                fail("number out of range \"" + written + "\"");
            }
            return value == limit ? std::numeric_limits<std::int64_t>::min()
                                  : -static_cast<std::int64_t>(value);
        }
        return static_cast<std::int64_t>(value);
    }

    std::string quoted(char quote)
    {
        std::string out;
        ++at_;
        for (;;)
        {
            if (at_ >= text_.size() || text_[at_] == '\n')
            {
                fail(std::string(quote == '"' ? "string" : "character") +
                     " literal not closed");
            }
            const char c = text_[at_++];
            if (c == quote)
            {
                break;
            }
            if (c != '\\')
            {
                out += c;
                continue;
            }
            escape(out);
        }
        if (quote == '\'' && out.empty())
        {
            fail("empty character literal");
        }
        return out;
    }

    void escape(std::string& out)
    {
        if (at_ >= text_.size())
        {
            fail("string literal not closed");
        }
        const char e = text_[at_++];
        switch (e)
        {
            case 'b':
                out += '\b';
                return;
            case 't':
                out += '\t';
                return;
            case 'n':
                out += '\n';
                return;
            case 'f':
                out += '\f';
                return;
            case 'r':
                out += '\r';
                return;
            case '"':
            case '\'':
            case '\\':
                out += e;
                return;
            case 'x':
            case 'X':
                hexEscape(out);
                return;
            default:
                fail("unknown escape \"\\" + std::string(1, e) + "\"");
        }
    }

    // \x followed by one to four hex digits: a UCS-2 character, written
    // out as UTF-8.
    void hexEscape(std::string& out)
    {
        unsigned code = 0;
        int digits = 0;
        while (digits < 4 &&
               std::isxdigit(static_cast<unsigned char>(peek())) != 0)
        {
            const char c = text_[at_++];
            code =
                code * 16 +
                static_cast<unsigned>(
                    isDigit(c) ? c - '0'
                               : std::tolower(static_cast<unsigned char>(c)) -
                                     'a' + 10);
            ++digits;
        }
        if (digits == 0)
        {
            fail("\\x escape without hex digits");
        }
        if (code < 0x80)
        {
            out += static_cast<char>(code);
        }
        else if (code < 0x800)
        {
            out += static_cast<char>(0xC0 | (code >> 6));
            out += static_cast<char>(0x80 | (code & 0x3F));
        }
        else
        {
            out += static_cast<char>(0xE0 | (code >> 12));
            out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
            out += static_cast<char>(0x80 | (code & 0x3F));
        }
    }

    std::string_view text_;
    const std::string& source_;
    std::size_t at_ = 0;
    int line_ = 1;
};

} // namespace

std::vector<Token> tokenize(std::string_view text, const std::string& source)
{
    return Lexer(text, source).tokens();
}

} // namespace mof::detail
