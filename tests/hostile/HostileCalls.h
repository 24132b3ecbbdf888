#pragma once

// The table of hostile calls: what each call has at hand, the answer it
// must give, and the helpers the rows are written with. The rows are
// grouped by the operations they call (HostileInstanceCalls.cpp,
// HostileMethodCalls.cpp, HostileStubCalls.cpp).
#include "EntryFixture.h"

#include <cmpift.h>

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

namespace hostile
{

using entry::classPath;
using host::ObjectPath;
using host::Value;

constexpr const char* logClass = "ZAN_MgmtHwLog";
constexpr const char* entryClass = "ZAN_MgmtHwLogEntry";
constexpr unsigned entryCount = 3;

// Inline, so that they are made before the table that uses them is built
// in any file that includes this one.
inline const std::string hugeName(100000, 'A');
inline const std::string directives = "%n%s%s%s%x%p%n%99999999d";
inline const std::string invalidUtf8 = "\xff\xfe\xc0\xaf\xed\xa0\x80Z";

/** What the table's calls have at hand. */
struct Call
{
    host::Broker& broker;
    const CMPIContext* context;
    const CMPIResult* result;
    CMPIInstanceMI* instanceMI;
    CMPIMethodMI* methodMI;
    CMPIIndicationMI* indicationMI;
    /** The path of the first entry, as the provider names it. */
    const ObjectPath& firstEntry;

    CMPIObjectPath* path(const ObjectPath& value) const
    {
        return broker.makeObjectPath(value);
    }
};

/** The answer a call must give. */
struct Expected
{
    CMPIrc rc = CMPI_RC_OK;
    std::optional<std::string> message;
    bool done = false;
    std::size_t paths = 0;
    std::size_t instances = 0;
    std::optional<std::uint32_t> returnValue;
};

struct Case
{
    std::string name;
    std::function<CMPIStatus(const Call&)> call;
    Expected expected;
};

void PrintTo(const Case& c, std::ostream* out);

ObjectPath withClass(const std::string& className);
ObjectPath logPath();
ObjectPath withManyKeys(ObjectPath path, unsigned count);

Expected failed(const char* message);
Expected enumerated(std::size_t paths, std::size_t instances);
Expected methodValue(std::uint32_t value);

inline const Expected noResult = failed("No result was passed");
inline const Expected noPath = failed("No object path was passed");
/** An unknown class: the factory finds nothing and no end is signalled. */
inline const Expected unknownClass{};
inline const Expected notSupported = []
{
    Expected expected;
    expected.rc = CMPI_RC_ERR_NOT_SUPPORTED;
    return expected;
}();

// Operations through the tables, with any argument replaceable.
CMPIStatus names(const Call& c, const CMPIContext* context,
                 const CMPIResult* result, const CMPIObjectPath* path);
CMPIStatus instances(const Call& c, const CMPIContext* context,
                     const CMPIResult* result, const CMPIObjectPath* path,
                     const char** properties);
CMPIStatus get(const Call& c, const CMPIContext* context,
               const CMPIResult* result, const CMPIObjectPath* path,
               const char** properties);
CMPIStatus invoke(const Call& c, const CMPIContext* context,
                  const CMPIResult* result, const CMPIObjectPath* path,
                  const char* method, const CMPIArgs* in, CMPIArgs* out);

inline const char* hostileProperties[] = {
    hugeName.c_str(), directives.c_str(), invalidUtf8.c_str(),
    "RecordID",       "RecordID",         "",
    nullptr};
inline const char* emptyProperties[] = {nullptr};

/** Rows calling enumerateInstanceNames, enumerateInstances, getInstance. */
std::vector<Case> instanceCalls();
/** Rows calling invokeMethod. */
std::vector<Case> methodCalls();
/** Rows calling the operations the provider does not support. */
std::vector<Case> stubCalls();

/** The provider on three entries, with every diagnostic line captured. */
class CapturingThreeEntries : public entry::CapturingProviderTest
{
  protected:
    void SetUp() override
    {
        CapturingProviderTest::SetUp();
        install(entry::selTree(entryCount));
    }
};

} // namespace hostile
