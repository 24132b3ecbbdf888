#include "PropertySelection.h"

namespace QX::SELComposite
{

PropertySelection::PropertySelection(const char** properties, bool keysOnly) :
    all_(properties == nullptr && !keysOnly)
{
    if (properties != nullptr)
    {
        for (const char** name = properties; *name != nullptr; ++name)
        {
            requested_.insert(*name);
        }
    }
}

bool PropertySelection::wants(const char* name) const
{
    return all_ || requested_.count(name) != 0;
}

} // namespace QX::SELComposite
