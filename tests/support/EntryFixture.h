#pragma once

#include "CVLogger.h"
#include "CaptureSink.h"
#include "Host.h"
#include "MemorySource.h"
#include "NodeTree.h"
#include "Platform.h"

#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace entry
{

constexpr const char* nameSpace = "root/zanqx";

/** Controller /bmc0, log /bmc0/sel ("IPMI SEL Log", MaxRecords 512,
 *  status 1) with @p entries entries (ids 1..entries). */
QX::NodeTreeBuilder selTree(unsigned entries);

/** Adds entry @p recordId to /bmc0/sel. */
void addEntry(QX::NodeTreeBuilder& tree, unsigned recordId,
              const std::string& timestamp = "2011-01-02 03:04:05",
              const std::string& description = "Temperature CPU1: asserted",
              const std::string& recordData = "0a 0b");

host::ObjectPath classPath(const std::string& className);

/** The operation answered OK and signalled the end of its results. */
void expectComplete(const host::Outcome& outcome);

/** The provider library loaded through its factories, as an object
 *  manager does, on an in-memory tree the test controls. */
class ProviderTest : public ::testing::Test
{
  protected:
    void SetUp() override;
    void TearDown() override;

    void install(const QX::NodeTreeBuilder& tree);
    host::Host& host()
    {
        return *host_;
    }
    host::Broker& broker()
    {
        return host_->broker();
    }

    std::shared_ptr<QX::MemorySource> source;

  private:
    std::unique_ptr<host::Host> host_;
};

/** The provider as in ProviderTest, with every diagnostic line of every
 *  level captured in capture_. */
class CapturingProviderTest : public ProviderTest
{
  protected:
    void SetUp() override;
    void TearDown() override;

    std::shared_ptr<testsupport::CaptureSink> capture_;

  private:
    CVLog::LoggerSettings previous_;
};

} // namespace entry
