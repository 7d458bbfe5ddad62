// The provider's own entry points, for programs that link it in place of loading it.
#pragma once

#include <ProviderUtilities.h>

#include <string>

// Makes the providers that are created from now on read a machine below `root`.
void setHostRoot(const std::string& root);

extern "C" CMPIInstanceMI* OXAHostProvider_Create_InstanceMI(const CMPIBroker* broker,
                                                             const CMPIContext* context, CMPIStatus* rc);
extern "C" CMPIAssociationMI* OXAHostProvider_Create_AssociationMI(const CMPIBroker* broker,
                                                                   const CMPIContext* context,
                                                                   CMPIStatus* rc);
extern "C" CMPIMethodMI* OXAHostProvider_Create_MethodMI(const CMPIBroker* broker, const CMPIContext* context,
                                                         CMPIStatus* rc);
