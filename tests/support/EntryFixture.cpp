#include "EntryFixture.h"

#include "CVLogger.h"
#include "SelClasses.h"

namespace entry
{

using namespace QX::NodeLexicon;

QX::NodeTreeBuilder selTree(unsigned entries)
{
    QX::NodeTreeBuilder tree;
    tree.addNode(ManagementController, "/bmc0", "", "BMC", 1);
    tree.addNode(EventLog, "/bmc0/sel", "/bmc0", "System Event Log", 1);
    tree.setProperty("/bmc0/sel", Name, std::string("IPMI SEL Log"));
    tree.setProperty("/bmc0/sel", MaxRecords, 512u);
    tree.setProperty("/bmc0/sel", OverwritePolicy, 1u);
    tree.setProperty("/bmc0/sel", DataFormat, std::string("hex bytes"));
    for (unsigned id = 1; id <= entries; ++id)
    {
        addEntry(tree, id);
    }
    return tree;
}

void addEntry(QX::NodeTreeBuilder& tree, unsigned recordId,
              const std::string& timestamp, const std::string& description,
              const std::string& recordData)
{
    const std::string path = QX::MemorySource::entryPath("/bmc0/sel", recordId);
    tree.addNode(EventLogEntry, path, "/bmc0/sel", description, 1);
    tree.setProperty(path, RecordId, recordId);
    tree.setProperty(path, Timestamp, timestamp);
    tree.setProperty(path, RecordData, recordData);
}

host::ObjectPath classPath(const std::string& className)
{
    host::ObjectPath path;
    path.nameSpace = nameSpace;
    path.className = className;
    return path;
}

void expectComplete(const host::Outcome& outcome)
{
    EXPECT_EQ(outcome.rc, CMPI_RC_OK);
    EXPECT_TRUE(outcome.done);
}

void ProviderTest::SetUp()
{
    // Keep the provider's diagnostics out of the system log during tests.
    CVLog::CVLogger::setSink(nullptr);
    host_ =
        std::make_unique<host::Host>(selclasses::hostOptions(SELPROV_LIBRARY));
}

void ProviderTest::TearDown()
{
    host_.reset();
    QX::Platform::overrideSource(nullptr);
}

void ProviderTest::install(const QX::NodeTreeBuilder& tree)
{
    source = std::make_shared<QX::MemorySource>(tree.build());
    QX::Platform::overrideSource(source);
}

void CapturingProviderTest::SetUp()
{
    ProviderTest::SetUp();
    capture_ = std::make_shared<testsupport::CaptureSink>();
    previous_ = CVLog::CVLogger::settings();
    CVLog::CVLogger::setSink(capture_);
    CVLog::LoggerSettings all;
    all.logLevel = 1;
    all.traceLevel = 1;
    CVLog::CVLogger::configure(all);
}

void CapturingProviderTest::TearDown()
{
    CVLog::CVLogger::configure(previous_);
    CVLog::CVLogger::setSink(nullptr);
    ProviderTest::TearDown();
}

} // namespace entry
