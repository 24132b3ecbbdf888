// Layout of the MI objects and MI function tables a provider library hands
// to the object manager from its factory functions.
#include "abi/abi_check.h"

#include <cmpift.h>

#include <cstring>

#include <gtest/gtest.h>

namespace
{

// Every MI object is a handle plus its function table.
static_assert(sizeof(CMPIInstanceMI) == 16);
CMPI_ASSERT_MEMBER(CMPIInstanceMI, hdl, 0, const void*);
CMPI_ASSERT_MEMBER(CMPIInstanceMI, ft, 8, CMPIInstanceMIFT*);
static_assert(sizeof(CMPIAssociationMI) == 16);
CMPI_ASSERT_MEMBER(CMPIAssociationMI, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIAssociationMI, ft, 8, CMPIAssociationMIFT*);
static_assert(sizeof(CMPIMethodMI) == 16);
CMPI_ASSERT_MEMBER(CMPIMethodMI, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIMethodMI, ft, 8, CMPIMethodMIFT*);
static_assert(sizeof(CMPIPropertyMI) == 16);
CMPI_ASSERT_MEMBER(CMPIPropertyMI, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIPropertyMI, ft, 8, CMPIPropertyMIFT*);
static_assert(sizeof(CMPIIndicationMI) == 16);
CMPI_ASSERT_MEMBER(CMPIIndicationMI, hdl, 0, void*);
CMPI_ASSERT_MEMBER(CMPIIndicationMI, ft, 8, CMPIIndicationMIFT*);

// CMPIInstanceMIFT
static_assert(sizeof(CMPIInstanceMIFT) == 80);
static_assert(alignof(CMPIInstanceMIFT) == 8);
CMPI_ASSERT_MEMBER(CMPIInstanceMIFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIInstanceMIFT, miVersion, 4, int);
CMPI_ASSERT_MEMBER(CMPIInstanceMIFT, miName, 8, const char*);
CMPI_ASSERT_MEMBER(CMPIInstanceMIFT, cleanup, 16,
                   CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*,
                                  CMPIBoolean));
CMPI_ASSERT_MEMBER(CMPIInstanceMIFT, enumerateInstanceNames, 24,
                   CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*));
CMPI_ASSERT_MEMBER(CMPIInstanceMIFT, enumerateInstances, 32,
                   CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const char**));
CMPI_ASSERT_MEMBER(CMPIInstanceMIFT, getInstance, 40,
                   CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const char**));
CMPI_ASSERT_MEMBER(CMPIInstanceMIFT, createInstance, 48,
                   CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const CMPIInstance*));
CMPI_ASSERT_MEMBER(CMPIInstanceMIFT, modifyInstance, 56,
                   CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const CMPIInstance*, const char**));
CMPI_ASSERT_MEMBER(CMPIInstanceMIFT, deleteInstance, 64,
                   CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*));
CMPI_ASSERT_MEMBER(CMPIInstanceMIFT, execQuery, 72,
                   CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const char*, const char*));

// CMPIAssociationMIFT
static_assert(sizeof(CMPIAssociationMIFT) == 56);
static_assert(alignof(CMPIAssociationMIFT) == 8);
CMPI_ASSERT_MEMBER(CMPIAssociationMIFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIAssociationMIFT, miVersion, 4, const CMPISint32);
CMPI_ASSERT_MEMBER(CMPIAssociationMIFT, miName, 8, const char*);
CMPI_ASSERT_MEMBER(CMPIAssociationMIFT, cleanup, 16,
                   CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*,
                                  CMPIBoolean));
CMPI_ASSERT_MEMBER(CMPIAssociationMIFT, associators, 24,
                   CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const char*, const char*, const char*,
                                  const char*, const char**));
CMPI_ASSERT_MEMBER(CMPIAssociationMIFT, associatorNames, 32,
                   CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const char*, const char*, const char*,
                                  const char*));
CMPI_ASSERT_MEMBER(CMPIAssociationMIFT, references, 40,
                   CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const char*, const char*, const char**));
CMPI_ASSERT_MEMBER(CMPIAssociationMIFT, referenceNames, 48,
                   CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const char*, const char*));

// CMPIMethodMIFT
static_assert(sizeof(CMPIMethodMIFT) == 32);
static_assert(alignof(CMPIMethodMIFT) == 8);
CMPI_ASSERT_MEMBER(CMPIMethodMIFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIMethodMIFT, miVersion, 4, int);
CMPI_ASSERT_MEMBER(CMPIMethodMIFT, miName, 8, const char*);
CMPI_ASSERT_MEMBER(CMPIMethodMIFT, cleanup, 16,
                   CMPIStatus (*)(CMPIMethodMI*, const CMPIContext*,
                                  CMPIBoolean));
CMPI_ASSERT_MEMBER(CMPIMethodMIFT, invokeMethod, 24,
                   CMPIStatus (*)(CMPIMethodMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const char*, const CMPIArgs*, CMPIArgs*));

// CMPIPropertyMIFT
static_assert(sizeof(CMPIPropertyMIFT) == 48);
static_assert(alignof(CMPIPropertyMIFT) == 8);
CMPI_ASSERT_MEMBER(CMPIPropertyMIFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIPropertyMIFT, miVersion, 4, int);
CMPI_ASSERT_MEMBER(CMPIPropertyMIFT, miName, 8, const char*);
CMPI_ASSERT_MEMBER(CMPIPropertyMIFT, cleanup, 16,
                   CMPIStatus (*)(CMPIPropertyMI*, const CMPIContext*,
                                  CMPIBoolean));
CMPI_ASSERT_MEMBER(CMPIPropertyMIFT, setProperty, 24,
                   CMPIStatus (*)(CMPIPropertyMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const char*, const CMPIData));
CMPI_ASSERT_MEMBER(CMPIPropertyMIFT, getProperty, 32,
                   CMPIStatus (*)(CMPIPropertyMI*, const CMPIContext*,
                                  const CMPIResult*, const CMPIObjectPath*,
                                  const char*));
CMPI_ASSERT_MEMBER(CMPIPropertyMIFT, setPropertyWithOrigin, 40,
                   CMPIStatus (*)(CMPIPropertyMI*, const CMPIContext*,
                                  const CMPIResult*, CMPIObjectPath*,
                                  const char*, const CMPIData, const char*));

// CMPIIndicationMIFT
static_assert(sizeof(CMPIIndicationMIFT) == 72);
static_assert(alignof(CMPIIndicationMIFT) == 8);
CMPI_ASSERT_MEMBER(CMPIIndicationMIFT, ftVersion, 0, int);
CMPI_ASSERT_MEMBER(CMPIIndicationMIFT, miVersion, 4, int);
CMPI_ASSERT_MEMBER(CMPIIndicationMIFT, miName, 8, const char*);
CMPI_ASSERT_MEMBER(CMPIIndicationMIFT, cleanup, 16,
                   CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*,
                                  CMPIBoolean));
CMPI_ASSERT_MEMBER(CMPIIndicationMIFT, authorizeFilter, 24,
                   CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*,
                                  const CMPISelectExp*, const char*,
                                  const CMPIObjectPath*, const char*));
CMPI_ASSERT_MEMBER(CMPIIndicationMIFT, mustPoll, 32,
                   CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*,
                                  const CMPISelectExp*, const char*,
                                  const CMPIObjectPath*));
CMPI_ASSERT_MEMBER(CMPIIndicationMIFT, activateFilter, 40,
                   CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*,
                                  const CMPISelectExp*, const char*,
                                  const CMPIObjectPath*, CMPIBoolean));
CMPI_ASSERT_MEMBER(CMPIIndicationMIFT, deActivateFilter, 48,
                   CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*,
                                  const CMPISelectExp*, const char*,
                                  const CMPIObjectPath*, CMPIBoolean));
CMPI_ASSERT_MEMBER(CMPIIndicationMIFT, enableIndications, 56,
                   CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*));
CMPI_ASSERT_MEMBER(CMPIIndicationMIFT, disableIndications, 64,
                   CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*));

// Minimal provider entry points used to fill statically initialised tables
// the way a provider library does.
int enableCalls = 0;
int disableCalls = 0;

CMPIStatus cleanupOk(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean)
{
    return CMPIStatus{CMPI_RC_OK, nullptr};
}

CMPIStatus enumerateNamesUnsupported(CMPIInstanceMI*, const CMPIContext*,
                                     const CMPIResult*, const CMPIObjectPath*)
{
    return CMPIStatus{CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

CMPIStatus enableIndications(CMPIIndicationMI*, const CMPIContext*)
{
    ++enableCalls;
    return CMPIStatus{CMPI_RC_OK, nullptr};
}

CMPIStatus disableIndications(CMPIIndicationMI*, const CMPIContext*)
{
    ++disableCalls;
    return CMPIStatus{CMPI_RC_OK, nullptr};
}

CMPIInstanceMIFT instanceTable = {
    CMPICurrentVersion,
    CMPICurrentVersion,
    "instanceTestProvider",
    cleanupOk,
    enumerateNamesUnsupported,
    nullptr,
    nullptr,
    nullptr,
    nullptr,
    nullptr,
    nullptr,
};

CMPIIndicationMIFT indicationTable = {
    CMPICurrentVersion,
    CMPICurrentVersion,
    "IndicationTestProvider",
    nullptr,
    nullptr,
    nullptr,
    nullptr,
    nullptr,
    enableIndications,
    disableIndications,
};

TEST(MITables, StaticInstanceTableReadsBackInSlotOrder)
{
    CMPIInstanceMI mi{nullptr, &instanceTable};

    EXPECT_EQ(mi.ft->ftVersion, 200);
    EXPECT_EQ(mi.ft->miVersion, 200);
    EXPECT_STREQ(mi.ft->miName, "instanceTestProvider");
    EXPECT_EQ(mi.ft->cleanup, &cleanupOk);
    EXPECT_EQ(mi.ft->enumerateInstanceNames, &enumerateNamesUnsupported);
    EXPECT_EQ(mi.ft->execQuery, nullptr);
    EXPECT_EQ(mi.ft->enumerateInstanceNames(&mi, nullptr, nullptr, nullptr).rc,
              CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(mi.ft->cleanup(&mi, nullptr, 1).rc, CMPI_RC_OK);
}

TEST(MITables, IndicationEnableAndDisableSitInTheLastTwoSlots)
{
    CMPIIndicationMI mi{nullptr, &indicationTable};
    enableCalls = 0;
    disableCalls = 0;

    // Call through the raw slot addresses a broker uses.
    const auto* const raw = reinterpret_cast<const unsigned char*>(mi.ft);
    using Toggle = CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*);
    Toggle enable = nullptr;
    Toggle disable = nullptr;
    std::memcpy(&enable, raw + 56, sizeof enable);
    std::memcpy(&disable, raw + 64, sizeof disable);
    ASSERT_NE(enable, nullptr);
    ASSERT_NE(disable, nullptr);

    EXPECT_EQ(enable(&mi, nullptr).rc, CMPI_RC_OK);
    EXPECT_EQ(disable(&mi, nullptr).rc, CMPI_RC_OK);
    EXPECT_EQ(disable(&mi, nullptr).rc, CMPI_RC_OK);
    EXPECT_EQ(enableCalls, 1);
    EXPECT_EQ(disableCalls, 2);
}

} // namespace
