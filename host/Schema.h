#pragma once

#include <cmpidt.h>

#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace host
{

// The key properties of a class, in the order the class declares them.
struct ClassKeys
{
    std::string className;
    std::vector<std::pair<std::string, CMPIType>> keys;

    bool isKey(std::string_view name) const;
};

// What the host knows of classes: like a CIMOM's class repository, reduced
// to the key names and types needed to build instance paths.
class Schema
{
  public:
    void add(ClassKeys keys); // replaces a class of the same name
    const ClassKeys* find(std::string_view className) const;

  private:
    std::vector<ClassKeys> classes_;
};

} // namespace host
