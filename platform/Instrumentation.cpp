#include "Instrumentation.h"

#include "Platform.h"
#include "SnapshotWalk.h"

#include <stdexcept>

namespace QX
{

Instrumentation::Instrumentation() : Instrumentation(Platform::currentSource())
{
}

Instrumentation::Instrumentation(
    std::shared_ptr<InstrumentationSource> source) :
    source_(std::move(source))
{
    if (!source_)
    {
        throw std::invalid_argument("instrumentation cursor without a source");
    }
    walk_ = source_->openWalk();
    if (!walk_)
    {
        throw std::runtime_error("instrumentation source opened no walk");
    }
}

Instrumentation::~Instrumentation() = default;

void Instrumentation::selectNode(NodeLexicon::NodeType kind)
{
    walk_->selectNode(kind);
}

void Instrumentation::selectNode(const std::string& path)
{
    walk_->selectNode(path);
}

Instrumentation::operator bool() const
{
    return walk_->valid();
}

Instrumentation& Instrumentation::operator++()
{
    walk_->next();
    return *this;
}

bool Instrumentation::setFilter(NodeLexicon::PathType type,
                                const std::string& path)
{
    return walk_->setFilter(type, path);
}

const std::string& Instrumentation::getPathToNode() const
{
    return walk_->getPathToNode();
}

std::string Instrumentation::getPathToParentNode() const
{
    return walk_->getPathToParentNode();
}

std::string Instrumentation::convertPathToString(const std::string& path) const
{
    return walk_->convertPathToString(path);
}

std::string Instrumentation::getNodeDescription() const
{
    return walk_->getNodeDescription();
}

unsigned Instrumentation::getNodeStatus() const
{
    return walk_->getNodeStatus();
}

bool Instrumentation::getProperty(NodeLexicon::Properties property,
                                  std::string& value)
{
    return readProperty(property, value);
}

bool Instrumentation::getProperty(NodeLexicon::Properties property,
                                  unsigned int& value)
{
    return readProperty(property, value);
}

bool Instrumentation::getProperty(NodeLexicon::Properties property, bool& value)
{
    return readProperty(property, value);
}

bool Instrumentation::setProperty(NodeLexicon::Properties property,
                                  unsigned int& value)
{
    return walk_->setProperty(property, value);
}

void Instrumentation::startMonitoring(NodeLexicon::NodeType kind,
                                      MonitorCallback callback,
                                      const void* context)
{
    walk_->changeMonitoring(true, kind, callback, context);
}

void Instrumentation::stopMonitoring(NodeLexicon::NodeType kind,
                                     MonitorCallback callback,
                                     const void* context)
{
    walk_->changeMonitoring(false, kind, callback, context);
}

template <typename T>
bool Instrumentation::readProperty(NodeLexicon::Properties property, T& value)
{
    const PropertyValue* stored = walk_->findProperty(property);
    if (stored == nullptr)
    {
        return false;
    }
    const T* typed = std::get_if<T>(stored);
    if (typed == nullptr)
    {
        return false;
    }
    value = *typed;
    return true;
}

} // namespace QX
