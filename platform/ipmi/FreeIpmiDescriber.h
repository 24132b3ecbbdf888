#pragma once

#include "FreeIpmiHandles.h"
#include "IpmiSession.h"
#include "RecordDescriber.h"

#include <optional>
#include <string>

namespace QX::Ipmi
{

/**
 * @brief Event texts from FreeIPMI's SEL library, with sensor names from
 *        the BMC's SDR kept in a cache file in the state directory.
 *
 * The cache file is checked against the BMC's SDR repository whenever the
 * session is new (a BMC may have restarted with another SDR) and rebuilt
 * when it is missing or out of date. Without a usable cache (a state
 * directory that cannot be written, say) sensors are named by number.
 */
class FreeIpmiDescriber : public RecordDescriber
{
  public:
    /**
     * @param session the session the SDR is read over
     * @param stateDirectory where the SDR cache file lives
     * @param sdrCreateFlags extra IPMI_SDR_CACHE_CREATE_FLAGS_*
     * @param selFlags IPMI_SEL_FLAGS_* for interpreting records
     */
    FreeIpmiDescriber(IpmiSession& session, std::string stateDirectory,
                      int sdrCreateFlags, unsigned selFlags);

    bool refreshSensorNames() override;
    std::string describe(const SelRecordBytes& record) override;
    /** The interpretation flags and the SDR cache file in use with its
     *  size and modification time (a rebuilt cache is another file). */
    std::string textsKey() const override;

    /**
     * Names sensors from the SDR cache file @p file as it stands, without
     * asking the BMC whether it is current: for records read elsewhere,
     * with the cache of the BMC they came from. Lasts until the next
     * refreshSensorNames. False (sensors named by number) when the file
     * cannot be opened.
     */
    bool openCacheFile(const std::string& file);

  private:
    bool openOrBuildCache(IpmiContext& context);
    std::string cacheFile() const;

    IpmiSession& session_;
    std::string stateDirectory_;
    int sdrCreateFlags_;
    unsigned selFlags_;
    SdrContext sdr_;
    // FreeIPMI takes an SDR context for a SEL context only while its cache
    // is open: this one lives exactly as long as the open cache.
    std::optional<SelContext> named_;
    std::string namesFile_; // the cache file named_ reads
    SelContext unnamed_;    // sensor numbers only
    bool cacheProblemLogged_ = false;
    std::uint64_t checkedGeneration_ = 0;
};

} // namespace QX::Ipmi
