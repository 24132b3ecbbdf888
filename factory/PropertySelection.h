#pragma once

#include <string_view>
#include <vector>

namespace QX::SELComposite
{

/**
 * @brief Which conditional properties a request wants.
 *
 * All of them when the request gave no property list and did not ask for
 * keys only; otherwise exactly the listed names, compared byte for byte.
 * The names are not copied: the request's list must outlive the selection.
 */
class PropertySelection
{
  public:
    PropertySelection(const char** properties, bool keysOnly);

    bool wants(const char* name) const;

  private:
    std::vector<std::string_view> requested_; // sorted
    bool all_;
};

} // namespace QX::SELComposite
