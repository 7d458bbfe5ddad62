// Every slot of every table that takes a handle: with each argument null in turn, and while memory runs out
// at each allocation in turn. No call may crash, throw, leak, or report success that it did not have.
#include "EmbeddedBroker.h"
#include "FailingMemory.h"

#include <cstdlib>
#include <functional>
#include <gtest/gtest.h>
#include <string>
#include <tuple>
#include <type_traits>
#include <utility>

using oxahv::EmbeddedBroker;
using oxahv::Request;

namespace {

const CMPIBroker* broker = nullptr;
std::function<void(const CMPIResult*)> insideProvider;

CMPIStatus serveNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                      const CMPIObjectPath* path) {
    if (const auto once = std::exchange(insideProvider, nullptr)) {
        once(result);
    }
    return CMReturnObjectPath(result, path);
}

CMPIStatus serveInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                         const CMPIObjectPath* path, const char**) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIInstance* const instance = CMNewInstance(broker, path, &status);
    return status.rc == CMPI_RC_OK ? CMReturnInstance(result, instance) : status;
}

CMPIInstanceMI* createProvider(const CMPIBroker* theBroker, const CMPIContext*, CMPIStatus*) {
    static CMPIInstanceMIFT table = {};
    static CMPIInstanceMI mi = {nullptr, &table};
    table.enumerateInstanceNames = serveNames;
    table.enumerateInstances = serveInstance;
    table.getInstance = serveInstance;
    broker = theBroker;
    return &mi;
}

// A slot's types, however it is called.
template <class Return, class... Parameters>
struct Signature {};

class EverySlot : public testing::Test {
protected:
    EverySlot() { broker_.host("Provider", {createProvider}); }
    ~EverySlot() override { insideProvider = nullptr; }

    template <class... Slots>
    void sweep(Slots... slots) {
        (sweepOne(slots), ...);
    }

    EmbeddedBroker broker_;
    const CMPIResult* result_ = nullptr;
    std::size_t swept_ = 0;
    std::size_t failures_ = 0; // calls that found no memory

private:
    template <class Return, class... Parameters>
    void sweepOne(Return (*slot)(Parameters...)) {
        sweepAs(Signature<Return, Parameters...>(), slot);
    }
    template <class Return, class... Parameters>
    void sweepOne(Return (*slot)(Parameters..., ...)) {
        sweepAs(Signature<Return, Parameters...>(), slot);
    }

    template <class Return, class... Parameters, class Slot>
    void sweepAs(Signature<Return, Parameters...> signature, Slot slot) {
        name_ = EmbeddedBroker::slotNames().at(swept_++);
        const std::size_t live = broker_.liveObjects().total();
        withNulls(signature, slot, std::index_sequence_for<Parameters...>());
        withoutMemory(signature, slot);
        if (result_ == nullptr) { // else what was returned waits for its reply
            EXPECT_EQ(broker_.liveObjects().total(), live) << name_;
        }
    }

    template <class Return, class... Parameters, class Slot, std::size_t... positions>
    void withNulls(Signature<Return, Parameters...> signature, Slot slot, std::index_sequence<positions...>) {
        (withNull<positions>(signature, slot), ...);
    }

    template <std::size_t position, class Return, class... Parameters, class Slot>
    void withNull(Signature<Return, Parameters...> signature, Slot slot) {
        using Type = std::tuple_element_t<position, std::tuple<Parameters...>>;
        using Target = std::remove_const_t<std::remove_pointer_t<Type>>;
        if constexpr (std::is_pointer_v<Type>) {
            const Request request(broker_);
            std::tuple<Parameters...> arguments = argumentsOf(signature, request);
            std::get<position>(arguments) = nullptr;
            call(signature, slot, arguments);
            constexpr bool isNeeded =
                std::is_same_v<Target, CMPIObjectPath> || std::is_same_v<Target, CMPIInstance> ||
                std::is_same_v<Target, CMPIContext> || std::is_same_v<Target, CMPIError>;
            if (hasStatus<Return, Parameters...> && position == 0) {
                EXPECT_EQ(status_.rc, CMPI_RC_ERR_INVALID_HANDLE) << name_;
            } else if (hasStatus<Return, Parameters...> && isNeeded) {
                EXPECT_TRUE(status_.rc == CMPI_RC_ERR_INVALID_HANDLE ||
                            status_.rc == CMPI_RC_ERR_NOT_SUPPORTED)
                    << name_ << ", argument " << position << ": " << oxahv::codeName(status_.rc);
            }
        }
    }

    template <class Return, class... Parameters, class Slot>
    void withoutMemory(Signature<Return, Parameters...> signature, Slot slot) {
        for (unsigned int n = 1, used = n; used >= n; ++n) {
            const Request request(broker_);
            const std::tuple<Parameters...> arguments = argumentsOf(signature, request);
            call(signature, slot, arguments, n);
            used = allocations_;
            failures_ += used >= n ? 1U : 0U;
            if (hasStatus<Return, Parameters...> && used >= n) {
                EXPECT_NE(status_.rc, CMPI_RC_OK) << name_ << " without its allocation " << n;
            }
        }
    }

    template <class Return, class... Parameters>
    static constexpr bool hasStatus = std::is_same_v<Return, CMPIStatus> ||
                                      (std::is_same_v<Parameters, CMPIStatus*> || ...);

    // Calls a slot, and gives back what it hands to its caller.
    template <class Return, class... Parameters, class Slot>
    void call(Signature<Return, Parameters...>, Slot slot, const std::tuple<Parameters...>& arguments,
              unsigned int failingFrom = 0) {
        const auto apply = [&] {
            return std::apply([&](auto... given) { return slot(given...); }, arguments);
        };
        status_ = {CMPI_RC_OK, nullptr};
        failing::allocationsFrom(failingFrom);
        if constexpr (std::is_void_v<Return>) {
            apply();
            noteAllocations();
        } else {
            const Return returned = apply();
            noteAllocations();
            if constexpr (std::is_same_v<Return, CMPIStatus>) {
                status_ = returned;
            } else if constexpr (std::is_same_v<Return, void*> || std::is_same_v<Return, char*>) {
                std::free(returned);
            } else if constexpr (isObject<Return>(0)) {
                if (returned != nullptr) {
                    CMRelease(returned);
                }
            }
        }
        while (broker->bft->detachThread(broker, request_->context()).rc == CMPI_RC_OK) {
        }
    }

    void noteAllocations() {
        failing::ended();
        allocations_ = failing::allocations();
    }

    template <class Type>
    static constexpr auto isObject(int) -> decltype(std::declval<Type>()->ft->release, true) {
        return true;
    }
    template <class Type>
    static constexpr bool isObject(long) {
        return false;
    }

    // Fresh arguments, with which most slots succeed.
    template <class Return, class... Parameters>
    std::tuple<Parameters...> argumentsOf(Signature<Return, Parameters...>, const Request& request) {
        request_ = &request;
        CMAddContextEntry(request.context(), "text", "value", CMPI_chars);
        return {argument<Parameters>()...};
    }
    template <class Type>
    Type argument();

    std::string name_;
    unsigned int allocations_ = 0; // of the last call
    CMPIStatus status_ = {CMPI_RC_OK, nullptr};
    const Request* request_ = nullptr;
};

// Compiled for the arguments alone that are handles.
template <class Type, class Target>
Type constCast(const Target* object) {
    return const_cast<Type>(object);
}

template <class Type>
Type EverySlot::argument() {
    using Target = std::remove_const_t<std::remove_pointer_t<Type>>;
    const auto made = [](auto* object) { return constCast<Type>(static_cast<const Target*>(object)); };
    if constexpr (std::is_same_v<Target, CMPIBroker>) {
        return made(broker);
    } else if constexpr (std::is_same_v<Type, CMPIStatus*>) {
        return &status_;
    } else if constexpr (std::is_same_v<Target, CMPIString>) {
        return made(CMNewString(broker, "text", nullptr));
    } else if constexpr (std::is_same_v<Target, CMPIObjectPath>) {
        CMPIObjectPath* const path = CMNewObjectPath(broker, "root", "Demo", nullptr);
        CMAddKey(path, "text", "value", CMPI_chars);
        return made(path);
    } else if constexpr (std::is_same_v<Target, CMPIInstance>) {
        return made(CMNewInstance(broker, argument<CMPIObjectPath*>(), nullptr));
    } else if constexpr (std::is_same_v<Target, CMPIArgs>) {
        CMPIArgs* const arguments = CMNewArgs(broker, nullptr);
        CMAddArg(arguments, "text", "value", CMPI_chars);
        return made(arguments);
    } else if constexpr (std::is_same_v<Target, CMPIArray>) {
        CMPIArray* const array = CMNewArray(broker, 1, CMPI_string, nullptr);
        CMSetArrayElementAt(array, 0, "value", CMPI_chars);
        return made(array);
    } else if constexpr (std::is_same_v<Target, CMPIDateTime>) {
        return made(CMNewDateTime(broker, nullptr));
    } else if constexpr (std::is_same_v<Target, CMPIContext>) {
        return made(request_->context());
    } else if constexpr (std::is_same_v<Target, CMPIEnumeration>) {
        return made(broker->bft->enumerateInstanceNames(broker, request_->context(),
                                                        argument<CMPIObjectPath*>(), nullptr));
    } else if constexpr (std::is_same_v<Target, CMPIResult>) {
        return made(result_);
    } else if constexpr (std::is_same_v<Target, CMPIError>) {
        CMPIError* const error = broker->eft->newCMPIError(broker, "owner", "id", "text", ErrorSevLow,
                                                           ErrorProbCauseOther, CMPI_RC_ERR_FAILED, nullptr);
        error->ft->setRecommendedActions(error, argument<CMPIArray*>());
        error->ft->setMessageArguments(error, argument<CMPIArray*>());
        return made(error);
    } else if constexpr (std::is_same_v<Target, CMPIPropertyList>) {
        return made(broker->eft->newPropertyList(broker, argument<const char**>(), nullptr));
    } else if constexpr (std::is_same_v<Target, CMPIGcStat>) {
        return made(broker->mft->mark(broker, nullptr));
    } else if constexpr (std::is_same_v<Type, const void*>) {
        return argument<CMPIString*>();
    } else if constexpr (std::is_same_v<Type, const char*>) {
        return "text";
    } else if constexpr (std::is_same_v<Type, const char**>) {
        static const char* names[] = {"text", nullptr};
        return names;
    } else if constexpr (std::is_same_v<Target, CMPIValue>) {
        static CMPIValue value = {};
        value.string = argument<CMPIString*>();
        return &value;
    } else if constexpr (std::is_same_v<Type, CMPIString**>) {
        static CMPIString* text = nullptr;
        return &text;
    } else if constexpr (std::is_same_v<Type, CMPIType>) {
        return CMPI_string;
    } else {
        return Type{};
    }
}

} // namespace

TEST_F(EverySlot, SurvivesNullArgumentsAndWantOfMemory) {
    const Request request(broker_);
    const auto* const bft = broker->bft;
    sweep(bft->prepareAttachThread, bft->attachThread, bft->detachThread, bft->deliverIndication,
          bft->enumerateInstanceNames, bft->getInstance, bft->createInstance, bft->modifyInstance,
          bft->deleteInstance, bft->execQuery, bft->enumerateInstances, bft->associators,
          bft->associatorNames, bft->references, bft->referenceNames, bft->invokeMethod, bft->setProperty,
          bft->getProperty, bft->enumerateInstancesFiltered, bft->associatorsFiltered,
          bft->referencesFiltered);
    const auto* const eft = broker->eft;
    sweep(eft->newInstance, eft->newObjectPath, eft->newArgs, eft->newString, eft->newArray, eft->newDateTime,
          eft->newDateTimeFromBinary, eft->newDateTimeFromChars, eft->newSelectExp, eft->classPathIsA,
          eft->toString, eft->isOfType, eft->getType, eft->getMessage, eft->logMessage, eft->trace,
          eft->newCMPIError, eft->openMessageFile, eft->closeMessageFile, eft->getMessage2,
          eft->newPropertyList, eft->newStringCP, eft->newEnumerationFilter);
    const auto* const mft = broker->mft;
    sweep(mft->mark, mft->release, mft->cmpiMalloc, mft->cmpiCalloc, mft->cmpiRealloc, mft->cmpiStrDup,
          mft->cmpiFree, mft->freeInstance, mft->freeObjectPath, mft->freeArgs, mft->freeString,
          mft->freeArray, mft->freeDateTime, mft->freeSelectExp, mft->freeChars);
    const auto* const context = request.context()->ft;
    sweep(context->release, context->clone, context->getEntry, context->getEntryAt, context->getEntryCount,
          context->addEntry);
    insideProvider = [this](const CMPIResult* result) {
        result_ = result;
        const auto* const ft = result->ft;
        sweep(ft->release, ft->clone, ft->returnData, ft->returnInstance, ft->returnObjectPath,
              ft->returnDone, ft->returnError);
        result_ = nullptr;
    };
    const CMPIObjectPath* const path = CMNewObjectPath(broker, "root", "Demo", nullptr);
    broker->bft->enumerateInstanceNames(broker, request.context(), path, nullptr);
    const auto* const string = CMNewString(broker, "", nullptr)->ft;
    sweep(string->release, string->clone, string->getCharPtr, string->newCharsCP);
    const auto* const array = CMNewArray(broker, 0, CMPI_uint8, nullptr)->ft;
    sweep(array->release, array->clone, array->getSize, array->getSimpleType, array->getElementAt,
          array->setElementAt);
    const auto* const enumeration =
        broker->bft->enumerateInstanceNames(broker, request.context(), path, nullptr)->ft;
    sweep(enumeration->release, enumeration->clone, enumeration->getNext, enumeration->hasNext,
          enumeration->toArray);
    const auto* const instance = CMNewInstance(broker, path, nullptr)->ft;
    sweep(instance->release, instance->clone, instance->getProperty, instance->getPropertyAt,
          instance->getPropertyCount, instance->setProperty, instance->getObjectPath,
          instance->setPropertyFilter, instance->setObjectPath, instance->setPropertyWithOrigin);
    const auto* const op = path->ft;
    sweep(op->release, op->clone, op->setNameSpace, op->getNameSpace, op->setHostname, op->getHostname,
          op->setClassName, op->getClassName, op->addKey, op->getKey, op->getKeyAt, op->getKeyCount,
          op->setNameSpaceFromObjectPath, op->setHostAndNameSpaceFromObjectPath, op->getClassQualifier,
          op->getPropertyQualifier, op->getMethodQualifier, op->getParameterQualifier, op->toString);
    const auto* const args = CMNewArgs(broker, nullptr)->ft;
    sweep(args->release, args->clone, args->addArg, args->getArg, args->getArgAt, args->getArgCount);
    const auto* const date = CMNewDateTime(broker, nullptr)->ft;
    sweep(date->release, date->clone, date->getBinaryFormat, date->getStringFormat, date->isInterval);
    const auto* const error =
        eft->newCMPIError(broker, "", "", "", ErrorSevLow, ErrorProbCauseOther, CMPI_RC_OK, nullptr)->ft;
    sweep(error->release, error->clone, error->getErrorType, error->getOtherErrorType, error->getOwningEntity,
          error->getMessageID, error->getMessage, error->getPerceivedSeverity, error->getProbableCause,
          error->getProbableCauseDescription, error->getRecommendedActions, error->getErrorSource,
          error->getErrorSourceFormat, error->getOtherErrorSourceFormat, error->getCIMStatusCode,
          error->getCIMStatusCodeDescription, error->getMessageArguments, error->setErrorType,
          error->setOtherErrorType, error->setProbableCauseDescription, error->setRecommendedActions,
          error->setErrorSource, error->setErrorSourceFormat, error->setOtherErrorSourceFormat,
          error->setCIMStatusCodeDescription, error->setMessageArguments);
    const auto* const list = eft->newPropertyList(broker, nullptr, nullptr)->ft;
    sweep(list->release, list->clone, list->isPropertyInList, list->getProperties);
    EXPECT_EQ(swept_, EmbeddedBroker::slotNames().size());
    EXPECT_GT(failures_, 50U) << "the program's own operator new is not in use";
}
