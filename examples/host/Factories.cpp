// What a CIM server calls when it loads the provider: a factory for each function table. They begin by
// reading the server's context, which the stubs of the CMPI headers do not.

#include "HostProvider.h"
#include "Provider.h"

#include <TKExport.h>

extern "C" {
CMPIInstanceMI* OXAHost_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
CMPIAssociationMI* OXAHost_Create_AssociationMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
CMPIMethodMI* OXAHost_Create_MethodMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
}

namespace {

template <class MI>
MI* create(MI* (*stub)(const CMPIBroker*, const CMPIContext*, CMPIStatus*), const CMPIBroker* theBroker,
           const CMPIContext* context, CMPIStatus* rc) {
    const CMPIStatus status = begin(theBroker, context);
    if (status.rc == CMPI_RC_OK) {
        return stub(theBroker, context, rc);
    }
    if (rc != nullptr) {
        *rc = status;
    }
    return nullptr;
}

} // namespace

TK_EXPORT CMPIInstanceMI* OXAHostProvider_Create_InstanceMI(const CMPIBroker* theBroker,
                                                            const CMPIContext* context, CMPIStatus* rc) {
    return create(OXAHost_Create_InstanceMI, theBroker, context, rc);
}

TK_EXPORT CMPIAssociationMI* OXAHostProvider_Create_AssociationMI(const CMPIBroker* theBroker,
                                                                  const CMPIContext* context,
                                                                  CMPIStatus* rc) {
    return create(OXAHost_Create_AssociationMI, theBroker, context, rc);
}

TK_EXPORT CMPIMethodMI* OXAHostProvider_Create_MethodMI(const CMPIBroker* theBroker,
                                                        const CMPIContext* context, CMPIStatus* rc) {
    return create(OXAHost_Create_MethodMI, theBroker, context, rc);
}
