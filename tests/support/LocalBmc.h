#pragma once

// What the simulated BMCs of the tests share: they answer in this
// process, so their one session is never lost and never idle.

#include "ipmi/BmcCommands.h"

#include <chrono>
#include <cstdint>

namespace QX::test
{

class LocalBmc : public Ipmi::BmcCommands
{
  public:
    /** The session count a test may raise, as a BMC that restarted
     *  between two exchanges would make it. */
    std::uint64_t generation = 1;

    std::uint64_t sessionGeneration() const override
    {
        return generation;
    }
    std::chrono::steady_clock::time_point lastActivity() const override
    {
        return std::chrono::steady_clock::now();
    }
};

} // namespace QX::test
