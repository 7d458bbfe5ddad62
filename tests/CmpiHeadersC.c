/* A provider in C with every kind of MI, which uses every convenience name. It returns what it is sent, so
 * that a request shows which functions the tables call.
 */
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>
#include <cmpios.h>
#include <cmpipl.h>

static const CMPIBroker* broker;
static int factoryCalls = 0;

/* The parameters that the functions of an MI begin with. */
#define REQUEST(kind) \
    CMPI##kind##MI *mi, const CMPIContext *context, const CMPIResult *result, const CMPIObjectPath *path

/* A function that this provider does not serve, whose parameters nobody reads. */
#define NOT_SUPPORTED(name, parameters, unread)  \
    static CMPIStatus name parameters {          \
        (void)mi, (void)context, (void)(unread); \
        CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);     \
    }

#define CLEANUP(name, kind)                                                                      \
    static CMPIStatus name(CMPI##kind##MI* mi, const CMPIContext* context, CMPIBoolean ending) { \
        (void)mi, (void)context, (void)ending;                                                   \
        CMReturn(CMPI_RC_OK);                                                                    \
    }

/* A path's copy with all that a path can say. */
static CMPIObjectPath* CopyOf(const CMPIObjectPath* path, CMPIStatus* status) {
    CMPIObjectPath* copy = CMNewObjectPath(broker, CMGetCharsPtr(CMGetNameSpace(path, NULL), NULL),
                                           CMGetCharsPtr(CMGetClassName(path, NULL), NULL), status);
    CMPICount i;
    CMSetNameSpace(copy, CMGetCharsPtr(CMGetNameSpace(path, NULL), NULL));
    CMSetClassName(copy, CMGetCharsPtr(CMGetClassName(path, NULL), NULL));
    CMSetHostname(copy, CMGetCharsPtr(CMGetHostname(path, NULL), NULL));
    for (i = 0; i < CMGetKeyCount(path, NULL); ++i) {
        CMPIString* name = NULL;
        CMPIData key = CMGetKeyAt(path, i, &name, NULL);
        CMAddKey(copy, CMGetCharsPtr(name, NULL), &key.value, key.type);
    }
    return copy;
}

/* An instance of a path, with a text, an array and a date. */
static CMPIInstance* InstanceOf(const CMPIObjectPath* path, const char** properties, CMPIStatus* status) {
    CMPIInstance* instance = CMNewInstance(broker, path, status);
    CMPIArray* array = CMNewArray(broker, 1, CMPI_uint8, NULL);
    CMPIDateTime* date = CMNewDateTimeFromChars(broker, "20240229120000.000000+000", NULL);
    CMPIUint8 element = 7;
    CMSetPropertyFilter(instance, properties, NULL);
    CMSetProperty(instance, "Text", "text", CMPI_chars);
    CMSetArrayElementAt(array, 0, &element, CMPI_uint8);
    CMSetProperty(instance, "Array", &array, CMPI_uint8A);
    date = CMNewDateTimeFromBinary(broker, CMGetBinaryFormat(date, NULL), CMIsInterval(date, NULL), NULL);
    CMSetProperty(instance, "Date", &date, CMPI_dateTime);
    return instance;
}

/* Instance MI */

CLEANUP(CCleanup, Instance)

static CMPIStatus CEnumInstanceNames(REQUEST(Instance)) {
    CMPIStatus status = {CMPI_RC_OK, NULL};
    CMPIObjectPath* copy = CopyOf(path, &status);
    (void)mi, (void)context;
    if (status.rc == CMPI_RC_OK && !CMIsNullObject(copy)) {
        CMReturnObjectPath(result, copy);
    }
    CMRelease(copy);
    CMReturnDone(result);
    return status;
}

static CMPIStatus CGetInstance(REQUEST(Instance), const char** properties) {
    CMPIStatus status = {CMPI_RC_OK, NULL};
    CMPIInstance* instance = InstanceOf(path, properties, &status);
    (void)mi, (void)context;
    CMReturnInstance(result, CMClone(instance, NULL));
    return status;
}

/* As an upcall: the instance of every name. */
static CMPIStatus CEnumInstances(REQUEST(Instance), const char** properties) {
    CMPIStatus status = {CMPI_RC_OK, NULL};
    CMPIEnumeration* names = broker->bft->enumerateInstanceNames(broker, context, path, &status);
    CMPIArray* all = CMToArray(names, NULL);
    (void)mi;
    if (CMGetArrayType(all, NULL) != CMPI_ref || CMGetArrayCount(all, NULL) != 1) {
        CMSetStatus(&status, CMPI_RC_ERR_FAILED);
    }
    while (CMHasNext(names, NULL)) {
        CMReturnInstance(result, InstanceOf(CMGetNext(names, NULL).value.ref, properties, &status));
    }
    return status;
}

NOT_SUPPORTED(CCreateInstance, (REQUEST(Instance), const CMPIInstance* instance),
              (result == NULL || path == NULL || instance == NULL))
NOT_SUPPORTED(CModifyInstance, (REQUEST(Instance), const CMPIInstance* instance, const char** properties),
              (result == NULL || path == NULL || instance == NULL || properties == NULL))
NOT_SUPPORTED(CDeleteInstance, (REQUEST(Instance)), (result == NULL || path == NULL))
NOT_SUPPORTED(CExecQuery, (REQUEST(Instance), const char* query, const char* language),
              (result == NULL || path == NULL || query == NULL || language == NULL))

/* Association MI: an instance's one associate is itself, and the association's role is its name. */

CLEANUP(CAssociationCleanup, Association)

static CMPIStatus CAssociators(REQUEST(Association), const char* assocClass, const char* resultClass,
                               const char* role, const char* resultRole, const char** properties) {
    CMPIStatus status = {CMPI_RC_OK, NULL};
    CMPIInstance* instance = InstanceOf(path, properties, &status);
    (void)mi, (void)context, (void)assocClass, (void)resultRole;
    if (resultClass == NULL || CMClassPathIsA(broker, path, resultClass, NULL)) {
        CMSetProperty(instance, "Text", role != NULL ? role : "", CMPI_chars);
        CMReturnInstance(result, instance);
    }
    return status;
}

static CMPIStatus CAssociatorNames(REQUEST(Association), const char* assocClass, const char* resultClass,
                                   const char* role, const char* resultRole) {
    (void)mi, (void)context, (void)assocClass, (void)resultClass, (void)role, (void)resultRole;
    return CMReturnObjectPath(result, path);
}

NOT_SUPPORTED(CReferences,
              (REQUEST(Association), const char* resultClass, const char* role, const char** properties),
              (result == NULL || path == NULL || resultClass == NULL || role == NULL || properties == NULL))
NOT_SUPPORTED(CReferenceNames, (REQUEST(Association), const char* resultClass, const char* role),
              (result == NULL || path == NULL || resultClass == NULL || role == NULL))

/* Method MI: the arguments come back, and the namespace of the context as the method's value. */

CLEANUP(CMethodCleanup, Method)

static CMPIStatus CInvokeMethod(REQUEST(Method), const char* method, const CMPIArgs* in, CMPIArgs* out) {
    CMPIData nameSpace = CMGetContextEntry(context, CMPIInitNameSpace, NULL);
    CMPICount i;
    (void)mi, (void)path;
    for (i = 0; i < CMGetArgCount(in, NULL); ++i) {
        CMPIString* name = NULL;
        CMPIData argument = CMGetArgAt(in, i, &name, NULL);
        if (!CMIsNullValue(argument) && !CMIsArray(argument)) {
            CMAddArg(out, CMGetCharsPtr(name, NULL), &argument.value, argument.type);
        }
    }
    CMAddArg(out, "Method", method, CMPI_chars);
    return CMReturnData(result, &nameSpace.value, nameSpace.type);
}

/* Property and indication MI */

CLEANUP(CPropertyCleanup, Property)
NOT_SUPPORTED(CSetProperty, (REQUEST(Property), const char* name, const CMPIData data),
              (result == NULL || path == NULL || name == NULL || CMIsNullValue(data)))
NOT_SUPPORTED(CGetProperty, (REQUEST(Property), const char* name),
              (result == NULL || path == NULL || name == NULL))

CLEANUP(CIndicationCleanup, Indication)

#define FILTER                                                                                            \
    CMPIIndicationMI *mi, const CMPIContext *context, const CMPISelectExp *filter, const char *className, \
        const CMPIObjectPath *path

NOT_SUPPORTED(CAuthorizeFilter, (FILTER, const char* owner),
              (filter == NULL || className == NULL || path == NULL || owner == NULL))
NOT_SUPPORTED(CMustPoll, (FILTER), (filter == NULL || className == NULL || path == NULL))
NOT_SUPPORTED(CActivateFilter, (FILTER, CMPIBoolean isFirst),
              (filter == NULL || className == NULL || path == NULL || isFirst))
NOT_SUPPORTED(CDeActivateFilter, (FILTER, CMPIBoolean isLast),
              (filter == NULL || className == NULL || path == NULL || isLast))
NOT_SUPPORTED(CEnableIndications, (CMPIIndicationMI * mi, const CMPIContext* context), 0)
NOT_SUPPORTED(CDisableIndications, (CMPIIndicationMI * mi, const CMPIContext* context), 0)

CMInstanceMIStub(C, CProvider, broker, CMNoHook)
CMAssociationMIStub(C, CProvider, broker, )
CMMethodMIStub(C, CProvider, broker, ++factoryCalls)
CMPropertyMIStub(C, CProvider, broker, CMNoHook)
CMIndicationMIStub(C, CProvider, broker, CMNoHook)

/* The names that no request above needs. Nothing calls it: that it compiles is enough. */
CMPI_EXPORT CMPIStatus CRemainingNames(CMPIInstance* instance, CMPIContext* context);
CMPI_EXPORT CMPIStatus CRemainingNames(CMPIInstance* instance, CMPIContext* context) {
    CMPIStatus status = {CMPI_RC_OK, NULL};
    CMPIString* name = CMNewString(broker, "name", &status);
    CMPIArgs* arguments = CMNewArgs(broker, &status);
    CMPIDateTime* now = CMNewDateTime(broker, &status);
    CMPIData data = CMGetProperty(instance, "Text", &status);
    CMAddContextEntry(context, "entry", CMGetCharsPtr(CMGetStringFormat(now, NULL), NULL), CMPI_chars);
    if (CMGetContextEntryCount(context, NULL) > 0) {
        data = CMGetContextEntryAt(context, 0, &name, &status);
    }
    if (CMGetPropertyCount(instance, NULL) > 0) {
        data = CMGetPropertyAt(instance, 0, &name, &status);
    }
    data = CMGetArrayElementAt(data.value.array, 0, &status);
    CMAddArg(arguments, "data", &data.value, data.type);
    data = CMGetArg(arguments, "data", &status);
    data = CMGetKey(CMGetObjectPath(instance, NULL), "key", &status);
    return status;
}
