#include "FreeIpmiHandles.h"

#include <cstring>

namespace QX::Ipmi
{

namespace
{

std::string text(const char* message)
{
    return message != nullptr ? message : "";
}

ErrorCategory completionCategory(std::uint8_t code)
{
    return code == IPMI_COMP_CODE_NODE_BUSY ? ErrorCategory::Busy
                                            : ErrorCategory::CompletionCode;
}

// What a request reports on a machine without an in-band BMC (no IPMI
// device, or the kernel driver not loaded): one line that says what is
// missing and the two ways to fix it.
constexpr const char* noInbandBmc =
    "no in-band BMC on this machine (no IPMI device such as /dev/ipmi0): "
    "load the kernel's IPMI driver (modprobe ipmi_si ipmi_devintf), or "
    "reach the BMC over the network with ipmi.interface = lan and "
    "ipmi.host in the platform configuration (/etc/qx/platform.conf)";

constexpr const char* inbandProbe = "ipmi_ctx_find_inband";

} // namespace

bool isNoInbandBmc(const IpmiError& error)
{
    return error.call() == inbandProbe && error.detail() == noInbandBmc;
}

ErrorCategory categoryOf(int ipmiErrnum)
{
    switch (ipmiErrnum)
    {
        case IPMI_ERR_CONNECTION_TIMEOUT:
        case IPMI_ERR_SESSION_TIMEOUT:
        case IPMI_ERR_DRIVER_TIMEOUT:
        case IPMI_ERR_MESSAGE_TIMEOUT:
            return ErrorCategory::Timeout;
        case IPMI_ERR_USERNAME_INVALID:
        case IPMI_ERR_PASSWORD_INVALID:
        case IPMI_ERR_K_G_INVALID:
        case IPMI_ERR_PRIVILEGE_LEVEL_INSUFFICIENT:
        case IPMI_ERR_PRIVILEGE_LEVEL_CANNOT_BE_OBTAINED:
        case IPMI_ERR_AUTHENTICATION_TYPE_UNAVAILABLE:
        case IPMI_ERR_CIPHER_SUITE_ID_UNAVAILABLE:
        case IPMI_ERR_PASSWORD_VERIFICATION_TIMEOUT:
        case IPMI_ERR_IPMI_2_0_UNAVAILABLE:
        case IPMI_ERR_BAD_RMCPPLUS_STATUS_CODE:
        case IPMI_ERR_DEVICE_NOT_OPEN:
            return ErrorCategory::Session;
        case IPMI_ERR_DRIVER_BUSY:
        case IPMI_ERR_BMC_BUSY:
            return ErrorCategory::Busy;
        case IPMI_ERR_COMMAND_INVALID_OR_UNSUPPORTED:
        case IPMI_ERR_BAD_COMPLETION_CODE:
            return ErrorCategory::CompletionCode;
        default:
            return ErrorCategory::Other;
    }
}

FiidObject::FiidObject(fiid_template_t tmpl) : object_(fiid_obj_create(tmpl))
{
    if (!object_)
    {
        throw IpmiError("fiid_obj_create", ErrorCategory::Other,
                        "out of memory");
    }
}

std::uint64_t FiidObject::field(const char* name) const
{
    std::uint64_t value = 0;
    const int rc = fiid_obj_get(object_.get(), name, &value);
    if (rc < 0)
    {
        throw IpmiError(std::string("fiid_obj_get(") + name + ")",
                        ErrorCategory::Other,
                        text(fiid_obj_errormsg(object_.get())));
    }
    if (rc == 0)
    {
        throw IpmiError(std::string("fiid_obj_get(") + name + ")",
                        ErrorCategory::Other,
                        "the BMC's answer lacks this field");
    }
    return value;
}

void FiidObject::data(const char* name, std::span<std::uint8_t> out) const
{
    const int length = fiid_obj_get_data(object_.get(), name, out.data(),
                                         static_cast<unsigned>(out.size()));
    if (length < 0)
    {
        throw IpmiError(std::string("fiid_obj_get_data(") + name + ")",
                        ErrorCategory::Other,
                        text(fiid_obj_errormsg(object_.get())));
    }
    if (static_cast<std::size_t>(length) != out.size())
    {
        throw IpmiError(std::string("fiid_obj_get_data(") + name + ")",
                        ErrorCategory::Other,
                        "the BMC answered " + std::to_string(length) +
                            " bytes, not " + std::to_string(out.size()));
    }
}

std::optional<std::uint8_t> FiidObject::completionCode() const
{
    std::uint64_t value = 0;
    if (fiid_obj_get(object_.get(), "comp_code", &value) != 1)
    {
        return std::nullopt;
    }
    return static_cast<std::uint8_t>(value);
}

void IpmiContext::Destroy::operator()(ipmi_ctx_t context) const
{
    // Closing a context that was never opened fails harmlessly.
    ipmi_ctx_close(context);
    ipmi_ctx_destroy(context);
}

IpmiContext::IpmiContext(const SessionParameters& parameters) :
    context_(ipmi_ctx_create())
{
    if (!context_)
    {
        throw IpmiError("ipmi_ctx_create", ErrorCategory::Other,
                        "out of memory");
    }
    ipmi_ctx_t context = context_.get();
    const bool inBand = !parameters.lan;
    const auto failOpen = [context, inBand](const char* call)
    {
        const int errnum = ipmi_ctx_errnum(context);
        if (inBand && errnum == IPMI_ERR_DEVICE_NOT_FOUND)
        {
            throw IpmiError(call, ErrorCategory::Other, noInbandBmc);
        }
        throw IpmiError(call, categoryOf(errnum),
                        text(ipmi_ctx_errormsg(context)));
    };
    if (parameters.lan)
    {
        if (ipmi_ctx_open_outofband_2_0(
                context, parameters.host.c_str(),
                parameters.user.empty() ? nullptr : parameters.user.c_str(),
                parameters.password.empty() ? nullptr
                                            : parameters.password.c_str(),
                nullptr, 0, parameters.privilege, parameters.cipherSuite,
                parameters.sessionTimeoutMs, parameters.retransmissionTimeoutMs,
                parameters.workaroundFlags, IPMI_FLAGS_DEFAULT) < 0)
        {
            failOpen("ipmi_ctx_open_outofband_2_0");
        }
        driver_ = IPMI_DEVICE_LAN_2_0;
        return;
    }
    const char* device = parameters.driverDevice.empty()
                             ? nullptr
                             : parameters.driverDevice.c_str();
    if (parameters.driver == IPMI_DEVICE_UNKNOWN)
    {
        const int found = ipmi_ctx_find_inband(
            context, &driver_, 0, 0, 0, device, parameters.workaroundFlags,
            IPMI_FLAGS_DEFAULT);
        if (found < 0)
        {
            failOpen("ipmi_ctx_find_inband");
        }
        if (found == 0)
        {
            throw IpmiError(inbandProbe, ErrorCategory::Other, noInbandBmc);
        }
        return;
    }
    if (ipmi_ctx_open_inband(context, parameters.driver, 0, 0, 0, device,
                             parameters.workaroundFlags,
                             IPMI_FLAGS_DEFAULT) < 0)
    {
        failOpen("ipmi_ctx_open_inband");
    }
    driver_ = parameters.driver;
}

void IpmiContext::fail(const char* call, const FiidObject& response,
                       std::uint8_t netFunction) const
{
    const int errnum = ipmi_ctx_errnum(context_.get());
    const std::optional<std::uint8_t> code = response.completionCode();
    if (code && *code != 0)
    {
        char reason[IPMI_ERR_STR_MAX_LEN];
        if (ipmi_completion_code_strerror_cmd_r(response.get(), netFunction,
                                                reason, sizeof reason) < 0)
        {
            std::strcpy(reason, "unknown completion code");
        }
        throw IpmiError(call, completionCategory(*code), reason, *code);
    }
    throw IpmiError(call, categoryOf(errnum),
                    text(ipmi_ctx_errormsg(context_.get())));
}

void IpmiContext::fail(const char* call) const
{
    throw IpmiError(call, categoryOf(ipmi_ctx_errnum(context_.get())),
                    text(ipmi_ctx_errormsg(context_.get())));
}

SdrContext::SdrContext() : context_(ipmi_sdr_ctx_create())
{
    if (!context_)
    {
        throw IpmiError("ipmi_sdr_ctx_create", ErrorCategory::Other,
                        "out of memory");
    }
}

std::string SdrContext::message() const
{
    return text(ipmi_sdr_ctx_errormsg(context_.get()));
}

SelContext::SelContext(ipmi_sdr_ctx_t sdr) :
    context_(ipmi_sel_ctx_create(nullptr, sdr))
{
    if (!context_)
    {
        throw IpmiError("ipmi_sel_ctx_create", ErrorCategory::Other,
                        "out of memory");
    }
    if (ipmi_sel_ctx_set_separator(context_.get(), " ; ") < 0)
    {
        throw IpmiError("ipmi_sel_ctx_set_separator", ErrorCategory::Other,
                        text(ipmi_sel_ctx_errormsg(context_.get())));
    }
}

} // namespace QX::Ipmi
