// The trace lines that come from a header name it as the project does,
// without the directories of the machine that built the library.
#include "EntryFixture.h"

#include <string>

#include <gtest/gtest.h>

namespace
{

using HeaderTraceLines = entry::CapturingProviderTest;

TEST_F(HeaderTraceLines, NameTheHeaderAsTheProjectDoes)
{
    install(entry::selTree(1));
    host().enumerateInstances(entry::classPath("ZAN_MgmtHwLog"));
    const auto records = capture_->records();
    int marks = 0;
    for (const auto& record : records)
    {
        if (record.function != "markProviderEntry" &&
            record.function != "markProviderExit")
        {
            continue;
        }
        ++marks;
        EXPECT_EQ(record.file, "diagnostics/sdk/qxlib/include/Trace.h");
        EXPECT_NE(record.file.front(), '/');
        EXPECT_EQ(record.file.find(SELPROV_SOURCE_DIR), std::string::npos);
    }
    // Entry and exit, each a banner and a line, on both channels.
    EXPECT_EQ(marks, 8);
}

} // namespace
