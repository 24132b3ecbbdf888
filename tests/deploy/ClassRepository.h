#pragma once

#include "Mof.h"

#include <string>
#include <string_view>
#include <vector>

namespace mof
{

// Classes from several MOF files, looked up as an object manager resolves
// them: by name without regard to case, with properties, methods, keys and
// class qualifiers inherited along the superclass chain.
class ClassRepository
{
  public:
    // Adds the classes of a document; a class defined twice, in the same or
    // another document, throws MofError.
    void add(const Document& document);

    const Class* find(std::string_view name) const;
    // The class and its superclasses, most derived first. Throws MofError
    // for an unknown class, a missing superclass or a cycle.
    std::vector<const Class*> chain(std::string_view name) const;
    // The most derived declaration of a property (or reference) in the
    // chain, and the class that declares it; nullptr when none does.
    const Feature* findProperty(std::string_view className,
                                std::string_view propertyName,
                                const Class** declaredIn = nullptr) const;
    const Method* findMethod(std::string_view className,
                             std::string_view methodName,
                             const Class** declaredIn = nullptr) const;
    // The names of the key properties, as the most derived declaration of
    // each writes them, in the order of the chain from the root class down.
    std::vector<std::string> keys(std::string_view className) const;
    // A class qualifier of the class or, inherited, of a superclass.
    bool hasInheritedFlag(std::string_view className,
                          std::string_view qualifier) const;

    const std::vector<Class>& classes() const
    {
        return classes_;
    }

  private:
    std::vector<Class> classes_;
};

} // namespace mof
