/*
 * CMPI encapsulated objects, each an opaque handle plus a function table:
 * the data objects the broker hands the provider, and the management
 * instrumentation (MI) interfaces the provider library exports.
 *
 * Every struct here is shared in binary form with the object manager, so
 * member order and types must stay exactly as they are. Included through
 * cmpift.h.
 */
#ifndef CMPI_FT_OBJECTS_H_INCLUDED
#define CMPI_FT_OBJECTS_H_INCLUDED

#include "cmpidt.h"
#include "cmpios.h"

/* clang-format off */
#ifdef __cplusplus
extern "C" {
#endif

/* ---- Encapsulated objects: an opaque handle plus a function table --- */

struct _CMPIContext
{
    void* hdl;
    CMPIContextFT* ft;
};

struct _CMPIContextFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPIContext* ctx);
    CMPIContext* (*clone)(const CMPIContext* ctx, CMPIStatus* rc);
    CMPIData (*getEntry)(const CMPIContext* ctx, const char* name,
                         CMPIStatus* rc);
    CMPIData (*getEntryAt)(const CMPIContext* ctx, CMPICount index,
                           CMPIString** name, CMPIStatus* rc);
    CMPICount (*getEntryCount)(const CMPIContext* ctx, CMPIStatus* rc);
    CMPIStatus (*addEntry)(const CMPIContext* ctx, const char* name,
                           const CMPIValue* value, const CMPIType type);
};

struct _CMPIResult
{
    void* hdl;
    CMPIResultFT* ft;
};

/* OpenPegasus leaves release and clone NULL on results given to an MI. */
struct _CMPIResultFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPIResult* rslt);
    CMPIResult* (*clone)(const CMPIResult* rslt, CMPIStatus* rc);
    CMPIStatus (*returnData)(const CMPIResult* rslt, const CMPIValue* value,
                             const CMPIType type);
    CMPIStatus (*returnInstance)(const CMPIResult* rslt,
                                 const CMPIInstance* inst);
    CMPIStatus (*returnObjectPath)(const CMPIResult* rslt,
                                   const CMPIObjectPath* ref);
    CMPIStatus (*returnDone)(const CMPIResult* rslt);
#ifdef CMPI_VER_200
    CMPIStatus (*returnError)(const CMPIResult* rslt, const CMPIError* er);
#endif
};

#ifdef CMPI_VER_200
struct _CMPIError
{
    void* hdl;
    CMPIErrorFT* ft;
};

struct _CMPIErrorFT
{
    CMPISint32 ftVersion;
    CMPIStatus (*release)(CMPIError* er);
    CMPIError* (*clone)(const CMPIError* er, CMPIStatus* rc);
    CMPIErrorType (*getErrorType)(const CMPIError* er, CMPIStatus* rc);
    CMPIString* (*getOtherErrorType)(const CMPIError* er, CMPIStatus* rc);
    CMPIString* (*getOwningEntity)(const CMPIError* er, CMPIStatus* rc);
    CMPIString* (*getMessageID)(const CMPIError* er, CMPIStatus* rc);
    CMPIString* (*getMessage)(const CMPIError* er, CMPIStatus* rc);
    CMPIErrorSeverity (*getPerceivedSeverity)(const CMPIError* er,
                                              CMPIStatus* rc);
    CMPIErrorProbableCause (*getProbableCause)(const CMPIError* er,
                                               CMPIStatus* rc);
    CMPIString* (*getProbableCauseDescription)(const CMPIError* er,
                                               CMPIStatus* rc);
    CMPIArray* (*getRecommendedActions)(const CMPIError* er, CMPIStatus* rc);
    CMPIString* (*getErrorSource)(const CMPIError* er, CMPIStatus* rc);
    CMPIErrorSrcFormat (*getErrorSourceFormat)(const CMPIError* er,
                                               CMPIStatus* rc);
    CMPIString* (*getOtherErrorSourceFormat)(const CMPIError* er,
                                             CMPIStatus* rc);
    CMPIrc (*getCIMStatusCode)(const CMPIError* er, CMPIStatus* rc);
    CMPIString* (*getCIMStatusCodeDescription)(const CMPIError* er,
                                               CMPIStatus* rc);
    CMPIArray* (*getMessageArguments)(const CMPIError* er, CMPIStatus* rc);
    CMPIStatus (*setErrorType)(CMPIError* er, const CMPIErrorType et);
    CMPIStatus (*setOtherErrorType)(CMPIError* er, const char* ot);
    CMPIStatus (*setProbableCauseDescription)(CMPIError* er, const char* pcd);
    CMPIStatus (*setRecommendedActions)(CMPIError* er, const CMPIArray* ra);
    CMPIStatus (*setErrorSource)(CMPIError* er, const char* es);
    CMPIStatus (*setErrorSourceFormat)(CMPIError* er,
                                       const CMPIErrorSrcFormat esf);
    CMPIStatus (*setOtherErrorSourceFormat)(CMPIError* er, const char* oef);
    CMPIStatus (*setCIMStatusCodeDescription)(CMPIError* er, const char* scd);
    CMPIStatus (*setMessageArguments)(CMPIError* er, CMPIArray* values);
};
#endif /* CMPI_VER_200 */

struct _CMPIInstance
{
    void* hdl;
    CMPIInstanceFT* ft;
};

struct _CMPIInstanceFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPIInstance* inst);
    CMPIInstance* (*clone)(const CMPIInstance* inst, CMPIStatus* rc);
    CMPIData (*getProperty)(const CMPIInstance* inst, const char* name,
                            CMPIStatus* rc);
    CMPIData (*getPropertyAt)(const CMPIInstance* inst, CMPICount index,
                              CMPIString** name, CMPIStatus* rc);
    CMPICount (*getPropertyCount)(const CMPIInstance* inst, CMPIStatus* rc);
    CMPIStatus (*setProperty)(const CMPIInstance* inst, const char* name,
                              const CMPIValue* value, CMPIType type);
    CMPIObjectPath* (*getObjectPath)(const CMPIInstance* inst, CMPIStatus* rc);
    CMPIStatus (*setPropertyFilter)(CMPIInstance* inst,
                                    const char** propertyList,
                                    const char** keys);
    CMPIStatus (*setObjectPath)(CMPIInstance* inst, const CMPIObjectPath* op);
#ifdef CMPI_VER_200
    CMPIStatus (*setPropertyWithOrigin)(const CMPIInstance* inst,
                                        const char* name,
                                        const CMPIValue* value,
                                        const CMPIType type,
                                        const char* origin);
#endif
};

struct _CMPIObjectPath
{
    void* hdl;
    CMPIObjectPathFT* ft;
};

struct _CMPIObjectPathFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPIObjectPath* op);
    CMPIObjectPath* (*clone)(const CMPIObjectPath* op, CMPIStatus* rc);
    CMPIStatus (*setNameSpace)(CMPIObjectPath* op, const char* ns);
    CMPIString* (*getNameSpace)(const CMPIObjectPath* op, CMPIStatus* rc);
    CMPIStatus (*setHostname)(CMPIObjectPath* op, const char* hn);
    CMPIString* (*getHostname)(const CMPIObjectPath* op, CMPIStatus* rc);
    CMPIStatus (*setClassName)(CMPIObjectPath* op, const char* cn);
    CMPIString* (*getClassName)(const CMPIObjectPath* op, CMPIStatus* rc);
    CMPIStatus (*addKey)(CMPIObjectPath* op, const char* name,
                         const CMPIValue* value, const CMPIType type);
    CMPIData (*getKey)(const CMPIObjectPath* op, const char* name,
                       CMPIStatus* rc);
    CMPIData (*getKeyAt)(const CMPIObjectPath* op, CMPICount index,
                         CMPIString** name, CMPIStatus* rc);
    CMPICount (*getKeyCount)(const CMPIObjectPath* op, CMPIStatus* rc);
    CMPIStatus (*setNameSpaceFromObjectPath)(CMPIObjectPath* op,
                                             const CMPIObjectPath* src);
    CMPIStatus (*setHostAndNameSpaceFromObjectPath)(CMPIObjectPath* op,
                                                    const CMPIObjectPath* src);
    CMPIData (*getClassQualifier)(const CMPIObjectPath* op, const char* qName,
                                  CMPIStatus* rc);
    CMPIData (*getPropertyQualifier)(const CMPIObjectPath* op,
                                     const char* pName, const char* qName,
                                     CMPIStatus* rc);
    CMPIData (*getMethodQualifier)(const CMPIObjectPath* op,
                                   const char* methodName, const char* qName,
                                   CMPIStatus* rc);
    CMPIData (*getParameterQualifier)(const CMPIObjectPath* op,
                                      const char* mName, const char* pName,
                                      const char* qName, CMPIStatus* rc);
    CMPIString* (*toString)(const CMPIObjectPath* op, CMPIStatus* rc);
};

struct _CMPISelectExp
{
    void* hdl;
    CMPISelectExpFT* ft;
};

struct _CMPISelectExpFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPISelectExp* se);
    CMPISelectExp* (*clone)(const CMPISelectExp* se, CMPIStatus* rc);
    CMPIBoolean (*evaluate)(const CMPISelectExp* se, const CMPIInstance* inst,
                            CMPIStatus* rc);
    CMPIString* (*getString)(const CMPISelectExp* se, CMPIStatus* rc);
    CMPISelectCond* (*getDOC)(const CMPISelectExp* se, CMPIStatus* rc);
    CMPISelectCond* (*getCOD)(const CMPISelectExp* se, CMPIStatus* rc);
    CMPIBoolean (*evaluateUsingAccessor)(const CMPISelectExp* se,
                                         CMPIAccessor* accessor, void* parm,
                                         CMPIStatus* rc);
};

struct _CMPISelectCond
{
    void* hdl;
    CMPISelectCondFT* ft;
};

struct _CMPISelectCondFT
{
    const int ftVersion;
    CMPIStatus (*release)(CMPISelectCond* sc);
    CMPISelectCond* (*clone)(const CMPISelectCond* sc, CMPIStatus* rc);
    /* type receives a CMPISelectCondType value. */
    CMPICount (*getCountAndType)(const CMPISelectCond* sc, int* type,
                                 CMPIStatus* rc);
    CMPISubCond* (*getSubCondAt)(const CMPISelectCond* sc, CMPICount index,
                                 CMPIStatus* rc);
};

struct _CMPISubCond
{
    void* hdl;
    CMPISubCondFT* ft;
};

struct _CMPISubCondFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPISubCond* sc);
    CMPISubCond* (*clone)(const CMPISubCond* sc, CMPIStatus* rc);
    CMPICount (*getCount)(const CMPISubCond* sc, CMPIStatus* rc);
    CMPIPredicate* (*getPredicateAt)(const CMPISubCond* sc, CMPICount index,
                                     CMPIStatus* rc);
    CMPIPredicate* (*getPredicate)(const CMPISubCond* sc, const char* name,
                                   CMPIStatus* rc);
};

struct _CMPIPredicate
{
    void* hdl;
    CMPIPredicateFT* ft;
};

struct _CMPIPredicateFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPIPredicate* pr);
    CMPIPredicate* (*clone)(const CMPIPredicate* pr, CMPIStatus* rc);
    CMPIStatus (*getData)(const CMPIPredicate* pr, CMPIType* type,
                          CMPIPredOp* op, CMPIString** lhs, CMPIString** rhs);
    CMPIBoolean (*evaluateUsingAccessor)(const CMPIPredicate* pr,
                                         CMPIAccessor* accessorFnc, void* parm,
                                         CMPIStatus* rc);
};

struct _CMPIArgs
{
    void* hdl;
    CMPIArgsFT* ft;
};

struct _CMPIArgsFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPIArgs* as);
    CMPIArgs* (*clone)(const CMPIArgs* as, CMPIStatus* rc);
    CMPIStatus (*addArg)(const CMPIArgs* as, const char* name,
                         const CMPIValue* value, const CMPIType type);
    CMPIData (*getArg)(const CMPIArgs* as, const char* name, CMPIStatus* rc);
    CMPIData (*getArgAt)(const CMPIArgs* as, CMPICount index, CMPIString** name,
                         CMPIStatus* rc);
    CMPICount (*getArgCount)(const CMPIArgs* as, CMPIStatus* rc);
};

struct _CMPIString
{
    void* hdl;
    CMPIStringFT* ft;
};

struct _CMPIStringFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPIString* st);
    CMPIString* (*clone)(const CMPIString* st, CMPIStatus* rc);
    const char* (*getCharPtr)(const CMPIString* st, CMPIStatus* rc);
};

struct _CMPIArray
{
    void* hdl;
    CMPIArrayFT* ft;
};

struct _CMPIArrayFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPIArray* ar);
    CMPIArray* (*clone)(const CMPIArray* ar, CMPIStatus* rc);
    CMPICount (*getSize)(const CMPIArray* ar, CMPIStatus* rc);
    CMPIType (*getSimpleType)(const CMPIArray* ar, CMPIStatus* rc);
    CMPIData (*getElementAt)(const CMPIArray* ar, CMPICount index,
                             CMPIStatus* rc);
    CMPIStatus (*setElementAt)(CMPIArray* ar, CMPICount index,
                               const CMPIValue* value, CMPIType type);
};

struct _CMPIEnumeration
{
    void* hdl;
    CMPIEnumerationFT* ft;
};

struct _CMPIEnumerationFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPIEnumeration* en);
    CMPIEnumeration* (*clone)(const CMPIEnumeration* en, CMPIStatus* rc);
    CMPIData (*getNext)(const CMPIEnumeration* en, CMPIStatus* rc);
    CMPIBoolean (*hasNext)(const CMPIEnumeration* en, CMPIStatus* rc);
    CMPIArray* (*toArray)(const CMPIEnumeration* en, CMPIStatus* rc);
};

struct _CMPIDateTime
{
    void* hdl;
    CMPIDateTimeFT* ft;
};

struct _CMPIDateTimeFT
{
    int ftVersion;
    CMPIStatus (*release)(CMPIDateTime* dt);
    CMPIDateTime* (*clone)(const CMPIDateTime* dt, CMPIStatus* rc);
    /* Microseconds since the epoch, or the length of an interval. */
    CMPIUint64 (*getBinaryFormat)(const CMPIDateTime* dt, CMPIStatus* rc);
    CMPIString* (*getStringFormat)(const CMPIDateTime* dt, CMPIStatus* rc);
    CMPIBoolean (*isInterval)(const CMPIDateTime* dt, CMPIStatus* rc);
};

/* ---- Management instrumentation (provider side) --------------------- */

typedef struct _CMPIInstanceMIFT CMPIInstanceMIFT;
typedef struct _CMPIInstanceMI
{
    const void* hdl;
    CMPIInstanceMIFT* ft;
} CMPIInstanceMI;

struct _CMPIInstanceMIFT
{
    int ftVersion;
    int miVersion;
    const char* miName;
    CMPIStatus (*cleanup)(CMPIInstanceMI* mi, const CMPIContext* ctx,
                          CMPIBoolean terminating);
    CMPIStatus (*enumerateInstanceNames)(CMPIInstanceMI* mi,
                                         const CMPIContext* ctx,
                                         const CMPIResult* rslt,
                                         const CMPIObjectPath* op);
    CMPIStatus (*enumerateInstances)(CMPIInstanceMI* mi, const CMPIContext* ctx,
                                     const CMPIResult* rslt,
                                     const CMPIObjectPath* op,
                                     const char** properties);
    CMPIStatus (*getInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx,
                              const CMPIResult* rslt, const CMPIObjectPath* op,
                              const char** properties);
    CMPIStatus (*createInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx,
                                 const CMPIResult* rslt,
                                 const CMPIObjectPath* op,
                                 const CMPIInstance* inst);
    CMPIStatus (*modifyInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx,
                                 const CMPIResult* rslt,
                                 const CMPIObjectPath* op,
                                 const CMPIInstance* inst,
                                 const char** properties);
    CMPIStatus (*deleteInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx,
                                 const CMPIResult* rslt,
                                 const CMPIObjectPath* op);
    CMPIStatus (*execQuery)(CMPIInstanceMI* mi, const CMPIContext* ctx,
                            const CMPIResult* rslt, const CMPIObjectPath* op,
                            const char* query, const char* lang);
};

typedef struct _CMPIAssociationMIFT CMPIAssociationMIFT;
typedef struct _CMPIAssociationMI
{
    void* hdl;
    CMPIAssociationMIFT* ft;
} CMPIAssociationMI;

struct _CMPIAssociationMIFT
{
    int ftVersion;
    const CMPISint32 miVersion;
    const char* miName;
    CMPIStatus (*cleanup)(CMPIAssociationMI* mi, const CMPIContext* ctx,
                          CMPIBoolean terminating);
    CMPIStatus (*associators)(CMPIAssociationMI* mi, const CMPIContext* ctx,
                              const CMPIResult* rslt, const CMPIObjectPath* op,
                              const char* asscClass, const char* resultClass,
                              const char* role, const char* resultRole,
                              const char** properties);
    CMPIStatus (*associatorNames)(CMPIAssociationMI* mi, const CMPIContext* ctx,
                                  const CMPIResult* rslt,
                                  const CMPIObjectPath* op,
                                  const char* assocClass,
                                  const char* resultClass, const char* role,
                                  const char* resultRole);
    CMPIStatus (*references)(CMPIAssociationMI* mi, const CMPIContext* ctx,
                             const CMPIResult* rslt, const CMPIObjectPath* op,
                             const char* resultClass, const char* role,
                             const char** properties);
    CMPIStatus (*referenceNames)(CMPIAssociationMI* mi, const CMPIContext* ctx,
                                 const CMPIResult* rslt,
                                 const CMPIObjectPath* op,
                                 const char* resultClass, const char* role);
};

typedef struct _CMPIMethodMIFT CMPIMethodMIFT;
typedef struct _CMPIMethodMI
{
    void* hdl;
    CMPIMethodMIFT* ft;
} CMPIMethodMI;

struct _CMPIMethodMIFT
{
    int ftVersion;
    int miVersion;
    const char* miName;
    CMPIStatus (*cleanup)(CMPIMethodMI* mi, const CMPIContext* ctx,
                          CMPIBoolean terminating);
    CMPIStatus (*invokeMethod)(CMPIMethodMI* mi, const CMPIContext* ctx,
                               const CMPIResult* rslt, const CMPIObjectPath* op,
                               const char* method, const CMPIArgs* in,
                               CMPIArgs* out);
};

typedef struct _CMPIPropertyMIFT CMPIPropertyMIFT;
typedef struct _CMPIPropertyMI
{
    void* hdl;
    CMPIPropertyMIFT* ft;
} CMPIPropertyMI;

struct _CMPIPropertyMIFT
{
    int ftVersion;
    int miVersion;
    const char* miName;
    CMPIStatus (*cleanup)(CMPIPropertyMI* mi, const CMPIContext* ctx,
                          CMPIBoolean terminating);
    CMPIStatus (*setProperty)(CMPIPropertyMI* mi, const CMPIContext* ctx,
                              const CMPIResult* rslt, const CMPIObjectPath* op,
                              const char* name, const CMPIData data);
    CMPIStatus (*getProperty)(CMPIPropertyMI* mi, const CMPIContext* ctx,
                              const CMPIResult* rslt,
                              const CMPIObjectPath* instPath, const char* name);
#ifdef CMPI_VER_200
    /* OpenPegasus never reads this slot. */
    CMPIStatus (*setPropertyWithOrigin)(CMPIPropertyMI* mi,
                                        const CMPIContext* ctx,
                                        const CMPIResult* rslt,
                                        CMPIObjectPath* op, const char* name,
                                        const CMPIData data,
                                        const char* origin);
#endif
};

typedef struct _CMPIIndicationMIFT CMPIIndicationMIFT;
typedef struct _CMPIIndicationMI
{
    void* hdl;
    CMPIIndicationMIFT* ft;
} CMPIIndicationMI;

/*
 * Brokers select older calling sequences when ftVersion is below 100, so
 * set ftVersion and miVersion to CMPICurrentVersion. SFCB calls
 * enableIndications/disableIndications without a NULL check.
 */
struct _CMPIIndicationMIFT
{
    int ftVersion;
    int miVersion;
    const char* miName;
    CMPIStatus (*cleanup)(CMPIIndicationMI* mi, const CMPIContext* ctx,
                          CMPIBoolean terminating);
    CMPIStatus (*authorizeFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx,
                                  const CMPISelectExp* filter,
                                  const char* className,
                                  const CMPIObjectPath* op, const char* owner);
    CMPIStatus (*mustPoll)(CMPIIndicationMI* mi, const CMPIContext* ctx,
                           const CMPISelectExp* filter, const char* className,
                           const CMPIObjectPath* classPath);
    CMPIStatus (*activateFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx,
                                 const CMPISelectExp* filter,
                                 const char* className,
                                 const CMPIObjectPath* classPath,
                                 CMPIBoolean firstActivation);
    CMPIStatus (*deActivateFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx,
                                   const CMPISelectExp* filter,
                                   const char* className,
                                   const CMPIObjectPath* classPath,
                                   CMPIBoolean lastActivation);
    CMPIStatus (*enableIndications)(CMPIIndicationMI* mi,
                                    const CMPIContext* ctx);
    CMPIStatus (*disableIndications)(CMPIIndicationMI* mi,
                                     const CMPIContext* ctx);
};

#ifdef __cplusplus
}
#endif
/* clang-format on */

#endif /* CMPI_FT_OBJECTS_H_INCLUDED */
