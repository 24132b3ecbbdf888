#pragma once

// Profiles that the reading and the alerting tests both run on.

#include "ProfileBmc.h"

#include <chrono>

namespace profiles
{

/** A Clear SEL that erases in the background for @p takes, answers 81h
 *  meanwhile, cancels the reservation and leaves a "Log Area
 *  Reset/Cleared" record. */
inline QX::test::BmcProfile backgroundClear(std::chrono::milliseconds takes)
{
    QX::test::BmcProfile profile;
    profile.eraseTakes = takes;
    profile.eraseCancelsReservation = true;
    profile.clearedRecordAfterErase = true;
    return profile;
}

/** A BMC that takes 20 ms for each exchange and @p slowTakes for every
 *  @p slowEvery-th one. */
inline QX::test::BmcProfile slowBmc(unsigned slowEvery,
                                    std::chrono::milliseconds slowTakes)
{
    QX::test::BmcProfile profile;
    profile.delay = std::chrono::milliseconds(20);
    profile.slowEvery = slowEvery;
    profile.slowTakes = slowTakes;
    return profile;
}

} // namespace profiles
