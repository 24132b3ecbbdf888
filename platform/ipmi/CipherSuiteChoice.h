#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace QX::Ipmi
{

/**
 * @brief Which RMCP+ cipher suites a LAN session offers the BMC, in order.
 *
 * Configured: that one suite only. Automatic: 17 (HMAC-SHA256, AES) first,
 * which newer BMCs require, then 3 (HMAC-SHA1, AES), which older ones
 * speak; the suite that last worked with this BMC goes first, kept in a
 * one-line file in the state directory, so an older BMC costs the refused
 * attempt once and not at every start.
 *
 * Not thread-safe: the session that owns it serializes its use.
 */
class CipherSuiteChoice
{
  public:
    /** The suites tried when none is configured, in this order. */
    static constexpr std::uint8_t automaticOrder[] = {17, 3};

    /** No choice of its own: the session's parameters decide. */
    CipherSuiteChoice() = default;
    /** Always and only @p suite. */
    static CipherSuiteChoice fixed(std::uint8_t suite);
    /** 17, then 3, remembered in @p stateDirectory ("": not remembered)
     *  once the session names the BMC with rememberFor(). */
    static CipherSuiteChoice automatic(std::string stateDirectory);

    /** Names the BMC (IpmiSession::peerKey()): the suite is kept in
     *  "cipher-suite-<peerKey>" and read back from there. */
    void rememberFor(const std::string& peerKey);

    /** Whether suites are tried in turn. */
    bool automaticChoice() const
    {
        return automatic_;
    }
    /** The suites to offer, the one to try first at the front; empty when
     *  the session's parameters decide. */
    std::vector<std::uint8_t> candidates() const;
    /** Counts a session opening tried with one of the candidates. */
    void tried()
    {
        ++attempts_;
    }
    /** Records that a session opened with @p suite; an automatic choice
     *  keeps it for the next start. */
    void worked(std::uint8_t suite);
    /** How many session openings were tried. */
    std::uint64_t attempts() const
    {
        return attempts_;
    }
    /** The suite that opened the last session, if any did. */
    std::optional<std::uint8_t> current() const
    {
        return current_;
    }

  private:
    bool automatic_ = false;
    std::optional<std::uint8_t> fixed_;
    std::optional<std::uint8_t> current_;
    std::string directory_;
    std::string file_;
    std::uint64_t attempts_ = 0;
};

} // namespace QX::Ipmi
