#include "PropertySelection.h"

#include <algorithm>

namespace QX::SELComposite
{

PropertySelection::PropertySelection(const char** properties, bool keysOnly) :
    all_(properties == nullptr && !keysOnly)
{
    if (properties != nullptr)
    {
        for (const char** name = properties; *name != nullptr; ++name)
        {
            requested_.emplace_back(*name);
        }
        std::sort(requested_.begin(), requested_.end());
    }
}

bool PropertySelection::wants(const char* name) const
{
    return all_ || std::binary_search(requested_.begin(), requested_.end(),
                                      std::string_view(name));
}

} // namespace QX::SELComposite
