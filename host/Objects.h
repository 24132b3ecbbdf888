// The broker's encapsulated CMPI objects. Each one embeds the {hdl, ft}
// struct handed to providers; hdl points back at the object.
#pragma once

#include "Outcome.h"
#include "Values.h"

#include <cmpift.h>

#include <algorithm>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

namespace host::detail
{

struct BrokerState;

extern CMPIStringFT stringFT;
extern CMPIArrayFT arrayFT;
extern CMPIDateTimeFT dateTimeFT;
extern CMPIObjectPathFT objectPathFT;
extern CMPIInstanceFT instanceFT;
extern CMPIResultFT resultFT;
extern CMPIContextFT contextFT;
extern CMPIArgsFT argsFT;
extern CMPISelectExpFT selectExpFT;

enum class Ownership
{
    Scoped,   // freed with its request (or with the broker)
    Clone,    // made by clone(): freed by release() or with the broker
    Prepared, // a prepareAttachThread context: likewise
};

struct Object
{
    explicit Object(BrokerState& state) : broker(&state) {}
    virtual ~Object() = default;
    Object(const Object&) = delete;
    Object& operator=(const Object&) = delete;

    BrokerState* broker;
    Ownership ownership = Ownership::Scoped;
};

// Binds the embedded CMPI struct to its object and function table. Each
// object also has copyFrom(other), which copies its own state for clone().
template <typename C, typename FT, FT* table>
struct Encapsulated : Object
{
    explicit Encapsulated(BrokerState& state) : Object(state)
    {
        cmpi.hdl = this;
        cmpi.ft = table;
    }
    C cmpi{};

    // The object behind a CMPI pointer: nullptr for NULL, a NULL handle or
    // a foreign function table.
    template <typename Self>
    static Self* from(const C* c)
    {
        if (c == nullptr || c->ft != table || c->hdl == nullptr)
        {
            return nullptr;
        }
        return static_cast<Self*>(static_cast<Encapsulated*>(c->hdl));
    }
};

struct StringObject : Encapsulated<CMPIString, CMPIStringFT, &stringFT>
{
    using Encapsulated::Encapsulated;
    static StringObject* of(const CMPIString* s)
    {
        return from<StringObject>(s);
    }
    std::optional<std::string> text;

    void copyFrom(const StringObject& other);
};

struct ArrayObject : Encapsulated<CMPIArray, CMPIArrayFT, &arrayFT>
{
    using Encapsulated::Encapsulated;
    static ArrayObject* of(const CMPIArray* a)
    {
        return from<ArrayObject>(a);
    }
    CMPIType elementType = CMPI_null; // never CMPI_chars
    std::vector<Value> elements;

    void copyFrom(const ArrayObject& other);
};

struct DateTimeObject : Encapsulated<CMPIDateTime, CMPIDateTimeFT, &dateTimeFT>
{
    using Encapsulated::Encapsulated;
    static DateTimeObject* of(const CMPIDateTime* d)
    {
        return from<DateTimeObject>(d);
    }
    Text text; // CIM datetime text

    void copyFrom(const DateTimeObject& other);
};

struct ObjectPathObject :
    Encapsulated<CMPIObjectPath, CMPIObjectPathFT, &objectPathFT>
{
    using Encapsulated::Encapsulated;
    static ObjectPathObject* of(const CMPIObjectPath* p)
    {
        return from<ObjectPathObject>(p);
    }
    ObjectPath path;

    void copyFrom(const ObjectPathObject& other);
};

struct InstanceObject : Encapsulated<CMPIInstance, CMPIInstanceFT, &instanceFT>
{
    using Encapsulated::Encapsulated;
    static InstanceObject* of(const CMPIInstance* i)
    {
        return from<InstanceObject>(i);
    }
    ObjectPath path; // as given to newInstance / setObjectPath
    SharedNamedValues properties;
    std::optional<std::vector<std::string>> filter; // NULL list: no filter
    std::vector<std::string> filterKeys;

    bool accepts(std::string_view name) const;
    // The path a CIMOM with a class repository reports: the path's keys plus
    // the key properties set on the instance, in the class's key order.
    ObjectPath effectivePath() const;
    Instance snapshot() const;
    void copyFrom(const InstanceObject& other);
};

struct ResultObject : Encapsulated<CMPIResult, CMPIResultFT, &resultFT>
{
    using Encapsulated::Encapsulated;
    static ResultObject* of(const CMPIResult* r)
    {
        return from<ResultObject>(r);
    }
    Outcome* outcome = nullptr;
    const ResultHandlers* handlers = nullptr; // guarded by mutex
    std::mutex mutex;
};

struct ContextObject : Encapsulated<CMPIContext, CMPIContextFT, &contextFT>
{
    explicit ContextObject(BrokerState& state);
    ~ContextObject() override;
    static ContextObject* of(const CMPIContext* c)
    {
        return from<ContextObject>(c);
    }
    NamedValues entries; // names compare exactly

    void copyFrom(const ContextObject& other);
};

struct ArgsObject : Encapsulated<CMPIArgs, CMPIArgsFT, &argsFT>
{
    using Encapsulated::Encapsulated;
    static ArgsObject* of(const CMPIArgs* a)
    {
        return from<ArgsObject>(a);
    }
    NamedValues args;

    void copyFrom(const ArgsObject& other);
};

// The filter an object manager hands to an indication MI: the query and
// its language, as a subscription's filter instance holds them.
struct SelectExpObject :
    Encapsulated<CMPISelectExp, CMPISelectExpFT, &selectExpFT>
{
    using Encapsulated::Encapsulated;
    static SelectExpObject* of(const CMPISelectExp* e)
    {
        return from<SelectExpObject>(e);
    }
    std::string query;
    std::string language;

    void copyFrom(const SelectExpObject& other);
};

// Owns the broker objects made in one scope (a request, a thread attached
// to a context, or the broker itself) until it is cleared or destroyed.
// Thread-safe.
class OwnedObjects
{
  public:
    OwnedObjects() = default;
    ~OwnedObjects();
    OwnedObjects(const OwnedObjects&) = delete;
    OwnedObjects& operator=(const OwnedObjects&) = delete;

    template <typename T>
    T* make(BrokerState& state)
    {
        auto object = std::make_unique<T>(state);
        T* made = object.get();
        const std::lock_guard lock(mutex_);
        objects_.push_back(std::move(object));
        return made;
    }
    std::size_t size() const;
    // Ends the life of every object, newest first.
    void clear();

  private:
    mutable std::mutex mutex_;
    std::vector<std::unique_ptr<Object>> objects_;
};

inline CMPIStatus okStatus()
{
    return {CMPI_RC_OK, nullptr};
}

inline CMPIStatus errorStatus(CMPIrc rc)
{
    return {rc, nullptr};
}

inline void setStatus(CMPIStatus* status, CMPIrc rc)
{
    if (status != nullptr)
    {
        status->rc = rc;
        status->msg = nullptr;
    }
}

inline CMPIData nullData()
{
    CMPIData d{};
    d.type = CMPI_null;
    d.state = CMPI_nullValue;
    return d;
}

} // namespace host::detail
