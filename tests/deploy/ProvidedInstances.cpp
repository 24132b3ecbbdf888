#include "ProvidedInstances.h"

#include "CVLogger.h"
#include "DeployFiles.h"
#include "EntryFixture.h"
#include "MemorySource.h"
#include "NodeTree.h"
#include "Platform.h"
#include "SelClasses.h"

namespace deploy
{

namespace
{

using namespace QX::NodeLexicon;

std::shared_ptr<const QX::NodeTree> treeWithEveryProperty()
{
    QX::NodeTreeBuilder tree = entry::selTree(0);
    tree.setProperty("/bmc0/sel", IsEmpty, false);
    for (unsigned id = 1; id <= 2; ++id)
    {
        entry::addEntry(tree, id, "2024-03-04 08:15:22", "Fan FAN3: asserted",
                        "01 00 02 1a 83 e5 65 20 00 04 10 01 6f 02 ff ff");
    }
    return tree.build();
}

std::vector<std::string> classNames(bool indications)
{
    std::vector<std::string> names;
    for (const mof::Class& c : projectClasses().classes())
    {
        if (c.hasFlag("Indication") == indications)
        {
            names.push_back(c.name);
        }
    }
    return names;
}

host::ObjectPath classPath(const std::string& className)
{
    host::ObjectPath path;
    path.nameSpace = "root/zanqx";
    path.className = className;
    return path;
}

} // namespace

void ProvidedInstances::SetUp()
{
    CVLog::CVLogger::setSink(nullptr);
    host_ =
        std::make_unique<host::Host>(selclasses::hostOptions(SELPROV_LIBRARY));
    QX::Platform::overrideSource(
        std::make_shared<QX::MemorySource>(treeWithEveryProperty()));
}

void ProvidedInstances::TearDown()
{
    host_.reset();
    QX::Platform::overrideSource(nullptr);
}

std::vector<host::Instance>
ProvidedInstances::instancesOf(const std::string& className)
{
    const host::Outcome out = host_->enumerateInstances(classPath(className));
    EXPECT_EQ(out.rc, CMPI_RC_OK) << className;
    EXPECT_FALSE(out.instances.empty()) << "no instance of " << className;
    return out.instances;
}

std::vector<host::ObjectPath>
ProvidedInstances::namesOf(const std::string& className)
{
    const host::Outcome out =
        host_->enumerateInstanceNames(classPath(className));
    EXPECT_EQ(out.rc, CMPI_RC_OK) << className;
    EXPECT_FALSE(out.paths.empty()) << "no instance name of " << className;
    return out.paths;
}

std::vector<std::string> instanceClassNames()
{
    return classNames(false);
}

std::vector<std::string> indicationClassNames()
{
    return classNames(true);
}

} // namespace deploy
