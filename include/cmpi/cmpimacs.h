/* The usual short names over the slots of the CMPI tables.
 *
 * All are inline functions but those that serve objects of every kind. None checks its arguments:
 * the object must not be null, and the slot must be one that its table has.
 */
#ifndef TVX_CMPI_CMPIMACS_H
#define TVX_CMPI_CMPIMACS_H

#include "cmpidt.h"
#include "cmpift.h"

#ifdef __cplusplus
extern "C" {
#define CMPI_NO_STATUS nullptr
#else
#define CMPI_NO_STATUS ((CMPIStatus*)0)
#endif

/* ---- Objects of every kind ---- */

#define CMRelease(obj) ((obj)->ft->release((obj)))
#define CMClone(obj, rc) ((obj)->ft->clone((obj), (rc)))

/* Leaves the calling function with a status of this code and no message. */
#define CMReturn(code)                             \
  do {                                             \
    CMPIStatus status_ = {(code), CMPI_NO_STRING}; \
    return status_;                                \
  } while (0)

/* Stores a code, and no message, in a status that may be null. */
#define CMSetStatus(st, code)     \
  do {                            \
    if ((st) != CMPI_NO_STATUS) { \
      (st)->rc = (code);          \
      (st)->msg = CMPI_NO_STRING; \
    }                             \
  } while (0)

#ifdef __cplusplus
#define CMPI_NO_STRING nullptr
#else
#define CMPI_NO_STRING ((CMPIString*)0)
#endif

#define CMIsNullValue(data) (((data).state & CMPI_nullValue) != 0)
#define CMIsArray(data) (((data).type & CMPI_ARRAY) != 0)

/* ---- Making objects ---- */

static inline CMPIInstance* CMNewInstance(const CMPIBroker* mb, const CMPIObjectPath* op,
                                          CMPIStatus* rc) {
  return mb->eft->newInstance(mb, op, rc);
}

static inline CMPIObjectPath* CMNewObjectPath(const CMPIBroker* mb, const char* ns, const char* cn,
                                              CMPIStatus* rc) {
  return mb->eft->newObjectPath(mb, ns, cn, rc);
}

static inline CMPIArgs* CMNewArgs(const CMPIBroker* mb, CMPIStatus* rc) {
  return mb->eft->newArgs(mb, rc);
}

static inline CMPIString* CMNewString(const CMPIBroker* mb, const char* chars, CMPIStatus* rc) {
  return mb->eft->newString(mb, chars, rc);
}

static inline CMPIArray* CMNewArray(const CMPIBroker* mb, CMPICount count, CMPIType type,
                                    CMPIStatus* rc) {
  return mb->eft->newArray(mb, count, type, rc);
}

static inline CMPIDateTime* CMNewDateTime(const CMPIBroker* mb, CMPIStatus* rc) {
  return mb->eft->newDateTime(mb, rc);
}

static inline CMPIDateTime* CMNewDateTimeFromBinary(const CMPIBroker* mb, CMPIUint64 usec,
                                                    CMPIBoolean interval, CMPIStatus* rc) {
  return mb->eft->newDateTimeFromBinary(mb, usec, interval, rc);
}

static inline CMPIDateTime* CMNewDateTimeFromChars(const CMPIBroker* mb, const char* chars,
                                                   CMPIStatus* rc) {
  return mb->eft->newDateTimeFromChars(mb, chars, rc);
}

/* ---- Instances ---- */

static inline CMPIData CMGetProperty(const CMPIInstance* inst, const char* name, CMPIStatus* rc) {
  return inst->ft->getProperty(inst, name, rc);
}

static inline CMPIData CMGetPropertyAt(const CMPIInstance* inst, CMPICount index, CMPIString** name,
                                       CMPIStatus* rc) {
  return inst->ft->getPropertyAt(inst, index, name, rc);
}

static inline CMPICount CMGetPropertyCount(const CMPIInstance* inst, CMPIStatus* rc) {
  return inst->ft->getPropertyCount(inst, rc);
}

static inline CMPIStatus CMSetProperty(const CMPIInstance* inst, const char* name,
                                       const CMPIValue* value, CMPIType type) {
  return inst->ft->setProperty(inst, name, value, type);
}

static inline CMPIStatus CMSetPropertyFilter(CMPIInstance* inst, const char** properties,
                                             const char** keys) {
  return inst->ft->setPropertyFilter(inst, properties, keys);
}

static inline CMPIObjectPath* CMGetObjectPath(const CMPIInstance* inst, CMPIStatus* rc) {
  return inst->ft->getObjectPath(inst, rc);
}

/* ---- Object paths ---- */

static inline CMPIString* CMGetNameSpace(const CMPIObjectPath* op, CMPIStatus* rc) {
  return op->ft->getNameSpace(op, rc);
}

static inline CMPIStatus CMSetNameSpace(CMPIObjectPath* op, const char* ns) {
  return op->ft->setNameSpace(op, ns);
}

static inline CMPIString* CMGetHostname(const CMPIObjectPath* op, CMPIStatus* rc) {
  return op->ft->getHostname(op, rc);
}

static inline CMPIStatus CMSetHostname(CMPIObjectPath* op, const char* host) {
  return op->ft->setHostname(op, host);
}

static inline CMPIString* CMGetClassName(const CMPIObjectPath* op, CMPIStatus* rc) {
  return op->ft->getClassName(op, rc);
}

static inline CMPIStatus CMSetClassName(CMPIObjectPath* op, const char* cn) {
  return op->ft->setClassName(op, cn);
}

static inline CMPIStatus CMAddKey(CMPIObjectPath* op, const char* name, const CMPIValue* value,
                                  CMPIType type) {
  return op->ft->addKey(op, name, value, type);
}

static inline CMPIData CMGetKey(const CMPIObjectPath* op, const char* name, CMPIStatus* rc) {
  return op->ft->getKey(op, name, rc);
}

static inline CMPIData CMGetKeyAt(const CMPIObjectPath* op, CMPICount index, CMPIString** name,
                                  CMPIStatus* rc) {
  return op->ft->getKeyAt(op, index, name, rc);
}

static inline CMPICount CMGetKeyCount(const CMPIObjectPath* op, CMPIStatus* rc) {
  return op->ft->getKeyCount(op, rc);
}

/* ---- Arguments ---- */

static inline CMPIStatus CMAddArg(CMPIArgs* args, const char* name, const CMPIValue* value,
                                  CMPIType type) {
  return args->ft->addArg(args, name, value, type);
}

static inline CMPIData CMGetArg(const CMPIArgs* args, const char* name, CMPIStatus* rc) {
  return args->ft->getArg(args, name, rc);
}

static inline CMPIData CMGetArgAt(const CMPIArgs* args, CMPICount index, CMPIString** name,
                                  CMPIStatus* rc) {
  return args->ft->getArgAt(args, index, name, rc);
}

static inline CMPICount CMGetArgCount(const CMPIArgs* args, CMPIStatus* rc) {
  return args->ft->getArgCount(args, rc);
}

/* ---- Arrays, texts, timestamps, enumerations ---- */

static inline CMPICount CMGetArrayCount(const CMPIArray* array, CMPIStatus* rc) {
  return array->ft->getSize(array, rc);
}

static inline CMPIType CMGetArrayType(const CMPIArray* array, CMPIStatus* rc) {
  return array->ft->getSimpleType(array, rc);
}

static inline CMPIData CMGetArrayElementAt(const CMPIArray* array, CMPICount index,
                                           CMPIStatus* rc) {
  return array->ft->getElementAt(array, index, rc);
}

static inline CMPIStatus CMSetArrayElementAt(CMPIArray* array, CMPICount index,
                                             const CMPIValue* value, CMPIType type) {
  return array->ft->setElementAt(array, index, value, type);
}

static inline const char* CMGetCharsPtr(const CMPIString* str, CMPIStatus* rc) {
  return str->ft->getCharPtr(str, rc);
}

static inline const char* CMGetCharPtr(const CMPIString* str) {
  return str->ft->getCharPtr(str, CMPI_NO_STATUS);
}

static inline CMPIUint64 CMGetBinaryFormat(const CMPIDateTime* dt, CMPIStatus* rc) {
  return dt->ft->getBinaryFormat(dt, rc);
}

static inline CMPIString* CMGetStringFormat(const CMPIDateTime* dt, CMPIStatus* rc) {
  return dt->ft->getStringFormat(dt, rc);
}

static inline CMPIBoolean CMIsInterval(const CMPIDateTime* dt, CMPIStatus* rc) {
  return dt->ft->isInterval(dt, rc);
}

static inline CMPIData CMGetNext(const CMPIEnumeration* en, CMPIStatus* rc) {
  return en->ft->getNext(en, rc);
}

static inline CMPIBoolean CMHasNext(const CMPIEnumeration* en, CMPIStatus* rc) {
  return en->ft->hasNext(en, rc);
}

/* ---- The request's context and result ---- */

static inline CMPIData CMGetContextEntry(const CMPIContext* ctx, const char* name, CMPIStatus* rc) {
  return ctx->ft->getEntry(ctx, name, rc);
}

static inline CMPIStatus CMAddContextEntry(const CMPIContext* ctx, const char* name,
                                           const CMPIValue* value, CMPIType type) {
  return ctx->ft->addEntry(ctx, name, value, type);
}

static inline CMPIStatus CMReturnData(const CMPIResult* rslt, const CMPIValue* value,
                                      CMPIType type) {
  return rslt->ft->returnData(rslt, value, type);
}

static inline CMPIStatus CMReturnInstance(const CMPIResult* rslt, const CMPIInstance* inst) {
  return rslt->ft->returnInstance(rslt, inst);
}

static inline CMPIStatus CMReturnObjectPath(const CMPIResult* rslt, const CMPIObjectPath* op) {
  return rslt->ft->returnObjectPath(rslt, op);
}

static inline CMPIStatus CMReturnDone(const CMPIResult* rslt) {
  return rslt->ft->returnDone(rslt);
}

/* ---- Calls to the broker ---- */

static inline CMPIContext* CBPrepareAttachThread(const CMPIBroker* mb, const CMPIContext* ctx) {
  return mb->bft->prepareAttachThread(mb, ctx);
}

static inline CMPIStatus CBAttachThread(const CMPIBroker* mb, const CMPIContext* ctx) {
  return mb->bft->attachThread(mb, ctx);
}

static inline CMPIStatus CBDetachThread(const CMPIBroker* mb, const CMPIContext* ctx) {
  return mb->bft->detachThread(mb, ctx);
}

static inline CMPIStatus CBDeliverIndication(const CMPIBroker* mb, const CMPIContext* ctx,
                                             const char* ns, const CMPIInstance* ind) {
  return mb->bft->deliverIndication(mb, ctx, ns, ind);
}

static inline CMPIEnumeration* CBEnumInstanceNames(const CMPIBroker* mb, const CMPIContext* ctx,
                                                   const CMPIObjectPath* op, CMPIStatus* rc) {
  return mb->bft->enumerateInstanceNames(mb, ctx, op, rc);
}

static inline CMPIEnumeration* CBEnumInstances(const CMPIBroker* mb, const CMPIContext* ctx,
                                               const CMPIObjectPath* op, const char** properties,
                                               CMPIStatus* rc) {
  return mb->bft->enumerateInstances(mb, ctx, op, properties, rc);
}

static inline CMPIInstance* CBGetInstance(const CMPIBroker* mb, const CMPIContext* ctx,
                                          const CMPIObjectPath* op, const char** properties,
                                          CMPIStatus* rc) {
  return mb->bft->getInstance(mb, ctx, op, properties, rc);
}

static inline CMPIObjectPath* CBCreateInstance(const CMPIBroker* mb, const CMPIContext* ctx,
                                               const CMPIObjectPath* op, const CMPIInstance* inst,
                                               CMPIStatus* rc) {
  return mb->bft->createInstance(mb, ctx, op, inst, rc);
}

static inline CMPIStatus CBModifyInstance(const CMPIBroker* mb, const CMPIContext* ctx,
                                          const CMPIObjectPath* op, const CMPIInstance* inst,
                                          const char** properties) {
  return mb->bft->modifyInstance(mb, ctx, op, inst, properties);
}

static inline CMPIStatus CBSetInstance(const CMPIBroker* mb, const CMPIContext* ctx,
                                       const CMPIObjectPath* op, const CMPIInstance* inst,
                                       const char** properties) {
  return mb->bft->modifyInstance(mb, ctx, op, inst, properties);
}

static inline CMPIStatus CBDeleteInstance(const CMPIBroker* mb, const CMPIContext* ctx,
                                          const CMPIObjectPath* op) {
  return mb->bft->deleteInstance(mb, ctx, op);
}

static inline CMPIEnumeration* CBAssociators(const CMPIBroker* mb, const CMPIContext* ctx,
                                             const CMPIObjectPath* op, const char* assocClass,
                                             const char* resultClass, const char* role,
                                             const char* resultRole, const char** properties,
                                             CMPIStatus* rc) {
  return mb->bft->associators(mb, ctx, op, assocClass, resultClass, role, resultRole, properties,
                              rc);
}

static inline CMPIEnumeration* CBAssociatorNames(const CMPIBroker* mb, const CMPIContext* ctx,
                                                 const CMPIObjectPath* op, const char* assocClass,
                                                 const char* resultClass, const char* role,
                                                 const char* resultRole, CMPIStatus* rc) {
  return mb->bft->associatorNames(mb, ctx, op, assocClass, resultClass, role, resultRole, rc);
}

static inline CMPIEnumeration* CBReferences(const CMPIBroker* mb, const CMPIContext* ctx,
                                            const CMPIObjectPath* op, const char* resultClass,
                                            const char* role, const char** properties,
                                            CMPIStatus* rc) {
  return mb->bft->references(mb, ctx, op, resultClass, role, properties, rc);
}

static inline CMPIEnumeration* CBReferenceNames(const CMPIBroker* mb, const CMPIContext* ctx,
                                                const CMPIObjectPath* op, const char* resultClass,
                                                const char* role, CMPIStatus* rc) {
  return mb->bft->referenceNames(mb, ctx, op, resultClass, role, rc);
}

static inline CMPIData CBInvokeMethod(const CMPIBroker* mb, const CMPIContext* ctx,
                                      const CMPIObjectPath* op, const char* method,
                                      const CMPIArgs* in, CMPIArgs* out, CMPIStatus* rc) {
  return mb->bft->invokeMethod(mb, ctx, op, method, in, out, rc);
}

#ifdef __cplusplus
}
#endif

#endif /* TVX_CMPI_CMPIMACS_H */
