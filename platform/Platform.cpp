#include "Platform.h"

#include "CVLogger.h"
#include "Configuration.h"
#include "FailureReport.h"
#include "Fixture.h"
#include "MemorySource.h"
#include "Resources.h"
#include "ipmi/IpmiSourceFactory.h"

#include <mutex>
#include <sstream>
#include <stdexcept>

namespace QX::Platform
{

namespace
{

std::mutex sourceMutex;
std::shared_ptr<InstrumentationSource> activeSource;

// Ends the source, and with it its threads (the IPMI poller, the alert
// dispatcher), when the library is unloaded or the process exits: object
// managers unload an idle provider after calling only its cleanup, and a
// thread left running in unmapped code would crash them. Made after the
// logger, so it is destroyed before it: those threads may still log.
struct SourceTeardown
{
    SourceTeardown()
    {
        CVLog::CVLogger::settings();
    }
    ~SourceTeardown()
    {
        std::shared_ptr<InstrumentationSource> source;
        {
            const std::lock_guard lock(sourceMutex);
            source = std::move(activeSource);
        }
        source.reset();
    }
    SourceTeardown(const SourceTeardown&) = delete;
    SourceTeardown& operator=(const SourceTeardown&) = delete;
};
const SourceTeardown sourceTeardown;

std::vector<std::string> splitComponents(const std::string& list)
{
    std::vector<std::string> components;
    std::istringstream items(list);
    std::string item;
    while (std::getline(items, item, ','))
    {
        const std::size_t first = item.find_first_not_of(" \t");
        if (first == std::string::npos)
        {
            continue;
        }
        components.push_back(
            item.substr(first, item.find_last_not_of(" \t") - first + 1));
    }
    return components;
}

std::shared_ptr<CVLog::LogSink> makeSink(const std::string& name)
{
    if (name == "syslog")
    {
        return CVLog::makeSyslogSink();
    }
    if (name == "stderr")
    {
        return CVLog::makeStderrSink();
    }
    if (name.starts_with("file:"))
    {
        return CVLog::makeFileSink(name.substr(5));
    }
    return nullptr; // "none"
}

void configureLogger(const Configuration& configuration)
{
    auto sink = makeSink(configuration.logSink);
    CVLog::LoggerSettings settings;
    settings.logLevel = configuration.logLevel;
    settings.traceLevel = configuration.traceLevel;
    settings.components = splitComponents(configuration.logComponents);
    CVLog::CVLogger::setSink(std::move(sink));
    CVLog::CVLogger::configure(settings);
}

std::shared_ptr<InstrumentationSource>
makeSource(const Configuration& configuration)
{
    if (configuration.source == "ipmi")
    {
        return Ipmi::makeIpmiSource(configuration.ipmi, configuration.file);
    }
    if (configuration.fixtureFile.empty())
    {
        std::istringstream sample(builtinSampleFixture());
        return std::make_shared<MemorySource>(
            parseFixture(sample, "built-in sample SEL"));
    }
    return std::make_shared<MemorySource>(
        loadFixtureFile(configuration.fixtureFile));
}

} // namespace

std::shared_ptr<InstrumentationSource> currentSource()
{
    const std::lock_guard lock(sourceMutex);
    if (activeSource)
    {
        return activeSource;
    }
    try
    {
        const Configuration configuration = loadConfiguration();
        configureLogger(configuration);
        Locale::configureLanguage(configuration.locale);
        activeSource = makeSource(configuration);
    }
    catch (const std::exception& error)
    {
        const std::string reason =
            std::string("instrumentation platform unavailable: ") +
            error.what();
        reportFailure("currentSource", __LINE__, reason);
        throw std::runtime_error(reason);
    }
    return activeSource;
}

void overrideSource(std::shared_ptr<InstrumentationSource> source)
{
    const std::lock_guard lock(sourceMutex);
    activeSource = std::move(source);
}

} // namespace QX::Platform
