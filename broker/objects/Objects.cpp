#include "objects/Objects.h"

#include "Core.h"

#include <algorithm>
#include <iterator>

namespace oxahv {

namespace {

thread_local Owner* currentOwner = nullptr;

// A copy of the object in a value, null when there is none.
std::unique_ptr<Object> objectIn(const void* handle) {
    if (handle == nullptr) {
        return nullptr;
    }
    const Object* const object = objectOf(handle);
    if (object == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    return object->clone();
}

// The object kind that a type's handles have.
Kind kindOf(CMPIType type) {
    if ((type & CMPI_ARRAY) != 0) {
        return Kind::array;
    }
    switch (type) {
    case CMPI_instance:
        return Kind::instance;
    case CMPI_ref:
        return Kind::objectPath;
    case CMPI_args:
        return Kind::arguments;
    case CMPI_enumeration:
        return Kind::enumeration;
    case CMPI_string:
        return Kind::string;
    case CMPI_dateTime:
        return Kind::dateTime;
    default:
        return Kind::other;
    }
}

// Copies the one member that holds a plain value: the caller may have no more than that.
bool copyPlain(CMPIValue& to, const CMPIValue& from, CMPIType type) {
    switch (type) {
    case CMPI_boolean:
        to.boolean = from.boolean;
        return true;
    case CMPI_uint8:
    case CMPI_sint8:
        to.uint8 = from.uint8;
        return true;
    case CMPI_char16:
    case CMPI_uint16:
    case CMPI_sint16:
        to.uint16 = from.uint16;
        return true;
    case CMPI_uint32:
    case CMPI_sint32:
        to.uint32 = from.uint32;
        return true;
    case CMPI_real32:
        to.real32 = from.real32;
        return true;
    case CMPI_uint64:
    case CMPI_sint64:
        to.uint64 = from.uint64;
        return true;
    case CMPI_real64:
        to.real64 = from.real64;
        return true;
    default:
        return false;
    }
}

} // namespace

Object* objectOf(const void* handle) {
    // Every record begins with a handle and a table, and the address of the table tells the kind.
    struct Record {
        void* object;
        const void* table;
    };
    static const void* const tables[] = {&String::table,       &Array::table,    &DateTime::table,
                                         &Arguments::table,    &Context::table,  &Enumeration::table,
                                         &ObjectPath::table,   &Instance::table, &Result::table,
                                         &PropertyList::table, &Error::table};
    if (handle == nullptr) {
        return nullptr;
    }
    const auto* const record = static_cast<const Record*>(handle);
    const bool isOurs = std::find(std::begin(tables), std::end(tables), record->table) != std::end(tables);
    return isOurs ? static_cast<Object*>(record->object) : nullptr;
}

Object::Object(Core& core, Kind kind) : core_(core), kind_(kind) {
    core.countObject(kind, 1);
}

Object::~Object() {
    core_.countObject(kind_, -1);
}

Owner::~Owner() {
    while (newest_ != nullptr) {
        release(*newest_);
    }
}

void Owner::adopt(std::unique_ptr<Object> object) {
    const std::lock_guard<std::mutex> lock(mutex_);
    Object* const given = object.release();
    given->owner_ = this;
    given->older_ = newest_;
    if (newest_ != nullptr) {
        newest_->newer_ = given;
    }
    newest_ = given;
}

void Owner::unlink(Object& object) {
    (object.newer_ != nullptr ? object.newer_->older_ : newest_) = object.older_;
    if (object.older_ != nullptr) {
        object.older_->newer_ = object.newer_;
    }
    object.owner_ = nullptr;
    object.newer_ = nullptr;
    object.older_ = nullptr;
}

std::unique_ptr<Object> Owner::release(Object& object) {
    const std::lock_guard<std::mutex> lock(mutex_);
    unlink(object);
    return std::unique_ptr<Object>(&object);
}

void Owner::freeSince(const Object& mark) {
    Owner doomed(core_); // frees outside the lock
    const std::lock_guard<std::mutex> lock(mutex_);
    for (bool reached = false; !reached && newest_ != nullptr;) {
        Object& object = *newest_;
        reached = &object == &mark;
        unlink(object);
        doomed.adopt(std::unique_ptr<Object>(&object));
    }
}

void Owner::enter() {
    outer_ = currentOwner;
    currentOwner = this;
}

void Owner::leave() {
    for (Owner** link = &currentOwner; *link != nullptr; link = &(*link)->outer_) {
        if (*link == this) {
            *link = outer_;
            return;
        }
    }
}

Owner& Owner::current(Core& core) {
    for (Owner* owner = currentOwner; owner != nullptr; owner = owner->outer_) {
        if (&owner->core_ == &core) {
            return *owner;
        }
    }
    return core.owner;
}

CMPIValue memberOf(const CMPIValue* value, CMPIType type) {
    CMPIValue result = {};
    if (value == nullptr || type == CMPI_null || copyPlain(result, *value, type)) {
        return result;
    }
    if (type == CMPI_chars) {
        result.chars = reinterpret_cast<char*>(const_cast<CMPIValue*>(value));
    } else if (type == CMPI_ptr || type == CMPI_charsptr) {
        result.dataPtr = value->dataPtr;
    } else {
        result.string = value->string; // all handles stand in the same place
    }
    return result;
}

Value& Value::operator=(const Value& other) {
    if (this != &other) {
        object_ = other.object_ != nullptr ? other.object_->clone() : nullptr;
        type_ = other.type_;
        isNull_ = other.isNull_;
        plain_ = other.plain_;
    }
    return *this;
}

CMPIType storedType(CMPIType type) {
    const auto element = static_cast<CMPIType>(type & ~CMPI_ARRAY);
    const bool isText = element == CMPI_chars || element == CMPI_charsptr;
    return isText ? static_cast<CMPIType>(CMPI_string | (type & CMPI_ARRAY)) : type;
}

Value Value::null(CMPIType type) {
    Value result;
    result.type_ = storedType(type);
    return result;
}

Value Value::number(const CMPIValue& value, CMPIType type) {
    Value result;
    result.type_ = type;
    result.isNull_ = false;
    result.plain_ = value;
    return result;
}

Value Value::text(Core& core, std::string text, CMPIType type) {
    Value result;
    result.type_ = type;
    result.isNull_ = false;
    result.object_ = std::make_unique<String>(core, std::move(text));
    return result;
}

Value Value::from(Core& core, const CMPIValue* value, CMPIType type) {
    if (value == nullptr || type == CMPI_null) {
        return null(type);
    }
    if (type == CMPI_chars) {
        return text(core, reinterpret_cast<const char*>(value));
    }
    if (type == CMPI_charsptr) {
        const CMPIValuePtr& pointer = value->dataPtr;
        return pointer.ptr == nullptr
                   ? null(CMPI_string)
                   : text(core, std::string(static_cast<const char*>(pointer.ptr), pointer.length));
    }
    Value result;
    result.type_ = storedType(type);
    if (copyPlain(result.plain_, *value, type)) {
        result.isNull_ = false;
        return result;
    }
    const Kind kind = kindOf(type);
    if (kind == Kind::other) {
        throw Failure{CMPI_RC_ERR_INVALID_DATA_TYPE};
    }
    result.object_ = objectIn(value->string); // all handles stand in the same place
    result.isNull_ = result.object_ == nullptr;
    if (!result.isNull_ &&
        (result.object_->kind() != kind ||
         (kind == Kind::array && static_cast<Array&>(*result.object_).type() != result.type_))) {
        throw Failure{CMPI_RC_ERR_TYPE_MISMATCH};
    }
    return result;
}

Value Value::asProperty(CMPIType declared) const {
    Value result = *this;
    const bool isUnsigned = declared >= CMPI_uint8 && declared <= CMPI_uint64;
    const bool isSigned = declared >= CMPI_sint8 && declared <= CMPI_sint64;
    const unsigned int bits = 8U << (declared >> 4U & 3U); // as the codes of the integer types have it
    static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__,
                  "here and where integers are read from texts, the narrower members share the low bytes");
    const bool fits =
        (type_ == CMPI_uint64 && isUnsigned && (bits == 64 || plain_.uint64 >> bits == 0)) ||
        (type_ == CMPI_sint64 && isSigned && plain_.sint64 >> (bits - 1) == plain_.sint64 >> 63);
    result.type_ = fits ? declared : storedType(type_);
    return result;
}

CMPIData Value::data(CMPIValueState state) const {
    CMPIData result = {type_, state, plain_};
    if (isNull_) {
        result.state = static_cast<CMPIValueState>(state | CMPI_nullValue);
    } else if (type_ == CMPI_chars) {
        result.value.chars = static_cast<String&>(*object_).text.data();
    } else if (object_ != nullptr) {
        result.value.string = static_cast<CMPIString*>(object_->record());
    }
    return result;
}

const NamedValue* NamedValues::find(std::string_view name) const {
    const auto found = std::find_if(values_.begin(), values_.end(),
                                    [&](const NamedValue& v) { return sameName(v.name, name); });
    return found != values_.end() ? &*found : nullptr;
}

void NamedValues::set(std::string_view name, Value value) {
    for (NamedValue& named : values_) {
        if (sameName(named.name, name)) {
            named.value = std::move(value);
            return;
        }
    }
    values_.push_back({std::string(name), std::move(value)});
}

const NamedValue& NamedValues::at(std::size_t index) const {
    if (index >= values_.size()) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return values_[index];
}

Array::Array(Core& core, CMPIType type, std::size_t size)
    : RecordedObject(core), elementType(storedType(type)), elements(size, Value::null(type)) {}

std::unique_ptr<Object> Array::clone() const {
    auto copy = std::make_unique<Array>(core(), elementType, 0);
    copy->elements = elements;
    return copy;
}

std::unique_ptr<Object> Arguments::clone() const {
    auto copy = std::make_unique<Arguments>(core());
    copy->values = values;
    return copy;
}

std::unique_ptr<Object> Context::clone() const {
    auto copy = std::make_unique<Context>(core());
    copy->values = values;
    return copy;
}

std::unique_ptr<Object> Enumeration::clone() const {
    auto copy = std::make_unique<Enumeration>(core(), elementType);
    copy->elements = elements;
    copy->next = next;
    return copy;
}

std::unique_ptr<ObjectPath> ObjectPath::copy() const {
    auto copy = std::make_unique<ObjectPath>(core(), nameSpace, className);
    copy->hostName = hostName;
    copy->keys = keys;
    return copy;
}

std::unique_ptr<Object> Instance::clone() const {
    auto copy = std::make_unique<Instance>(core(), path->copy());
    copy->properties = properties;
    copy->isFiltered = isFiltered;
    copy->filter = filter;
    return copy;
}

void Instance::setKeysOf(const ObjectPath& source) {
    const auto declared = core().classes.find(source.className);
    for (const NamedValue& key : source.keys) {
        const PropertyDeclaration* const property = declared != nullptr ? declared->find(key.name) : nullptr;
        properties.set(key.name,
                       key.value.asProperty(property != nullptr ? property->type : CMPIType{CMPI_null}));
    }
}

PropertyList::PropertyList(Core& core, std::vector<std::string> list)
    : RecordedObject(core), names(std::move(list)) {
    for (const std::string& name : names) {
        pointers.push_back(name.c_str());
    }
    pointers.push_back(nullptr);
}

std::unique_ptr<Object> Error::clone() const {
    auto copy = std::make_unique<Error>(core());
    copy->type = type;
    copy->severity = severity;
    copy->probableCause = probableCause;
    copy->sourceFormat = sourceFormat;
    copy->statusCode = statusCode;
    copy->otherType = otherType;
    copy->owningEntity = owningEntity;
    copy->messageId = messageId;
    copy->message = message;
    copy->probableCauseDescription = probableCauseDescription;
    copy->source = source;
    copy->otherSourceFormat = otherSourceFormat;
    copy->statusCodeDescription = statusCodeDescription;
    copy->recommendedActions = recommendedActions;
    copy->messageArguments = messageArguments;
    return copy;
}

CMPIData keep(Core& core, Value value) {
    auto holder = std::make_unique<Array>(core, value.type(), 0);
    holder->elements.push_back(std::move(value));
    return handOut(std::move(holder))->elements.front().data();
}

} // namespace oxahv
