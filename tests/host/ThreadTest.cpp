#include "BrokerFixture.h"
#include "SelClasses.h"

#include <atomic>
#include <ctime>
#include <thread>

namespace hosttest
{
namespace
{

using ThreadTest = BrokerTest;

struct Shared
{
    const CMPIBroker* mb;
    const CMPIContext* ctx;
    CMPI_MUTEX_TYPE mutex;
    CMPI_COND_TYPE cond;
    bool done = false;
    CMPIrc attachRc = CMPI_RC_ERR_FAILED;
    CMPIrc deliverRc = CMPI_RC_ERR_FAILED;
    CMPIrc detachRc = CMPI_RC_ERR_FAILED;
};

void* deliverFromThread(void* parm)
{
    auto* s = static_cast<Shared*>(parm);
    const CMPIBroker* mb = s->mb;
    s->attachRc = mb->bft->attachThread(mb, s->ctx).rc;
    CMPIObjectPath* op =
        mb->eft->newObjectPath(mb, "root/zanqx", "ZAN_Alert", nullptr);
    CMPIInstance* ind = mb->eft->newInstance(mb, op, nullptr);
    ind->ft->setProperty(ind, "Message",
                         reinterpret_cast<const CMPIValue*>("hot"), CMPI_chars);
    s->deliverRc =
        mb->bft->deliverIndication(mb, s->ctx, "root/interop", ind).rc;
    s->detachRc = mb->bft->detachThread(mb, s->ctx).rc;
    mb->xft->lockMutex(s->mutex);
    s->done = true;
    mb->xft->signalCondition(s->cond);
    mb->xft->unlockMutex(s->mutex);
    return nullptr;
}

TEST_F(ThreadTest, DetachedThreadDeliversIndication)
{
    host::IndicationInbox inbox = broker_.listen("root/interop");
    CMPIContext* prepared = mb()->bft->prepareAttachThread(mb(), context());
    ASSERT_NE(prepared, nullptr);
    EXPECT_EQ(prepared->ft->getEntryCount(prepared, nullptr), 2u);
    Shared s{mb(), prepared, mb()->xft->newMutex(0),
             mb()->xft->newCondition(0)};
    ASSERT_NE(mb()->xft->newThread(deliverFromThread, &s, 1), nullptr);
    mb()->xft->lockMutex(s.mutex);
    while (!s.done)
    {
        ASSERT_EQ(mb()->xft->condWait(s.cond, s.mutex), 0);
    }
    mb()->xft->unlockMutex(s.mutex);
    EXPECT_EQ(s.attachRc, CMPI_RC_OK);
    EXPECT_EQ(s.deliverRc, CMPI_RC_OK);
    EXPECT_EQ(s.detachRc, CMPI_RC_OK);
    const auto delivered = inbox.takeAll();
    ASSERT_EQ(delivered.size(), 1u);
    EXPECT_EQ(delivered[0].nameSpace, "root/interop");
    EXPECT_EQ(delivered[0].instance.path.className, "ZAN_Alert");
    EXPECT_EQ(delivered[0].instance.property("Message")->text(), "hot");
    EXPECT_EQ(delivered[0].broker, mb());
    mb()->xft->destroyCondition(s.cond);
    mb()->xft->destroyMutex(s.mutex);
    // Detaching freed the prepared context, as SFCB does.
    EXPECT_EQ(broker_.outstandingPreparedContexts(), 0u);
    EXPECT_EQ(broker_.brokerOwnedObjects(), 0u);
}

void* answer(void* parm)
{
    return static_cast<char*>(parm) + 1;
}

TEST_F(ThreadTest, JoinableThreadReturnsValue)
{
    char base[2] = {};
    CMPI_THREAD_TYPE t = mb()->xft->newThread(answer, base, 0);
    ASSERT_NE(t, nullptr);
    void* ret = nullptr;
    EXPECT_EQ(mb()->xft->joinThread(t, &ret), 0);
    EXPECT_EQ(ret, base + 1);
}

TEST_F(ThreadTest, TimedCondWaitTimesOut)
{
    CMPI_MUTEX_TYPE m = mb()->xft->newMutex(0);
    CMPI_COND_TYPE c = mb()->xft->newCondition(0);
    timespec deadline{};
    clock_gettime(CLOCK_REALTIME, &deadline);
    deadline.tv_nsec += 20'000'000;
    if (deadline.tv_nsec >= 1'000'000'000)
    {
        deadline.tv_sec += 1;
        deadline.tv_nsec -= 1'000'000'000;
    }
    mb()->xft->lockMutex(m);
    EXPECT_EQ(mb()->xft->timedCondWait(c, m, &deadline), ETIMEDOUT);
    mb()->xft->unlockMutex(m);
    mb()->xft->destroyCondition(c);
    mb()->xft->destroyMutex(m);
}

TEST_F(ThreadTest, ThreadKeysAreFourBytes)
{
    static_assert(sizeof(CMPI_THREAD_KEY_TYPE) == 4);
    CMPI_THREAD_KEY_TYPE key = 0;
    ASSERT_EQ(mb()->xft->createThreadKey(&key, nullptr), 0);
    int value = 3;
    EXPECT_EQ(mb()->xft->setThreadSpecific(key, &value), 0);
    EXPECT_EQ(mb()->xft->getThreadSpecific(key), &value);
    std::thread other(
        [&] { EXPECT_EQ(mb()->xft->getThreadSpecific(key), nullptr); });
    other.join();
    EXPECT_EQ(mb()->xft->destroyThreadKey(key), 0);
}

int onceCount = 0;
void countOnce()
{
    ++onceCount;
}

TEST_F(ThreadTest, ThreadOnceRunsOnce)
{
    static int once = 0;
    EXPECT_EQ(mb()->xft->threadOnce(&once, countOnce), 0);
    EXPECT_EQ(mb()->xft->threadOnce(&once, countOnce), 0);
    EXPECT_EQ(onceCount, 1);
}

TEST_F(ThreadTest, ThreadSleepWaits)
{
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(mb()->xft->threadSleep(15), 0);
    EXPECT_GE(std::chrono::steady_clock::now() - start,
              std::chrono::milliseconds(15));
}

TEST_F(ThreadTest, ResolveFileName)
{
    char* name = mb()->xft->resolveFileName("SELProvider");
    ASSERT_NE(name, nullptr);
    EXPECT_STREQ(name, "libSELProvider.so");
    std::free(name);
}

TEST_F(ThreadTest, AttachNeedsABrokerContext)
{
    CMPIContext foreign{nullptr, nullptr};
    EXPECT_EQ(mb()->bft->attachThread(mb(), &foreign).rc,
              CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(mb()->bft->detachThread(mb(), &foreign).rc,
              CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(mb()->bft->attachThread(mb(), nullptr).rc,
              CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(mb()->bft
                  ->deliverIndication(mb(), &foreign, "root",
                                      newInstance("root", "I"))
                  .rc,
              CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(ThreadTest, AttachedThreadObjectsAreFreedAtDetach)
{
    std::atomic<std::size_t> before{0};
    std::thread worker(
        [&]
        {
            const CMPIBroker* b = mb();
            ASSERT_EQ(b->bft->attachThread(b, context()).rc, CMPI_RC_OK);
            for (int i = 0; i < 100; ++i)
            {
                b->eft->newString(b, "x", nullptr);
            }
            before = broker_.brokerOwnedObjects();
            ASSERT_EQ(b->bft->detachThread(b, context()).rc, CMPI_RC_OK);
        });
    worker.join();
    EXPECT_EQ(before.load(), 0u); // not the broker's, the attachment's
}

TEST_F(ThreadTest, DeliverIndicationChecksArguments)
{
    EXPECT_EQ(mb()->bft
                  ->deliverIndication(mb(), context(), nullptr,
                                      newInstance("root", "I"))
                  .rc,
              CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(mb()->bft->deliverIndication(mb(), context(), "root", nullptr).rc,
              CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(broker_.deliveredIndications(), 0u);
}

TEST(ConcurrentRequests, ManyThreadsUseOneBroker)
{
    host::Broker broker{selclasses::schema()};
    std::vector<std::thread> threads;
    threads.reserve(8);
    std::atomic<int> failures{0};
    for (int t = 0; t < 8; ++t)
    {
        threads.emplace_back(
            [&broker, &failures]
            {
                for (int n = 0; n < 200; ++n)
                {
                    host::Broker::Request request(broker);
                    const CMPIBroker* mb = broker.cmpi();
                    CMPIObjectPath* op =
                        mb->eft->newObjectPath(mb, "root", "C", nullptr);
                    CMPIInstance* i = mb->eft->newInstance(mb, op, nullptr);
                    CMPIValue v{};
                    v.uint32 = static_cast<CMPIUint32>(n);
                    i->ft->setProperty(i, "N", &v, CMPI_uint32);
                    mb->eft->trace(mb, CMPI_LEV_INFO, "t", "x", nullptr);
                    request.result()->ft->returnInstance(request.result(), i);
                    const host::Outcome out =
                        request.finish({CMPI_RC_OK, nullptr});
                    if (out.instances.size() != 1 ||
                        out.instances[0].property("N")->unsignedValue() !=
                            static_cast<std::uint64_t>(n))
                    {
                        ++failures;
                    }
                }
            });
    }
    for (auto& t : threads)
    {
        t.join();
    }
    EXPECT_EQ(failures.load(), 0);
    EXPECT_EQ(broker.traces().size(), 8u * 200u);
    EXPECT_EQ(broker.brokerOwnedObjects(), 0u);
}

} // namespace
} // namespace hosttest
