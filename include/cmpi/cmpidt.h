/* CMPI data types: scalars, values, type codes, return codes and the encapsulated objects.
 *
 * Written for 64-bit Linux from the published binary interface; usable from C and C++. The layouts
 * cover versions 1.0 (100), 2.0 (200) and 2.1 (210): members that a version does not have are the
 * last ones of their table and must be looked at only after the table's `ftVersion` was tested.
 */
#ifndef TVX_CMPI_CMPIDT_H
#define TVX_CMPI_CMPIDT_H

#ifdef __cplusplus
extern "C" {
#endif

/* ---- Scalars ---- */

typedef unsigned char CMPIBoolean;
typedef unsigned short CMPIChar16;
typedef unsigned char CMPIUint8;
typedef unsigned short CMPIUint16;
typedef unsigned int CMPIUint32;
typedef signed char CMPISint8;
typedef short CMPISint16;
typedef int CMPISint32;
typedef float CMPIReal32;
typedef double CMPIReal64;
__extension__ typedef unsigned long long CMPIUint64;
__extension__ typedef long long CMPISint64;

typedef unsigned int CMPICount;
typedef unsigned int CMPIFlags;
typedef unsigned short CMPIType;
typedef unsigned short CMPIValueState;
typedef int CMPIVersion;

#define CMPIVersion100 100
#define CMPIVersion200 200
#define CMPIVersion210 210

/* ---- Objects and function tables ---- */

typedef struct CMPIBroker CMPIBroker;
typedef struct CMPIBrokerFT CMPIBrokerFT;
typedef struct CMPIBrokerEncFT CMPIBrokerEncFT;
typedef struct CMPIBrokerExtFT CMPIBrokerExtFT;
typedef struct CMPIBrokerMemFT CMPIBrokerMemFT;

typedef struct CMPIContext CMPIContext;
typedef struct CMPIContextFT CMPIContextFT;
typedef struct CMPIResult CMPIResult;
typedef struct CMPIResultFT CMPIResultFT;
typedef struct CMPIString CMPIString;
typedef struct CMPIStringFT CMPIStringFT;
typedef struct CMPIArray CMPIArray;
typedef struct CMPIArrayFT CMPIArrayFT;
typedef struct CMPIEnumeration CMPIEnumeration;
typedef struct CMPIEnumerationFT CMPIEnumerationFT;
typedef struct CMPIInstance CMPIInstance;
typedef struct CMPIInstanceFT CMPIInstanceFT;
typedef struct CMPIObjectPath CMPIObjectPath;
typedef struct CMPIObjectPathFT CMPIObjectPathFT;
typedef struct CMPIArgs CMPIArgs;
typedef struct CMPIArgsFT CMPIArgsFT;
typedef struct CMPIDateTime CMPIDateTime;
typedef struct CMPIDateTimeFT CMPIDateTimeFT;
typedef struct CMPISelectExp CMPISelectExp;
typedef struct CMPISelectExpFT CMPISelectExpFT;
typedef struct CMPISelectCond CMPISelectCond;
typedef struct CMPISelectCondFT CMPISelectCondFT;
typedef struct CMPISubCond CMPISubCond;
typedef struct CMPISubCondFT CMPISubCondFT;
typedef struct CMPIPredicate CMPIPredicate;
typedef struct CMPIPredicateFT CMPIPredicateFT;
typedef struct CMPIError CMPIError;
typedef struct CMPIErrorFT CMPIErrorFT;
typedef struct CMPIPropertyList CMPIPropertyList;
typedef struct CMPIPropertyListFT CMPIPropertyListFT;
typedef struct CMPIEnumerationFilter CMPIEnumerationFilter;
typedef struct CMPIEnumerationFilterFT CMPIEnumerationFilterFT;

typedef struct CMPIInstanceMI CMPIInstanceMI;
typedef struct CMPIInstanceMIFT CMPIInstanceMIFT;
typedef struct CMPIAssociationMI CMPIAssociationMI;
typedef struct CMPIAssociationMIFT CMPIAssociationMIFT;
typedef struct CMPIMethodMI CMPIMethodMI;
typedef struct CMPIMethodMIFT CMPIMethodMIFT;
typedef struct CMPIPropertyMI CMPIPropertyMI;
typedef struct CMPIPropertyMIFT CMPIPropertyMIFT;
typedef struct CMPIIndicationMI CMPIIndicationMI;
typedef struct CMPIIndicationMIFT CMPIIndicationMIFT;

/* Handles that are opaque to a provider. */
typedef void* CMPI_THREAD_RETURN;
typedef void* CMPI_THREAD_TYPE;
typedef void* CMPI_MUTEX_TYPE;
typedef void* CMPI_COND_TYPE;
typedef void* CMPIGcStat;
typedef void* CMPIMsgFileHandle;

/* ---- Values ---- */

typedef struct CMPIValuePtr {
  void* ptr;
  CMPICount length;
} CMPIValuePtr;

typedef union CMPIValue {
  CMPIUint64 uint64;
  CMPIUint32 uint32;
  CMPIUint16 uint16;
  CMPIUint8 uint8;
  CMPISint64 sint64;
  CMPISint32 sint32;
  CMPISint16 sint16;
  CMPISint8 sint8;
  CMPIReal64 real64;
  CMPIReal32 real32;
  CMPIBoolean boolean;
  CMPIChar16 char16;
  CMPIInstance* inst;
  CMPIObjectPath* ref;
  CMPIArgs* args;
  CMPISelectExp* filter;
  CMPIEnumeration* Enum;
  CMPIArray* array;
  CMPIString* string;
  char* chars;
  CMPIDateTime* dateTime;
  CMPIValuePtr dataPtr;
} CMPIValue;

typedef struct CMPIData {
  CMPIType type;
  CMPIValueState state;
  CMPIValue value;
} CMPIData;

/* Value states. A null value carries CMPI_nullValue, whatever its type. */
#define CMPI_goodValue ((CMPIValueState)0)
#define CMPI_nullValue ((CMPIValueState)0x100)
#define CMPI_keyValue ((CMPIValueState)0x200)
#define CMPI_notFound ((CMPIValueState)0x400)
#define CMPI_badValue ((CMPIValueState)0x8000)

/* Type codes. An array has the code of its elements with CMPI_ARRAY added. */
#define CMPI_null ((CMPIType)0)

#define CMPI_SIMPLE ((CMPIType)2)
#define CMPI_boolean ((CMPIType)2)
#define CMPI_char16 ((CMPIType)3)

#define CMPI_REAL ((CMPIType)8)
#define CMPI_real32 ((CMPIType)8)
#define CMPI_real64 ((CMPIType)0xC)

#define CMPI_UINT ((CMPIType)0x80)
#define CMPI_uint8 ((CMPIType)0x80)
#define CMPI_uint16 ((CMPIType)0x90)
#define CMPI_uint32 ((CMPIType)0xA0)
#define CMPI_uint64 ((CMPIType)0xB0)
#define CMPI_SINT ((CMPIType)0xC0)
#define CMPI_sint8 ((CMPIType)0xC0)
#define CMPI_sint16 ((CMPIType)0xD0)
#define CMPI_sint32 ((CMPIType)0xE0)
#define CMPI_sint64 ((CMPIType)0xF0)

#define CMPI_ENC ((CMPIType)0x1000)
#define CMPI_instance ((CMPIType)0x1000)
#define CMPI_ref ((CMPIType)0x1100)
#define CMPI_args ((CMPIType)0x1200)
#define CMPI_class ((CMPIType)0x1300)
#define CMPI_filter ((CMPIType)0x1400)
#define CMPI_enumeration ((CMPIType)0x1500)
#define CMPI_string ((CMPIType)0x1600)
#define CMPI_chars ((CMPIType)0x1700)
#define CMPI_dateTime ((CMPIType)0x1800)
#define CMPI_ptr ((CMPIType)0x1900)
#define CMPI_charsptr ((CMPIType)0x1A00)

#define CMPI_ARRAY ((CMPIType)0x2000)
#define CMPI_booleanA ((CMPIType)0x2002)
#define CMPI_char16A ((CMPIType)0x2003)
#define CMPI_real32A ((CMPIType)0x2008)
#define CMPI_real64A ((CMPIType)0x200C)
#define CMPI_uint8A ((CMPIType)0x2080)
#define CMPI_uint16A ((CMPIType)0x2090)
#define CMPI_uint32A ((CMPIType)0x20A0)
#define CMPI_uint64A ((CMPIType)0x20B0)
#define CMPI_sint8A ((CMPIType)0x20C0)
#define CMPI_sint16A ((CMPIType)0x20D0)
#define CMPI_sint32A ((CMPIType)0x20E0)
#define CMPI_sint64A ((CMPIType)0x20F0)
#define CMPI_instanceA ((CMPIType)0x3000)
#define CMPI_refA ((CMPIType)0x3100)
#define CMPI_stringA ((CMPIType)0x3600)
#define CMPI_charsA ((CMPIType)0x3700)
#define CMPI_dateTimeA ((CMPIType)0x3800)
#define CMPI_charsptrA ((CMPIType)0x3A00)

#define CMPI_keyInteger CMPI_sint64
#define CMPI_keyString CMPI_string
#define CMPI_keyBoolean CMPI_boolean
#define CMPI_keyRef CMPI_ref

/* ---- Return codes ---- */

typedef enum CMPIrc {
  CMPI_RC_OK = 0,
  CMPI_RC_ERR_FAILED = 1,
  CMPI_RC_ERR_ACCESS_DENIED = 2,
  CMPI_RC_ERR_INVALID_NAMESPACE = 3,
  CMPI_RC_ERR_INVALID_PARAMETER = 4,
  CMPI_RC_ERR_INVALID_CLASS = 5,
  CMPI_RC_ERR_NOT_FOUND = 6,
  CMPI_RC_ERR_NOT_SUPPORTED = 7,
  CMPI_RC_ERR_CLASS_HAS_CHILDREN = 8,
  CMPI_RC_ERR_CLASS_HAS_INSTANCES = 9,
  CMPI_RC_ERR_INVALID_SUPERCLASS = 10,
  CMPI_RC_ERR_ALREADY_EXISTS = 11,
  CMPI_RC_ERR_NO_SUCH_PROPERTY = 12,
  CMPI_RC_ERR_TYPE_MISMATCH = 13,
  CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED = 14,
  CMPI_RC_ERR_INVALID_QUERY = 15,
  CMPI_RC_ERR_METHOD_NOT_AVAILABLE = 16,
  CMPI_RC_ERR_METHOD_NOT_FOUND = 17,
  CMPI_RC_DO_NOT_UNLOAD = 50,
  CMPI_RC_NEVER_UNLOAD = 51,
  CMPI_RC_ERR_INVALID_HANDLE = 60,
  CMPI_RC_ERR_INVALID_DATA_TYPE = 61,
  CMPI_RC_ERROR_SYSTEM = 100,
  CMPI_RC_ERROR = 200
} CMPIrc;

/* Result of an operation; `msg` may be null. */
typedef struct CMPIStatus {
  CMPIrc rc;
  CMPIString* msg;
} CMPIStatus;

/* Flags of a request, the entry CMPIInvocationFlags of its context. */
#define CMPI_FLAG_LocalOnly 1
#define CMPI_FLAG_DeepInheritance 2
#define CMPI_FLAG_IncludeQualifiers 4
#define CMPI_FLAG_IncludeClassOrigin 8

/* Names of context entries. */
#define CMPIInitNameSpace "CMPIInitNameSpace"
#define CMPIInvocationFlags "CMPIInvocationFlags"
#define CMPIPrincipal "CMPIPrincipal"
#define CMPIRole "CMPIRole"
#define CMPIAcceptLanguage "CMPIAcceptLanguage"
#define CMPIContentLanguage "CMPIContentLanguage"

/* Operators of a query predicate. */
typedef enum CMPIPredOp {
  CMPI_PredOp_Equals = 1,
  CMPI_PredOp_NotEquals = 2,
  CMPI_PredOp_LessThan = 3,
  CMPI_PredOp_GreaterThanOrEquals = 4,
  CMPI_PredOp_GreaterThan = 5,
  CMPI_PredOp_LessThanOrEquals = 6,
  CMPI_PredOp_Isa = 7,
  CMPI_PredOp_NotIsa = 8,
  CMPI_PredOp_Like = 9,
  CMPI_PredOp_NotLike = 10
} CMPIPredOp;

/* Answers the value of a property by name while an expression is evaluated. */
typedef CMPIData CMPIAccessor(const char* name, void* parameter);

#ifdef __cplusplus
}
#endif

#endif /* TVX_CMPI_CMPIDT_H */
