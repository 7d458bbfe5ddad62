// What a CIM server and a provider that were compiled apart must agree on: sizes, offsets and codes of CMPI,
// as the standard fixes them on a 64-bit machine, checked by the compiler for the version it is compiled
// with; and which slot each convenience name and each function of a provider is.
#define USES usesInCpp
#define PROVIDER ProviderInCpp
#include "Uses.h"

#include "Slots.h"

#include <cstdarg>
#include <cstddef>
#include <gtest/gtest.h>
#include <sstream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <tuple>
#include <type_traits>
#include <utility>
#include <vector>

extern "C" const Uses usesInC;

namespace {

// Scalars and values

template <class Type, class... Names>
constexpr bool are = (std::is_same_v<Type, Names> && ...);
#define VALUE(member) decltype(CMPIValue::member)

static_assert(are<unsigned char, CMPIBoolean, VALUE(boolean), CMPIUint8, VALUE(uint8)>);
static_assert(are<unsigned short, CMPIChar16, VALUE(char16), CMPIUint16, VALUE(uint16)>);
static_assert(are<unsigned short, CMPIType, CMPIValueState>);
static_assert(are<unsigned int, CMPIUint32, VALUE(uint32), CMPICount, CMPIFlags>);
static_assert(are<unsigned long long, CMPIUint64, VALUE(uint64)>);
static_assert(are<signed char, CMPISint8, VALUE(sint8)>);
static_assert(are<short, CMPISint16, VALUE(sint16)>);
static_assert(are<int, CMPISint32, VALUE(sint32), CMPIVersion>);
static_assert(are<long long, CMPISint64, VALUE(sint64)>);
static_assert(are<float, CMPIReal32, VALUE(real32)>);
static_assert(are<double, CMPIReal64, VALUE(real64)>);
static_assert(are<void*, CMPI_THREAD_TYPE, CMPI_THREAD_RETURN, CMPI_MUTEX_TYPE, CMPI_COND_TYPE>);
static_assert(are<pthread_key_t, CMPI_THREAD_KEY_TYPE> && are<void*, CMPIMsgFileHandle>);
static_assert(are<CMPIInstance*, VALUE(inst)> && are<CMPIObjectPath*, VALUE(ref)>);
static_assert(are<CMPIArgs*, VALUE(args)> && are<CMPISelectExp*, VALUE(filter)>);
static_assert(are<CMPIEnumeration*, VALUE(Enum)> && are<CMPIArray*, VALUE(array)>);
static_assert(are<CMPIString*, VALUE(string)> && are<char*, VALUE(chars)>);
static_assert(are<CMPIDateTime*, VALUE(dateTime)> && are<CMPIValuePtr, VALUE(dataPtr)>);
static_assert(std::is_union_v<CMPIValue> && sizeof(CMPIValue) == 16);

#define CODE(name, value) static_assert((name) == (value), #name);
#define SIZE(record, size) static_assert(sizeof(record) == (size), #record);
#define MEMBER(record, member, offset, ...)                                   \
    static_assert(offsetof(record, member) == (offset), #record "." #member); \
    static_assert(are<decltype(record::member), __VA_ARGS__>, #record "." #member " type");

MEMBER(CMPIValuePtr, ptr, 0, void*)
MEMBER(CMPIValuePtr, length, 8, CMPICount)
MEMBER(CMPIData, type, 0, CMPIType)
MEMBER(CMPIData, state, 2, CMPIValueState)
MEMBER(CMPIData, value, 8, CMPIValue)
static_assert(sizeof(CMPIData) == 24);
MEMBER(CMPIStatus, rc, 0, CMPIrc)
MEMBER(CMPIStatus, msg, 8, CMPIString*) static_assert(sizeof(CMPIStatus) == 16);
#include "CmpiStandard.inc"

static_assert(CMPICurrentVersion == CMPI_VERSION);
static_assert(std::string_view(CMPIInitNameSpace) == "CMPIInitNameSpace");
static_assert(std::string_view(CMPIInvocationFlags) == "CMPIInvocationFlags");
static_assert(std::string_view(CMPIPrincipal) == "CMPIPrincipal");
static_assert(std::string_view(CMPIRole) == "CMPIRole");
static_assert(std::string_view(CMPIAcceptLanguage) == "CMPIAcceptLanguage");
static_assert(std::string_view(CMPIContentLanguage) == "CMPIContentLanguage");

// The convenience names: fake tables note which function was called with what.

using Bits = std::vector<unsigned long long>;
struct {
    void (*function)();
    Bits arguments;
} seen;

template <class Type>
unsigned long long bits(Type value) {
    if constexpr (std::is_pointer_v<Type>) {
        return reinterpret_cast<std::uintptr_t>(value);
    } else if constexpr (std::is_same_v<Type, CMPIStatus>) {
        return static_cast<unsigned long long>(value.rc);
    } else if constexpr (std::is_same_v<Type, CMPIData>) {
        return value.type;
    } else {
        return static_cast<unsigned long long>(value);
    }
}

// A value of a type, another one for each number. Nobody looks at what the pointers point to.
template <class Type>
Type value(std::size_t number) {
    if constexpr (std::is_pointer_v<Type>) {
        return reinterpret_cast<Type>(number * 16);
    } else if constexpr (std::is_same_v<Type, CMPIStatus>) {
        return {static_cast<CMPIrc>(number), nullptr};
    } else if constexpr (std::is_same_v<Type, CMPIData>) {
        return {static_cast<CMPIType>(number), CMPI_goodValue, {}};
    } else {
        return static_cast<Type>(number);
    }
}
// Of what each fake returns: more than any slot has arguments, so that none is taken for it.
constexpr std::size_t resultNumber = 17;

template <class Return, class... Parameters>
Return note(void (*function)(), Parameters... parameters) {
    seen = {function, {bits(parameters)...}};
    if constexpr (!std::is_void_v<Return>) {
        return value<Return>(resultNumber);
    }
}

// A function of its own for each slot, since slots of one type are told apart by their functions.
template <auto slot>
struct Fake;
template <class Table, class Return, class... Parameters, Return (*Table::*slot)(Parameters...)>
struct Fake<slot> {
    static Return call(Parameters... parameters) {
        return note<Return>(reinterpret_cast<void (*)()>(call), parameters...);
    }
};

// A message's text, and its insertions as a broker reads them.
std::string noted;
CMPIString* noteMessage(const char* text, CMPICount count, std::va_list& list) {
    std::ostringstream out;
    out << text;
    for (CMPICount i = 0; i < count; ++i) {
        const int type = va_arg(list, int);
        out << ' ' << std::hex << type << std::dec << '=';
        type == CMPI_sint32    ? out << va_arg(list, long)
        : type == CMPI_uint32  ? out << va_arg(list, unsigned long)
        : type == CMPI_sint64  ? out << va_arg(list, long long)
        : type == CMPI_uint64  ? out << va_arg(list, unsigned long long)
        : type == CMPI_real64  ? out << va_arg(list, double)
        : type == CMPI_boolean ? out << va_arg(list, int)
        : type == CMPI_chars   ? out << va_arg(list, const char*)
                               : out << bits(va_arg(list, const CMPIString*));
    }
    noted += out.str() + "\n";
    return value<CMPIString*>(resultNumber);
}
// Templates cannot tell a variable argument list from a fixed one in every compiler: these are written out.
#define NOTE_MESSAGE(slot, ...)                                                                  \
    template <>                                                                                  \
    struct Fake<&CMPIBrokerEncFT::slot> {                                                        \
        static CMPIString* call(const CMPIBroker*, const char* /*id*/, __VA_ARGS__, CMPIStatus*, \
                                CMPICount count, ...) {                                          \
            std::va_list list;                                                                   \
            va_start(list, count);                                                               \
            CMPIString* const made = noteMessage(text, count, list);                             \
            va_end(list);                                                                        \
            return made;                                                                         \
        }                                                                                        \
    };
NOTE_MESSAGE(getMessage, const char* text)
#if CMPI_VERSION >= 200
NOTE_MESSAGE(getMessage2, CMPIMsgFileHandle, const char* text)
#endif

// Every slot is filled, so that a name that calls the wrong one is found out and does not crash.
#define TABLE(table)                             \
    [[maybe_unused]] table& fake(const table*) { \
        static table functions{};
#define SLOT(table, slot) functions.slot = Fake<&table::slot>::call;
#define END_TABLE()   \
    return functions; \
    }
#include "CmpiStandard.inc"

// An object with fake functions.
template <class Record>
Record& fakeObject() {
    static Record record{};
    if constexpr (std::is_same_v<Record, CMPIBroker>) {
        record.bft = &fake(record.bft);
        record.eft = &fake(record.eft);
#if CMPI_VERSION >= 200
        record.mft = &fake(record.mft);
#endif
    } else {
        record.ft = &fake(record.ft);
    }
    return record;
}

// Expects that `use` calls `function` with all its arguments in their order, and returns its result. The
// parameters of `use` come from the list: a name that takes or returns another type does not compile.
template <class Return, class Record, class... Rest, std::size_t... positions>
void expectCall(const char* name, void (*function)(), Return (*use)(Record*, Rest...),
                std::index_sequence<positions...> /*of the rest*/) {
    const std::tuple<Record*, Rest...> arguments{&fakeObject<std::remove_const_t<Record>>(),
                                                 value<Rest>(positions + 1)...};
    seen = {};
    if constexpr (std::is_void_v<Return>) {
        std::apply(use, arguments);
    } else {
        EXPECT_EQ(bits(std::apply(use, arguments)), bits(value<Return>(resultNumber))) << name;
    }
    EXPECT_EQ(seen.function, function) << name;
    EXPECT_EQ(seen.arguments, std::apply([](auto... all) { return Bits{bits(all)...}; }, arguments)) << name;
}
template <class Return, class Record, class... Rest>
void expectCall(const char* name, void (*function)(), Return (*use)(Record*, Rest...)) {
    expectCall(name, function, use, std::index_sequence_for<Rest...>());
}

class ConvenienceNamesTest : public testing::TestWithParam<const Uses*> {
protected:
    const Uses& uses_ = *GetParam();
    const CMPIBroker* const broker_ = &fakeObject<CMPIBroker>();
    CMPIString* const string_ = &fakeObject<CMPIString>();
};

// A provider as a class, which fails whatever it is asked for.

bool constructorFails = false;
int aliveProviders = 0;

class Provider {
public:
    Provider(const CMPIBroker*, const CMPIContext*) {
        if (constructorFails) {
            throw std::runtime_error("constructor");
        }
        ++aliveProviders;
    }
    Provider(const Provider&) = delete;
    Provider& operator=(const Provider&) = delete;
    ~Provider() { --aliveProviders; }

#define STUB(slot, function, parameters)    \
    template <class... Parameters>          \
    CMPIStatus slot(Parameters...) {        \
        called(#slot);                      \
        throw std::runtime_error("failed"); \
    }
#include "CmpiStandard.inc"
};

template <class MI, class... Parameters>
CMPIStatus callWithNothing(CMPIStatus (*function)(MI*, Parameters...), MI* mi) {
    return function(mi, Parameters{}...);
}

// Calls every function of a provider that serves clients; they all fail.
std::string calledSlots;
template <class MI>
void callSlots(MI* mi) {
    std::string expected;
    calledSlots.clear();
    forEachSlot(*mi->ft, [&](std::string_view name, auto function) {
        const std::string slot(name.substr(name.find('.') + 1));
        if constexpr (!std::is_invocable_v<decltype(function), MI*, const CMPIContext*, CMPIBoolean>) {
            if (function != nullptr) { // else it is of a later version
                expected += slot + " ";
                EXPECT_EQ(callWithNothing(function, mi).rc, CMPI_RC_ERR_FAILED) << slot;
            }
        }
    });
    EXPECT_EQ(calledSlots, expected);
    EXPECT_NE(expected, "");
    EXPECT_EQ(mi->ft->cleanup(mi, nullptr, 0).rc, CMPI_RC_OK);
}

} // namespace

extern "C" void called(const char* slot) {
    calledSlots += std::string(slot) + " ";
}

CMProviderBase(TestProvider)
CMInstanceMIFactory(Provider, TestProvider)
CMAssociationMIFactory(Provider, TestProvider)
CMMethodMIFactory(Provider, TestProvider)
CMPropertyMIFactory(Provider, TestProvider)
CMIndicationMIFactory(Provider, TestProvider)
CMProviderBase(OtherProvider)
CMMethodMIFactory(Provider, OtherProvider)

TEST(FactoryTest, SharesOneObjectPerProviderName) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    constructorFails = true;
    EXPECT_EQ(TestProvider_Create_MethodMI(nullptr, nullptr, &status), nullptr);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_FAILED);
    constructorFails = false;
    CMPIMethodMI* const methods = TestProvider_Create_MethodMI(nullptr, nullptr, &status);
    EXPECT_EQ(status.rc, CMPI_RC_OK);
    CMPIInstanceMI* const instances = TestProvider_Create_InstanceMI(nullptr, nullptr, nullptr);
    CMPIMethodMI* const others = OtherProvider_Create_MethodMI(nullptr, nullptr, nullptr);
    EXPECT_EQ(aliveProviders, 2);
    EXPECT_STREQ(methods->ft->miName, "methodTestProvider");
    EXPECT_STREQ(others->ft->miName, "methodOtherProvider");

    others->ft->cleanup(others, nullptr, 0);
    EXPECT_EQ(aliveProviders, 1);
    instances->ft->cleanup(instances, nullptr, 0);
    EXPECT_EQ(aliveProviders, 1);
    EXPECT_EQ(methods->ft->cleanup(methods, nullptr, 0).rc, CMPI_RC_OK);
    EXPECT_EQ(aliveProviders, 0);
}

TEST(FactoryTest, FillsEverySlotAndCatchesExceptions) {
    callSlots(TestProvider_Create_InstanceMI(nullptr, nullptr, nullptr));
    callSlots(TestProvider_Create_AssociationMI(nullptr, nullptr, nullptr));
    callSlots(TestProvider_Create_MethodMI(nullptr, nullptr, nullptr));
    callSlots(TestProvider_Create_PropertyMI(nullptr, nullptr, nullptr));
    callSlots(TestProvider_Create_IndicationMI(nullptr, nullptr, nullptr));
    EXPECT_EQ(aliveProviders, 0);
}

TEST_P(ConvenienceNamesTest, StubsFillEverySlot) {
    CMPIStatus status = {CMPI_RC_ERROR, nullptr};
    callSlots(uses_.createInstance(broker_, nullptr, nullptr));
    callSlots(uses_.createAssociation(broker_, nullptr, nullptr));
    callSlots(uses_.createProperty(broker_, nullptr, &status));
    EXPECT_EQ(status.rc, CMPI_RC_OK);
    callSlots(uses_.createMethod(broker_, nullptr, &status));
    EXPECT_EQ(status.rc, CMPI_RC_ERR_ACCESS_DENIED) << "which the hook sets";
    calledSlots.clear();
    CMPIIndicationMI* const indications = uses_.createIndication(broker_, nullptr, nullptr);
    EXPECT_EQ(calledSlots, "factory ");
    callSlots(indications);
    EXPECT_EQ(std::string(indications->ft->miName).substr(0, 20), "indicationProviderIn");
}

TEST_P(ConvenienceNamesTest, CallTheirSlots) {
#define CALL(result, name, table, slot, parameters, body) \
    expectCall(#name, reinterpret_cast<void (*)()>(Fake<&table::slot>::call), uses_.call##name);
#include "CmpiStandard.inc"
}

TEST_P(ConvenienceNamesTest, WithoutASlotDoTheirWork) {
    CMPIBrokerFT& services = fake(broker_->bft);
    services.brokerCapabilities = CMPI_MB_Indications;
    services.brokerVersion = CMPICurrentVersion;
    services.brokerName = "name";
    string_->hdl = this;
    EXPECT_STREQ(uses_.failedExpectation(broker_, string_, value<CMPIString*>(resultNumber)), nullptr);
}

TEST_P(ConvenienceNamesTest, PassInsertionsOfMessages) {
    noted.clear();
    EXPECT_EQ(uses_.message(broker_, value<CMPIString*>(1)), value<CMPIString*>(resultNumber));
    const std::string insertions =
        " e0=-1 a0=4000000000 f0=-5000000000 b0=5000000000 c=0.5 2=1 1700=chars 1600=16\n";
    EXPECT_EQ(noted, (CMPI_VERSION >= 200 ? "file" + insertions : "") + "text" + insertions);
}

INSTANTIATE_TEST_SUITE_P(OfEachLanguage, ConvenienceNamesTest, testing::Values(&usesInC, &usesInCpp));
