#pragma once

#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace mof
{

// One "[ClassName]" block of an SFCB providerRegister file with its
// "key: value" lines, in file order.
struct SfcbStanza
{
    std::string className;
    std::vector<std::pair<std::string, std::string>> entries;
    int line = 0;

    // The value of a key (keys compare without regard to case); nullptr
    // when the block has no such line.
    const std::string* value(std::string_view key) const;
};

// Parses providerRegister text: "#" comment lines, blank lines, "[Class]"
// headers and "key: value" lines. A key line outside a block, a line that
// is neither, a block given twice or a key given twice in one block throws
// MofError with "<source>:<line>: <what>".
std::vector<SfcbStanza> parseSfcbRegistration(std::string_view text,
                                              const std::string& source);
std::vector<SfcbStanza> parseSfcbRegistrationFile(const std::string& path);

// The words of a value: "instance method" gives {"instance", "method"}.
std::vector<std::string> words(std::string_view text);

} // namespace mof
