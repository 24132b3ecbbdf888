// Layout of the broker object and the four broker service tables, checked
// against the x86_64 offsets the object managers were compiled with.
#include "abi/abi_check.h"

#include <cmpift.h>

#include <cstring>
#include <string>

#include <gtest/gtest.h>

namespace
{

// CMPIBroker
static_assert(sizeof(CMPIBroker) == 40);
static_assert(alignof(CMPIBroker) == 8);
CMPI_ASSERT_MEMBER(CMPIBroker, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIBroker, bft, 8, CMPIBrokerFT*);
CMPI_ASSERT_MEMBER(CMPIBroker, eft, 16, CMPIBrokerEncFT*);
CMPI_ASSERT_MEMBER(CMPIBroker, xft, 24, CMPIBrokerExtFT*);
CMPI_ASSERT_MEMBER(CMPIBroker, mft, 32, CMPIBrokerMemFT*);

// CMPIBrokerFT
static_assert(sizeof(CMPIBrokerFT) == 160);
static_assert(alignof(CMPIBrokerFT) == 8);
CMPI_ASSERT_MEMBER(CMPIBrokerFT, brokerCapabilities, 0, unsigned int);
CMPI_ASSERT_MEMBER(CMPIBrokerFT, brokerVersion, 4, unsigned int);
CMPI_ASSERT_MEMBER(CMPIBrokerFT, brokerName, 8, const char*);
CMPI_ASSERT_MEMBER(CMPIBrokerFT, prepareAttachThread, 16,
                   CMPIContext* (*)(const CMPIBroker*, const CMPIContext*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, attachThread, 24,
                   CMPIStatus (*)(const CMPIBroker*, const CMPIContext*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, detachThread, 32,
                   CMPIStatus (*)(const CMPIBroker*, const CMPIContext*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, deliverIndication, 40,
                   CMPIStatus (*)(const CMPIBroker*, const CMPIContext*,
                                  const char*, const CMPIInstance*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, enumerateInstanceNames, 48,
                   CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*,
                                        const CMPIObjectPath*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, getInstance, 56,
                   CMPIInstance* (*)(const CMPIBroker*, const CMPIContext*,
                                     const CMPIObjectPath*, const char**,
                                     CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, createInstance, 64,
                   CMPIObjectPath* (*)(const CMPIBroker*, const CMPIContext*,
                                       const CMPIObjectPath*,
                                       const CMPIInstance*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, modifyInstance, 72,
                   CMPIStatus (*)(const CMPIBroker*, const CMPIContext*,
                                  const CMPIObjectPath*, const CMPIInstance*,
                                  const char**));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, deleteInstance, 80,
                   CMPIStatus (*)(const CMPIBroker*, const CMPIContext*,
                                  const CMPIObjectPath*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, execQuery, 88,
                   CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*,
                                        const CMPIObjectPath*, const char*,
                                        const char*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, enumerateInstances, 96,
                   CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*,
                                        const CMPIObjectPath*, const char**,
                                        CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, associators, 104,
                   CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*,
                                        const CMPIObjectPath*, const char*,
                                        const char*, const char*, const char*,
                                        const char**, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, associatorNames, 112,
                   CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*,
                                        const CMPIObjectPath*, const char*,
                                        const char*, const char*, const char*,
                                        CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, references, 120,
                   CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*,
                                        const CMPIObjectPath*, const char*,
                                        const char*, const char**,
                                        CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, referenceNames, 128,
                   CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*,
                                        const CMPIObjectPath*, const char*,
                                        const char*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, invokeMethod, 136,
                   CMPIData (*)(const CMPIBroker*, const CMPIContext*,
                                const CMPIObjectPath*, const char*,
                                const CMPIArgs*, CMPIArgs*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, setProperty, 144,
                   CMPIStatus (*)(const CMPIBroker*, const CMPIContext*,
                                  const CMPIObjectPath*, const char*,
                                  const CMPIValue*, CMPIType));
CMPI_ASSERT_MEMBER(CMPIBrokerFT, getProperty, 152,
                   CMPIData (*)(const CMPIBroker*, const CMPIContext*,
                                const CMPIObjectPath*, const char*,
                                CMPIStatus*));

// CMPIBrokerEncFT
static_assert(sizeof(CMPIBrokerEncFT) == 168);
static_assert(alignof(CMPIBrokerEncFT) == 8);
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, newInstance, 8,
                   CMPIInstance* (*)(const CMPIBroker*, const CMPIObjectPath*,
                                     CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, newObjectPath, 16,
                   CMPIObjectPath* (*)(const CMPIBroker*, const char*,
                                       const char*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, newArgs, 24,
                   CMPIArgs* (*)(const CMPIBroker*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, newString, 32,
                   CMPIString* (*)(const CMPIBroker*, const char*,
                                   CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, newArray, 40,
                   CMPIArray* (*)(const CMPIBroker*, CMPICount, CMPIType,
                                  CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, newDateTime, 48,
                   CMPIDateTime* (*)(const CMPIBroker*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, newDateTimeFromBinary, 56,
                   CMPIDateTime* (*)(const CMPIBroker*, CMPIUint64, CMPIBoolean,
                                     CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, newDateTimeFromChars, 64,
                   CMPIDateTime* (*)(const CMPIBroker*, const char*,
                                     CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, newSelectExp, 72,
                   CMPISelectExp* (*)(const CMPIBroker*, const char*,
                                      const char*, CMPIArray**, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, classPathIsA, 80,
                   CMPIBoolean (*)(const CMPIBroker*, const CMPIObjectPath*,
                                   const char*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, toString, 88,
                   CMPIString* (*)(const CMPIBroker*, const void*,
                                   CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, isOfType, 96,
                   CMPIBoolean (*)(const CMPIBroker*, const void*, const char*,
                                   CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, getType, 104,
                   CMPIString* (*)(const CMPIBroker*, const void*,
                                   CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, getMessage, 112,
                   CMPIString* (*)(const CMPIBroker*, const char*, const char*,
                                   CMPIStatus*, CMPICount, ...));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, logMessage, 120,
                   CMPIStatus (*)(const CMPIBroker*, int, const char*,
                                  const char*, const CMPIString*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, trace, 128,
                   CMPIStatus (*)(const CMPIBroker*, int, const char*,
                                  const char*, const CMPIString*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, newCMPIError, 136,
                   CMPIError* (*)(const CMPIBroker*, const char*, const char*,
                                  const char*, const CMPIErrorSeverity,
                                  const CMPIErrorProbableCause, const CMPIrc,
                                  CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, openMessageFile, 144,
                   CMPIStatus (*)(const CMPIBroker*, const char*,
                                  CMPIMsgFileHandle*));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, closeMessageFile, 152,
                   CMPIStatus (*)(const CMPIBroker*, const CMPIMsgFileHandle));
CMPI_ASSERT_MEMBER(CMPIBrokerEncFT, getMessage2, 160,
                   CMPIString* (*)(const CMPIBroker*, const char*,
                                   const CMPIMsgFileHandle, const char*,
                                   CMPIStatus*, CMPICount, ...));

// CMPIBrokerExtFT
static_assert(sizeof(CMPIBrokerExtFT) == 168);
static_assert(alignof(CMPIBrokerExtFT) == 8);
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, resolveFileName, 8, char* (*)(const char*));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, newThread, 16,
                   void* (*)(void* (*)(void*), void*, int));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, joinThread, 24, int (*)(void*, void**));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, exitThread, 32, int (*)(void*));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, cancelThread, 40, int (*)(void*));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, threadSleep, 48, int (*)(CMPIUint32));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, threadOnce, 56, int (*)(int*, void (*)()));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, createThreadKey, 64,
                   int (*)(unsigned int*, void (*)(void*)));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, destroyThreadKey, 72,
                   int (*)(unsigned int));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, getThreadSpecific, 80,
                   void* (*)(unsigned int));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, setThreadSpecific, 88,
                   int (*)(unsigned int, void*));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, newMutex, 96, void* (*)(int));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, destroyMutex, 104, void (*)(void*));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, lockMutex, 112, void (*)(void*));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, unlockMutex, 120, void (*)(void*));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, newCondition, 128, void* (*)(int));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, destroyCondition, 136, void (*)(void*));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, condWait, 144, int (*)(void*, void*));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, timedCondWait, 152,
                   int (*)(void*, void*, struct timespec*));
CMPI_ASSERT_MEMBER(CMPIBrokerExtFT, signalCondition, 160, int (*)(void*));

// CMPIBrokerMemFT
static_assert(sizeof(CMPIBrokerMemFT) == 120);
static_assert(alignof(CMPIBrokerMemFT) == 8);
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, ftVersion, 0, const int);
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, mark, 8,
                   CMPIGcStat* (*)(const CMPIBroker*, CMPIStatus*));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, release, 16,
                   CMPIStatus (*)(const CMPIBroker*, const CMPIGcStat*));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, cmpiMalloc, 24,
                   void* (*)(const CMPIBroker*, size_t));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, cmpiCalloc, 32,
                   void* (*)(const CMPIBroker*, size_t, size_t));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, cmpiRealloc, 40,
                   void* (*)(const CMPIBroker*, void*, size_t));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, cmpiStrDup, 48,
                   char* (*)(const CMPIBroker*, const char*));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, cmpiFree, 56,
                   void (*)(const CMPIBroker*, void*));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, freeInstance, 64,
                   void (*)(const CMPIBroker*, CMPIInstance*));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, freeObjectPath, 72,
                   void (*)(const CMPIBroker*, CMPIObjectPath*));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, freeArgs, 80,
                   void (*)(const CMPIBroker*, CMPIArgs*));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, freeString, 88,
                   void (*)(const CMPIBroker*, CMPIString*));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, freeArray, 96,
                   void (*)(const CMPIBroker*, CMPIArray*));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, freeDateTime, 104,
                   void (*)(const CMPIBroker*, CMPIDateTime*));
CMPI_ASSERT_MEMBER(CMPIBrokerMemFT, freeSelectExp, 112,
                   void (*)(const CMPIBroker*, CMPISelectExp*));

// A broker whose trace entry records what it was called with, so the test
// can show a provider-side call lands in the right slot with its arguments.
struct TraceRecord
{
    const CMPIBroker* broker = nullptr;
    int level = 0;
    std::string component;
    std::string text;
    const CMPIString* string = nullptr;
};

TraceRecord lastTrace;

CMPIStatus recordTrace(const CMPIBroker* mb, int level, const char* component,
                       const char* text, const CMPIString* string)
{
    lastTrace = {mb, level, component, text, string};
    return CMPIStatus{CMPI_RC_OK, nullptr};
}

CMPIStatus rejectLog(const CMPIBroker*, int, const char*, const char*,
                     const CMPIString*)
{
    return CMPIStatus{CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

TEST(BrokerTables, TraceCallReachesTheTraceSlotWithItsArguments)
{
    CMPIBrokerEncFT eft{};
    eft.ftVersion = CMPICurrentVersion;
    eft.logMessage = rejectLog;
    eft.trace = recordTrace;
    CMPIBrokerFT bft{};
    bft.brokerName = "TestBroker";
    const CMPIBroker broker{nullptr, &bft, &eft, nullptr, nullptr};

    const CMPIStatus st = broker.eft->trace(&broker, CMPI_LEV_VERBOSE, "sel",
                                            "polled 3 records", nullptr);

    EXPECT_EQ(st.rc, CMPI_RC_OK);
    EXPECT_EQ(lastTrace.broker, &broker);
    EXPECT_EQ(lastTrace.level, CMPI_LEV_VERBOSE);
    EXPECT_EQ(lastTrace.component, "sel");
    EXPECT_EQ(lastTrace.text, "polled 3 records");
    EXPECT_STREQ(broker.bft->brokerName, "TestBroker");
}

TEST(BrokerTables, SlotsAreReadFromTheOffsetsABrokerWritesThem)
{
    // A broker built from another compiler's headers stores the function
    // pointers by byte offset; reading them through our struct must agree.
    CMPIBrokerEncFT eft{};
    auto* const raw = reinterpret_cast<unsigned char*>(&eft);
    auto* const traceFn = &recordTrace;
    auto* const logFn = &rejectLog;
    std::memcpy(raw + 128, &traceFn, sizeof traceFn);
    std::memcpy(raw + 120, &logFn, sizeof logFn);

    EXPECT_EQ(eft.trace, &recordTrace);
    EXPECT_EQ(eft.logMessage, &rejectLog);
    EXPECT_EQ(eft.getMessage2, nullptr);
}

} // namespace
