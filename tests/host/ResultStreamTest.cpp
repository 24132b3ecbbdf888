// Results handed to the caller's handlers as the provider returns them,
// and finish() handing the collected results over.
#include "BrokerFixture.h"

#include <stdexcept>
#include <vector>

namespace hosttest
{
namespace
{

using ResultStreamTest = BrokerTest;

TEST_F(ResultStreamTest, HandlersReceiveResultsInOrderInsteadOfTheOutcome)
{
    std::vector<std::string> seen;
    host::ResultHandlers handlers;
    handlers.instance = [&](const host::Instance& i)
    { seen.push_back("instance " + std::string(i.property("X")->text())); };
    handlers.path = [&](const host::ObjectPath& p)
    { seen.push_back("path " + p.className); };
    request_->streamTo(&handlers);

    const CMPIResult* r = result();
    CMPIInstance* i = newInstance("root", "I");
    i->ft->setProperty(i, "X", chars("first"), CMPI_chars);
    EXPECT_EQ(r->ft->returnInstance(r, i).rc, CMPI_RC_OK);
    // The handler saw the instance as it was when returned.
    i->ft->setProperty(i, "X", chars("second"), CMPI_chars);
    EXPECT_EQ(r->ft->returnObjectPath(r, newPath("root", "P")).rc, CMPI_RC_OK);
    EXPECT_EQ(r->ft->returnInstance(r, i).rc, CMPI_RC_OK);
    EXPECT_EQ(r->ft->returnDone(r).rc, CMPI_RC_OK);

    const host::Outcome out = request_->finish({CMPI_RC_OK, nullptr});
    EXPECT_EQ(seen, (std::vector<std::string>{"instance first", "path P",
                                              "instance second"}));
    EXPECT_TRUE(out.instances.empty());
    EXPECT_TRUE(out.paths.empty());
    EXPECT_EQ(out.streamedInstances, 2u);
    EXPECT_EQ(out.streamedPaths, 1u);
    EXPECT_TRUE(out.done);
}

TEST_F(ResultStreamTest, KindsWithoutAHandlerAreStillCollected)
{
    std::size_t instances = 0;
    host::ResultHandlers handlers;
    handlers.instance = [&](const host::Instance&) { ++instances; };
    request_->streamTo(&handlers);
    const CMPIResult* r = result();
    r->ft->returnInstance(r, newInstance("root", "I"));
    r->ft->returnObjectPath(r, newPath("root", "P"));

    const host::Outcome out = request_->finish({CMPI_RC_OK, nullptr});
    EXPECT_EQ(instances, 1u);
    ASSERT_EQ(out.paths.size(), 1u);
    EXPECT_EQ(out.paths[0].className, "P");
}

TEST_F(ResultStreamTest, AThrowingHandlerFailsTheReturnWithoutUnwinding)
{
    host::ResultHandlers handlers;
    handlers.instance = [](const host::Instance&)
    { throw std::runtime_error("full"); };
    request_->streamTo(&handlers);
    const CMPIResult* r = result();
    EXPECT_EQ(r->ft->returnInstance(r, newInstance("root", "I")).rc,
              CMPI_RC_ERR_FAILED);
}

TEST_F(ResultStreamTest, FinishHandsOverWhatWasCollectedSoFar)
{
    const CMPIResult* r = result();
    r->ft->returnObjectPath(r, newPath("root", "A"));
    const host::Outcome first = request_->finish({CMPI_RC_OK, nullptr});
    r->ft->returnObjectPath(r, newPath("root", "B"));
    const host::Outcome second = request_->finish({CMPI_RC_OK, nullptr});
    ASSERT_EQ(first.paths.size(), 1u);
    EXPECT_EQ(first.paths[0].className, "A");
    ASSERT_EQ(second.paths.size(), 1u);
    EXPECT_EQ(second.paths[0].className, "B");
}

} // namespace
} // namespace hosttest
