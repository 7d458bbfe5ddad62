// CMPIBrokerEncFT: makes objects and asks about them.

#include "tables/Slots.h"
#include "text/DateTimeText.h"

#include <charconv>
#include <chrono>
#include <cstdarg>

namespace oxahv {

namespace {

CMPIObjectPath* newObjectPath(Core& core, const char* nameSpace, const char* className) {
    return handOut(
        std::make_unique<ObjectPath>(core, nameSpace != nullptr ? nameSpace : "", required(className)));
}

// The instance has every property of its class, NULL but for the path's keys where they become properties:
// what the provider does not set shows.
CMPIInstance* newInstance(Core& core, const CMPIObjectPath* handle) {
    const ObjectPath* const path = ObjectPath::of(handle);
    if (path == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    auto instance = std::make_unique<Instance>(core, nullptr);
    if (core.classes.any()) {
        const DeclaredClass* const declared = core.classes.find(path->className);
        if (declared == nullptr) {
            throw Failure{CMPI_RC_ERR_INVALID_CLASS};
        }
        instance->properties = nullValues(*declared);
    }
    instance->setPath(path->copy());
    return handOut(std::move(instance));
}

CMPIArgs* newArgs(Core& core) {
    return handOut(std::make_unique<Arguments>(core));
}

CMPIString* newString(Core& core, const char* text) {
    return newText(core, required(text));
}

CMPIString* newStringIn(Core& core, const char* text, CMPICodepageID codepage) {
    if (codepage == CMPI_CPID_UTF16) {
        throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
    }
    return newString(core, text);
}

CMPIArray* newArray(Core& core, CMPICount size, CMPIType type) {
    if (type == CMPI_null || (type & CMPI_ARRAY) != 0) {
        throw Failure{CMPI_RC_ERR_INVALID_DATA_TYPE};
    }
    return handOut(std::make_unique<Array>(core, type, size));
}

CMPIDateTime* newDateTimeOf(Core& core, std::string text) {
    if (!isDateTimeText(text)) {
        throw Failure{CMPI_RC_ERR_INVALID_PARAMETER};
    }
    return handOut(std::make_unique<DateTime>(core, std::move(text)));
}

CMPIDateTime* newDateTime(Core& core) {
    using namespace std::chrono;
    const auto now = duration_cast<microseconds>(system_clock::now().time_since_epoch()).count();
    return newDateTimeOf(core, dateTimeText(static_cast<std::uint64_t>(now), false));
}

CMPIDateTime* newDateTimeFromBinary(Core& core, CMPIUint64 microseconds, CMPIBoolean isInterval) {
    return newDateTimeOf(core, dateTimeText(microseconds, isInterval != 0));
}

CMPIDateTime* newDateTimeFromChars(Core& core, const char* text) {
    return newDateTimeOf(core, required(text));
}

// The select list as an array of texts; none for `*`.
CMPIArray* projectionOf(Core& core, const Query& query) {
    if (query.selectsAll()) {
        return nullptr;
    }
    auto array = std::make_unique<Array>(core, CMPI_string, 0);
    for (const QueryProperty& property : query.selected()) {
        array->elements.push_back(Value::text(core, property.text));
    }
    return handOut(std::move(array));
}

CMPISelectExp* newSelectExp(Core& core, const char* text, const char* language, CMPIArray** projection) {
    const std::shared_ptr<const Query> query = Query::parse(required(text), required(language));
    query->check(core.classes);
    auto expression = std::make_unique<SelectExpression>(core, query);
    if (projection != nullptr) {
        *projection = projectionOf(core, *query);
    }
    return handOut(std::move(expression));
}

CMPIBoolean classPathIsA(Core& core, const CMPIObjectPath* handle, const char* className) {
    const ObjectPath* const path = ObjectPath::of(handle);
    if (path == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    if (core.classes.any() && core.classes.find(path->className) == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_CLASS};
    }
    return core.classes.isA(path->className, required(className)) ? 1 : 0;
}

// Asking about an object of any kind

template <class Class>
bool isA(const Object& object) {
    return dynamic_cast<const Class*>(&object) != nullptr;
}

const char* typeOfOther(const Object& object) {
    return isA<Error>(object)              ? "CMPIError"
           : isA<PropertyList>(object)     ? "CMPIPropertyList"
           : isA<SelectExpression>(object) ? "CMPISelectExp"
           : isA<SelectCondition>(object)  ? "CMPISelectCond"
           : isA<SubCondition>(object)     ? "CMPISubCond"
                                           : "CMPIPredicate";
}

const char* typeOf(const void* handle) {
    const Object* const object = objectOf(handle);
    if (object == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    switch (object->kind()) {
    case Kind::instance:
        return "CMPIInstance";
    case Kind::objectPath:
        return "CMPIObjectPath";
    case Kind::arguments:
        return "CMPIArgs";
    case Kind::string:
        return "CMPIString";
    case Kind::array:
        return "CMPIArray";
    case Kind::dateTime:
        return "CMPIDateTime";
    case Kind::enumeration:
        return "CMPIEnumeration";
    case Kind::context:
        return "CMPIContext";
    case Kind::result:
        return "CMPIResult";
    case Kind::other:
        break;
    }
    return typeOfOther(*object);
}

CMPIString* getType(Core& core, const void* handle) {
    return newText(core, typeOf(handle));
}

CMPIBoolean isOfType(Core& /*core*/, const void* handle, const char* type) {
    return std::string_view(typeOf(handle)) == required(type) ? 1 : 0;
}

CMPIString* toString(Core& core, const void* handle) {
    const std::string_view type = typeOf(handle);
    Object* const object = objectOf(handle);
    if (object->kind() == Kind::string) {
        return newText(core, static_cast<String*>(object)->text);
    }
    if (object->kind() == Kind::dateTime) {
        return newText(core, static_cast<DateTime*>(object)->text);
    }
    if (object->kind() == Kind::objectPath) {
        return newText(core, pathText(static_cast<ObjectPath*>(object)));
    }
    return newText(core, std::string(type));
}

// Messages

// The default text of a message with its insertions: {0}, {1}, … stand for them.
CMPIString* newMessage(Core& core, const char* /*id*/, const char* text,
                       const std::vector<std::string>* insertions) {
    std::string message;
    for (std::string_view rest = required(text); !rest.empty();) {
        std::size_t number = insertions->size();
        const char* const end = rest.data() + rest.size();
        const char* after = rest.data() + 1;
        if (rest.front() == '{') {
            after = std::from_chars(after, end, number).ptr;
        }
        if (number < insertions->size() && after != end && *after == '}') {
            message += (*insertions)[number];
            rest.remove_prefix(static_cast<std::size_t>(after + 1 - rest.data()));
        } else {
            message += rest.front();
            rest.remove_prefix(1);
        }
    }
    return newText(core, message);
}

// One insertion: its type, then its value, as C passes them.
std::string insertionOf(std::va_list& list) {
    const int type = va_arg(list, int);
    switch (type) {
    case CMPI_chars: {
        const char* const text = va_arg(list, const char*);
        return text != nullptr ? text : "";
    }
    case CMPI_string: {
        const String* const string = String::of(va_arg(list, CMPIString*));
        return string != nullptr ? string->text : "";
    }
    case CMPI_boolean:
        return va_arg(list, int) != 0 ? "TRUE" : "FALSE";
    case CMPI_sint8:
    case CMPI_sint16:
    case CMPI_sint32:
        return std::to_string(va_arg(list, int));
    case CMPI_uint8:
    case CMPI_uint16:
    case CMPI_uint32:
        return std::to_string(va_arg(list, unsigned int));
    case CMPI_sint64:
        return std::to_string(va_arg(list, long long));
    case CMPI_uint64:
        return std::to_string(va_arg(list, unsigned long long));
    case CMPI_real32:
    case CMPI_real64: {
        CMPIData real = {CMPI_real64, CMPI_goodValue, {}};
        real.value.real64 = va_arg(list, double);
        return valueText(real);
    }
    default:
        throw Failure{CMPI_RC_ERR_INVALID_DATA_TYPE};
    }
}

using MessageSlot = CMPIString* (*)(const CMPIBroker*, const char*, const char*,
                                    const std::vector<std::string>*, CMPIStatus*);

template <std::size_t index>
CMPIString* message(const CMPIBroker* broker, const char* id, const char* text, CMPIStatus* rc,
                    CMPICount count, std::va_list& list) {
    CMPIStatus unasked = {CMPI_RC_OK, nullptr};
    CMPIStatus& status = rc != nullptr ? *rc : unasked;
    try {
        std::vector<std::string> insertions;
        for (CMPICount i = 0; i < count; ++i) {
            insertions.push_back(insertionOf(list));
        }
        return SlotOf<index, newMessage, MessageSlot>::call(broker, id, text, &insertions, &status);
    } catch (const Failure& failure) {
        return failed<CMPIString*>(status, failure.code);
    } catch (const std::bad_alloc&) {
        return failed<CMPIString*>(status, CMPI_RC_ERROR_SYSTEM);
    }
}

CMPIString* getMessage(const CMPIBroker* broker, const char* id, const char* text, CMPIStatus* rc,
                       CMPICount count, ...) {
    std::va_list list;
    va_start(list, count);
    CMPIString* const result =
        message<slotIndex("CMPIBrokerEncFT.getMessage")>(broker, id, text, rc, count, list);
    va_end(list);
    return result;
}

CMPIString* getMessageOfFile(const CMPIBroker* broker, const char* id, CMPIMsgFileHandle /*file*/,
                             const char* text, CMPIStatus* rc, CMPICount count, ...) {
    std::va_list list;
    va_start(list, count);
    CMPIString* const result =
        message<slotIndex("CMPIBrokerEncFT.getMessage2")>(broker, id, text, rc, count, list);
    va_end(list);
    return result;
}

void openMessageFile(Core& /*core*/, const char* /*file*/, CMPIMsgFileHandle* /*handle*/) {
    throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
}

void closeMessageFile(Core& /*core*/, CMPIMsgFileHandle /*handle*/) {
    throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
}

void tell(Core& core, bool isTrace, int severity, const char* component, const char* text,
          const CMPIString* string) {
    const String* const other = String::of(string);
    core.tell({isTrace, severity, component != nullptr ? component : "",
               text != nullptr ? text : (other != nullptr ? other->text : "")});
}

void logMessage(Core& core, CMPISeverity severity, const char* id, const char* text,
                const CMPIString* string) {
    tell(core, false, severity, id, text, string);
}

void trace(Core& core, CMPILevel level, const char* component, const char* text, const CMPIString* string) {
    tell(core, true, level, component, text, string);
}

// Errors, property lists, filters

CMPIError* newError(Core& core, const char* owner, const char* id, const char* message,
                    CMPIErrorSeverity severity, CMPIErrorProbableCause cause, CMPIrc statusCode) {
    auto error = std::make_unique<Error>(core);
    error->owningEntity = required(owner);
    error->messageId = required(id);
    error->message = required(message);
    error->severity = severity;
    error->probableCause = cause;
    error->statusCode = statusCode;
    return handOut(std::move(error));
}

CMPIPropertyList* newPropertyList(Core& core, const char** properties) {
    std::vector<std::string> names;
    for (const char** name = properties; name != nullptr && *name != nullptr; ++name) {
        names.emplace_back(*name);
    }
    return handOut(std::make_unique<PropertyList>(core, std::move(names)));
}

CMPIEnumerationFilter* newEnumerationFilter(Core& /*core*/, const char* /*language*/, const char* /*query*/) {
    throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
}

} // namespace

const CMPIBrokerEncFT encapsulationTable = {
    CMPICurrentVersion,
    SLOT(CMPIBrokerEncFT, newInstance, newInstance),
    SLOT(CMPIBrokerEncFT, newObjectPath, newObjectPath),
    SLOT(CMPIBrokerEncFT, newArgs, newArgs),
    SLOT(CMPIBrokerEncFT, newString, newString),
    SLOT(CMPIBrokerEncFT, newArray, newArray),
    SLOT(CMPIBrokerEncFT, newDateTime, newDateTime),
    SLOT(CMPIBrokerEncFT, newDateTimeFromBinary, newDateTimeFromBinary),
    SLOT(CMPIBrokerEncFT, newDateTimeFromChars, newDateTimeFromChars),
    SLOT(CMPIBrokerEncFT, newSelectExp, newSelectExp),
    SLOT(CMPIBrokerEncFT, classPathIsA, classPathIsA),
    SLOT(CMPIBrokerEncFT, toString, toString),
    SLOT(CMPIBrokerEncFT, isOfType, isOfType),
    SLOT(CMPIBrokerEncFT, getType, getType),
    getMessage,
    SLOT(CMPIBrokerEncFT, logMessage, logMessage),
    SLOT(CMPIBrokerEncFT, trace, trace),
    SLOT(CMPIBrokerEncFT, newCMPIError, newError),
    SLOT(CMPIBrokerEncFT, openMessageFile, openMessageFile),
    SLOT(CMPIBrokerEncFT, closeMessageFile, closeMessageFile),
    getMessageOfFile,
    SLOT(CMPIBrokerEncFT, newPropertyList, newPropertyList),
    SLOT(CMPIBrokerEncFT, newStringCP, newStringIn),
    SLOT(CMPIBrokerEncFT, newEnumerationFilter, newEnumerationFilter),
};

} // namespace oxahv
