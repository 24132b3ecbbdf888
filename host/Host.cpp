#include "Host.h"

#include "StatusText.h"

namespace host
{
namespace
{

// A property list as providers receive it: NULL-terminated, or NULL.
class PropertyList
{
  public:
    explicit PropertyList(const std::vector<std::string>* names)
    {
        if (names != nullptr)
        {
            for (const std::string& n : *names)
            {
                pointers_.push_back(n.c_str());
            }
            pointers_.push_back(nullptr);
        }
    }
    const char** get()
    {
        return pointers_.empty() ? nullptr : pointers_.data();
    }

  private:
    std::vector<const char*> pointers_;
};

Outcome missingSlot(const char* slot)
{
    Outcome out;
    out.rc = CMPI_RC_ERR_NOT_SUPPORTED;
    out.message = std::string("the provider has no ") + slot + " function";
    return out;
}

template <typename MI, typename Factory>
MI* createMI(Broker& broker, const CMPIBroker* given, const char* type,
             Factory&& factory)
{
    Broker::Request request(broker);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    MI* mi = factory(given, request.context(), &status);
    if (mi == nullptr || status.rc != CMPI_RC_OK)
    {
        const Outcome out = request.finish(status);
        throw LoadError(std::string("the ") + type + " MI factory failed (" +
                        describeStatus(out.rc, out.message) + ")");
    }
    return mi;
}

// Indexes of the broker pointers handed to the three factories when each
// gets its own.
constexpr std::size_t instanceView = 0;
constexpr std::size_t methodView = 1;
constexpr std::size_t indicationView = 2;

} // namespace

ObjectPath IndicationFilter::classPath() const
{
    ObjectPath path;
    path.nameSpace = sourceNamespace;
    path.className = className;
    return path;
}

IndicationFilter IndicationFilter::forClass(std::string className,
                                            std::string sourceNamespace)
{
    IndicationFilter filter;
    filter.query = "SELECT * FROM " + className;
    filter.className = std::move(className);
    filter.sourceNamespace = std::move(sourceNamespace);
    return filter;
}

Host::Host(HostOptions options) :
    broker_(std::move(options.schema)), brokerPerMI_(options.brokerPerMI)
{
    if (!options.libraryPath.empty())
    {
        library_ = std::make_unique<ProviderLibrary>(
            options.libraryPath, std::move(options.providerName));
    }
    createMIs(options.factories);
}

void Host::createMIs(const ProviderFactories& factories)
{
    try
    {
        createEachMI(factories);
    }
    catch (...)
    {
        // Let the MIs that did load stop whatever they started.
        cleanupAll(true);
        throw;
    }
}

void Host::createEachMI(const ProviderFactories& factories)
{
    const auto& lib = library_;
    const auto need = [](auto* factory, const char* type)
    {
        if (factory == nullptr)
        {
            throw LoadError(std::string("no ") + type + " MI factory");
        }
        return factory;
    };
    instanceMI_ = createMI<CMPIInstanceMI>(
        broker_, instanceBroker(), "instance",
        [&](const CMPIBroker* b, const CMPIContext* c, CMPIStatus* s)
        {
            return lib ? lib->createInstanceMI(b, c, s)
                       : need(factories.instance, "instance")(b, c, s);
        });
    methodMI_ = createMI<CMPIMethodMI>(
        broker_, methodBroker(), "method",
        [&](const CMPIBroker* b, const CMPIContext* c, CMPIStatus* s)
        {
            return lib ? lib->createMethodMI(b, c, s)
                       : need(factories.method, "method")(b, c, s);
        });
    indicationMI_ = createMI<CMPIIndicationMI>(
        broker_, indicationBroker(), "indication",
        [&](const CMPIBroker* b, const CMPIContext* c, CMPIStatus* s)
        {
            return lib ? lib->createIndicationMI(b, c, s)
                       : need(factories.indication, "indication")(b, c, s);
        });
}

Host::~Host()
{
    if (indicationsEnabled_)
    {
        disableIndications();
    }
    if (!terminated_)
    {
        cleanupAll(true);
    }
}

Broker& Host::broker()
{
    return broker_;
}

const CMPIBroker* Host::instanceBroker() const
{
    return broker_.cmpiView(brokerPerMI_ ? instanceView : 0);
}

const CMPIBroker* Host::methodBroker() const
{
    return broker_.cmpiView(brokerPerMI_ ? methodView : 0);
}

const CMPIBroker* Host::indicationBroker() const
{
    return broker_.cmpiView(brokerPerMI_ ? indicationView : 0);
}

IndicationInbox Host::listen(std::string nameSpace)
{
    return broker_.listen(std::move(nameSpace));
}

CMPIInstanceMI* Host::instanceMI()
{
    return instanceMI_;
}

CMPIMethodMI* Host::methodMI()
{
    return methodMI_;
}

CMPIIndicationMI* Host::indicationMI()
{
    return indicationMI_;
}

Outcome Host::enumerateInstanceNames(const ObjectPath& reference,
                                     const ResultHandlers* handlers)
{
    if (instanceMI_->ft->enumerateInstanceNames == nullptr)
    {
        return missingSlot("enumerateInstanceNames");
    }
    Broker::Request request(broker_);
    request.streamTo(handlers);
    const CMPIStatus status = instanceMI_->ft->enumerateInstanceNames(
        instanceMI_, request.context(), request.result(),
        broker_.makeObjectPath(reference));
    return request.finish(status);
}

Outcome Host::enumerateInstances(const ObjectPath& reference,
                                 const std::vector<std::string>* properties,
                                 const ResultHandlers* handlers)
{
    if (instanceMI_->ft->enumerateInstances == nullptr)
    {
        return missingSlot("enumerateInstances");
    }
    Broker::Request request(broker_);
    request.streamTo(handlers);
    PropertyList list(properties);
    const CMPIStatus status = instanceMI_->ft->enumerateInstances(
        instanceMI_, request.context(), request.result(),
        broker_.makeObjectPath(reference), list.get());
    return request.finish(status);
}

Outcome Host::getInstance(const ObjectPath& path,
                          const std::vector<std::string>* properties,
                          const ResultHandlers* handlers)
{
    if (instanceMI_->ft->getInstance == nullptr)
    {
        return missingSlot("getInstance");
    }
    Broker::Request request(broker_);
    request.streamTo(handlers);
    PropertyList list(properties);
    const CMPIStatus status = instanceMI_->ft->getInstance(
        instanceMI_, request.context(), request.result(),
        broker_.makeObjectPath(path), list.get());
    return request.finish(status);
}

Outcome Host::createInstance(const ObjectPath& path, const Instance& instance)
{
    if (instanceMI_->ft->createInstance == nullptr)
    {
        return missingSlot("createInstance");
    }
    Broker::Request request(broker_);
    const CMPIStatus status = instanceMI_->ft->createInstance(
        instanceMI_, request.context(), request.result(),
        broker_.makeObjectPath(path), broker_.makeInstance(instance));
    return request.finish(status);
}

Outcome Host::modifyInstance(const ObjectPath& path, const Instance& instance,
                             const std::vector<std::string>* properties)
{
    if (instanceMI_->ft->modifyInstance == nullptr)
    {
        return missingSlot("modifyInstance");
    }
    Broker::Request request(broker_);
    PropertyList list(properties);
    const CMPIStatus status = instanceMI_->ft->modifyInstance(
        instanceMI_, request.context(), request.result(),
        broker_.makeObjectPath(path), broker_.makeInstance(instance),
        list.get());
    return request.finish(status);
}

Outcome Host::deleteInstance(const ObjectPath& path)
{
    if (instanceMI_->ft->deleteInstance == nullptr)
    {
        return missingSlot("deleteInstance");
    }
    Broker::Request request(broker_);
    const CMPIStatus status = instanceMI_->ft->deleteInstance(
        instanceMI_, request.context(), request.result(),
        broker_.makeObjectPath(path));
    return request.finish(status);
}

Outcome Host::execQuery(const ObjectPath& path, const std::string& query,
                        const std::string& language)
{
    if (instanceMI_->ft->execQuery == nullptr)
    {
        return missingSlot("execQuery");
    }
    Broker::Request request(broker_);
    const CMPIStatus status = instanceMI_->ft->execQuery(
        instanceMI_, request.context(), request.result(),
        broker_.makeObjectPath(path), query.c_str(), language.c_str());
    return request.finish(status);
}

Outcome Host::invokeMethod(const ObjectPath& path, const std::string& method,
                           const NamedValues& in)
{
    if (methodMI_->ft->invokeMethod == nullptr)
    {
        return missingSlot("invokeMethod");
    }
    Broker::Request request(broker_);
    CMPIArgs* out = broker_.makeArgs();
    const CMPIStatus status = methodMI_->ft->invokeMethod(
        methodMI_, request.context(), request.result(),
        broker_.makeObjectPath(path), method.c_str(), broker_.makeArgs(in),
        out);
    Outcome outcome = request.finish(status);
    outcome.outArgs = Broker::toArgs(out);
    return outcome;
}

Outcome Host::authorizeFilter(const IndicationFilter& filter,
                              const std::string& owner)
{
    if (indicationMI_->ft->authorizeFilter == nullptr)
    {
        return missingSlot("authorizeFilter");
    }
    Broker::Request request(broker_);
    const CMPIStatus status = indicationMI_->ft->authorizeFilter(
        indicationMI_, request.context(),
        broker_.makeSelectExp(filter.query, filter.language),
        filter.className.c_str(), broker_.makeObjectPath(filter.classPath()),
        owner.c_str());
    return request.finish(status);
}

Outcome Host::mustPoll(const IndicationFilter& filter)
{
    if (indicationMI_->ft->mustPoll == nullptr)
    {
        return missingSlot("mustPoll");
    }
    Broker::Request request(broker_);
    const CMPIStatus status = indicationMI_->ft->mustPoll(
        indicationMI_, request.context(),
        broker_.makeSelectExp(filter.query, filter.language),
        filter.className.c_str(), broker_.makeObjectPath(filter.classPath()));
    return request.finish(status);
}

Outcome Host::activateFilter(const IndicationFilter& filter,
                             bool firstActivation, const ObjectPath* classPath)
{
    if (indicationMI_->ft->activateFilter == nullptr)
    {
        return missingSlot("activateFilter");
    }
    Broker::Request request(broker_);
    const CMPIStatus status = indicationMI_->ft->activateFilter(
        indicationMI_, request.context(),
        broker_.makeSelectExp(filter.query, filter.language),
        filter.className.c_str(),
        broker_.makeObjectPath(classPath ? *classPath : filter.classPath()),
        firstActivation ? 1 : 0);
    return request.finish(status);
}

Outcome Host::deActivateFilter(const IndicationFilter& filter,
                               bool lastActivation, const ObjectPath* classPath)
{
    if (indicationMI_->ft->deActivateFilter == nullptr)
    {
        return missingSlot("deActivateFilter");
    }
    Broker::Request request(broker_);
    const CMPIStatus status = indicationMI_->ft->deActivateFilter(
        indicationMI_, request.context(),
        broker_.makeSelectExp(filter.query, filter.language),
        filter.className.c_str(),
        broker_.makeObjectPath(classPath ? *classPath : filter.classPath()),
        lastActivation ? 1 : 0);
    return request.finish(status);
}

Outcome Host::enableIndications()
{
    if (indicationMI_->ft->enableIndications == nullptr)
    {
        return missingSlot("enableIndications");
    }
    Broker::Request request(broker_);
    Outcome out = request.finish(
        indicationMI_->ft->enableIndications(indicationMI_, request.context()));
    if (out.rc == CMPI_RC_OK)
    {
        indicationsEnabled_ = true;
    }
    return out;
}

Outcome Host::disableIndications()
{
    if (indicationMI_->ft->disableIndications == nullptr)
    {
        return missingSlot("disableIndications");
    }
    Broker::Request request(broker_);
    indicationsEnabled_ = false;
    return request.finish(indicationMI_->ft->disableIndications(
        indicationMI_, request.context()));
}

CMPIStatus Host::cleanupAll(bool terminating)
{
    CMPIStatus first{CMPI_RC_OK, nullptr};
    const auto keep = [&first](CMPIStatus s)
    {
        if (first.rc == CMPI_RC_OK && s.rc != CMPI_RC_OK)
        {
            first = s;
        }
    };
    const CMPIBoolean flag = terminating ? 1 : 0;
    {
        Broker::Request request(broker_);
        if (instanceMI_ && instanceMI_->ft->cleanup)
        {
            keep(
                instanceMI_->ft->cleanup(instanceMI_, request.context(), flag));
        }
        if (methodMI_ && methodMI_->ft->cleanup)
        {
            keep(methodMI_->ft->cleanup(methodMI_, request.context(), flag));
        }
        if (indicationMI_ && indicationMI_->ft->cleanup)
        {
            keep(indicationMI_->ft->cleanup(indicationMI_, request.context(),
                                            flag));
        }
        // The message string lives in the request: keep only its code.
        first.msg = nullptr;
    }
    terminated_ = terminated_ || terminating;
    return first;
}

} // namespace host
