#pragma once

#include "EventClasses.h"
#include "Values.h"

#include <chrono>
#include <cstddef>
#include <string>

namespace soak
{

constexpr const char* nameSpace = "root/zanqx";
using namespace testevents;

/** How long a wait for something that normally takes milliseconds may
 *  last before the test gives up on it. */
constexpr std::chrono::seconds patience{30};

/** Threads of this process now (entries of /proc/self/task). */
std::size_t threadCount();

/** threadCount() once a thread has been started and joined: the thread
 *  sanitizer starts a thread of its own with the process's second one. */
std::size_t threadBaseline();

/** Waits until the process has at most @p count threads (threads that
 *  ended may still be on their way out); the count reached. */
std::size_t awaitThreadCount(std::size_t count);

/** The names of this process's threads, for a failure message. */
std::string threadNames();

/** Empty when @p indication is one of the four indication classes,
 *  delivered into root/zanqx with the provider's common properties;
 *  otherwise what is wrong with it. */
std::string malformation(const host::DeliveredIndication& indication);

} // namespace soak
