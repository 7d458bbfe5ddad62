/* A provider in C that returns what it is sent, so that a request shows how the broker serves it. */
#include <cmpimacs.h>

/* The tables fix the parameters. */
#pragma GCC diagnostic ignored "-Wunused-parameter"

static const CMPIBroker* broker;

/* The parameters that the functions of an MI begin with. */
#define REQUEST(kind) \
    CMPI##kind##MI *mi, const CMPIContext *context, const CMPIResult *result, const CMPIObjectPath *path

/* A path's copy with all that a path can say. */
static CMPIObjectPath* CopyOf(const CMPIObjectPath* path, CMPIStatus* status) {
    CMPIObjectPath* copy = CMNewObjectPath(broker, "", "", status);
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
    return CMClone(instance, NULL);
}

static CMPIStatus CEnumInstanceNames(REQUEST(Instance)) {
    CMPIStatus status = {CMPI_RC_OK, NULL};
    CMPIObjectPath* copy = CopyOf(path, &status);
    if (status.rc == CMPI_RC_OK && !CMIsNullObject(copy)) {
        CMReturnObjectPath(result, copy);
    }
    CMRelease(copy);
    CMReturnDone(result);
    return status;
}

/* As an upcall: the instance of every name. */
static CMPIStatus CEnumInstances(REQUEST(Instance), const char** properties) {
    CMPIStatus status = {CMPI_RC_OK, NULL};
    CMPIEnumeration* names = CBEnumInstanceNames(broker, context, path, &status);
    CMPIArray* all = CMToArray(names, NULL);
    if (CMGetArrayType(all, NULL) != CMPI_ref || CMGetArrayCount(all, NULL) != 1) {
        CMSetStatus(&status, CMPI_RC_ERR_FAILED);
    }
    while (CMHasNext(names, NULL)) {
        CMReturnInstance(result, InstanceOf(CMGetNext(names, NULL).value.ref, properties, &status));
    }
    return status;
}

/* The arguments come back, and the namespace of the context as the method's value. */
static CMPIStatus CInvokeMethod(REQUEST(Method), const char* method, const CMPIArgs* in, CMPIArgs* out) {
    CMPIData nameSpace = CMGetContextEntry(context, CMPIInitNameSpace, NULL);
    CMPICount i;
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

#define UNSERVED(name, ...)                  \
    static CMPIStatus name(__VA_ARGS__) {    \
        CMReturn(CMPI_RC_ERR_NOT_SUPPORTED); \
    }

UNSERVED(CCleanup, CMPIInstanceMI* mi, const CMPIContext* context, CMPIBoolean ending)
UNSERVED(CGetInstance, REQUEST(Instance), const char** properties)
UNSERVED(CCreateInstance, REQUEST(Instance), const CMPIInstance* instance)
UNSERVED(CModifyInstance, REQUEST(Instance), const CMPIInstance* instance, const char** properties)
UNSERVED(CDeleteInstance, REQUEST(Instance))
UNSERVED(CExecQuery, REQUEST(Instance), const char* query, const char* language)
UNSERVED(CMethodCleanup, CMPIMethodMI* mi, const CMPIContext* context, CMPIBoolean ending)

CMInstanceMIStub(C, CProvider, broker, CMNoHook)
CMMethodMIStub(C, CProvider, broker, CMNoHook)
