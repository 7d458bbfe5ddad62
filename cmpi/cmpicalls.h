/**
 * @file
 * CMPI's convenience names that call one slot each: `CB…` the services of the CIM server, `CM…` all others.
 *
 * They are inline functions, or macros where the includer defines `CMPI_NO_INLINE`. A name has its slot's
 * arguments in the slot's order, and its version: below it, the name is absent. None checks anything. A value
 * argument is any pointer, since a `CMPI_chars` value is given as the text itself.
 */
#ifndef CMPICALLS_H
#define CMPICALLS_H

#include "cmpift.h"

#ifdef CMPI_NO_INLINE

/* The CIM server: threads of a provider, indications, requests to other providers */

#define CBPrepareAttachThread(mb, ctx) ((mb)->bft->prepareAttachThread((mb), (ctx)))
#define CBAttachThread(mb, ctx) ((mb)->bft->attachThread((mb), (ctx)))
#define CBDetachThread(mb, ctx) ((mb)->bft->detachThread((mb), (ctx)))
#define CBDeliverIndication(mb, ctx, ns, ind) ((mb)->bft->deliverIndication((mb), (ctx), (ns), (ind)))
#define CBEnumInstanceNames(mb, ctx, classPath, rc) \
    ((mb)->bft->enumerateInstanceNames((mb), (ctx), (classPath), (rc)))
#define CBGetInstance(mb, ctx, instPath, properties, rc) \
    ((mb)->bft->getInstance((mb), (ctx), (instPath), (properties), (rc)))
#define CBCreateInstance(mb, ctx, classPath, newInst, rc) \
    ((mb)->bft->createInstance((mb), (ctx), (classPath), (newInst), (rc)))
#define CBModifyInstance(mb, ctx, instPath, modInst, properties) \
    ((mb)->bft->modifyInstance((mb), (ctx), (instPath), (modInst), (properties)))
#define CBDeleteInstance(mb, ctx, instPath) ((mb)->bft->deleteInstance((mb), (ctx), (instPath)))
#define CBExecQuery(mb, ctx, classPath, query, lang, rc) \
    ((mb)->bft->execQuery((mb), (ctx), (classPath), (query), (lang), (rc)))
#define CBEnumInstances(mb, ctx, classPath, properties, rc) \
    ((mb)->bft->enumerateInstances((mb), (ctx), (classPath), (properties), (rc)))
#define CBAssociators(mb, ctx, instPath, assocClass, resultClass, role, resultRole, properties, rc)     \
    ((mb)->bft->associators((mb), (ctx), (instPath), (assocClass), (resultClass), (role), (resultRole), \
                            (properties), (rc)))
#define CBAssociatorNames(mb, ctx, instPath, assocClass, resultClass, role, resultRole, rc)                 \
    ((mb)->bft->associatorNames((mb), (ctx), (instPath), (assocClass), (resultClass), (role), (resultRole), \
                                (rc)))
#define CBReferences(mb, ctx, instPath, resultClass, role, properties, rc) \
    ((mb)->bft->references((mb), (ctx), (instPath), (resultClass), (role), (properties), (rc)))
#define CBReferenceNames(mb, ctx, instPath, resultClass, role, rc) \
    ((mb)->bft->referenceNames((mb), (ctx), (instPath), (resultClass), (role), (rc)))
#define CBInvokeMethod(mb, ctx, objPath, method, in, out, rc) \
    ((mb)->bft->invokeMethod((mb), (ctx), (objPath), (method), (in), (out), (rc)))
#define CBSetProperty(mb, ctx, instPath, name, value, type) \
    ((mb)->bft->setProperty((mb), (ctx), (instPath), (name), (CMPIValue*)(value), (type)))
#define CBGetProperty(mb, ctx, instPath, name, rc) \
    ((mb)->bft->getProperty((mb), (ctx), (instPath), (name), (rc)))
#if CMPI_VERSION >= 210
#define CBEnumInstancesFiltered(mb, ctx, classPath, properties, filterQueryLanguage, filterQuery, rc)     \
    ((mb)->bft->enumerateInstancesFiltered((mb), (ctx), (classPath), (properties), (filterQueryLanguage), \
                                           (filterQuery), (rc)))
#define CBAssociatorsFiltered(mb, ctx, instPath, assocClass, resultClass, role, resultRole, properties, \
                              filterQueryLanguage, filterQuery, rc)                                     \
    ((mb)->bft->associatorsFiltered((mb), (ctx), (instPath), (assocClass), (resultClass), (role),       \
                                    (resultRole), (properties), (filterQueryLanguage), (filterQuery), (rc)))
#define CBReferencesFiltered(mb, ctx, instPath, resultClass, role, properties, filterQueryLanguage, \
                             filterQuery, rc)                                                       \
    ((mb)->bft->referencesFiltered((mb), (ctx), (instPath), (resultClass), (role), (properties),    \
                                   (filterQueryLanguage), (filterQuery), (rc)))
#endif

/* Making objects, asking about classes, logging */

#define CMNewInstance(mb, instPath, rc) ((mb)->eft->newInstance((mb), (instPath), (rc)))
#define CMNewObjectPath(mb, ns, cn, rc) ((mb)->eft->newObjectPath((mb), (ns), (cn), (rc)))
#define CMNewArgs(mb, rc) ((mb)->eft->newArgs((mb), (rc)))
#define CMNewString(mb, data, rc) ((mb)->eft->newString((mb), (data), (rc)))
#define CMNewArray(mb, size, type, rc) ((mb)->eft->newArray((mb), (size), (type), (rc)))
#define CMNewDateTime(mb, rc) ((mb)->eft->newDateTime((mb), (rc)))
#define CMNewDateTimeFromBinary(mb, binTime, interval, rc) \
    ((mb)->eft->newDateTimeFromBinary((mb), (binTime), (interval), (rc)))
#define CMNewDateTimeFromChars(mb, datetime, rc) ((mb)->eft->newDateTimeFromChars((mb), (datetime), (rc)))
#define CMNewSelectExp(mb, query, lang, projection, rc) \
    ((mb)->eft->newSelectExp((mb), (query), (lang), (projection), (rc)))
#define CMClassPathIsA(mb, classPath, className, rc) \
    ((mb)->eft->classPathIsA((mb), (classPath), (className), (rc)))
#define CMLogMessage(mb, severity, id, text, string) \
    ((mb)->eft->logMessage((mb), (severity), (id), (text), (string)))
#define CMTraceMessage(mb, level, component, text, string) \
    ((mb)->eft->trace((mb), (level), (component), (text), (string)))
#if CMPI_VERSION >= 200
#define CMNewCMPIError(mb, owner, msgID, msg, sev, pc, cimStatusCode, rc) \
    ((mb)->eft->newCMPIError((mb), (owner), (msgID), (msg), (sev), (pc), (cimStatusCode), (rc)))
#define CMOpenMessageFile(mb, msgFile, msgFileHandle) \
    ((mb)->eft->openMessageFile((mb), (msgFile), (msgFileHandle)))
#define CMCloseMessageFile(mb, msgFileHandle) ((mb)->eft->closeMessageFile((mb), (msgFileHandle)))
#endif
#if CMPI_VERSION >= 210
#define CMNewPropertyList(mb, properties, rc) ((mb)->eft->newPropertyList((mb), (properties), (rc)))
#define CMNewStringCP(mb, data, cpid, rc) ((mb)->eft->newStringCP((mb), (data), (cpid), (rc)))
#define CMNewEnumerationFilter(mb, filterQueryLanguage, filterQuery, rc) \
    ((mb)->eft->newEnumerationFilter((mb), (filterQueryLanguage), (filterQuery), (rc)))
#endif

/* Memory that belongs to the broker */

#if CMPI_VERSION >= 200
#define CMMemMark(mb, rc) ((mb)->mft->mark((mb), (rc)))
#define CMMemRelease(mb, gc) ((mb)->mft->release((mb), (gc)))
#define CMMalloc(mb, size) ((mb)->mft->cmpiMalloc((mb), (size)))
#define CMCalloc(mb, nElems, sizeElem) ((mb)->mft->cmpiCalloc((mb), (nElems), (sizeElem)))
#define CMRealloc(mb, ptr, size) ((mb)->mft->cmpiRealloc((mb), (ptr), (size)))
#define CMStrDup(mb, str) ((mb)->mft->cmpiStrDup((mb), (str)))
#define CMFree(mb, ptr) ((mb)->mft->cmpiFree((mb), (ptr)))
#define CMFreeInstance(mb, inst) ((mb)->mft->freeInstance((mb), (inst)))
#define CMFreeObjectPath(mb, obj) ((mb)->mft->freeObjectPath((mb), (obj)))
#define CMFreeArgs(mb, args) ((mb)->mft->freeArgs((mb), (args)))
#define CMFreeString(mb, str) ((mb)->mft->freeString((mb), (str)))
#define CMFreeArray(mb, array) ((mb)->mft->freeArray((mb), (array)))
#define CMFreeDateTime(mb, dt) ((mb)->mft->freeDateTime((mb), (dt)))
#define CMFreeSelectExp(mb, se) ((mb)->mft->freeSelectExp((mb), (se)))
#endif
#if CMPI_VERSION >= 210
#define CMFreeChars(mb, chars) ((mb)->mft->freeChars((mb), (chars)))
#endif

/* Contexts */

#define CMGetContextEntry(ctx, name, rc) ((ctx)->ft->getEntry((ctx), (name), (rc)))
#define CMGetContextEntryAt(ctx, index, name, rc) ((ctx)->ft->getEntryAt((ctx), (index), (name), (rc)))
#define CMGetContextEntryCount(ctx, rc) ((ctx)->ft->getEntryCount((ctx), (rc)))
#define CMAddContextEntry(ctx, name, value, type) \
    ((ctx)->ft->addEntry((ctx), (name), (CMPIValue*)(value), (type)))

/* Results */

#define CMReturnData(rslt, value, type) ((rslt)->ft->returnData((rslt), (CMPIValue*)(value), (type)))
#define CMReturnInstance(rslt, inst) ((rslt)->ft->returnInstance((rslt), (inst)))
#define CMReturnObjectPath(rslt, op) ((rslt)->ft->returnObjectPath((rslt), (op)))
#define CMReturnDone(rslt) ((rslt)->ft->returnDone((rslt)))
#if CMPI_VERSION >= 200
#define CMReturnError(rslt, er) ((rslt)->ft->returnError((rslt), (er)))
#endif

/* Strings */

#define CMGetCharsPtr(str, rc) ((str)->ft->getCharPtr((str), (rc)))
#if CMPI_VERSION >= 210
#define CMNewCharsCP(str, cpid, rc) ((str)->ft->newCharsCP((str), (cpid), (rc)))
#endif

/* Arrays */

#define CMGetArrayCount(ar, rc) ((ar)->ft->getSize((ar), (rc)))
#define CMGetArrayType(ar, rc) ((ar)->ft->getSimpleType((ar), (rc)))
#define CMGetArrayElementAt(ar, index, rc) ((ar)->ft->getElementAt((ar), (index), (rc)))
#define CMSetArrayElementAt(ar, index, value, type) \
    ((ar)->ft->setElementAt((ar), (index), (CMPIValue*)(value), (type)))

/* Enumerations */

#define CMGetNext(en, rc) ((en)->ft->getNext((en), (rc)))
#define CMHasNext(en, rc) ((en)->ft->hasNext((en), (rc)))
#define CMToArray(en, rc) ((en)->ft->toArray((en), (rc)))

/* Instances */

#define CMGetProperty(inst, name, rc) ((inst)->ft->getProperty((inst), (name), (rc)))
#define CMGetPropertyAt(inst, index, name, rc) ((inst)->ft->getPropertyAt((inst), (index), (name), (rc)))
#define CMGetPropertyCount(inst, rc) ((inst)->ft->getPropertyCount((inst), (rc)))
#define CMSetProperty(inst, name, value, type) \
    ((inst)->ft->setProperty((inst), (name), (CMPIValue*)(value), (type)))
#define CMGetObjectPath(inst, rc) ((inst)->ft->getObjectPath((inst), (rc)))
#define CMSetPropertyFilter(inst, properties, keyList) \
    ((inst)->ft->setPropertyFilter((inst), (properties), (keyList)))
#define CMSetObjectPath(inst, op) ((inst)->ft->setObjectPath((inst), (op)))
#if CMPI_VERSION >= 200
#define CMSetPropertyWithOrigin(inst, name, value, type, origin) \
    ((inst)->ft->setPropertyWithOrigin((inst), (name), (CMPIValue*)(value), (type), (origin)))
#endif

/* Object paths */

#define CMSetNameSpace(op, ns) ((op)->ft->setNameSpace((op), (ns)))
#define CMGetNameSpace(op, rc) ((op)->ft->getNameSpace((op), (rc)))
#define CMSetHostname(op, hn) ((op)->ft->setHostname((op), (hn)))
#define CMGetHostname(op, rc) ((op)->ft->getHostname((op), (rc)))
#define CMSetClassName(op, cn) ((op)->ft->setClassName((op), (cn)))
#define CMGetClassName(op, rc) ((op)->ft->getClassName((op), (rc)))
#define CMAddKey(op, key, value, type) ((op)->ft->addKey((op), (key), (CMPIValue*)(value), (type)))
#define CMGetKey(op, key, rc) ((op)->ft->getKey((op), (key), (rc)))
#define CMGetKeyAt(op, index, name, rc) ((op)->ft->getKeyAt((op), (index), (name), (rc)))
#define CMGetKeyCount(op, rc) ((op)->ft->getKeyCount((op), (rc)))
#define CMSetNameSpaceFromObjectPath(op, src) ((op)->ft->setNameSpaceFromObjectPath((op), (src)))
#define CMSetHostAndNameSpaceFromObjectPath(op, src) \
    ((op)->ft->setHostAndNameSpaceFromObjectPath((op), (src)))
#define CMGetClassQualifier(op, qName, rc) ((op)->ft->getClassQualifier((op), (qName), (rc)))
#define CMGetPropertyQualifier(op, pName, qName, rc) \
    ((op)->ft->getPropertyQualifier((op), (pName), (qName), (rc)))
#define CMGetMethodQualifier(op, mName, qName, rc) \
    ((op)->ft->getMethodQualifier((op), (mName), (qName), (rc)))
#define CMGetParameterQualifier(op, mName, pName, qName, rc) \
    ((op)->ft->getParameterQualifier((op), (mName), (pName), (qName), (rc)))

/* A method's arguments */

#define CMAddArg(args, name, value, type) ((args)->ft->addArg((args), (name), (CMPIValue*)(value), (type)))
#define CMGetArg(args, name, rc) ((args)->ft->getArg((args), (name), (rc)))
#define CMGetArgAt(args, index, name, rc) ((args)->ft->getArgAt((args), (index), (name), (rc)))
#define CMGetArgCount(args, rc) ((args)->ft->getArgCount((args), (rc)))

/* Dates and times */

#define CMGetBinaryFormat(dt, rc) ((dt)->ft->getBinaryFormat((dt), (rc)))
#define CMGetStringFormat(dt, rc) ((dt)->ft->getStringFormat((dt), (rc)))
#define CMIsInterval(dt, rc) ((dt)->ft->isInterval((dt), (rc)))

/* Errors */

#define CMGetErrorType(er, rc) ((er)->ft->getErrorType((er), (rc)))
#define CMGetOtherErrorType(er, rc) ((er)->ft->getOtherErrorType((er), (rc)))
#define CMGetOwningEntity(er, rc) ((er)->ft->getOwningEntity((er), (rc)))
#define CMGetMessageID(er, rc) ((er)->ft->getMessageID((er), (rc)))
#define CMGetErrorMessage(er, rc) ((er)->ft->getMessage((er), (rc)))
#define CMGetPerceivedSeverity(er, rc) ((er)->ft->getPerceivedSeverity((er), (rc)))
#define CMGetProbableCause(er, rc) ((er)->ft->getProbableCause((er), (rc)))
#define CMGetProbableCauseDescription(er, rc) ((er)->ft->getProbableCauseDescription((er), (rc)))
#define CMGetRecommendedActions(er, rc) ((er)->ft->getRecommendedActions((er), (rc)))
#define CMGetErrorSource(er, rc) ((er)->ft->getErrorSource((er), (rc)))
#define CMGetErrorSourceFormat(er, rc) ((er)->ft->getErrorSourceFormat((er), (rc)))
#define CMGetOtherErrorSourceFormat(er, rc) ((er)->ft->getOtherErrorSourceFormat((er), (rc)))
#define CMGetCIMStatusCode(er, rc) ((er)->ft->getCIMStatusCode((er), (rc)))
#define CMGetCIMStatusCodeDescription(er, rc) ((er)->ft->getCIMStatusCodeDescription((er), (rc)))
#define CMGetMessageArguments(er, rc) ((er)->ft->getMessageArguments((er), (rc)))
#define CMSetErrorType(er, et) ((er)->ft->setErrorType((er), (et)))
#define CMSetOtherErrorType(er, ot) ((er)->ft->setOtherErrorType((er), (ot)))
#define CMSetProbableCauseDescription(er, pcd) ((er)->ft->setProbableCauseDescription((er), (pcd)))
#define CMSetRecommendedActions(er, ra) ((er)->ft->setRecommendedActions((er), (ra)))
#define CMSetErrorSource(er, es) ((er)->ft->setErrorSource((er), (es)))
#define CMSetErrorSourceFormat(er, esf) ((er)->ft->setErrorSourceFormat((er), (esf)))
#define CMSetOtherErrorSourceFormat(er, oef) ((er)->ft->setOtherErrorSourceFormat((er), (oef)))
#define CMSetCIMStatusCodeDescription(er, scd) ((er)->ft->setCIMStatusCodeDescription((er), (scd)))
#define CMSetMessageArguments(er, values) ((er)->ft->setMessageArguments((er), (values)))

/* Property lists */

#if CMPI_VERSION >= 210
#define CMIsPropertyInList(plist, pname, rc) ((plist)->ft->isPropertyInList((plist), (pname), (rc)))
#define CMGetListProperties(plist, rc) ((plist)->ft->getProperties((plist), (rc)))
#endif

/* Enumeration filters */

#if CMPI_VERSION >= 210
#define CMFilterMatch(ef, inst, rc) ((ef)->ft->match((ef), (inst), (rc)))
#endif

/* Select expressions */

#define CMEvaluateSelExp(se, inst, rc) ((se)->ft->evaluate((se), (inst), (rc)))
#define CMGetSelExpString(se, rc) ((se)->ft->getString((se), (rc)))
#define CMGetDoc(se, rc) ((se)->ft->getDOC((se), (rc)))
#define CMGetCod(se, rc) ((se)->ft->getCOD((se), (rc)))
#define CMEvaluateSelExpUsingAccessor(se, accessor, parm, rc) \
    ((se)->ft->evaluateUsingAccessor((se), (accessor), (parm), (rc)))

/* Conditions in normal form */

#define CMGetSubCondCountAndType(sc, type, rc) ((sc)->ft->getCountAndType((sc), (type), (rc)))
#define CMGetSubCondAt(sc, index, rc) ((sc)->ft->getSubCondAt((sc), (index), (rc)))

/* Parts of a condition */

#define CMGetPredicateCount(sc, rc) ((sc)->ft->getCount((sc), (rc)))
#define CMGetPredicateAt(sc, index, rc) ((sc)->ft->getPredicateAt((sc), (index), (rc)))
#define CMGetPredicate(sc, name, rc) ((sc)->ft->getPredicate((sc), (name), (rc)))

/* Predicates */

#define CMGetPredicateData(pr, type, prop, lhs, rhs) ((pr)->ft->getData((pr), (type), (prop), (lhs), (rhs)))
#define CMEvaluatePredicateUsingAccessor(pr, accessorFnc, parm, rc) \
    ((pr)->ft->evaluateUsingAccessor((pr), (accessorFnc), (parm), (rc)))

#else

/* The value argument of a slot, from any pointer. */
#ifdef __cplusplus
#define CMPI_VALUE(pointer) static_cast<const CMPIValue*>(pointer)
#else
#define CMPI_VALUE(pointer) ((const CMPIValue*)(pointer))
#endif

/* The CIM server: threads of a provider, indications, requests to other providers
 *
 * The context is the one that a provider's function was given. A thread of the provider's own uses what
 * CBPrepareAttachThread made of it beforehand, between CBAttachThread and CBDetachThread. A list of
 * properties ends with a null pointer; null in its place asks for all. */

static inline CMPIContext* CBPrepareAttachThread(const CMPIBroker* mb, const CMPIContext* ctx) {
    return mb->bft->prepareAttachThread(mb, ctx);
}
static inline CMPIStatus CBAttachThread(const CMPIBroker* mb, const CMPIContext* ctx) {
    return mb->bft->attachThread(mb, ctx);
}
static inline CMPIStatus CBDetachThread(const CMPIBroker* mb, const CMPIContext* ctx) {
    return mb->bft->detachThread(mb, ctx);
}
static inline CMPIStatus CBDeliverIndication(const CMPIBroker* mb, const CMPIContext* ctx, const char* ns,
                                             const CMPIInstance* ind) {
    return mb->bft->deliverIndication(mb, ctx, ns, ind);
}
static inline CMPIEnumeration* CBEnumInstanceNames(const CMPIBroker* mb, const CMPIContext* ctx,
                                                   const CMPIObjectPath* classPath, CMPIStatus* rc) {
    return mb->bft->enumerateInstanceNames(mb, ctx, classPath, rc);
}
static inline CMPIInstance* CBGetInstance(const CMPIBroker* mb, const CMPIContext* ctx,
                                          const CMPIObjectPath* instPath, const char** properties,
                                          CMPIStatus* rc) {
    return mb->bft->getInstance(mb, ctx, instPath, properties, rc);
}
static inline CMPIObjectPath* CBCreateInstance(const CMPIBroker* mb, const CMPIContext* ctx,
                                               const CMPIObjectPath* classPath, const CMPIInstance* newInst,
                                               CMPIStatus* rc) {
    return mb->bft->createInstance(mb, ctx, classPath, newInst, rc);
}
static inline CMPIStatus CBModifyInstance(const CMPIBroker* mb, const CMPIContext* ctx,
                                          const CMPIObjectPath* instPath, const CMPIInstance* modInst,
                                          const char** properties) {
    return mb->bft->modifyInstance(mb, ctx, instPath, modInst, properties);
}
static inline CMPIStatus CBDeleteInstance(const CMPIBroker* mb, const CMPIContext* ctx,
                                          const CMPIObjectPath* instPath) {
    return mb->bft->deleteInstance(mb, ctx, instPath);
}
static inline CMPIEnumeration* CBExecQuery(const CMPIBroker* mb, const CMPIContext* ctx,
                                           const CMPIObjectPath* classPath, const char* query,
                                           const char* lang, CMPIStatus* rc) {
    return mb->bft->execQuery(mb, ctx, classPath, query, lang, rc);
}
static inline CMPIEnumeration* CBEnumInstances(const CMPIBroker* mb, const CMPIContext* ctx,
                                               const CMPIObjectPath* classPath, const char** properties,
                                               CMPIStatus* rc) {
    return mb->bft->enumerateInstances(mb, ctx, classPath, properties, rc);
}
static inline CMPIEnumeration* CBAssociators(const CMPIBroker* mb, const CMPIContext* ctx,
                                             const CMPIObjectPath* instPath, const char* assocClass,
                                             const char* resultClass, const char* role,
                                             const char* resultRole, const char** properties,
                                             CMPIStatus* rc) {
    return mb->bft->associators(mb, ctx, instPath, assocClass, resultClass, role, resultRole, properties, rc);
}
static inline CMPIEnumeration* CBAssociatorNames(const CMPIBroker* mb, const CMPIContext* ctx,
                                                 const CMPIObjectPath* instPath, const char* assocClass,
                                                 const char* resultClass, const char* role,
                                                 const char* resultRole, CMPIStatus* rc) {
    return mb->bft->associatorNames(mb, ctx, instPath, assocClass, resultClass, role, resultRole, rc);
}
static inline CMPIEnumeration* CBReferences(const CMPIBroker* mb, const CMPIContext* ctx,
                                            const CMPIObjectPath* instPath, const char* resultClass,
                                            const char* role, const char** properties, CMPIStatus* rc) {
    return mb->bft->references(mb, ctx, instPath, resultClass, role, properties, rc);
}
static inline CMPIEnumeration* CBReferenceNames(const CMPIBroker* mb, const CMPIContext* ctx,
                                                const CMPIObjectPath* instPath, const char* resultClass,
                                                const char* role, CMPIStatus* rc) {
    return mb->bft->referenceNames(mb, ctx, instPath, resultClass, role, rc);
}
static inline CMPIData CBInvokeMethod(const CMPIBroker* mb, const CMPIContext* ctx,
                                      const CMPIObjectPath* objPath, const char* method, const CMPIArgs* in,
                                      CMPIArgs* out, CMPIStatus* rc) {
    return mb->bft->invokeMethod(mb, ctx, objPath, method, in, out, rc);
}
static inline CMPIStatus CBSetProperty(const CMPIBroker* mb, const CMPIContext* ctx,
                                       const CMPIObjectPath* instPath, const char* name, const void* value,
                                       CMPIType type) {
    return mb->bft->setProperty(mb, ctx, instPath, name, CMPI_VALUE(value), type);
}
static inline CMPIData CBGetProperty(const CMPIBroker* mb, const CMPIContext* ctx,
                                     const CMPIObjectPath* instPath, const char* name, CMPIStatus* rc) {
    return mb->bft->getProperty(mb, ctx, instPath, name, rc);
}
#if CMPI_VERSION >= 210
static inline CMPIEnumeration* CBEnumInstancesFiltered(const CMPIBroker* mb, const CMPIContext* ctx,
                                                       const CMPIObjectPath* classPath,
                                                       const char** properties,
                                                       const char* filterQueryLanguage,
                                                       const char* filterQuery, CMPIStatus* rc) {
    return mb->bft->enumerateInstancesFiltered(mb, ctx, classPath, properties, filterQueryLanguage,
                                               filterQuery, rc);
}
static inline CMPIEnumeration* CBAssociatorsFiltered(const CMPIBroker* mb, const CMPIContext* ctx,
                                                     const CMPIObjectPath* instPath, const char* assocClass,
                                                     const char* resultClass, const char* role,
                                                     const char* resultRole, const char** properties,
                                                     const char* filterQueryLanguage, const char* filterQuery,
                                                     CMPIStatus* rc) {
    return mb->bft->associatorsFiltered(mb, ctx, instPath, assocClass, resultClass, role, resultRole,
                                        properties, filterQueryLanguage, filterQuery, rc);
}
static inline CMPIEnumeration* CBReferencesFiltered(const CMPIBroker* mb, const CMPIContext* ctx,
                                                    const CMPIObjectPath* instPath, const char* resultClass,
                                                    const char* role, const char** properties,
                                                    const char* filterQueryLanguage, const char* filterQuery,
                                                    CMPIStatus* rc) {
    return mb->bft->referencesFiltered(mb, ctx, instPath, resultClass, role, properties, filterQueryLanguage,
                                       filterQuery, rc);
}
#endif

/* Making objects, asking about classes, logging
 *
 * What is made here belongs to the broker, which releases it after the provider's function has returned.
 * CMClone makes a copy that lives until CMRelease. */

static inline CMPIInstance* CMNewInstance(const CMPIBroker* mb, const CMPIObjectPath* instPath,
                                          CMPIStatus* rc) {
    return mb->eft->newInstance(mb, instPath, rc);
}
static inline CMPIObjectPath* CMNewObjectPath(const CMPIBroker* mb, const char* ns, const char* cn,
                                              CMPIStatus* rc) {
    return mb->eft->newObjectPath(mb, ns, cn, rc);
}
static inline CMPIArgs* CMNewArgs(const CMPIBroker* mb, CMPIStatus* rc) {
    return mb->eft->newArgs(mb, rc);
}
static inline CMPIString* CMNewString(const CMPIBroker* mb, const char* data, CMPIStatus* rc) {
    return mb->eft->newString(mb, data, rc);
}
static inline CMPIArray* CMNewArray(const CMPIBroker* mb, CMPICount size, CMPIType type, CMPIStatus* rc) {
    return mb->eft->newArray(mb, size, type, rc);
}
static inline CMPIDateTime* CMNewDateTime(const CMPIBroker* mb, CMPIStatus* rc) {
    return mb->eft->newDateTime(mb, rc);
}
static inline CMPIDateTime* CMNewDateTimeFromBinary(const CMPIBroker* mb, CMPIUint64 binTime,
                                                    CMPIBoolean interval, CMPIStatus* rc) {
    return mb->eft->newDateTimeFromBinary(mb, binTime, interval, rc);
}
static inline CMPIDateTime* CMNewDateTimeFromChars(const CMPIBroker* mb, const char* datetime,
                                                   CMPIStatus* rc) {
    return mb->eft->newDateTimeFromChars(mb, datetime, rc);
}
static inline CMPISelectExp* CMNewSelectExp(const CMPIBroker* mb, const char* query, const char* lang,
                                            CMPIArray** projection, CMPIStatus* rc) {
    return mb->eft->newSelectExp(mb, query, lang, projection, rc);
}
static inline CMPIBoolean CMClassPathIsA(const CMPIBroker* mb, const CMPIObjectPath* classPath,
                                         const char* className, CMPIStatus* rc) {
    return mb->eft->classPathIsA(mb, classPath, className, rc);
}
static inline CMPIStatus CMLogMessage(const CMPIBroker* mb, CMPISeverity severity, const char* id,
                                      const char* text, const CMPIString* string) {
    return mb->eft->logMessage(mb, severity, id, text, string);
}
static inline CMPIStatus CMTraceMessage(const CMPIBroker* mb, CMPILevel level, const char* component,
                                        const char* text, const CMPIString* string) {
    return mb->eft->trace(mb, level, component, text, string);
}
#if CMPI_VERSION >= 200
static inline CMPIError* CMNewCMPIError(const CMPIBroker* mb, const char* owner, const char* msgID,
                                        const char* msg, const CMPIErrorSeverity sev,
                                        const CMPIErrorProbableCause pc, const CMPIrc cimStatusCode,
                                        CMPIStatus* rc) {
    return mb->eft->newCMPIError(mb, owner, msgID, msg, sev, pc, cimStatusCode, rc);
}
static inline CMPIStatus CMOpenMessageFile(const CMPIBroker* mb, const char* msgFile,
                                           CMPIMsgFileHandle* msgFileHandle) {
    return mb->eft->openMessageFile(mb, msgFile, msgFileHandle);
}
static inline CMPIStatus CMCloseMessageFile(const CMPIBroker* mb, const CMPIMsgFileHandle msgFileHandle) {
    return mb->eft->closeMessageFile(mb, msgFileHandle);
}
#endif
#if CMPI_VERSION >= 210
static inline CMPIPropertyList* CMNewPropertyList(const CMPIBroker* mb, const char** properties,
                                                  CMPIStatus* rc) {
    return mb->eft->newPropertyList(mb, properties, rc);
}
static inline CMPIString* CMNewStringCP(const CMPIBroker* mb, const char* data, const CMPICodepageID cpid,
                                        CMPIStatus* rc) {
    return mb->eft->newStringCP(mb, data, cpid, rc);
}
static inline CMPIEnumerationFilter* CMNewEnumerationFilter(const CMPIBroker* mb,
                                                            const char* filterQueryLanguage,
                                                            const char* filterQuery, CMPIStatus* rc) {
    return mb->eft->newEnumerationFilter(mb, filterQueryLanguage, filterQuery, rc);
}
#endif

/* Memory that belongs to the broker
 *
 * CMMemRelease frees what the calling thread has got since its CMMemMark: of use to a provider that makes
 * very many objects in one request. CMMalloc and its like are freed by CMFree alone. */

#if CMPI_VERSION >= 200
static inline CMPIGcStat* CMMemMark(const CMPIBroker* mb, CMPIStatus* rc) {
    return mb->mft->mark(mb, rc);
}
static inline CMPIStatus CMMemRelease(const CMPIBroker* mb, const CMPIGcStat* gc) {
    return mb->mft->release(mb, gc);
}
static inline void* CMMalloc(const CMPIBroker* mb, size_t size) {
    return mb->mft->cmpiMalloc(mb, size);
}
static inline void* CMCalloc(const CMPIBroker* mb, size_t nElems, size_t sizeElem) {
    return mb->mft->cmpiCalloc(mb, nElems, sizeElem);
}
static inline void* CMRealloc(const CMPIBroker* mb, void* ptr, size_t size) {
    return mb->mft->cmpiRealloc(mb, ptr, size);
}
static inline char* CMStrDup(const CMPIBroker* mb, const char* str) {
    return mb->mft->cmpiStrDup(mb, str);
}
static inline void CMFree(const CMPIBroker* mb, void* ptr) {
    mb->mft->cmpiFree(mb, ptr);
}
static inline void CMFreeInstance(const CMPIBroker* mb, CMPIInstance* inst) {
    mb->mft->freeInstance(mb, inst);
}
static inline void CMFreeObjectPath(const CMPIBroker* mb, CMPIObjectPath* obj) {
    mb->mft->freeObjectPath(mb, obj);
}
static inline void CMFreeArgs(const CMPIBroker* mb, CMPIArgs* args) {
    mb->mft->freeArgs(mb, args);
}
static inline void CMFreeString(const CMPIBroker* mb, CMPIString* str) {
    mb->mft->freeString(mb, str);
}
static inline void CMFreeArray(const CMPIBroker* mb, CMPIArray* array) {
    mb->mft->freeArray(mb, array);
}
static inline void CMFreeDateTime(const CMPIBroker* mb, CMPIDateTime* dt) {
    mb->mft->freeDateTime(mb, dt);
}
static inline void CMFreeSelectExp(const CMPIBroker* mb, CMPISelectExp* se) {
    mb->mft->freeSelectExp(mb, se);
}
#endif
#if CMPI_VERSION >= 210
static inline void CMFreeChars(const CMPIBroker* mb, char* chars) {
    mb->mft->freeChars(mb, chars);
}
#endif

/* Contexts: named values that travel with a request, such as the principal and the flags of a client */

static inline CMPIData CMGetContextEntry(const CMPIContext* ctx, const char* name, CMPIStatus* rc) {
    return ctx->ft->getEntry(ctx, name, rc);
}
static inline CMPIData CMGetContextEntryAt(const CMPIContext* ctx, CMPICount index, CMPIString** name,
                                           CMPIStatus* rc) {
    return ctx->ft->getEntryAt(ctx, index, name, rc);
}
static inline CMPICount CMGetContextEntryCount(const CMPIContext* ctx, CMPIStatus* rc) {
    return ctx->ft->getEntryCount(ctx, rc);
}
static inline CMPIStatus CMAddContextEntry(const CMPIContext* ctx, const char* name, const void* value,
                                           const CMPIType type) {
    return ctx->ft->addEntry(ctx, name, CMPI_VALUE(value), type);
}

/* Results
 *
 * A function of a provider hands its objects over one by one, and ends with CMReturnDone. */

static inline CMPIStatus CMReturnData(const CMPIResult* rslt, const void* value, const CMPIType type) {
    return rslt->ft->returnData(rslt, CMPI_VALUE(value), type);
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
#if CMPI_VERSION >= 200
static inline CMPIStatus CMReturnError(const CMPIResult* rslt, const CMPIError* er) {
    return rslt->ft->returnError(rslt, er);
}
#endif

/* Strings
 *
 * The characters that CMGetCharsPtr returns live as long as the string. */

static inline CMPI_CONST_SINCE_210 char* CMGetCharsPtr(const CMPIString* str, CMPIStatus* rc) {
    return str->ft->getCharPtr(str, rc);
}
#if CMPI_VERSION >= 210
static inline char* CMNewCharsCP(const CMPIString* str, const CMPICodepageID cpid, CMPIStatus* rc) {
    return str->ft->newCharsCP(str, cpid, rc);
}
#endif

/* Arrays have a type and a size from the start; elements are null until they are set. */

static inline CMPICount CMGetArrayCount(const CMPIArray* ar, CMPIStatus* rc) {
    return ar->ft->getSize(ar, rc);
}
static inline CMPIType CMGetArrayType(const CMPIArray* ar, CMPIStatus* rc) {
    return ar->ft->getSimpleType(ar, rc);
}
static inline CMPIData CMGetArrayElementAt(const CMPIArray* ar, CMPICount index, CMPIStatus* rc) {
    return ar->ft->getElementAt(ar, index, rc);
}
static inline CMPIStatus CMSetArrayElementAt(const CMPIArray* ar, CMPICount index, const void* value,
                                             CMPIType type) {
    return ar->ft->setElementAt(ar, index, CMPI_VALUE(value), type);
}

/* Enumerations: values that are visited in turn, or copied into an array */

static inline CMPIData CMGetNext(const CMPIEnumeration* en, CMPIStatus* rc) {
    return en->ft->getNext(en, rc);
}
static inline CMPIBoolean CMHasNext(const CMPIEnumeration* en, CMPIStatus* rc) {
    return en->ft->hasNext(en, rc);
}
static inline CMPIArray* CMToArray(const CMPIEnumeration* en, CMPIStatus* rc) {
    return en->ft->toArray(en, rc);
}

/* Instances
 *
 * After CMSetPropertyFilter, CMSetProperty ignores the properties that are not in its list. `keyList` names
 * the keys, which it never ignores. */

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
static inline CMPIStatus CMSetProperty(const CMPIInstance* inst, const char* name, const void* value,
                                       CMPIType type) {
    return inst->ft->setProperty(inst, name, CMPI_VALUE(value), type);
}
static inline CMPIObjectPath* CMGetObjectPath(const CMPIInstance* inst, CMPIStatus* rc) {
    return inst->ft->getObjectPath(inst, rc);
}
static inline CMPIStatus CMSetPropertyFilter(const CMPIInstance* inst, const char** properties,
                                             const char** keyList) {
    return inst->ft->setPropertyFilter(inst, properties, keyList);
}
static inline CMPIStatus CMSetObjectPath(const CMPIInstance* inst, const CMPIObjectPath* op) {
    return inst->ft->setObjectPath(inst, op);
}
#if CMPI_VERSION >= 200
static inline CMPIStatus CMSetPropertyWithOrigin(const CMPIInstance* inst, const char* name,
                                                 const void* value, const CMPIType type, const char* origin) {
    return inst->ft->setPropertyWithOrigin(inst, name, CMPI_VALUE(value), type, origin);
}
#endif

/* Object paths
 *
 * The qualifiers are those of the path's class. Few CIM servers serve them all. */

static inline CMPIStatus CMSetNameSpace(const CMPIObjectPath* op, const char* ns) {
    return op->ft->setNameSpace(op, ns);
}
static inline CMPIString* CMGetNameSpace(const CMPIObjectPath* op, CMPIStatus* rc) {
    return op->ft->getNameSpace(op, rc);
}
static inline CMPIStatus CMSetHostname(const CMPIObjectPath* op, const char* hn) {
    return op->ft->setHostname(op, hn);
}
static inline CMPIString* CMGetHostname(const CMPIObjectPath* op, CMPIStatus* rc) {
    return op->ft->getHostname(op, rc);
}
static inline CMPIStatus CMSetClassName(const CMPIObjectPath* op, const char* cn) {
    return op->ft->setClassName(op, cn);
}
static inline CMPIString* CMGetClassName(const CMPIObjectPath* op, CMPIStatus* rc) {
    return op->ft->getClassName(op, rc);
}
static inline CMPIStatus CMAddKey(const CMPIObjectPath* op, const char* key, const void* value,
                                  const CMPIType type) {
    return op->ft->addKey(op, key, CMPI_VALUE(value), type);
}
static inline CMPIData CMGetKey(const CMPIObjectPath* op, const char* key, CMPIStatus* rc) {
    return op->ft->getKey(op, key, rc);
}
static inline CMPIData CMGetKeyAt(const CMPIObjectPath* op, CMPICount index, CMPIString** name,
                                  CMPIStatus* rc) {
    return op->ft->getKeyAt(op, index, name, rc);
}
static inline CMPICount CMGetKeyCount(const CMPIObjectPath* op, CMPIStatus* rc) {
    return op->ft->getKeyCount(op, rc);
}
static inline CMPIStatus CMSetNameSpaceFromObjectPath(const CMPIObjectPath* op, const CMPIObjectPath* src) {
    return op->ft->setNameSpaceFromObjectPath(op, src);
}
static inline CMPIStatus CMSetHostAndNameSpaceFromObjectPath(const CMPIObjectPath* op,
                                                             const CMPIObjectPath* src) {
    return op->ft->setHostAndNameSpaceFromObjectPath(op, src);
}
static inline CMPIData CMGetClassQualifier(const CMPIObjectPath* op, const char* qName, CMPIStatus* rc) {
    return op->ft->getClassQualifier(op, qName, rc);
}
static inline CMPIData CMGetPropertyQualifier(const CMPIObjectPath* op, const char* pName, const char* qName,
                                              CMPIStatus* rc) {
    return op->ft->getPropertyQualifier(op, pName, qName, rc);
}
static inline CMPIData CMGetMethodQualifier(const CMPIObjectPath* op, const char* mName, const char* qName,
                                            CMPIStatus* rc) {
    return op->ft->getMethodQualifier(op, mName, qName, rc);
}
static inline CMPIData CMGetParameterQualifier(const CMPIObjectPath* op, const char* mName, const char* pName,
                                               const char* qName, CMPIStatus* rc) {
    return op->ft->getParameterQualifier(op, mName, pName, qName, rc);
}

/* A method's arguments, in and out */

static inline CMPIStatus CMAddArg(const CMPIArgs* args, const char* name, const void* value,
                                  const CMPIType type) {
    return args->ft->addArg(args, name, CMPI_VALUE(value), type);
}
static inline CMPIData CMGetArg(const CMPIArgs* args, const char* name, CMPIStatus* rc) {
    return args->ft->getArg(args, name, rc);
}
static inline CMPIData CMGetArgAt(const CMPIArgs* args, CMPICount index, CMPIString** name, CMPIStatus* rc) {
    return args->ft->getArgAt(args, index, name, rc);
}
static inline CMPICount CMGetArgCount(const CMPIArgs* args, CMPIStatus* rc) {
    return args->ft->getArgCount(args, rc);
}

/* Dates and times
 *
 * The binary format counts microseconds: of an interval its length, else since the start of 1970 in UTC. */

static inline CMPIUint64 CMGetBinaryFormat(const CMPIDateTime* dt, CMPIStatus* rc) {
    return dt->ft->getBinaryFormat(dt, rc);
}
static inline CMPIString* CMGetStringFormat(const CMPIDateTime* dt, CMPIStatus* rc) {
    return dt->ft->getStringFormat(dt, rc);
}
static inline CMPIBoolean CMIsInterval(const CMPIDateTime* dt, CMPIStatus* rc) {
    return dt->ft->isInterval(dt, rc);
}

/* Errors: the properties of an instance of CIM_Error */

static inline CMPIErrorType CMGetErrorType(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getErrorType(er, rc);
}
static inline CMPIString* CMGetOtherErrorType(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getOtherErrorType(er, rc);
}
static inline CMPIString* CMGetOwningEntity(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getOwningEntity(er, rc);
}
static inline CMPIString* CMGetMessageID(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getMessageID(er, rc);
}
static inline CMPIString* CMGetErrorMessage(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getMessage(er, rc);
}
static inline CMPIErrorSeverity CMGetPerceivedSeverity(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getPerceivedSeverity(er, rc);
}
static inline CMPIErrorProbableCause CMGetProbableCause(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getProbableCause(er, rc);
}
static inline CMPIString* CMGetProbableCauseDescription(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getProbableCauseDescription(er, rc);
}
static inline CMPIArray* CMGetRecommendedActions(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getRecommendedActions(er, rc);
}
static inline CMPIString* CMGetErrorSource(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getErrorSource(er, rc);
}
static inline CMPIErrorSrcFormat CMGetErrorSourceFormat(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getErrorSourceFormat(er, rc);
}
static inline CMPIString* CMGetOtherErrorSourceFormat(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getOtherErrorSourceFormat(er, rc);
}
static inline CMPIrc CMGetCIMStatusCode(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getCIMStatusCode(er, rc);
}
static inline CMPIString* CMGetCIMStatusCodeDescription(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getCIMStatusCodeDescription(er, rc);
}
static inline CMPIArray* CMGetMessageArguments(const CMPIError* er, CMPIStatus* rc) {
    return er->ft->getMessageArguments(er, rc);
}
static inline CMPIStatus CMSetErrorType(const CMPIError* er, const CMPIErrorType et) {
    return er->ft->setErrorType(er, et);
}
static inline CMPIStatus CMSetOtherErrorType(const CMPIError* er, const char* ot) {
    return er->ft->setOtherErrorType(er, ot);
}
static inline CMPIStatus CMSetProbableCauseDescription(const CMPIError* er, const char* pcd) {
    return er->ft->setProbableCauseDescription(er, pcd);
}
static inline CMPIStatus CMSetRecommendedActions(const CMPIError* er, const CMPIArray* ra) {
    return er->ft->setRecommendedActions(er, ra);
}
static inline CMPIStatus CMSetErrorSource(const CMPIError* er, const char* es) {
    return er->ft->setErrorSource(er, es);
}
static inline CMPIStatus CMSetErrorSourceFormat(const CMPIError* er, const CMPIErrorSrcFormat esf) {
    return er->ft->setErrorSourceFormat(er, esf);
}
static inline CMPIStatus CMSetOtherErrorSourceFormat(const CMPIError* er, const char* oef) {
    return er->ft->setOtherErrorSourceFormat(er, oef);
}
static inline CMPIStatus CMSetCIMStatusCodeDescription(const CMPIError* er, const char* scd) {
    return er->ft->setCIMStatusCodeDescription(er, scd);
}
static inline CMPIStatus CMSetMessageArguments(const CMPIError* er, const CMPIArray* values) {
    return er->ft->setMessageArguments(er, values);
}

/* Property lists */

#if CMPI_VERSION >= 210
static inline CMPIBoolean CMIsPropertyInList(const CMPIPropertyList* plist, const char* pname,
                                             CMPIStatus* rc) {
    return plist->ft->isPropertyInList(plist, pname, rc);
}
static inline const char** CMGetListProperties(const CMPIPropertyList* plist, CMPIStatus* rc) {
    return plist->ft->getProperties(plist, rc);
}
#endif

/* Enumeration filters */

#if CMPI_VERSION >= 210
static inline CMPIBoolean CMFilterMatch(const CMPIEnumerationFilter* ef, const CMPIInstance* inst,
                                        CMPIStatus* rc) {
    return ef->ft->match(ef, inst, rc);
}
#endif

/* Select expressions
 *
 * The two normal forms of the WHERE clause, DOC and COD, are a disjunction of conjunctions and the reverse.
 * An accessor supplies the values of properties where there is no instance yet. */

static inline CMPIBoolean CMEvaluateSelExp(const CMPISelectExp* se, const CMPIInstance* inst,
                                           CMPIStatus* rc) {
    return se->ft->evaluate(se, inst, rc);
}
static inline CMPIString* CMGetSelExpString(const CMPISelectExp* se, CMPIStatus* rc) {
    return se->ft->getString(se, rc);
}
static inline CMPISelectCond* CMGetDoc(const CMPISelectExp* se, CMPIStatus* rc) {
    return se->ft->getDOC(se, rc);
}
static inline CMPISelectCond* CMGetCod(const CMPISelectExp* se, CMPIStatus* rc) {
    return se->ft->getCOD(se, rc);
}
static inline CMPIBoolean CMEvaluateSelExpUsingAccessor(const CMPISelectExp* se, CMPIAccessor* accessor,
                                                        void* parm, CMPIStatus* rc) {
    return se->ft->evaluateUsingAccessor(se, accessor, parm, rc);
}

/* Conditions in normal form */

static inline CMPICount CMGetSubCondCountAndType(const CMPISelectCond* sc, int* type, CMPIStatus* rc) {
    return sc->ft->getCountAndType(sc, type, rc);
}
static inline CMPISubCond* CMGetSubCondAt(const CMPISelectCond* sc, CMPICount index, CMPIStatus* rc) {
    return sc->ft->getSubCondAt(sc, index, rc);
}

/* Parts of a condition */

static inline CMPICount CMGetPredicateCount(const CMPISubCond* sc, CMPIStatus* rc) {
    return sc->ft->getCount(sc, rc);
}
static inline CMPIPredicate* CMGetPredicateAt(const CMPISubCond* sc, CMPICount index, CMPIStatus* rc) {
    return sc->ft->getPredicateAt(sc, index, rc);
}
static inline CMPIPredicate* CMGetPredicate(const CMPISubCond* sc, const char* name, CMPIStatus* rc) {
    return sc->ft->getPredicate(sc, name, rc);
}

/* Predicates: a name on the left, a value as text on the right */

static inline CMPIStatus CMGetPredicateData(const CMPIPredicate* pr, CMPIType* type, CMPIPredOp* prop,
                                            CMPIString** lhs, CMPIString** rhs) {
    return pr->ft->getData(pr, type, prop, lhs, rhs);
}
static inline CMPIBoolean CMEvaluatePredicateUsingAccessor(const CMPIPredicate* pr, CMPIAccessor* accessorFnc,
                                                           void* parm, CMPIStatus* rc) {
    return pr->ft->evaluateUsingAccessor(pr, accessorFnc, parm, rc);
}

#undef CMPI_VALUE

#endif

#endif
