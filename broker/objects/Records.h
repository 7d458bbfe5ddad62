// The broker's objects with their CMPI records: instances, object paths, strings, arrays and the rest. Each
// class has one function table, which tables/ fills; the address of that table in a record tells the class of
// a handle.
#pragma once

#include "objects/NamedValues.h"

#include <atomic>
#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace oxahv {

struct DeclaredClass;

// An object with its CMPI record. The address of the table tells the kind of a handle.
template <class Record, Kind objectKind, class Derived>
class RecordedObject : public Object, public Record {
public:
    explicit RecordedObject(Core& core)
        : Object(core, objectKind), Record{static_cast<Object*>(this), &Derived::table} {}
    void* record() override { return static_cast<Record*>(this); }
    std::size_t size() const override { return sizeof(Derived); }

    // The object of a handle; null for a null handle, for one of another kind, and for one of an object that
    // has died.
    static Derived* of(const Record* handle) {
        if (handle == nullptr || handle->ft != &Derived::table) {
            return nullptr;
        }
        auto* const object = static_cast<Derived*>(const_cast<Record*>(handle));
        if (handle->hdl != static_cast<Object*>(object)) {
            return nullptr;
        }
        object->touch();
        return object;
    }
};

struct DeclaredClass;

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

// Who gets the results of a request while it runs. Empty functions get none.
struct Receiver {
    std::function<void(std::size_t)> progress; // their number
    InstanceHandler instances;
    PathHandler paths;
};

class Context : public RecordedObject<CMPIContext, Kind::context, Context> {
public:
    static const CMPIContextFT table;

    explicit Context(Core& core) : RecordedObject(core) {}
    std::unique_ptr<Object> clone() const override;

    NamedValues values;
    // Who wants to have the results of the request that begins next; null for nobody. Upcalls, which come
    // under the same context, find it taken.
    const Receiver* receiver = nullptr;
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
    // Gives keys that came as the KeyMode has them their declared types.
    void declareKeys();

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
    // Names it anew. The keys become properties, unless new instances are bare.
    void setPath(std::unique_ptr<ObjectPath> newPath);
    // From now on it has its keys and the properties of these names alone.
    void setFilter(std::vector<std::string> names);
    bool isKey(const DeclaredClass* declared, std::string_view name) const;
    bool passesFilter(const DeclaredClass* declared, std::string_view name) const;

    // The declaration of its class; null where there is none.
    const DeclaredClass* declaredClass() const;

    std::unique_ptr<ObjectPath> path;
    NamedValues properties;
    bool isFiltered = false;
    std::vector<std::string> filter; // the names that a property filter lets through

private:
    mutable std::atomic<const DeclaredClass*> declared_{nullptr}; // once it has been looked for
};

// Collects what a provider returns, or hands it on at once.
class Result : public RecordedObject<CMPIResult, Kind::result, Result> {
public:
    static const CMPIResultFT table;

    Result(Core& core, Owner& itsKeeper) : RecordedObject(core), keeper(itsKeeper) {}
    std::unique_ptr<Object> clone() const override { throw Failure{CMPI_RC_ERR_NOT_SUPPORTED}; }

    void add(const Instance& instance);
    void add(const ObjectPath& path);

    // Owns what is returned: the provider may return it on a thread whose own objects die before the request.
    Owner& keeper;
    Reply reply;
    const Receiver* receiver = nullptr;
    std::size_t earlier = 0; // results of providers that were asked before
    std::size_t count = 0;   // of instances and object paths

private:
    template <class Class, class Handle>
    void add(Exposed<Class> copy, std::vector<Handle*>& kept,
             const std::function<void(const Handle*)>* handler);
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

// Whether a handle is a record of an object, living or dead.
bool isRecord(const void* handle);
// The object of a handle of any kind; null for what is none, and for one that has died.
Object* objectOf(const void* handle);

// Throws CMPI_RC_ERR_INVALID_PARAMETER where objects nest so deep that what copies them, on the stack, might
// not return.
void requireShallow(const Object& object);

// A value that belongs to an array of one, which the current owner has.
CMPIData keep(Core& core, Value value);

} // namespace oxahv
