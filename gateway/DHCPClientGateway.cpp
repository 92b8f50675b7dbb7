#include "DHCPClientGateway.h"

// The factories of the exact provider, which is known by nothing else.
CMPI_EXTERN_C CMPIInstanceMI* DHCPClientProvider_Create_InstanceMI(const CMPIBroker* broker,
                                                                   const CMPIContext* ctx,
                                                                   CMPIStatus* rc);
CMPI_EXTERN_C CMPIAssociationMI* DHCPClientProvider_Create_AssociationMI(const CMPIBroker* broker,
                                                                         const CMPIContext* ctx,
                                                                         CMPIStatus* rc);

CMPIInstanceMI* DHCPClientGateway_Create_InstanceMI(const CMPIBroker* broker,
                                                    const CMPIContext* ctx, CMPIStatus* rc) {
    return DHCPClientProvider_Create_InstanceMI(broker, ctx, rc);
}

CMPIAssociationMI* DHCPClientGateway_Create_AssociationMI(const CMPIBroker* broker,
                                                          const CMPIContext* ctx, CMPIStatus* rc) {
    return DHCPClientProvider_Create_AssociationMI(broker, ctx, rc);
}
