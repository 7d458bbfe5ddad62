// A provider that takes each request the library's whole road: the path's keys into a moniker and back, an
// instance with properties of every kind, and the texts, dates and names that belong to them. As a library it
// is libRoad.so.
#pragma once

#include <ProviderUtilities.h>

extern "C" CMPIInstanceMI* Road_Create_InstanceMI(const CMPIBroker* broker, const CMPIContext* context,
                                                  CMPIStatus* status);
