#pragma once

// The four indication classes the provider delivers.

namespace testevents
{

constexpr const char* entryEvent = "ZAN_MgmtHwLogEntryEvent";
constexpr const char* clearEvent = "ZAN_MgmtHwLogClearEvent";
constexpr const char* fullEvent = "ZAN_MgmtHwLogFullEvent";
constexpr const char* restartEvent = "ZANx_AutomaticServerRestartEvent";

} // namespace testevents
