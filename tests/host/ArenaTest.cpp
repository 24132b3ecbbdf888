#include "Broker.h"
#include "SelClasses.h"

#include <cmpift.h>

#include <fstream>
#include <string>

#include <gtest/gtest.h>

namespace hosttest
{
namespace
{

// Makes one of every kind of object, reading values back so that the
// broker makes more objects for them.
void busyRequest(host::Broker& broker)
{
    host::Broker::Request request(broker);
    const CMPIBroker* mb = broker.cmpi();
    CMPIObjectPath* op =
        mb->eft->newObjectPath(mb, "root/zanqx", "ZAN_MgmtHwLogEntry", nullptr);
    op->ft->addKey(op, "RecordID", reinterpret_cast<const CMPIValue*>("1"),
                   CMPI_chars);
    CMPIInstance* inst = mb->eft->newInstance(mb, op, nullptr);
    CMPIArray* array = mb->eft->newArray(mb, 2, CMPI_string, nullptr);
    array->ft->setElementAt(array, 0, reinterpret_cast<const CMPIValue*>("a"),
                            CMPI_chars);
    CMPIValue v{};
    v.array = array;
    inst->ft->setProperty(inst, "List", &v, CMPI_stringA);
    v.dateTime =
        mb->eft->newDateTimeFromChars(mb, "20080523044811.000000+000", nullptr);
    inst->ft->setProperty(inst, "MessageTimestamp", &v, CMPI_dateTime);
    inst->ft->getProperty(inst, "List", nullptr);
    inst->ft->getObjectPath(inst, nullptr);
    mb->eft->newString(mb, "text", nullptr);
    mb->eft->newArgs(mb, nullptr);
    CMPIString* s = mb->eft->toString(mb, op, nullptr);
    s->ft->release(s); // harmless: owned by the request
    request.result()->ft->returnInstance(request.result(), inst);
    request.finish({CMPI_RC_OK, nullptr});
}

long residentKiB()
{
    std::ifstream status("/proc/self/status");
    std::string line;
    while (std::getline(status, line))
    {
        if (line.rfind("VmRSS:", 0) == 0)
        {
            return std::stol(line.substr(6));
        }
    }
    return 0;
}

TEST(Arena, ObjectsInsideARequestAreNotTheBrokers)
{
    host::Broker broker{selclasses::schema()};
    busyRequest(broker);
    EXPECT_EQ(broker.brokerOwnedObjects(), 0u);
    EXPECT_EQ(broker.outstandingClones(), 0u);
}

TEST(Arena, ObjectsOutsideRequestsBelongToTheBroker)
{
    host::Broker broker{selclasses::schema()};
    const CMPIBroker* mb = broker.cmpi();
    mb->eft->newString(mb, "a", nullptr);
    mb->eft->newString(mb, "b", nullptr);
    EXPECT_EQ(broker.brokerOwnedObjects(), 2u);
}

TEST(Arena, UnreleasedClonesAreCountedAndFreedWithTheBroker)
{
    host::Broker broker{selclasses::schema()};
    {
        host::Broker::Request request(broker);
        const CMPIBroker* mb = broker.cmpi();
        CMPIString* s = mb->eft->newString(mb, "keep", nullptr);
        CMPIString* kept = s->ft->clone(s, nullptr);
        request.finish({CMPI_RC_OK, nullptr});
        EXPECT_EQ(broker.outstandingClones(), 1u);
        (void)kept;
    }
    EXPECT_EQ(broker.outstandingClones(), 1u); // outlives the request
}

TEST(Arena, ClonesOutliveTheirRequest)
{
    host::Broker broker{selclasses::schema()};
    CMPIString* kept = nullptr;
    {
        host::Broker::Request request(broker);
        const CMPIBroker* mb = broker.cmpi();
        CMPIString* s = mb->eft->newString(mb, "keep", nullptr);
        kept = s->ft->clone(s, nullptr);
    }
    EXPECT_STREQ(kept->ft->getCharPtr(kept, nullptr), "keep");
    EXPECT_EQ(kept->ft->release(kept).rc, CMPI_RC_OK);
    EXPECT_EQ(broker.outstandingClones(), 0u);
}

TEST(Arena, TenThousandRequestsDoNotGrow)
{
    host::Broker broker{selclasses::schema()};
    for (int i = 0; i < 1000; ++i)
    {
        busyRequest(broker);
    }
    const long before = residentKiB();
    for (int i = 0; i < 10000; ++i)
    {
        busyRequest(broker);
    }
    const long after = residentKiB();
    EXPECT_EQ(broker.brokerOwnedObjects(), 0u);
#ifndef __SANITIZE_ADDRESS__
    // ASan quarantines freed memory (its leak check covers this build).
    EXPECT_LT(after - before, 4096)
        << "RSS grew from " << before << " to " << after << " KiB";
#else
    (void)before;
    (void)after;
#endif
}

TEST(Arena, NestedRequestsOnOneThread)
{
    host::Broker broker{selclasses::schema()};
    host::Broker::Request outer(broker);
    const CMPIBroker* mb = broker.cmpi();
    CMPIString* outerString = mb->eft->newString(mb, "outer", nullptr);
    {
        host::Broker::Request inner(broker);
        mb->eft->newString(mb, "inner", nullptr);
    }
    EXPECT_STREQ(outerString->ft->getCharPtr(outerString, nullptr), "outer");
    EXPECT_EQ(broker.brokerOwnedObjects(), 0u);
}

TEST(Arena, TwoBrokersKeepTheirOwnObjects)
{
    host::Broker first{selclasses::schema()};
    host::Broker second{selclasses::schema()};
    host::Broker::Request request(first);
    const CMPIBroker* mb = second.cmpi();
    mb->eft->newString(mb, "second's", nullptr);
    EXPECT_EQ(second.brokerOwnedObjects(), 1u);
    EXPECT_EQ(first.brokerOwnedObjects(), 0u);
}

} // namespace
} // namespace hosttest
