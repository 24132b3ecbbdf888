// Class names with printf directives and of 100,000 characters, as the
// provider's trace lines show them.
#include "CVLogger.h"
#include "HostileCalls.h"
#include "sdk/qxlib/include/Trace.h"

#include <string>

#include <gtest/gtest.h>

namespace hostile
{
namespace
{

class HostileNames : public CapturingThreeEntries
{
  protected:
    /** The captured line that starts with @p prefix, or an empty text. */
    std::string lineStartingWith(const std::string& prefix) const
    {
        for (const CVLog::LogRecord& line : capture_->records())
        {
            if (line.message.starts_with(prefix))
            {
                return line.message;
            }
        }
        return {};
    }
};

TEST_F(HostileNames, DirectivesInAClassNameArePrintedAsTheyStand)
{
    const host::Outcome outcome =
        host().enumerateInstances(classPath(directives));
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    const std::string line = lineStartingWith("VARIABLE: 'classname'");
    EXPECT_TRUE(line.starts_with("VARIABLE: 'classname' has Value '" +
                                 directives + "' at line "))
        << line;
    EXPECT_TRUE(line.ends_with(" in SELProvider.cpp")) << line;
}

TEST_F(HostileNames, AHugeClassNameIsCutAtTheBuffer)
{
    const host::Outcome outcome =
        host().enumerateInstanceNames(classPath(hugeName));
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    const std::string line = lineStartingWith("VARIABLE: 'classname'");
    const std::string start = "VARIABLE: 'classname' has Value '";
    ASSERT_EQ(line.size(), QX::TRACE_BUFFER_SIZE - 1);
    EXPECT_EQ(line, start + std::string(line.size() - start.size(), 'A'));
    EXPECT_FALSE(lineStartingWith("MESSAGE [File: ").empty());
}

} // namespace
} // namespace hostile
