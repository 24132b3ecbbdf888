#pragma once

#include "NodeTree.h"

#include <istream>
#include <memory>
#include <stdexcept>
#include <string>

namespace QX
{

/** A fixture text that cannot be read; what() names the line. */
class FixtureError : public std::runtime_error
{
  public:
    using std::runtime_error::runtime_error;
};

/**
 * @brief Reads an instrumentation tree from the fixture text format.
 *
 * The format is documented in docs/fixture-format.md. Throws
 * FixtureError with the source name and line number on any error.
 */
std::shared_ptr<const NodeTree> parseFixture(std::istream& in,
                                             const std::string& sourceName);
std::shared_ptr<const NodeTree> loadFixtureFile(const std::string& path);

/** The sample SEL that ships with the platform, compiled in. */
const char* builtinSampleFixture();

} // namespace QX
