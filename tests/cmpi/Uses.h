/* Uses of CMPI's convenience names, compiled as C and as C++: a function for each name that calls a slot, and
 * some for all others. The includer names what is defined here: USES the record of them, PROVIDER the
 * provider. */
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>
#include <cmpios.h>
#include <cmpipl.h>

/* The tables fix the parameters. */
#pragma GCC diagnostic ignored "-Wunused-parameter"

#define FACTORY(kind) CMPI##kind##MI* (*create##kind)(const CMPIBroker*, const CMPIContext*, CMPIStatus*)
struct Uses {
#define CALL(result, name, table, slot, parameters, body) result(*call##name) parameters;
#include "CmpiStandard.inc"
    const char* (*failedExpectation)(const CMPIBroker* mb, CMPIString* string, CMPIString* made);
    CMPIString* (*message)(const CMPIBroker* mb, const CMPIString* string);
    FACTORY(Instance);
    FACTORY(Association);
    FACTORY(Method);
    FACTORY(Property);
    FACTORY(Indication);
};

/* What a function of a provider in C reports to the test. */
CMPI_EXTERN_C void called(const char* slot);

#define CALL(result, name, table, slot, parameters, body) \
    static result call##name parameters {                 \
        body;                                             \
    }
#include "CmpiStandard.inc"

static CMPIStatus returnCode(void) {
    CMReturn(CMPI_RC_ERR_NOT_FOUND);
}
static CMPIStatus returnString(CMPIString* text) {
    CMReturnWithString(CMPI_RC_ERR_FAILED, text);
}
static CMPIStatus returnChars(const CMPIBroker* mb) {
    CMReturnWithChars(mb, CMPI_RC_ERROR, "returned");
}
static int is(CMPIStatus status, CMPIrc code, const CMPIString* text) {
    return status.rc == code && status.msg == text;
}

/* What the names of no slot must do, as an expectation that fails; null when none does. `made` is what the
 * broker makes of any characters. */
static const char* failedExpectation(const CMPIBroker* mb, CMPIString* string, CMPIString* made) {
#define EXPECT(expression)  \
    if (!(expression)) {    \
        return #expression; \
    }
    static const int lists[] = {CMFmtArgs0(),
                                CMFmtArgs1(1),
                                CMFmtArgs2(1, 2),
                                CMFmtArgs3(1, 2, 3),
                                CMFmtArgs4(1, 2, 3, 4),
                                CMFmtArgs5(1, 2, 3, 4, 5),
                                CMFmtArgs6(1, 2, 3, 4, 5, 6),
                                CMFmtArgs7(1, 2, 3, 4, 5, 6, 7),
                                CMFmtArgs8(1, 2, 3, 4, 5, 6, 7, 8),
                                CMFmtArgs9(1, 2, 3, 4, 5, 6, 7, 8, 9),
                                CMFmtArgs10(1, 2, 3, 4, 5, 6, 7, 8, 9, 10)};
    const int* next = lists;
    int length;
    int i;
    CMPIStatus status = {CMPI_RC_ERROR, made};
    CMPIStatus* const nowhere = NULL;
    CMPIString empty = *string;
    CMPIData data = {CMPI_stringA, CMPI_nullValue, {0}};
    for (length = 0; length <= 10; ++length) {
        for (i = 0; i <= length; ++i) {
            EXPECT(*next++ == (i == 0 ? length : i));
        }
    }
    EXPECT(next == lists + sizeof lists / sizeof lists[0]);

    EXPECT(is(returnCode(), CMPI_RC_ERR_NOT_FOUND, NULL));
    EXPECT(is(returnString(string), CMPI_RC_ERR_FAILED, string));
    EXPECT(is(returnChars(mb), CMPI_RC_ERROR, made));
    CMSetStatus(&status, CMPI_RC_ERR_FAILED);
    EXPECT(is(status, CMPI_RC_ERR_FAILED, NULL));
    CMSetStatusWithString(&status, CMPI_RC_ERR_NOT_FOUND, string);
    EXPECT(is(status, CMPI_RC_ERR_NOT_FOUND, string));
    CMSetStatusWithChars(mb, &status, CMPI_RC_ERROR, "set");
    EXPECT(is(status, CMPI_RC_ERROR, made));
    CMSetStatus(nowhere, CMPI_RC_ERR_FAILED);
    CMSetStatusWithString(nowhere, CMPI_RC_ERR_FAILED, string);
    CMSetStatusWithChars(mb, nowhere, CMPI_RC_ERR_FAILED, "unused");

    empty.hdl = NULL;
    EXPECT(CMIsNullObject(&empty) && CMIsNullObject((CMPIString*)NULL) && !CMIsNullObject(string));
    EXPECT(CMIsNullValue(data) && !CMIsKeyValue(data) && CMIsArray(data));
    data.state = CMPI_keyValue;
    data.type = CMPI_string;
    EXPECT(!CMIsNullValue(data) && CMIsKeyValue(data) && !CMIsArray(data));
    EXPECT(CMGetCharPtr(string) == (const char*)made && CMClone(string, NULL) == made);
    EXPECT(CMRelease(string).rc != CMPI_RC_OK);
    EXPECT(CBGetCapabilities(mb) == CMPI_MB_Indications && CBBrokerVersion(mb) == CMPICurrentVersion);
    EXPECT(*CBBrokerName(mb) == 'n');
    return NULL;
}

/* Every kind of insertion. */
static CMPIString* message(const CMPIBroker* mb, const CMPIString* string) {
#define INSERTIONS                                                                               \
    CMFmtArgs8(CMFmtSint(-1), CMFmtUint(4000000000U), CMFmtSint64(-5000000000LL),                \
               CMFmtUint64(5000000000ULL), CMFmtReal(0.5), CMFmtBoolean(1), CMFmtChars("chars"), \
               CMFmtString(string))
#if CMPI_VERSION >= 200
    CMGetMessage2(mb, "id", NULL, "file", NULL, INSERTIONS);
#endif
    return CMGetMessage(mb, "id", "text", NULL, INSERTIONS);
}

/* A provider of every kind. Its functions report that they were called, and fail. */
#define STUB(slot, function, parameters)          \
    static CMPIStatus Stub##function parameters { \
        called(#slot);                            \
        CMReturn(CMPI_RC_ERR_FAILED);             \
    }
#include "CmpiStandard.inc"
#define CLEANUP(function, kind)                                                                            \
    static CMPIStatus Stub##function(CMPI##kind##MI* mi, const CMPIContext* context, CMPIBoolean ending) { \
        CMReturn(CMPI_RC_OK);                                                                              \
    }
CLEANUP(Cleanup, Instance)
CLEANUP(AssociationCleanup, Association)
CLEANUP(MethodCleanup, Method)
CLEANUP(PropertyCleanup, Property)
CLEANUP(IndicationCleanup, Indication)

static const CMPIBroker* stubBroker;
static void StubMethodInitialize(CMPIMethodMI* mi, const CMPIContext* context, CMPIStatus* status) {
    CMSetStatus(status, mi->ft != NULL && context == NULL ? CMPI_RC_ERR_ACCESS_DENIED : CMPI_RC_OK);
}

/* The factories' macros, with PROVIDER expanded. */
#define STUBS(kind, name, hook) CM##kind##MIStub(Stub, name, stubBroker, hook)
STUBS(Instance, PROVIDER, CMNoHook)
STUBS(Association, PROVIDER, )
STUBS(Method, PROVIDER, CMInitHook(Stub, Method))
STUBS(Property, PROVIDER, CMNoHook)
STUBS(Indication, PROVIDER, called("factory"))

#define FACTORY_OF(name, kind) name##_Create_##kind##MI
#define FACTORIES(name)                                                                  \
    FACTORY_OF(name, Instance), FACTORY_OF(name, Association), FACTORY_OF(name, Method), \
        FACTORY_OF(name, Property), FACTORY_OF(name, Indication)
CMPI_EXTERN_C const struct Uses USES;
const struct Uses USES = {
#define CALL(result, name, table, slot, parameters, body) call##name,
#include "CmpiStandard.inc"
    failedExpectation, message, FACTORIES(PROVIDER)};
