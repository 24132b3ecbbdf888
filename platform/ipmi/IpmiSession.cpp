#include "IpmiSession.h"

#include "IpmiLog.h"

#include <algorithm>
#include <exception>
#include <type_traits>

namespace QX::Ipmi
{

namespace
{

using Clock = std::chrono::steady_clock;

// How long a machine found without an in-band BMC is taken to have none.
// FreeIPMI's probe leaks memory each time it finds nothing (about 640
// bytes, reported by LeakSanitizer with FreeIPMI 1.6) and opens every
// device it knows; an object manager polling a BMC-less machine would pay
// both on every request. A driver loaded later is found within this time.
constexpr std::chrono::seconds noBmcRecheck{60};

std::int64_t ticks(Clock::time_point when)
{
    return std::chrono::duration_cast<std::chrono::nanoseconds>(
               when.time_since_epoch())
        .count();
}

const char* driverName(ipmi_driver_type_t driver)
{
    switch (driver)
    {
        case IPMI_DEVICE_KCS:
            return "KCS";
        case IPMI_DEVICE_SMIC:
            return "SMIC";
        case IPMI_DEVICE_BT:
            return "BT";
        case IPMI_DEVICE_SSIF:
            return "SSIF";
        case IPMI_DEVICE_OPENIPMI:
            return "OpenIPMI driver";
        case IPMI_DEVICE_SUNBMC:
            return "Sun BMC driver";
        case IPMI_DEVICE_INTELDCMI:
            return "Intel DCMI";
        default:
            return "driver probed at first use";
    }
}

/** Clear SEL with @p operation under @p reservationId; gives the checked
 *  response. */
FiidObject clearSel(IpmiContext& context, std::uint16_t reservationId,
                    std::uint8_t operation)
{
    FiidObject response(tmpl_cmd_clear_sel_rs);
    context.check(ipmi_cmd_clear_sel(context.get(), reservationId, operation,
                                     response.get()),
                  "ipmi_cmd_clear_sel", response, IPMI_NET_FN_STORAGE_RQ);
    return response;
}

} // namespace

IpmiSession::IpmiSession(SessionParameters parameters,
                         CipherSuiteChoice cipherSuites) :
    parameters_(std::move(parameters)),
    cipherSuites_(std::move(cipherSuites)),
    reopenAfter_(
        parameters_.lan
            ? std::optional(std::min<std::chrono::milliseconds>(
                  std::chrono::milliseconds(parameters_.sessionTimeoutMs / 2),
                  std::chrono::seconds(15)))
            : std::nullopt),
    guarded_(!parameters_.lan || parameters_.guardExchanges)
{
    if (parameters_.lan)
    {
        cipherSuites_.rememberFor(peerKey());
    }
}

IpmiSession::~IpmiSession() = default;

std::string IpmiSession::peerName() const
{
    if (parameters_.lan)
    {
        return "LAN 2.0 " + parameters_.host;
    }
    return std::string("in-band (") +
           driverName(context_ ? context_->driver() : parameters_.driver) + ")";
}

std::uint64_t IpmiSession::requestCount() const
{
    return requests_.load(std::memory_order_relaxed);
}

std::string IpmiSession::peerKey() const
{
    if (!parameters_.lan)
    {
        return "inband";
    }
    std::string key = "lan-" + parameters_.host;
    for (char& c : key)
    {
        const bool plain = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') ||
                           (c >= '0' && c <= '9') || c == '.' || c == '-';
        if (!plain)
        {
            c = '_';
        }
    }
    return key;
}

std::shared_ptr<IpmiContext> IpmiSession::open()
{
    if (worker_ && worker_->busy())
    {
        throw IpmiError("IPMI exchange", ErrorCategory::Busy,
                        "the driver has not yet returned from an "
                        "exchange given up on after the timeout");
    }
    if (context_)
    {
        const Clock::time_point last{
            std::chrono::nanoseconds(lastActivity_.load())};
        if (!reopenAfter_ || Clock::now() - last < *reopenAfter_)
        {
            return context_;
        }
        // Idle long enough that the BMC, or FreeIPMI's own bookkeeping,
        // may already count the session as dead: start a fresh one.
        context_.reset();
    }
    if (noBmc_ && Clock::now() - noBmcSince_ < noBmcRecheck)
    {
        throw *noBmc_;
    }
    try
    {
        context_ = parameters_.lan ? openLan()
                                   : std::make_shared<IpmiContext>(parameters_);
    }
    catch (const IpmiError& error)
    {
        touch();
        lost_ = true;
        if (isNoInbandBmc(error))
        {
            noBmc_ = error;
            noBmcSince_ = Clock::now();
        }
        throw;
    }
    noBmc_.reset();
    ++generation_;
    touch();
    // Routine re-opens after idle time are not worth a line; the first
    // session and the first one after a failure are.
    if (generation_.load() == 1 || lost_)
    {
        logLine(logLevelInfo, "IpmiSession::open", __LINE__,
                std::string(lost_ ? "IPMI session opened again: "
                                  : "IPMI session opened: ") +
                    peerName());
    }
    lost_ = false;
    return context_;
}

std::shared_ptr<IpmiContext> IpmiSession::openLan()
{
    const std::vector<std::uint8_t> suites = cipherSuites_.candidates();
    if (suites.empty())
    {
        return std::make_shared<IpmiContext>(parameters_);
    }
    SessionParameters attempt = parameters_;
    for (std::size_t i = 0;; ++i)
    {
        attempt.cipherSuite = suites[i];
        cipherSuites_.tried();
        try
        {
            auto context = std::make_shared<IpmiContext>(attempt);
            if (i > 0)
            {
                logLine(logLevelInfo, "IpmiSession::openLan", __LINE__,
                        "IPMI session opened with cipher suite " +
                            std::to_string(suites[i]) + " after suite " +
                            std::to_string(suites[0]) +
                            " was refused: " + peerName());
            }
            cipherSuites_.worked(suites[i]);
            return context;
        }
        catch (const IpmiError& error)
        {
            // A BMC that does not answer is not asked again with another
            // suite: that would only double the wait.
            if (i + 1 == suites.size() ||
                error.category() == ErrorCategory::Timeout)
            {
                throw;
            }
        }
    }
}

void IpmiSession::touch()
{
    lastActivity_.store(ticks(Clock::now()));
}

void IpmiSession::noteFailure(const IpmiError& error)
{
    touch();
    if (error.sessionLost())
    {
        context_.reset();
        lost_ = true;
    }
}

template <typename Result, typename Work>
Result IpmiSession::onWorker(const std::shared_ptr<IpmiContext>& context,
                             Work work)
{
    // What the job touches it owns, so it may outlive this call when the
    // driver does not return in time.
    using Stored = std::conditional_t<std::is_void_v<Result>, bool, Result>;
    struct Outcome
    {
        std::optional<Stored> value;
        std::exception_ptr error;
    };
    auto outcome = std::make_shared<Outcome>();
    auto job = [outcome, context, work]() mutable
    {
        try
        {
            if constexpr (std::is_void_v<Result>)
            {
                work(*context);
                outcome->value.emplace(true);
            }
            else
            {
                outcome->value.emplace(work(*context));
            }
        }
        catch (...)
        {
            outcome->error = std::current_exception();
        }
    };
    if (!worker_)
    {
        worker_.emplace();
    }
    const auto timeout = std::chrono::milliseconds(
        parameters_.guardTimeoutMs != 0 ? parameters_.guardTimeoutMs
                                        : parameters_.sessionTimeoutMs);
    if (!worker_->run(std::move(job), timeout))
    {
        throw IpmiError("IPMI exchange", ErrorCategory::Timeout,
                        "no answer from the driver within " +
                            std::to_string(timeout.count()) + " ms");
    }
    // The worker finished the job: its outcome is ours alone now.
    if (outcome->error)
    {
        std::rethrow_exception(outcome->error);
    }
    if constexpr (!std::is_void_v<Result>)
    {
        return std::move(*outcome->value);
    }
}

template <typename Result, typename Work>
Result IpmiSession::exchange(Work work)
{
    const std::shared_ptr<IpmiContext> context = open();
    requests_.fetch_add(1, std::memory_order_relaxed);
    try
    {
        if (guarded_)
        {
            if constexpr (std::is_void_v<Result>)
            {
                onWorker<void>(context, work);
                touch();
                return;
            }
            else
            {
                Result result = onWorker<Result>(context, work);
                touch();
                return result;
            }
        }
        if constexpr (std::is_void_v<Result>)
        {
            work(*context);
            touch();
        }
        else
        {
            Result result = work(*context);
            touch();
            return result;
        }
    }
    catch (const IpmiError& error)
    {
        noteFailure(error);
        throw;
    }
}

void IpmiSession::run(const std::function<void(IpmiContext&)>& work)
{
    // Not on the worker: the work uses its caller's state, which must not
    // be left to the worker after a timeout. The SDR cache code it runs
    // makes single driver calls bounded by the driver.
    const std::shared_ptr<IpmiContext> context = open();
    try
    {
        work(*context);
        touch();
    }
    catch (const IpmiError& error)
    {
        noteFailure(error);
        throw;
    }
}

SelInfo IpmiSession::getSelInfo()
{
    return exchange<SelInfo>(
        [](IpmiContext& context)
        {
            FiidObject response(tmpl_cmd_get_sel_info_rs);
            context.check(ipmi_cmd_get_sel_info(context.get(), response.get()),
                          "ipmi_cmd_get_sel_info", response,
                          IPMI_NET_FN_STORAGE_RQ);
            SelInfo info;
            info.entries =
                static_cast<std::uint16_t>(response.field("entries"));
            info.freeSpace =
                static_cast<std::uint16_t>(response.field("free_space"));
            info.mostRecentAddition = static_cast<std::uint32_t>(
                response.field("most_recent_addition_timestamp"));
            info.mostRecentErase = static_cast<std::uint32_t>(
                response.field("most_recent_erase_timestamp"));
            info.overflow = response.field("overflow_flag") != 0;
            info.reserveSupported =
                response.field("reserve_sel_command_supported") != 0;
            return info;
        });
}

std::uint16_t IpmiSession::reserveSel()
{
    return exchange<std::uint16_t>(
        [](IpmiContext& context)
        {
            FiidObject response(tmpl_cmd_reserve_sel_rs);
            context.check(ipmi_cmd_reserve_sel(context.get(), response.get()),
                          "ipmi_cmd_reserve_sel", response,
                          IPMI_NET_FN_STORAGE_RQ);
            return static_cast<std::uint16_t>(response.field("reservation_id"));
        });
}

SelEntry IpmiSession::getSelEntry(std::uint16_t reservationId,
                                  std::uint16_t recordId)
{
    return exchange<SelEntry>(
        [reservationId, recordId](IpmiContext& context)
        {
            FiidObject response(tmpl_cmd_get_sel_entry_rs);
            context.check(
                ipmi_cmd_get_sel_entry(
                    context.get(), reservationId, recordId, 0,
                    IPMI_SEL_READ_ENTIRE_RECORD_BYTES_TO_READ, response.get()),
                "ipmi_cmd_get_sel_entry", response, IPMI_NET_FN_STORAGE_RQ);
            SelEntry entry;
            entry.nextRecordId =
                static_cast<std::uint16_t>(response.field("next_record_id"));
            response.data("record_data", entry.data);
            return entry;
        });
}

void IpmiSession::initiateSelErase(std::uint16_t reservationId)
{
    exchange<void>(
        [reservationId](IpmiContext& context) {
            clearSel(context, reservationId,
                     IPMI_SEL_CLEAR_OPERATION_INITIATE_ERASE);
        });
}

bool IpmiSession::selEraseCompleted(std::uint16_t reservationId)
{
    return exchange<bool>(
        [reservationId](IpmiContext& context)
        {
            const FiidObject response =
                clearSel(context, reservationId,
                         IPMI_SEL_CLEAR_OPERATION_GET_ERASURE_STATUS);
            return response.field("erasure_progress") ==
                   IPMI_SEL_CLEAR_ERASE_COMPLETED;
        });
}

std::optional<std::uint8_t> IpmiSession::getSystemRestartCause()
{
    return exchange<std::optional<std::uint8_t>>(
        [](IpmiContext& context) -> std::optional<std::uint8_t>
        {
            FiidObject response(tmpl_cmd_get_system_restart_cause_rs);
            try
            {
                context.check(ipmi_cmd_get_system_restart_cause(context.get(),
                                                                response.get()),
                              "ipmi_cmd_get_system_restart_cause", response,
                              IPMI_NET_FN_CHASSIS_RQ);
            }
            catch (const IpmiError& error)
            {
                if (error.completionCode() == completionInvalidCommand)
                {
                    return std::nullopt;
                }
                throw;
            }
            return static_cast<std::uint8_t>(response.field("restart_cause"));
        });
}

std::uint64_t IpmiSession::sessionGeneration() const
{
    return generation_.load();
}

Clock::time_point IpmiSession::lastActivity() const
{
    return Clock::time_point(std::chrono::nanoseconds(lastActivity_.load()));
}

} // namespace QX::Ipmi
