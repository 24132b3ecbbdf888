#pragma once

// Move-only owners of FreeIPMI's C handles. Every FreeIPMI return code is
// checked here, once; a failure becomes an IpmiError naming the call.

#include "IpmiError.h"

#include <freeipmi/freeipmi.h>

#include <cstdint>
#include <memory>
#include <span>
#include <string>

namespace QX::Ipmi
{

/** A FreeIPMI message object (fiid_obj_t) made from a template. */
class FiidObject
{
  public:
    /** Throws IpmiError (Other) when FreeIPMI cannot allocate it. */
    explicit FiidObject(fiid_template_t tmpl);

    fiid_obj_t get() const
    {
        return object_.get();
    }
    /** Value of an integer field; throws IpmiError when it is not set. */
    std::uint64_t field(const char* name) const;
    /** Copies a data field into @p out; throws unless it fills it. */
    void data(const char* name, std::span<std::uint8_t> out) const;
    /** The completion code, when the message holds one. */
    std::optional<std::uint8_t> completionCode() const;

  private:
    struct Destroy
    {
        void operator()(fiid_obj_t object) const
        {
            fiid_obj_destroy(object);
        }
    };
    std::unique_ptr<std::remove_pointer_t<fiid_obj_t>, Destroy> object_;
};

/** What a session to the BMC is opened with. */
struct SessionParameters
{
    bool lan = false;
    // In-band: FreeIPMI driver type (IPMI_DEVICE_UNKNOWN to probe for one)
    // and an optional device path.
    ipmi_driver_type_t driver = IPMI_DEVICE_UNKNOWN;
    std::string driverDevice;
    // LAN 2.0 (RMCP+).
    std::string host; // "name", "name:port" or "[v6]:port"
    std::string user;
    std::string password;
    std::uint8_t privilege = IPMI_PRIVILEGE_LEVEL_OPERATOR;
    std::uint8_t cipherSuite = 3;
    unsigned sessionTimeoutMs = 5000;
    unsigned retransmissionTimeoutMs = 500;
    unsigned workaroundFlags = 0;
    // Run each exchange on the session's worker thread and give up after
    // guardTimeoutMs (the session timeout when 0). Always on in-band.
    bool guardExchanges = false;
    unsigned guardTimeoutMs = 0;
};

/**
 * @brief An ipmi_ctx_t with an open session (LAN 2.0) or device (in-band).
 *
 * Opening throws IpmiError; the destructor closes and destroys the
 * context. Not thread-safe.
 */
class IpmiContext
{
  public:
    explicit IpmiContext(const SessionParameters& parameters);

    ipmi_ctx_t get() const
    {
        return context_.get();
    }
    /** Throws the IpmiError for a failed FreeIPMI command call. */
    [[noreturn]] void fail(const char* call, const FiidObject& response,
                           std::uint8_t netFunction) const;
    /** Throws the IpmiError for a failed FreeIPMI call without a response
     *  object, from the context's error number and message. */
    [[noreturn]] void fail(const char* call) const;
    /** Runs `rc = command(ctx, ..., response)` results through fail(). */
    void check(int rc, const char* call, const FiidObject& response,
               std::uint8_t netFunction) const
    {
        if (rc < 0)
        {
            fail(call, response, netFunction);
        }
    }
    /** The in-band driver found (IPMI_DEVICE_LAN_2_0 over the LAN). */
    ipmi_driver_type_t driver() const
    {
        return driver_;
    }

  private:
    struct Destroy
    {
        void operator()(ipmi_ctx_t context) const;
    };
    std::unique_ptr<std::remove_pointer_t<ipmi_ctx_t>, Destroy> context_;
    ipmi_driver_type_t driver_ = IPMI_DEVICE_UNKNOWN;
};

/** An SDR context (ipmi_sdr_ctx_t); its cache file is closed with it. */
class SdrContext
{
  public:
    SdrContext();

    ipmi_sdr_ctx_t get() const
    {
        return context_.get();
    }
    int errnum() const
    {
        return ipmi_sdr_ctx_errnum(context_.get());
    }
    std::string message() const;

  private:
    struct Destroy
    {
        void operator()(ipmi_sdr_ctx_t context) const
        {
            ipmi_sdr_ctx_destroy(context);
        }
    };
    std::unique_ptr<std::remove_pointer_t<ipmi_sdr_ctx_t>, Destroy> context_;
};

/** A SEL context (ipmi_sel_ctx_t) used only to interpret records: it has
 *  no IPMI context, so it never talks to the BMC. */
class SelContext
{
  public:
    /** @p sdr gives sensor names; null for none. */
    explicit SelContext(ipmi_sdr_ctx_t sdr);

    ipmi_sel_ctx_t get() const
    {
        return context_.get();
    }

  private:
    struct Destroy
    {
        void operator()(ipmi_sel_ctx_t context) const
        {
            ipmi_sel_ctx_destroy(context);
        }
    };
    std::unique_ptr<std::remove_pointer_t<ipmi_sel_ctx_t>, Destroy> context_;
};

/** The category of a FreeIPMI context error number. */
ErrorCategory categoryOf(int ipmiErrnum);

/** True for the error of an in-band probe that found no BMC on this
 *  machine (no IPMI device, or the kernel driver not loaded). */
bool isNoInbandBmc(const IpmiError& error);

} // namespace QX::Ipmi
