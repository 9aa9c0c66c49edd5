/* CMPI, the Common Manageability Programming Interface (The Open Group), version 2.0: the function tables of the broker
 * and of providers.
 *
 * Each object is a pair of a handle, which only its owner understands, and a function table. A function gets the object
 * whose table it is in as its first argument; an object of another kind, or one that ended, gives
 * CMPI_RC_ERR_INVALID_HANDLE as far as the broker can tell.
 *
 * Status. Functions return a CMPIStatus or store one through their last parameter, rc, which may be null. CMPI_RC_OK
 * is stored on success as well. Besides the codes named with a function, any may fail with CMPI_RC_ERR_FAILED. What a
 * function gives beside an error means nothing (null, 0, or a CMPIData whose state is not CMPI_goodValue).
 *
 * Ownership. Objects that a broker makes for a provider, and all that can be reached from them, live until the call of
 * the provider in which they were made returns, or, in a thread of the provider's own, until it detaches. clone gives a
 * copy that lives until release. Texts and values given to a function are copied by it.
 *
 * Threads. A broker's tables may be used from any thread that the broker called or that is attached; one object must
 * not be changed in one thread while another uses it.
 *
 * Texts are UTF-8, NUL-terminated. Names of classes, properties, methods and the like match without regard to case. */

#ifndef _CMPIFT_H_
#define _CMPIFT_H_

#include "cmpidt.h"
#include "cmpios.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef struct _CMPIInstanceMIFT CMPIInstanceMIFT;       /* Its functions */
typedef struct _CMPIInstanceMI CMPIInstanceMI;           /* Provider of instances */
typedef struct _CMPIAssociationMIFT CMPIAssociationMIFT; /* Its functions */
typedef struct _CMPIAssociationMI CMPIAssociationMI;     /* Provider of associations */
typedef struct _CMPIMethodMIFT CMPIMethodMIFT;           /* Its functions */
typedef struct _CMPIMethodMI CMPIMethodMI;               /* Provider of methods */
typedef struct _CMPIPropertyMIFT CMPIPropertyMIFT;       /* Its functions */
typedef struct _CMPIPropertyMI CMPIPropertyMI;           /* Provider of single properties */
typedef struct _CMPIIndicationMIFT CMPIIndicationMIFT;   /* Its functions */
typedef struct _CMPIIndicationMI CMPIIndicationMI;       /* Provider of indications */

/* What timedCondWait counts with; its definition is in <time.h>. */
struct timespec;

/* ---- The broker ---- */

/* Encapsulation services: making CMPI objects, asking about them, messages and logging. A null result means failure,
 * with the reason in *rc. */
struct _CMPIBrokerEncFT {
  /* Version of this table, CMPICurrentVersion of the headers that the broker was built with. */
  int ftVersion;
  /* A new instance of the class and namespace of op. It starts with the key values that op holds. CMPI_RC_ERR_NOT_FOUND
   * if the broker does not know the class, CMPI_RC_ERR_FAILED otherwise. */
  CMPIInstance* (*newInstance)(const CMPIBroker* mb, const CMPIObjectPath* op, CMPIStatus* rc);
  /* A new object path of namespace ns and class cn without keys. A null ns means the namespace that the broker
   * presumes. CMPI_RC_ERR_FAILED if it cannot be made. */
  CMPIObjectPath* (*newObjectPath)(const CMPIBroker* mb, const char* ns, const char* cn, CMPIStatus* rc);
  /* A new, empty list of method arguments. */
  CMPIArgs* (*newArgs)(const CMPIBroker* mb, CMPIStatus* rc);
  /* A new string with a copy of the NUL-terminated UTF-8 text data. */
  CMPIString* (*newString)(const CMPIBroker* mb, const char* data, CMPIStatus* rc);
  /* A new array of max elements, all null. type is the type of one element, without CMPI_ARRAY. The size never
   * changes. */
  CMPIArray* (*newArray)(const CMPIBroker* mb, CMPICount max, CMPIType type, CMPIStatus* rc);
  /* A date and time that holds the present moment. */
  CMPIDateTime* (*newDateTime)(const CMPIBroker* mb, CMPIStatus* rc);
  /* A date and time from microseconds: since 1970-01-01 00:00 UTC if interval is 0, otherwise the length of an
   * interval. */
  CMPIDateTime* (*newDateTimeFromBinary)(const CMPIBroker* mb, CMPIUint64 binTime, CMPIBoolean interval,
                                         CMPIStatus* rc);
  /* A date and time from the 25 characters of CIM's datetime format (DSP0004), timestamp or interval.
   * CMPI_RC_ERR_INVALID_PARAMETER or CMPI_RC_ERR_FAILED if utcTime is not of that form. */
  CMPIDateTime* (*newDateTimeFromChars)(const CMPIBroker* mb, const char* utcTime, CMPIStatus* rc);
  /* A select expression compiled from query in the language lang ("WQL", "CIM:CQL"). If projection is not null,
   * *projection becomes an array with the names of the selected properties, or null for all.
   * CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, CMPI_RC_ERR_INVALID_QUERY. */
  CMPISelectExp* (*newSelectExp)(const CMPIBroker* mb, const char* query, const char* lang, CMPIArray** projection,
                                 CMPIStatus* st);
  /* Whether the class of op is type or a subclass of it; class names match without regard to case.
   * CMPI_RC_ERR_INVALID_PARAMETER for a null type, CMPI_RC_ERR_INVALID_HANDLE for an op that is none. */
  CMPIBoolean (*classPathIsA)(const CMPIBroker* mb, const CMPIObjectPath* op, const char* type, CMPIStatus* rc);
  /* A text that shows any CMPI object, for traces; its form is the broker's own. CMPI_RC_ERR_INVALID_HANDLE if object
   * is none. */
  CMPIString* (*toString)(const CMPIBroker* mb, const void* object, CMPIStatus* rc);
  /* Whether object is a CMPI object of the C type named type, such as "CMPIInstance". CMPI_RC_ERR_INVALID_HANDLE if
   * object is none. */
  CMPIBoolean (*isOfType)(const CMPIBroker* mb, const void* object, const char* type, CMPIStatus* rc);
  /* The name of the C type of a CMPI object, such as "CMPIInstance". CMPI_RC_ERR_INVALID_HANDLE if object is none. */
  CMPIString* (*getType)(const CMPIBroker* mb, const void* object, CMPIStatus* rc);
  /* The text of message msgId in the language of the request, or defMsg where the broker has none, with count inserts.
   * Each insert is a CMPIType followed by its value; CMFmtArgs1 and its like write such a list. */
  CMPIString* (*getMessage)(const CMPIBroker* mb, const char* msgId, const char* defMsg, CMPIStatus* rc,
                            CMPICount count, ...);
  /* Writes an entry to the broker's log: severity as CMPISeverity, id of the message or null, and either text or
   * string. CMPI_RC_ERR_FAILED if it could not be written. */
  CMPIStatus (*logMessage)(const CMPIBroker* mb, int severity, const char* id, const char* text,
                           const CMPIString* string);
  /* Writes an entry to the broker's trace: level as CMPILevel, the component that it is about or null, and either text
   * or string. */
  CMPIStatus (*trace)(const CMPIBroker* mb, int level, const char* component, const char* text,
                      const CMPIString* string);
#ifdef CMPI_VER_200
  /* A new error object (CIM_Error): the entity that owns the message, its id and text, severity, cause, and the status
   * code of the error. Everything else can be set afterwards. */
  CMPIError* (*newCMPIError)(const CMPIBroker* mb, const char* owner, const char* msgID, const char* msg,
                             const CMPIErrorSeverity sev, const CMPIErrorProbableCause pc, const CMPIrc cimStatusCode,
                             CMPIStatus* rc);
  /* Opens the translated message file msgFile in the language of the request and sets *msgFileHandle. Where no language
   * fits the status is still CMPI_RC_OK, the handle null, and getMessage2 gives default texts. Close it with
   * closeMessageFile. */
  CMPIStatus (*openMessageFile)(const CMPIBroker* mb, const char* msgFile, CMPIMsgFileHandle* msgFileHandle);
  /* Closes a handle from openMessageFile; it must not be used again. CMPI_RC_ERR_INVALID_HANDLE if it is none. */
  CMPIStatus (*closeMessageFile)(const CMPIBroker* mb, const CMPIMsgFileHandle msgFileHandle);
  /* As getMessage, from the message file msgFileHandle. With a null handle or an unknown msgId the text is defMsg. */
  CMPIString* (*getMessage2)(const CMPIBroker* mb, const char* msgId, const CMPIMsgFileHandle msgFileHandle,
                             const char* defMsg, CMPIStatus* rc, CMPICount count, ...);
#endif
};

/* What the broker is, threads, and operations on the CIM server that a provider may call (up-calls). Up-calls take the
 * context of the request that they serve; its CMPIInvocationFlags entry applies to them. Errors are the status codes of
 * the CIM operation of that name (DSP0200). */
struct _CMPIBrokerFT {
  unsigned int brokerCapabilities; /* What the broker can do: CMPI_MB_... bits. */
  unsigned int brokerVersion;      /* The version of CMPI that the broker follows, such as CMPIVersion200. */
  const char* brokerName;          /* The broker's name, NUL-terminated, owned by the broker. */
  /* Called in the thread that owns ctx: makes the context that a new thread of the provider passes to attachThread. The
   * result belongs to that thread and ends with detachThread. */
  CMPIContext* (*prepareAttachThread)(const CMPIBroker* mb, const CMPIContext* ctx);
  /* Called in the new thread, before any other use of the broker, with the context from prepareAttachThread. */
  CMPIStatus (*attachThread)(const CMPIBroker* mb, const CMPIContext* ctx);
  /* Called in the attached thread as its last use of the broker; frees ctx and what the thread was given. */
  CMPIStatus (*detachThread)(const CMPIBroker* mb, const CMPIContext* ctx);
  /* Hands the indication ind of namespace ns to the broker for delivery to the subscribers. ind stays the caller's.
   * CMPI_RC_ERR_NOT_SUPPORTED if the broker has no indications. */
  CMPIStatus (*deliverIndication)(const CMPIBroker* mb, const CMPIContext* ctx, const char* ns,
                                  const CMPIInstance* ind);
  /* The object paths of all instances of the class of op and of its subclasses. */
  CMPIEnumeration* (*enumerateInstanceNames)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                             CMPIStatus* rc);
  /* The instance that op names, with only the listed properties if properties (ended by a null) is not null.
   * CMPI_RC_ERR_NOT_FOUND if there is none. */
  CMPIInstance* (*getInstance)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                               const char** properties, CMPIStatus* rc);
  /* Creates inst under the path op and returns its path as the provider of the class made it.
   * CMPI_RC_ERR_ALREADY_EXISTS. */
  CMPIObjectPath* (*createInstance)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                    const CMPIInstance* inst, CMPIStatus* rc);
  /* Changes the instance that op names to the values of inst: all of them, or only those listed in properties (ended by
   * a null). CMPI_RC_ERR_NOT_FOUND. */
  CMPIStatus (*modifyInstance)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                               const CMPIInstance* inst, const char** properties);
  /* Deletes the instance that op names. CMPI_RC_ERR_NOT_FOUND. */
  CMPIStatus (*deleteInstance)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op);
  /* The instances, in the namespace of op, that match query in the language lang. */
  CMPIEnumeration* (*execQuery)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                const char* query, const char* lang, CMPIStatus* rc);
  /* All instances of the class of op and of its subclasses, with only the listed properties if properties (ended by a
   * null) is not null. */
  CMPIEnumeration* (*enumerateInstances)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                         const char** properties, CMPIStatus* rc);
  /* The instances associated with the instance op. Each filter that is not null narrows them: the association's class,
   * the class of the far end, the role of op and of the far end in the association. properties as in getInstance. */
  CMPIEnumeration* (*associators)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                  const char* assocClass, const char* resultClass, const char* role,
                                  const char* resultRole, const char** properties, CMPIStatus* rc);
  /* The object paths of the instances that associators would give. */
  CMPIEnumeration* (*associatorNames)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                      const char* assocClass, const char* resultClass, const char* role,
                                      const char* resultRole, CMPIStatus* rc);
  /* The association instances that refer to the instance op, narrowed by their class and the role of op in them where
   * those are not null. properties as in getInstance. */
  CMPIEnumeration* (*references)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                 const char* resultClass, const char* role, const char** properties, CMPIStatus* rc);
  /* The object paths of the instances that references would give. */
  CMPIEnumeration* (*referenceNames)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op,
                                     const char* resultClass, const char* role, CMPIStatus* rc);
  /* Calls method of the instance, or for a static method the class, op with the arguments in; output arguments are
   * added to out. The result is the method's return value. CMPI_RC_ERR_METHOD_NOT_FOUND,
   * CMPI_RC_ERR_METHOD_NOT_AVAILABLE. */
  CMPIData (*invokeMethod)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op, const char* method,
                           const CMPIArgs* in, CMPIArgs* out, CMPIStatus* rc);
  /* Sets one property of the instance op. CMPI_RC_ERR_NO_SUCH_PROPERTY, CMPI_RC_ERR_TYPE_MISMATCH. */
  CMPIStatus (*setProperty)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op, const char* name,
                            const CMPIValue* value, CMPIType type);
  /* One property of the instance op. CMPI_RC_ERR_NO_SUCH_PROPERTY. */
  CMPIData (*getProperty)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* op, const char* name,
                          CMPIStatus* rc);
};

/* Services of the operating system, in the broker's make of them: files, threads, locks. The functions that return int
 * give 0 for success and an errno value otherwise, as POSIX threads do. The table may be missing (a null xft) where the
 * broker lacks CMPI_MB_OSEncapsulationSupport. */
struct _CMPIBrokerExtFT {
  int ftVersion; /* Version of this table. */
  /* The file name of a library made of its bare name, as the platform forms it ("lib" + name + ".so"). The caller frees
   * the result with free(). */
  char* (*resolveFileName)(const char* filename);
  /* Starts a thread that runs start(parm), detached if detached is not 0. Returns the handle that joinThread and
   * cancelThread take, null on failure. */
  void* (*newThread)(void* (*start)(void*), void* parm, int detached);
  /* Waits for the end of a thread that is not detached and sets *retval, if given, to its result. */
  int (*joinThread)(void* thread, void** retval);
  /* Ends the calling thread with the result return_code; does not return when it succeeds. */
  int (*exitThread)(void* return_code);
  /* Asks a thread to end. */
  int (*cancelThread)(void* thread);
  /* Makes the calling thread sleep for msec milliseconds. */
  int (*threadSleep)(CMPIUint32 msec);
  /* Runs init if no earlier call with the same *once did; *once starts as 0. */
  int (*threadOnce)(int* once, void (*init)(void));
  /* Makes a key for values that each thread has for itself and stores it in *key. cleanup, if given, gets the value of
   * each thread that ends. */
  int (*createThreadKey)(unsigned long* key, void (*cleanup)(void*));
  /* Ends a key; cleanup is not called for values that threads still hold. */
  int (*destroyThreadKey)(unsigned long key);
  /* The calling thread's value of key, null if it set none. */
  void* (*getThreadSpecific)(unsigned long key);
  /* Sets the calling thread's value of key. */
  int (*setThreadSpecific)(unsigned long key, void* value);
  /* A new, unlocked mutex, null on failure; opt must be 0. Ends with destroyMutex. */
  void* (*newMutex)(int opt);
  /* Ends a mutex, which must not be locked. */
  void (*destroyMutex)(void* mutex);
  /* Waits until the mutex is free and locks it. */
  void (*lockMutex)(void* mutex);
  /* Unlocks a mutex that the calling thread locked. */
  void (*unlockMutex)(void* mutex);
  /* A new condition variable, null on failure; opt must be 0. Ends with destroyCondition. */
  void* (*newCondition)(int opt);
  /* Ends a condition variable that no thread waits for. */
  void (*destroyCondition)(void* cond);
  /* Unlocks mutex, waits for a signal of cond, and locks mutex again. It may also wake without a signal. */
  int (*condWait)(void* cond, void* mutex);
  /* As condWait, but at most until the absolute time *wait; then the result is ETIMEDOUT. */
  int (*timedCondWait)(void* cond, void* mutex, struct timespec* wait);
  /* Wakes at least one of the threads that wait for cond. */
  int (*signalCondition)(void* cond);
};

#ifdef CMPI_VER_200
/* Memory services for providers that make many objects in one call, present (mft is not null) where the broker has
 * CMPI_MB_Supports_MemEnhancements. The free... functions end an object before the end of the call would; afterwards it
 * must not be used. */
struct _CMPIBrokerMemFT {
  const int ftVersion; /* Version of this table. */
  /* Marks the present moment: release of the mark frees the CMPI objects that the broker made for this thread since.
   * Null on failure. */
  CMPIGcStat* (*mark)(const CMPIBroker* mb, CMPIStatus* rc);
  /* Frees the objects made since mark gave gc, and gc itself. Objects from clone are left alone. */
  CMPIStatus (*release)(const CMPIBroker* mb, const CMPIGcStat* gc);
  /* size bytes, not set, that cmpiFree or the end of the call frees; null if there are none left. */
  void* (*cmpiMalloc)(const CMPIBroker* mb, size_t size);
  /* count elements of size bytes, all zero; ends as those of cmpiMalloc. */
  void* (*cmpiCalloc)(const CMPIBroker* mb, size_t count, size_t size);
  /* Changes the length of a block of this table to size and returns where it is now. On failure the result is null and
   * the old block stays. */
  void* (*cmpiRealloc)(const CMPIBroker* mb, void* ptr, size_t size);
  /* A copy of the NUL-terminated text str; ends as those of cmpiMalloc. */
  char* (*cmpiStrDup)(const CMPIBroker* mb, const char* str);
  /* Frees a block of cmpiMalloc, cmpiCalloc, cmpiRealloc or cmpiStrDup. */
  void (*cmpiFree)(const CMPIBroker* mb, void* ptr);
  /* Frees an instance that newInstance or a call of the broker made. */
  void (*freeInstance)(const CMPIBroker* mb, CMPIInstance* inst);
  /* Frees an object path. */
  void (*freeObjectPath)(const CMPIBroker* mb, CMPIObjectPath* obj);
  /* Frees a list of arguments. */
  void (*freeArgs)(const CMPIBroker* mb, CMPIArgs* args);
  /* Frees a string. */
  void (*freeString)(const CMPIBroker* mb, CMPIString* str);
  /* Frees an array and its elements. */
  void (*freeArray)(const CMPIBroker* mb, CMPIArray* array);
  /* Frees a date and time. */
  void (*freeDateTime)(const CMPIBroker* mb, CMPIDateTime* date);
  /* Frees a select expression. */
  void (*freeSelectExp)(const CMPIBroker* mb, CMPISelectExp* se);
};
#endif

/* The broker as a provider sees it. It is given to the provider's create function and stays valid until its cleanup. */
struct _CMPIBroker {
  void* hdl;            /* The broker's own; a provider leaves it alone. */
  CMPIBrokerFT* bft;    /* What the broker is, threads and up-calls. */
  CMPIBrokerEncFT* eft; /* Objects, messages, log. */
  CMPIBrokerExtFT* xft; /* Services of the operating system, or null. */
#ifdef CMPI_VER_200
  CMPIBrokerMemFT* mft; /* Memory services, or null. */
#endif
};

/* ---- What a request brings and where results go ---- */

/* The context of a request: named values about the caller and the request. */
struct _CMPIContextFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPIContext* ctx);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPIContext* (*clone)(const CMPIContext* ctx, CMPIStatus* rc);
  /* The entry called name (CMPIPrincipal, CMPIInvocationFlags, ...). CMPI_RC_ERR_NOT_FOUND if there is none. */
  CMPIData (*getEntry)(const CMPIContext* ctx, const char* name, CMPIStatus* rc);
  /* The entry at index, counted from 0, and its name in *name if name is not null. CMPI_RC_ERR_NOT_FOUND past the
   * end. */
  CMPIData (*getEntryAt)(const CMPIContext* ctx, CMPICount index, CMPIString** name, CMPIStatus* rc);
  /* The number of entries. */
  CMPICount (*getEntryCount)(const CMPIContext* ctx, CMPIStatus* rc);
  /* Adds an entry or replaces the one of that name; the value is copied. CMPI_RC_ERR_INVALID_DATA_TYPE. */
  CMPIStatus (*addEntry)(const CMPIContext* ctx, const char* name, const CMPIValue* value, const CMPIType type);
};

/* The context of a request, valid for the length of the call that it came with. */
struct _CMPIContext {
  void* hdl;         /* The broker's own. */
  CMPIContextFT* ft; /* Its functions. */
};

/* Where a provider puts its results, valid for the length of the call that it came with. */
struct _CMPIResult {
  void* hdl;        /* The broker's own. */
  CMPIResultFT* ft; /* Its functions. */
};

/* Handing out results, as many as the operation has, one at a time. What is handed out is copied or taken over by the
 * broker and need not be kept. */
struct _CMPIResultFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPIResult* rslt);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPIResult* (*clone)(const CMPIResult* rslt, CMPIStatus* rc);
  /* Hands out a value: a property or a method's return value. CMPI_RC_ERR_INVALID_DATA_TYPE. */
  CMPIStatus (*returnData)(const CMPIResult* rslt, const CMPIValue* value, const CMPIType type);
  /* Hands out an instance. */
  CMPIStatus (*returnInstance)(const CMPIResult* rslt, const CMPIInstance* inst);
  /* Hands out an object path. */
  CMPIStatus (*returnObjectPath)(const CMPIResult* rslt, const CMPIObjectPath* ref);
  /* Says that all results were handed out; nothing may follow. */
  CMPIStatus (*returnDone)(const CMPIResult* rslt);
#ifdef CMPI_VER_200
  /* Adds an error object to the answer. Several may be given; they go out with the status that the operation
   * returns. */
  CMPIStatus (*returnError)(const CMPIResult* rslt, const CMPIError* er);
#endif
};

/* ---- Objects ---- */

#ifdef CMPI_VER_200
/* An error in the detail of CIM_Error, made by newCMPIError. */
struct _CMPIError {
  void* hdl;       /* The broker's own. */
  CMPIErrorFT* ft; /* Its functions. */
};
#endif

#ifdef CMPI_VER_200
/* Reading and completing an error. Getters of what was never set give null or the value for unknown.
 * CMPI_RC_ERR_INVALID_HANDLE if the object is no error. */
struct _CMPIErrorFT {
  /* Version of this table. */
  CMPISint32 ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPIError* er);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPIError* (*clone)(const CMPIError* er, CMPIStatus* rc);
  /* Which kind of error it is. */
  CMPIErrorType (*getErrorType)(const CMPIError* er, CMPIStatus* rc);
  /* The kind in words, where getErrorType gives OtherErrorType. */
  CMPIString* (*getOtherErrorType)(const CMPIError* er, CMPIStatus* rc);
  /* Who defined the message, such as "DMTF". */
  CMPIString* (*getOwningEntity)(const CMPIError* er, CMPIStatus* rc);
  /* The id of the message, unique for its owner. */
  CMPIString* (*getMessageID)(const CMPIError* er, CMPIStatus* rc);
  /* The text of the message. */
  CMPIString* (*getMessage)(const CMPIError* er, CMPIStatus* rc);
  /* How severe it is. */
  CMPIErrorSeverity (*getPerceivedSeverity)(const CMPIError* er, CMPIStatus* rc);
  /* The cause, as a code. */
  CMPIErrorProbableCause (*getProbableCause)(const CMPIError* er, CMPIStatus* rc);
  /* The cause in words. */
  CMPIString* (*getProbableCauseDescription)(const CMPIError* er, CMPIStatus* rc);
  /* What can be done about it, an array of strings. */
  CMPIArray* (*getRecommendedActions)(const CMPIError* er, CMPIStatus* rc);
  /* Where it arose: the path of the object, in the form that getErrorSourceFormat gives. */
  CMPIString* (*getErrorSource)(const CMPIError* er, CMPIStatus* rc);
  /* The form of getErrorSource's text. */
  CMPIErrorSrcFormat (*getErrorSourceFormat)(const CMPIError* er, CMPIStatus* rc);
  /* That form in words, where getErrorSourceFormat gives CMPIErrSrcOther. */
  CMPIString* (*getOtherErrorSourceFormat)(const CMPIError* er, CMPIStatus* rc);
  /* The status code of the error. */
  CMPIrc (*getCIMStatusCode)(const CMPIError* er, CMPIStatus* rc);
  /* That status code in words. */
  CMPIString* (*getCIMStatusCodeDescription)(const CMPIError* er, CMPIStatus* rc);
  /* The values that were put into the message, an array of strings. */
  CMPIArray* (*getMessageArguments)(const CMPIError* er, CMPIStatus* rc);
  /* Sets the kind of error. */
  CMPIStatus (*setErrorType)(CMPIError* er, const CMPIErrorType errorType);
  /* Sets the kind in words, for the kind OtherErrorType. */
  CMPIStatus (*setOtherErrorType)(CMPIError* er, const char* errorType);
  /* Sets the cause in words. */
  CMPIStatus (*setProbableCauseDescription)(CMPIError* er, const char* description);
  /* Sets what can be done about it, an array of strings, which is copied. */
  CMPIStatus (*setRecommendedActions)(CMPIError* er, const CMPIArray* actions);
  /* Sets where it arose. */
  CMPIStatus (*setErrorSource)(CMPIError* er, const char* source);
  /* Sets the form of the text given to setErrorSource. */
  CMPIStatus (*setErrorSourceFormat)(CMPIError* er, const CMPIErrorSrcFormat format);
  /* Sets that form in words, for the form CMPIErrSrcOther. */
  CMPIStatus (*setOtherErrorSourceFormat)(CMPIError* er, const char* format);
  /* Sets the status code in words. */
  CMPIStatus (*setCIMStatusCodeDescription)(CMPIError* er, const char* description);
  /* Sets the values that were put into the message, an array of strings, which is copied. */
  CMPIStatus (*setMessageArguments)(CMPIError* er, CMPIArray* arguments);
};
#endif

/* An instance of a CIM class. */
struct _CMPIInstance {
  void* hdl;          /* The broker's own. */
  CMPIInstanceFT* ft; /* Its functions. */
};

/* The properties and the path of an instance. Property names match without regard to case. */
struct _CMPIInstanceFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPIInstance* inst);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPIInstance* (*clone)(const CMPIInstance* inst, CMPIStatus* rc);
  /* The property called name. CMPI_RC_ERR_NO_SUCH_PROPERTY; where it exists without a value, the state has
   * CMPI_nullValue. */
  CMPIData (*getProperty)(const CMPIInstance* inst, const char* name, CMPIStatus* rc);
  /* The property at index, counted from 0, and its name in *name if name is not null. CMPI_RC_ERR_NO_SUCH_PROPERTY past
   * the end. */
  CMPIData (*getPropertyAt)(const CMPIInstance* inst, CMPICount index, CMPIString** name, CMPIStatus* rc);
  /* The number of properties. */
  CMPICount (*getPropertyCount)(const CMPIInstance* inst, CMPIStatus* rc);
  /* Sets a property to a copy of *value; a null value makes it null. With a property filter in place, what it does not
   * list is ignored with CMPI_RC_OK. CMPI_RC_ERR_TYPE_MISMATCH, CMPI_RC_ERR_NO_SUCH_PROPERTY. */
  CMPIStatus (*setProperty)(const CMPIInstance* inst, const char* name, const CMPIValue* value, CMPIType type);
  /* The instance's path, made of its class, its namespace and its key properties. */
  CMPIObjectPath* (*getObjectPath)(const CMPIInstance* inst, CMPIStatus* rc);
  /* From now on only the properties in propertyList and keys are taken by setProperty; both lists end with a null. A
   * null propertyList lifts the filter. Set it before any property. */
  CMPIStatus (*setPropertyFilter)(CMPIInstance* inst, const char** propertyList, const char** keys);
  /* Gives the instance the path op; where keys differ from key properties, the path's apply. */
  CMPIStatus (*setObjectPath)(CMPIInstance* inst, const CMPIObjectPath* op);
#ifdef CMPI_VER_200
  /* As setProperty, and notes origin as the class that defined the property. */
  CMPIStatus (*setPropertyWithOrigin)(const CMPIInstance* inst, const char* name, const CMPIValue* value,
                                      const CMPIType type, const char* origin);
#endif
};

/* The name of an instance or class: host, namespace, class, keys. */
struct _CMPIObjectPath {
  void* hdl;            /* The broker's own. */
  CMPIObjectPathFT* ft; /* Its functions. */
};

/* The parts of an object path, and the qualifiers of the class that it names. Texts given are copied. Names of keys
 * match without regard to case. */
struct _CMPIObjectPathFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPIObjectPath* op);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPIObjectPath* (*clone)(const CMPIObjectPath* op, CMPIStatus* rc);
  /* Sets the namespace. */
  CMPIStatus (*setNameSpace)(CMPIObjectPath* op, const char* ns);
  /* The namespace; an empty string where none was set. */
  CMPIString* (*getNameSpace)(const CMPIObjectPath* op, CMPIStatus* rc);
  /* Sets the host. */
  CMPIStatus (*setHostname)(CMPIObjectPath* op, const char* hn);
  /* The host; an empty string where none was set. */
  CMPIString* (*getHostname)(const CMPIObjectPath* op, CMPIStatus* rc);
  /* Sets the class. */
  CMPIStatus (*setClassName)(CMPIObjectPath* op, const char* cn);
  /* The class; an empty string where none was set. */
  CMPIString* (*getClassName)(const CMPIObjectPath* op, CMPIStatus* rc);
  /* Adds a key, or replaces the one of that name, with a copy of *value. CMPI_RC_ERR_INVALID_DATA_TYPE for types that
   * cannot be keys. */
  CMPIStatus (*addKey)(CMPIObjectPath* op, const char* name, const CMPIValue* value, const CMPIType type);
  /* The key called name; its state has CMPI_keyValue. CMPI_RC_ERR_NOT_FOUND. */
  CMPIData (*getKey)(const CMPIObjectPath* op, const char* name, CMPIStatus* rc);
  /* The key at index, counted from 0, and its name in *name if name is not null. CMPI_RC_ERR_NOT_FOUND past the end. */
  CMPIData (*getKeyAt)(const CMPIObjectPath* op, CMPICount index, CMPIString** name, CMPIStatus* rc);
  /* The number of keys. */
  CMPICount (*getKeyCount)(const CMPIObjectPath* op, CMPIStatus* rc);
  /* Takes over the namespace of src. */
  CMPIStatus (*setNameSpaceFromObjectPath)(CMPIObjectPath* op, const CMPIObjectPath* src);
  /* Takes over the host and the namespace of src. */
  CMPIStatus (*setHostAndNameSpaceFromObjectPath)(CMPIObjectPath* op, const CMPIObjectPath* src);
  /* The class's qualifier qName. This and the next three: CMPI_RC_ERR_NOT_FOUND if there is none,
   * CMPI_RC_ERR_NOT_SUPPORTED where the broker lacks CMPI_MB_Supports_Qualifier. */
  CMPIData (*getClassQualifier)(const CMPIObjectPath* op, const char* qName, CMPIStatus* rc);
  /* The qualifier qName of the property pName. */
  CMPIData (*getPropertyQualifier)(const CMPIObjectPath* op, const char* pName, const char* qName, CMPIStatus* rc);
  /* The qualifier qName of the method methodName. */
  CMPIData (*getMethodQualifier)(const CMPIObjectPath* op, const char* methodName, const char* qName, CMPIStatus* rc);
  /* The qualifier qName of the parameter pName of the method mName. */
  CMPIData (*getParameterQualifier)(const CMPIObjectPath* op, const char* mName, const char* pName, const char* qName,
                                    CMPIStatus* rc);
  /* The path as text; its form is the broker's own, commonly that of DSP0207. */
  CMPIString* (*toString)(const CMPIObjectPath* op, CMPIStatus* rc);
};

/* A compiled query, such as an indication filter. */
struct _CMPISelectExp {
  void* hdl;           /* The broker's own. */
  CMPISelectExpFT* ft; /* Its functions. */
};

/* Evaluating a query, or taking its WHERE clause apart. */
struct _CMPISelectExpFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPISelectExp* se);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPISelectExp* (*clone)(const CMPISelectExp* se, CMPIStatus* rc);
  /* Whether inst matches the query. CMPI_RC_ERR_NOT_SUPPORTED, CMPI_RC_ERR_INVALID_QUERY. */
  CMPIBoolean (*evaluate)(const CMPISelectExp* se, const CMPIInstance* inst, CMPIStatus* rc);
  /* The query's text. */
  CMPIString* (*getString)(const CMPISelectExp* se, CMPIStatus* rc);
  /* The WHERE clause as a disjunction of conjunctions; null with CMPI_RC_OK if there is none. CMPI_RC_ERR_NOT_SUPPORTED
   * where the broker lacks CMPI_MB_Supports_QueryNormalization. */
  CMPISelectCond* (*getDOC)(const CMPISelectExp* se, CMPIStatus* rc);
  /* The WHERE clause as a conjunction of disjunctions, otherwise as getDOC. */
  CMPISelectCond* (*getCOD)(const CMPISelectExp* se, CMPIStatus* rc);
  /* As evaluate, but asks accessor(name, parm) for each property value, so that no instance is needed. */
  CMPIBoolean (*evaluateUsingAccessor)(const CMPISelectExp* se, CMPIAccessor* accessor, void* parm, CMPIStatus* rc);
};

/* A WHERE clause in a normal form. */
struct _CMPISelectCond {
  void* hdl;            /* The broker's own. */
  CMPISelectCondFT* ft; /* Its functions. */
};

/* The outer level of a normal form: its sub-conditions. */
struct _CMPISelectCondFT {
  const int ftVersion; /* Version of this table. */
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPISelectCond* sc);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPISelectCond* (*clone)(const CMPISelectCond* sc, CMPIStatus* rc);
  /* The number of sub-conditions; *type, if type is not null, becomes CMPI_COND_DOC (0) or CMPI_COND_COD (1). */
  CMPICount (*getCountAndType)(const CMPISelectCond* sc, int* type, CMPIStatus* rc);
  /* The sub-condition at index, counted from 0. CMPI_RC_ERR_NOT_FOUND past the end. */
  CMPISubCond* (*getSubCondAt)(const CMPISelectCond* sc, CMPICount index, CMPIStatus* rc);
};

/* One conjunction, or disjunction, of predicates. */
struct _CMPISubCond {
  void* hdl;         /* The broker's own. */
  CMPISubCondFT* ft; /* Its functions. */
};

/* The inner level of a normal form: its predicates. */
struct _CMPISubCondFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPISubCond* sc);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPISubCond* (*clone)(const CMPISubCond* sc, CMPIStatus* rc);
  /* The number of predicates. */
  CMPICount (*getCount)(const CMPISubCond* sc, CMPIStatus* rc);
  /* The predicate at index, counted from 0. CMPI_RC_ERR_NOT_FOUND past the end. */
  CMPIPredicate* (*getPredicateAt)(const CMPISubCond* sc, CMPICount index, CMPIStatus* rc);
  /* The predicate whose left-hand side is the property name. CMPI_RC_ERR_NOT_FOUND. */
  CMPIPredicate* (*getPredicate)(const CMPISubCond* sc, const char* name, CMPIStatus* rc);
};

/* One comparison. */
struct _CMPIPredicate {
  void* hdl;           /* The broker's own. */
  CMPIPredicateFT* ft; /* Its functions. */
};

/* What a predicate compares, and its evaluation. */
struct _CMPIPredicateFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPIPredicate* pr);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPIPredicate* (*clone)(const CMPIPredicate* pr, CMPIStatus* rc);
  /* The parts of the comparison: type of its operands, operator, left-hand and right-hand side as text. Null pointers
   * are passed over. */
  CMPIStatus (*getData)(const CMPIPredicate* pr, CMPIType* type, CMPIPredOp* op, CMPIString** lhs, CMPIString** rhs);
  /* Whether the comparison holds for the values that accessorFnc(name, parm) gives. */
  CMPIBoolean (*evaluateUsingAccessor)(const CMPIPredicate* pr, CMPIAccessor* accessorFnc, void* parm, CMPIStatus* rc);
};

/* The arguments of a method. */
struct _CMPIArgs {
  void* hdl;      /* The broker's own. */
  CMPIArgsFT* ft; /* Its functions. */
};

/* Arguments by name. Names match without regard to case. */
struct _CMPIArgsFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPIArgs* as);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPIArgs* (*clone)(const CMPIArgs* as, CMPIStatus* rc);
  /* Adds an argument, or replaces the one of that name, with a copy of *value; a null value makes it null.
   * CMPI_RC_ERR_INVALID_DATA_TYPE. */
  CMPIStatus (*addArg)(const CMPIArgs* as, const char* name, const CMPIValue* value, const CMPIType type);
  /* The argument called name. CMPI_RC_ERR_NOT_FOUND. */
  CMPIData (*getArg)(const CMPIArgs* as, const char* name, CMPIStatus* rc);
  /* The argument at index, counted from 0, and its name in *name if name is not null. CMPI_RC_ERR_NOT_FOUND past the
   * end. */
  CMPIData (*getArgAt)(const CMPIArgs* as, CMPICount index, CMPIString** name, CMPIStatus* rc);
  /* The number of arguments. */
  CMPICount (*getArgCount)(const CMPIArgs* as, CMPIStatus* rc);
};

/* A string that never changes. */
struct _CMPIString {
  void* hdl;        /* The broker's own. */
  CMPIStringFT* ft; /* Its functions. */
};

/* Reading a string. */
struct _CMPIStringFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPIString* st);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPIString* (*clone)(const CMPIString* st, CMPIStatus* rc);
  /* The text, UTF-8 and NUL-terminated. It belongs to the string and ends with it. */
  const char* (*getCharPtr)(const CMPIString* st, CMPIStatus* rc);
};

/* An array of fixed size, its elements all of one type. */
struct _CMPIArray {
  void* hdl;       /* The broker's own. */
  CMPIArrayFT* ft; /* Its functions. */
};

/* The elements of an array. */
struct _CMPIArrayFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPIArray* ar);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPIArray* (*clone)(const CMPIArray* ar, CMPIStatus* rc);
  /* The number of elements. */
  CMPICount (*getSize)(const CMPIArray* ar, CMPIStatus* rc);
  /* The type of one element, without CMPI_ARRAY. */
  CMPIType (*getSimpleType)(const CMPIArray* ar, CMPIStatus* rc);
  /* The element at index, counted from 0. CMPI_RC_ERR_NO_SUCH_PROPERTY or CMPI_RC_ERR_NOT_FOUND past the end, as the
   * broker has it. */
  CMPIData (*getElementAt)(const CMPIArray* ar, CMPICount index, CMPIStatus* rc);
  /* Sets the element at index to a copy of *value; type is the array's element type, or CMPI_null to make the element
   * null. CMPI_RC_ERR_TYPE_MISMATCH. */
  CMPIStatus (*setElementAt)(CMPIArray* ar, CMPICount index, const CMPIValue* value, CMPIType type);
};

/* The answer of an up-call, read once from front to back. */
struct _CMPIEnumeration {
  void* hdl;             /* The broker's own. */
  CMPIEnumerationFT* ft; /* Its functions. */
};

/* Reading an enumeration. One reader at a time. */
struct _CMPIEnumerationFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPIEnumeration* en);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPIEnumeration* (*clone)(const CMPIEnumeration* en, CMPIStatus* rc);
  /* The next element. CMPI_RC_ERR_NOT_FOUND past the end. */
  CMPIData (*getNext)(const CMPIEnumeration* en, CMPIStatus* rc);
  /* Whether getNext has another element to give. */
  CMPIBoolean (*hasNext)(const CMPIEnumeration* en, CMPIStatus* rc);
  /* All elements as an array, whatever was read before. */
  CMPIArray* (*toArray)(const CMPIEnumeration* en, CMPIStatus* rc);
};

/* A point in time or an interval. */
struct _CMPIDateTime {
  void* hdl;          /* The broker's own. */
  CMPIDateTimeFT* ft; /* Its functions. */
};

/* Reading a date and time. */
struct _CMPIDateTimeFT {
  /* Version of this table. */
  int ftVersion;
  /* Ends an object that clone made; it must not be used afterwards. What was not cloned is left to the broker. */
  CMPIStatus (*release)(CMPIDateTime* dt);
  /* A copy of the object that lives until release; null on failure, with the reason in *rc. */
  CMPIDateTime* (*clone)(const CMPIDateTime* dt, CMPIStatus* rc);
  /* Microseconds: since 1970-01-01 00:00 UTC, or the length of the interval. */
  CMPIUint64 (*getBinaryFormat)(const CMPIDateTime* dt, CMPIStatus* rc);
  /* The 25 characters of CIM's datetime format (DSP0004). */
  CMPIString* (*getStringFormat)(const CMPIDateTime* dt, CMPIStatus* rc);
  /* Whether it is an interval. */
  CMPIBoolean (*isInterval)(const CMPIDateTime* dt, CMPIStatus* rc);
};

/* ---- Providers ---- */

/* A provider of instances, as its create function returns it; the memory is the provider's. */
struct _CMPIInstanceMI {
  const void* hdl;      /* The provider's own. */
  CMPIInstanceMIFT* ft; /* Its functions. */
};

/* What a provider of instances does. The broker may call any of these in several threads at once. A function that the
 * provider does not offer answers CMPI_RC_ERR_NOT_SUPPORTED; none may be null. op is the class or instance that the
 * request is about, results go to rslt, and the status is that of the CIM operation. */
struct _CMPIInstanceMIFT {
  int ftVersion;      /* Version of this table: CMPICurrentVersion of the provider's headers. */
  int miVersion;      /* The provider's version, in its own count. */
  const char* miName; /* The provider's name, NUL-terminated, for messages of the broker. */
  /* The provider is about to be unloaded and frees what it holds. Unless terminating is not 0, it may refuse with
   * CMPI_RC_DO_NOT_UNLOAD for now or CMPI_RC_NEVER_UNLOAD for good. */
  CMPIStatus (*cleanup)(CMPIInstanceMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
  /* Hands out the path of every instance of op's class that this provider has. */
  CMPIStatus (*enumerateInstanceNames)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                       const CMPIObjectPath* op);
  /* Hands out every instance of op's class that this provider has, with only the listed properties if properties (ended
   * by a null) is not null. */
  CMPIStatus (*enumerateInstances)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                   const CMPIObjectPath* op, const char** properties);
  /* Hands out the instance op, its properties as in enumerateInstances. CMPI_RC_ERR_NOT_FOUND. */
  CMPIStatus (*getInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                            const CMPIObjectPath* op, const char** properties);
  /* Creates inst and hands out its path. CMPI_RC_ERR_ALREADY_EXISTS, CMPI_RC_ERR_INVALID_PARAMETER. */
  CMPIStatus (*createInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                               const CMPIObjectPath* op, const CMPIInstance* inst);
  /* Changes the instance op to the values of inst: all of them, or only those listed in properties (ended by a null).
   * CMPI_RC_ERR_NOT_FOUND. */
  CMPIStatus (*modifyInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                               const CMPIObjectPath* op, const CMPIInstance* inst, const char** properties);
  /* Deletes the instance op. CMPI_RC_ERR_NOT_FOUND. */
  CMPIStatus (*deleteInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                               const CMPIObjectPath* op);
  /* Hands out the instances of op's class that match query in the language lang.
   * CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, CMPI_RC_ERR_INVALID_QUERY. */
  CMPIStatus (*execQuery)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt, const CMPIObjectPath* op,
                          const char* query, const char* lang);
};

/* A provider of associations, as its create function returns it; the memory is the provider's. */
struct _CMPIAssociationMI {
  void* hdl;               /* The provider's own. */
  CMPIAssociationMIFT* ft; /* Its functions. */
};

/* What a provider of associations does; the rules of CMPIInstanceMIFT hold. A null filter does not filter. */
struct _CMPIAssociationMIFT {
  int ftVersion;              /* Version of this table: CMPICurrentVersion of the provider's headers. */
  const CMPISint32 miVersion; /* The provider's version, in its own count. */
  const char* miName;         /* The provider's name, NUL-terminated, for messages of the broker. */
  /* As in CMPIInstanceMIFT. */
  CMPIStatus (*cleanup)(CMPIAssociationMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
  /* Hands out the instances associated with the instance op: through an association of class asscClass, of class
   * resultClass, where op plays role and they play resultRole; of their properties those listed in properties (ended by
   * a null), all if it is null. */
  CMPIStatus (*associators)(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                            const CMPIObjectPath* op, const char* asscClass, const char* resultClass, const char* role,
                            const char* resultRole, const char** properties);
  /* Hands out the paths of the instances that associators would. */
  CMPIStatus (*associatorNames)(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                const CMPIObjectPath* op, const char* assocClass, const char* resultClass,
                                const char* role, const char* resultRole);
  /* Hands out the association instances of class resultClass in which op plays role; properties as in associators. */
  CMPIStatus (*references)(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                           const CMPIObjectPath* op, const char* resultClass, const char* role,
                           const char** properties);
  /* Hands out the paths of the instances that references would. */
  CMPIStatus (*referenceNames)(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                               const CMPIObjectPath* op, const char* resultClass, const char* role);
};

/* A provider of methods, as its create function returns it; the memory is the provider's. */
struct _CMPIMethodMI {
  void* hdl;          /* The provider's own. */
  CMPIMethodMIFT* ft; /* Its functions. */
};

/* What a provider of methods does; the rules of CMPIInstanceMIFT hold. */
struct _CMPIMethodMIFT {
  int ftVersion;      /* Version of this table: CMPICurrentVersion of the provider's headers. */
  int miVersion;      /* The provider's version, in its own count. */
  const char* miName; /* The provider's name, NUL-terminated, for messages of the broker. */
  /* As in CMPIInstanceMIFT. */
  CMPIStatus (*cleanup)(CMPIMethodMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
  /* Runs method of the instance, or class, op with the arguments in; puts output arguments into out and hands out the
   * return value. CMPI_RC_ERR_METHOD_NOT_FOUND, CMPI_RC_ERR_METHOD_NOT_AVAILABLE. */
  CMPIStatus (*invokeMethod)(CMPIMethodMI* mi, const CMPIContext* ctx, const CMPIResult* rslt, const CMPIObjectPath* op,
                             const char* method, const CMPIArgs* in, CMPIArgs* out);
};

/* A provider of single properties, as its create function returns it; the memory is the provider's. */
struct _CMPIPropertyMI {
  void* hdl;            /* The provider's own. */
  CMPIPropertyMIFT* ft; /* Its functions. */
};

/* What a provider of single properties does; the rules of CMPIInstanceMIFT hold. */
struct _CMPIPropertyMIFT {
  int ftVersion;      /* Version of this table: CMPICurrentVersion of the provider's headers. */
  int miVersion;      /* The provider's version, in its own count. */
  const char* miName; /* The provider's name, NUL-terminated, for messages of the broker. */
  /* As in CMPIInstanceMIFT. */
  CMPIStatus (*cleanup)(CMPIPropertyMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
  /* Sets the property name of the instance op to data. CMPI_RC_ERR_NO_SUCH_PROPERTY, CMPI_RC_ERR_TYPE_MISMATCH. */
  CMPIStatus (*setProperty)(CMPIPropertyMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                            const CMPIObjectPath* op, const char* name, const CMPIData data);
  /* Hands out the property name of the instance op. CMPI_RC_ERR_NO_SUCH_PROPERTY. */
  CMPIStatus (*getProperty)(CMPIPropertyMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                            const CMPIObjectPath* op, const char* name);
#ifdef CMPI_VER_200
  /* As setProperty, and notes origin as the class that defined the property. May be null. */
  CMPIStatus (*setPropertyWithOrigin)(CMPIPropertyMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                      CMPIObjectPath* op, const char* name, const CMPIData data, const char* origin);
#endif
};

/* A provider of indications, as its create function returns it; the memory is the provider's. */
struct _CMPIIndicationMI {
  void* hdl;              /* The provider's own. */
  CMPIIndicationMIFT* ft; /* Its functions. */
};

/* What a provider of indications does; the rules of CMPIInstanceMIFT hold. filter is the subscription's query,
 * className the class that it names. */
struct _CMPIIndicationMIFT {
  int ftVersion;      /* Version of this table: CMPICurrentVersion of the provider's headers. */
  int miVersion;      /* The provider's version, in its own count. */
  const char* miName; /* The provider's name, NUL-terminated, for messages of the broker. */
  /* As in CMPIInstanceMIFT. */
  CMPIStatus (*cleanup)(CMPIIndicationMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
  /* Whether owner may subscribe with filter: CMPI_RC_OK, or CMPI_RC_ERR_ACCESS_DENIED. */
  CMPIStatus (*authorizeFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx, const CMPISelectExp* filter,
                                const char* className, const CMPIObjectPath* op, const char* owner);
  /* Whether the broker has to poll for filter: CMPI_RC_OK if it has, CMPI_RC_ERR_NOT_SUPPORTED if the provider watches
   * for itself. */
  CMPIStatus (*mustPoll)(CMPIIndicationMI* mi, const CMPIContext* ctx, const CMPISelectExp* filter,
                         const char* className, const CMPIObjectPath* classPath);
  /* Begins to watch for filter; firstActivation is not 0 for the first subscription with this filter.
   * CMPI_RC_ERR_NOT_SUPPORTED, CMPI_RC_ERR_INVALID_QUERY. */
  CMPIStatus (*activateFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx, const CMPISelectExp* filter,
                               const char* className, const CMPIObjectPath* classPath, CMPIBoolean firstActivation);
  /* Ends watching for filter; lastActiviation is not 0 when no subscription with it is left. */
  CMPIStatus (*deActivateFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx, const CMPISelectExp* filter,
                                 const char* className, const CMPIObjectPath* classPath, CMPIBoolean lastActiviation);
  /* From now on the provider may deliver indications. May be null. */
  CMPIStatus (*enableIndications)(CMPIIndicationMI* mi, const CMPIContext* ctx);
  /* From now on the provider must not deliver indications; its filters stay active. May be null. */
  CMPIStatus (*disableIndications)(CMPIIndicationMI* mi, const CMPIContext* ctx);
};

#ifdef __cplusplus
}
#endif

#include "cmpimacs.h"

#endif /* _CMPIFT_H_ */
