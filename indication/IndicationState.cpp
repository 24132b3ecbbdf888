#include "ActivityLedger.h"
#include "SELIndication.h"
#include "Watches.h"

namespace QX::SELComposite
{

std::string loggerSELIndication = "Corvane.SELProvider";

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
 * Runs when the library is unloaded (or the process ends). The platform may
 * stay loaded after us and its sources must not call back into code that is
 * about to be unmapped: the watches still held are removed (after which no
 * alert handler of ours runs) and the delivery threads still in flight are
 * waited for. Defined after every other object of this unit, so that it is
 * destroyed before them.
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
