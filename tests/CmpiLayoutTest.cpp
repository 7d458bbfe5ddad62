// What a CIM server and a provider that were compiled apart must agree on: sizes, offsets and codes of CMPI,
// as the standard fixes them on a 64-bit machine. All of it is checked by the compiler, for the version it is
// compiled with.
#include "CmpiSlots.h"

#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>
#include <cmpios.h>
#include <cmpipl.h>

#include <cstddef>
#include <gtest/gtest.h>
#include <stdexcept>
#include <string>
#include <string_view>
#include <type_traits>

namespace {

constexpr std::size_t byVersion(std::size_t size100, std::size_t size200, std::size_t size210) {
    return CMPI_VERSION >= 210 ? size210 : CMPI_VERSION >= 200 ? size200 : size100;
}

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

#define MEMBER(record, member, offset, ...)                                   \
    static_assert(offsetof(record, member) == (offset), #record "." #member); \
    static_assert(are<decltype(record::member), __VA_ARGS__>, #record "." #member " type")

MEMBER(CMPIValuePtr, ptr, 0, void*);
MEMBER(CMPIValuePtr, length, 8, CMPICount);
MEMBER(CMPIData, type, 0, CMPIType);
MEMBER(CMPIData, state, 2, CMPIValueState);
MEMBER(CMPIData, value, 8, CMPIValue);
static_assert(sizeof(CMPIData) == 24);
MEMBER(CMPIStatus, rc, 0, CMPIrc);
MEMBER(CMPIStatus, msg, 8, CMPIString*);
static_assert(sizeof(CMPIStatus) == 16);

// Codes

// Whether codes follow one another, in steps.
template <class... Codes>
constexpr bool follow(int first, int step, Codes... codes) {
    int next = first - step;
    return ((static_cast<int>(codes) == (next += step)) && ...);
}

static_assert(follow(0, 2, CMPI_null, CMPI_boolean) && follow(2, 1, CMPI_boolean, CMPI_char16));
static_assert(follow(0x0008, 0x0004, CMPI_real32, CMPI_real64));
static_assert(follow(0x0080, 0x0010, CMPI_uint8, CMPI_uint16, CMPI_uint32, CMPI_uint64, CMPI_sint8,
                     CMPI_sint16, CMPI_sint32, CMPI_sint64));
static_assert(follow(0x1000, 0x0100, CMPI_instance, CMPI_ref, CMPI_args, CMPI_class, CMPI_filter,
                     CMPI_enumeration, CMPI_string, CMPI_chars, CMPI_dateTime, CMPI_ptr, CMPI_charsptr));
static_assert(follow(0x2000, 2, CMPI_ARRAY, CMPI_booleanA) && follow(0x2002, 1, CMPI_booleanA, CMPI_char16A));
static_assert(follow(0x2008, 0x0004, CMPI_real32A, CMPI_real64A));
static_assert(follow(0x2080, 0x0010, CMPI_uint8A, CMPI_uint16A, CMPI_uint32A, CMPI_uint64A, CMPI_sint8A,
                     CMPI_sint16A, CMPI_sint32A, CMPI_sint64A));
static_assert(follow(0x3000, 0x0100, CMPI_instanceA, CMPI_refA, CMPI_argsA, CMPI_classA, CMPI_filterA,
                     CMPI_enumerationA, CMPI_stringA, CMPI_charsA, CMPI_dateTimeA, CMPI_ptrA,
                     CMPI_charsptrA));
static_assert(CMPI_SIMPLE == 0x0002 && CMPI_REAL == 0x0008 && CMPI_UINT == 0x0080 && CMPI_SINT == 0x00C0);
static_assert(CMPI_INTEGER == 0x00C0 && CMPI_ENC == 0x1000);
static_assert(CMPI_keyInteger == CMPI_sint64 && CMPI_keyString == CMPI_string);
static_assert(CMPI_keyBoolean == CMPI_boolean);
static_assert(CMPI_goodValue == 0 && CMPI_nullValue == 0x0100 && CMPI_keyValue == 0x0200);
static_assert(CMPI_notFound == 0x0400 && CMPI_badValue == 0x8000);
static_assert(follow(0, 1, CMPI_RC_OK, CMPI_RC_ERR_FAILED, CMPI_RC_ERR_ACCESS_DENIED,
                     CMPI_RC_ERR_INVALID_NAMESPACE, CMPI_RC_ERR_INVALID_PARAMETER, CMPI_RC_ERR_INVALID_CLASS,
                     CMPI_RC_ERR_NOT_FOUND, CMPI_RC_ERR_NOT_SUPPORTED, CMPI_RC_ERR_CLASS_HAS_CHILDREN,
                     CMPI_RC_ERR_CLASS_HAS_INSTANCES, CMPI_RC_ERR_INVALID_SUPERCLASS,
                     CMPI_RC_ERR_ALREADY_EXISTS, CMPI_RC_ERR_NO_SUCH_PROPERTY, CMPI_RC_ERR_TYPE_MISMATCH,
                     CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, CMPI_RC_ERR_INVALID_QUERY,
                     CMPI_RC_ERR_METHOD_NOT_AVAILABLE, CMPI_RC_ERR_METHOD_NOT_FOUND));
static_assert(follow(50, 1, CMPI_RC_DO_NOT_UNLOAD, CMPI_RC_NEVER_UNLOAD));
static_assert(follow(60, 1, CMPI_RC_ERR_INVALID_HANDLE, CMPI_RC_ERR_INVALID_DATA_TYPE));
static_assert(follow(100, 100, CMPI_RC_ERROR_SYSTEM, CMPI_RC_ERROR));
static_assert(follow(1, 1, CMPI_SEV_ERROR, CMPI_SEV_INFO, CMPI_SEV_WARNING, CMPI_DEV_DEBUG));
static_assert(follow(1, 1, CMPI_LEV_INFO, CMPI_LEV_WARNING, CMPI_LEV_VERBOSE));
static_assert(follow(0, 1, CMPI_COND_DOC, CMPI_COND_COD));
static_assert(follow(1, 1, CMPI_PredOp_Equals, CMPI_PredOp_NotEquals, CMPI_PredOp_LessThan,
                     CMPI_PredOp_GreaterThanOrEquals, CMPI_PredOp_GreaterThan, CMPI_PredOp_LessThanOrEquals,
                     CMPI_PredOp_Isa, CMPI_PredOp_NotIsa, CMPI_PredOp_Like, CMPI_PredOp_NotLike));
#if CMPI_VERSION >= 200
static_assert(follow(11, 1, CMPI_PredOp_Not_Null, CMPI_PredOp_Null, CMPI_PredOp_And, CMPI_PredOp_Or));
#endif
static_assert(ErrorSevUnknown == 0 && follow(2, 1, ErrorSevLow, ErrorSevMedium, ErrorSevHigh, ErrorSevFatal));
static_assert(follow(0, 1, CMPIErrSrcUnknown, CMPIErrSrcOther, CIMObjectHandle));
static_assert(follow(0, 1, UnknownErrorType, OtherErrorType, CommunicationsError, QualityOfServiceError,
                     SoftwareError, HardwareError, EnvironmentalError, SecurityError, OversubscriptionError,
                     UnavailableResourceError, UnsupportedOperationError));
static_assert(follow(0, 1, ErrorProbCauseUnknown, ErrorProbCauseOther));
static_assert(follow(1, 1, CMPI_CPID_SYSTEM, CMPI_CPID_USASCII, CMPI_CPID_UTF16));
static_assert(CMPIVersion100 == 100 && CMPIVersion200 == 200 && CMPIVersion210 == 210);
static_assert(CMPICurrentVersion == CMPI_VERSION);
static_assert(std::string_view(CMPIInitNameSpace) == "CMPIInitNameSpace");
static_assert(std::string_view(CMPIInvocationFlags) == "CMPIInvocationFlags");
static_assert(std::string_view(CMPIPrincipal) == "CMPIPrincipal");
static_assert(std::string_view(CMPIRole) == "CMPIRole");
static_assert(std::string_view(CMPIAcceptLanguage) == "CMPIAcceptLanguage");
static_assert(std::string_view(CMPIContentLanguage) == "CMPIContentLanguage");

// Records and function tables

MEMBER(CMPIBroker, hdl, 0, CMPI_CONST_SINCE_210 void*);
MEMBER(CMPIBroker, bft, 8, CMPI_CONST_SINCE_210 CMPIBrokerFT*);
MEMBER(CMPIBroker, eft, 16, CMPI_CONST_SINCE_210 CMPIBrokerEncFT*);
MEMBER(CMPIBroker, xft, 24, CMPI_CONST_SINCE_210 CMPIBrokerExtFT*);
#if CMPI_VERSION >= 200
MEMBER(CMPIBroker, mft, 32, CMPI_CONST_SINCE_210 CMPIBrokerMemFT*);
#endif
static_assert(sizeof(CMPIBroker) == byVersion(32, 40, 40));

// A value of each type that a table holds, to be told from none.
template <class Type>
constexpr Type some = 1;
template <>
constexpr const char* some<const char*> = "";
template <class Return, class... Parameters>
Return function(Parameters...) {
    throw 0;
}
template <class Return, class... Parameters>
constexpr auto some<Return (*)(Parameters...)> = &function<Return, Parameters...>;
template <class Return, class... Parameters>
Return variadicFunction(Parameters..., ...) {
    throw 0;
}
template <class Return, class... Parameters>
constexpr auto some<Return (*)(Parameters..., ...)> = &variadicFunction<Return, Parameters...>;

// Whether a table consists of these members in this order. As every slot is as wide as a pointer, the size
// leaves each of them one offset.
template <class Table, class... Types>
constexpr bool areAll(Types Table::*... members) {
    std::size_t next = 0;
    const auto isNext = [&next](auto member) {
        std::size_t i = 0;
        const Table table = {(i++ == next ? some<Types> : Types{})...};
        ++next;
        return table.*member != std::decay_t<decltype(table.*member)>{};
    };
    return (isNext(members) && ...);
}
template <class Table, auto... slots, class... Heads>
constexpr bool consistsOf(std::size_t size, Slots<slots...> /*behind the heads*/, Heads Table::*... heads) {
    return sizeof(Table) == size && areAll(heads..., slots...);
}

template <class Record>
using TableOf = std::remove_const_t<std::remove_pointer_t<decltype(Record::ft)>>;

template <class Record>
constexpr bool isRecord() {
    return offsetof(Record, hdl) == 0 && offsetof(Record, ft) == 8 && sizeof(Record) == 16 &&
           are<CMPI_CONST_SINCE_210 void*, decltype(Record::hdl)> &&
           are<CMPI_CONST_SINCE_210 TableOf<Record>*, decltype(Record::ft)> &&
           are<CMPIVersion, decltype(TableOf<Record>::ftVersion)>;
}

template <class Record, class List>
constexpr bool isObject(std::size_t size, List slots) {
    using Table = TableOf<Record>;
    return isRecord<Record>() && consistsOf(size, slots, &Table::ftVersion, &Table::release, &Table::clone);
}

template <class Record, class List>
constexpr bool isMi(std::size_t size, List slots) {
    using Table = TableOf<Record>;
    return isRecord<Record>() && are<int, decltype(Table::miVersion)> &&
           consistsOf(size, slots, &Table::ftVersion, &Table::miVersion, &Table::miName, &Table::cleanup);
}

static_assert(consistsOf(byVersion(160, 160, 184), RequestSlots(), &CMPIBrokerFT::brokerCapabilities,
                         &CMPIBrokerFT::brokerVersion, &CMPIBrokerFT::brokerName));
static_assert(consistsOf(byVersion(136, 168, 192), EncapsulationSlots(), &CMPIBrokerEncFT::ftVersion));
static_assert(consistsOf(byVersion(168, 168, 200), SystemSlots(), &CMPIBrokerExtFT::ftVersion));
static_assert(consistsOf(byVersion(120, 120, 128), MemorySlots(), &CMPIBrokerMemFT::ftVersion));
static_assert(isObject<CMPIContext>(56, ContextSlots()));
static_assert(isObject<CMPIResult>(byVersion(56, 64, 64), ResultSlots()));
static_assert(isObject<CMPIString>(byVersion(32, 32, 40), StringSlots()));
static_assert(isObject<CMPIArray>(56, ArraySlots()));
static_assert(isObject<CMPIEnumeration>(48, EnumerationSlots()));
static_assert(isObject<CMPIInstance>(byVersion(80, 88, 88), InstanceSlots()));
static_assert(isObject<CMPIObjectPath>(160, ObjectPathSlots()));
static_assert(isObject<CMPIArgs>(56, ArgsSlots()));
static_assert(isObject<CMPIDateTime>(48, DateTimeSlots()));
static_assert(isObject<CMPIError>(216, ErrorSlots()));
#if CMPI_VERSION >= 210
static_assert(isObject<CMPIPropertyList>(40, PropertyListSlots()));
static_assert(isObject<CMPIEnumerationFilter>(32, EnumerationFilterSlots()));
#endif
static_assert(isMi<CMPIInstanceMI>(byVersion(80, 80, 88), InstanceMISlots()));
static_assert(isMi<CMPIAssociationMI>(byVersion(56, 56, 72), AssociationMISlots()));
static_assert(isMi<CMPIMethodMI>(32, MethodMISlots()));
static_assert(isMi<CMPIPropertyMI>(40, PropertyMISlots()));
static_assert(isMi<CMPIIndicationMI>(72, IndicationMISlots()));

// What a slot takes is held by the broker's functions and the provider in C, which do not compile with other
// types. A number that it returns would be converted.
template <class Result, class Table, class... Parameters>
Result resultOf(Result (*Table::*slot)(Parameters...));
template <class Result, auto... slots>
constexpr bool return_ = are<Result, decltype(resultOf(slots))...>;

static_assert(
    return_<CMPICount, &CMPIContextFT::getEntryCount, &CMPIArrayFT::getSize,
            &CMPIInstanceFT::getPropertyCount, &CMPIObjectPathFT::getKeyCount, &CMPIArgsFT::getArgCount>);
static_assert(return_<CMPIBoolean, &CMPIBrokerEncFT::classPathIsA, &CMPIBrokerEncFT::isOfType,
                      &CMPIEnumerationFT::hasNext, &CMPIDateTimeFT::isInterval>);
static_assert(return_<CMPIType, &CMPIArrayFT::getSimpleType> &&
              return_<CMPIUint64, &CMPIDateTimeFT::getBinaryFormat>);
static_assert(return_<CMPI_CONST_SINCE_210 char*, &CMPIStringFT::getCharPtr>);
static_assert(are<CMPIVersion, decltype(CMPIBrokerFT::brokerVersion), decltype(CMPIBrokerEncFT::ftVersion),
                  decltype(CMPIBrokerExtFT::ftVersion), decltype(CMPIBrokerMemFT::ftVersion)>);
static_assert(are<unsigned int, decltype(CMPIBrokerFT::brokerCapabilities)>);
#if CMPI_VERSION >= 210
// What has no function behind it.
#define REQUEST_OF(kind) CMPI##kind##MI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*
#define FILTER const char**, const char*, const char*
static_assert(are<decltype(CMPIInstanceMIFT::enumerateInstancesFiltered),
                  CMPIStatus (*)(REQUEST_OF(Instance), FILTER, CMPIStatus*)>);
static_assert(are<decltype(CMPIAssociationMIFT::associatorsFiltered),
                  CMPIStatus (*)(REQUEST_OF(Association), const char*, const char*, const char*, const char*,
                                 FILTER, CMPIBoolean)>);
static_assert(are<decltype(CMPIAssociationMIFT::referencesFiltered),
                  CMPIStatus (*)(REQUEST_OF(Association), const char*, const char*, FILTER, CMPIBoolean)>);
static_assert(are<decltype(CMPIEnumerationFilterFT::match),
                  CMPIBoolean (*)(const CMPIEnumerationFilter*, const CMPIInstance*, CMPIStatus*)>);
static_assert(return_<CMPIBoolean, &CMPIPropertyListFT::isPropertyInList>);
#endif

// A provider as a class, which fails whatever it is asked for.

bool constructorFails = false;
int aliveProviders = 0;
std::string calledFunctions;

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

#define FAILS(function)                     \
    template <class... Parameters>          \
    CMPIStatus function(Parameters...) {    \
        calledFunctions += #function " ";   \
        throw std::runtime_error("failed"); \
    }
    FAILS(enumerateInstanceNames)
    FAILS(enumerateInstances)
    FAILS(getInstance)
    FAILS(createInstance)
    FAILS(modifyInstance)
    FAILS(deleteInstance)
    FAILS(execQuery)
    FAILS(associators)
    FAILS(associatorNames)
    FAILS(references)
    FAILS(referenceNames)
    FAILS(invokeMethod)
    FAILS(setProperty)
    FAILS(getProperty)
    FAILS(authorizeFilter)
    FAILS(mustPoll)
    FAILS(activateFilter)
    FAILS(deActivateFilter)
    FAILS(enableIndications)
    FAILS(disableIndications)
};

template <class MI, class Table, class... Parameters>
void callSlot(MI* mi, CMPIStatus (*Table::*slot)(MI*, Parameters...)) {
    if (mi->ft->*slot != nullptr) { // the filtered requests have no function
        EXPECT_EQ((mi->ft->*slot)(mi, Parameters{}...).rc, CMPI_RC_ERR_FAILED);
    }
}
template <class MI, auto... slots>
void callSlots(MI* mi, Slots<slots...> /*of the table*/) {
    (callSlot(mi, slots), ...);
}

} // namespace

CMProviderBase(TestProvider)
CMInstanceMIFactory(Provider, TestProvider)
CMAssociationMIFactory(Provider, TestProvider)
CMMethodMIFactory(Provider, TestProvider)
CMPropertyMIFactory(Provider, TestProvider)
CMIndicationMIFactory(Provider, TestProvider)
CMProviderBase(OtherProvider)
CMMethodMIFactory(Provider, OtherProvider)

TEST(AProviderFactory, SharesOneObjectAmongTheKindsOfOneName) {
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

TEST(AProviderFactory, FillsEachSlotWithItsFunctionWhichLetsNoExceptionOut) {
    callSlots(TestProvider_Create_InstanceMI(nullptr, nullptr, nullptr), InstanceMISlots());
    callSlots(TestProvider_Create_AssociationMI(nullptr, nullptr, nullptr), AssociationMISlots());
    callSlots(TestProvider_Create_MethodMI(nullptr, nullptr, nullptr), MethodMISlots());
    callSlots(TestProvider_Create_PropertyMI(nullptr, nullptr, nullptr), PropertyMISlots());
    CMPIIndicationMI* const indications = TestProvider_Create_IndicationMI(nullptr, nullptr, nullptr);
    callSlots(indications, IndicationMISlots());
    EXPECT_EQ(calledFunctions,
              "enumerateInstanceNames enumerateInstances getInstance createInstance modifyInstance "
              "deleteInstance execQuery associators associatorNames references referenceNames "
              "invokeMethod setProperty getProperty authorizeFilter mustPoll activateFilter "
              "deActivateFilter enableIndications disableIndications ");
    for (int kind = 0; kind < 5; ++kind) {
        indications->ft->cleanup(indications, nullptr, 0);
    }
    EXPECT_EQ(aliveProviders, 0);
}
