#pragma once

// The requests the BMC-backed test fixtures send through the in-process
// host, as an object manager would.

#include "Host.h"

#include <string>

namespace testrequests
{

/** EnumerateInstances of @p className in the provider's namespace. */
inline host::Outcome enumerate(host::Host& host, const std::string& className)
{
    host::ObjectPath path;
    path.nameSpace = "root/zanqx";
    path.className = className;
    return host.enumerateInstances(path);
}

/** ClearLog on the provider's one log. */
inline host::Outcome clearLog(host::Host& host)
{
    host::ObjectPath path;
    path.nameSpace = "root/zanqx";
    path.className = "ZAN_MgmtHwLog";
    path.keys.edit().push_back({"Name", host::Value::string("IPMI SEL Log")});
    path.keys.edit().push_back(
        {"CreationClassName", host::Value::string("ZAN_MgmtHwLog")});
    return host.invokeMethod(path, "ClearLog");
}

} // namespace testrequests
