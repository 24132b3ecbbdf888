// The WBEM object-path parser of the host and selprov, with and without the
// provider's schema. A path that parses prints as text that parses again
// to the same text.
#include "Schema.h"
#include "SelClasses.h"
#include "Values.h"

#include <cstdint>
#include <cstdlib>
#include <stdexcept>
#include <string>
#include <string_view>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data,
                                      std::size_t size)
{
    static const host::Schema schema = selclasses::schema();
    if (size == 0)
    {
        return 0;
    }
    const host::Schema* const withSchema =
        (data[0] & 1) != 0 ? &schema : nullptr;
    const std::string_view text(reinterpret_cast<const char*>(data) + 1,
                                size - 1);
    std::string printed;
    try
    {
        printed = host::ObjectPath::parse(text, withSchema).toString();
    }
    catch (const std::invalid_argument&)
    {
        return 0;
    }
    try
    {
        if (host::ObjectPath::parse(printed, withSchema).toString() != printed)
        {
            std::abort();
        }
    }
    catch (const std::invalid_argument&)
    {
        // A printed path must read back.
        std::abort();
    }
    return 0;
}
