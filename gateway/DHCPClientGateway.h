#pragma once

#include <cmpift.h>

// The factories of the gateway, as object managers call them. Each gives the same record at
// each call, which lives as long as the library.

CMPI_EXTERN_C CMPIInstanceMI* DHCPClientGateway_Create_InstanceMI(const CMPIBroker* broker,
                                                                  const CMPIContext* ctx,
                                                                  CMPIStatus* rc);
CMPI_EXTERN_C CMPIAssociationMI* DHCPClientGateway_Create_AssociationMI(const CMPIBroker* broker,
                                                                        const CMPIContext* ctx,
                                                                        CMPIStatus* rc);
