// The host's side of indications: filters handed to the indication MI,
// inboxes per namespace, thread attachment and the broker pointers each
// MI factory gets.
#include "BrokerFixture.h"
#include "Host.h"
#include "SelClasses.h"

#include <cmpift.h>

#include <atomic>
#include <chrono>
#include <memory>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

namespace hosttest
{
namespace
{

using namespace std::chrono_literals;

// A small indication provider that records what it is handed.
struct FilterCall
{
    std::string operation;
    std::string query;
    std::string className;
    std::string pathClass;
    bool flag = false;
    bool filterIsSelectExp = false;
};

struct Provider
{
    std::vector<FilterCall> calls;
    std::vector<const CMPIBroker*> brokers; // per factory, in call order
};
Provider provider;

std::string text(const CMPIString* s)
{
    const char* chars = s ? s->ft->getCharPtr(s, nullptr) : nullptr;
    return chars ? chars : "";
}

FilterCall describe(const char* operation, const CMPISelectExp* filter,
                    const char* className, const CMPIObjectPath* path,
                    bool flag)
{
    FilterCall call;
    call.operation = operation;
    call.filterIsSelectExp =
        filter != nullptr &&
        provider.brokers.front()->eft->isOfType(
            provider.brokers.front(), filter, "CMPISelectExp", nullptr);
    call.query = filter ? text(filter->ft->getString(filter, nullptr)) : "";
    call.className = className ? className : "";
    call.pathClass = path ? text(path->ft->getClassName(path, nullptr)) : "";
    call.flag = flag;
    return call;
}

CMPIStatus ok()
{
    return {CMPI_RC_OK, nullptr};
}

/** Keeps @p call in the provider's record and answers OK. */
CMPIStatus recorded(const FilterCall& call)
{
    provider.calls.push_back(call);
    return ok();
}

CMPIStatus cleanup(CMPIIndicationMI*, const CMPIContext*, CMPIBoolean)
{
    return ok();
}

CMPIStatus authorize(CMPIIndicationMI*, const CMPIContext*,
                     const CMPISelectExp* filter, const char* className,
                     const CMPIObjectPath* path, const char* owner)
{
    return recorded(describe("authorizeFilter", filter, className, path,
                             std::string(owner) == "root"));
}

CMPIStatus mustPoll(CMPIIndicationMI*, const CMPIContext*,
                    const CMPISelectExp* filter, const char* className,
                    const CMPIObjectPath* path)
{
    return recorded(describe("mustPoll", filter, className, path, false));
}

CMPIStatus activate(CMPIIndicationMI*, const CMPIContext*,
                    const CMPISelectExp* filter, const char* className,
                    const CMPIObjectPath* path, CMPIBoolean first)
{
    return recorded(
        describe("activateFilter", filter, className, path, first != 0));
}

CMPIStatus deactivate(CMPIIndicationMI*, const CMPIContext*,
                      const CMPISelectExp* filter, const char* className,
                      const CMPIObjectPath* path, CMPIBoolean last)
{
    return recorded(
        describe("deActivateFilter", filter, className, path, last != 0));
}

CMPIStatus enable(CMPIIndicationMI*, const CMPIContext*)
{
    return ok();
}

CMPIIndicationMIFT indicationFT = {
    200,      200,      "Indicationtest", cleanup, authorize,
    mustPoll, activate, deactivate,       enable,  enable};
CMPIIndicationMI indicationMI = {nullptr, &indicationFT};

CMPIInstanceMIFT instanceFT = {200,     200,     "instancetest", nullptr,
                               nullptr, nullptr, nullptr,        nullptr,
                               nullptr, nullptr, nullptr};
CMPIInstanceMI instanceMI = {nullptr, &instanceFT};
CMPIMethodMIFT methodFT = {200, 200, "methodtest", nullptr, nullptr};
CMPIMethodMI methodMI = {nullptr, &methodFT};

CMPIInstanceMI* makeInstanceMI(const CMPIBroker* b, const CMPIContext*,
                               CMPIStatus*)
{
    provider.brokers.push_back(b);
    return &instanceMI;
}

CMPIMethodMI* makeMethodMI(const CMPIBroker* b, const CMPIContext*, CMPIStatus*)
{
    provider.brokers.push_back(b);
    return &methodMI;
}

CMPIIndicationMI* makeIndicationMI(const CMPIBroker* b, const CMPIContext*,
                                   CMPIStatus*)
{
    provider.brokers.push_back(b);
    return &indicationMI;
}

class IndicationHostTest : public ::testing::Test
{
  protected:
    void SetUp() override
    {
        provider = Provider{};
        host::HostOptions options;
        options.factories = {makeInstanceMI, makeMethodMI, makeIndicationMI};
        options.schema = selclasses::schema();
        host_ = std::make_unique<host::Host>(std::move(options));
    }
    std::unique_ptr<host::Host> host_;
};

TEST_F(IndicationHostTest, FilterOperationsHandTheQueryAsASelectExpression)
{
    const auto filter = selclasses::filterFor("ZAN_MgmtHwLogClearEvent");
    EXPECT_EQ(filter.query, "SELECT * FROM ZAN_MgmtHwLogClearEvent");
    EXPECT_EQ(host_->authorizeFilter(filter, "root").rc, CMPI_RC_OK);
    EXPECT_EQ(host_->mustPoll(filter).rc, CMPI_RC_OK);
    EXPECT_EQ(host_->activateFilter(filter, true).rc, CMPI_RC_OK);
    host::ObjectPath noClass;
    noClass.nameSpace = "root/zanqx";
    EXPECT_EQ(host_->deActivateFilter(filter, true, &noClass).rc, CMPI_RC_OK);
    ASSERT_EQ(provider.calls.size(), 4u);
    const char* expected[] = {"authorizeFilter", "mustPoll", "activateFilter",
                              "deActivateFilter"};
    for (std::size_t i = 0; i < 4; ++i)
    {
        const FilterCall& call = provider.calls[i];
        EXPECT_EQ(call.operation, expected[i]);
        EXPECT_TRUE(call.filterIsSelectExp) << call.operation;
        EXPECT_EQ(call.query, filter.query) << call.operation;
        EXPECT_EQ(call.className, "ZAN_MgmtHwLogClearEvent");
    }
    EXPECT_TRUE(provider.calls[0].flag); // the owner came through
    EXPECT_EQ(provider.calls[2].pathClass, "ZAN_MgmtHwLogClearEvent");
    EXPECT_TRUE(provider.calls[2].flag);
    EXPECT_EQ(provider.calls[3].pathClass, "");
}

TEST_F(IndicationHostTest, EveryFactoryGetsTheSameBrokerByDefault)
{
    const CMPIBroker* one = host_->broker().cmpi();
    EXPECT_EQ(provider.brokers,
              (std::vector<const CMPIBroker*>{one, one, one}));
    EXPECT_EQ(host_->instanceBroker(), one);
    EXPECT_EQ(host_->methodBroker(), one);
    EXPECT_EQ(host_->indicationBroker(), one);
}

TEST(IndicationHost, BrokerViewsAreDistinctPointersOverOneBroker)
{
    host::Broker broker{selclasses::schema()};
    std::vector<const CMPIBroker*> views;
    for (std::size_t i = 0; i < host::Broker::viewCount; ++i)
    {
        views.push_back(broker.cmpiView(i));
    }
    EXPECT_EQ(views[0], broker.cmpi());
    EXPECT_NE(views[0], views[1]);
    EXPECT_NE(views[1], views[2]);
    EXPECT_THROW(broker.cmpiView(host::Broker::viewCount), std::out_of_range);
    // Objects made through any view belong to the one broker.
    host::Broker::Request request(broker);
    for (const CMPIBroker* view : views)
    {
        CMPIString* s = view->eft->newString(view, "x", nullptr);
        ASSERT_NE(s, nullptr);
        EXPECT_EQ(text(s), "x");
    }
    host::IndicationInbox inbox = broker.listen("root/zanqx");
    CMPIInstance* instance = views[2]->eft->newInstance(
        views[2],
        views[2]->eft->newObjectPath(views[2], "root/zanqx", "E", nullptr),
        nullptr);
    EXPECT_EQ(views[2]
                  ->bft
                  ->deliverIndication(views[2], request.context(), "root/zanqx",
                                      instance)
                  .rc,
              CMPI_RC_OK);
    const auto delivered = inbox.takeAll();
    ASSERT_EQ(delivered.size(), 1u);
    EXPECT_EQ(delivered[0].broker, views[2]);
}

using InboxTest = BrokerTest;

TEST_F(InboxTest, EachInboxGetsTheIndicationsOfItsNamespaceInOrder)
{
    host::IndicationInbox zanqx = broker_.listen("root/zanqx");
    host::IndicationInbox upper = broker_.listen("ROOT/ZANQX");
    host::IndicationInbox other = broker_.listen("root/interop");
    for (const char* cls : {"First", "Second", "Third"})
    {
        ASSERT_EQ(mb()->bft
                      ->deliverIndication(mb(), context(), "root/zanqx",
                                          newInstance("root/zanqx", cls))
                      .rc,
                  CMPI_RC_OK);
    }
    EXPECT_EQ(other.pending(), 0u);
    EXPECT_EQ(upper.pending(), 3u);
    EXPECT_EQ(zanqx.received(), 3u);
    std::vector<std::string> order;
    while (auto next = zanqx.next(0ms))
    {
        order.emplace_back(next->instance.path.className);
        EXPECT_EQ(next->nameSpace, "root/zanqx");
    }
    EXPECT_EQ(order, (std::vector<std::string>{"First", "Second", "Third"}));
    EXPECT_EQ(zanqx.pending(), 0u);
    EXPECT_EQ(zanqx.received(), 3u);
    EXPECT_EQ(broker_.deliveredIndications(), 3u);
    EXPECT_EQ(broker_.unheardIndications(), 0u);
}

TEST_F(InboxTest, WaitingForAnIndicationIsBounded)
{
    host::IndicationInbox inbox = broker_.listen("root/zanqx");
    const auto start = std::chrono::steady_clock::now();
    EXPECT_FALSE(inbox.next(30ms).has_value());
    EXPECT_GE(std::chrono::steady_clock::now() - start, 30ms);
    const CMPIBroker* b = mb();
    CMPIContext* prepared = b->bft->prepareAttachThread(b, context());
    std::thread later(
        [&]
        {
            std::this_thread::sleep_for(20ms);
            b->bft->attachThread(b, prepared);
            CMPIObjectPath* op =
                b->eft->newObjectPath(b, "root/zanqx", "Late", nullptr);
            b->bft->deliverIndication(b, prepared, "root/zanqx",
                                      b->eft->newInstance(b, op, nullptr));
            b->bft->detachThread(b, prepared);
        });
    const auto arrived = inbox.next(10s);
    later.join();
    ASSERT_TRUE(arrived.has_value());
    EXPECT_EQ(arrived->instance.path.className, "Late");
}

TEST_F(InboxTest, NobodyListeningCountsAsUnheard)
{
    {
        host::IndicationInbox gone = broker_.listen("root/zanqx");
    }
    EXPECT_EQ(mb()->bft
                  ->deliverIndication(mb(), context(), "root/zanqx",
                                      newInstance("root/zanqx", "E"))
                  .rc,
              CMPI_RC_OK);
    EXPECT_EQ(broker_.deliveredIndications(), 1u);
    EXPECT_EQ(broker_.unheardIndications(), 1u);
}

TEST_F(InboxTest, DeliveringNeedsARequestOrAnAttachedThread)
{
    host::IndicationInbox inbox = broker_.listen("root/zanqx");
    const CMPIBroker* b = mb();
    CMPIInstance* instance = newInstance("root/zanqx", "E");
    CMPIContext* prepared = b->bft->prepareAttachThread(b, context());
    CMPIrc unattached = CMPI_RC_OK;
    CMPIrc attached = CMPI_RC_ERR_FAILED;
    std::thread worker(
        [&]
        {
            unattached =
                b->bft->deliverIndication(b, prepared, "root/zanqx", instance)
                    .rc;
            b->bft->attachThread(b, prepared);
            attached =
                b->bft->deliverIndication(b, prepared, "root/zanqx", instance)
                    .rc;
            b->bft->detachThread(b, prepared);
        });
    worker.join();
    EXPECT_EQ(unattached, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(attached, CMPI_RC_OK);
    EXPECT_EQ(inbox.pending(), 1u);
}

TEST_F(InboxTest, DetachFreesThePreparedContextAndTheThreadsObjects)
{
    const CMPIBroker* b = mb();
    std::vector<CMPIContext*> prepared;
    prepared.reserve(100);
    for (int i = 0; i < 100; ++i)
    {
        prepared.push_back(b->bft->prepareAttachThread(b, context()));
    }
    EXPECT_EQ(broker_.outstandingPreparedContexts(), 100u);
    std::thread worker(
        [&]
        {
            for (CMPIContext* ctx : prepared)
            {
                ASSERT_EQ(b->bft->attachThread(b, ctx).rc, CMPI_RC_OK);
                b->eft->newString(b, "made while attached", nullptr);
                ASSERT_EQ(b->bft->detachThread(b, ctx).rc, CMPI_RC_OK);
                // Gone with the detach, as SFCB releases it.
                EXPECT_EQ(b->bft->attachThread(b, ctx).rc,
                          CMPI_RC_ERR_INVALID_HANDLE);
            }
        });
    worker.join();
    EXPECT_EQ(broker_.outstandingPreparedContexts(), 0u);
    EXPECT_EQ(broker_.brokerOwnedObjects(), 0u);
}

void* pause(void* parm)
{
    auto* release = static_cast<std::atomic<bool>*>(parm);
    while (!release->load())
    {
        std::this_thread::sleep_for(1ms);
    }
    return nullptr;
}

TEST(ProviderThreads, TheBrokerKnowsItsThreadsAndWaitsForThem)
{
    std::atomic<bool> release{false};
    auto broker = std::make_unique<host::Broker>();
    {
        host::Broker::Request request(*broker);
        const CMPIBroker* b = broker->cmpi();
        ASSERT_NE(b->xft->newThread(pause, &release, 1), nullptr);
        ASSERT_NE(b->xft->newThread(pause, &release, 1), nullptr);
    }
    EXPECT_EQ(broker->runningThreads(), 2u);
    EXPECT_FALSE(broker->waitForThreads(10ms));
    release = true;
    EXPECT_TRUE(broker->waitForThreads(10s));
    EXPECT_EQ(broker->runningThreads(), 0u);
}

TEST(ProviderThreads, DestroyingTheBrokerWaitsForItsThreads)
{
    std::atomic<bool> release{false};
    auto broker = std::make_unique<host::Broker>();
    {
        host::Broker::Request request(*broker);
        ASSERT_NE(broker->cmpi()->xft->newThread(pause, &release, 1), nullptr);
    }
    std::thread releaser(
        [&]
        {
            std::this_thread::sleep_for(30ms);
            release = true;
        });
    broker.reset();
    EXPECT_TRUE(release.load());
    releaser.join();
}

TEST_F(InboxTest, SelectExpressionsCarryTheirQuery)
{
    CMPISelectExp* filter =
        broker_.makeSelectExp("SELECT * FROM ZAN_MgmtHwLogEntryEvent", "WQL");
    ASSERT_NE(filter, nullptr);
    CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
    EXPECT_EQ(text(filter->ft->getString(filter, &rc)),
              "SELECT * FROM ZAN_MgmtHwLogEntryEvent");
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(text(eft()->getType(mb(), filter, nullptr)), "CMPISelectExp");
    CMPISelectExp* copy = filter->ft->clone(filter, &rc);
    ASSERT_NE(copy, nullptr);
    EXPECT_EQ(text(copy->ft->getString(copy, nullptr)),
              "SELECT * FROM ZAN_MgmtHwLogEntryEvent");
    EXPECT_EQ(broker_.outstandingClones(), 1u);
    EXPECT_EQ(copy->ft->release(copy).rc, CMPI_RC_OK);
    EXPECT_EQ(broker_.outstandingClones(), 0u);
    filter->ft->evaluate(filter, nullptr, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(filter->ft->getDOC(filter, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
}

} // namespace
} // namespace hosttest
