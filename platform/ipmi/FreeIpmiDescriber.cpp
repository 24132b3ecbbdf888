#include "FreeIpmiDescriber.h"

#include "IpmiLog.h"
#include "SelRecordText.h"

#include <cstdio>
#include <filesystem>
#include <sys/stat.h>

namespace QX::Ipmi
{

namespace
{

constexpr unsigned stringFlags =
    IPMI_SEL_STRING_FLAGS_IGNORE_UNAVAILABLE_FIELD |
    IPMI_SEL_STRING_FLAGS_OUTPUT_NOT_AVAILABLE;

void setFlags(const SelContext& context, unsigned flags)
{
    if (flags != 0 && ipmi_sel_ctx_set_flags(context.get(), flags) < 0)
    {
        throw IpmiError("ipmi_sel_ctx_set_flags", ErrorCategory::Other,
                        std::string(ipmi_sel_ctx_strerror(
                            ipmi_sel_ctx_errnum(context.get()))));
    }
}

// The record through FreeIPMI with @p format; empty when it cannot.
std::string interpret(const SelContext& context, const char* format,
                      const SelRecordBytes& record)
{
    char text[2048];
    const int length = ipmi_sel_parse_read_record_string(
        context.get(), format, record.data(),
        static_cast<unsigned>(record.size()), text, sizeof text, stringFlags);
    if (length <= 0)
    {
        return {};
    }
    return std::string(
        text, std::min<std::size_t>(static_cast<std::size_t>(length),
                                    std::char_traits<char>::length(text)));
}

std::string oemPrefix(std::uint8_t type)
{
    char prefix[32];
    std::snprintf(prefix, sizeof prefix, "OEM record type %02Xh: ", type);
    return prefix;
}

} // namespace

FreeIpmiDescriber::FreeIpmiDescriber(IpmiSession& session,
                                     std::string stateDirectory,
                                     int sdrCreateFlags, unsigned selFlags) :
    session_(session),
    stateDirectory_(std::move(stateDirectory)), sdrCreateFlags_(sdrCreateFlags),
    selFlags_(selFlags), unnamed_(nullptr)
{
    setFlags(unnamed_, selFlags_);
}

std::string FreeIpmiDescriber::cacheFile() const
{
    return stateDirectory_ + "/sdr-cache-" + session_.peerKey();
}

bool FreeIpmiDescriber::refreshSensorNames()
{
    const std::uint64_t generation = session_.sessionGeneration();
    if (generation != 0 && generation == checkedGeneration_)
    {
        return false;
    }
    bool changed = false;
    session_.run([this, &changed](IpmiContext& context)
                 { changed = openOrBuildCache(context); });
    checkedGeneration_ = session_.sessionGeneration();
    return changed;
}

bool FreeIpmiDescriber::openOrBuildCache(IpmiContext& context)
{
    const bool wasOpen = named_.has_value();
    if (named_)
    {
        named_.reset();
        ipmi_sdr_cache_close(sdr_.get());
    }
    const auto opened = [this]
    {
        namesFile_ = cacheFile();
        named_.emplace(sdr_.get());
        setFlags(*named_, selFlags_);
    };
    const auto unusable = [this, wasOpen](const std::string& why)
    {
        if (!cacheProblemLogged_)
        {
            logLine(logLevelFailure, "FreeIpmiDescriber", __LINE__,
                    "SDR cache " + cacheFile() + " unusable (" + why +
                        "): sensors are named by number");
            cacheProblemLogged_ = true;
        }
        return wasOpen;
    };
    if (stateDirectory_.empty())
    {
        return unusable("no state directory configured");
    }
    std::error_code error;
    std::filesystem::create_directories(stateDirectory_, error);
    if (error)
    {
        return unusable(error.message());
    }

    const std::string file = cacheFile();
    if (ipmi_sdr_cache_open(sdr_.get(), context.get(), file.c_str()) == 0)
    {
        opened();
        return !wasOpen;
    }
    switch (sdr_.errnum())
    {
        case IPMI_SDR_ERR_CACHE_READ_CACHE_DOES_NOT_EXIST:
        case IPMI_SDR_ERR_CACHE_OUT_OF_DATE:
        case IPMI_SDR_ERR_CACHE_INVALID:
            break;
        case IPMI_SDR_ERR_IPMI_ERROR:
            context.fail("ipmi_sdr_cache_open");
        default:
            return unusable(sdr_.message());
    }
    if (ipmi_sdr_cache_create(sdr_.get(), context.get(), file.c_str(),
                              IPMI_SDR_CACHE_CREATE_FLAGS_OVERWRITE |
                                  sdrCreateFlags_,
                              nullptr, nullptr) < 0)
    {
        if (sdr_.errnum() == IPMI_SDR_ERR_IPMI_ERROR)
        {
            context.fail("ipmi_sdr_cache_create");
        }
        return unusable(sdr_.message());
    }
    // Just built from the BMC: no need to ask the BMC again.
    if (ipmi_sdr_cache_open(sdr_.get(), nullptr, file.c_str()) < 0)
    {
        return unusable(sdr_.message());
    }
    opened();
    cacheProblemLogged_ = false;
    return true;
}

bool FreeIpmiDescriber::openCacheFile(const std::string& file)
{
    if (named_)
    {
        named_.reset();
        ipmi_sdr_cache_close(sdr_.get());
    }
    if (ipmi_sdr_cache_open(sdr_.get(), nullptr, file.c_str()) < 0)
    {
        return false;
    }
    namesFile_ = file;
    named_.emplace(sdr_.get());
    setFlags(*named_, selFlags_);
    return true;
}

std::string FreeIpmiDescriber::textsKey() const
{
    // Bump the leading word when the texts this class makes change.
    std::string key = "freeipmi-texts-1 flags " + std::to_string(selFlags_);
    if (!named_)
    {
        return key + " unnamed";
    }
    struct stat info
    {
    };
    if (::stat(namesFile_.c_str(), &info) != 0)
    {
        return {};
    }
    return key + " sdr " + namesFile_ + " " + std::to_string(info.st_size) +
           " " + std::to_string(info.st_mtim.tv_sec) + "." +
           std::to_string(info.st_mtim.tv_nsec);
}

std::string FreeIpmiDescriber::describe(const SelRecordBytes& record)
{
    const std::uint8_t type = recordTypeOf(record);
    std::string prefix;
    const char* format = nullptr;
    switch (ipmi_sel_record_type_class(type))
    {
        case IPMI_SEL_RECORD_TYPE_CLASS_SYSTEM_EVENT_RECORD:
            format = "%T %s: %E (%k)";
            break;
        case IPMI_SEL_RECORD_TYPE_CLASS_TIMESTAMPED_OEM_RECORD:
            prefix = oemPrefix(type);
            format = "%m: %o";
            break;
        case IPMI_SEL_RECORD_TYPE_CLASS_NON_TIMESTAMPED_OEM_RECORD:
            prefix = oemPrefix(type);
            format = "%o";
            break;
        default:
            return fallbackDescription(record);
    }
    std::string text;
    if (named_)
    {
        text = interpret(*named_, format, record);
    }
    if (text.empty())
    {
        text = interpret(unnamed_, format, record);
    }
    if (text.empty())
    {
        return fallbackDescription(record);
    }
    return prefix + text;
}

} // namespace QX::Ipmi
