#pragma once

#include "Host.h"

#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace deploy
{

// The provider library loaded through its factories, as an object manager
// loads it, serving a memory tree in which every property the provider
// reads is present: so every property it can set is set.
class ProvidedInstances : public ::testing::Test
{
  protected:
    void SetUp() override;
    void TearDown() override;

    // All instances of @p className with all properties; fails the test
    // when the provider returns none.
    std::vector<host::Instance> instancesOf(const std::string& className);
    std::vector<host::ObjectPath> namesOf(const std::string& className);
    host::Host& host()
    {
        return *host_;
    }

  private:
    std::unique_ptr<host::Host> host_;
};

// The non-indication classes of the project's MOF: the ones the instance
// MI serves.
std::vector<std::string> instanceClassNames();
// The indication classes of the project's MOF.
std::vector<std::string> indicationClassNames();

} // namespace deploy
