// The platform configuration reader on arbitrary text: it gives settings
// within their ranges or reports the line with a std::runtime_error.
#include "Configuration.h"

#include <cstdint>
#include <cstdlib>
#include <stdexcept>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data,
                                      std::size_t size)
{
    const std::string text(reinterpret_cast<const char*>(data), size);
    try
    {
        const QX::Platform::Configuration configuration =
            QX::Platform::parseConfiguration(text, "fuzz.conf");
        if (configuration.logLevel < 0 || configuration.traceLevel < 0 ||
            (configuration.source != "memory" &&
             configuration.source != "ipmi"))
        {
            std::abort();
        }
    }
    catch (const std::runtime_error&)
    {
    }
    return 0;
}
