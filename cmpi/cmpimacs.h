/*
 * cmpimacs.h - convenience macros of the project's own CMPI 2.0 headers.
 *
 * Written to the CMPI 2.0 binary interface.  Every call-through macro expands
 * to exactly one function-table call, with its arguments in the order given.
 * Value arguments of the set/add/return-data macros are cast to CMPIValue*:
 * brokers read a CMPI_chars value as the char* itself, so
 * CMSetProperty(inst, "Name", "text", CMPI_chars) works, and for any other
 * type the argument points to a variable of the matching member type.
 *
 * Differences from the oldest macro forms, all source-compatible:
 *  - statement macros are do { } while (0) blocks, so they nest in if/else;
 *  - CMSetStatus* tolerate a NULL status pointer (brokers pass NULL for "no
 *    status wanted"), and CMReturnWithChars tolerates a NULL broker;
 *  - CMGetCharPtr goes through CMPIStringFT.getCharPtr instead of reading
 *    hdl, so it does not depend on how a broker stores its strings; it and
 *    CMGetCharsPtr evaluate their argument once and return NULL for NULL;
 *  - CMFmtString uses CMPI_string, and CBGetClassification reads
 *    brokerCapabilities (the member it once named no longer exists).
 */
#ifndef _CMPIMACS_H_
#define _CMPIMACS_H_

#include "cmpift.h"

#ifdef __cplusplus
extern "C" {
#endif

/* ---- helpers behind the status macros (functions, so a NULL test on an
 *      address such as &st does not trip -Waddress) ----------------------- */

static inline void CMPIMacSetStatus_(CMPIStatus* st, CMPIrc rc, CMPIString* msg) {
  if (st != NULL) {
    st->rc = rc;
    st->msg = msg;
  }
}

static inline CMPIString* CMPIMacNewString_(const CMPIBroker* mb, const char* chars) {
  return mb != NULL ? mb->eft->newString(mb, chars, NULL) : NULL;
}

static inline void CMPIMacSetStatusChars_(const CMPIBroker* mb, CMPIStatus* st, CMPIrc rc,
                                          const char* chars) {
  if (st != NULL) {
    st->rc = rc;
    st->msg = CMPIMacNewString_(mb, chars);
  }
}

/* One evaluation of the string argument, so the common
 * CMGetCharPtr(CMGetClassName(op, NULL)) asks the broker once; NULL-safe. */
static inline char* CMPIMacGetCharPtr_(const CMPIString* str, CMPIStatus* rc) {
  return str != NULL ? str->ft->getCharPtr(str, rc) : NULL;
}

static inline int CMPIMacIsNullObject_(const void* obj) {
  return obj == NULL || *(void* const*)obj == NULL;
}

/* ---- status and return -------------------------------------------------- */

/* Return {rc, NULL} from the enclosing function (which returns CMPIStatus). */
#define CMReturn(rc)                                       \
  do {                                                     \
    CMPIStatus cmpiStat_ = {(CMPIrc)(rc), NULL};           \
    return cmpiStat_;                                      \
  } while (0)

#define CMReturnWithString(rc, str)                        \
  do {                                                     \
    CMPIStatus cmpiStat_ = {(CMPIrc)(rc), (str)};          \
    return cmpiStat_;                                      \
  } while (0)

/* The message is a new broker string (CMPIBrokerEncFT.newString). */
#define CMReturnWithChars(mb, rc, chars)                   \
  do {                                                     \
    CMPIStatus cmpiStat_ = {(CMPIrc)(rc), NULL};           \
    cmpiStat_.msg = CMPIMacNewString_((mb), (chars));      \
    return cmpiStat_;                                      \
  } while (0)

#define CMSetStatus(st, rc) CMPIMacSetStatus_((st), (CMPIrc)(rc), NULL)
#define CMSetStatusWithString(st, rc, str) CMPIMacSetStatus_((st), (CMPIrc)(rc), (str))
#define CMSetStatusWithChars(mb, st, rc, chars) \
  CMPIMacSetStatusChars_((mb), (st), (CMPIrc)(rc), (chars))

/* ---- tests on objects and data ------------------------------------------- */

/* True when the object pointer or its hdl is NULL. */
#define CMIsNullObject(obj) CMPIMacIsNullObject_((const void*)(obj))
#define CMIsNullValue(data) (((data).state) & CMPI_nullValue)
#define CMIsKeyValue(data)  (((data).state) & CMPI_keyValue)
#define CMIsArray(data)     (((data).type) & CMPI_ARRAY)

/* ---- any encapsulated object: slot 1 is release, slot 2 clone ---------- */

#define CMRelease(obj)   ((obj)->ft->release((obj)))
#define CMClone(obj, rc) ((obj)->ft->clone((obj), (rc)))

#define CMGetCharPtr(str) CMPIMacGetCharPtr_((str), NULL)

/* ---- broker data fields ---------------------------------------------------- */

#define CBGetBrokerCapabilities(mb) ((mb)->bft->brokerCapabilities)
#define CBGetClassification(mb)     ((mb)->bft->brokerCapabilities)
#define CBBrokerVersion(mb)         ((mb)->bft->brokerVersion)
#define CBBrokerName(mb)            ((mb)->bft->brokerName)

/* CMPIBrokerFT (broker->bft) */
#define CBPrepareAttachThread(mb, ctx) \
  ((mb)->bft->prepareAttachThread((mb), (ctx)))
#define CBAttachThread(mb, ctx) \
  ((mb)->bft->attachThread((mb), (ctx)))
#define CBDetachThread(mb, ctx) \
  ((mb)->bft->detachThread((mb), (ctx)))
#define CBDeliverIndication(mb, ctx, ns, indication) \
  ((mb)->bft->deliverIndication((mb), (ctx), (ns), (indication)))
#define CBEnumInstanceNames(mb, ctx, classPath, rc) \
  ((mb)->bft->enumerateInstanceNames((mb), (ctx), (classPath), (rc)))
#define CBGetInstance(mb, ctx, instPath, propertyList, rc) \
  ((mb)->bft->getInstance((mb), (ctx), (instPath), (propertyList), (rc)))
#define CBCreateInstance(mb, ctx, classPath, newInstance, rc) \
  ((mb)->bft->createInstance((mb), (ctx), (classPath), (newInstance), (rc)))
#define CBModifyInstance(mb, ctx, instPath, modifiedInstance, propertyList) \
  ((mb)->bft->modifyInstance((mb), (ctx), (instPath), (modifiedInstance), (propertyList)))
#define CBDeleteInstance(mb, ctx, instPath) \
  ((mb)->bft->deleteInstance((mb), (ctx), (instPath)))
#define CBExecQuery(mb, ctx, namespacePath, query, queryLanguage, rc) \
  ((mb)->bft->execQuery((mb), (ctx), (namespacePath), (query), (queryLanguage), (rc)))
#define CBEnumInstances(mb, ctx, classPath, propertyList, rc) \
  ((mb)->bft->enumerateInstances((mb), (ctx), (classPath), (propertyList), (rc)))
#define CBAssociators(mb, ctx, sourcePath, assocClass, resultClass, role, resultRole, \
    propertyList, rc) \
  ((mb)->bft->associators((mb), (ctx), (sourcePath), (assocClass), (resultClass), (role), \
   (resultRole), (propertyList), (rc)))
#define CBAssociatorNames(mb, ctx, sourcePath, assocClass, resultClass, role, resultRole, rc) \
  ((mb)->bft->associatorNames((mb), (ctx), (sourcePath), (assocClass), (resultClass), (role), \
   (resultRole), (rc)))
#define CBReferences(mb, ctx, sourcePath, resultClass, role, propertyList, rc) \
  ((mb)->bft->references((mb), (ctx), (sourcePath), (resultClass), (role), (propertyList), (rc)))
#define CBReferenceNames(mb, ctx, sourcePath, resultClass, role, rc) \
  ((mb)->bft->referenceNames((mb), (ctx), (sourcePath), (resultClass), (role), (rc)))
#define CBInvokeMethod(mb, ctx, objectPath, methodName, inArgs, outArgs, rc) \
  ((mb)->bft->invokeMethod((mb), (ctx), (objectPath), (methodName), (inArgs), (outArgs), (rc)))
#define CBSetProperty(mb, ctx, instPath, propertyName, value, valueType) \
  ((mb)->bft->setProperty((mb), (ctx), (instPath), (propertyName), (const CMPIValue*)(value), \
   (valueType)))
#define CBGetProperty(mb, ctx, instPath, propertyName, rc) \
  ((mb)->bft->getProperty((mb), (ctx), (instPath), (propertyName), (rc)))

/* CMPIBrokerEncFT (broker->eft) */
#define CMNewInstance(mb, classPath, rc) \
  ((mb)->eft->newInstance((mb), (classPath), (rc)))
#define CMNewObjectPath(mb, ns, className, rc) \
  ((mb)->eft->newObjectPath((mb), (ns), (className), (rc)))
#define CMNewArgs(mb, rc) \
  ((mb)->eft->newArgs((mb), (rc)))
#define CMNewString(mb, chars, rc) \
  ((mb)->eft->newString((mb), (chars), (rc)))
#define CMNewArray(mb, initialSize, elementType, rc) \
  ((mb)->eft->newArray((mb), (initialSize), (elementType), (rc)))
#define CMNewDateTime(mb, rc) \
  ((mb)->eft->newDateTime((mb), (rc)))
#define CMNewDateTimeFromBinary(mb, microseconds, isInterval, rc) \
  ((mb)->eft->newDateTimeFromBinary((mb), (microseconds), (isInterval), (rc)))
#define CMNewDateTimeFromChars(mb, cimDateTimeString, rc) \
  ((mb)->eft->newDateTimeFromChars((mb), (cimDateTimeString), (rc)))
#define CMNewSelectExp(mb, query, queryLanguage, projectionOut, rc) \
  ((mb)->eft->newSelectExp((mb), (query), (queryLanguage), (projectionOut), (rc)))
#define CMClassPathIsA(mb, classPath, className, rc) \
  ((mb)->eft->classPathIsA((mb), (classPath), (className), (rc)))
#define CDToString(mb, anyEncapsulatedObject, rc) \
  ((mb)->eft->toString((mb), (const void*)(anyEncapsulatedObject), (rc)))
#define CDIsOfType(mb, anyEncapsulatedObject, typeName, rc) \
  ((mb)->eft->isOfType((mb), (const void*)(anyEncapsulatedObject), (typeName), (rc)))
#define CDGetType(mb, anyEncapsulatedObject, rc) \
  ((mb)->eft->getType((mb), (const void*)(anyEncapsulatedObject), (rc)))
#define CMGetMessage(mb, messageId, defaultMessage, rc, parms) \
  ((mb)->eft->getMessage((mb), (messageId), (defaultMessage), (rc), parms))
#define CMLogMessage(mb, severity, messageId, text, textAsString) \
  ((mb)->eft->logMessage((mb), (severity), (messageId), (text), (textAsString)))
#define CMTraceMessage(mb, level, component, text, textAsString) \
  ((mb)->eft->trace((mb), (level), (component), (text), (textAsString)))
#define CMNewCMPIError(mb, owningEntity, messageId, message, severity, probableCause, \
    cimStatusCode, rc) \
  ((mb)->eft->newCMPIError((mb), (owningEntity), (messageId), (message), (severity), \
   (probableCause), (cimStatusCode), (rc)))
#define CMOpenMessageFile(mb, messageFileName, handleOut) \
  ((mb)->eft->openMessageFile((mb), (messageFileName), (handleOut)))
#define CMCloseMessageFile(mb, handle) \
  ((mb)->eft->closeMessageFile((mb), (handle)))
#define CMGetMessage2(mb, messageId, handle, defaultMessage, rc, parms) \
  ((mb)->eft->getMessage2((mb), (messageId), (handle), (defaultMessage), (rc), parms))

/* CMPIArgsFT (obj->ft) */
#define CMAddArg(args, argName, value, valueType) \
  ((args)->ft->addArg((args), (argName), (const CMPIValue*)(value), (valueType)))
#define CMGetArg(args, argName, rc) \
  ((args)->ft->getArg((args), (argName), (rc)))
#define CMGetArgAt(args, index, nameOut, rc) \
  ((args)->ft->getArgAt((args), (index), (nameOut), (rc)))
#define CMGetArgCount(args, rc) \
  ((args)->ft->getArgCount((args), (rc)))

/* CMPIArrayFT (obj->ft) */
#define CMGetArrayCount(ar, rc) \
  ((ar)->ft->getSize((ar), (rc)))
#define CMGetArrayType(ar, rc) \
  ((ar)->ft->getSimpleType((ar), (rc)))
#define CMGetArrayElementAt(ar, index, rc) \
  ((ar)->ft->getElementAt((ar), (index), (rc)))
#define CMSetArrayElementAt(ar, index, value, valueType) \
  ((ar)->ft->setElementAt((ar), (index), (const CMPIValue*)(value), (valueType)))

/* CMPIContextFT (obj->ft) */
#define CMGetContextEntry(ctx, entryName, rc) \
  ((ctx)->ft->getEntry((ctx), (entryName), (rc)))
#define CMGetContextEntryAt(ctx, index, nameOut, rc) \
  ((ctx)->ft->getEntryAt((ctx), (index), (nameOut), (rc)))
#define CMGetContextEntryCount(ctx, rc) \
  ((ctx)->ft->getEntryCount((ctx), (rc)))
#define CMAddContextEntry(ctx, entryName, value, valueType) \
  ((ctx)->ft->addEntry((ctx), (entryName), (const CMPIValue*)(value), (valueType)))

/* CMPIDateTimeFT (obj->ft) */
#define CMGetBinaryFormat(dt, rc) \
  ((dt)->ft->getBinaryFormat((dt), (rc)))
#define CMGetStringFormat(dt, rc) \
  ((dt)->ft->getStringFormat((dt), (rc)))
#define CMIsInterval(dt, rc) \
  ((dt)->ft->isInterval((dt), (rc)))

/* CMPIEnumerationFT (obj->ft) */
#define CMGetNext(en, rc) \
  ((en)->ft->getNext((en), (rc)))
#define CMHasNext(en, rc) \
  ((en)->ft->hasNext((en), (rc)))
#define CMToArray(en, rc) \
  ((en)->ft->toArray((en), (rc)))

/* CMPIErrorFT (obj->ft) */
#define CMGetErrorType(er, rc) \
  ((er)->ft->getErrorType((er), (rc)))
#define CMGetOtherErrorType(er, rc) \
  ((er)->ft->getOtherErrorType((er), (rc)))
#define CMGetOwningEntity(er, rc) \
  ((er)->ft->getOwningEntity((er), (rc)))
#define CMGetMessageID(er, rc) \
  ((er)->ft->getMessageID((er), (rc)))
#define CMGetErrorMessage(er, rc) \
  ((er)->ft->getMessage((er), (rc)))
#define CMGetPerceivedSeverity(er, rc) \
  ((er)->ft->getPerceivedSeverity((er), (rc)))
#define CMGetProbableCause(er, rc) \
  ((er)->ft->getProbableCause((er), (rc)))
#define CMGetProbableCauseDescription(er, rc) \
  ((er)->ft->getProbableCauseDescription((er), (rc)))
#define CMGetRecommendedActions(er, rc) \
  ((er)->ft->getRecommendedActions((er), (rc)))
#define CMGetErrorSource(er, rc) \
  ((er)->ft->getErrorSource((er), (rc)))
#define CMGetErrorSourceFormat(er, rc) \
  ((er)->ft->getErrorSourceFormat((er), (rc)))
#define CMGetOtherErrorSourceFormat(er, rc) \
  ((er)->ft->getOtherErrorSourceFormat((er), (rc)))
#define CMGetCIMStatusCode(er, rc) \
  ((er)->ft->getCIMStatusCode((er), (rc)))
#define CMGetCIMStatusCodeDescription(er, rc) \
  ((er)->ft->getCIMStatusCodeDescription((er), (rc)))
#define CMGetMessageArguments(er, rc) \
  ((er)->ft->getMessageArguments((er), (rc)))
#define CMSetErrorType(er, errorType) \
  ((er)->ft->setErrorType((er), (errorType)))
#define CMSetOtherErrorType(er, text) \
  ((er)->ft->setOtherErrorType((er), (text)))
#define CMSetProbableCauseDescription(er, text) \
  ((er)->ft->setProbableCauseDescription((er), (text)))
#define CMSetRecommendedActions(er, stringArray) \
  ((er)->ft->setRecommendedActions((er), (stringArray)))
#define CMSetErrorSource(er, text) \
  ((er)->ft->setErrorSource((er), (text)))
#define CMSetErrorSourceFormat(er, format) \
  ((er)->ft->setErrorSourceFormat((er), (format)))
#define CMSetOtherErrorSourceFormat(er, text) \
  ((er)->ft->setOtherErrorSourceFormat((er), (text)))
#define CMSetCIMStatusCodeDescription(er, text) \
  ((er)->ft->setCIMStatusCodeDescription((er), (text)))
#define CMSetMessageArguments(er, stringArray) \
  ((er)->ft->setMessageArguments((er), (stringArray)))

/* CMPIInstanceFT (obj->ft) */
#define CMGetProperty(inst, propertyName, rc) \
  ((inst)->ft->getProperty((inst), (propertyName), (rc)))
#define CMGetPropertyAt(inst, index, nameOut, rc) \
  ((inst)->ft->getPropertyAt((inst), (index), (nameOut), (rc)))
#define CMGetPropertyCount(inst, rc) \
  ((inst)->ft->getPropertyCount((inst), (rc)))
#define CMSetProperty(inst, propertyName, value, valueType) \
  ((inst)->ft->setProperty((inst), (propertyName), (const CMPIValue*)(value), (valueType)))
#define CMGetObjectPath(inst, rc) \
  ((inst)->ft->getObjectPath((inst), (rc)))
#define CMSetPropertyFilter(inst, propertyList, keyList) \
  ((inst)->ft->setPropertyFilter((inst), (propertyList), (keyList)))
#define CMSetObjectPath(inst, objectPath) \
  ((inst)->ft->setObjectPath((inst), (objectPath)))
#define CMSetPropertyWithOrigin(inst, propertyName, value, valueType, originClassName) \
  ((inst)->ft->setPropertyWithOrigin((inst), (propertyName), (const CMPIValue*)(value), \
   (valueType), (originClassName)))

/* CMPIObjectPathFT (obj->ft) */
#define CMSetNameSpace(op, ns) \
  ((op)->ft->setNameSpace((op), (ns)))
#define CMGetNameSpace(op, rc) \
  ((op)->ft->getNameSpace((op), (rc)))
#define CMSetHostname(op, hostname) \
  ((op)->ft->setHostname((op), (hostname)))
#define CMGetHostname(op, rc) \
  ((op)->ft->getHostname((op), (rc)))
#define CMSetClassName(op, className) \
  ((op)->ft->setClassName((op), (className)))
#define CMGetClassName(op, rc) \
  ((op)->ft->getClassName((op), (rc)))
#define CMAddKey(op, keyName, value, valueType) \
  ((op)->ft->addKey((op), (keyName), (const CMPIValue*)(value), (valueType)))
#define CMGetKey(op, keyName, rc) \
  ((op)->ft->getKey((op), (keyName), (rc)))
#define CMGetKeyAt(op, index, nameOut, rc) \
  ((op)->ft->getKeyAt((op), (index), (nameOut), (rc)))
#define CMGetKeyCount(op, rc) \
  ((op)->ft->getKeyCount((op), (rc)))
#define CMSetNameSpaceFromObjectPath(op, source) \
  ((op)->ft->setNameSpaceFromObjectPath((op), (source)))
#define CMSetHostAndNameSpaceFromObjectPath(op, source) \
  ((op)->ft->setHostAndNameSpaceFromObjectPath((op), (source)))
#define CMGetClassQualifier(op, qualifierName, rc) \
  ((op)->ft->getClassQualifier((op), (qualifierName), (rc)))
#define CMGetPropertyQualifier(op, propertyName, qualifierName, rc) \
  ((op)->ft->getPropertyQualifier((op), (propertyName), (qualifierName), (rc)))
#define CMGetMethodQualifier(op, methodName, qualifierName, rc) \
  ((op)->ft->getMethodQualifier((op), (methodName), (qualifierName), (rc)))
#define CMGetParameterQualifier(op, methodName, parameterName, qualifierName, rc) \
  ((op)->ft->getParameterQualifier((op), (methodName), (parameterName), (qualifierName), (rc)))
#define CMObjectPathToString(op, rc) \
  ((op)->ft->toString((op), (rc)))

/* CMPIPredicateFT (obj->ft) */
#define CMGetPredicateData(pr, typeOut, operatorOut, leftSideOut, rightSideOut) \
  ((pr)->ft->getData((pr), (typeOut), (operatorOut), (leftSideOut), (rightSideOut)))
#define CMEvaluatePredicateUsingAccessor(pr, accessorFunction, accessorArg, rc) \
  ((pr)->ft->evaluateUsingAccessor((pr), (accessorFunction), (accessorArg), (rc)))

/* CMPIResultFT (obj->ft) */
#define CMReturnData(rslt, value, valueType) \
  ((rslt)->ft->returnData((rslt), (const CMPIValue*)(value), (valueType)))
#define CMReturnInstance(rslt, instance) \
  ((rslt)->ft->returnInstance((rslt), (instance)))
#define CMReturnObjectPath(rslt, objectPath) \
  ((rslt)->ft->returnObjectPath((rslt), (objectPath)))
#define CMReturnDone(rslt) \
  ((rslt)->ft->returnDone((rslt)))
#define CMReturnError(rslt, error) \
  ((rslt)->ft->returnError((rslt), (error)))

/* CMPISelectCondFT (obj->ft) */
#define CMGetSubCondCountAndType(sc, typeOut, rc) \
  ((sc)->ft->getCountAndType((sc), (typeOut), (rc)))
#define CMGetSubCondAt(sc, index, rc) \
  ((sc)->ft->getSubCondAt((sc), (index), (rc)))

/* CMPISelectExpFT (obj->ft) */
#define CMEvaluateSelExp(se, instance, rc) \
  ((se)->ft->evaluate((se), (instance), (rc)))
#define CMGetSelExpString(se, rc) \
  ((se)->ft->getString((se), (rc)))
#define CMGetDoc(se, rc) \
  ((se)->ft->getDOC((se), (rc)))
#define CMGetCod(se, rc) \
  ((se)->ft->getCOD((se), (rc)))
#define CMEvaluateSelExpUsingAccessor(se, accessorFunction, accessorArg, rc) \
  ((se)->ft->evaluateUsingAccessor((se), (accessorFunction), (accessorArg), (rc)))

/* CMPIStringFT (obj->ft) */
#define CMGetCharsPtr(str, rc) CMPIMacGetCharPtr_((str), (rc))

/* CMPISubCondFT (obj->ft) */
#define CMGetPredicateCount(sc, rc) \
  ((sc)->ft->getCount((sc), (rc)))
#define CMGetPredicateAt(sc, index, rc) \
  ((sc)->ft->getPredicateAt((sc), (index), (rc)))
#define CMGetPredicate(sc, name, rc) \
  ((sc)->ft->getPredicate((sc), (name), (rc)))

/* ---- message substitution arguments for CMGetMessage/CMGetMessage2 -------- */
/* Each item is a (type code, value) pair; CMFmtArgsN prefixes the count.     */

#define CMFmtSint(v)    CMPI_sint32, ((long)(v))
#define CMFmtUint(v)    CMPI_uint32, ((unsigned long)(v))
#define CMFmtSint64(v)  CMPI_sint64, ((long long)(v))
#define CMFmtUint64(v)  CMPI_uint64, ((unsigned long long)(v))
#define CMFmtReal(v)    CMPI_real64, ((double)(v))
#define CMFmtBoolean(v) CMPI_boolean, ((int)(v))
#define CMFmtChars(v)   CMPI_chars, ((char*)(v))
#define CMFmtString(v)  CMPI_string, ((CMPIString*)(v))

#define CMFmtArgs0() 0
#define CMFmtArgs1(v1) 1, v1
#define CMFmtArgs2(v1, v2) 2, v1, v2
#define CMFmtArgs3(v1, v2, v3) 3, v1, v2, v3
#define CMFmtArgs4(v1, v2, v3, v4) 4, v1, v2, v3, v4
#define CMFmtArgs5(v1, v2, v3, v4, v5) 5, v1, v2, v3, v4, v5
#define CMFmtArgs6(v1, v2, v3, v4, v5, v6) 6, v1, v2, v3, v4, v5, v6
#define CMFmtArgs7(v1, v2, v3, v4, v5, v6, v7) 7, v1, v2, v3, v4, v5, v6, v7
#define CMFmtArgs8(v1, v2, v3, v4, v5, v6, v7, v8) 8, v1, v2, v3, v4, v5, v6, v7, v8
#define CMFmtArgs9(v1, v2, v3, v4, v5, v6, v7, v8, v9) 9, v1, v2, v3, v4, v5, v6, v7, v8, v9
#define CMFmtArgs10(v1, v2, v3, v4, v5, v6, v7, v8, v9, v10) \
  10, v1, v2, v3, v4, v5, v6, v7, v8, v9, v10

/* ---- MI stubs ------------------------------------------------------------- */
/*
 * CM<Type>MIStub(pfx, pn, broker, hook) defines, at file scope, the static
 * function table of the MI (functions named pfx##<Operation>) and the exported
 * factory pn_Create_<Type>MI.  The factory stores its broker argument into the
 * provider variable `broker` (a const CMPIBroker*), then runs `hook` (a
 * statement; CMNoHook for none), which may use the factory parameters brkr,
 * ctx and rc.  It never writes *rc: the broker has set it to OK already.
 * Each stub may be used once per translation unit.
 */
#define CMNoHook

#define CMInstanceMIStub(pfx, pn, broker, hook)                                           \
  static CMPIInstanceMIFT cmpiInstanceMIFT_ = {                                           \
      CMPICurrentVersion,       CMPICurrentVersion,     "instance" #pn,                   \
      pfx##Cleanup,             pfx##EnumInstanceNames, pfx##EnumInstances,               \
      pfx##GetInstance,         pfx##CreateInstance,    pfx##ModifyInstance,              \
      pfx##DeleteInstance,      pfx##ExecQuery};                                          \
  CMPI_EXTERN_C CMPIInstanceMI* pn##_Create_InstanceMI(const CMPIBroker* brkr,            \
                                                       const CMPIContext* ctx,            \
                                                       CMPIStatus* rc) {                  \
    static CMPIInstanceMI cmpiMI_ = {NULL, &cmpiInstanceMIFT_};                           \
    (void)ctx;                                                                            \
    (void)rc;                                                                             \
    broker = brkr;                                                                        \
    hook;                                                                                 \
    return &cmpiMI_;                                                                      \
  }

#define CMAssociationMIStub(pfx, pn, broker, hook)                                        \
  static CMPIAssociationMIFT cmpiAssociationMIFT_ = {                                     \
      CMPICurrentVersion,      CMPICurrentVersion, "association" #pn,                     \
      pfx##AssociationCleanup, pfx##Associators,   pfx##AssociatorNames,                  \
      pfx##References,         pfx##ReferenceNames};                                      \
  CMPI_EXTERN_C CMPIAssociationMI* pn##_Create_AssociationMI(const CMPIBroker* brkr,      \
                                                             const CMPIContext* ctx,      \
                                                             CMPIStatus* rc) {            \
    static CMPIAssociationMI cmpiMI_ = {NULL, &cmpiAssociationMIFT_};                     \
    (void)ctx;                                                                            \
    (void)rc;                                                                             \
    broker = brkr;                                                                        \
    hook;                                                                                 \
    return &cmpiMI_;                                                                      \
  }

#define CMMethodMIStub(pfx, pn, broker, hook)                                             \
  static CMPIMethodMIFT cmpiMethodMIFT_ = {CMPICurrentVersion, CMPICurrentVersion,        \
                                           "method" #pn, pfx##MethodCleanup,              \
                                           pfx##InvokeMethod};                            \
  CMPI_EXTERN_C CMPIMethodMI* pn##_Create_MethodMI(const CMPIBroker* brkr,                \
                                                   const CMPIContext* ctx,                \
                                                   CMPIStatus* rc) {                      \
    static CMPIMethodMI cmpiMI_ = {NULL, &cmpiMethodMIFT_};                               \
    (void)ctx;                                                                            \
    (void)rc;                                                                             \
    broker = brkr;                                                                        \
    hook;                                                                                 \
    return &cmpiMI_;                                                                      \
  }

/* setPropertyWithOrigin stays NULL: brokers fall back to setProperty. */
#define CMPropertyMIStub(pfx, pn, broker, hook)                                           \
  static CMPIPropertyMIFT cmpiPropertyMIFT_ = {                                           \
      CMPICurrentVersion, CMPICurrentVersion, "property" #pn, pfx##PropertyCleanup,       \
      pfx##SetProperty,   pfx##GetProperty,   NULL};                                      \
  CMPI_EXTERN_C CMPIPropertyMI* pn##_Create_PropertyMI(const CMPIBroker* brkr,            \
                                                       const CMPIContext* ctx,            \
                                                       CMPIStatus* rc) {                  \
    static CMPIPropertyMI cmpiMI_ = {NULL, &cmpiPropertyMIFT_};                           \
    (void)ctx;                                                                            \
    (void)rc;                                                                             \
    broker = brkr;                                                                        \
    hook;                                                                                 \
    return &cmpiMI_;                                                                      \
  }

/* enable/disableIndications are always filled: brokers call them blindly. */
#define CMIndicationMIStub(pfx, pn, broker, hook)                                         \
  static CMPIIndicationMIFT cmpiIndicationMIFT_ = {                                       \
      CMPICurrentVersion,       CMPICurrentVersion,    "Indication" #pn,                  \
      pfx##IndicationCleanup,   pfx##AuthorizeFilter,  pfx##MustPoll,                     \
      pfx##ActivateFilter,      pfx##DeActivateFilter, pfx##EnableIndications,            \
      pfx##DisableIndications};                                                           \
  CMPI_EXTERN_C CMPIIndicationMI* pn##_Create_IndicationMI(const CMPIBroker* brkr,        \
                                                           const CMPIContext* ctx,        \
                                                           CMPIStatus* rc) {              \
    static CMPIIndicationMI cmpiMI_ = {NULL, &cmpiIndicationMIFT_};                       \
    (void)ctx;                                                                            \
    (void)rc;                                                                             \
    broker = brkr;                                                                        \
    hook;                                                                                 \
    return &cmpiMI_;                                                                      \
  }

#ifdef __cplusplus
}
#endif

#endif /* _CMPIMACS_H_ */
