/* A provider written in C, with every kind of MI: that the CMPI headers are C is shown by its being compiled.
 */
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>
#include <cmpios.h>
#include <cmpipl.h>

static const CMPIBroker* broker;

/* The functions that this provider does not serve. */
#define NOT_SUPPORTED(name, parameters)      \
    static CMPIStatus name parameters {      \
        CMReturn(CMPI_RC_ERR_NOT_SUPPORTED); \
    }

static CMPIStatus CCleanup(CMPIInstanceMI* mi, const CMPIContext* context, CMPIBoolean ending) {
    (void)mi;
    (void)context;
    (void)ending;
    CMReturn(CMPI_RC_OK);
}

static CMPIStatus CEnumInstanceNames(REQUEST(Instance)) {
    CMPIStatus status;
    CMPIObjectPath* name = CMNewObjectPath(broker, "root/cimv2", "Demo_Class", &status);
    (void)mi;
    (void)context;
    (void)path;
    if (status.rc == CMPI_RC_OK && !CMIsNullObject(name)) {
        CMAddKey(name, "Key", "text", CMPI_chars);
        CMReturnObjectPath(result, name);
    }
    CMReturnDone(result);
    return status;
}

static CMPIStatus CInvokeMethod(REQUEST(Method), const char* method, const CMPIArgs* in, CMPIArgs* out) {
    CMPIStatus status;
    CMPIData data = CMGetArg(in, "Argument", &status);
    (void)mi;
    (void)context;
    (void)path;
    (void)method;
    if (!CMIsNullValue(data) && !CMIsArray(data)) {
        CMAddArg(out, "Argument", &data.value, data.type);
        CMReturnData(result, &data.value, data.type);
    }
    CMSetStatus(&status, CMPI_RC_OK);
    return status;
}
