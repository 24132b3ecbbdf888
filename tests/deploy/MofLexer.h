#pragma once

// The tokens of MOF text, for the MOF reader.

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace mof::detail
{

struct Token
{
    enum class Kind
    {
        Identifier,
        String,
        Char,
        Integer,
        Real,
        Punctuation,
        End,
    };
    Kind kind = Kind::End;
    std::string text; // identifier, unescaped string/char, number as written
    std::int64_t integer = 0;
    int line = 0;
};

// "end of file", "'}'", "string \"x\"", "\"name\"": for messages.
std::string describe(const Token& token);

// Splits MOF text into tokens, the last one of kind End; comments and blanks
// are dropped, string and character literals unescaped, integers parsed.
// Throws MofError with "<source>:<line>: <what>".
std::vector<Token> tokenize(std::string_view text, const std::string& source);

} // namespace mof::detail
