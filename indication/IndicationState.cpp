#include "ActivityLedger.h"
#include "SELIndication.h"
#include "Watches.h"

namespace QX::SELComposite
{

std::atomic<std::uint32_t> subscriberCountServerIndication{0};
std::atomic<std::uint32_t> subscriberCountLogEntryIndication{0};
std::atomic<std::uint32_t> subscriberCountLogFullIndication{0};
std::atomic<std::uint32_t> subscriberCountLogClearIndication{0};
std::atomic<bool> _enabledSEL{false};
std::atomic<const CMPIBroker*> _alertSELBroker{nullptr};
std::atomic<const CMPIContext*> _alertSELContext{nullptr};
std::atomic<bool> _alertSELContextAvailable{false};
AlertHandOver indicationSELData;
std::atomic<CMPI_THREAD_TYPE> ind_thread_id_server{nullptr};
std::atomic<CMPI_THREAD_TYPE> ind_thread_id_log{nullptr};
std::atomic<CMPI_THREAD_TYPE> ind_thread_id_entry{nullptr};

ActivityLedger indicationActivity;
Watches indicationWatches;

bool awaitIndicationThreads(std::chrono::milliseconds timeout)
{
    return indicationActivity.awaitIdle(timeout);
}

namespace
{

/** Longest the library's unloading waits for its threads to finish. */
constexpr std::chrono::seconds unloadWait{5};

/**
 * The one place where this library ends its own activity, when it is
 * unloaded or the process ends: the watches still held are removed, after
 * which the platform calls no alert handler of ours, and the alert handlers
 * and delivery threads still running are waited for (indicationActivity
 * counts both). Once it has run, no thread executes this library's code.
 *
 * It protects the code and the statics of this library from those
 * threads. Every other static they touch is either destroyed after this
 * guard (the objects of this unit, defined before it) or has no destructor
 * at all (the logger component names, the atomics of the indication
 * state), so the order in which units are linked does not matter. The
 * platform library, which may stay loaded, ends its own threads itself:
 * its teardown in platform/Platform.cpp destroys the source, which joins
 * them.
 */
struct UnloadGuard
{
    UnloadGuard() = default;
    UnloadGuard(const UnloadGuard&) = delete;
    UnloadGuard& operator=(const UnloadGuard&) = delete;
    ~UnloadGuard()
    {
        indicationActivity.closeForUnload();
        indicationWatches.releaseAll();
        indicationActivity.awaitIdle(unloadWait);
    }
};

UnloadGuard unloadGuard;

} // namespace

} // namespace QX::SELComposite
