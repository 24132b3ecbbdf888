// The fixture reader on arbitrary text: it builds a tree or reports the
// line with a FixtureError, nothing else.
#include "Fixture.h"

#include "CVLogger.h"

#include <cstdint>
#include <sstream>
#include <string>

extern "C" int LLVMFuzzerInitialize(int*, char***)
{
    CVLog::CVLogger::setSink(nullptr);
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data,
                                      std::size_t size)
{
    std::istringstream text(
        std::string(reinterpret_cast<const char*>(data), size));
    try
    {
        QX::parseFixture(text, "fuzz.fixture");
    }
    catch (const QX::FixtureError&)
    {
    }
    return 0;
}
