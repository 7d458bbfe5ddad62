// What a CIM server and a provider that were compiled apart must agree on: sizes, offsets, signatures and
// codes of CMPI, as the standard fixes them on a 64-bit machine. Everything here is checked by the compiler,
// for the version it is compiled with.
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>
#include <cmpios.h>
#include <cmpipl.h>

#include <cstddef>
#include <gtest/gtest.h>
#include <stdexcept>
#include <string_view>
#include <type_traits>

namespace {

constexpr std::size_t byVersion(std::size_t size100, std::size_t size200, std::size_t size210) {
    return CMPI_VERSION >= 210 ? size210 : CMPI_VERSION >= 200 ? size200 : size100;
}

#define SAME(name, ...) static_assert(std::is_same_v<name, __VA_ARGS__>, #name)
#define SLOT(record, member, offset, ...)                                     \
    static_assert(offsetof(record, member) == (offset), #record "." #member); \
    static_assert(std::is_same_v<decltype(record::member), __VA_ARGS__>, #record "." #member " type")
#define MEMBER(member, type)                                  \
    static_assert(offsetof(CMPIValue, member) == 0, #member); \
    static_assert(std::is_same_v<decltype(CMPIValue::member), type>, #member)
#define CODE(name, value) static_assert(static_cast<int>(name) == (value), #name)

// Scalars and values

SAME(CMPIBoolean, unsigned char);
SAME(CMPIChar16, unsigned short);
SAME(CMPIUint8, unsigned char);
SAME(CMPIUint16, unsigned short);
SAME(CMPIUint32, unsigned int);
SAME(CMPIUint64, unsigned long long);
SAME(CMPISint8, signed char);
SAME(CMPISint16, short);
SAME(CMPISint32, int);
SAME(CMPISint64, long long);
SAME(CMPIReal32, float);
SAME(CMPIReal64, double);
SAME(CMPICount, unsigned int);
SAME(CMPIVersion, int);
SAME(CMPIFlags, unsigned int);
SAME(CMPIType, unsigned short);
SAME(CMPIValueState, unsigned short);
SAME(CMPI_THREAD_TYPE, void*);
SAME(CMPI_THREAD_RETURN, void*);
SAME(CMPI_MUTEX_TYPE, void*);
SAME(CMPI_COND_TYPE, void*);
SAME(CMPI_THREAD_KEY_TYPE, pthread_key_t);
SAME(CMPIMsgFileHandle, void*);

MEMBER(boolean, CMPIBoolean);
MEMBER(char16, CMPIChar16);
MEMBER(uint8, CMPIUint8);
MEMBER(uint16, CMPIUint16);
MEMBER(uint32, CMPIUint32);
MEMBER(uint64, CMPIUint64);
MEMBER(sint8, CMPISint8);
MEMBER(sint16, CMPISint16);
MEMBER(sint32, CMPISint32);
MEMBER(sint64, CMPISint64);
MEMBER(real32, CMPIReal32);
MEMBER(real64, CMPIReal64);
MEMBER(inst, CMPIInstance*);
MEMBER(ref, CMPIObjectPath*);
MEMBER(args, CMPIArgs*);
MEMBER(filter, CMPISelectExp*);
MEMBER(Enum, CMPIEnumeration*);
MEMBER(array, CMPIArray*);
MEMBER(string, CMPIString*);
MEMBER(chars, char*);
MEMBER(dateTime, CMPIDateTime*);
MEMBER(dataPtr, CMPIValuePtr);
static_assert(sizeof(CMPIValue) == 16);
SLOT(CMPIValuePtr, ptr, 0, void*);
SLOT(CMPIValuePtr, length, 8, CMPICount);
SLOT(CMPIData, type, 0, CMPIType);
SLOT(CMPIData, state, 2, CMPIValueState);
SLOT(CMPIData, value, 8, CMPIValue);
static_assert(sizeof(CMPIData) == 24);
SLOT(CMPIStatus, rc, 0, CMPIrc);
SLOT(CMPIStatus, msg, 8, CMPIString*);
static_assert(sizeof(CMPIStatus) == 16);

// Codes

CODE(CMPI_null, 0);
CODE(CMPI_boolean, 0x0002);
CODE(CMPI_char16, 0x0003);
CODE(CMPI_real32, 0x0008);
CODE(CMPI_real64, 0x000C);
CODE(CMPI_uint8, 0x0080);
CODE(CMPI_uint16, 0x0090);
CODE(CMPI_uint32, 0x00A0);
CODE(CMPI_uint64, 0x00B0);
CODE(CMPI_sint8, 0x00C0);
CODE(CMPI_sint16, 0x00D0);
CODE(CMPI_sint32, 0x00E0);
CODE(CMPI_sint64, 0x00F0);
CODE(CMPI_instance, 0x1000);
CODE(CMPI_ref, 0x1100);
CODE(CMPI_args, 0x1200);
CODE(CMPI_class, 0x1300);
CODE(CMPI_filter, 0x1400);
CODE(CMPI_enumeration, 0x1500);
CODE(CMPI_string, 0x1600);
CODE(CMPI_chars, 0x1700);
CODE(CMPI_dateTime, 0x1800);
CODE(CMPI_ptr, 0x1900);
CODE(CMPI_charsptr, 0x1A00);
CODE(CMPI_ARRAY, 0x2000);

CODE(CMPI_booleanA, 0x2002);
CODE(CMPI_char16A, 0x2003);
CODE(CMPI_real32A, 0x2008);
CODE(CMPI_real64A, 0x200C);
CODE(CMPI_uint8A, 0x2080);
CODE(CMPI_uint16A, 0x2090);
CODE(CMPI_uint32A, 0x20A0);
CODE(CMPI_uint64A, 0x20B0);
CODE(CMPI_sint8A, 0x20C0);
CODE(CMPI_sint16A, 0x20D0);
CODE(CMPI_sint32A, 0x20E0);
CODE(CMPI_sint64A, 0x20F0);
CODE(CMPI_instanceA, 0x3000);
CODE(CMPI_refA, 0x3100);
CODE(CMPI_argsA, 0x3200);
CODE(CMPI_classA, 0x3300);
CODE(CMPI_filterA, 0x3400);
CODE(CMPI_enumerationA, 0x3500);
CODE(CMPI_stringA, 0x3600);
CODE(CMPI_charsA, 0x3700);
CODE(CMPI_dateTimeA, 0x3800);
CODE(CMPI_ptrA, 0x3900);
CODE(CMPI_charsptrA, 0x3A00);

CODE(CMPI_SIMPLE, 0x0002);
CODE(CMPI_REAL, 0x0008);
CODE(CMPI_UINT, 0x0080);
CODE(CMPI_SINT, 0x00C0);
CODE(CMPI_INTEGER, 0x00C0);
CODE(CMPI_ENC, 0x1000);
CODE(CMPI_goodValue, 0);
CODE(CMPI_nullValue, 0x0100);
CODE(CMPI_keyValue, 0x0200);
CODE(CMPI_notFound, 0x0400);
CODE(CMPI_badValue, 0x8000);

CODE(CMPI_RC_OK, 0);
CODE(CMPI_RC_ERR_FAILED, 1);
CODE(CMPI_RC_ERR_ACCESS_DENIED, 2);
CODE(CMPI_RC_ERR_INVALID_NAMESPACE, 3);
CODE(CMPI_RC_ERR_INVALID_PARAMETER, 4);
CODE(CMPI_RC_ERR_INVALID_CLASS, 5);
CODE(CMPI_RC_ERR_NOT_FOUND, 6);
CODE(CMPI_RC_ERR_NOT_SUPPORTED, 7);
CODE(CMPI_RC_ERR_CLASS_HAS_CHILDREN, 8);
CODE(CMPI_RC_ERR_CLASS_HAS_INSTANCES, 9);
CODE(CMPI_RC_ERR_INVALID_SUPERCLASS, 10);
CODE(CMPI_RC_ERR_ALREADY_EXISTS, 11);
CODE(CMPI_RC_ERR_NO_SUCH_PROPERTY, 12);
CODE(CMPI_RC_ERR_TYPE_MISMATCH, 13);
CODE(CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, 14);
CODE(CMPI_RC_ERR_INVALID_QUERY, 15);
CODE(CMPI_RC_ERR_METHOD_NOT_AVAILABLE, 16);
CODE(CMPI_RC_ERR_METHOD_NOT_FOUND, 17);
CODE(CMPI_RC_DO_NOT_UNLOAD, 50);
CODE(CMPI_RC_NEVER_UNLOAD, 51);
CODE(CMPI_RC_ERR_INVALID_HANDLE, 60);
CODE(CMPI_RC_ERR_INVALID_DATA_TYPE, 61);
CODE(CMPI_RC_ERROR_SYSTEM, 100);
CODE(CMPI_RC_ERROR, 200);

CODE(CMPI_SEV_ERROR, 1);
CODE(CMPI_SEV_INFO, 2);
CODE(CMPI_SEV_WARNING, 3);
CODE(CMPI_DEV_DEBUG, 4);
CODE(CMPI_LEV_INFO, 1);
CODE(CMPI_LEV_WARNING, 2);
CODE(CMPI_LEV_VERBOSE, 3);
CODE(CMPI_COND_DOC, 0);
CODE(CMPI_COND_COD, 1);
CODE(CMPI_PredOp_Equals, 1);
CODE(CMPI_PredOp_NotEquals, 2);
CODE(CMPI_PredOp_LessThan, 3);
CODE(CMPI_PredOp_GreaterThanOrEquals, 4);
CODE(CMPI_PredOp_GreaterThan, 5);
CODE(CMPI_PredOp_LessThanOrEquals, 6);
CODE(CMPI_PredOp_Isa, 7);
CODE(CMPI_PredOp_NotIsa, 8);
CODE(CMPI_PredOp_Like, 9);
CODE(CMPI_PredOp_NotLike, 10);
#if CMPI_VERSION >= 200
CODE(CMPI_PredOp_Not_Null, 11);
CODE(CMPI_PredOp_Null, 12);
CODE(CMPI_PredOp_And, 13);
CODE(CMPI_PredOp_Or, 14);
#endif
CODE(ErrorSevUnknown, 0);
CODE(ErrorSevLow, 2);
CODE(ErrorSevMedium, 3);
CODE(ErrorSevHigh, 4);
CODE(ErrorSevFatal, 5);
CODE(CMPIErrSrcUnknown, 0);
CODE(CMPIErrSrcOther, 1);
CODE(CIMObjectHandle, 2);
CODE(UnknownErrorType, 0);
CODE(OtherErrorType, 1);
CODE(CommunicationsError, 2);
CODE(QualityOfServiceError, 3);
CODE(SoftwareError, 4);
CODE(HardwareError, 5);
CODE(EnvironmentalError, 6);
CODE(SecurityError, 7);
CODE(OversubscriptionError, 8);
CODE(UnavailableResourceError, 9);
CODE(UnsupportedOperationError, 10);
CODE(ErrorProbCauseUnknown, 0);
CODE(ErrorProbCauseOther, 1);
CODE(CMPI_CPID_SYSTEM, 1);
CODE(CMPI_CPID_USASCII, 2);
CODE(CMPI_CPID_UTF16, 3);
CODE(CMPIVersion100, 100);
CODE(CMPIVersion200, 200);
CODE(CMPIVersion210, 210);
CODE(CMPICurrentVersion, CMPI_VERSION);
static_assert(std::string_view(CMPIInitNameSpace) == "CMPIInitNameSpace");
static_assert(std::string_view(CMPIInvocationFlags) == "CMPIInvocationFlags");
static_assert(std::string_view(CMPIPrincipal) == "CMPIPrincipal");
static_assert(std::string_view(CMPIRole) == "CMPIRole");
static_assert(std::string_view(CMPIAcceptLanguage) == "CMPIAcceptLanguage");
static_assert(std::string_view(CMPIContentLanguage) == "CMPIContentLanguage");

// Records and function tables

// clang-format off
SLOT(CMPIBroker, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIBroker, bft, 8, CMPI_CONST_SINCE_210 CMPIBrokerFT*);
SLOT(CMPIBroker, eft, 16, CMPI_CONST_SINCE_210 CMPIBrokerEncFT*);
SLOT(CMPIBroker, xft, 24, CMPI_CONST_SINCE_210 CMPIBrokerExtFT*);
#if CMPI_VERSION >= 200
SLOT(CMPIBroker, mft, 32, CMPI_CONST_SINCE_210 CMPIBrokerMemFT*);
#endif
static_assert(sizeof(CMPIBroker) == byVersion(32, 40, 40));

SLOT(CMPIBrokerFT, brokerCapabilities, 0, unsigned int);
SLOT(CMPIBrokerFT, brokerVersion, 4, CMPIVersion);
SLOT(CMPIBrokerFT, brokerName, 8, const char*);
SLOT(CMPIBrokerFT, prepareAttachThread, 16, CMPIContext* (*)(const CMPIBroker*, const CMPIContext*));
SLOT(CMPIBrokerFT, attachThread, 24, CMPIStatus (*)(const CMPIBroker*, const CMPIContext*));
SLOT(CMPIBrokerFT, detachThread, 32, CMPIStatus (*)(const CMPIBroker*, const CMPIContext*));
SLOT(CMPIBrokerFT, deliverIndication, 40, CMPIStatus (*)(const CMPIBroker*, const CMPIContext*, const char*, const CMPIInstance*));
SLOT(CMPIBrokerFT, enumerateInstanceNames, 48, CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, CMPIStatus*));
SLOT(CMPIBrokerFT, getInstance, 56, CMPIInstance* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char**, CMPIStatus*));
SLOT(CMPIBrokerFT, createInstance, 64, CMPIObjectPath* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const CMPIInstance*, CMPIStatus*));
SLOT(CMPIBrokerFT, modifyInstance, 72, CMPIStatus (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const CMPIInstance*, const char**));
SLOT(CMPIBrokerFT, deleteInstance, 80, CMPIStatus (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*));
SLOT(CMPIBrokerFT, execQuery, 88, CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char*, const char*, CMPIStatus*));
SLOT(CMPIBrokerFT, enumerateInstances, 96, CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char**, CMPIStatus*));
SLOT(CMPIBrokerFT, associators, 104, CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char*, const char*, const char*, const char*, const char**, CMPIStatus*));
SLOT(CMPIBrokerFT, associatorNames, 112, CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char*, const char*, const char*, const char*, CMPIStatus*));
SLOT(CMPIBrokerFT, references, 120, CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char*, const char*, const char**, CMPIStatus*));
SLOT(CMPIBrokerFT, referenceNames, 128, CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char*, const char*, CMPIStatus*));
SLOT(CMPIBrokerFT, invokeMethod, 136, CMPIData (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char*, const CMPIArgs*, CMPIArgs*, CMPIStatus*));
SLOT(CMPIBrokerFT, setProperty, 144, CMPIStatus (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char*, const CMPIValue*, CMPIType));
SLOT(CMPIBrokerFT, getProperty, 152, CMPIData (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char*, CMPIStatus*));
#if CMPI_VERSION >= 210
SLOT(CMPIBrokerFT, enumerateInstancesFiltered, 160, CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char**, const char*, const char*, CMPIStatus*));
SLOT(CMPIBrokerFT, associatorsFiltered, 168, CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char*, const char*, const char*, const char*, const char**, const char*, const char*, CMPIStatus*));
SLOT(CMPIBrokerFT, referencesFiltered, 176, CMPIEnumeration* (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*, const char*, const char*, const char**, const char*, const char*, CMPIStatus*));
#endif
static_assert(sizeof(CMPIBrokerFT) == byVersion(160, 160, 184));

SLOT(CMPIBrokerEncFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIBrokerEncFT, newInstance, 8, CMPIInstance* (*)(const CMPIBroker*, const CMPIObjectPath*, CMPIStatus*));
SLOT(CMPIBrokerEncFT, newObjectPath, 16, CMPIObjectPath* (*)(const CMPIBroker*, const char*, const char*, CMPIStatus*));
SLOT(CMPIBrokerEncFT, newArgs, 24, CMPIArgs* (*)(const CMPIBroker*, CMPIStatus*));
SLOT(CMPIBrokerEncFT, newString, 32, CMPIString* (*)(const CMPIBroker*, const char*, CMPIStatus*));
SLOT(CMPIBrokerEncFT, newArray, 40, CMPIArray* (*)(const CMPIBroker*, CMPICount, CMPIType, CMPIStatus*));
SLOT(CMPIBrokerEncFT, newDateTime, 48, CMPIDateTime* (*)(const CMPIBroker*, CMPIStatus*));
SLOT(CMPIBrokerEncFT, newDateTimeFromBinary, 56, CMPIDateTime* (*)(const CMPIBroker*, CMPIUint64, CMPIBoolean, CMPIStatus*));
SLOT(CMPIBrokerEncFT, newDateTimeFromChars, 64, CMPIDateTime* (*)(const CMPIBroker*, const char*, CMPIStatus*));
SLOT(CMPIBrokerEncFT, newSelectExp, 72, CMPISelectExp* (*)(const CMPIBroker*, const char*, const char*, CMPIArray**, CMPIStatus*));
SLOT(CMPIBrokerEncFT, classPathIsA, 80, CMPIBoolean (*)(const CMPIBroker*, const CMPIObjectPath*, const char*, CMPIStatus*));
SLOT(CMPIBrokerEncFT, toString, 88, CMPIString* (*)(const CMPIBroker*, const void*, CMPIStatus*));
SLOT(CMPIBrokerEncFT, isOfType, 96, CMPIBoolean (*)(const CMPIBroker*, const void*, const char*, CMPIStatus*));
SLOT(CMPIBrokerEncFT, getType, 104, CMPIString* (*)(const CMPIBroker*, const void*, CMPIStatus*));
SLOT(CMPIBrokerEncFT, getMessage, 112, CMPIString* (*)(const CMPIBroker*, const char*, const char*, CMPIStatus*, CMPICount, ...));
SLOT(CMPIBrokerEncFT, logMessage, 120, CMPIStatus (*)(const CMPIBroker*, CMPISeverity, const char*, const char*, const CMPIString*));
SLOT(CMPIBrokerEncFT, trace, 128, CMPIStatus (*)(const CMPIBroker*, CMPILevel, const char*, const char*, const CMPIString*));
#if CMPI_VERSION >= 200
SLOT(CMPIBrokerEncFT, newCMPIError, 136, CMPIError* (*)(const CMPIBroker*, const char*, const char*, const char*, CMPIErrorSeverity, CMPIErrorProbableCause, CMPIrc, CMPIStatus*));
SLOT(CMPIBrokerEncFT, openMessageFile, 144, CMPIStatus (*)(const CMPIBroker*, const char*, CMPIMsgFileHandle*));
SLOT(CMPIBrokerEncFT, closeMessageFile, 152, CMPIStatus (*)(const CMPIBroker*, CMPIMsgFileHandle));
SLOT(CMPIBrokerEncFT, getMessage2, 160, CMPIString* (*)(const CMPIBroker*, const char*, CMPIMsgFileHandle, const char*, CMPIStatus*, CMPICount, ...));
#endif
#if CMPI_VERSION >= 210
SLOT(CMPIBrokerEncFT, newPropertyList, 168, CMPIPropertyList* (*)(const CMPIBroker*, const char**, CMPIStatus*));
SLOT(CMPIBrokerEncFT, newStringCP, 176, CMPIString* (*)(const CMPIBroker*, const char*, CMPICodepageID, CMPIStatus*));
SLOT(CMPIBrokerEncFT, newEnumerationFilter, 184, CMPIEnumerationFilter* (*)(const CMPIBroker*, const char*, const char*, CMPIStatus*));
#endif
static_assert(sizeof(CMPIBrokerEncFT) == byVersion(136, 168, 192));

SLOT(CMPIBrokerExtFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIBrokerExtFT, resolveFileName, 8, char* (*)(const char*));
SLOT(CMPIBrokerExtFT, newThread, 16, CMPI_THREAD_TYPE (*)(CMPIThreadFunc, void*, int));
SLOT(CMPIBrokerExtFT, joinThread, 24, int (*)(CMPI_THREAD_TYPE, CMPI_THREAD_RETURN*));
SLOT(CMPIBrokerExtFT, exitThread, 32, int (*)(CMPI_THREAD_RETURN));
SLOT(CMPIBrokerExtFT, cancelThread, 40, int (*)(CMPI_THREAD_TYPE));
SLOT(CMPIBrokerExtFT, threadSleep, 48, int (*)(CMPIUint32));
SLOT(CMPIBrokerExtFT, threadOnce, 56, int (*)(int*, CMPIThreadOnceFunc));
SLOT(CMPIBrokerExtFT, createThreadKey, 64, int (*)(CMPI_THREAD_KEY_TYPE*, CMPIThreadKeyCleanupFunc));
SLOT(CMPIBrokerExtFT, destroyThreadKey, 72, int (*)(CMPI_THREAD_KEY_TYPE));
SLOT(CMPIBrokerExtFT, getThreadSpecific, 80, void* (*)(CMPI_THREAD_KEY_TYPE));
SLOT(CMPIBrokerExtFT, setThreadSpecific, 88, int (*)(CMPI_THREAD_KEY_TYPE, void*));
SLOT(CMPIBrokerExtFT, newMutex, 96, CMPI_MUTEX_TYPE (*)(int));
SLOT(CMPIBrokerExtFT, destroyMutex, 104, void (*)(CMPI_MUTEX_TYPE));
SLOT(CMPIBrokerExtFT, lockMutex, 112, void (*)(CMPI_MUTEX_TYPE));
SLOT(CMPIBrokerExtFT, unlockMutex, 120, void (*)(CMPI_MUTEX_TYPE));
SLOT(CMPIBrokerExtFT, newCondition, 128, CMPI_COND_TYPE (*)(int));
SLOT(CMPIBrokerExtFT, destroyCondition, 136, void (*)(CMPI_COND_TYPE));
SLOT(CMPIBrokerExtFT, condWait, 144, int (*)(CMPI_COND_TYPE, CMPI_MUTEX_TYPE));
SLOT(CMPIBrokerExtFT, timedCondWait, 152, int (*)(CMPI_COND_TYPE, CMPI_MUTEX_TYPE, struct timespec*));
SLOT(CMPIBrokerExtFT, signalCondition, 160, int (*)(CMPI_COND_TYPE));
#if CMPI_VERSION >= 210
SLOT(CMPIBrokerExtFT, destroyMutex2, 168, int (*)(CMPI_MUTEX_TYPE));
SLOT(CMPIBrokerExtFT, lockMutex2, 176, int (*)(CMPI_MUTEX_TYPE));
SLOT(CMPIBrokerExtFT, unlockMutex2, 184, int (*)(CMPI_MUTEX_TYPE));
SLOT(CMPIBrokerExtFT, destroyCondition2, 192, int (*)(CMPI_COND_TYPE));
#endif
static_assert(sizeof(CMPIBrokerExtFT) == byVersion(168, 168, 200));

SLOT(CMPIBrokerMemFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIBrokerMemFT, mark, 8, CMPIGcStat* (*)(const CMPIBroker*, CMPIStatus*));
SLOT(CMPIBrokerMemFT, release, 16, CMPIStatus (*)(const CMPIBroker*, const CMPIGcStat*));
SLOT(CMPIBrokerMemFT, cmpiMalloc, 24, void* (*)(const CMPIBroker*, size_t));
SLOT(CMPIBrokerMemFT, cmpiCalloc, 32, void* (*)(const CMPIBroker*, size_t, size_t));
SLOT(CMPIBrokerMemFT, cmpiRealloc, 40, void* (*)(const CMPIBroker*, void*, size_t));
SLOT(CMPIBrokerMemFT, cmpiStrDup, 48, char* (*)(const CMPIBroker*, const char*));
SLOT(CMPIBrokerMemFT, cmpiFree, 56, void (*)(const CMPIBroker*, void*));
SLOT(CMPIBrokerMemFT, freeInstance, 64, void (*)(const CMPIBroker*, CMPIInstance*));
SLOT(CMPIBrokerMemFT, freeObjectPath, 72, void (*)(const CMPIBroker*, CMPIObjectPath*));
SLOT(CMPIBrokerMemFT, freeArgs, 80, void (*)(const CMPIBroker*, CMPIArgs*));
SLOT(CMPIBrokerMemFT, freeString, 88, void (*)(const CMPIBroker*, CMPIString*));
SLOT(CMPIBrokerMemFT, freeArray, 96, void (*)(const CMPIBroker*, CMPIArray*));
SLOT(CMPIBrokerMemFT, freeDateTime, 104, void (*)(const CMPIBroker*, CMPIDateTime*));
SLOT(CMPIBrokerMemFT, freeSelectExp, 112, void (*)(const CMPIBroker*, CMPISelectExp*));
#if CMPI_VERSION >= 210
SLOT(CMPIBrokerMemFT, freeChars, 120, void (*)(const CMPIBroker*, char*));
#endif
static_assert(sizeof(CMPIBrokerMemFT) == byVersion(120, 120, 128));

SLOT(CMPIContext, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIContext, ft, 8, CMPI_CONST_SINCE_210 CMPIContextFT*);
static_assert(sizeof(CMPIContext) == 16);

SLOT(CMPIContextFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIContextFT, release, 8, CMPIStatus (*)(CMPIContext*));
SLOT(CMPIContextFT, clone, 16, CMPIContext* (*)(const CMPIContext*, CMPIStatus*));
SLOT(CMPIContextFT, getEntry, 24, CMPIData (*)(const CMPIContext*, const char*, CMPIStatus*));
SLOT(CMPIContextFT, getEntryAt, 32, CMPIData (*)(const CMPIContext*, CMPICount, CMPIString**, CMPIStatus*));
SLOT(CMPIContextFT, getEntryCount, 40, CMPICount (*)(const CMPIContext*, CMPIStatus*));
SLOT(CMPIContextFT, addEntry, 48, CMPIStatus (*)(const CMPIContext*, const char*, const CMPIValue*, CMPIType));
static_assert(sizeof(CMPIContextFT) == 56);

SLOT(CMPIResult, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIResult, ft, 8, CMPI_CONST_SINCE_210 CMPIResultFT*);
static_assert(sizeof(CMPIResult) == 16);

SLOT(CMPIResultFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIResultFT, release, 8, CMPIStatus (*)(CMPIResult*));
SLOT(CMPIResultFT, clone, 16, CMPIResult* (*)(const CMPIResult*, CMPIStatus*));
SLOT(CMPIResultFT, returnData, 24, CMPIStatus (*)(const CMPIResult*, const CMPIValue*, CMPIType));
SLOT(CMPIResultFT, returnInstance, 32, CMPIStatus (*)(const CMPIResult*, const CMPIInstance*));
SLOT(CMPIResultFT, returnObjectPath, 40, CMPIStatus (*)(const CMPIResult*, const CMPIObjectPath*));
SLOT(CMPIResultFT, returnDone, 48, CMPIStatus (*)(const CMPIResult*));
#if CMPI_VERSION >= 200
SLOT(CMPIResultFT, returnError, 56, CMPIStatus (*)(const CMPIResult*, const CMPIError*));
#endif
static_assert(sizeof(CMPIResultFT) == byVersion(56, 64, 64));

SLOT(CMPIString, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIString, ft, 8, CMPI_CONST_SINCE_210 CMPIStringFT*);
static_assert(sizeof(CMPIString) == 16);

SLOT(CMPIStringFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIStringFT, release, 8, CMPIStatus (*)(CMPIString*));
SLOT(CMPIStringFT, clone, 16, CMPIString* (*)(const CMPIString*, CMPIStatus*));
SLOT(CMPIStringFT, getCharPtr, 24, CMPI_CONST_SINCE_210 char* (*)(const CMPIString*, CMPIStatus*));
#if CMPI_VERSION >= 210
SLOT(CMPIStringFT, newCharsCP, 32, char* (*)(const CMPIString*, CMPICodepageID, CMPIStatus*));
#endif
static_assert(sizeof(CMPIStringFT) == byVersion(32, 32, 40));

SLOT(CMPIArray, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIArray, ft, 8, CMPI_CONST_SINCE_210 CMPIArrayFT*);
static_assert(sizeof(CMPIArray) == 16);

SLOT(CMPIArrayFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIArrayFT, release, 8, CMPIStatus (*)(CMPIArray*));
SLOT(CMPIArrayFT, clone, 16, CMPIArray* (*)(const CMPIArray*, CMPIStatus*));
SLOT(CMPIArrayFT, getSize, 24, CMPICount (*)(const CMPIArray*, CMPIStatus*));
SLOT(CMPIArrayFT, getSimpleType, 32, CMPIType (*)(const CMPIArray*, CMPIStatus*));
SLOT(CMPIArrayFT, getElementAt, 40, CMPIData (*)(const CMPIArray*, CMPICount, CMPIStatus*));
SLOT(CMPIArrayFT, setElementAt, 48, CMPIStatus (*)(const CMPIArray*, CMPICount, const CMPIValue*, CMPIType));
static_assert(sizeof(CMPIArrayFT) == 56);

SLOT(CMPIEnumeration, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIEnumeration, ft, 8, CMPI_CONST_SINCE_210 CMPIEnumerationFT*);
static_assert(sizeof(CMPIEnumeration) == 16);

SLOT(CMPIEnumerationFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIEnumerationFT, release, 8, CMPIStatus (*)(CMPIEnumeration*));
SLOT(CMPIEnumerationFT, clone, 16, CMPIEnumeration* (*)(const CMPIEnumeration*, CMPIStatus*));
SLOT(CMPIEnumerationFT, getNext, 24, CMPIData (*)(const CMPIEnumeration*, CMPIStatus*));
SLOT(CMPIEnumerationFT, hasNext, 32, CMPIBoolean (*)(const CMPIEnumeration*, CMPIStatus*));
SLOT(CMPIEnumerationFT, toArray, 40, CMPIArray* (*)(const CMPIEnumeration*, CMPIStatus*));
static_assert(sizeof(CMPIEnumerationFT) == 48);

SLOT(CMPIInstance, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIInstance, ft, 8, CMPI_CONST_SINCE_210 CMPIInstanceFT*);
static_assert(sizeof(CMPIInstance) == 16);

SLOT(CMPIInstanceFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIInstanceFT, release, 8, CMPIStatus (*)(CMPIInstance*));
SLOT(CMPIInstanceFT, clone, 16, CMPIInstance* (*)(const CMPIInstance*, CMPIStatus*));
SLOT(CMPIInstanceFT, getProperty, 24, CMPIData (*)(const CMPIInstance*, const char*, CMPIStatus*));
SLOT(CMPIInstanceFT, getPropertyAt, 32, CMPIData (*)(const CMPIInstance*, CMPICount, CMPIString**, CMPIStatus*));
SLOT(CMPIInstanceFT, getPropertyCount, 40, CMPICount (*)(const CMPIInstance*, CMPIStatus*));
SLOT(CMPIInstanceFT, setProperty, 48, CMPIStatus (*)(const CMPIInstance*, const char*, const CMPIValue*, CMPIType));
SLOT(CMPIInstanceFT, getObjectPath, 56, CMPIObjectPath* (*)(const CMPIInstance*, CMPIStatus*));
SLOT(CMPIInstanceFT, setPropertyFilter, 64, CMPIStatus (*)(const CMPIInstance*, const char**, const char**));
SLOT(CMPIInstanceFT, setObjectPath, 72, CMPIStatus (*)(const CMPIInstance*, const CMPIObjectPath*));
#if CMPI_VERSION >= 200
SLOT(CMPIInstanceFT, setPropertyWithOrigin, 80, CMPIStatus (*)(const CMPIInstance*, const char*, const CMPIValue*, CMPIType, const char*));
#endif
static_assert(sizeof(CMPIInstanceFT) == byVersion(80, 88, 88));

SLOT(CMPIObjectPath, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIObjectPath, ft, 8, CMPI_CONST_SINCE_210 CMPIObjectPathFT*);
static_assert(sizeof(CMPIObjectPath) == 16);

SLOT(CMPIObjectPathFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIObjectPathFT, release, 8, CMPIStatus (*)(CMPIObjectPath*));
SLOT(CMPIObjectPathFT, clone, 16, CMPIObjectPath* (*)(const CMPIObjectPath*, CMPIStatus*));
SLOT(CMPIObjectPathFT, setNameSpace, 24, CMPIStatus (*)(const CMPIObjectPath*, const char*));
SLOT(CMPIObjectPathFT, getNameSpace, 32, CMPIString* (*)(const CMPIObjectPath*, CMPIStatus*));
SLOT(CMPIObjectPathFT, setHostname, 40, CMPIStatus (*)(const CMPIObjectPath*, const char*));
SLOT(CMPIObjectPathFT, getHostname, 48, CMPIString* (*)(const CMPIObjectPath*, CMPIStatus*));
SLOT(CMPIObjectPathFT, setClassName, 56, CMPIStatus (*)(const CMPIObjectPath*, const char*));
SLOT(CMPIObjectPathFT, getClassName, 64, CMPIString* (*)(const CMPIObjectPath*, CMPIStatus*));
SLOT(CMPIObjectPathFT, addKey, 72, CMPIStatus (*)(const CMPIObjectPath*, const char*, const CMPIValue*, CMPIType));
SLOT(CMPIObjectPathFT, getKey, 80, CMPIData (*)(const CMPIObjectPath*, const char*, CMPIStatus*));
SLOT(CMPIObjectPathFT, getKeyAt, 88, CMPIData (*)(const CMPIObjectPath*, CMPICount, CMPIString**, CMPIStatus*));
SLOT(CMPIObjectPathFT, getKeyCount, 96, CMPICount (*)(const CMPIObjectPath*, CMPIStatus*));
SLOT(CMPIObjectPathFT, setNameSpaceFromObjectPath, 104, CMPIStatus (*)(const CMPIObjectPath*, const CMPIObjectPath*));
SLOT(CMPIObjectPathFT, setHostAndNameSpaceFromObjectPath, 112, CMPIStatus (*)(const CMPIObjectPath*, const CMPIObjectPath*));
SLOT(CMPIObjectPathFT, getClassQualifier, 120, CMPIData (*)(const CMPIObjectPath*, const char*, CMPIStatus*));
SLOT(CMPIObjectPathFT, getPropertyQualifier, 128, CMPIData (*)(const CMPIObjectPath*, const char*, const char*, CMPIStatus*));
SLOT(CMPIObjectPathFT, getMethodQualifier, 136, CMPIData (*)(const CMPIObjectPath*, const char*, const char*, CMPIStatus*));
SLOT(CMPIObjectPathFT, getParameterQualifier, 144, CMPIData (*)(const CMPIObjectPath*, const char*, const char*, const char*, CMPIStatus*));
SLOT(CMPIObjectPathFT, toString, 152, CMPIString* (*)(const CMPIObjectPath*, CMPIStatus*));
static_assert(sizeof(CMPIObjectPathFT) == 160);

SLOT(CMPIArgs, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIArgs, ft, 8, CMPI_CONST_SINCE_210 CMPIArgsFT*);
static_assert(sizeof(CMPIArgs) == 16);

SLOT(CMPIArgsFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIArgsFT, release, 8, CMPIStatus (*)(CMPIArgs*));
SLOT(CMPIArgsFT, clone, 16, CMPIArgs* (*)(const CMPIArgs*, CMPIStatus*));
SLOT(CMPIArgsFT, addArg, 24, CMPIStatus (*)(const CMPIArgs*, const char*, const CMPIValue*, CMPIType));
SLOT(CMPIArgsFT, getArg, 32, CMPIData (*)(const CMPIArgs*, const char*, CMPIStatus*));
SLOT(CMPIArgsFT, getArgAt, 40, CMPIData (*)(const CMPIArgs*, CMPICount, CMPIString**, CMPIStatus*));
SLOT(CMPIArgsFT, getArgCount, 48, CMPICount (*)(const CMPIArgs*, CMPIStatus*));
static_assert(sizeof(CMPIArgsFT) == 56);

SLOT(CMPIDateTime, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIDateTime, ft, 8, CMPI_CONST_SINCE_210 CMPIDateTimeFT*);
static_assert(sizeof(CMPIDateTime) == 16);

SLOT(CMPIDateTimeFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIDateTimeFT, release, 8, CMPIStatus (*)(CMPIDateTime*));
SLOT(CMPIDateTimeFT, clone, 16, CMPIDateTime* (*)(const CMPIDateTime*, CMPIStatus*));
SLOT(CMPIDateTimeFT, getBinaryFormat, 24, CMPIUint64 (*)(const CMPIDateTime*, CMPIStatus*));
SLOT(CMPIDateTimeFT, getStringFormat, 32, CMPIString* (*)(const CMPIDateTime*, CMPIStatus*));
SLOT(CMPIDateTimeFT, isInterval, 40, CMPIBoolean (*)(const CMPIDateTime*, CMPIStatus*));
static_assert(sizeof(CMPIDateTimeFT) == 48);

SLOT(CMPIError, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIError, ft, 8, CMPI_CONST_SINCE_210 CMPIErrorFT*);
static_assert(sizeof(CMPIError) == 16);

SLOT(CMPIErrorFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIErrorFT, release, 8, CMPIStatus (*)(CMPIError*));
SLOT(CMPIErrorFT, clone, 16, CMPIError* (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getErrorType, 24, CMPIErrorType (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getOtherErrorType, 32, CMPIString* (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getOwningEntity, 40, CMPIString* (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getMessageID, 48, CMPIString* (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getMessage, 56, CMPIString* (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getPerceivedSeverity, 64, CMPIErrorSeverity (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getProbableCause, 72, CMPIErrorProbableCause (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getProbableCauseDescription, 80, CMPIString* (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getRecommendedActions, 88, CMPIArray* (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getErrorSource, 96, CMPIString* (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getErrorSourceFormat, 104, CMPIErrorSrcFormat (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getOtherErrorSourceFormat, 112, CMPIString* (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getCIMStatusCode, 120, CMPIrc (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getCIMStatusCodeDescription, 128, CMPIString* (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, getMessageArguments, 136, CMPIArray* (*)(const CMPIError*, CMPIStatus*));
SLOT(CMPIErrorFT, setErrorType, 144, CMPIStatus (*)(const CMPIError*, CMPIErrorType));
SLOT(CMPIErrorFT, setOtherErrorType, 152, CMPIStatus (*)(const CMPIError*, const char*));
SLOT(CMPIErrorFT, setProbableCauseDescription, 160, CMPIStatus (*)(const CMPIError*, const char*));
SLOT(CMPIErrorFT, setRecommendedActions, 168, CMPIStatus (*)(const CMPIError*, const CMPIArray*));
SLOT(CMPIErrorFT, setErrorSource, 176, CMPIStatus (*)(const CMPIError*, const char*));
SLOT(CMPIErrorFT, setErrorSourceFormat, 184, CMPIStatus (*)(const CMPIError*, CMPIErrorSrcFormat));
SLOT(CMPIErrorFT, setOtherErrorSourceFormat, 192, CMPIStatus (*)(const CMPIError*, const char*));
SLOT(CMPIErrorFT, setCIMStatusCodeDescription, 200, CMPIStatus (*)(const CMPIError*, const char*));
SLOT(CMPIErrorFT, setMessageArguments, 208, CMPIStatus (*)(const CMPIError*, const CMPIArray*));
static_assert(sizeof(CMPIErrorFT) == 216);

#if CMPI_VERSION >= 210
SLOT(CMPIPropertyList, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIPropertyList, ft, 8, CMPI_CONST_SINCE_210 CMPIPropertyListFT*);
static_assert(sizeof(CMPIPropertyList) == 16);
#endif

#if CMPI_VERSION >= 210
SLOT(CMPIPropertyListFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIPropertyListFT, release, 8, CMPIStatus (*)(CMPIPropertyList*));
SLOT(CMPIPropertyListFT, clone, 16, CMPIPropertyList* (*)(const CMPIPropertyList*, CMPIStatus*));
SLOT(CMPIPropertyListFT, isPropertyInList, 24, CMPIBoolean (*)(const CMPIPropertyList*, const char*, CMPIStatus*));
SLOT(CMPIPropertyListFT, getProperties, 32, const char** (*)(const CMPIPropertyList*, CMPIStatus*));
static_assert(sizeof(CMPIPropertyListFT) == 40);
#endif

#if CMPI_VERSION >= 210
SLOT(CMPIEnumerationFilter, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIEnumerationFilter, ft, 8, CMPI_CONST_SINCE_210 CMPIEnumerationFilterFT*);
static_assert(sizeof(CMPIEnumerationFilter) == 16);
#endif

#if CMPI_VERSION >= 210
SLOT(CMPIEnumerationFilterFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIEnumerationFilterFT, release, 8, CMPIStatus (*)(CMPIEnumerationFilter*));
SLOT(CMPIEnumerationFilterFT, clone, 16, CMPIEnumerationFilter* (*)(const CMPIEnumerationFilter*, CMPIStatus*));
SLOT(CMPIEnumerationFilterFT, match, 24, CMPIBoolean (*)(const CMPIEnumerationFilter*, const CMPIInstance*, CMPIStatus*));
static_assert(sizeof(CMPIEnumerationFilterFT) == 32);
#endif

SLOT(CMPIInstanceMI, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIInstanceMI, ft, 8, CMPI_CONST_SINCE_210 CMPIInstanceMIFT*);
static_assert(sizeof(CMPIInstanceMI) == 16);

SLOT(CMPIInstanceMIFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIInstanceMIFT, miVersion, 4, int);
SLOT(CMPIInstanceMIFT, miName, 8, const char*);
SLOT(CMPIInstanceMIFT, cleanup, 16, CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean));
SLOT(CMPIInstanceMIFT, enumerateInstanceNames, 24, CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*));
SLOT(CMPIInstanceMIFT, enumerateInstances, 32, CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char**));
SLOT(CMPIInstanceMIFT, getInstance, 40, CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char**));
SLOT(CMPIInstanceMIFT, createInstance, 48, CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const CMPIInstance*));
SLOT(CMPIInstanceMIFT, modifyInstance, 56, CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const CMPIInstance*, const char**));
SLOT(CMPIInstanceMIFT, deleteInstance, 64, CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*));
SLOT(CMPIInstanceMIFT, execQuery, 72, CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*));
#if CMPI_VERSION >= 210
SLOT(CMPIInstanceMIFT, enumerateInstancesFiltered, 80, CMPIStatus (*)(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char**, const char*, const char*, CMPIStatus*));
#endif
static_assert(sizeof(CMPIInstanceMIFT) == byVersion(80, 80, 88));

SLOT(CMPIAssociationMI, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIAssociationMI, ft, 8, CMPI_CONST_SINCE_210 CMPIAssociationMIFT*);
static_assert(sizeof(CMPIAssociationMI) == 16);

SLOT(CMPIAssociationMIFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIAssociationMIFT, miVersion, 4, int);
SLOT(CMPIAssociationMIFT, miName, 8, const char*);
SLOT(CMPIAssociationMIFT, cleanup, 16, CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean));
SLOT(CMPIAssociationMIFT, associators, 24, CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*, const char*, const char*, const char**));
SLOT(CMPIAssociationMIFT, associatorNames, 32, CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*, const char*, const char*));
SLOT(CMPIAssociationMIFT, references, 40, CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*, const char**));
SLOT(CMPIAssociationMIFT, referenceNames, 48, CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*));
#if CMPI_VERSION >= 210
SLOT(CMPIAssociationMIFT, associatorsFiltered, 56, CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*, const char*, const char*, const char**, const char*, const char*, CMPIBoolean));
SLOT(CMPIAssociationMIFT, referencesFiltered, 64, CMPIStatus (*)(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*, const char**, const char*, const char*, CMPIBoolean));
#endif
static_assert(sizeof(CMPIAssociationMIFT) == byVersion(56, 56, 72));

SLOT(CMPIMethodMI, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIMethodMI, ft, 8, CMPI_CONST_SINCE_210 CMPIMethodMIFT*);
static_assert(sizeof(CMPIMethodMI) == 16);

SLOT(CMPIMethodMIFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIMethodMIFT, miVersion, 4, int);
SLOT(CMPIMethodMIFT, miName, 8, const char*);
SLOT(CMPIMethodMIFT, cleanup, 16, CMPIStatus (*)(CMPIMethodMI*, const CMPIContext*, CMPIBoolean));
SLOT(CMPIMethodMIFT, invokeMethod, 24, CMPIStatus (*)(CMPIMethodMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const CMPIArgs*, CMPIArgs*));
static_assert(sizeof(CMPIMethodMIFT) == 32);

SLOT(CMPIPropertyMI, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIPropertyMI, ft, 8, CMPI_CONST_SINCE_210 CMPIPropertyMIFT*);
static_assert(sizeof(CMPIPropertyMI) == 16);

SLOT(CMPIPropertyMIFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIPropertyMIFT, miVersion, 4, int);
SLOT(CMPIPropertyMIFT, miName, 8, const char*);
SLOT(CMPIPropertyMIFT, cleanup, 16, CMPIStatus (*)(CMPIPropertyMI*, const CMPIContext*, CMPIBoolean));
SLOT(CMPIPropertyMIFT, setProperty, 24, CMPIStatus (*)(CMPIPropertyMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, CMPIData));
SLOT(CMPIPropertyMIFT, getProperty, 32, CMPIStatus (*)(CMPIPropertyMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*));
static_assert(sizeof(CMPIPropertyMIFT) == 40);

SLOT(CMPIIndicationMI, hdl, 0, CMPI_CONST_SINCE_210 void*);
SLOT(CMPIIndicationMI, ft, 8, CMPI_CONST_SINCE_210 CMPIIndicationMIFT*);
static_assert(sizeof(CMPIIndicationMI) == 16);

SLOT(CMPIIndicationMIFT, ftVersion, 0, CMPIVersion);
SLOT(CMPIIndicationMIFT, miVersion, 4, int);
SLOT(CMPIIndicationMIFT, miName, 8, const char*);
SLOT(CMPIIndicationMIFT, cleanup, 16, CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*, CMPIBoolean));
SLOT(CMPIIndicationMIFT, authorizeFilter, 24, CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*, const char*, const CMPIObjectPath*, const char*));
SLOT(CMPIIndicationMIFT, mustPoll, 32, CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*, const char*, const CMPIObjectPath*));
SLOT(CMPIIndicationMIFT, activateFilter, 40, CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*, const char*, const CMPIObjectPath*, CMPIBoolean));
SLOT(CMPIIndicationMIFT, deActivateFilter, 48, CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*, const char*, const CMPIObjectPath*, CMPIBoolean));
SLOT(CMPIIndicationMIFT, enableIndications, 56, CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*));
SLOT(CMPIIndicationMIFT, disableIndications, 64, CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*));
static_assert(sizeof(CMPIIndicationMIFT) == 72);
// clang-format on

// A provider as a class. Its constructor, and any function, fails when the test says so.

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

    template <class... Parameters>
    CMPIStatus fail(Parameters...) {
        throw std::runtime_error("function");
    }
#define FAILS(function)                             \
    template <class... Parameters>                  \
    CMPIStatus function(Parameters... parameters) { \
        return fail(parameters...);                 \
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
    FAILS(setProperty)
    FAILS(getProperty)
    FAILS(authorizeFilter)
    FAILS(mustPoll)
    FAILS(activateFilter)
    FAILS(deActivateFilter)
    FAILS(enableIndications)
    FAILS(disableIndications)

    CMPIStatus invokeMethod(const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*,
                            const CMPIArgs*, CMPIArgs*) {
        CMReturn(CMPI_RC_ERR_METHOD_NOT_FOUND);
    }
};

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
    CMPIStatus status = {CMPI_RC_ERR_FAILED, nullptr};
    CMPIInstanceMI* const instances = TestProvider_Create_InstanceMI(nullptr, nullptr, &status);
    EXPECT_EQ(status.rc, CMPI_RC_OK);
    CMPIMethodMI* const methods = TestProvider_Create_MethodMI(nullptr, nullptr, nullptr);
    CMPIMethodMI* const others = OtherProvider_Create_MethodMI(nullptr, nullptr, nullptr);
    ASSERT_TRUE(instances != nullptr && methods != nullptr && others != nullptr);
    EXPECT_STREQ(instances->ft->miName, "instanceTestProvider");
    EXPECT_STREQ(others->ft->miName, "methodOtherProvider");
    EXPECT_EQ(instances->hdl, methods->hdl);
    EXPECT_NE(methods->hdl, others->hdl);
    EXPECT_EQ(aliveProviders, 2);

    EXPECT_EQ(instances->ft->getInstance(instances, nullptr, nullptr, nullptr, nullptr).rc,
              CMPI_RC_ERR_FAILED);
    EXPECT_EQ(methods->ft->invokeMethod(methods, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr).rc,
              CMPI_RC_ERR_METHOD_NOT_FOUND);

    EXPECT_EQ(instances->ft->cleanup(instances, nullptr, 0).rc, CMPI_RC_OK);
    EXPECT_EQ(aliveProviders, 2);
    EXPECT_EQ(methods->ft->cleanup(methods, nullptr, 0).rc, CMPI_RC_OK);
    EXPECT_EQ(others->ft->cleanup(others, nullptr, 0).rc, CMPI_RC_OK);
    EXPECT_EQ(aliveProviders, 0);
}

TEST(AProviderFactory, ReportsAConstructorThatThrows) {
    constructorFails = true;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    EXPECT_EQ(TestProvider_Create_AssociationMI(nullptr, nullptr, &status), nullptr);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_FAILED);
    constructorFails = false;
    EXPECT_NE(TestProvider_Create_PropertyMI(nullptr, nullptr, &status), nullptr);
    CMPIIndicationMI* const indications = TestProvider_Create_IndicationMI(nullptr, nullptr, &status);
    EXPECT_EQ(status.rc, CMPI_RC_OK);
    EXPECT_EQ(indications->ft->enableIndications(indications, nullptr).rc, CMPI_RC_ERR_FAILED);
}
