#include "EntryFixture.h"
#include "ProviderLibrary.h"
#include "SelClasses.h"

#include <dlfcn.h>
#include <string>

#include <gtest/gtest.h>

namespace
{

using entry::classPath;
using entry::selTree;

class Loading : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        source_ = std::make_shared<QX::MemorySource>(selTree(3).build());
        QX::Platform::overrideSource(source_);
    }
    void TearDown() override
    {
        QX::Platform::overrideSource(nullptr);
    }

  private:
    std::shared_ptr<QX::MemorySource> source_;
};

TEST_F(Loading, LibraryCanBeLoadedUnloadedAndLoadedAgain)
{
    for (int round = 0; round < 3; ++round)
    {
        host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
        const auto outcome =
            host.enumerateInstances(classPath("ZAN_MgmtHwLogEntry"));
        EXPECT_EQ(outcome.rc, CMPI_RC_OK) << "round " << round;
        EXPECT_EQ(outcome.instances.size(), 3u) << "round " << round;
    }
}

TEST_F(Loading, LibraryIsReallyUnloadedBetweenLoads)
{
    {
        host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
        EXPECT_EQ(host.enumerateInstanceNames(classPath("ZAN_MgmtHwLog"))
                      .paths.size(),
                  1u);
    }
    // Nothing of ours keeps the library resident once the host let go.
    void* handle = ::dlopen(SELPROV_LIBRARY, RTLD_NOW | RTLD_NOLOAD);
    EXPECT_EQ(handle, nullptr);
    if (handle != nullptr)
    {
        ::dlclose(handle);
    }
    host::Host again(selclasses::hostOptions(SELPROV_LIBRARY));
    EXPECT_EQ(
        again.enumerateInstanceNames(classPath("ZAN_MgmtHwLog")).paths.size(),
        1u);
}

TEST(LoadingErrors, MissingLibraryIsReported)
{
    EXPECT_THROW(
        host::ProviderLibrary("/nonexistent/libSELProvider.so", "SELProvider"),
        std::runtime_error);
}

TEST(LoadingErrors, WrongProviderNameFindsNoFactory)
{
    host::ProviderLibrary library(SELPROV_LIBRARY, "OtherProvider");
    host::Broker broker{selclasses::schema()};
    EXPECT_THROW(library.createInstanceMI(broker.cmpi(), nullptr, nullptr),
                 std::runtime_error);
    EXPECT_EQ(library.symbol("OtherProvider_Create_InstanceMI"), nullptr);
    EXPECT_NE(library.symbol("SELProvider_Create_MethodMI"), nullptr);
}

TEST(ExportedSymbols, OnlyTheFactoriesAreVisible)
{
    host::ProviderLibrary library(SELPROV_LIBRARY, "SELProvider");
    for (const char* hidden :
         {"_ZN2QX11SELComposite6brokerE", "_ZN2QX11SELComposite10instMIFT__E",
          "_ZN2QX11SELComposite8clearLogEv"})
    {
        EXPECT_EQ(library.symbol(hidden), nullptr) << hidden;
    }
}

TEST_F(Loading, TenThousandRequestsKeepWorking)
{
    host::Host host(selclasses::hostOptions(SELPROV_LIBRARY));
    host::ObjectPath path = classPath("ZAN_MgmtHwLog");
    path.keys.edit().push_back({"Name", host::Value::string("IPMI SEL Log")});
    path.keys.edit().push_back(
        {"CreationClassName", host::Value::string("ZAN_MgmtHwLog")});
    for (int i = 0; i < 10000; ++i)
    {
        const auto outcome = host.getInstance(path);
        ASSERT_EQ(outcome.instances.size(), 1u) << "request " << i;
    }
}

} // namespace
