/* CMPI function tables: of the broker, of the encapsulated objects and of the provider interfaces.
 *
 * Members marked [200] or [210] exist only in tables of that version or later. Where the first
 * version had another name for a member, both names are usable. A `rc` parameter may be null.
 */
#ifndef TVX_CMPI_CMPIFT_H
#define TVX_CMPI_CMPIFT_H

#include "cmpidt.h"

struct timespec;

#ifdef __cplusplus
extern "C" {
#endif

/* Head of the function table of every encapsulated object. */
#define CMPI_OBJECT_FT_HEAD(OBJECT)     \
  CMPIVersion ftVersion;                \
  CMPIStatus (*release)(OBJECT * self); \
  OBJECT* (*clone)(const OBJECT* self, CMPIStatus* rc)

/* Head of the function table of every provider interface. */
#define CMPI_MI_FT_HEAD(MI) \
  CMPIVersion ftVersion;    \
  int miVersion;            \
  const char* miName;       \
  CMPIStatus (*cleanup)(MI * self, const CMPIContext* ctx, CMPIBoolean terminating)

/* One slot with the name of the first version and that of the later ones. */
#define CMPI_RENAMED_SLOT(RESULT, NAME, NAME_100, ARGS) \
  __extension__ union {                                 \
    RESULT(*NAME) ARGS;                                 \
    RESULT(*NAME_100) ARGS;                             \
  }

/* ---- Broker ---- */

struct CMPIBroker {
  void* hdl;
  const CMPIBrokerFT* bft;
  const CMPIBrokerEncFT* eft;
  const CMPIBrokerExtFT* xft; /* may be null */
  const CMPIBrokerMemFT* mft; /* [200], may be null */
};

struct CMPIBrokerFT {
  __extension__ union {
    unsigned int brokerCapabilities;
    unsigned int brokerClassification;
  };
  CMPIVersion brokerVersion;
  const char* brokerName;
  CMPIContext* (*prepareAttachThread)(const CMPIBroker* mb, const CMPIContext* ctx);
  CMPIStatus (*attachThread)(const CMPIBroker* mb, const CMPIContext* ctx);
  CMPIStatus (*detachThread)(const CMPIBroker* mb, const CMPIContext* ctx);
  CMPIStatus (*deliverIndication)(const CMPIBroker* mb, const CMPIContext* ctx, const char* ns,
                                  const CMPIInstance* ind);
  CMPI_RENAMED_SLOT(CMPIEnumeration*, enumerateInstanceNames, enumInstanceNames,
                    (const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                     CMPIStatus* rc));
  CMPIInstance* (*getInstance)(const CMPIBroker* mb, const CMPIContext* ctx,
                               const CMPIObjectPath* op, const char** properties, CMPIStatus* rc);
  CMPIObjectPath* (*createInstance)(const CMPIBroker* mb, const CMPIContext* ctx,
                                    const CMPIObjectPath* op, const CMPIInstance* inst,
                                    CMPIStatus* rc);
  CMPI_RENAMED_SLOT(CMPIStatus, modifyInstance, setInstance,
                    (const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                     const CMPIInstance* inst, const char** properties));
  CMPIStatus (*deleteInstance)(const CMPIBroker* mb, const CMPIContext* ctx,
                               const CMPIObjectPath* op);
  CMPIEnumeration* (*execQuery)(const CMPIBroker* mb, const CMPIContext* ctx,
                                const CMPIObjectPath* op, const char* query, const char* lang,
                                CMPIStatus* rc);
  CMPI_RENAMED_SLOT(CMPIEnumeration*, enumerateInstances, enumInstances,
                    (const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                     const char** properties, CMPIStatus* rc));
  CMPIEnumeration* (*associators)(const CMPIBroker* mb, const CMPIContext* ctx,
                                  const CMPIObjectPath* op, const char* assocClass,
                                  const char* resultClass, const char* role, const char* resultRole,
                                  const char** properties, CMPIStatus* rc);
  CMPIEnumeration* (*associatorNames)(const CMPIBroker* mb, const CMPIContext* ctx,
                                      const CMPIObjectPath* op, const char* assocClass,
                                      const char* resultClass, const char* role,
                                      const char* resultRole, CMPIStatus* rc);
  CMPIEnumeration* (*references)(const CMPIBroker* mb, const CMPIContext* ctx,
                                 const CMPIObjectPath* op, const char* resultClass,
                                 const char* role, const char** properties, CMPIStatus* rc);
  CMPIEnumeration* (*referenceNames)(const CMPIBroker* mb, const CMPIContext* ctx,
                                     const CMPIObjectPath* op, const char* resultClass,
                                     const char* role, CMPIStatus* rc);
  CMPIData (*invokeMethod)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                           const char* method, const CMPIArgs* in, CMPIArgs* out, CMPIStatus* rc);
  CMPIStatus (*setProperty)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                            const char* name, const CMPIValue* value, CMPIType type);
  CMPIData (*getProperty)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                          const char* name, CMPIStatus* rc);
  /* [210] */
  CMPIEnumeration* (*enumerateInstancesFiltered)(const CMPIBroker* mb, const CMPIContext* ctx,
                                                 const CMPIObjectPath* op, const char** properties,
                                                 const CMPIEnumerationFilter* filter,
                                                 CMPIStatus* rc);
  CMPIEnumeration* (*associatorsFiltered)(const CMPIBroker* mb, const CMPIContext* ctx,
                                          const CMPIObjectPath* op, const char* assocClass,
                                          const char* resultClass, const char* role,
                                          const char* resultRole, const char** properties,
                                          const CMPIEnumerationFilter* filter, CMPIStatus* rc);
  CMPIEnumeration* (*referencesFiltered)(const CMPIBroker* mb, const CMPIContext* ctx,
                                         const CMPIObjectPath* op, const char* resultClass,
                                         const char* role, const char** properties,
                                         const CMPIEnumerationFilter* filter, CMPIStatus* rc);
};

struct CMPIBrokerEncFT {
  CMPIVersion ftVersion;
  CMPIInstance* (*newInstance)(const CMPIBroker* mb, const CMPIObjectPath* op, CMPIStatus* rc);
  CMPIObjectPath* (*newObjectPath)(const CMPIBroker* mb, const char* ns, const char* cn,
                                   CMPIStatus* rc);
  CMPIArgs* (*newArgs)(const CMPIBroker* mb, CMPIStatus* rc);
  CMPIString* (*newString)(const CMPIBroker* mb, const char* chars, CMPIStatus* rc);
  CMPIArray* (*newArray)(const CMPIBroker* mb, CMPICount count, CMPIType type, CMPIStatus* rc);
  CMPIDateTime* (*newDateTime)(const CMPIBroker* mb, CMPIStatus* rc);
  CMPIDateTime* (*newDateTimeFromBinary)(const CMPIBroker* mb, CMPIUint64 usec,
                                         CMPIBoolean interval, CMPIStatus* rc);
  CMPIDateTime* (*newDateTimeFromChars)(const CMPIBroker* mb, const char* chars, CMPIStatus* rc);
  CMPISelectExp* (*newSelectExp)(const CMPIBroker* mb, const char* query, const char* lang,
                                 CMPIArray** projection, CMPIStatus* rc);
  CMPIBoolean (*classPathIsA)(const CMPIBroker* mb, const CMPIObjectPath* op, const char* className,
                              CMPIStatus* rc);
  CMPIString* (*toString)(const CMPIBroker* mb, const void* object, CMPIStatus* rc);
  CMPIBoolean (*isOfType)(const CMPIBroker* mb, const void* object, const char* type,
                          CMPIStatus* rc);
  CMPIString* (*getType)(const CMPIBroker* mb, const void* object, CMPIStatus* rc);
  CMPIString* (*getMessage)(const CMPIBroker* mb, const char* id, const char* defaultText,
                            CMPIStatus* rc, CMPICount count, ...);
  /* absent in some brokers of version 100 */
  CMPIStatus (*logMessage)(const CMPIBroker* mb, int severity, const char* id, const char* text,
                           const CMPIString* string);
  CMPIStatus (*trace)(const CMPIBroker* mb, int level, const char* component, const char* text,
                      const CMPIString* string);
  /* [200] */
  CMPIError* (*newCMPIError)(const CMPIBroker* mb, const char* owner, const char* messageId,
                             const char* message, int severity, int probableCause, int cimStatus,
                             CMPIStatus* rc);
  CMPIStatus (*openMessageFile)(const CMPIBroker* mb, const char* file, CMPIMsgFileHandle* handle);
  CMPIStatus (*closeMessageFile)(const CMPIBroker* mb, const CMPIMsgFileHandle handle);
  CMPIString* (*getMessage2)(const CMPIBroker* mb, const char* id, const CMPIMsgFileHandle handle,
                             const char* defaultText, CMPIStatus* rc, CMPICount count, ...);
  /* [210] */
  CMPIPropertyList* (*newPropertyList)(const CMPIBroker* mb, const char** properties,
                                       CMPIStatus* rc);
  CMPIString* (*newStringCP)(const CMPIBroker* mb, const char* chars, CMPIUint32 codePage,
                             CMPIStatus* rc);
  CMPIEnumerationFilter* (*newEnumerationFilter)(const CMPIBroker* mb, const char* lang,
                                                 const char* query, CMPIStatus* rc);
};

struct CMPIBrokerExtFT {
  CMPIVersion ftVersion;
  char* (*resolveFileName)(const char* libName);
  CMPI_THREAD_TYPE (*newThread)(CMPI_THREAD_RETURN (*start)(void*), void* parm, int detached);
  int (*joinThread)(CMPI_THREAD_TYPE thread, CMPI_THREAD_RETURN* ret);
  int (*exitThread)(CMPI_THREAD_RETURN ret);
  int (*cancelThread)(CMPI_THREAD_TYPE thread);
  int (*threadSleep)(CMPIUint32 msec);
  int (*threadOnce)(int* once, void (*function)(void));
  int (*createThreadKey)(unsigned int* key, void (*cleanup)(void*));
  int (*destroyThreadKey)(unsigned int key);
  void* (*getThreadSpecific)(unsigned int key);
  int (*setThreadSpecific)(unsigned int key, void* value);
  CMPI_MUTEX_TYPE (*newMutex)(int opt);
  void (*destroyMutex)(CMPI_MUTEX_TYPE mutex);
  void (*lockMutex)(CMPI_MUTEX_TYPE mutex);
  void (*unlockMutex)(CMPI_MUTEX_TYPE mutex);
  CMPI_COND_TYPE (*newCondition)(int opt);
  void (*destroyCondition)(CMPI_COND_TYPE cond);
  int (*condWait)(CMPI_COND_TYPE cond, CMPI_MUTEX_TYPE mutex);
  int (*timedCondWait)(CMPI_COND_TYPE cond, CMPI_MUTEX_TYPE mutex, struct timespec* wait);
  int (*signalCondition)(CMPI_COND_TYPE cond);
  /* [210] */
  CMPIStatus (*destroyMutex2)(CMPI_MUTEX_TYPE mutex);
  CMPIStatus (*lockMutex2)(CMPI_MUTEX_TYPE mutex);
  CMPIStatus (*unlockMutex2)(CMPI_MUTEX_TYPE mutex);
  CMPIStatus (*destroyCondition2)(CMPI_COND_TYPE cond);
};

/* [200] */
struct CMPIBrokerMemFT {
  CMPIVersion ftVersion;
  CMPIGcStat* (*mark)(const CMPIBroker* mb, CMPIStatus* rc);
  CMPIStatus (*release)(const CMPIBroker* mb, const CMPIGcStat* gc);
  void* (*cmpiMalloc)(const CMPIBroker* mb, __SIZE_TYPE__ size);
  void* (*cmpiCalloc)(const CMPIBroker* mb, __SIZE_TYPE__ count, __SIZE_TYPE__ size);
  void* (*cmpiRealloc)(const CMPIBroker* mb, void* ptr, __SIZE_TYPE__ size);
  char* (*cmpiStrDup)(const CMPIBroker* mb, const char* text);
  void (*cmpiFree)(const CMPIBroker* mb, void* ptr);
  void (*freeInstance)(const CMPIBroker* mb, CMPIInstance* inst);
  void (*freeObjectPath)(const CMPIBroker* mb, CMPIObjectPath* op);
  void (*freeArgs)(const CMPIBroker* mb, CMPIArgs* args);
  void (*freeString)(const CMPIBroker* mb, CMPIString* string);
  void (*freeArray)(const CMPIBroker* mb, CMPIArray* array);
  void (*freeDateTime)(const CMPIBroker* mb, CMPIDateTime* dateTime);
  void (*freeSelectExp)(const CMPIBroker* mb, CMPISelectExp* expression);
  void (*freeChars)(const CMPIBroker* mb, char* chars); /* [210] */
};

/* ---- Encapsulated objects ---- */

struct CMPIContext {
  void* hdl;
  const CMPIContextFT* ft;
};

struct CMPIContextFT {
  CMPI_OBJECT_FT_HEAD(CMPIContext);
  CMPIData (*getEntry)(const CMPIContext* ctx, const char* name, CMPIStatus* rc);
  CMPIData (*getEntryAt)(const CMPIContext* ctx, CMPICount index, CMPIString** name,
                         CMPIStatus* rc);
  CMPICount (*getEntryCount)(const CMPIContext* ctx, CMPIStatus* rc);
  CMPIStatus (*addEntry)(const CMPIContext* ctx, const char* name, const CMPIValue* value,
                         CMPIType type);
};

struct CMPIResult {
  void* hdl;
  const CMPIResultFT* ft;
};

struct CMPIResultFT {
  CMPI_OBJECT_FT_HEAD(CMPIResult);
  CMPIStatus (*returnData)(const CMPIResult* rslt, const CMPIValue* value, CMPIType type);
  CMPIStatus (*returnInstance)(const CMPIResult* rslt, const CMPIInstance* inst);
  CMPIStatus (*returnObjectPath)(const CMPIResult* rslt, const CMPIObjectPath* op);
  CMPIStatus (*returnDone)(const CMPIResult* rslt);
  CMPIStatus (*returnError)(const CMPIResult* rslt, const CMPIError* error); /* [200] */
};

struct CMPIString {
  void* hdl;
  const CMPIStringFT* ft;
};

struct CMPIStringFT {
  CMPI_OBJECT_FT_HEAD(CMPIString);
  const char* (*getCharPtr)(const CMPIString* str, CMPIStatus* rc);
  const char* (*newCharsCP)(const CMPIString* str, CMPIUint32 codePage, CMPIStatus* rc); /* [210] */
};

struct CMPIArray {
  void* hdl;
  const CMPIArrayFT* ft;
};

struct CMPIArrayFT {
  CMPI_OBJECT_FT_HEAD(CMPIArray);
  CMPICount (*getSize)(const CMPIArray* array, CMPIStatus* rc);
  CMPIType (*getSimpleType)(const CMPIArray* array, CMPIStatus* rc);
  CMPIData (*getElementAt)(const CMPIArray* array, CMPICount index, CMPIStatus* rc);
  CMPIStatus (*setElementAt)(CMPIArray* array, CMPICount index, const CMPIValue* value,
                             CMPIType type);
};

struct CMPIEnumeration {
  void* hdl;
  const CMPIEnumerationFT* ft;
};

struct CMPIEnumerationFT {
  CMPI_OBJECT_FT_HEAD(CMPIEnumeration);
  CMPIData (*getNext)(const CMPIEnumeration* en, CMPIStatus* rc);
  CMPIBoolean (*hasNext)(const CMPIEnumeration* en, CMPIStatus* rc);
  CMPIArray* (*toArray)(const CMPIEnumeration* en, CMPIStatus* rc);
};

struct CMPIInstance {
  void* hdl;
  const CMPIInstanceFT* ft;
};

struct CMPIInstanceFT {
  CMPI_OBJECT_FT_HEAD(CMPIInstance);
  CMPIData (*getProperty)(const CMPIInstance* inst, const char* name, CMPIStatus* rc);
  CMPIData (*getPropertyAt)(const CMPIInstance* inst, CMPICount index, CMPIString** name,
                            CMPIStatus* rc);
  CMPICount (*getPropertyCount)(const CMPIInstance* inst, CMPIStatus* rc);
  CMPIStatus (*setProperty)(const CMPIInstance* inst, const char* name, const CMPIValue* value,
                            CMPIType type);
  CMPIObjectPath* (*getObjectPath)(const CMPIInstance* inst, CMPIStatus* rc);
  CMPIStatus (*setPropertyFilter)(CMPIInstance* inst, const char** properties, const char** keys);
  CMPIStatus (*setObjectPath)(CMPIInstance* inst, const CMPIObjectPath* op);
  CMPIStatus (*setPropertyWithOrigin)(const CMPIInstance* inst, const char* name,
                                      const CMPIValue* value, CMPIType type,
                                      const char* origin); /* [200] */
};

struct CMPIObjectPath {
  void* hdl;
  const CMPIObjectPathFT* ft;
};

struct CMPIObjectPathFT {
  CMPI_OBJECT_FT_HEAD(CMPIObjectPath);
  CMPIStatus (*setNameSpace)(CMPIObjectPath* op, const char* ns);
  CMPIString* (*getNameSpace)(const CMPIObjectPath* op, CMPIStatus* rc);
  CMPIStatus (*setHostname)(CMPIObjectPath* op, const char* host);
  CMPIString* (*getHostname)(const CMPIObjectPath* op, CMPIStatus* rc);
  CMPIStatus (*setClassName)(CMPIObjectPath* op, const char* cn);
  CMPIString* (*getClassName)(const CMPIObjectPath* op, CMPIStatus* rc);
  CMPIStatus (*addKey)(CMPIObjectPath* op, const char* name, const CMPIValue* value, CMPIType type);
  CMPIData (*getKey)(const CMPIObjectPath* op, const char* name, CMPIStatus* rc);
  CMPIData (*getKeyAt)(const CMPIObjectPath* op, CMPICount index, CMPIString** name,
                       CMPIStatus* rc);
  CMPICount (*getKeyCount)(const CMPIObjectPath* op, CMPIStatus* rc);
  CMPIStatus (*setNameSpaceFromObjectPath)(CMPIObjectPath* op, const CMPIObjectPath* src);
  CMPIStatus (*setHostAndNameSpaceFromObjectPath)(CMPIObjectPath* op, const CMPIObjectPath* src);
  CMPIData (*getClassQualifier)(const CMPIObjectPath* op, const char* qualifier, CMPIStatus* rc);
  CMPIData (*getPropertyQualifier)(const CMPIObjectPath* op, const char* property,
                                   const char* qualifier, CMPIStatus* rc);
  CMPIData (*getMethodQualifier)(const CMPIObjectPath* op, const char* method,
                                 const char* qualifier, CMPIStatus* rc);
  CMPIData (*getParameterQualifier)(const CMPIObjectPath* op, const char* method,
                                    const char* parameter, const char* qualifier, CMPIStatus* rc);
  CMPIString* (*toString)(const CMPIObjectPath* op, CMPIStatus* rc); /* [200] */
};

struct CMPIArgs {
  void* hdl;
  const CMPIArgsFT* ft;
};

struct CMPIArgsFT {
  CMPI_OBJECT_FT_HEAD(CMPIArgs);
  CMPIStatus (*addArg)(CMPIArgs* args, const char* name, const CMPIValue* value, CMPIType type);
  CMPIData (*getArg)(const CMPIArgs* args, const char* name, CMPIStatus* rc);
  CMPIData (*getArgAt)(const CMPIArgs* args, CMPICount index, CMPIString** name, CMPIStatus* rc);
  CMPICount (*getArgCount)(const CMPIArgs* args, CMPIStatus* rc);
};

struct CMPIDateTime {
  void* hdl;
  const CMPIDateTimeFT* ft;
};

struct CMPIDateTimeFT {
  CMPI_OBJECT_FT_HEAD(CMPIDateTime);
  CMPIUint64 (*getBinaryFormat)(const CMPIDateTime* dt, CMPIStatus* rc);
  CMPIString* (*getStringFormat)(const CMPIDateTime* dt, CMPIStatus* rc);
  CMPIBoolean (*isInterval)(const CMPIDateTime* dt, CMPIStatus* rc);
};

struct CMPISelectExp {
  void* hdl;
  const CMPISelectExpFT* ft;
};

struct CMPISelectExpFT {
  CMPI_OBJECT_FT_HEAD(CMPISelectExp);
  CMPIBoolean (*evaluate)(const CMPISelectExp* se, const CMPIInstance* inst, CMPIStatus* rc);
  CMPIString* (*getString)(const CMPISelectExp* se, CMPIStatus* rc);
  CMPISelectCond* (*getDOC)(const CMPISelectExp* se, CMPIStatus* rc);
  CMPISelectCond* (*getCOD)(const CMPISelectExp* se, CMPIStatus* rc);
  CMPIBoolean (*evaluateUsingAccessor)(const CMPISelectExp* se, CMPIAccessor* accessor,
                                       void* parameter, CMPIStatus* rc);
};

struct CMPISelectCond {
  void* hdl;
  const CMPISelectCondFT* ft;
};

struct CMPISelectCondFT {
  CMPI_OBJECT_FT_HEAD(CMPISelectCond);
  CMPICount (*getCountAndType)(const CMPISelectCond* sc, int* type, CMPIStatus* rc);
  CMPISubCond* (*getSubCondAt)(const CMPISelectCond* sc, CMPICount index, CMPIStatus* rc);
};

struct CMPISubCond {
  void* hdl;
  const CMPISubCondFT* ft;
};

struct CMPISubCondFT {
  CMPI_OBJECT_FT_HEAD(CMPISubCond);
  CMPICount (*getCount)(const CMPISubCond* sc, CMPIStatus* rc);
  CMPIPredicate* (*getPredicateAt)(const CMPISubCond* sc, CMPICount index, CMPIStatus* rc);
  CMPIPredicate* (*getPredicate)(const CMPISubCond* sc, const char* name, CMPIStatus* rc);
};

struct CMPIPredicate {
  void* hdl;
  const CMPIPredicateFT* ft;
};

struct CMPIPredicateFT {
  CMPI_OBJECT_FT_HEAD(CMPIPredicate);
  CMPIStatus (*getData)(const CMPIPredicate* pr, CMPIType* type, CMPIPredOp* op, CMPIString** lhs,
                        CMPIString** rhs);
  CMPIBoolean (*evaluateUsingAccessor)(const CMPIPredicate* pr, CMPIAccessor* accessor,
                                       void* parameter, CMPIStatus* rc);
};

/* [200] */
struct CMPIError {
  void* hdl;
  const CMPIErrorFT* ft;
};

struct CMPIErrorFT {
  CMPI_OBJECT_FT_HEAD(CMPIError);
  int (*getErrorType)(const CMPIError* error, CMPIStatus* rc);
  CMPIString* (*getOtherErrorType)(const CMPIError* error, CMPIStatus* rc);
  CMPIString* (*getOwningEntity)(const CMPIError* error, CMPIStatus* rc);
  CMPIString* (*getMessageID)(const CMPIError* error, CMPIStatus* rc);
  CMPIString* (*getMessage)(const CMPIError* error, CMPIStatus* rc);
  int (*getPerceivedSeverity)(const CMPIError* error, CMPIStatus* rc);
  int (*getProbableCause)(const CMPIError* error, CMPIStatus* rc);
  CMPIString* (*getProbableCauseDescription)(const CMPIError* error, CMPIStatus* rc);
  CMPIArray* (*getRecommendedActions)(const CMPIError* error, CMPIStatus* rc);
  CMPIString* (*getErrorSource)(const CMPIError* error, CMPIStatus* rc);
  int (*getErrorSourceFormat)(const CMPIError* error, CMPIStatus* rc);
  CMPIString* (*getOtherErrorSourceFormat)(const CMPIError* error, CMPIStatus* rc);
  CMPIrc (*getCIMStatusCode)(const CMPIError* error, CMPIStatus* rc);
  CMPIString* (*getCIMStatusCodeDescription)(const CMPIError* error, CMPIStatus* rc);
  CMPIArray* (*getMessageArguments)(const CMPIError* error, CMPIStatus* rc);
  CMPIStatus (*setErrorType)(CMPIError* error, int type);
  CMPIStatus (*setOtherErrorType)(CMPIError* error, const char* text);
  CMPIStatus (*setProbableCauseDescription)(CMPIError* error, const char* text);
  CMPIStatus (*setRecommendedActions)(CMPIError* error, const CMPIArray* texts);
  CMPIStatus (*setErrorSource)(CMPIError* error, const char* text);
  CMPIStatus (*setErrorSourceFormat)(CMPIError* error, int format);
  CMPIStatus (*setOtherErrorSourceFormat)(CMPIError* error, const char* text);
  CMPIStatus (*setCIMStatusCodeDescription)(CMPIError* error, const char* text);
  CMPIStatus (*setMessageArguments)(CMPIError* error, const CMPIArray* texts);
};

/* [210] */
struct CMPIPropertyList {
  void* hdl;
  const CMPIPropertyListFT* ft;
};

struct CMPIPropertyListFT {
  CMPI_OBJECT_FT_HEAD(CMPIPropertyList);
  CMPIBoolean (*isPropertyInList)(const CMPIPropertyList* list, const char* name, CMPIStatus* rc);
  const char** (*getProperties)(const CMPIPropertyList* list, CMPICount* count, CMPIStatus* rc);
};

/* [210] */
struct CMPIEnumerationFilter {
  void* hdl;
  const CMPIEnumerationFilterFT* ft;
};

struct CMPIEnumerationFilterFT {
  CMPI_OBJECT_FT_HEAD(CMPIEnumerationFilter);
  CMPIBoolean (*match)(const CMPIEnumerationFilter* filter, const CMPIInstance* inst,
                       CMPIStatus* rc);
};

/* ---- Provider interfaces ---- */

struct CMPIInstanceMI {
  void* hdl;
  const CMPIInstanceMIFT* ft;
};

struct CMPIInstanceMIFT {
  CMPI_MI_FT_HEAD(CMPIInstanceMI);
  CMPI_RENAMED_SLOT(CMPIStatus, enumerateInstanceNames, enumInstanceNames,
                    (CMPIInstanceMI * mi, const CMPIContext* ctx, const CMPIResult* rslt,
                     const CMPIObjectPath* op));
  CMPI_RENAMED_SLOT(CMPIStatus, enumerateInstances, enumInstances,
                    (CMPIInstanceMI * mi, const CMPIContext* ctx, const CMPIResult* rslt,
                     const CMPIObjectPath* op, const char** properties));
  CMPIStatus (*getInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                            const CMPIObjectPath* op, const char** properties);
  CMPIStatus (*createInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                               const CMPIObjectPath* op, const CMPIInstance* inst);
  CMPI_RENAMED_SLOT(CMPIStatus, modifyInstance, setInstance,
                    (CMPIInstanceMI * mi, const CMPIContext* ctx, const CMPIResult* rslt,
                     const CMPIObjectPath* op, const CMPIInstance* inst, const char** properties));
  CMPIStatus (*deleteInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                               const CMPIObjectPath* op);
  CMPIStatus (*execQuery)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                          const CMPIObjectPath* op, const char* query, const char* lang);
  /* [210] */
  CMPIStatus (*enumerateInstancesFiltered)(CMPIInstanceMI* mi, const CMPIContext* ctx,
                                           const CMPIResult* rslt, const CMPIObjectPath* op,
                                           const char** properties,
                                           const CMPIEnumerationFilter* filter);
};

struct CMPIAssociationMI {
  void* hdl;
  const CMPIAssociationMIFT* ft;
};

struct CMPIAssociationMIFT {
  CMPI_MI_FT_HEAD(CMPIAssociationMI);
  CMPIStatus (*associators)(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                            const CMPIObjectPath* op, const char* assocClass,
                            const char* resultClass, const char* role, const char* resultRole,
                            const char** properties);
  CMPIStatus (*associatorNames)(CMPIAssociationMI* mi, const CMPIContext* ctx,
                                const CMPIResult* rslt, const CMPIObjectPath* op,
                                const char* assocClass, const char* resultClass, const char* role,
                                const char* resultRole);
  CMPIStatus (*references)(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                           const CMPIObjectPath* op, const char* resultClass, const char* role,
                           const char** properties);
  CMPIStatus (*referenceNames)(CMPIAssociationMI* mi, const CMPIContext* ctx,
                               const CMPIResult* rslt, const CMPIObjectPath* op,
                               const char* resultClass, const char* role);
  /* [210] */
  CMPIStatus (*associatorsFiltered)(CMPIAssociationMI* mi, const CMPIContext* ctx,
                                    const CMPIResult* rslt, const CMPIObjectPath* op,
                                    const char* assocClass, const char* resultClass,
                                    const char* role, const char* resultRole,
                                    const char** properties, const CMPIEnumerationFilter* filter);
  CMPIStatus (*referencesFiltered)(CMPIAssociationMI* mi, const CMPIContext* ctx,
                                   const CMPIResult* rslt, const CMPIObjectPath* op,
                                   const char* resultClass, const char* role,
                                   const char** properties, const CMPIEnumerationFilter* filter);
};

struct CMPIMethodMI {
  void* hdl;
  const CMPIMethodMIFT* ft;
};

struct CMPIMethodMIFT {
  CMPI_MI_FT_HEAD(CMPIMethodMI);
  CMPIStatus (*invokeMethod)(CMPIMethodMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                             const CMPIObjectPath* op, const char* method, const CMPIArgs* in,
                             CMPIArgs* out);
};

struct CMPIPropertyMI {
  void* hdl;
  const CMPIPropertyMIFT* ft;
};

struct CMPIPropertyMIFT {
  CMPI_MI_FT_HEAD(CMPIPropertyMI);
  CMPIStatus (*setProperty)(CMPIPropertyMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                            const CMPIObjectPath* op, const char* name, CMPIData data);
  CMPIStatus (*getProperty)(CMPIPropertyMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                            const CMPIObjectPath* op, const char* name);
  CMPIStatus (*setPropertyWithOrigin)(CMPIPropertyMI* mi, const CMPIContext* ctx,
                                      const CMPIResult* rslt, const CMPIObjectPath* op,
                                      const char* name, CMPIData data,
                                      const char* origin); /* [200] */
};

struct CMPIIndicationMI {
  void* hdl;
  const CMPIIndicationMIFT* ft;
};

struct CMPIIndicationMIFT {
  CMPI_MI_FT_HEAD(CMPIIndicationMI);
  CMPIStatus (*authorizeFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx,
                                const CMPISelectExp* filter, const char* className,
                                const CMPIObjectPath* op, const char* owner);
  CMPIStatus (*mustPoll)(CMPIIndicationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                         const CMPISelectExp* filter, const char* className,
                         const CMPIObjectPath* op);
  CMPIStatus (*activateFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx,
                               const CMPISelectExp* filter, const char* className,
                               const CMPIObjectPath* op, CMPIBoolean firstActivation);
  CMPIStatus (*deActivateFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx,
                                 const CMPISelectExp* filter, const char* className,
                                 const CMPIObjectPath* op, CMPIBoolean lastDeActivation);
  CMPIStatus (*enableIndications)(CMPIIndicationMI* mi, const CMPIContext* ctx);
  CMPIStatus (*disableIndications)(CMPIIndicationMI* mi, const CMPIContext* ctx);
  /* [210] */
  CMPIStatus (*authorizeFilterCollection)(CMPIIndicationMI* mi, const CMPIContext* ctx,
                                          const CMPIInstance* collection, const char* owner);
  CMPIStatus (*activateFilterCollection)(CMPIIndicationMI* mi, const CMPIContext* ctx,
                                         const CMPIInstance* collection);
  CMPIStatus (*deActivateFilterCollection)(CMPIIndicationMI* mi, const CMPIContext* ctx,
                                           const CMPIInstance* collection);
};

#ifdef __cplusplus
}
#endif

#endif /* TVX_CMPI_CMPIFT_H */
