// The broker's CMPI objects, the values in them, and who owns them.
#pragma once

#include "EmbeddedBroker.h"

#include <Names.h>

#include <algorithm>
#include <cxxabi.h>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace oxahv {

using Core = EmbeddedBroker::Impl;

// What an operation of a slot throws; the slot reports it as a status.
struct Failure {
    CMPIrc code;
};

// In a handler of everything: a thread that ends unwinds its stack by what is no C++ exception and must go
// on.
inline void passOnTheEndOfAThread() {
    if (abi::__cxa_current_exception_type() == nullptr) {
        throw;
    }
}

using encoding::foldedName;
using encoding::sameName;

enum class Kind {
    instance,
    objectPath,
    arguments,
    string,
    array,
    dateTime,
    enumeration,
    context,
    result,
    other
};
constexpr std::size_t kindCount = 10;

class Owner;

// What all objects of the broker have in common.
class Object {
public:
    Object(Core& core, Kind kind);
    virtual ~Object();
    Object(const Object&) = delete;
    Object& operator=(const Object&) = delete;

    Core& core() const { return core_; }
    Kind kind() const { return kind_; }
    // The owner that frees this object; null while it is part of another object.
    Owner* owner() const { return owner_; }
    virtual std::unique_ptr<Object> clone() const = 0;
    // The CMPI record, as a handle of any kind.
    virtual void* record() = 0;

private:
    friend class Owner;
    Core& core_;
    Kind kind_;
    Owner* owner_ = nullptr;
    Object* newer_ = nullptr; // the owner's list
    Object* older_ = nullptr;
};

// Frees its objects when it dies: a request's, an attached thread's, or the broker's.
class Owner {
public:
    explicit Owner(Core& core) : core_(core) {}
    ~Owner();
    Owner(const Owner&) = delete;
    Owner& operator=(const Owner&) = delete;

    Core& core() const { return core_; }
    void adopt(std::unique_ptr<Object> object);
    std::unique_ptr<Object> release(Object& object);
    // Frees what was adopted after `mark`, and `mark` itself.
    void freeSince(const Object& mark);

    // The innermost owner of the calling thread, the broker itself when it has none.
    static Owner& current(Core& core);

    // Makes an owner the innermost one of the thread while it lives.
    class Scope {
    public:
        explicit Scope(Owner& owner) : owner_(owner) { owner_.enter(); }
        ~Scope() { owner_.leave(); }
        Scope(const Scope&) = delete;
        Scope& operator=(const Scope&) = delete;

    private:
        Owner& owner_;
    };

private:
    // The owners of a thread, innermost first.
    void enter();
    void leave();
    void unlink(Object& object);

    Core& core_;
    std::mutex mutex_;
    Object* newest_ = nullptr;
    Owner* outer_ = nullptr;
};

// The member of a value that its type says, and no byte more: the caller may have no whole value. Of a
// `CMPI_chars` the pointer itself.
CMPIValue memberOf(const CMPIValue* value, CMPIType type);

// The type under which values of a type are stored: texts are CMPI_string, their arrays CMPI_stringA.
CMPIType storedType(CMPIType type);

// A CMPI value that owns its text or object.
class Value {
public:
    Value() = default;
    Value(const Value& other) { *this = other; }
    Value(Value&&) noexcept = default;
    Value& operator=(const Value& other);
    Value& operator=(Value&&) noexcept = default;
    ~Value() = default;

    // A NULL of a type.
    static Value null(CMPIType type);
    // A copy of what the caller of a slot passed: `value` may be null, and of `CMPI_chars` is the text
    // itself.
    static Value from(Core& core, const CMPIValue* value, CMPIType type);
    static Value number(const CMPIValue& value, CMPIType type);
    static Value text(Core& core, std::string text, CMPIType type = CMPI_string);

    CMPIType type() const { return type_; }
    bool isNull() const { return isNull_; }
    // What a slot hands out. Texts and objects in it stay this value's.
    CMPIData data(CMPIValueState state = CMPI_goodValue) const;
    // A text as `CMPI_chars`, or as `CMPI_string` again.
    void retype(CMPIType type) { type_ = type; }
    // A key, which may have come as the KeyMode has it, as a property of a type: a text as `CMPI_string`, an
    // integer of the widest type as the narrower one where it fits.
    Value asProperty(CMPIType declared) const;

private:
    CMPIType type_ = CMPI_null;
    bool isNull_ = true;
    CMPIValue plain_ = {};
    std::unique_ptr<Object> object_;
};

struct NamedValue {
    std::string name;
    Value value;
};

// Keys, properties, arguments, context entries: values by name, in the order in which the names came.
class NamedValues {
public:
    const NamedValue* find(std::string_view name) const;
    void set(std::string_view name, Value value);
    std::size_t size() const { return values_.size(); }
    // Throws CMPI_RC_ERR_NOT_FOUND for an index out of range.
    const NamedValue& at(std::size_t index) const;
    // Removes the others. `isKept` takes a name.
    template <class Predicate>
    void keepOnly(const Predicate& isKept) {
        const auto end = std::remove_if(values_.begin(), values_.end(),
                                        [&](const NamedValue& named) { return !isKept(named.name); });
        values_.erase(end, values_.end());
    }
    auto begin() const { return values_.begin(); }
    auto end() const { return values_.end(); }
    auto begin() { return values_.begin(); }
    auto end() { return values_.end(); }

private:
    std::vector<NamedValue> values_;
};

// An object with its CMPI record. The address of the table tells the kind of a handle.
template <class Record, Kind objectKind, class Derived>
class RecordedObject : public Object, public Record {
public:
    explicit RecordedObject(Core& core)
        : Object(core, objectKind), Record{static_cast<Object*>(this), &Derived::table} {}
    void* record() override { return static_cast<Record*>(this); }

    // The object of a handle; null for a null handle and for one of another kind.
    static Derived* of(const Record* handle) {
        return handle != nullptr && handle->ft == &Derived::table
                   ? static_cast<Derived*>(const_cast<Record*>(handle))
                   : nullptr;
    }
};

class String : public RecordedObject<CMPIString, Kind::string, String> {
public:
    static const CMPIStringFT table;

    String(Core& core, std::string chars) : RecordedObject(core), text(std::move(chars)) {}
    std::unique_ptr<Object> clone() const override { return std::make_unique<String>(core(), text); }

    std::string text;
};

class Array : public RecordedObject<CMPIArray, Kind::array, Array> {
public:
    static const CMPIArrayFT table;

    Array(Core& core, CMPIType type, std::size_t size);
    std::unique_ptr<Object> clone() const override;
    // The type of a value that holds this array.
    CMPIType type() const { return static_cast<CMPIType>(elementType | CMPI_ARRAY); }

    CMPIType elementType;
    std::vector<Value> elements;
};

class DateTime : public RecordedObject<CMPIDateTime, Kind::dateTime, DateTime> {
public:
    static const CMPIDateTimeFT table;

    DateTime(Core& core, std::string chars) : RecordedObject(core), text(std::move(chars)) {}
    std::unique_ptr<Object> clone() const override { return std::make_unique<DateTime>(core(), text); }

    std::string text; // a CIM date/time text, always a valid one
};

class Arguments : public RecordedObject<CMPIArgs, Kind::arguments, Arguments> {
public:
    static const CMPIArgsFT table;

    explicit Arguments(Core& core) : RecordedObject(core) {}
    std::unique_ptr<Object> clone() const override;

    NamedValues values;
};

class Context : public RecordedObject<CMPIContext, Kind::context, Context> {
public:
    static const CMPIContextFT table;

    explicit Context(Core& core) : RecordedObject(core) {}
    std::unique_ptr<Object> clone() const override;

    NamedValues values;
    // Who wants to know of the results of the request that begins next; null for nobody. Upcalls, which come
    // under the same context, find it taken.
    const std::function<void(std::size_t)>* progress = nullptr;
};

class Enumeration : public RecordedObject<CMPIEnumeration, Kind::enumeration, Enumeration> {
public:
    static const CMPIEnumerationFT table;

    Enumeration(Core& core, CMPIType type) : RecordedObject(core), elementType(type) {}
    std::unique_ptr<Object> clone() const override;

    CMPIType elementType;
    std::vector<Value> elements;
    std::size_t next = 0;
};

class ObjectPath : public RecordedObject<CMPIObjectPath, Kind::objectPath, ObjectPath> {
public:
    static const CMPIObjectPathFT table;

    ObjectPath(Core& core, std::string ns, std::string cn)
        : RecordedObject(core), nameSpace(std::move(ns)), className(std::move(cn)) {}
    std::unique_ptr<Object> clone() const override { return copy(); }
    std::unique_ptr<ObjectPath> copy() const;

    std::string nameSpace;
    std::string hostName;
    std::string className;
    NamedValues keys;
};

class Instance : public RecordedObject<CMPIInstance, Kind::instance, Instance> {
public:
    static const CMPIInstanceFT table;

    Instance(Core& core, std::unique_ptr<ObjectPath> itsPath)
        : RecordedObject(core), path(std::move(itsPath)) {}
    std::unique_ptr<Object> clone() const override;
    // Sets the properties that are a path's keys, with their declared types.
    void setKeysOf(const ObjectPath& source);

    std::unique_ptr<ObjectPath> path;
    NamedValues properties;
    bool isFiltered = false;
    std::vector<std::string> filter; // the names that a property filter lets through
};

// Collects what a provider returns.
class Result : public RecordedObject<CMPIResult, Kind::result, Result> {
public:
    static const CMPIResultFT table;

    Result(Core& core, Owner& itsKeeper) : RecordedObject(core), keeper(itsKeeper) {}
    std::unique_ptr<Object> clone() const override { throw Failure{CMPI_RC_ERR_NOT_SUPPORTED}; }

    // Says that one more has come.
    void tellProgress() const {
        if (progress != nullptr && *progress) {
            (*progress)(reply.instances.size() + reply.objectPaths.size());
        }
    }

    // Owns what is returned: the provider may return it on a thread whose own objects die before the request.
    Owner& keeper;
    Reply reply;
    const std::function<void(std::size_t)>* progress = nullptr;
};

class PropertyList : public RecordedObject<CMPIPropertyList, Kind::other, PropertyList> {
public:
    static const CMPIPropertyListFT table;

    PropertyList(Core& core, std::vector<std::string> list);
    std::unique_ptr<Object> clone() const override { return std::make_unique<PropertyList>(core(), names); }

    std::vector<std::string> names;
    std::vector<const char*> pointers; // to the names, and a null at the end
};

class Error : public RecordedObject<CMPIError, Kind::other, Error> {
public:
    static const CMPIErrorFT table;

    explicit Error(Core& core) : RecordedObject(core) {}
    std::unique_ptr<Object> clone() const override;

    // What the setters and getters of CMPIErrorFT name.
    CMPIErrorType type = UnknownErrorType;
    CMPIErrorSeverity severity = ErrorSevUnknown;
    CMPIErrorProbableCause probableCause = ErrorProbCauseUnknown;
    CMPIErrorSrcFormat sourceFormat = CMPIErrSrcUnknown;
    CMPIrc statusCode = CMPI_RC_OK;
    std::string otherType;
    std::string owningEntity;
    std::string messageId;
    std::string message;
    std::string probableCauseDescription;
    std::string source;
    std::string otherSourceFormat;
    std::string statusCodeDescription;
    Value recommendedActions;
    Value messageArguments;
};

// What a CMPIGcStat is here: a record like the others, so that it is told from them.
struct MarkRecord {
    void* hdl;
    const char* ft;
};

// A position in an owner's list of objects, for CMPIBrokerMemFT.
class Mark : public RecordedObject<MarkRecord, Kind::other, Mark> {
public:
    static constexpr char table = 0;

    explicit Mark(Core& core) : RecordedObject(core) {}
    std::unique_ptr<Object> clone() const override { throw Failure{CMPI_RC_ERR_NOT_SUPPORTED}; }
};

// The object of a handle of any kind; null for what is none.
Object* objectOf(const void* handle);

// Gives a new object to the current owner of the thread and hands out its record.
template <class Class>
auto handOut(std::unique_ptr<Class> object) {
    Class& given = *object;
    Owner::current(given.core()).adopt(std::move(object));
    return &given;
}

// A value that belongs to an array of one, which the current owner has.
CMPIData keep(Core& core, Value value);

} // namespace oxahv
