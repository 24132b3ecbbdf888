/*
 * Compiled as C99 by CTest (syntax only): providers written in C must be able
 * to use the CMPI headers without warnings, including a factory function and
 * a statically initialised MI table.
 */
#include <cmpift.h>
#include <cmpimacs.h>

#include <stddef.h>

/* Pre-C11 compile-time check: a negative array size fails the build. */
#define C_CHECK(name, cond) typedef char c_check_##name[(cond) ? 1 : -1]

C_CHECK(value_size, sizeof(CMPIValue) == 16);
C_CHECK(data_size, sizeof(CMPIData) == 24);
C_CHECK(status_size, sizeof(CMPIStatus) == 16);
C_CHECK(broker_size, sizeof(CMPIBroker) == 40);
C_CHECK(enc_trace, offsetof(CMPIBrokerEncFT, trace) == 128);
C_CHECK(enc_size, sizeof(CMPIBrokerEncFT) == 168);
C_CHECK(result_size, sizeof(CMPIResultFT) == 64);
C_CHECK(instance_ft_size, sizeof(CMPIInstanceFT) == 88);
C_CHECK(instance_mi_size, sizeof(CMPIInstanceMIFT) == 80);
C_CHECK(property_mi_size, sizeof(CMPIPropertyMIFT) == 48);
C_CHECK(indication_mi_size, sizeof(CMPIIndicationMIFT) == 72);
C_CHECK(thread_key_size, sizeof(CMPI_THREAD_KEY_TYPE) == 4);

CMPIStatus CheckCleanup(CMPIMethodMI* mi, const CMPIContext* ctx,
                        CMPIBoolean terminating);
CMPIStatus CheckCleanup(CMPIMethodMI* mi, const CMPIContext* ctx,
                        CMPIBoolean terminating)
{
    (void)mi;
    (void)ctx;
    (void)terminating;
    CMReturn(CMPI_RC_OK);
}

static CMPIMethodMIFT checkMethodTable = {
    CMPICurrentVersion, CMPICurrentVersion, "methodCheck", CheckCleanup, NULL,
};

static CMPIMethodMI checkMethodMI = {NULL, &checkMethodTable};

CMPI_EXTERN_C CMPIMethodMI* Check_Create_MethodMI(const CMPIBroker* mb,
                                                  const CMPIContext* ctx,
                                                  CMPIStatus* rc);
CMPI_EXTERN_C CMPIMethodMI* Check_Create_MethodMI(const CMPIBroker* mb,
                                                  const CMPIContext* ctx,
                                                  CMPIStatus* rc)
{
    (void)mb;
    (void)ctx;
    CMSetStatus(rc, CMPI_RC_OK);
    return &checkMethodMI;
}
