/* CMPI, the Common Manageability Programming Interface (The Open Group), version 2.0: short forms for calling the
 * function tables, and for making a provider.
 *
 * CM...: objects; CB...: up-calls to the broker; CD...: about any object. They take no step of their own beyond the
 * call: cmpift.h describes what the slot does, its errors and the owner of the result. As macros they use their first
 * argument twice. With CMPI_INLINE defined before the include, those that call a slot are inline functions of the same
 * names instead. */

#ifndef _CMPIMACS_H_
#define _CMPIMACS_H_

#include "cmpidt.h"
#include "cmpift.h"

/* ---- What the macros below share; not for use elsewhere. ---- */

#ifdef __cplusplus
#define CMPI_CAST_(type, v) (static_cast<type>(v))
#else
#define CMPI_CAST_(type, v) ((type)(v))
#endif

/* Any object pointer as the const CMPIValue* that the tables take. A value is handed over as a pointer to the variable
 * that holds it (CMPI_uint32: &number; CMPI_ref: &path), except CMPI_chars, where it is the text itself. */
static inline const CMPIValue* cmpi_value_of_(const void* v) { return CMPI_CAST_(const CMPIValue*, v); }

static inline CMPIStatus cmpi_status_(CMPIrc rc, CMPIString* msg) {
  CMPIStatus status;
  status.rc = rc;
  status.msg = msg;
  return status;
}

/* ---- Status ---- */

/* Ends the calling function, which returns a CMPIStatus, with the code rc and no message. */
#define CMReturn(rc) return cmpi_status_((rc), NULL)

/* Ends the calling function with the code rc and the message str, a CMPIString*. */
#define CMReturnWithString(rc, str) return cmpi_status_((rc), (str))

/* Ends the calling function with the code rc and a message that the broker b makes of the C string chars. */
#define CMReturnWithChars(b, rc, chars) return cmpi_status_((rc), (b)->eft->newString((b), (chars), NULL))

/* Sets *st to the code rcp without a message; does nothing where st is null. */
static inline void CMSetStatus(CMPIStatus* st, CMPIrc rcp) {
  if (st) *st = cmpi_status_(rcp, NULL);
}

/* Sets *st to the code rcp and the message string, which keeps its owner; does nothing where st is
 * null. */
static inline void CMSetStatusWithString(CMPIStatus* st, CMPIrc rcp, const CMPIString* string) {
  if (!st) return;
  st->rc = rcp;
#ifdef __cplusplus
  st->msg = const_cast<CMPIString*>(string);
#else
  st->msg = (CMPIString*)string;
#endif
}

/* Sets *st to the code rcp and a message that the broker mb makes of the C string chars. Does nothing where st is null;
 * without a broker the message is left out. */
static inline void CMSetStatusWithChars(const CMPIBroker* mb, CMPIStatus* st, CMPIrc rcp, const char* chars) {
  if (!st) return;
  st->rc = rcp;
  st->msg = mb ? mb->eft->newString(mb, chars, NULL) : NULL;
}

/* ---- Tests ---- */

/* Whether the CMPI object o is a null pointer or one whose handle, its first word, is null. */
static inline CMPIBoolean CMIsNullObject(const void* o) {
  return CMPI_CAST_(CMPIBoolean, !o || !*CMPI_CAST_(void* const*, o));
}

/* Whether the CMPIData v holds no value. */
#define CMIsNullValue(v) CMPI_CAST_(CMPIBoolean, ((v).state & CMPI_nullValue) != 0)

/* Whether the CMPIData v is a key of the object that it came from. */
#define CMIsKeyValue(v) CMPI_CAST_(CMPIBoolean, ((v).state & CMPI_keyValue) != 0)

/* Whether the CMPIData v holds an array. */
#define CMIsArray(v) CMPI_CAST_(CMPIBoolean, ((v).type & CMPI_ARRAY) != 0)

/* ---- Any object with a function table ---- */

/* A copy of the object o that lives until it is given to CMRelease; null on failure, with the reason in *rc. */
#define CMClone(o, rc) ((o)->ft->clone((o), (rc)))

/* Ends a copy that CMClone made. Objects that the broker handed out for the length of a call need no release. */
#define CMRelease(o) ((o)->ft->release((o)))

/* The text of the CMPIString s, read from its handle without asking its table. True only of brokers whose string handle
 * is the text itself; CMGetCharsPtr works with all. */
#define CMGetCharPtr(s) CMPI_CAST_(char*, (s)->hdl)

/* ---- Messages with inserts ----
 *
 * CMGetMessage(b, "id", "default {0}", &rc, CMFmtArgs1(CMFmtSint(42)))
 *
 * Each CMFmt... is a pair of a CMPI type and a value, widened as a variable argument list needs it. */
#define CMFmtSint(v) CMPI_sint32, CMPI_CAST_(long int, v)
#define CMFmtUint(v) CMPI_uint32, CMPI_CAST_(unsigned long int, v)
#define CMFmtSint64(v) CMPI_sint64, CMPI_CAST_(long long int, v)
#define CMFmtUint64(v) CMPI_uint64, CMPI_CAST_(unsigned long long int, v)
#define CMFmtReal(v) CMPI_real64, CMPI_CAST_(double, v)
#define CMFmtBoolean(v) CMPI_boolean, CMPI_CAST_(int, v)
#define CMFmtChars(v) CMPI_chars, CMPI_CAST_(const char*, v)
#define CMFmtString(v) CMPI_string, CMPI_CAST_(const CMPIString*, v)

/* The count of the inserts and the inserts, each a CMFmt... pair. */
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
#define CMFmtArgs10(v1, v2, v3, v4, v5, v6, v7, v8, v9, v10) 10, v1, v2, v3, v4, v5, v6, v7, v8, v9, v10

/* The text of the message id in the caller's language, def where there is none, with parms (a CMFmtArgs...) put in. */
#define CMGetMessage(b, id, def, rc, parms) ((b)->eft->getMessage((b), (id), (def), (rc), parms))

#ifdef CMPI_VER_200
/* As CMGetMessage, from the message file mfh that CMOpenMessageFile opened. */
#define CMGetMessage2(b, id, mfh, def, rc, parms) ((b)->eft->getMessage2((b), (id), (mfh), (def), (rc), parms))
#endif

#ifndef CMPI_INLINE

/* ---- Making objects: CMPIBrokerEncFT ---- */

/* New instance of the class of the path c, which gives it its keys. */
#define CMNewInstance(b, c, rc) ((b)->eft->newInstance((b), (c), (rc)))

/* New path of namespace n and class c. */
#define CMNewObjectPath(b, n, c, rc) ((b)->eft->newObjectPath((b), (n), (c), (rc)))

/* New string with a copy of the C string s. */
#define CMNewString(b, s, rc) ((b)->eft->newString((b), (s), (rc)))

/* New, empty list of arguments. */
#define CMNewArgs(b, rc) ((b)->eft->newArgs((b), (rc)))

/* New array of c elements of the type t. */
#define CMNewArray(b, c, t, rc) ((b)->eft->newArray((b), (c), (t), (rc)))

/* The present moment. */
#define CMNewDateTime(b, rc) ((b)->eft->newDateTime((b), (rc)))

/* d microseconds as a point in time, or with i as an interval. */
#define CMNewDateTimeFromBinary(b, d, i, rc) ((b)->eft->newDateTimeFromBinary((b), (d), (i), (rc)))

/* The date and time that the 25 characters d mean. */
#define CMNewDateTimeFromChars(b, d, rc) ((b)->eft->newDateTimeFromChars((b), (d), (rc)))

/* The query q in the language l, compiled; the selected properties go to *p. */
#define CMNewSelectExp(b, q, l, p, rc) ((b)->eft->newSelectExp((b), (q), (l), (p), (rc)))

/* ---- About objects: CMPIBrokerEncFT ---- */

/* Whether the class of the path p is pn or a subclass of it. */
#define CMClassPathIsA(b, p, pn, rc) ((b)->eft->classPathIsA((b), (p), (pn), (rc)))

/* Any object as text. */
#define CDToString(b, o, rc) ((b)->eft->toString((b), (o), (rc)))

/* Whether the object o is of the C type named t. */
#define CDIsOfType(b, o, t, rc) ((b)->eft->isOfType((b), (o), (t), (rc)))

/* The name of the C type of the object o. */
#define CDGetType(b, o, rc) ((b)->eft->getType((b), (o), (rc)))

/* ---- Log, errors, message files: CMPIBrokerEncFT ---- */

/* Writes text or string to the broker's log. */
#define CMLogMessage(b, severity, id, text, string) ((b)->eft->logMessage((b), (severity), (id), (text), (string)))

/* Writes text or string to the broker's trace. */
#define CMTraceMessage(b, level, component, text, string) ((b)->eft->trace((b), (level), (component), (text), (string)))

#ifdef CMPI_VER_200
/* New error object. */
#define CMNewCMPIError(b, owner, msgID, msg, sev, pc, cimStatusCode, rc) \
  ((b)->eft->newCMPIError((b), (owner), (msgID), (msg), (sev), (pc), (cimStatusCode), (rc)))

/* Opens the message file mf and sets *mfh. */
#define CMOpenMessageFile(b, mf, mfh) ((b)->eft->openMessageFile((b), (mf), (mfh)))

/* Closes the message file mfh. */
#define CMCloseMessageFile(b, mfh) ((b)->eft->closeMessageFile((b), (mfh)))
#endif /* CMPI_VER_200 */

/* ---- CMPIInstanceFT ---- */

/* Property n of the instance i. */
#define CMGetProperty(i, n, rc) ((i)->ft->getProperty((i), (n), (rc)))

/* Property at position num of the instance i; its name goes to *s. */
#define CMGetPropertyAt(i, num, s, rc) ((i)->ft->getPropertyAt((i), (num), (s), (rc)))

/* Sets property n of the instance i to the value that v points to, of type t. */
#define CMSetProperty(i, n, v, t) ((i)->ft->setProperty((i), (n), cmpi_value_of_(v), (t)))

/* Number of properties of the instance i. */
#define CMGetPropertyCount(i, rc) ((i)->ft->getPropertyCount((i), (rc)))

/* Path of the instance i. */
#define CMGetObjectPath(i, rc) ((i)->ft->getObjectPath((i), (rc)))

/* Gives the instance i the path obj. */
#define CMSetObjectPath(i, obj) ((i)->ft->setObjectPath((i), (obj)))

/* Lets the instance i take only the properties in pl and the keys in k. */
#define CMSetPropertyFilter(i, pl, k) ((i)->ft->setPropertyFilter((i), (pl), (k)))

#ifdef CMPI_VER_200
/* As CMSetProperty, with o as the class that defined the property. */
#define CMSetPropertyWithOrigin(i, n, v, t, o) ((i)->ft->setPropertyWithOrigin((i), (n), cmpi_value_of_(v), (t), (o)))
#endif /* CMPI_VER_200 */

/* ---- CMPIObjectPathFT ---- */

/* Sets the host of the path p. */
#define CMSetHostname(p, n) ((p)->ft->setHostname((p), (n)))

/* Host of the path p. */
#define CMGetHostname(p, rc) ((p)->ft->getHostname((p), (rc)))

/* Sets the namespace of the path p. */
#define CMSetNameSpace(p, n) ((p)->ft->setNameSpace((p), (n)))

/* Namespace of the path p. */
#define CMGetNameSpace(p, rc) ((p)->ft->getNameSpace((p), (rc)))

/* Sets the class of the path p. */
#define CMSetClassName(p, n) ((p)->ft->setClassName((p), (n)))

/* Class of the path p. */
#define CMGetClassName(p, rc) ((p)->ft->getClassName((p), (rc)))

/* Adds the key n to the path p with the value that v points to, of type t. */
#define CMAddKey(p, n, v, t) ((p)->ft->addKey((p), (n), cmpi_value_of_(v), (t)))

/* Key n of the path p. */
#define CMGetKey(p, n, rc) ((p)->ft->getKey((p), (n), (rc)))

/* Key at position i of the path p; its name goes to *n. */
#define CMGetKeyAt(p, i, n, rc) ((p)->ft->getKeyAt((p), (i), (n), (rc)))

/* Number of keys of the path p. */
#define CMGetKeyCount(p, rc) ((p)->ft->getKeyCount((p), (rc)))

/* Gives the path p the namespace of the path s. */
#define CMSetNameSpaceFromObjectPath(p, s) ((p)->ft->setNameSpaceFromObjectPath((p), (s)))

/* Gives the path p the host and the namespace of the path s. */
#define CMSetHostAndNameSpaceFromObjectPath(p, s) ((p)->ft->setHostAndNameSpaceFromObjectPath((p), (s)))

/* Qualifier qName of the class. */
#define CMGetClassQualifier(op, qName, rc) ((op)->ft->getClassQualifier((op), (qName), (rc)))

/* Qualifier qName of a property. */
#define CMGetPropertyQualifier(op, pName, qName, rc) ((op)->ft->getPropertyQualifier((op), (pName), (qName), (rc)))

/* Qualifier qName of a method. */
#define CMGetMethodQualifier(op, methodName, qName, rc) \
  ((op)->ft->getMethodQualifier((op), (methodName), (qName), (rc)))

/* Qualifier qName of the parameter pName of the method mName. */
#define CMGetParameterQualifier(op, mName, pName, qName, rc) \
  ((op)->ft->getParameterQualifier((op), (mName), (pName), (qName), (rc)))

/* The path p as text. */
#define CMObjectPathToString(p, rc) ((p)->ft->toString((p), (rc)))

/* ---- CMPIArrayFT ---- */

/* Number of elements of the array a. */
#define CMGetArrayCount(a, rc) ((a)->ft->getSize((a), (rc)))

/* Type of an element of the array a. */
#define CMGetArrayType(a, rc) ((a)->ft->getSimpleType((a), (rc)))

/* Element at position n of the array a. */
#define CMGetArrayElementAt(a, n, rc) ((a)->ft->getElementAt((a), (n), (rc)))

/* Sets the element at position n of the array a to the value that v points to, of type t. */
#define CMSetArrayElementAt(a, n, v, t) ((a)->ft->setElementAt((a), (n), cmpi_value_of_(v), (t)))

/* ---- CMPIArgsFT ---- */

/* Adds the argument n with the value that v points to, of type t. */
#define CMAddArg(a, n, v, t) ((a)->ft->addArg((a), (n), cmpi_value_of_(v), (t)))

/* Argument n. */
#define CMGetArg(a, n, rc) ((a)->ft->getArg((a), (n), (rc)))

/* Argument at position p; its name goes to *n. */
#define CMGetArgAt(a, p, n, rc) ((a)->ft->getArgAt((a), (p), (n), (rc)))

/* Number of arguments. */
#define CMGetArgCount(a, rc) ((a)->ft->getArgCount((a), (rc)))

/* ---- CMPIStringFT ---- */

/* The text of the string st. */
#define CMGetCharsPtr(st, rc) ((st)->ft->getCharPtr((st), (rc)))

/* ---- CMPIDateTimeFT ---- */

/* The date and time d as 25 characters. */
#define CMGetStringFormat(d, rc) ((d)->ft->getStringFormat((d), (rc)))

/* The date and time d as microseconds. */
#define CMGetBinaryFormat(d, rc) ((d)->ft->getBinaryFormat((d), (rc)))

/* Whether d is an interval. */
#define CMIsInterval(d, rc) ((d)->ft->isInterval((d), (rc)))

/* ---- CMPIErrorFT ---- */

#ifdef CMPI_VER_200
/* Kind of error. */
#define CMGetErrorType(e, rc) ((e)->ft->getErrorType((e), (rc)))

/* Kind of error in words. */
#define CMGetOtherErrorType(e, rc) ((e)->ft->getOtherErrorType((e), (rc)))

/* Who defined the message. */
#define CMGetOwningEntity(e, rc) ((e)->ft->getOwningEntity((e), (rc)))

/* Id of the message. */
#define CMGetMessageID(e, rc) ((e)->ft->getMessageID((e), (rc)))

/* Text of the message: the slot getMessage. */
#define CMGetErrorMessage(e, rc) ((e)->ft->getMessage((e), (rc)))

/* How severe the error is. */
#define CMGetPerceivedSeverity(e, rc) ((e)->ft->getPerceivedSeverity((e), (rc)))

/* Cause of the error. */
#define CMGetProbableCause(e, rc) ((e)->ft->getProbableCause((e), (rc)))

/* Cause of the error in words. */
#define CMGetProbableCauseDescription(e, rc) ((e)->ft->getProbableCauseDescription((e), (rc)))

/* What can be done about it. */
#define CMGetRecommendedActions(e, rc) ((e)->ft->getRecommendedActions((e), (rc)))

/* Where the error arose. */
#define CMGetErrorSource(e, rc) ((e)->ft->getErrorSource((e), (rc)))

/* Form of the source's text. */
#define CMGetErrorSourceFormat(e, rc) ((e)->ft->getErrorSourceFormat((e), (rc)))

/* Form of the source's text in words. */
#define CMGetOtherErrorSourceFormat(e, rc) ((e)->ft->getOtherErrorSourceFormat((e), (rc)))

/* Status code of the error. */
#define CMGetCIMStatusCode(e, rc) ((e)->ft->getCIMStatusCode((e), (rc)))

/* That status code in words. */
#define CMGetCIMStatusCodeDescription(e, rc) ((e)->ft->getCIMStatusCodeDescription((e), (rc)))

/* Values that were put into the message. */
#define CMGetMessageArguments(e, rc) ((e)->ft->getMessageArguments((e), (rc)))

/* Sets the kind of error. */
#define CMSetErrorType(e, et) ((e)->ft->setErrorType((e), (et)))

/* Sets the kind of error in words. */
#define CMSetOtherErrorType(e, oet) ((e)->ft->setOtherErrorType((e), (oet)))

/* Sets the cause in words. */
#define CMSetProbableCauseDescription(e, pcd) ((e)->ft->setProbableCauseDescription((e), (pcd)))

/* Sets what can be done about it. */
#define CMSetRecommendedActions(e, ra) ((e)->ft->setRecommendedActions((e), (ra)))

/* Sets where the error arose. */
#define CMSetErrorSource(e, es) ((e)->ft->setErrorSource((e), (es)))

/* Sets the form of the source's text. */
#define CMSetErrorSourceFormat(e, esf) ((e)->ft->setErrorSourceFormat((e), (esf)))

/* Sets the form of the source's text in words. */
#define CMSetOtherErrorSourceFormat(e, oesf) ((e)->ft->setOtherErrorSourceFormat((e), (oesf)))

/* Sets the status code in words. */
#define CMSetCIMStatusCodeDescription(e, cd) ((e)->ft->setCIMStatusCodeDescription((e), (cd)))

/* Sets the values that were put into the message. */
#define CMSetMessageArguments(e, ma) ((e)->ft->setMessageArguments((e), (ma)))
#endif /* CMPI_VER_200 */

/* ---- CMPIEnumerationFT ---- */

/* Next element of the enumeration n. */
#define CMGetNext(n, rc) ((n)->ft->getNext((n), (rc)))

/* Whether the enumeration n has another element. */
#define CMHasNext(n, rc) ((n)->ft->hasNext((n), (rc)))

/* All elements of the enumeration n. */
#define CMToArray(n, rc) ((n)->ft->toArray((n), (rc)))

/* ---- CMPIResultFT ---- */

/* Hands out the value that v points to, of type t. Unlike CMReturn, this does not end the calling function. */
#define CMReturnData(r, v, t) ((r)->ft->returnData((r), cmpi_value_of_(v), (t)))

/* Hands out the instance i. */
#define CMReturnInstance(r, i) ((r)->ft->returnInstance((r), (i)))

/* Hands out the path o. */
#define CMReturnObjectPath(r, o) ((r)->ft->returnObjectPath((r), (o)))

/* Says that all results were handed out. */
#define CMReturnDone(r) ((r)->ft->returnDone((r)))

#ifdef CMPI_VER_200
/* Adds the error e to the answer. */
#define CMReturnError(r, e) ((r)->ft->returnError((r), (e)))
#endif /* CMPI_VER_200 */

/* ---- CMPIContextFT ---- */

/* Entry n of the context c. */
#define CMGetContextEntry(c, n, rc) ((c)->ft->getEntry((c), (n), (rc)))

/* Entry at position p of the context c; its name goes to *n. */
#define CMGetContextEntryAt(c, p, n, rc) ((c)->ft->getEntryAt((c), (p), (n), (rc)))

/* Number of entries of the context c. */
#define CMGetContextEntryCount(c, rc) ((c)->ft->getEntryCount((c), (rc)))

/* Sets the entry n of the context c to the value that v points to, of type t. */
#define CMAddContextEntry(c, n, v, t) ((c)->ft->addEntry((c), (n), cmpi_value_of_(v), (t)))

/* ---- CMPISelectExpFT ---- */

/* Text of the query s. */
#define CMGetSelExpString(s, rc) ((s)->ft->getString((s), (rc)))

/* Whether the instance i matches the query s; the status goes to *r. */
#define CMEvaluateSelExp(s, i, r) ((s)->ft->evaluate((s), (i), (r)))

/* As CMEvaluateSelExp, with values from the accessor i(name, p). */
#define CMEvaluateSelExpUsingAccessor(s, i, p, r) ((s)->ft->evaluateUsingAccessor((s), (i), (p), (r)))

/* WHERE clause as a disjunction of conjunctions. */
#define CMGetDoc(s, rc) ((s)->ft->getDOC((s), (rc)))

/* WHERE clause as a conjunction of disjunctions. */
#define CMGetCod(s, rc) ((s)->ft->getCOD((s), (rc)))

/* ---- CMPISelectCondFT ---- */

/* Number of sub-conditions; the normal form goes to *t. */
#define CMGetSubCondCountAndType(c, t, rc) ((c)->ft->getCountAndType((c), (t), (rc)))

/* Sub-condition at position p. */
#define CMGetSubCondAt(c, p, rc) ((c)->ft->getSubCondAt((c), (p), (rc)))

/* ---- CMPISubCondFT ---- */

/* Number of predicates. */
#define CMGetPredicateCount(s, rc) ((s)->ft->getCount((s), (rc)))

/* Predicate at position p. */
#define CMGetPredicateAt(s, p, rc) ((s)->ft->getPredicateAt((s), (p), (rc)))

/* Predicate about the property n. */
#define CMGetPredicate(s, n, rc) ((s)->ft->getPredicate((s), (n), (rc)))

/* ---- CMPIPredicateFT ---- */

/* Parts of the predicate p: type *t, operator *o, left-hand side *n, right-hand side *v. */
#define CMGetPredicateData(p, t, o, n, v) ((p)->ft->getData((p), (t), (o), (n), (v)))

/* Whether the predicate p holds for the values of the accessor a(name, parm). */
#define CMEvaluatePredicateUsingAccessor(p, a, parm, rc) ((p)->ft->evaluateUsingAccessor((p), (a), (parm), (rc)))

/* ---- The broker: CMPIBrokerFT ---- */

/* What the broker can do: CMPI_MB_... bits. */
#define CBGetClassification(b) ((b)->bft->brokerCapabilities)

/* Version of CMPI that the broker follows. */
#define CBBrokerVersion(b) ((b)->bft->brokerVersion)

/* Name of the broker. */
#define CBBrokerName(b) ((b)->bft->brokerName)

/* Context for a new thread, made in the thread that owns c. */
#define CBPrepareAttachThread(b, c) ((b)->bft->prepareAttachThread((b), (c)))

/* Attaches the calling thread, with the context from CBPrepareAttachThread. */
#define CBAttachThread(b, c) ((b)->bft->attachThread((b), (c)))

/* Detaches the calling thread. */
#define CBDetachThread(b, c) ((b)->bft->detachThread((b), (c)))

/* Delivers the indication i of namespace n. */
#define CBDeliverIndication(b, c, n, i) ((b)->bft->deliverIndication((b), (c), (n), (i)))

/* Paths of the instances of the class p. */
#define CBEnumInstanceNames(b, c, p, rc) ((b)->bft->enumerateInstanceNames((b), (c), (p), (rc)))

/* Instances of the class p, with the properties in pr or all. */
#define CBEnumInstances(b, c, p, pr, rc) ((b)->bft->enumerateInstances((b), (c), (p), (pr), (rc)))

/* The instance p, with the properties in pr or all. */
#define CBGetInstance(b, c, p, pr, rc) ((b)->bft->getInstance((b), (c), (p), (pr), (rc)))

/* Creates the instance i under the path p. */
#define CBCreateInstance(b, c, p, i, rc) ((b)->bft->createInstance((b), (c), (p), (i), (rc)))

/* Changes the instance p to the values of i: those in pr or all. */
#define CBModifyInstance(b, c, p, i, pr) ((b)->bft->modifyInstance((b), (c), (p), (i), (pr)))

/* Changes the instance p to all values of i. The older form of CBModifyInstance, and the same slot. */
#define CBSetInstance(b, c, p, i) ((b)->bft->modifyInstance((b), (c), (p), (i), NULL))

/* Deletes the instance p. */
#define CBDeleteInstance(b, c, p) ((b)->bft->deleteInstance((b), (c), (p)))

/* Instances that match a query. As the slot has it, the query comes first, then its language, whatever the names of l
 * and q suggest. */
#define CBExecQuery(b, c, p, l, q, rc) ((b)->bft->execQuery((b), (c), (p), (l), (q), (rc)))

/* Instances associated with p by acl, of the class rcl, in the roles r of p and rr of the other. */
#define CBAssociators(b, c, p, acl, rcl, r, rr, pr, rc) \
  ((b)->bft->associators((b), (c), (p), (acl), (rcl), (r), (rr), (pr), (rc)))

/* Paths of those instances. */
#define CBAssociatorNames(b, c, p, acl, rcl, r, rr, rc) \
  ((b)->bft->associatorNames((b), (c), (p), (acl), (rcl), (r), (rr), (rc)))

/* Association instances of the class acl that refer to p in the role r. */
#define CBReferences(b, c, p, acl, r, pr, rc) ((b)->bft->references((b), (c), (p), (acl), (r), (pr), (rc)))

/* Paths of those instances. */
#define CBReferenceNames(b, c, p, acl, r, rc) ((b)->bft->referenceNames((b), (c), (p), (acl), (r), (rc)))

/* Calls method m of p with the arguments ai; output arguments go to ao. */
#define CBInvokeMethod(b, c, p, m, ai, ao, rc) ((b)->bft->invokeMethod((b), (c), (p), (m), (ai), (ao), (rc)))

/* Sets property n of the instance p to the value that v points to, of type t. */
#define CBSetProperty(b, c, p, n, v, t) ((b)->bft->setProperty((b), (c), (p), (n), cmpi_value_of_(v), (t)))

/* Property n of the instance p. */
#define CBGetProperty(b, c, p, n, rc) ((b)->bft->getProperty((b), (c), (p), (n), (rc)))

#else /* CMPI_INLINE */

/* The same as inline functions. */

static inline CMPIInstance* CMNewInstance(const CMPIBroker* mb, const CMPIObjectPath* op, CMPIStatus* rc) {
  return mb->eft->newInstance(mb, op, rc);
}

static inline CMPIObjectPath* CMNewObjectPath(const CMPIBroker* mb, const char* ns, const char* cn, CMPIStatus* rc) {
  return mb->eft->newObjectPath(mb, ns, cn, rc);
}

static inline CMPIString* CMNewString(const CMPIBroker* mb, const char* data, CMPIStatus* rc) {
  return mb->eft->newString(mb, data, rc);
}

static inline CMPIArgs* CMNewArgs(const CMPIBroker* mb, CMPIStatus* rc) { return mb->eft->newArgs(mb, rc); }

static inline CMPIArray* CMNewArray(const CMPIBroker* mb, CMPICount max, CMPIType type, CMPIStatus* rc) {
  return mb->eft->newArray(mb, max, type, rc);
}

static inline CMPIDateTime* CMNewDateTime(const CMPIBroker* mb, CMPIStatus* rc) { return mb->eft->newDateTime(mb, rc); }

static inline CMPIDateTime* CMNewDateTimeFromBinary(const CMPIBroker* mb, CMPIUint64 binTime, CMPIBoolean interval,
                                                    CMPIStatus* rc) {
  return mb->eft->newDateTimeFromBinary(mb, binTime, interval, rc);
}

static inline CMPIDateTime* CMNewDateTimeFromChars(const CMPIBroker* mb, const char* utcTime, CMPIStatus* rc) {
  return mb->eft->newDateTimeFromChars(mb, utcTime, rc);
}

static inline CMPISelectExp* CMNewSelectExp(const CMPIBroker* mb, const char* query, const char* lang,
                                            CMPIArray** projection, CMPIStatus* rc) {
  return mb->eft->newSelectExp(mb, query, lang, projection, rc);
}

static inline CMPIBoolean CMClassPathIsA(const CMPIBroker* mb, const CMPIObjectPath* op, const char* type,
                                         CMPIStatus* rc) {
  return mb->eft->classPathIsA(mb, op, type, rc);
}

static inline CMPIString* CDToString(const CMPIBroker* mb, const void* object, CMPIStatus* rc) {
  return mb->eft->toString(mb, object, rc);
}

static inline CMPIBoolean CDIsOfType(const CMPIBroker* mb, const void* object, const char* type, CMPIStatus* rc) {
  return mb->eft->isOfType(mb, object, type, rc);
}

static inline CMPIString* CDGetType(const CMPIBroker* mb, const void* object, CMPIStatus* rc) {
  return mb->eft->getType(mb, object, rc);
}

static inline CMPIStatus CMLogMessage(const CMPIBroker* b, int severity, const char* id, const char* text,
                                      const CMPIString* string) {
  return b->eft->logMessage(b, severity, id, text, string);
}

static inline CMPIStatus CMTraceMessage(const CMPIBroker* b, int level, const char* component, const char* text,
                                        const CMPIString* string) {
  return b->eft->trace(b, level, component, text, string);
}

#ifdef CMPI_VER_200
static inline CMPIError* CMNewCMPIError(const CMPIBroker* b, const char* owner, const char* msgID, const char* msg,
                                        const CMPIErrorSeverity sev, const CMPIErrorProbableCause pc,
                                        const CMPIrc cimStatusCode, CMPIStatus* rc) {
  return b->eft->newCMPIError(b, owner, msgID, msg, sev, pc, cimStatusCode, rc);
}

static inline CMPIStatus CMOpenMessageFile(const CMPIBroker* b, const char* msgFile, CMPIMsgFileHandle* msgFileHandle) {
  return b->eft->openMessageFile(b, msgFile, msgFileHandle);
}

static inline CMPIStatus CMCloseMessageFile(const CMPIBroker* b, const CMPIMsgFileHandle msgFilehandle) {
  return b->eft->closeMessageFile(b, msgFilehandle);
}
#endif /* CMPI_VER_200 */

static inline CMPIData CMGetProperty(const CMPIInstance* inst, const char* name, CMPIStatus* rc) {
  return inst->ft->getProperty(inst, name, rc);
}

static inline CMPIData CMGetPropertyAt(const CMPIInstance* inst, CMPICount index, CMPIString** name, CMPIStatus* rc) {
  return inst->ft->getPropertyAt(inst, index, name, rc);
}

static inline CMPIStatus CMSetProperty(const CMPIInstance* inst, const char* name, const CMPIValue* value,
                                       CMPIType type) {
  return inst->ft->setProperty(inst, name, value, type);
}

static inline CMPICount CMGetPropertyCount(const CMPIInstance* inst, CMPIStatus* rc) {
  return inst->ft->getPropertyCount(inst, rc);
}

static inline CMPIObjectPath* CMGetObjectPath(const CMPIInstance* inst, CMPIStatus* rc) {
  return inst->ft->getObjectPath(inst, rc);
}

static inline CMPIStatus CMSetObjectPath(CMPIInstance* inst, const CMPIObjectPath* obj) {
  return inst->ft->setObjectPath(inst, obj);
}

static inline CMPIStatus CMSetPropertyFilter(CMPIInstance* inst, const char** propertyList, const char** keys) {
  return inst->ft->setPropertyFilter(inst, propertyList, keys);
}

#ifdef CMPI_VER_200
static inline CMPIStatus CMSetPropertyWithOrigin(const CMPIInstance* inst, const char* name, const CMPIValue* value,
                                                 const CMPIType type, const char* origin) {
  return inst->ft->setPropertyWithOrigin(inst, name, value, type, origin);
}
#endif /* CMPI_VER_200 */

static inline CMPIStatus CMSetHostname(CMPIObjectPath* op, const char* hn) { return op->ft->setHostname(op, hn); }

static inline CMPIString* CMGetHostname(const CMPIObjectPath* op, CMPIStatus* rc) {
  return op->ft->getHostname(op, rc);
}

static inline CMPIStatus CMSetNameSpace(CMPIObjectPath* op, const char* ns) { return op->ft->setNameSpace(op, ns); }

static inline CMPIString* CMGetNameSpace(const CMPIObjectPath* op, CMPIStatus* rc) {
  return op->ft->getNameSpace(op, rc);
}

static inline CMPIStatus CMSetClassName(CMPIObjectPath* op, const char* cn) { return op->ft->setClassName(op, cn); }

static inline CMPIString* CMGetClassName(const CMPIObjectPath* op, CMPIStatus* rc) {
  return op->ft->getClassName(op, rc);
}

static inline CMPIStatus CMAddKey(CMPIObjectPath* op, const char* name, const CMPIValue* value, const CMPIType type) {
  return op->ft->addKey(op, name, value, type);
}

static inline CMPIData CMGetKey(const CMPIObjectPath* op, const char* name, CMPIStatus* rc) {
  return op->ft->getKey(op, name, rc);
}

static inline CMPIData CMGetKeyAt(const CMPIObjectPath* op, CMPICount index, CMPIString** name, CMPIStatus* rc) {
  return op->ft->getKeyAt(op, index, name, rc);
}

static inline CMPICount CMGetKeyCount(const CMPIObjectPath* op, CMPIStatus* rc) { return op->ft->getKeyCount(op, rc); }

static inline CMPIStatus CMSetNameSpaceFromObjectPath(CMPIObjectPath* op, const CMPIObjectPath* src) {
  return op->ft->setNameSpaceFromObjectPath(op, src);
}

static inline CMPIStatus CMSetHostAndNameSpaceFromObjectPath(CMPIObjectPath* op, const CMPIObjectPath* src) {
  return op->ft->setHostAndNameSpaceFromObjectPath(op, src);
}

static inline CMPIData CMGetClassQualifier(const CMPIObjectPath* op, const char* qName, CMPIStatus* rc) {
  return op->ft->getClassQualifier(op, qName, rc);
}

static inline CMPIData CMGetPropertyQualifier(const CMPIObjectPath* op, const char* pName, const char* qName,
                                              CMPIStatus* rc) {
  return op->ft->getPropertyQualifier(op, pName, qName, rc);
}

static inline CMPIData CMGetMethodQualifier(const CMPIObjectPath* op, const char* methodName, const char* qName,
                                            CMPIStatus* rc) {
  return op->ft->getMethodQualifier(op, methodName, qName, rc);
}

static inline CMPIData CMGetParameterQualifier(const CMPIObjectPath* op, const char* mName, const char* pName,
                                               const char* qName, CMPIStatus* rc) {
  return op->ft->getParameterQualifier(op, mName, pName, qName, rc);
}

static inline CMPIString* CMObjectPathToString(const CMPIObjectPath* op, CMPIStatus* rc) {
  return op->ft->toString(op, rc);
}

static inline CMPICount CMGetArrayCount(const CMPIArray* ar, CMPIStatus* rc) { return ar->ft->getSize(ar, rc); }

static inline CMPIType CMGetArrayType(const CMPIArray* ar, CMPIStatus* rc) { return ar->ft->getSimpleType(ar, rc); }

static inline CMPIData CMGetArrayElementAt(const CMPIArray* ar, CMPICount index, CMPIStatus* rc) {
  return ar->ft->getElementAt(ar, index, rc);
}

static inline CMPIStatus CMSetArrayElementAt(CMPIArray* ar, CMPICount index, const CMPIValue* value, CMPIType type) {
  return ar->ft->setElementAt(ar, index, value, type);
}

static inline CMPIStatus CMAddArg(const CMPIArgs* as, const char* name, const CMPIValue* value, const CMPIType type) {
  return as->ft->addArg(as, name, value, type);
}

static inline CMPIData CMGetArg(const CMPIArgs* as, const char* name, CMPIStatus* rc) {
  return as->ft->getArg(as, name, rc);
}

static inline CMPIData CMGetArgAt(const CMPIArgs* as, CMPICount index, CMPIString** name, CMPIStatus* rc) {
  return as->ft->getArgAt(as, index, name, rc);
}

static inline CMPICount CMGetArgCount(const CMPIArgs* as, CMPIStatus* rc) { return as->ft->getArgCount(as, rc); }

static inline const char* CMGetCharsPtr(const CMPIString* st, CMPIStatus* rc) { return st->ft->getCharPtr(st, rc); }

static inline CMPIString* CMGetStringFormat(const CMPIDateTime* dt, CMPIStatus* rc) {
  return dt->ft->getStringFormat(dt, rc);
}

static inline CMPIUint64 CMGetBinaryFormat(const CMPIDateTime* dt, CMPIStatus* rc) {
  return dt->ft->getBinaryFormat(dt, rc);
}

static inline CMPIBoolean CMIsInterval(const CMPIDateTime* dt, CMPIStatus* rc) { return dt->ft->isInterval(dt, rc); }

#ifdef CMPI_VER_200
static inline CMPIErrorType CMGetErrorType(const CMPIError* er, CMPIStatus* rc) { return er->ft->getErrorType(er, rc); }

static inline CMPIString* CMGetOtherErrorType(const CMPIError* er, CMPIStatus* rc) {
  return er->ft->getOtherErrorType(er, rc);
}

static inline CMPIString* CMGetOwningEntity(const CMPIError* er, CMPIStatus* rc) {
  return er->ft->getOwningEntity(er, rc);
}

static inline CMPIString* CMGetMessageID(const CMPIError* er, CMPIStatus* rc) { return er->ft->getMessageID(er, rc); }

static inline CMPIString* CMGetErrorMessage(const CMPIError* er, CMPIStatus* rc) { return er->ft->getMessage(er, rc); }

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

static inline CMPIStatus CMSetErrorType(CMPIError* er, const CMPIErrorType et) { return er->ft->setErrorType(er, et); }

static inline CMPIStatus CMSetOtherErrorType(CMPIError* er, const char* oet) {
  return er->ft->setOtherErrorType(er, oet);
}

static inline CMPIStatus CMSetProbableCauseDescription(CMPIError* er, const char* pcd) {
  return er->ft->setProbableCauseDescription(er, pcd);
}

static inline CMPIStatus CMSetRecommendedActions(CMPIError* er, const CMPIArray* ra) {
  return er->ft->setRecommendedActions(er, ra);
}

static inline CMPIStatus CMSetErrorSource(CMPIError* er, const char* es) { return er->ft->setErrorSource(er, es); }

static inline CMPIStatus CMSetErrorSourceFormat(CMPIError* er, const CMPIErrorSrcFormat esf) {
  return er->ft->setErrorSourceFormat(er, esf);
}

static inline CMPIStatus CMSetOtherErrorSourceFormat(CMPIError* er, const char* oesf) {
  return er->ft->setOtherErrorSourceFormat(er, oesf);
}

static inline CMPIStatus CMSetCIMStatusCodeDescription(CMPIError* er, const char* cd) {
  return er->ft->setCIMStatusCodeDescription(er, cd);
}

static inline CMPIStatus CMSetMessageArguments(CMPIError* er, CMPIArray* ma) {
  return er->ft->setMessageArguments(er, ma);
}
#endif /* CMPI_VER_200 */

static inline CMPIData CMGetNext(const CMPIEnumeration* en, CMPIStatus* rc) { return en->ft->getNext(en, rc); }

static inline CMPIBoolean CMHasNext(const CMPIEnumeration* en, CMPIStatus* rc) { return en->ft->hasNext(en, rc); }

static inline CMPIArray* CMToArray(const CMPIEnumeration* en, CMPIStatus* rc) { return en->ft->toArray(en, rc); }

static inline CMPIStatus CMReturnData(const CMPIResult* rslt, const CMPIValue* value, const CMPIType type) {
  return rslt->ft->returnData(rslt, value, type);
}

static inline CMPIStatus CMReturnInstance(const CMPIResult* rslt, const CMPIInstance* inst) {
  return rslt->ft->returnInstance(rslt, inst);
}

static inline CMPIStatus CMReturnObjectPath(const CMPIResult* rslt, const CMPIObjectPath* ref) {
  return rslt->ft->returnObjectPath(rslt, ref);
}

static inline CMPIStatus CMReturnDone(const CMPIResult* rslt) { return rslt->ft->returnDone(rslt); }

#ifdef CMPI_VER_200
static inline CMPIStatus CMReturnError(const CMPIResult* rslt, const CMPIError* er) {
  return rslt->ft->returnError(rslt, er);
}
#endif /* CMPI_VER_200 */

static inline CMPIData CMGetContextEntry(const CMPIContext* ctx, const char* name, CMPIStatus* rc) {
  return ctx->ft->getEntry(ctx, name, rc);
}

static inline CMPIData CMGetContextEntryAt(const CMPIContext* ctx, CMPICount index, CMPIString** name, CMPIStatus* rc) {
  return ctx->ft->getEntryAt(ctx, index, name, rc);
}

static inline CMPICount CMGetContextEntryCount(const CMPIContext* ctx, CMPIStatus* rc) {
  return ctx->ft->getEntryCount(ctx, rc);
}

static inline CMPIStatus CMAddContextEntry(const CMPIContext* ctx, const char* name, const CMPIValue* value,
                                           const CMPIType type) {
  return ctx->ft->addEntry(ctx, name, value, type);
}

static inline CMPIString* CMGetSelExpString(const CMPISelectExp* se, CMPIStatus* rc) {
  return se->ft->getString(se, rc);
}

static inline CMPIBoolean CMEvaluateSelExp(const CMPISelectExp* se, const CMPIInstance* inst, CMPIStatus* rc) {
  return se->ft->evaluate(se, inst, rc);
}

static inline CMPIBoolean CMEvaluateSelExpUsingAccessor(const CMPISelectExp* se, CMPIAccessor* accessor, void* parm,
                                                        CMPIStatus* rc) {
  return se->ft->evaluateUsingAccessor(se, accessor, parm, rc);
}

static inline CMPISelectCond* CMGetDoc(const CMPISelectExp* se, CMPIStatus* rc) { return se->ft->getDOC(se, rc); }

static inline CMPISelectCond* CMGetCod(const CMPISelectExp* se, CMPIStatus* rc) { return se->ft->getCOD(se, rc); }

static inline CMPICount CMGetSubCondCountAndType(const CMPISelectCond* sc, int* type, CMPIStatus* rc) {
  return sc->ft->getCountAndType(sc, type, rc);
}

static inline CMPISubCond* CMGetSubCondAt(const CMPISelectCond* sc, CMPICount index, CMPIStatus* rc) {
  return sc->ft->getSubCondAt(sc, index, rc);
}

static inline CMPICount CMGetPredicateCount(const CMPISubCond* sc, CMPIStatus* rc) { return sc->ft->getCount(sc, rc); }

static inline CMPIPredicate* CMGetPredicateAt(const CMPISubCond* sc, CMPICount index, CMPIStatus* rc) {
  return sc->ft->getPredicateAt(sc, index, rc);
}

static inline CMPIPredicate* CMGetPredicate(const CMPISubCond* sc, const char* name, CMPIStatus* rc) {
  return sc->ft->getPredicate(sc, name, rc);
}

static inline CMPIStatus CMGetPredicateData(const CMPIPredicate* pr, CMPIType* type, CMPIPredOp* op, CMPIString** lhs,
                                            CMPIString** rhs) {
  return pr->ft->getData(pr, type, op, lhs, rhs);
}

static inline CMPIBoolean CMEvaluatePredicateUsingAccessor(const CMPIPredicate* pr, CMPIAccessor* accessor, void* parm,
                                                           CMPIStatus* rc) {
  return pr->ft->evaluateUsingAccessor(pr, accessor, parm, rc);
}

static inline unsigned int CBGetClassification(const CMPIBroker* mb) { return mb->bft->brokerCapabilities; }

static inline unsigned int CBBrokerVersion(const CMPIBroker* mb) { return mb->bft->brokerVersion; }

static inline const char* CBBrokerName(const CMPIBroker* mb) { return mb->bft->brokerName; }

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
                                                   const CMPIObjectPath* op, CMPIStatus* rc) {
  return mb->bft->enumerateInstanceNames(mb, ctx, op, rc);
}

static inline CMPIEnumeration* CBEnumInstances(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                               const char** properties, CMPIStatus* rc) {
  return mb->bft->enumerateInstances(mb, ctx, op, properties, rc);
}

static inline CMPIInstance* CBGetInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                          const char** properties, CMPIStatus* rc) {
  return mb->bft->getInstance(mb, ctx, op, properties, rc);
}

static inline CMPIObjectPath* CBCreateInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                               const CMPIInstance* inst, CMPIStatus* rc) {
  return mb->bft->createInstance(mb, ctx, op, inst, rc);
}

static inline CMPIStatus CBModifyInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                          const CMPIInstance* inst, const char** properties) {
  return mb->bft->modifyInstance(mb, ctx, op, inst, properties);
}

static inline CMPIStatus CBSetInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                       const CMPIInstance* inst) {
  return mb->bft->modifyInstance(mb, ctx, op, inst, NULL);
}

static inline CMPIStatus CBDeleteInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op) {
  return mb->bft->deleteInstance(mb, ctx, op);
}

static inline CMPIEnumeration* CBExecQuery(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                           const char* query, const char* lang, CMPIStatus* rc) {
  return mb->bft->execQuery(mb, ctx, op, query, lang, rc);
}

static inline CMPIEnumeration* CBAssociators(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                             const char* assocClass, const char* resultClass, const char* role,
                                             const char* resultRole, const char** properties, CMPIStatus* rc) {
  return mb->bft->associators(mb, ctx, op, assocClass, resultClass, role, resultRole, properties, rc);
}

static inline CMPIEnumeration* CBAssociatorNames(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                                 const char* assocClass, const char* resultClass, const char* role,
                                                 const char* resultRole, CMPIStatus* rc) {
  return mb->bft->associatorNames(mb, ctx, op, assocClass, resultClass, role, resultRole, rc);
}

static inline CMPIEnumeration* CBReferences(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                            const char* resultClass, const char* role, const char** properties,
                                            CMPIStatus* rc) {
  return mb->bft->references(mb, ctx, op, resultClass, role, properties, rc);
}

static inline CMPIEnumeration* CBReferenceNames(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                                const char* resultClass, const char* role, CMPIStatus* rc) {
  return mb->bft->referenceNames(mb, ctx, op, resultClass, role, rc);
}

static inline CMPIData CBInvokeMethod(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                      const char* method, const CMPIArgs* in, CMPIArgs* out, CMPIStatus* rc) {
  return mb->bft->invokeMethod(mb, ctx, op, method, in, out, rc);
}

static inline CMPIStatus CBSetProperty(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                       const char* name, const CMPIValue* value, CMPIType type) {
  return mb->bft->setProperty(mb, ctx, op, name, value, type);
}

static inline CMPIData CBGetProperty(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                     const char* name, CMPIStatus* rc) {
  return mb->bft->getProperty(mb, ctx, op, name, rc);
}

#endif /* CMPI_INLINE */

/* ---- Making a provider in C ----
 *
 * Each CM...MIStub writes a function table and the function pn_Create_...MI that a broker looks up by name and calls
 * once after loading. Used at file scope, without a semicolon.
 *
 *   pfx     prefix of the provider's functions: CMInstanceMIStub(Disk, ...) expects DiskCleanup, DiskEnumInstances, ...
 *   pn      the provider's name as it is registered with the broker
 *   broker  a variable of type const CMPIBroker* that the entry point sets
 *   hook    a statement to run then, after broker is set; it may use ctx and rc, the entry point's arguments, and mi,
 *           the provider object. CMNoHook for none.
 *
 * Functions that a macro's comment does not name are left out of the table (null). */

/* No statement at load. */
#define CMNoHook

#define CMPI_ENTRY_POINT_(mitype, entry, table, broker, ...)                                    \
  CMPI_EXTERN_C mitype* entry(const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc);  \
  CMPI_EXTERN_C mitype* entry(const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc) { \
    static mitype mi = {NULL, &table};                                                          \
    (void)ctx;                                                                                  \
    (void)rc;                                                                                   \
    broker = brkr;                                                                              \
    __VA_ARGS__;                                                                                \
    return &mi;                                                                                 \
  }

/* The name of the function that modifies an instance. */
#define CMInstanceMIStubChange(pfx) pfx##ModifyInstance

/* A table's slots are read one below the other. */
/* clang-format off */

/* A provider of instances: pfxCleanup, pfxEnumInstanceNames, pfxEnumInstances, pfxGetInstance, pfxCreateInstance,
 * pfxModifyInstance, pfxDeleteInstance, pfxExecQuery. */
#define CMInstanceMIStub(pfx, pn, broker, hook)  \
  static CMPIInstanceMIFT pn##_InstanceMIFT_ = { \
      CMPICurrentVersion,                        \
      CMPICurrentVersion,                        \
      "instance" #pn,                            \
      pfx##Cleanup,                              \
      pfx##EnumInstanceNames,                    \
      pfx##EnumInstances,                        \
      pfx##GetInstance,                          \
      pfx##CreateInstance,                       \
      CMInstanceMIStubChange(pfx),               \
      pfx##DeleteInstance,                       \
      pfx##ExecQuery,                            \
  };                                             \
  CMPI_ENTRY_POINT_(CMPIInstanceMI, pn##_Create_InstanceMI, pn##_InstanceMIFT_, broker, hook)

/* A provider of associations: pfxAssociationCleanup, pfxAssociators, pfxAssociatorNames, pfxReferences,
 * pfxReferenceNames. */
#define CMAssociationMIStub(pfx, pn, broker, hook)     \
  static CMPIAssociationMIFT pn##_AssociationMIFT_ = { \
      CMPICurrentVersion,                              \
      CMPICurrentVersion,                              \
      "association" #pn,                               \
      pfx##AssociationCleanup,                         \
      pfx##Associators,                                \
      pfx##AssociatorNames,                            \
      pfx##References,                                 \
      pfx##ReferenceNames,                             \
  };                                                   \
  CMPI_ENTRY_POINT_(CMPIAssociationMI, pn##_Create_AssociationMI, pn##_AssociationMIFT_, broker, hook)

/* A provider of methods: pfxMethodCleanup, pfxInvokeMethod. */
#define CMMethodMIStub(pfx, pn, broker, hook) \
  static CMPIMethodMIFT pn##_MethodMIFT_ = {  \
      CMPICurrentVersion,                     \
      CMPICurrentVersion,                     \
      "method" #pn,                           \
      pfx##MethodCleanup,                     \
      pfx##InvokeMethod,                      \
  };                                          \
  CMPI_ENTRY_POINT_(CMPIMethodMI, pn##_Create_MethodMI, pn##_MethodMIFT_, broker, hook)

/* Fills the slot setPropertyWithOrigin, which version 1.0 lacks. */
#ifdef CMPI_VER_200
#define CMPI_PROPERTY_WITH_ORIGIN_ NULL,
#else
#define CMPI_PROPERTY_WITH_ORIGIN_
#endif

/* A provider of single properties: pfxPropertyCleanup, pfxSetProperty, pfxGetProperty. */
#define CMPropertyMIStub(pfx, pn, broker, hook)  \
  static CMPIPropertyMIFT pn##_PropertyMIFT_ = { \
      CMPICurrentVersion,                        \
      CMPICurrentVersion,                        \
      "property" #pn,                            \
      pfx##PropertyCleanup,                      \
      pfx##SetProperty,                          \
      pfx##GetProperty,                          \
      CMPI_PROPERTY_WITH_ORIGIN_                 \
  };                                             \
  CMPI_ENTRY_POINT_(CMPIPropertyMI, pn##_Create_PropertyMI, pn##_PropertyMIFT_, broker, hook)

/* The last two slots of an indication provider's table: null, or with CMPI_VER_86 defined before the include
 * pfxEnableIndications and pfxDisableIndications. */
#ifdef CMPI_VER_86
#define CMIndicationMIStubExtensions(pfx) pfx##EnableIndications, pfx##DisableIndications,
#else
#define CMIndicationMIStubExtensions(pfx) NULL, NULL,
#endif

/* A provider of indications: pfxIndicationCleanup, pfxAuthorizeFilter, pfxMustPoll, pfxActivateFilter,
 * pfxDeActivateFilter. */
#define CMIndicationMIStub(pfx, pn, broker, hook)    \
  static CMPIIndicationMIFT pn##_IndicationMIFT_ = { \
      CMPICurrentVersion,                            \
      CMPICurrentVersion,                            \
      "Indication" #pn,                              \
      pfx##IndicationCleanup,                        \
      pfx##AuthorizeFilter,                          \
      pfx##MustPoll,                                 \
      pfx##ActivateFilter,                           \
      pfx##DeActivateFilter,                         \
      CMIndicationMIStubExtensions(pfx)};            \
  CMPI_ENTRY_POINT_(CMPIIndicationMI, pn##_Create_IndicationMI, pn##_IndicationMIFT_, broker, hook)

/* ---- Making a provider of a C++ class ----
 *
 * Each CM...MIFactory writes the table and the entry point for the class cn under the provider name pn; CMProviderBase
 * writes, once for each pn, the object that the entry points of one provider share. CMPI does not define the classes
 * of these macros: a program that uses them defines CmpiBroker, CmpiContext, CmpiProviderBase, CmpiBaseMI and
 * Cmpi<Instance, Association, Method, Property, Indication>MI; README.md beside this header says what they must have.
 * Used at file scope, without a semicolon. */

/* The state that the entry points of the provider pn share. */
#define CMProviderBase(pn) CmpiProviderBase base##pn;

/* One cleanup serves all five kinds of providers; the cast picks the overload, or fits the one function, for this. */
#define CMPI_BASE_CLEANUP_(mitype) \
  ((CMPIStatus(*)(mitype*, const CMPIContext*, CMPIBoolean)) &CmpiBaseMI::driveBaseCleanup)

#define CMPI_FACTORY_ENTRY_POINT_(mitype, entry, table, cn, base)                                  \
  CMPI_EXTERN_C mitype* entry(const CMPIBroker* broker, const CMPIContext* ctxp, CMPIStatus* rc);  \
  CMPI_EXTERN_C mitype* entry(const CMPIBroker* broker, const CMPIContext* ctxp, CMPIStatus* rc) { \
    static mitype mi = {NULL, &table};                                                             \
    (void)rc;                                                                                      \
    CmpiBaseMI* provider = base.getBaseMI();                                                       \
    if (!provider) {                                                                               \
      CmpiBroker brkr(const_cast<CMPIBroker*>(broker));                                            \
      CmpiContext ctx(const_cast<CMPIContext*>(ctxp));                                             \
      provider = new cn(brkr, ctx);                                                                \
      provider->setProviderBase(&base);                                                            \
      provider->initialize(ctx);                                                                   \
      base.setBaseMI(provider);                                                                    \
    }                                                                                              \
    mi.hdl = provider;                                                                             \
    base.incUseCount();                                                                            \
    return &mi;                                                                                    \
  }

/* A provider of instances; cn derives from CmpiInstanceMI. */
#define CMInstanceMIFactory(cn, pn)              \
  static CMPIInstanceMIFT pn##_InstanceMIFT_ = { \
      CMPICurrentVersion,                        \
      CMPICurrentVersion,                        \
      "instance" #pn,                            \
      CMPI_BASE_CLEANUP_(CMPIInstanceMI),        \
      CmpiInstanceMI::driveEnumInstanceNames,    \
      CmpiInstanceMI::driveEnumInstances,        \
      CmpiInstanceMI::driveGetInstance,          \
      CmpiInstanceMI::driveCreateInstance,       \
      CmpiInstanceMI::driveSetInstance,          \
      CmpiInstanceMI::driveDeleteInstance,       \
      CmpiInstanceMI::driveExecQuery,            \
  };                                             \
  CMPI_FACTORY_ENTRY_POINT_(CMPIInstanceMI, pn##_Create_InstanceMI, pn##_InstanceMIFT_, cn, base##pn)

/* A provider of associations; cn derives from CmpiAssociationMI. */
#define CMAssociationMIFactory(cn, pn)                 \
  static CMPIAssociationMIFT pn##_AssociationMIFT_ = { \
      CMPICurrentVersion,                              \
      CMPICurrentVersion,                              \
      "association" #pn,                               \
      CMPI_BASE_CLEANUP_(CMPIAssociationMI),           \
      CmpiAssociationMI::driveAssociators,             \
      CmpiAssociationMI::driveAssociatorNames,         \
      CmpiAssociationMI::driveReferences,              \
      CmpiAssociationMI::driveReferenceNames,          \
  };                                                   \
  CMPI_FACTORY_ENTRY_POINT_(CMPIAssociationMI, pn##_Create_AssociationMI, pn##_AssociationMIFT_, cn, base##pn)

/* A provider of methods; cn derives from CmpiMethodMI. */
#define CMMethodMIFactory(cn, pn)            \
  static CMPIMethodMIFT pn##_MethodMIFT_ = { \
      CMPICurrentVersion,                    \
      CMPICurrentVersion,                    \
      "method" #pn,                          \
      CMPI_BASE_CLEANUP_(CMPIMethodMI),      \
      CmpiMethodMI::driveInvokeMethod,       \
  };                                         \
  CMPI_FACTORY_ENTRY_POINT_(CMPIMethodMI, pn##_Create_MethodMI, pn##_MethodMIFT_, cn, base##pn)

/* A provider of single properties; cn derives from CmpiPropertyMI. */
#define CMPropertyMIFactory(cn, pn)                                       \
  static CMPIPropertyMIFT pn##_PropertyMIFT_ = {                          \
      CMPICurrentVersion,                                                 \
      CMPICurrentVersion,                                                 \
      "property" #pn,                                                     \
      CMPI_BASE_CLEANUP_(CMPIPropertyMI),                                 \
      CmpiPropertyMI::driveSetProperty, CmpiPropertyMI::driveGetProperty, \
      CMPI_PROPERTY_WITH_ORIGIN_                                          \
  };                                                                      \
  CMPI_FACTORY_ENTRY_POINT_(CMPIPropertyMI, pn##_Create_PropertyMI, pn##_PropertyMIFT_, cn, base##pn)

/* The last two slots of the table of CMIndicationMIFactory, as CMIndicationMIStubExtensions. */
#ifdef CMPI_VER_86
#define CMIndicationMIFactoryExtensions \
  CmpiIndicationMI::driveEnableIndications, CmpiIndicationMI::driveDisableIndications,
#else
#define CMIndicationMIFactoryExtensions NULL, NULL,
#endif

/* A provider of indications; cn derives from CmpiIndicationMI. */
#define CMIndicationMIFactory(cn, pn)                \
  static CMPIIndicationMIFT pn##_IndicationMIFT_ = { \
      CMPICurrentVersion,                            \
      CMPICurrentVersion,                            \
      "indication" #pn,                              \
      CMPI_BASE_CLEANUP_(CMPIIndicationMI),          \
      CmpiIndicationMI::driveAuthorizeFilter,        \
      CmpiIndicationMI::driveMustPoll,               \
      CmpiIndicationMI::driveActivateFilter,         \
      CmpiIndicationMI::driveDeActivateFilter,       \
      CMIndicationMIFactoryExtensions};              \
  CMPI_FACTORY_ENTRY_POINT_(CMPIIndicationMI, pn##_Create_IndicationMI, pn##_IndicationMIFT_, cn, base##pn)

/* clang-format on */

#endif /* _CMPIMACS_H_ */
