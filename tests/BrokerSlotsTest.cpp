// Every slot of every table that takes a handle: with each argument null in turn, and while memory runs out
// at each allocation in turn. No call may crash, throw, leak, or report success that it did not have.
#include "Factory.h"
#include "FailingMemory.h"
#include "cmpi/Slots.h"

#include <algorithm>
#include <cstdlib>
#include <functional>
#include <gtest/gtest.h>
#include <set>
#include <utility>

using oxahv::EmbeddedBroker;
using oxahv::Request;

namespace {

const CMPIResult* result = nullptr; // while the provider is inside
std::function<void()> insideProvider;
const CMPIContext* context = nullptr; // of the call
CMPIStatus status;                    // of the call

CMPIStatus serveNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* given,
                      const CMPIObjectPath* path) {
    if (const auto once = std::exchange(insideProvider, nullptr)) {
        result = given;
        once();
        result = nullptr;
    }
    return CMReturnObjectPath(given, path);
}

CMPIStatus serveInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* given,
                         const CMPIObjectPath* path, const char**) {
    CMPIStatus made = {CMPI_RC_OK, nullptr};
    const CMPIInstance* const instance = CMNewInstance(broker, path, &made);
    return made.rc == CMPI_RC_OK ? CMReturnInstance(given, instance) : made;
}

const CMPIInstanceMIFT served = {0, 0, "", {}, serveNames, serveInstance, serveInstance, {}, {}, {}, {}, {}};

// What a fresh argument points at, with which most slots succeed; null where they can do without.
struct Fresh {
    static const void* of(const CMPIBroker*) { return broker; }
    static const void* of(const CMPIContext*) { return context; }
    static const void* of(const CMPIResult*) { return result; }
    static const void* of(const CMPIStatus*) { return &status; }
    static const void* of(const CMPIString*) { return CMNewString(broker, "text", nullptr); }
    static const void* of(const CMPIInstance*) { return CMNewInstance(broker, path(), nullptr); }
    static const void* of(const CMPIObjectPath*) { return path(); }
    static const void* of(const CMPIArray*) { return array(); }
    static const void* of(const CMPIError*) { return error(); }
    static const void* of(const CMPIPropertyList*) { return properties(); }
    static const void* of(const CMPISelectExp*) { return query(); }
    static const void* of(const CMPISelectCond*) { return CMGetDoc(query(), nullptr); }
    static const void* of(const CMPISubCond*) {
        return CMGetSubCondAt(CMGetDoc(query(), nullptr), 0, nullptr);
    }
    static const void* of(const CMPIPredicate*) {
        return CMGetPredicateAt(CMGetSubCondAt(CMGetDoc(query(), nullptr), 0, nullptr), 0, nullptr);
    }
    static const void* of(CMPIAccessor*) { return reinterpret_cast<const void*>(&textValue); }
    static const void* of(const CMPIDateTime*) { return CMNewDateTime(broker, nullptr); }
    static const void* of(const CMPIGcStat*) { return broker->mft->mark(broker, nullptr); }
    static const void* of(const CMPIEnumeration*) {
        return broker->bft->enumerateInstanceNames(broker, context, path(), nullptr);
    }
    static const void* of(const CMPIArgs*) {
        CMPIArgs* const arguments = CMNewArgs(broker, nullptr);
        CMAddArg(arguments, "text", "value", CMPI_chars);
        return arguments;
    }
    static const void* of(const CMPIValue*) {
        static CMPIValue value = {};
        value.string = CMNewString(broker, "text", nullptr);
        return &value;
    }
    static const void* of(CMPIString* const*) {
        static CMPIString* text = nullptr;
        return &text;
    }
    static const void* of(const char*) { return *names; }
    static const void* of(const char* const*) { return names; }
    static const void* of(const void*) { return CMNewString(broker, "text", nullptr); }
    template <class Other>
    static const void* of(const Other*) {
        return nullptr;
    }

    static CMPIObjectPath* path() {
        CMPIObjectPath* const path = CMNewObjectPath(broker, "root", "Demo", nullptr);
        CMAddKey(path, "text", "value", CMPI_chars);
        return path;
    }
    static CMPIArray* array() {
        CMPIArray* const array = CMNewArray(broker, 1, CMPI_string, nullptr);
        CMSetArrayElementAt(array, 0, "value", CMPI_chars);
        return array;
    }
    static CMPIError* error() {
        CMPIError* const error = broker->eft->newCMPIError(broker, "owner", "id", "text", ErrorSevLow,
                                                           ErrorProbCauseOther, CMPI_RC_ERR_FAILED, nullptr);
        error->ft->setRecommendedActions(error, array());
        error->ft->setMessageArguments(error, array());
        return error;
    }
    static CMPISelectExp* query() {
        return CMNewSelectExp(broker, "SELECT * FROM Demo WHERE text = 'value'", "WQL", nullptr, nullptr);
    }
    static CMPIData textValue(const char*, void*) {
        CMPIData data = {CMPI_chars, CMPI_goodValue, {}};
        static char value[] = "value";
        data.value.chars = value;
        return data;
    }
    static CMPIPropertyList* properties() { return broker->eft->newPropertyList(broker, nullptr, nullptr); }

    static inline const char* names[] = {"text", nullptr};
};

template <class Type>
const void* argument() {
    if constexpr (std::is_same_v<Type, CMPIAccessor*>) {
        return Fresh::of(static_cast<Type>(nullptr));
    } else if constexpr (!std::is_pointer_v<Type> || std::is_same_v<Type, void*> ||
                         std::is_same_v<Type, char*>) {
        return nullptr;
    } else {
        return Fresh::of(static_cast<const std::remove_pointer_t<Type>*>(nullptr));
    }
}

template <class Type>
Type typed(const void* argument) {
    if constexpr (std::is_same_v<Type, CMPIAccessor*>) {
        return reinterpret_cast<Type>(const_cast<void*>(argument));
    } else if constexpr (std::is_pointer_v<Type>) {
        return static_cast<Type>(const_cast<void*>(argument));
    } else if constexpr (std::is_same_v<Type, CMPIType>) {
        return CMPI_string;
    } else {
        return Type{};
    }
}

// Whether a slot fails that is given null.
template <class Type>
constexpr bool isNeeded =
    std::is_same_v<Type, const CMPIObjectPath*> || std::is_same_v<Type, const CMPIInstance*> ||
    std::is_same_v<Type, const CMPIContext*> || std::is_same_v<Type, const CMPIError*>;

// Takes what a slot returns, or gives it back.
struct Returned {
    static void take(CMPIStatus returned) { status = returned; }
    static void take(void* block) { std::free(block); }
    static void take(char* text) { std::free(text); }
    template <class Object>
    static auto take(Object* object) -> decltype(object->ft->release, void()) {
        if (object != nullptr) {
            CMRelease(object);
        }
    }
    template <class Other>
    static void take(const Other&) {}
};

// A slot without its type: nothing that is done for each signature takes long to compile.
struct Slot {
    void (*function)();
    void (*call)(void (*function)(), const std::vector<const void*>& arguments);
    bool hasStatus;
    std::vector<const void* (*)()> arguments;
    std::vector<bool> isNeeded;
};

template <class Type, class Return, class... Parameters, std::size_t... positions>
Slot untyped(Type slot, Return (* /*fixed*/)(Parameters...), std::index_sequence<positions...>) {
    const auto call = [](void (*function)(), const std::vector<const void*>& arguments) {
        const auto typedSlot = reinterpret_cast<Type>(function);
        if constexpr (std::is_void_v<Return>) {
            typedSlot(typed<Parameters>(arguments[positions])...);
        } else {
            const Return returned = typedSlot(typed<Parameters>(arguments[positions])...);
            failing::ended();
            Returned::take(returned);
        }
    };
    return {reinterpret_cast<void (*)()>(slot),
            call,
            std::is_same_v<Return, CMPIStatus> || (std::is_same_v<Parameters, CMPIStatus*> || ...),
            {argument<Parameters>...},
            {isNeeded<Parameters>...}};
}
template <class Return, class... Parameters>
Slot untyped(Return (*slot)(Parameters...)) {
    return untyped(slot, slot, std::index_sequence_for<Parameters...>());
}
template <class Return, class... Parameters>
Slot untyped(Return (*slot)(Parameters..., ...)) {
    return untyped(slot, static_cast<Return (*)(Parameters...)>(nullptr),
                   std::index_sequence_for<Parameters...>());
}

// What a broker without a repository cannot do.
const std::set<std::string> unsupported = {
    "CMPIBrokerFT.enumerateInstancesFiltered",
    "CMPIBrokerFT.associatorsFiltered",
    "CMPIBrokerFT.referencesFiltered",
    "CMPIBrokerEncFT.openMessageFile",
    "CMPIBrokerEncFT.closeMessageFile",
    "CMPIBrokerEncFT.newEnumerationFilter",
    "CMPIStringFT.newCharsCP",
};

class EverySlot : public testing::Test {
protected:
    EverySlot() { broker_.host("Provider", {create<served>}); }

    template <class Table>
    void sweep(const Table* table) {
        forEachSlot(*table, [this](const char* name, auto slot) { sweepOne(name, untyped(slot)); });
    }

    EmbeddedBroker broker_;
    std::size_t swept_ = 0;
    std::size_t failures_ = 0; // calls that found no memory

private:
    void sweepOne(const std::string& name, const Slot& slot) {
        SCOPED_TRACE(name);
        EXPECT_EQ(name, EmbeddedBroker::slotNames().at(swept_++));
        const std::size_t live = broker_.liveObjects().total();
        for (std::size_t i = 0; i < slot.arguments.size(); ++i) {
            call(slot, i);
            if (slot.hasStatus && (i == 0 || slot.isNeeded[i])) {
                EXPECT_TRUE(status.rc == CMPI_RC_ERR_INVALID_HANDLE ||
                            (i > 0 && status.rc == CMPI_RC_ERR_NOT_SUPPORTED))
                    << "argument " << i << ": " << oxahv::codeName(status.rc);
            }
        }
        broker_.startRecording();
        call(slot, slot.arguments.size());
        const auto calls = broker_.stopRecording();
        EXPECT_TRUE(
            std::any_of(calls.begin(), calls.end(), [&](const auto& one) { return one.slot == name; }));
        EXPECT_TRUE(status.rc == CMPI_RC_ERR_NOT_SUPPORTED || unsupported.count(name) == 0);
        for (unsigned int n = 1, used = n; used >= n; ++n) {
            call(slot, slot.arguments.size(), n);
            used = failing::allocations();
            failures_ += used >= n ? 1U : 0U;
            EXPECT_TRUE(status.rc != CMPI_RC_OK || !slot.hasStatus || used < n)
                << "without its allocation " << n;
        }
        if (result == nullptr) { // else what was returned waits for its reply
            EXPECT_EQ(broker_.liveObjects().total(), live);
        }
    }

    void call(const Slot& slot, std::size_t nullPosition, unsigned int failingFrom = 0) {
        const Request request(broker_);
        context = request.context();
        CMAddContextEntry(context, "text", "value", CMPI_chars);
        std::vector<const void*> arguments;
        for (const auto argument : slot.arguments) {
            arguments.push_back(arguments.size() == nullPosition ? nullptr : argument());
        }
        status = {CMPI_RC_OK, nullptr};
        failing::allocationsFrom(failingFrom);
        slot.call(slot.function, arguments);
        failing::ended();
        while (broker->bft->detachThread(broker, context).rc == CMPI_RC_OK) {
        }
    }
};

} // namespace

TEST_F(EverySlot, SurvivesNullArgumentsAndOutOfMemory) {
    const Request request(broker_);
    const CMPIObjectPath* const path = CMNewObjectPath(broker, "root", "Demo", nullptr);
    const auto enumerate = [&] {
        return broker->bft->enumerateInstanceNames(broker, request.context(), path, nullptr);
    };
    sweep(broker->bft);
    sweep(broker->eft);
    sweep(broker->mft);
    sweep(request.context()->ft);
    insideProvider = [this] { sweep(result->ft); };
    enumerate();
    sweep(CMNewString(broker, "", nullptr)->ft);
    sweep(CMNewArray(broker, 0, CMPI_uint8, nullptr)->ft);
    sweep(enumerate()->ft);
    sweep(CMNewInstance(broker, path, nullptr)->ft);
    sweep(path->ft);
    sweep(CMNewArgs(broker, nullptr)->ft);
    sweep(CMNewDateTime(broker, nullptr)->ft);
    sweep(Fresh::error()->ft);
    sweep(Fresh::properties()->ft);
    sweep(Fresh::query()->ft);
    const CMPISelectCond* const condition = CMGetDoc(Fresh::query(), nullptr);
    sweep(condition->ft);
    const CMPISubCond* const group = CMGetSubCondAt(condition, 0, nullptr);
    sweep(group->ft);
    sweep(CMGetPredicateAt(group, 0, nullptr)->ft);
    forEachSlot(*broker->xft, [](const char* name, auto slot) { EXPECT_NE(slot, nullptr) << name; });
    const auto* const noMark = reinterpret_cast<const CMPIGcStat*>(CMNewString(broker, "", nullptr));
    EXPECT_EQ(broker->mft->release(broker, noMark).rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(swept_, EmbeddedBroker::slotNames().size());
    EXPECT_GT(failures_, 50U) << "the program's own operator new is not in use";
}
