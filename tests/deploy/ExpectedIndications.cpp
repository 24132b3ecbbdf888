#include "ExpectedIndications.h"

#include "CVLogger.h"
#include "EntryFixture.h"
#include "Host.h"
#include "MemorySource.h"
#include "NodeTree.h"
#include "Platform.h"
#include "ProvidedInstances.h"
#include "SelClasses.h"

#include <chrono>
#include <memory>
#include <stdexcept>
#include <string>

namespace deploy
{

namespace
{

using namespace QX::NodeLexicon;

constexpr const char* nameSpace = "root/zanqx";
constexpr std::chrono::seconds patience{10};

std::shared_ptr<const QX::NodeTree> treeWithWatchdog()
{
    QX::NodeTreeBuilder tree = entry::selTree(0);
    tree.setProperty("/bmc0/sel", IsEmpty, false);
    tree.addNode(Watchdog, "/bmc0/wdt", "/bmc0", "Watchdog 2", 1);
    tree.setProperty("/bmc0/wdt", RestartCause, 4u);
    return tree.build();
}

std::vector<host::Instance> deliverOneOfEach()
{
    CVLog::CVLogger::setSink(nullptr);
    auto source = std::make_shared<QX::MemorySource>(treeWithWatchdog());
    QX::Platform::overrideSource(source);
    std::vector<host::Instance> delivered;
    {
        host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
        host::IndicationInbox inbox = host.listen(nameSpace);
        for (const std::string& className : indicationClassNames())
        {
            host.activateFilter(selclasses::filterFor(className), true);
        }
        host.enableIndications();
        for (const QX::SimulatedAlert alert :
             {QX::SimulatedAlert::RecordAdded, QX::SimulatedAlert::LogCleared,
              QX::SimulatedAlert::LogAlmostFull, QX::SimulatedAlert::LogFull,
              QX::SimulatedAlert::WatchdogRestart})
        {
            source->raiseSimulatedAlert(alert);
            const auto indication = inbox.next(patience);
            if (!indication)
            {
                throw std::runtime_error(
                    std::string("no indication for the simulated alert \"") +
                    QX::simulatedAlertName(alert) + "\"");
            }
            delivered.push_back(indication->instance);
        }
        host.disableIndications();
    }
    QX::Platform::overrideSource(nullptr);
    return delivered;
}

} // namespace

const std::vector<host::Instance>& expectedIndications()
{
    static const std::vector<host::Instance> delivered = deliverOneOfEach();
    return delivered;
}

} // namespace deploy
