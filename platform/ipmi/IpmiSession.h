#pragma once

#include "BmcCommands.h"
#include "CipherSuiteChoice.h"
#include "ExchangeWorker.h"
#include "FreeIpmiHandles.h"

#include <atomic>
#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>

namespace QX::Ipmi
{

/**
 * @brief The process's one IPMI session (LAN 2.0) or in-band device,
 *        opened on first use, reused, and opened again when needed.
 *
 * Over the LAN, FreeIPMI gives up on an exchange once the session timeout
 * has passed since the last packet received, and BMCs drop sessions left
 * idle (the OpenIPMI simulator after 30 s). So a session idle for half the
 * timeout (at most 15 s) is replaced before the next exchange, and a
 * session whose exchange timed out or failed at the session level is
 * closed: the next exchange opens a new one. Nothing is retried here; a
 * failure throws IpmiError at once.
 *
 * In-band drivers wait on the BMC with timeouts of their own, longer than
 * the configured one. So in-band exchanges run on the session's one worker
 * thread (ExchangeWorker), started with the first exchange, and the caller
 * waits at most the timeout: then it throws (Timeout) and leaves the
 * context to the worker. Until the driver returns, further exchanges fail
 * at once (Busy); afterwards a new context is opened. The worker is joined
 * when the session ends. A driver call it is stuck in still ends on its
 * own, so that join is bounded: FreeIPMI's in-band drivers limit each wait
 * themselves (the one for the kernel's IPMI device waits at most 60 s for
 * an answer). Opening an in-band context takes no timeout, so that limit
 * cannot be made shorter from here.
 *
 * Not thread-safe: callers serialize every member except lastActivity(),
 * sessionGeneration() and requestCount(), which any thread may read.
 */
class IpmiSession : public BmcCommands
{
  public:
    /** @p cipherSuites picks the suite of each LAN session; by default
     *  the one in @p parameters. */
    explicit IpmiSession(SessionParameters parameters,
                         CipherSuiteChoice cipherSuites = {});
    /** Joins the in-band worker (defined here, where the worker is known:
     *  the worker is not part of the library's interface). */
    ~IpmiSession() override;

    IpmiSession(const IpmiSession&) = delete;
    IpmiSession& operator=(const IpmiSession&) = delete;

    SelInfo getSelInfo() override;
    std::uint16_t reserveSel() override;
    SelEntry getSelEntry(std::uint16_t reservationId,
                         std::uint16_t recordId) override;
    void initiateSelErase(std::uint16_t reservationId) override;
    bool selEraseCompleted(std::uint16_t reservationId) override;
    std::optional<std::uint8_t> getSystemRestartCause() override;
    std::uint64_t sessionGeneration() const override;
    std::chrono::steady_clock::time_point lastActivity() const override;
    std::uint64_t requestCount() const override;

    /**
     * Runs @p work with the open context, as one exchange: the session is
     * opened first if needed, and closed if @p work throws an IpmiError
     * that loses it. For FreeIPMI calls that take the context themselves
     * (the SDR cache).
     */
    void run(const std::function<void(IpmiContext&)>& work);

    /** How LAN sessions pick their cipher suite, and how they did. */
    const CipherSuiteChoice& cipherSuites() const
    {
        return cipherSuites_;
    }

    /** "LAN 2.0 host:port" or "in-band (KCS)", for log lines. */
    std::string peerName() const;
    /** A name for files kept per BMC: "lan-host_port" or "inband". */
    std::string peerKey() const;

  private:
    std::shared_ptr<IpmiContext> open();
    /** A new LAN session, trying the cipher suites in turn. */
    std::shared_ptr<IpmiContext> openLan();
    template <typename Result, typename Work>
    Result exchange(Work work);
    template <typename Result, typename Work>
    Result onWorker(const std::shared_ptr<IpmiContext>& context, Work work);
    void touch();
    /** After a failed exchange: closes the session when it was lost. */
    void noteFailure(const IpmiError& error);

    SessionParameters parameters_;
    CipherSuiteChoice cipherSuites_;
    /** Idle time after which a LAN session is replaced; none in-band,
     *  where there is no session to lose. */
    std::optional<std::chrono::milliseconds> reopenAfter_;
    bool guarded_;
    std::shared_ptr<IpmiContext> context_;
    bool lost_ = false; // the last session ended in a failure
    // The answer of the last in-band probe that found no BMC, and when it
    // was given: repeated instead of probing again for a while.
    std::optional<IpmiError> noBmc_;
    std::chrono::steady_clock::time_point noBmcSince_;
    std::atomic<std::uint64_t> generation_{0};
    std::atomic<std::uint64_t> requests_{0};    // exchanges sent
    std::atomic<std::int64_t> lastActivity_{0}; // steady clock, ns
    // Last, so that it is joined before the context goes.
    std::optional<ExchangeWorker> worker_;
};

} // namespace QX::Ipmi
