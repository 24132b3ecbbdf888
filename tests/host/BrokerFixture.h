// A broker with a request open, and short ways to reach its tables.
#pragma once

#include "Broker.h"
#include "SelClasses.h"

#include <cmpift.h>

#include <memory>
#include <string>

#include <gtest/gtest.h>

namespace hosttest
{

/** A C string as the CMPIValue of a CMPI_chars argument. */
inline const CMPIValue* chars(const char* text)
{
    return reinterpret_cast<const CMPIValue*>(text);
}

class BrokerTest : public ::testing::Test
{
  protected:
    BrokerTest() : request_(std::make_unique<host::Broker::Request>(broker_)) {}

    const CMPIBroker* mb() const
    {
        return broker_.cmpi();
    }
    const CMPIBrokerEncFT* eft() const
    {
        return broker_.cmpi()->eft;
    }
    const CMPIContext* context() const
    {
        return request_->context();
    }
    const CMPIResult* result() const
    {
        return request_->result();
    }

    CMPIString* newString(const char* text)
    {
        CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
        CMPIString* s = eft()->newString(mb(), text, &rc);
        EXPECT_EQ(rc.rc, CMPI_RC_OK);
        return s;
    }
    CMPIObjectPath* newPath(const char* ns, const char* cn)
    {
        CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
        CMPIObjectPath* p = eft()->newObjectPath(mb(), ns, cn, &rc);
        EXPECT_EQ(rc.rc, CMPI_RC_OK);
        return p;
    }
    CMPIInstance* newInstance(const char* ns, const char* cn)
    {
        CMPIStatus rc{CMPI_RC_ERR_FAILED, nullptr};
        CMPIInstance* i = eft()->newInstance(mb(), newPath(ns, cn), &rc);
        EXPECT_EQ(rc.rc, CMPI_RC_OK);
        return i;
    }
    static std::string text(const CMPIString* s)
    {
        const char* p = s->ft->getCharPtr(s, nullptr);
        return p ? p : "<null>";
    }

    host::Broker broker_{selclasses::schema()};
    std::unique_ptr<host::Broker::Request> request_;
};

} // namespace hosttest
