#include "PlatformFixture.h"

#include "CapturedLines.h"

namespace testsupport
{

using namespace QX::NodeLexicon;

QX::NodeTreeBuilder standardTree(unsigned entries, unsigned maxRecords)
{
    QX::NodeTreeBuilder tree;
    tree.addNode(ManagementController, "/bmc0", "", "BMC", 1);
    tree.addNode(EventLog, "/bmc0/sel", "/bmc0", "System Event Log", 1);
    tree.setProperty("/bmc0/sel", Name, std::string("IPMI SEL Log"));
    tree.setProperty("/bmc0/sel", MaxRecords, maxRecords);
    tree.setProperty("/bmc0/sel", OverwritePolicy, 1u);
    tree.setProperty("/bmc0/sel", DataFormat, std::string("hex bytes"));
    tree.setProperty("/bmc0/sel", IsEmpty, entries == 0);
    for (unsigned id = 1; id <= entries; ++id)
    {
        addEntry(tree, "/bmc0/sel", id, "2011-01-02 03:04:05");
    }
    return tree;
}

void addEntry(QX::NodeTreeBuilder& tree, const std::string& logPath,
              unsigned recordId, const std::string& timestamp,
              const std::string& description)
{
    const std::string path = QX::MemorySource::entryPath(logPath, recordId);
    tree.addNode(EventLogEntry, path, logPath, description, 1);
    tree.setProperty(path, RecordId, recordId);
    tree.setProperty(path, Timestamp, timestamp);
    tree.setProperty(path, RecordData,
                     std::string("01 00 02 00 00 00 00 20 00 04 01 30 01 59 "
                                 "50 52"));
}

void PlatformTest::SetUp()
{
    capture = std::make_shared<testsupport::CaptureSink>();
    previousSettings_ = CVLog::CVLogger::settings();
    previousSink_ = CVLog::CVLogger::setSink(capture);
    CVLog::LoggerSettings everything;
    everything.logLevel = 1;
    everything.traceLevel = 1;
    everything.components = {"*"};
    CVLog::CVLogger::configure(everything);
}

void PlatformTest::TearDown()
{
    QX::Platform::overrideSource(nullptr);
    CVLog::CVLogger::configure(previousSettings_);
    CVLog::CVLogger::setSink(previousSink_);
}

void PlatformTest::install(const QX::NodeTreeBuilder& tree)
{
    source = std::make_shared<QX::MemorySource>(tree.build());
    QX::Platform::overrideSource(source);
}

std::vector<CVLog::LogRecord> PlatformTest::logRecords() const
{
    return capture->records();
}

std::vector<CVLog::LogRecord>
PlatformTest::recordsContaining(const std::string& text) const
{
    return testsupport::recordsContaining(*capture, text);
}

} // namespace testsupport
