#pragma once

#include "Text.h"

#include <cmpidt.h>

#include <atomic>
#include <cstdint>
#include <initializer_list>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

namespace host
{

class Schema;
struct ObjectPath;

// A plain C++ copy of a CMPI value, independent of any request. Only the
// member of its kind is stored: instances hold many values, and the
// broker keeps every instance of a request until the request ends.
struct Value
{
    CMPIType type = CMPI_null; // CMPI_chars is stored as CMPI_string
    bool null = false;

    // Each reads its own kind and answers 0, "", {} or nullptr otherwise.
    std::uint64_t unsignedValue() const; // unsigned, char16, boolean (0/1)
    std::int64_t signedValue() const;
    double realValue() const;
    std::string_view text() const; // CMPI_string, CMPI_dateTime text
    const std::vector<Value>& elements() const; // arrays
    const std::shared_ptr<ObjectPath>& ref() const;

    void setUnsigned(std::uint64_t value)
    {
        payload_ = value;
    }
    void setSigned(std::int64_t value)
    {
        payload_ = value;
    }
    void setReal(double value)
    {
        payload_ = value;
    }
    void setText(Text value)
    {
        payload_ = std::move(value);
    }
    void setElements(std::vector<Value> elements)
    {
        payload_ = std::move(elements);
    }
    void setRef(std::shared_ptr<ObjectPath> path)
    {
        payload_ = std::move(path);
    }

    // MOF-like text: "\"text\"", "42", "TRUE", "{1, 2}", "NULL".
    std::string toString() const;
    bool isArray() const
    {
        return (type & CMPI_ARRAY) != 0;
    }
    bool operator==(const Value& other) const;

    static Value nullOf(CMPIType type);
    static Value boolean(bool value);
    static Value unsignedInt(CMPIType type, std::uint64_t value);
    static Value signedInt(CMPIType type, std::int64_t value);
    static Value real(CMPIType type, double value);
    static Value string(Text value);
    static Value dateTime(Text cimText);
    static Value reference(ObjectPath path);
    static Value array(CMPIType elementType, std::vector<Value> elements);

  private:
    std::variant<std::monostate, std::uint64_t, std::int64_t, double, Text,
                 std::vector<Value>, std::shared_ptr<ObjectPath>>
        payload_;
};

using NamedValues = std::vector<std::pair<Text, Value>>;

// Case-insensitive lookup in a list of named values; nullptr if absent.
const Value* findNamed(const NamedValues& values, std::string_view name);
// Replaces a value of the same name in place, or appends a new one.
void setNamed(NamedValues& values, Text name, Value value);

// A list of named values that copies share until one of them changes it.
// The instance a provider builds and every copy the broker takes of it (a
// returned result, a delivered indication, its object path) hold one list,
// so returning an instance or its path costs no copy of its properties or
// keys. Like a standard container,
// copies may be read from several threads at once; a list being changed
// must not be read or copied by another thread at the same time.
class SharedNamedValues
{
  public:
    SharedNamedValues() = default;
    SharedNamedValues(NamedValues values); // NOLINT: reads as the list
    SharedNamedValues(std::initializer_list<NamedValues::value_type> values) :
        SharedNamedValues(NamedValues(values))
    {
    }
    SharedNamedValues(const SharedNamedValues& other);
    SharedNamedValues(SharedNamedValues&& other) noexcept;
    SharedNamedValues& operator=(const SharedNamedValues& other);
    SharedNamedValues& operator=(SharedNamedValues&& other) noexcept;
    ~SharedNamedValues() = default;

    const NamedValues& list() const;
    // The list to change: first a private copy when a copy shares it.
    NamedValues& edit();

    std::size_t size() const
    {
        return list().size();
    }
    bool empty() const
    {
        return list().empty();
    }
    NamedValues::const_iterator begin() const
    {
        return list().begin();
    }
    NamedValues::const_iterator end() const
    {
        return list().end();
    }
    const NamedValues::value_type& operator[](std::size_t index) const
    {
        return list()[index];
    }
    bool operator==(const SharedNamedValues& other) const
    {
        return (list_ != nullptr && list_ == other.list_) ||
               list() == other.list();
    }

  private:
    std::shared_ptr<NamedValues> list_;
    // Set on both sides when a copy is taken; the side that edits next
    // makes its own list. A flag rather than use_count(): a count read
    // carries no ordering with the reads of a copy that was just released.
    mutable std::atomic<bool> shared_{false};
};

struct ObjectPath
{
    Text nameSpace;
    Text className;
    Text host;
    SharedNamedValues keys; // in insertion order

    const Value* key(std::string_view name) const;
    void setKey(Text name, Value value);
    // WBEM text: [//host/]ns:Class.K1="v1",K2=7 with keys sorted by name.
    std::string toString() const;
    // Throws std::invalid_argument on malformed text. With a schema, keys
    // of the class take the schema's types.
    static ObjectPath parse(std::string_view text,
                            const Schema* schema = nullptr);
    bool operator==(const ObjectPath& other) const;
};

struct Instance
{
    ObjectPath path;              // as the broker's getObjectPath returns it
    SharedNamedValues properties; // in the order first set
    const Value* property(std::string_view name) const;
    void setProperty(Text name, Value value);
    std::vector<std::string> propertyNames() const;
};

struct TraceRecord
{
    int level = 0;
    std::string component;
    std::string text;
    std::optional<std::string> string;
};

struct LogRecord
{
    int severity = 0;
    std::string id;
    std::string text;
    std::optional<std::string> string;
};

struct DeliveredIndication
{
    std::string nameSpace;
    Instance instance;
    // The broker pointer the provider delivered through.
    const void* broker = nullptr;
};

// The name of a CMPI type code, e.g. "CMPI_uint16A"; "unknown" otherwise.
std::string typeName(CMPIType type);
// CMPI_chars -> CMPI_string, CMPI_charsA -> CMPI_stringA, others unchanged.
CMPIType storedType(CMPIType type);

} // namespace host
