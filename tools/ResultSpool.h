// Results of one selprov request, formatted as the provider returns them.
#pragma once

#include "Outcome.h"

#include <ostream>
#include <string>
#include <vector>

namespace selprov
{

/**
 * Formats each instance or object path as it arrives (MOF-like text or
 * JSON) and keeps only its text, to be printed once the request has
 * succeeded. A large enumeration is thus never held as instances and as
 * text at the same time, and nothing is printed for a failed request.
 */
class ResultSpool
{
  public:
    explicit ResultSpool(bool json);
    ResultSpool(const ResultSpool&) = delete;
    ResultSpool& operator=(const ResultSpool&) = delete;

    // Handlers for the host's request; valid while the spool lives.
    const host::ResultHandlers* handlers() const;
    // Instances: separated by a blank line, or one JSON array.
    void printInstances(std::ostream& out) const;
    // Paths: one a line, or one JSON array.
    void printPaths(std::ostream& out) const;

  private:
    void keep(std::string text);
    void printJsonArray(std::ostream& out) const;

    bool json_;
    std::vector<std::string> texts_;
    host::ResultHandlers handlers_;
};

} // namespace selprov
