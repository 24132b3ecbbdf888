// Entry timestamp text to CIM datetime text, checked against a plain
// rebuilding: the first 63 characters without '-', ':' and blanks, then
// the fixed fraction and offset.
#include "SEL.h"

#include <cstdint>
#include <cstdlib>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data,
                                      std::size_t size)
{
    const std::string timestamp(reinterpret_cast<const char*>(data), size);
    const std::string result =
        QX::SELComposite::convertTimestampToCIM(timestamp);

    std::string expected;
    for (const char c : timestamp.substr(0, 63))
    {
        if (c == '\0')
        {
            break;
        }
        if (c != '-' && c != ':' && c != ' ')
        {
            expected += c;
        }
    }
    expected += ".000000+000";
    if (result != expected)
    {
        std::abort();
    }
    return 0;
}
