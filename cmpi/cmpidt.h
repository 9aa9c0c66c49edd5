/* CMPI, the Common Manageability Programming Interface (The Open Group), version 2.0: types and constants.
 *
 * CMPI_VERSION, if defined before the include, is the version of the interface that the program needs: 100 or 200.
 * Without it, it is 200. Then CMPI_VER_200 and CMPI_VER_100 are defined, for 100 only CMPI_VER_100, and the parts new
 * in 2.0 are left out. */

#ifndef _CMPIDT_H_
#define _CMPIDT_H_

#include "cmpipl.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Versions of the interface. */
#define CMPIVersion100 100
#define CMPIVersion200 200

#if defined(CMPI_VERSION)
#if CMPI_VERSION == 200
#ifndef CMPI_VER_200
#define CMPI_VER_200 1
#endif
#elif CMPI_VERSION == 100
#ifndef CMPI_VER_100
#define CMPI_VER_100 1
#endif
#else
#error "CMPI: CMPI_VERSION must be 100 or 200"
#endif
#elif !defined(CMPI_VER_200)
#define CMPI_VER_200 1
#endif

#if defined(CMPI_VER_ALL) && !defined(CMPI_VER_200)
#define CMPI_VER_200 1
#endif

/* The version that tables of this program have. */
#ifdef CMPI_VER_200
#ifndef CMPI_VER_100
#define CMPI_VER_100 1
#endif
#define CMPICurrentVersion CMPIVersion200
#else
#define CMPICurrentVersion CMPIVersion100
#endif

/* The objects of CMPI; cmpift.h has their definitions. */
typedef struct _CMPIBroker CMPIBroker;           /* The broker, given to a provider when it is created */
typedef struct _CMPIInstance CMPIInstance;       /* Instance of a class */
typedef struct _CMPIObjectPath CMPIObjectPath;   /* Name of an instance or class */
typedef struct _CMPIArgs CMPIArgs;               /* Arguments of a method */
typedef struct _CMPISelectExp CMPISelectExp;     /* Compiled query */
typedef struct _CMPISelectCond CMPISelectCond;   /* WHERE clause in a normal form */
typedef struct _CMPISubCond CMPISubCond;         /* Inner level of a normal form */
typedef struct _CMPIPredicate CMPIPredicate;     /* One comparison */
typedef struct _CMPIEnumeration CMPIEnumeration; /* Answer of an up-call */
typedef struct _CMPIArray CMPIArray;             /* Array */
typedef struct _CMPIString CMPIString;           /* String */
typedef struct _CMPIResult CMPIResult;           /* Where results go */
typedef struct _CMPIContext CMPIContext;         /* Context of a request */
typedef struct _CMPIDateTime CMPIDateTime;       /* Point in time or interval */
typedef struct _CMPIError CMPIError;             /* Error in detail */

/* Their function tables. */
typedef struct _CMPIBrokerMemFT CMPIBrokerMemFT;
typedef struct _CMPIErrorFT CMPIErrorFT;
typedef struct _CMPIBrokerFT CMPIBrokerFT;
typedef struct _CMPIBrokerEncFT CMPIBrokerEncFT;
typedef struct _CMPIBrokerExtFT CMPIBrokerExtFT;
typedef struct _CMPIInstanceFT CMPIInstanceFT;
typedef struct _CMPIObjectPathFT CMPIObjectPathFT;
typedef struct _CMPIArgsFT CMPIArgsFT;
typedef struct _CMPISelectExpFT CMPISelectExpFT;
typedef struct _CMPISelectCondFT CMPISelectCondFT;
typedef struct _CMPISubCondFT CMPISubCondFT;
typedef struct _CMPIPredicateFT CMPIPredicateFT;
typedef struct _CMPIEnumerationFT CMPIEnumerationFT;
typedef struct _CMPIArrayFT CMPIArrayFT;
typedef struct _CMPIStringFT CMPIStringFT;
typedef struct _CMPIResultFT CMPIResultFT;
typedef struct _CMPIContextFT CMPIContextFT;
typedef struct _CMPIDateTimeFT CMPIDateTimeFT;

/* Named by the standard, never defined. */
struct _CMPISelectCondDocFT;
struct _CMPISelectCondCodFT;
struct _CMPIresultFT;

/* The types of plain values. */
typedef unsigned int CMPICount;        /* Numbers of elements, and positions */
typedef unsigned char CMPIBoolean;     /* 0 or 1 */
typedef unsigned short CMPIChar16;     /* UTF-16 code unit */
typedef unsigned char CMPIUint8;       /* Unsigned, 8 bits */
typedef unsigned short CMPIUint16;     /* Unsigned, 16 bits */
typedef unsigned int CMPIUint32;       /* Unsigned, 32 bits */
typedef unsigned long long CMPIUint64; /* Unsigned, 64 bits */
typedef signed char CMPISint8;         /* Signed, 8 bits */
typedef short CMPISint16;              /* Signed, 16 bits */
typedef int CMPISint32;                /* Signed, 32 bits */
typedef long long CMPISint64;          /* Signed, 64 bits */
typedef float CMPIReal32;              /* IEEE 754 single */
typedef double CMPIReal64;             /* IEEE 754 double */

/* Which type a value has: one of the constants below. */
typedef unsigned short CMPIType;

/* Types of values. Bits of a kind can be tested: type & CMPI_ENC means a pointer, type & CMPI_ARRAY an array. */
#define CMPI_null 0                          /* No type, as that of a missing value */
#define CMPI_SIMPLE (2)                      /* Bit of the simple types */
#define CMPI_boolean (2 + 0)                 /* Truth value */
#define CMPI_char16 (2 + 1)                  /* UTF-16 code unit */
#define CMPI_REAL (2 << 2)                   /* Bit of the floating-point types */
#define CMPI_real32 ((2 + 0) << 2)           /* IEEE 754 single */
#define CMPI_real64 ((2 + 1) << 2)           /* IEEE 754 double */
#define CMPI_UINT (8 << 4)                   /* Bit of the integers, set in all of them */
#define CMPI_uint8 ((8 + 0) << 4)            /* Unsigned, 8 bits */
#define CMPI_uint16 ((8 + 1) << 4)           /* Unsigned, 16 bits */
#define CMPI_uint32 ((8 + 2) << 4)           /* Unsigned, 32 bits */
#define CMPI_uint64 ((8 + 3) << 4)           /* Unsigned, 64 bits */
#define CMPI_SINT ((8 + 4) << 4)             /* Bits of the signed integers */
#define CMPI_sint8 ((8 + 4) << 4)            /* Signed, 8 bits */
#define CMPI_sint16 ((8 + 5) << 4)           /* Signed, 16 bits */
#define CMPI_sint32 ((8 + 6) << 4)           /* Signed, 32 bits */
#define CMPI_sint64 ((8 + 7) << 4)           /* Signed, 64 bits */
#define CMPI_INTEGER (CMPI_UINT | CMPI_SINT) /* Bits of the integers of both kinds */
#define CMPI_ENC (16 << 8)                   /* Bit of the encapsulated types, which are pointers */
#define CMPI_instance ((16 + 0) << 8)        /* CMPIInstance* */
#define CMPI_ref ((16 + 1) << 8)             /* CMPIObjectPath* */
#define CMPI_args ((16 + 2) << 8)            /* CMPIArgs* */
#define CMPI_class ((16 + 3) << 8)           /* A class; reserved */
#define CMPI_filter ((16 + 4) << 8)          /* CMPISelectExp* */
#define CMPI_enumeration ((16 + 5) << 8)     /* CMPIEnumeration* */
#define CMPI_string ((16 + 6) << 8)          /* CMPIString* */
#define CMPI_chars ((16 + 7) << 8)           /* NUL-terminated text */
#define CMPI_dateTime ((16 + 8) << 8)        /* CMPIDateTime* */
#define CMPI_ptr ((16 + 9) << 8)             /* CMPIValuePtr */
#define CMPI_charsptr ((16 + 10) << 8)       /* Array of NUL-terminated texts */

/* Arrays. */
#define CMPI_ARRAY (1 << 13) /* Bit of the arrays: a CMPIArray* of elements of the type in the other bits */
#define CMPI_SIMPLEA (CMPI_ARRAY | CMPI_SIMPLE)     /* Array of a simple type */
#define CMPI_booleanA (CMPI_ARRAY | CMPI_boolean)   /* Array of truth values */
#define CMPI_char16A (CMPI_ARRAY | CMPI_char16)     /* Array of UTF-16 code units */
#define CMPI_REALA (CMPI_ARRAY | CMPI_REAL)         /* Array of a floating-point type */
#define CMPI_real32A (CMPI_ARRAY | CMPI_real32)     /* Array of singles */
#define CMPI_real64A (CMPI_ARRAY | CMPI_real64)     /* Array of doubles */
#define CMPI_UINTA (CMPI_ARRAY | CMPI_UINT)         /* Array of integers */
#define CMPI_uint8A (CMPI_ARRAY | CMPI_uint8)       /* Array of unsigned 8-bit integers */
#define CMPI_uint16A (CMPI_ARRAY | CMPI_uint16)     /* Array of unsigned 16-bit integers */
#define CMPI_uint32A (CMPI_ARRAY | CMPI_uint32)     /* Array of unsigned 32-bit integers */
#define CMPI_uint64A (CMPI_ARRAY | CMPI_uint64)     /* Array of unsigned 64-bit integers */
#define CMPI_SINTA (CMPI_ARRAY | CMPI_SINT)         /* Array of signed integers */
#define CMPI_sint8A (CMPI_ARRAY | CMPI_sint8)       /* Array of signed 8-bit integers */
#define CMPI_sint16A (CMPI_ARRAY | CMPI_sint16)     /* Array of signed 16-bit integers */
#define CMPI_sint32A (CMPI_ARRAY | CMPI_sint32)     /* Array of signed 32-bit integers */
#define CMPI_sint64A (CMPI_ARRAY | CMPI_sint64)     /* Array of signed 64-bit integers */
#define CMPI_INTEGERA (CMPI_ARRAY | CMPI_INTEGER)   /* Array of integers of either kind */
#define CMPI_ENCA (CMPI_ARRAY | CMPI_ENC)           /* Array of an encapsulated type */
#define CMPI_stringA (CMPI_ARRAY | CMPI_string)     /* Array of strings */
#define CMPI_charsA (CMPI_ARRAY | CMPI_chars)       /* Array of NUL-terminated texts */
#define CMPI_dateTimeA (CMPI_ARRAY | CMPI_dateTime) /* Array of dates and times */
#define CMPI_instanceA (CMPI_ARRAY | CMPI_instance) /* Array of instances */
#define CMPI_refA (CMPI_ARRAY | CMPI_ref)           /* Array of object paths */
#define CMPI_charsptrA (CMPI_ARRAY | CMPI_charsptr) /* Array of arrays of NUL-terminated texts */

/* The types of keys that a path in text form tells apart. */
#define CMPI_keyInteger (CMPI_sint64)  /* Integer key */
#define CMPI_keyString (CMPI_string)   /* Text key */
#define CMPI_keyBoolean (CMPI_boolean) /* Truth-value key */
#define CMPI_keyRef (CMPI_ref)         /* Reference key */

/* The meaning of the text of a predicate's operand. */
#define CMPI_charString (CMPI_string)                                /* Any text */
#define CMPI_integerString (CMPI_string | CMPI_sint64)               /* An integer */
#define CMPI_realString (CMPI_string | CMPI_real64)                  /* A floating-point number */
#define CMPI_numericString (CMPI_string | CMPI_sint64 | CMPI_real64) /* A number of either kind */
#define CMPI_booleanString (CMPI_string | CMPI_boolean)              /* A truth value */
#define CMPI_dateTimeString (CMPI_string | CMPI_dateTime)            /* A date and time */
#define CMPI_classNameString (CMPI_string | CMPI_class)              /* The name of a class */
#define CMPI_nameString (CMPI_string | ((16 + 10) << 8))             /* A name */

/* Other names of some types. */
#ifndef CMPI_NO_SYNONYM_SUPPORT
#define CMPI_Byte CMPI_sint8      /* Signed, 8 bits */
#define CMPI_Short CMPI_sint16    /* Signed, 16 bits */
#define CMPI_Int CMPI_sint32      /* Signed, 32 bits */
#define CMPI_Long CMPI_sint64     /* Signed, 64 bits */
#define CMPI_Float CMPI_real32    /* IEEE 754 single */
#define CMPI_Double CMPI_real64   /* IEEE 754 double */
#define CMPI_ByteA CMPI_sint8A    /* Array of signed 8-bit integers */
#define CMPI_ShortA CMPI_sint16A  /* Array of signed 16-bit integers */
#define CMPI_IntA CMPI_sint32A    /* Array of signed 32-bit integers */
#define CMPI_LongA CMPI_sint64A   /* Array of signed 64-bit integers */
#define CMPI_FloatA CMPI_real32A  /* Array of singles */
#define CMPI_DoubleA CMPI_real64A /* Array of doubles */
#endif

/* What is special about a value: bits of the constants below. */
typedef unsigned short CMPIValueState;

#define CMPI_goodValue (0)        /* A value, nothing special about it */
#define CMPI_nullValue (1 << 8)   /* There is no value */
#define CMPI_keyValue (2 << 8)    /* It is a key */
#define CMPI_notFound (4 << 8)    /* What was asked for does not exist */
#define CMPI_badValue (0x80 << 8) /* The value could not be had; what value holds means nothing */

/* A block of memory that the broker does not look into. */
struct _CMPIValuePtr {
  void* ptr;        /* Where it begins. */
  CMPICount length; /* How many bytes it has. */
};

typedef struct _CMPIValuePtr CMPIValuePtr;

/* A value; a CMPIType beside it says which member is valid. */
union _CMPIValue {
  CMPIUint64 uint64;      /* CMPI_uint64 */
  CMPIUint32 uint32;      /* CMPI_uint32 */
  CMPIUint16 uint16;      /* CMPI_uint16 */
  CMPIUint8 uint8;        /* CMPI_uint8 */
  CMPISint64 sint64;      /* CMPI_sint64 */
  CMPISint32 sint32;      /* CMPI_sint32 */
  CMPISint16 sint16;      /* CMPI_sint16 */
  CMPISint8 sint8;        /* CMPI_sint8 */
  CMPIReal64 real64;      /* CMPI_real64 */
  CMPIReal32 real32;      /* CMPI_real32 */
  CMPIBoolean boolean;    /* CMPI_boolean: 0 or 1 */
  CMPIChar16 char16;      /* CMPI_char16: one UTF-16 code unit */
  CMPIInstance* inst;     /* CMPI_instance */
  CMPIObjectPath* ref;    /* CMPI_ref */
  CMPIArgs* args;         /* CMPI_args */
  CMPISelectExp* filter;  /* CMPI_filter */
  CMPIEnumeration* Enum;  /* CMPI_enumeration */
  CMPIArray* array;       /* Any type with CMPI_ARRAY */
  CMPIString* string;     /* CMPI_string */
  char* chars;            /* CMPI_chars: NUL-terminated UTF-8 */
  CMPIDateTime* dateTime; /* CMPI_dateTime */
  CMPIValuePtr dataPtr;   /* CMPI_ptr */
  CMPISint8 Byte;         /* CMPI_Byte */
  CMPISint16 Short;       /* CMPI_Short */
  CMPISint32 Int;         /* CMPI_Int */
  CMPISint64 Long;        /* CMPI_Long */
  CMPIReal32 Float;       /* CMPI_Float */
  CMPIReal64 Double;      /* CMPI_Double */
};

typedef union _CMPIValue CMPIValue;

/* A value with its type and state. Objects in it belong to the function that returned it. */
struct _CMPIData {
  CMPIType type; /* Which member of value holds. */
  /* CMPI_goodValue, or the bits of what is special about it. With CMPI_nullValue, value means nothing. */
  CMPIValueState state;
  CMPIValue value; /* The value. */
};

typedef struct _CMPIData CMPIData;

/* A function of a provider that gives evaluateUsingAccessor the value of the property name; parm is what the caller of
 * evaluateUsingAccessor passed. */
typedef CMPIData CMPIAccessor(const char* name, void* parm);

/* Options of a request, the value of the context entry CMPIInvocationFlags. */
typedef unsigned int CMPIFlags;

#define CMPI_FLAG_LocalOnly 1          /* Only what the class itself defines */
#define CMPI_FLAG_DeepInheritance 2    /* Subclasses' properties too */
#define CMPI_FLAG_IncludeQualifiers 4  /* With qualifiers */
#define CMPI_FLAG_IncludeClassOrigin 8 /* With the class that defined each property */

/* Names of context entries, with the type of their values. */
#define CMPIPrincipal "CMPIPrincipal"             /* CMPI_string: name of the authenticated caller */
#define CMPIInvocationFlags "CMPIInvocationFlags" /* CMPI_uint32: CMPI_FLAG_... bits */
#define CMPIInitNameSpace \
  "CMPIInitNameSpace"       /* CMPI_string: namespace that the provider was registered for, at its creation */
#define CMPIRole "CMPIRole" /* CMPI_string: role of the caller */
#define CMPIAcceptLanguage "CMPIAcceptLanguage"   /* CMPI_string: languages that the caller prefers (RFC 2616, 14.4) */
#define CMPIContentLanguage "CMPIContentLanguage" /* CMPI_string: language of the request's or the answer's texts */

/* What a broker can do: bits of CMPIBrokerFT.brokerCapabilities. */
#define CMPI_MB_Class_0 0x00000001                     /* Broker class 0 */
#define CMPI_MB_Class_1 0x00000003                     /* Broker class 1, which includes class 0 */
#define CMPI_MB_Class_2 0x00000007                     /* Broker class 2, which includes class 1 */
#define CMPI_MB_Supports_PropertyMI 0x00000100         /* Calls providers of single properties */
#define CMPI_MB_Supports_IndicationMI 0x00000200       /* Calls providers of indications */
#define CMPI_MB_Supports_IndicationPolling 0x00000400  /* Polls for indications */
#define CMPI_MB_Supports_QueryNormalization 0x00000800 /* Takes WHERE clauses apart */
#define CMPI_MB_Supports_Qualifier 0x00001000          /* Gives qualifiers */
#define CMPI_MB_Supports_Schema 0x00003000             /* Gives the schema, qualifiers included */

#ifdef CMPI_VER_200
#define CMPI_MB_Supports_MemEnhancements 0x00004000 /* Has CMPIBrokerMemFT */
#define CMPI_MB_Supports_Extended_Error 0x00008000  /* Has CMPIError */
#endif

/* What a broker can do, by the functional groups of CIM operations (DSP0200). The bits overlap with those above: one
 * number follows one list or the other. */
#define CMPI_MB_BasicRead 0x00000001              /* Reads instances */
#define CMPI_MB_BasicWrite 0x00000003             /* Writes properties, and reads */
#define CMPI_MB_InstanceManipulation 0x00000007   /* Creates and deletes instances, and writes */
#define CMPI_MB_AssociationTraversal 0x00000009   /* Follows associations, and reads */
#define CMPI_MB_QueryExecution 0x00000011         /* Runs queries, and reads */
#define CMPI_MB_QueryNormalization 0x00000031     /* Takes WHERE clauses apart, and runs queries */
#define CMPI_MB_Indications 0x00000081            /* Delivers indications, and reads */
#define CMPI_MB_BasicQualifierSupport 0x00000047  /* Gives qualifiers, and manipulates instances */
#define CMPI_MB_OSEncapsulationSupport 0x00000100 /* Has CMPIBrokerExtFT */

/* Status codes. 0 to 17 are those of CIM operations (DSP0200). */
typedef enum _CMPIrc {
  CMPI_RC_OK = 0,                                /* Success */
  CMPI_RC_ERR_FAILED = 1,                        /* Failed, for a reason that no other code tells */
  CMPI_RC_ERR_ACCESS_DENIED = 2,                 /* The caller may not do that */
  CMPI_RC_ERR_INVALID_NAMESPACE = 3,             /* There is no such namespace */
  CMPI_RC_ERR_INVALID_PARAMETER = 4,             /* An argument is missing, wrong or given twice */
  CMPI_RC_ERR_INVALID_CLASS = 5,                 /* There is no such class */
  CMPI_RC_ERR_NOT_FOUND = 6,                     /* There is no such object */
  CMPI_RC_ERR_NOT_SUPPORTED = 7,                 /* This operation is not offered */
  CMPI_RC_ERR_CLASS_HAS_CHILDREN = 8,            /* The class has subclasses */
  CMPI_RC_ERR_CLASS_HAS_INSTANCES = 9,           /* The class has instances */
  CMPI_RC_ERR_INVALID_SUPERCLASS = 10,           /* There is no such superclass */
  CMPI_RC_ERR_ALREADY_EXISTS = 11,               /* There is such an object already */
  CMPI_RC_ERR_NO_SUCH_PROPERTY = 12,             /* There is no such property */
  CMPI_RC_ERR_TYPE_MISMATCH = 13,                /* The value's type is not the property's */
  CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED = 14, /* That query language is not understood */
  CMPI_RC_ERR_INVALID_QUERY = 15,                /* The query is not one of its language */
  CMPI_RC_ERR_METHOD_NOT_AVAILABLE = 16,         /* The method cannot be run now */
  CMPI_RC_ERR_METHOD_NOT_FOUND = 17,             /* There is no such method */
  CMPI_RC_DO_NOT_UNLOAD = 50,                    /* From cleanup: keep the provider for now */
  CMPI_RC_NEVER_UNLOAD = 51,                     /* From cleanup: keep the provider for good */
  CMPI_RC_ERR_INVALID_HANDLE = 60,               /* The object is null, foreign or damaged */
  CMPI_RC_ERR_INVALID_DATA_TYPE = 61,            /* The type is not one that fits here */
  CMPI_RC_ERROR_SYSTEM = 100,                    /* The operating system failed */
  CMPI_RC_ERROR = 200,                           /* Failed outside of CIM's codes */
} CMPIrc;

/* How a call ended. */
struct _CMPIStatus {
  CMPIrc rc;       /* CMPI_RC_OK or what went wrong. */
  CMPIString* msg; /* More about it, or null. */
};

typedef struct _CMPIStatus CMPIStatus;

/* Operators of a query. */
typedef enum _CMPIPredOp {
  CMPI_PredOp_Equals = 1,              /* = */
  CMPI_PredOp_NotEquals = 2,           /* <> */
  CMPI_PredOp_LessThan = 3,            /* < */
  CMPI_PredOp_GreaterThanOrEquals = 4, /* >= */
  CMPI_PredOp_GreaterThan = 5,         /* > */
  CMPI_PredOp_LessThanOrEquals = 6,    /* <= */
  CMPI_PredOp_Isa = 7,                 /* ISA */
  CMPI_PredOp_NotIsa = 8,              /* NOT ISA */
  CMPI_PredOp_Like = 9,                /* LIKE */
  CMPI_PredOp_NotLike = 10,            /* NOT LIKE */
#ifdef CMPI_VER_200
  CMPI_PredOp_Not_Null = 11, /* IS NOT NULL */
  CMPI_PredOp_Null = 12,     /* IS NULL */
  CMPI_PredOp_And = 13,      /* AND */
  CMPI_PredOp_Or = 14,       /* OR */
#endif
} CMPIPredOp;

/* The normal forms of a WHERE clause. */
typedef enum _CMPISelectCondType {
  CMPI_COND_DOC = 0, /* Disjunction of conjunctions */
  CMPI_COND_COD = 1, /* Conjunction of disjunctions */
} CMPISelectCondType;

/* How severe a log entry is. */
typedef enum _CMPISeverity {
  CMPI_SEV_ERROR = 1,   /* Something failed */
  CMPI_SEV_INFO = 2,    /* For information */
  CMPI_SEV_WARNING = 3, /* Something may fail */
  CMPI_DEV_DEBUG = 4,   /* For developers */
} CMPISeverity;

/* How much detail a trace entry belongs to. */
typedef enum _CMPILevel {
  CMPI_LEV_INFO = 1,    /* General */
  CMPI_LEV_WARNING = 2, /* Out of the ordinary */
  CMPI_LEV_VERBOSE = 3, /* Everything */
} CMPILevel;

/* A message file that openMessageFile opened. */
typedef void* CMPIMsgFileHandle;

/* A mark that CMPIBrokerMemFT.mark set. */
typedef void CMPIGcStat;

#ifdef CMPI_VER_200
/* Kinds of errors: CIM_Error.ErrorType. */
typedef enum _CMPIErrorType {
  UnknownErrorType = 0,           /* Not known */
  OtherErrorType = 1,             /* As the words in setOtherErrorType say */
  CommunicationsError = 2,        /* Moving data from one place to another */
  QualityOfServiceError = 3,      /* Performance below what was promised */
  SoftwareError = 4,              /* Software or its processing */
  HardwareError = 5,              /* Equipment */
  EnvironmentalError = 6,         /* The surroundings of equipment */
  SecurityError = 7,              /* Security */
  Oversubscription_Error = 8,     /* More was asked for than there is */
  UnavailableResourceError = 9,   /* Something needed is not there */
  UnsupportedOperationError = 10, /* Not supported */
} CMPIErrorType;

/* How severe an error is: CIM_Error.PerceivedSeverity. */
typedef enum _CMPIErrorSeverity {
  ErrorSevUnknown = 0, /* Not known */
  ErrorSevLow = 2,     /* Low */
  ErrorSevMedium = 3,  /* Medium */
  ErrorSevHigh = 4,    /* High */
  ErrorSevFatal = 5,   /* Nothing works any more */
} CMPIErrorSeverity;

/* Why an error happened: CIM_Error.ProbableCause. */
typedef enum _CMPIErrorProbableCause {
  ErrorProbCauseUnknown = 0,                   /* Not known */
  ErrorProbCauseOther = 1,                     /* As the words in setProbableCauseDescription say */
  Adapter_Card_Error = 2,                      /* An adapter card failed */
  Application_Subsystem_Failure = 3,           /* Part of an application failed */
  Bandwidth_Reduced = 4,                       /* A link carries less than it should */
  Connection_Establishment_Error = 5,          /* No connection came about */
  Communications_Protocol_Error = 6,           /* A peer broke the protocol */
  Communications_Subsystem_Failure = 7,        /* Part of the communications failed */
  ConfigurationCustomization_Error = 8,        /* Wrongly configured or adapted */
  Congestion = 9,                              /* More traffic than the system can carry */
  Corrupt_Data = 10,                           /* Data is wrong and not to be relied on */
  CPU_Cycles_Limit_Exceeded = 11,              /* Processing time reached its limit */
  DatasetModem_Error = 12,                     /* A modem or data set failed */
  Degraded_Signal = 13,                        /* A signal grew worse */
  DTE_DCE_Interface_Error = 14,                /* Between terminal and line equipment */
  Enclosure_Door_Open = 15,                    /* A cabinet's door is open */
  Equipment_Malfunction = 16,                  /* Equipment works wrongly */
  Excessive_Vibration = 17,                    /* It shakes too much */
  File_Format_Error = 18,                      /* A file is not of the form expected */
  Fire_Detected = 19,                          /* Fire */
  Flood_Detected = 20,                         /* Water where none should be */
  Framing_Error = 21,                          /* Frames on a line are not recognised */
  HVAC_Problem = 22,                           /* Heating, ventilation or cooling */
  Humidity_Unacceptable = 23,                  /* Too damp or too dry */
  IO_Device_Error = 24,                        /* A device for input and output failed */
  Input_Device_Error = 25,                     /* A device for input failed */
  LAN_Error = 26,                              /* The local network failed */
  Non_Toxic_Leak_Detected = 27,                /* Something harmless leaks */
  Local_Node_Transmission_Error = 28,          /* Sending fails at this end */
  Loss_of_Frame = 29,                          /* Frames on a line got lost */
  Loss_of_Signal = 30,                         /* There is no signal */
  Material_Supply_Exhausted = 31,              /* A material ran out */
  Multiplexer_Problem = 32,                    /* A multiplexer failed */
  Out_of_Memory = 33,                          /* No memory left */
  Output_Device_Error = 34,                    /* A device for output failed */
  Performance_Degraded = 35,                   /* Slower than it should be */
  Power_Problem = 36,                          /* Something about the power supply */
  Pressure_Unacceptable = 37,                  /* Pressure too high or too low */
  Processor_Problem = 38,                      /* A processor failed */
  Pump_Failure = 39,                           /* A pump failed */
  Queue_Size_Exceeded = 40,                    /* Too much is waiting */
  Receive_Failure = 41,                        /* Receiving failed */
  Receiver_Failure = 42,                       /* The receiving equipment failed */
  Remote_Node_Transmission_Error = 43,         /* Sending fails at the other end */
  Resource_at_or_Nearing_Capacity = 44,        /* A resource is full or nearly so */
  Response_Time_Excessive = 45,                /* Answers take too long */
  Retransmission_Rate_Excessive = 46,          /* Too much is sent again */
  Software_Error = 47,                         /* Software failed */
  Software_Program_Abnormally_Terminated = 48, /* A program ended out of turn */
  Software_Program_Error = 49,                 /* A program gave wrong results */
  Storage_Capacity_Problem = 50,               /* Storage is running out */
  Temperature_Unacceptable = 51,               /* Too hot or too cold */
  Threshold_Crossed = 52,                      /* A measured value passed its limit */
  Timing_Problem = 53,                         /* Things happen at the wrong time */
  Toxic_Leak_Detected = 54,                    /* Something poisonous leaks */
  Transmit_Failure = 55,                       /* Sending failed */
  Transmitter_Failure = 56,                    /* The sending equipment failed */
  Underlying_Resource_Unavailable = 57,        /* Something that it is built on is missing */
  Version_Mismatch = 58,                       /* Versions do not fit together */
  Previous_Alert_Cleared = 59,                 /* An earlier alert no longer holds */
  Login_Attempts_Failed = 60,                  /* Somebody could not log in, repeatedly */
  Software_Virus_Detected = 61,                /* Malicious software was found */
  Hardware_Security_Breached = 62,             /* The protection of hardware was broken */
  Denial_of_Service_Detected = 63,             /* An attack that keeps others from the service */
  Security_Credential_Mismatch = 64,           /* Credentials do not fit together */
  Unauthorized_Access = 65,                    /* Somebody got in without permission */
  Alarm_Received = 66,                         /* Another device raised an alarm */
  Loss_of_Pointer = 67,                        /* The pointer in a frame (SDH, SONET) got lost */
  Payload_Mismatch = 68,                       /* The content of a frame is not what it says */
  Transmission_Error = 69,                     /* Data changed on the way */
  Excessive_Error_Rate = 70,                   /* Too many errors on a line */
  Trace_Problem = 71,                          /* The path's trace is not the one expected */
  Element_Unavailable = 72,                    /* Part of the network cannot be used */
  Element_Missing = 73,                        /* Part of the network is not there */
  Loss_of_Multi_Frame = 74,                    /* The order of frames got lost */
  Broadcast_Channel_Failure = 75,              /* A broadcast channel failed */
  Invalid_Message_Received = 76,               /* A message makes no sense */
  Routing_Failure = 77,                        /* No way to the destination */
  Backplane_Failure = 78,                      /* A backplane failed */
  Identifier_Duplication = 79,                 /* An identifier is used twice */
  Protection_Path_Failure = 80,                /* The spare path failed */
  Sync_Loss_or_Mismatch = 81,                  /* Clocks do not agree */
  Terminal_Problem = 82,                       /* A terminal failed */
  Real_Time_Clock_Failure = 83,                /* The clock failed */
  Antenna_Failure = 84,                        /* An antenna failed */
  Battery_Charging_Failure = 85,               /* A battery does not charge */
  Disk_Failure = 86,                           /* A disk failed */
  Frequency_Hopping_Failure = 87,              /* A radio does not change frequency as it should */
  Loss_of_Redundancy = 88,                     /* No spare is left */
  Power_Supply_Failure = 89,                   /* A power supply failed */
  Signal_Quality_Problem = 90,                 /* A signal is poor */
  Battery_Discharging = 91,                    /* Running on a battery */
  Battery_Failure = 92,                        /* A battery failed */
  Commercial_Power_Problem = 93,               /* The mains fail */
  Fan_Failure = 94,                            /* A fan failed */
  Engine_Failure = 95,                         /* An engine failed */
  Sensor_Failure = 96,                         /* A sensor failed */
  Fuse_Failure = 97,                           /* A fuse blew */
  Generator_Failure = 98,                      /* A generator failed */
  Low_Battery = 99,                            /* A battery is nearly empty */
  Low_Fuel = 100,                              /* Fuel is nearly used up */
  Low_Water = 101,                             /* Water is nearly used up */
  Explosive_Gas = 102,                         /* Gas that may explode */
  High_Winds = 103,                            /* Storm */
  Ice_Buildup = 104,                           /* Ice gathers */
  Smoke = 105,                                 /* Smoke */
  Memory_Mismatch = 106,                       /* Memory modules do not fit together */
  Out_of_CPU_Cycles = 107,                     /* No processing time left */
  Software_Environment_Problem = 108,          /* What a program runs in is not as it needs it */
  Software_Download_Failure = 109,             /* Software did not arrive */
  Element_Reinitialized = 110,                 /* Part of the network started anew */
  Timeout = 111,                               /* No answer in time */
  Logging_Problems = 112,                      /* The log cannot be written */
  Leak_Detected_113 = 113,                     /* Something leaks */
  Protection_Mechanism_Failure = 114,          /* A safeguard failed */
  Protecting_Resource_Failure = 115,           /* The spare failed */
  Database_Inconsistency = 116,                /* A database contradicts itself */
  Authentication_Failure = 117,                /* Somebody is not who they claim to be */
  Breach_of_Confidentiality = 118,             /* Secret data got out */
  Cable_Tamper = 119,                          /* Somebody touched a cable */
  Delayed_Information = 120,                   /* Data arrived late */
  Duplicate_Information = 121,                 /* Data arrived twice */
  Information_Missing = 122,                   /* Data did not arrive */
  Information_Modification = 123,              /* Data was changed */
  Information_Out_of_Sequence = 124,           /* Data arrived in the wrong order */
  Key_Expired = 125,                           /* A key is past its time */
  Non_Repudiation_Failure = 126,               /* Who sent or received cannot be proved */
  Out_of_Hours_Activity = 127,                 /* Something happened at an unusual time */
  Out_of_Service = 128,                        /* Taken out of service */
  Procedural_Error = 129,                      /* Wrongly operated */
  Unexpected_Information = 130,                /* Data that was not requested */
} CMPIErrorProbableCause;

/* The form of an error's source: CIM_Error.ErrorSourceFormat. */
typedef enum _CMPIErrorSrcFormat {
  CMPIErrSrcUnknown = 0, /* Not known */
  CMPIErrSrcOther = 1,   /* As the words in setOtherErrorSourceFormat say */
  CIMObjectHandle = 2,   /* An object path as text */
} CMPIErrorSrcFormat;
#endif /* CMPI_VER_200 */

#ifdef __cplusplus
}
#endif

#endif /* _CMPIDT_H_ */
