#pragma once

#include <set>
#include <string>

namespace QX::SELComposite
{

/**
 * @brief Which conditional properties a request wants.
 *
 * All of them when the request gave no property list and did not ask for
 * keys only; otherwise exactly the listed names, compared byte for byte.
 */
class PropertySelection
{
  public:
    PropertySelection(const char** properties, bool keysOnly);

    bool wants(const char* name) const;

  private:
    std::set<std::string> requested_;
    bool all_;
};

} // namespace QX::SELComposite
