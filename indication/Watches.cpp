#include "Watches.h"

#include "IndicationTrace.h"
#include "Instrumentation.h"
#include "Platform.h"

#include <algorithm>
#include <exception>
#include <iostream>

namespace QX::SELComposite
{

namespace
{

/** Runs @p change on the platform's current source; an exception is
 *  written to standard error and logged as a failure of @p function. */
template <typename Change>
void onCurrentSource(const char* function, Change change)
{
    try
    {
        change(Platform::currentSource());
    }
    catch (const std::exception& error)
    {
        std::cerr << error.what() << std::endl;
        indication::traceMessage(function, __LINE__, LOG_LEVEL_FAILURE,
                                 error.what());
    }
}

} // namespace

void Watches::start(NodeLexicon::NodeType kind, MonitorCallback handler)
{
    onCurrentSource(
        "Watches::start",
        [&](const auto& source)
        {
            Instrumentation(source).startMonitoring(kind, handler, nullptr);
            const std::lock_guard lock(mutex_);
            registrations_.push_back(Registration{source, kind, handler});
        });
}

void Watches::stop(NodeLexicon::NodeType kind, MonitorCallback handler)
{
    onCurrentSource(
        "Watches::stop",
        [&](const auto& source)
        {
            Instrumentation(source).stopMonitoring(kind, handler, nullptr);
            const std::lock_guard lock(mutex_);
            const auto found =
                std::find_if(registrations_.begin(), registrations_.end(),
                             [&](const Registration& registration)
                             {
                                 return registration.kind == kind &&
                                        registration.handler == handler &&
                                        registration.source.lock() == source;
                             });
            if (found != registrations_.end())
            {
                registrations_.erase(found);
            }
        });
}

void Watches::releaseAll() noexcept
{
    std::vector<Registration> remaining;
    {
        const std::lock_guard lock(mutex_);
        remaining.swap(registrations_);
    }
    for (const Registration& registration : remaining)
    {
        try
        {
            if (const auto source = registration.source.lock())
            {
                source->stopMonitoring(registration.kind, registration.handler,
                                       nullptr);
            }
        }
        catch (...)
        {
            // Nothing more can be done for this one while unloading.
        }
    }
}

std::size_t Watches::held() const
{
    const std::lock_guard lock(mutex_);
    return registrations_.size();
}

} // namespace QX::SELComposite
