#include "ResultSpool.h"

#include "Printing.h"

namespace selprov
{

ResultSpool::ResultSpool(bool json) : json_(json)
{
    handlers_.instance = [this](const host::Instance& instance)
    { keep(json_ ? host::jsonInstance(instance) : host::formatMof(instance)); };
    handlers_.path = [this](const host::ObjectPath& path) {
        keep(json_ ? host::jsonString(path.toString())
                   : path.toString() + "\n");
    };
}

void ResultSpool::keep(std::string text)
{
    // A text built by appending may hold twice its length; thousands of
    // them are kept until the request ends.
    text.shrink_to_fit();
    texts_.push_back(std::move(text));
}

const host::ResultHandlers* ResultSpool::handlers() const
{
    return &handlers_;
}

void ResultSpool::printJsonArray(std::ostream& out) const
{
    out << "[";
    for (std::size_t i = 0; i < texts_.size(); ++i)
    {
        out << (i ? ",\n " : "") << texts_[i];
    }
    out << "]\n";
}

void ResultSpool::printInstances(std::ostream& out) const
{
    if (json_)
    {
        printJsonArray(out);
        return;
    }
    for (std::size_t i = 0; i < texts_.size(); ++i)
    {
        out << (i ? "\n" : "") << texts_[i];
    }
}

void ResultSpool::printPaths(std::ostream& out) const
{
    if (json_)
    {
        printJsonArray(out);
        return;
    }
    for (const std::string& text : texts_)
    {
        out << text;
    }
}

} // namespace selprov
