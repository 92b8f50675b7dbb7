/* A library that needs a function which no library has: it cannot be loaded. */
#include <cmpift.h>

CMPIInstanceMI* functionThatNobodyHas(void);

CMPI_EXTERN_C CMPIInstanceMI* Unbound_Create_InstanceMI(const CMPIBroker* mb,
                                                        const CMPIContext* ctx, CMPIStatus* rc) {
    (void)mb;
    (void)ctx;
    (void)rc;
    return functionThatNobodyHas();
}
