#include "Watches.h"

#include "IndicationTrace.h"
#include "Instrumentation.h"
#include "Platform.h"

#include <algorithm>
#include <exception>
#include <iostream>

namespace QX::SELComposite
{

void Watches::start(NodeLexicon::NodeType kind, MonitorCallback handler)
{
    change(true, kind, handler);
}

void Watches::stop(NodeLexicon::NodeType kind, MonitorCallback handler)
{
    change(false, kind, handler);
}

void Watches::change(bool watch, NodeLexicon::NodeType kind,
                     MonitorCallback handler)
{
    try
    {
        const std::shared_ptr<InstrumentationSource> source =
            Platform::currentSource();
        Instrumentation cursor(source);
        if (watch)
        {
            cursor.startMonitoring(kind, handler, nullptr);
        }
        else
        {
            cursor.stopMonitoring(kind, handler, nullptr);
        }
        const std::lock_guard lock(mutex_);
        if (watch)
        {
            registrations_.push_back(Registration{source, kind, handler});
            return;
        }
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
    }
    catch (const std::exception& error)
    {
        std::cerr << error.what() << std::endl;
        indication::traceMessage(watch ? "Watches::start" : "Watches::stop",
                                 __LINE__, LOG_LEVEL_FAILURE, error.what());
    }
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
