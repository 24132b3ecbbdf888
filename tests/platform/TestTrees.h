#pragma once

// Small trees shared by the platform tests.

#include "MemorySource.h"
#include "NodeTree.h"

#include <memory>
#include <string>

namespace QX::test
{

/**
 * Two controllers: /bmc0 with logs /bmc0/sel (3 entries, ids 1..3) and
 * /bmc0/aux (1 entry, id 7) and a watchdog; /bmc1 with log /bmc1/sel
 * (2 entries, ids 1..2).
 */
inline std::shared_ptr<const NodeTree> twoControllerTree()
{
    using namespace NodeLexicon;
    NodeTreeBuilder builder;
    builder.addNode(ManagementController, "/bmc0", "", "BMC zero", 1)
        .addNode(EventLog, "/bmc0/sel", "/bmc0", "SEL zero", 2)
        .setProperty("/bmc0/sel", Name, std::string("IPMI SEL Log"))
        .setProperty("/bmc0/sel", MaxRecords, 512u)
        .setProperty("/bmc0/sel", IsEmpty, false)
        .addNode(Watchdog, "/bmc0/wdt", "/bmc0", "Watchdog 2", 1)
        .setProperty("/bmc0/wdt", RestartCause, 4u)
        .addNode(EventLog, "/bmc0/aux", "/bmc0", "aux log", 3)
        .addNode(ManagementController, "/bmc1", "", "BMC one", 1)
        .addNode(EventLog, "/bmc1/sel", "/bmc1", "SEL one", 2)
        .setProperty("/bmc1/sel", Name, std::string("Second SEL"));
    for (unsigned id = 1; id <= 3; ++id)
    {
        const std::string path = MemorySource::entryPath("/bmc0/sel", id);
        builder.addNode(EventLogEntry, path, "/bmc0/sel", "entry", 0)
            .setProperty(path, RecordId, id);
    }
    builder.addNode(EventLogEntry, "/bmc0/aux/entry-00007", "/bmc0/aux", "", 0)
        .setProperty("/bmc0/aux/entry-00007", RecordId, 7u);
    for (unsigned id = 1; id <= 2; ++id)
    {
        const std::string path = MemorySource::entryPath("/bmc1/sel", id);
        builder.addNode(EventLogEntry, path, "/bmc1/sel", "entry", 0)
            .setProperty(path, RecordId, id);
    }
    return builder.build();
}

} // namespace QX::test
