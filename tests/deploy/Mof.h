#pragma once

// What the MOF reader makes of a MOF file: classes with their properties
// and methods, instances (registration MOFs) and qualifier declarations.
// Only the parts of the language that class and registration files use
// are represented; everything else is a parse error.

#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace mof
{

// A MOF file that cannot be read: the text is "<source>:<line>: <what>".
class MofError : public std::runtime_error
{
  public:
    using std::runtime_error::runtime_error;
};

// CIM names compare without regard to case.
bool sameName(std::string_view a, std::string_view b);

struct Value
{
    enum class Kind
    {
        Null,
        Boolean,
        Integer,
        Real,
        String,
        Char,
        Array,
    };

    Kind kind = Kind::Null;
    bool boolean = false;
    std::int64_t integer = 0; // Integer (also hexadecimal and binary forms)
    std::string text;         // String and Char (unescaped), Real (as written)
    std::vector<Value> elements; // Array

    bool isNull() const
    {
        return kind == Kind::Null;
    }
    // The strings of a string value or of an array of strings; throws
    // std::invalid_argument for anything else.
    std::vector<std::string> strings() const;
    // The integers of an integer value or of an array of integers; throws
    // std::invalid_argument for anything else.
    std::vector<std::int64_t> integers() const;
};

struct Qualifier
{
    std::string name;
    Value value; // a qualifier written without a value is boolean true
};

const Qualifier* findQualifier(const std::vector<Qualifier>& qualifiers,
                               std::string_view name);

// A property, method parameter or method return: the CIM data type in
// lower case ("uint16", "string", "datetime", ...), or "ref" with the
// referenced class for references.
struct Feature
{
    std::string name;
    std::string type;
    std::string referenceClass; // type "ref" only
    bool isArray = false;
    std::vector<Qualifier> qualifiers;
    std::optional<Value> defaultValue; // properties only
    int line = 0;

    const Qualifier* qualifier(std::string_view qualifierName) const
    {
        return findQualifier(qualifiers, qualifierName);
    }
    // A boolean qualifier such as Key or Indication: present
    // and not set to false.
    bool hasFlag(std::string_view qualifierName) const;
    // "uint16", "string[]", "ref CIM_Foo": for messages.
    std::string typeText() const;
};

struct Method
{
    std::string name;
    Feature returns; // name and qualifiers of the method itself
    std::vector<Feature> parameters;
};

struct Class
{
    std::string name;
    std::string superclass; // empty for a root class
    std::vector<Qualifier> qualifiers;
    std::vector<Feature> properties;
    std::vector<Method> methods;
    std::string source;
    int line = 0;

    const Qualifier* qualifier(std::string_view qualifierName) const
    {
        return findQualifier(qualifiers, qualifierName);
    }
    bool hasFlag(std::string_view qualifierName) const;
    const Feature* property(std::string_view propertyName) const;
    const Method* method(std::string_view methodName) const;
};

struct Instance
{
    std::string className;
    std::vector<std::pair<std::string, Value>> properties;
    std::string source;
    int line = 0;

    const Value* property(std::string_view propertyName) const;
};

struct QualifierDeclaration
{
    std::string name;
    Feature type; // data type and array-ness of the qualifier
    std::optional<Value> defaultValue;
    std::vector<std::string> scopes;
    std::vector<std::string> flavors;
};

struct Pragma
{
    std::string name;
    std::string value;
};

struct Document
{
    std::vector<Class> classes;
    std::vector<Instance> instances;
    std::vector<QualifierDeclaration> qualifiers;
    std::vector<Pragma> pragmas;
};

// Parses MOF text; @p source names it in error messages. Throws MofError.
Document parse(std::string_view text, const std::string& source);
// Reads and parses a file. Throws MofError (also when it cannot be read).
Document parseFile(const std::string& path);

} // namespace mof
