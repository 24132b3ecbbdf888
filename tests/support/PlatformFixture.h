#pragma once

#include "CVLogger.h"
#include "CaptureSink.h"
#include "MemorySource.h"
#include "NodeTree.h"
#include "Platform.h"

#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace testsupport
{

/** Builds the usual shape of tree: controller /bmc0 with log /bmc0/sel
 *  ("IPMI SEL Log") holding @p entries entries (record ids 1..entries). */
QX::NodeTreeBuilder standardTree(unsigned entries, unsigned maxRecords = 512);

/** Adds one entry with record id @p recordId under @p logPath. */
void addEntry(QX::NodeTreeBuilder& tree, const std::string& logPath,
              unsigned recordId, const std::string& timestamp,
              const std::string& description = "Temperature CPU1: asserted");

/**
 * Installs an in-memory source and a capturing logger that writes every
 * level on both channels; restores the configured platform afterwards.
 */
class PlatformTest : public ::testing::Test
{
  protected:
    void SetUp() override;
    void TearDown() override;

    void install(const QX::NodeTreeBuilder& tree);
    std::vector<CVLog::LogRecord> logRecords() const;
    /** Records whose message contains @p text. */
    std::vector<CVLog::LogRecord>
    recordsContaining(const std::string& text) const;

    std::shared_ptr<QX::MemorySource> source;
    std::shared_ptr<testsupport::CaptureSink> capture;

  private:
    std::shared_ptr<CVLog::LogSink> previousSink_;
    CVLog::LoggerSettings previousSettings_;
};

} // namespace testsupport
