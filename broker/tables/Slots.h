// How a slot of a function table calls the operation behind it.
//
// An operation is a plain function: it takes the object in place of the handle, and the slot's other
// parameters but for the status; it returns what the slot returns, nothing for a slot that returns a status;
// it throws Failure when it cannot. What is the same for all slots is here: the check of the handle, the
// status, exceptions, faults and the record of calls.
#pragma once

#include "Core.h"
#include "query/SelectExpression.h"

#include <cstring>
#include <new>
#include <tuple>
#include <type_traits>

namespace oxahv {

// The object that a handle stands for.
template <class Record>
struct SelfOf;

template <class Class>
struct ObjectSelf {
    template <class Record>
    static Class* of(const Record* handle) {
        return Class::of(handle);
    }
    static Core& core(const Class& self) { return self.core(); }
};
template <>
struct SelfOf<CMPIBroker> {
    static Core* of(const CMPIBroker* handle) { return coreOf(handle); }
    static Core& core(Core& self) { return self; }
};
template <>
struct SelfOf<CMPIString> : ObjectSelf<String> {};
template <>
struct SelfOf<CMPIArray> : ObjectSelf<Array> {};
template <>
struct SelfOf<CMPIDateTime> : ObjectSelf<DateTime> {};
template <>
struct SelfOf<CMPIArgs> : ObjectSelf<Arguments> {};
template <>
struct SelfOf<CMPIContext> : ObjectSelf<Context> {};
template <>
struct SelfOf<CMPIEnumeration> : ObjectSelf<Enumeration> {};
template <>
struct SelfOf<CMPIObjectPath> : ObjectSelf<ObjectPath> {};
template <>
struct SelfOf<CMPIInstance> : ObjectSelf<Instance> {};
template <>
struct SelfOf<CMPIResult> : ObjectSelf<Result> {};
template <>
struct SelfOf<CMPIPropertyList> : ObjectSelf<PropertyList> {};
template <>
struct SelfOf<CMPIError> : ObjectSelf<Error> {};
template <>
struct SelfOf<CMPISelectExp> : ObjectSelf<SelectExpression> {};
template <>
struct SelfOf<CMPISelectCond> : ObjectSelf<SelectCondition> {};
template <>
struct SelfOf<CMPISubCond> : ObjectSelf<SubCondition> {};
template <>
struct SelfOf<CMPIPredicate> : ObjectSelf<Predicate> {};

// The status among a slot's arguments; null when there is none.
inline CMPIStatus* statusIn() {
    return nullptr;
}
template <class First, class... Rest>
CMPIStatus* statusIn(First first, Rest... rest) {
    if constexpr (std::is_same_v<First, CMPIStatus*>) {
        return first;
    } else {
        return statusIn(rest...);
    }
}

// What a slot returns when it fails.
template <class Result>
Result failed(CMPIStatus& status, CMPIrc code) {
    status = {code, nullptr};
    if constexpr (std::is_same_v<Result, CMPIStatus>) {
        return status;
    } else if constexpr (std::is_same_v<Result, CMPIData>) {
        CMPIData data = {};
        data.type = CMPI_null;
        const bool isMissing = code == CMPI_RC_ERR_NOT_FOUND || code == CMPI_RC_ERR_NO_SUCH_PROPERTY;
        data.state = static_cast<CMPIValueState>(isMissing ? CMPI_nullValue | CMPI_notFound : CMPI_nullValue);
        return data;
    } else if constexpr (!std::is_void_v<Result>) {
        return Result{};
    }
}

// The same with the failure's text as the status's message, which the current owner has.
template <class Result>
Result failed(Core& core, CMPIStatus& status, const Failure& failure) {
    CMPIString* message = nullptr;
    if (failure.text != nullptr) {
        try {
            message = handOut(std::make_unique<String>(core, *failure.text));
        } catch (const std::bad_alloc&) {
            return failed<Result>(status, CMPI_RC_ERROR_SYSTEM);
        }
    }
    Result result = failed<Result>(status, failure.code);
    status.msg = message;
    if constexpr (std::is_same_v<Result, CMPIStatus>) {
        result.msg = message;
    }
    return result;
}

// Puts a slot's arguments into the record of its call. The value's type comes after the value.
struct CallDescription {
    Call call;
    const CMPIValue* value = nullptr;
    unsigned int texts = 0;

    void add(const char* text) {
        const unsigned int position = texts++;
        if (text != nullptr && position < 2) {
            (position == 0 ? call.name : call.secondName) = text;
        }
    }
    void add(CMPICount index) { call.index = index; }
    void add(CMPIType type) { call.type = type; }
    void add(const CMPIValue* pointer) { value = pointer; }
    void add(CMPIStatus* status) {
        call.hasStatus = status != nullptr;
        call.entryStatus = status != nullptr ? *status : call.entryStatus;
    }
    template <class Other>
    void add(const Other& /*not recorded*/) {}
};

// Looks through a slot's arguments for what has died. The value's type comes after the value.
class DeadArguments {
public:
    // The broker's quarantine, and the slot.
    DeadArguments(Quarantine& quarantine, std::string_view slot) : quarantine_(quarantine), slot_(slot) {}

    // Whether there is a text of a dead string.
    bool hasText(const char* text) { return isText(text); }
    bool hasText(const CMPIValue* value) {
        value_ = value;
        return false;
    }
    bool hasText(CMPIType type) {
        return type == CMPI_chars && isText(reinterpret_cast<const char*>(value_));
    }
    template <class Other>
    bool hasText(const Other& /*argument*/) {
        return false;
    }

    // Notes the handles of dead objects.
    void noteHandle(const CMPIValue* value) { value_ = value; }
    void noteHandle(CMPIType type) {
        if (value_ != nullptr && ((type & CMPI_ARRAY) != 0 || (type & CMPI_ENC) != 0)) {
            noteIfDead(value_->string); // all handles stand in the same place
        }
    }
    template <class Other>
    void noteHandle(const Other& argument) {
        using Record = std::remove_cv_t<std::remove_pointer_t<Other>>;
        if constexpr (std::is_pointer_v<Other> && std::is_class_v<Record> &&
                      !std::is_same_v<Record, CMPIStatus>) {
            noteIfDead(argument);
        }
    }

private:
    bool isText(const char* text) {
        const bool isDead = quarantine_.hasText(text);
        if (isDead) {
            quarantine_.note(slot_, text);
        }
        return isDead;
    }
    void noteIfDead(const void* handle) {
        if (Quarantine::of(handle) != nullptr) {
            quarantine_.note(slot_, handle);
        }
    }

    Quarantine& quarantine_;
    std::string_view slot_;
    const CMPIValue* value_ = nullptr;
};

template <std::size_t index, auto operation, class Signature>
struct SlotOf;

template <std::size_t index, auto operation, class Return, class Record, class... Rest>
struct SlotOf<index, operation, Return (*)(Record*, Rest...)> {
    using Self = SelfOf<std::remove_const_t<Record>>;

    static Return call(Record* handle, Rest... rest) {
        CMPIStatus unasked = {CMPI_RC_OK, nullptr};
        CMPIStatus* const given = statusIn(rest...);
        CMPIStatus& status = given != nullptr ? *given : unasked;
        auto* const self = Self::of(handle);
        if (self == nullptr) {
            if (Quarantine* const quarantine = Quarantine::of(handle)) {
                quarantine->note(slots[index], handle);
            }
            return failed<Return>(status, CMPI_RC_ERR_INVALID_HANDLE);
        }
        if (DeadArguments dead(Self::core(*self).quarantine, slots[index]); (dead.hasText(rest) || ...)) {
            return failed<Return>(status, CMPI_RC_ERR_INVALID_HANDLE);
        }
        if (Self::core(*self).hooks.active()) {
            try {
                return callHooked(*self, handle, status, rest...);
            } catch (const std::bad_alloc&) { // no room for the record
                return failed<Return>(status, CMPI_RC_ERROR_SYSTEM);
            }
        }
        return run(*self, status, rest...);
    }

private:
    template <class Object>
    static Return run(Object& self, CMPIStatus& status, Rest... rest) {
        try {
            status = {CMPI_RC_OK, nullptr};
            constexpr std::size_t count =
                sizeof...(Rest) - ((std::is_same_v<Rest, CMPIStatus*> ? 1 : 0) + ... + 0);
            return apply(self, std::tuple<Rest...>(rest...), std::make_index_sequence<count>());
        } catch (const Failure& failure) {
            if (failure.code == CMPI_RC_ERR_INVALID_HANDLE) {
                DeadArguments dead(Self::core(self).quarantine, slots[index]);
                (dead.noteHandle(rest), ...);
            }
            if constexpr (std::is_void_v<Return>) {
                return failed<Return>(status, failure.code);
            } else {
                return failed<Return>(Self::core(self), status, failure);
            }
        } catch (const std::bad_alloc&) {
            return failed<Return>(status, CMPI_RC_ERROR_SYSTEM);
        } catch (...) { // such as a message handler's
            passOnTheEndOfAThread();
            return failed<Return>(status, CMPI_RC_ERR_FAILED);
        }
    }

    template <class Object, std::size_t... positions>
    static Return apply(Object& self, const std::tuple<Rest...>& arguments,
                        std::index_sequence<positions...>) {
        if constexpr (std::is_same_v<Return, CMPIStatus>) {
            operation(self, std::get<positions>(arguments)...);
            return {CMPI_RC_OK, nullptr};
        } else {
            return operation(self, std::get<positions>(arguments)...);
        }
    }

    template <class Object>
    static Return callHooked(Object& self, const void* handle, CMPIStatus& status, Rest... rest) {
        Hooks& hooks = Self::core(self).hooks;
        CallDescription description;
        (description.add(rest), ...);
        const Fault fault = hooks.strike(index);
        if constexpr (std::is_void_v<Return>) {
            if (fault.code == CMPI_RC_OK && !fault.yieldsNull) {
                run(self, status, rest...);
            }
            finish(hooks, description, handle, status);
        } else {
            Return result = fault.code != CMPI_RC_OK ? failed<Return>(status, fault.code)
                                                     : runFaulted(self, fault, status, rest...);
            if constexpr (std::is_same_v<Return, CMPIData>) {
                result.state = static_cast<CMPIValueState>(result.state | fault.stateBits);
            } else if constexpr (std::is_same_v<Return, CMPIStatus>) {
                status = result;
                description.call.hasStatus = true;
            }
            finish(hooks, description, handle, status);
            return result;
        }
    }

    // The call with what a fault does to its result.
    template <class Object>
    static Return runFaulted(Object& self, const Fault& fault, CMPIStatus& status, Rest... rest) {
        if constexpr (std::is_same_v<Return, CMPIData>) {
            CMPIData data = run(self, status, rest...);
            if (fault.yieldsNull) {
                // An empty initializer would be free to zero the union's first member alone.
                std::memset(&data.value, 0, sizeof data.value);
            }
            return data;
        } else {
            return fault.yieldsNull ? failed<Return>(status, CMPI_RC_OK) : run(self, status, rest...);
        }
    }

    static void finish(Hooks& hooks, CallDescription& description, const void* handle,
                       const CMPIStatus& status) {
        Call& call = description.call;
        call.slot = slots[index];
        call.object = handle;
        call.value = memberOf(description.value, call.type);
        call.code = status.rc;
        call.thread = std::this_thread::get_id();
        hooks.record(std::move(call));
    }
};

// A slot: its position in the list of slots, its operation, and the type of the table's member.
template <std::size_t index, auto operation, auto member>
struct SlotWith;
template <std::size_t index, auto operation, class Table, class Signature, Signature Table::*member>
struct SlotWith<index, operation, member> : SlotOf<index, operation, Signature> {};

// The operations that every kind of object has.
template <class Class>
void releaseObject(Class& object) {
    Owner* const owner = object.owner();
    if (owner != nullptr) { // else it is part of another object and dies with it
        owner->release(object);
    }
}

// A clone is its caller's: it outlives the request, and dies with the broker at the latest.
template <class Class>
auto cloneObject(const Class& object) {
    std::unique_ptr<Object> copy = object.clone();
    auto& result = static_cast<Class&>(*copy);
    object.core().clones.adopt(std::move(copy));
    return &result;
}

// What a caller may not leave out.
inline const char* required(const char* text) {
    if (text == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_PARAMETER};
    }
    return text;
}

// What a slot hands out of an object, which keeps it for the caller where it is more than a number.
inline CMPIData lent(const Object& object, const CMPIData& data) {
    if (!CMIsNullValue(data) && ((data.type & CMPI_ARRAY) != 0 || (data.type & CMPI_ENC) != 0)) {
        object.keep();
    }
    return data;
}

// A new string of the current owner's.
inline CMPIString* newText(Core& core, std::string text) {
    return handOut(std::make_unique<String>(core, std::move(text)));
}

} // namespace oxahv

// The entry of a function table: `SLOT(CMPIStringFT, getCharPtr, getChars)`.
#define SLOT(table, member, operation) \
    ::oxahv::SlotWith<::oxahv::slotIndex(#table "." #member), operation, &table::member>::call
