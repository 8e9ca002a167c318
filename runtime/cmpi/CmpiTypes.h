// Types, values and constants of CMPI 1.0 (function tables of version 100).
//
// The declarations of this folder are the program's own. They fix the binary interface, so every structure is
// plain: no constructor, no default initialiser, nothing that would change how it is passed and returned.
#pragma once

#include <cstddef>

extern "C"
{

    using CMPIBoolean = unsigned char;
    using CMPIChar16 = unsigned short;
    using CMPIUint8 = unsigned char;
    using CMPIUint16 = unsigned short;
    using CMPIUint32 = unsigned int;
    using CMPIUint64 = unsigned long long;
    using CMPISint8 = signed char;
    using CMPISint16 = short;
    using CMPISint32 = int;
    using CMPISint64 = long long;
    using CMPIReal32 = float;
    using CMPIReal64 = double;
    using CMPICount = unsigned int;
    using CMPIType = unsigned short;
    using CMPIValueState = unsigned short;
    using CMPIFlags = unsigned int;
    using CMPIVersion = int;
    using CMPI_THREAD_TYPE = void*;
    using CMPI_MUTEX_TYPE = void*;
    using CMPI_COND_TYPE = void*;
    using CMPI_THREAD_RETURN = void*;
    using CMPI_THREAD_KEY_TYPE = unsigned int;

    struct CMPIBroker;
    struct CMPIContext;
    struct CMPIResult;
    struct CMPIString;
    struct CMPIArray;
    struct CMPIEnumeration;
    struct CMPIInstance;
    struct CMPIObjectPath;
    struct CMPIArgs;
    struct CMPIDateTime;
    struct CMPISelectExp;
    struct CMPISelectCond;
    struct CMPISubCond;
    struct CMPIPredicate;

    struct CMPIValuePtr
    {
        void* ptr;
        CMPICount length;
    };

    /// `dataPtr` gives the union its 16 bytes; without it CMPIData would be returned in registers.
    union CMPIValue
    {
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
        CMPISint8 Byte;
        CMPISint16 Short;
        CMPISint32 Int;
        CMPISint64 Long;
        CMPIReal32 Float;
        CMPIReal64 Double;
    };

    struct CMPIData
    {
        CMPIType type;
        CMPIValueState state;
        CMPIValue value;
    };

    /// The fixed type lets a broker of a later version answer codes that are not named here.
    enum CMPIrc : int
    {
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
        CMPI_RC_ERROR = 200,
    };

    struct CMPIStatus
    {
        CMPIrc rc;
        CMPIString* msg;
    };

    enum CMPISeverity : int
    {
        CMPI_SEV_ERROR = 1,
        CMPI_SEV_INFO = 2,
        CMPI_SEV_WARNING = 3,
        CMPI_DEV_DEBUG = 4, // spelt so in the standard
    };

    enum CMPILevel : int
    {
        CMPI_LEV_INFO = 1,
        CMPI_LEV_WARNING = 2,
        CMPI_LEV_VERBOSE = 3,
    };

    enum CMPIPredOp : int
    {
        CMPI_PredOp_Equals = 1,
        CMPI_PredOp_NotEquals = 2,
        CMPI_PredOp_LessThan = 3,
        CMPI_PredOp_GreaterThanOrEquals = 4,
        CMPI_PredOp_GreaterThan = 5,
        CMPI_PredOp_LessThanOrEquals = 6,
        CMPI_PredOp_Isa = 7,
        CMPI_PredOp_NotIsa = 8,
        CMPI_PredOp_Like = 9,
        CMPI_PredOp_NotLike = 10,
    };

    using CMPIAccessor = CMPIData(const char* name, void* parm);

} // extern "C"

// --- type codes; an array has the code of its element with the array bit ---------------------------------

inline constexpr CMPIType CMPI_ARRAY = 0x2000;
inline constexpr CMPIType CMPI_SIMPLE = 0x0002;
inline constexpr CMPIType CMPI_REAL = 0x0008;
inline constexpr CMPIType CMPI_UINT = 0x0080;
inline constexpr CMPIType CMPI_SINT = 0x00C0;
inline constexpr CMPIType CMPI_INTEGER = 0x00C0;
inline constexpr CMPIType CMPI_ENC = 0x1000;

inline constexpr CMPIType CMPI_null = 0x0000;
inline constexpr CMPIType CMPI_boolean = 0x0002;
inline constexpr CMPIType CMPI_char16 = 0x0003;
inline constexpr CMPIType CMPI_real32 = 0x0008;
inline constexpr CMPIType CMPI_real64 = 0x000C;
inline constexpr CMPIType CMPI_uint8 = 0x0080;
inline constexpr CMPIType CMPI_uint16 = 0x0090;
inline constexpr CMPIType CMPI_uint32 = 0x00A0;
inline constexpr CMPIType CMPI_uint64 = 0x00B0;
inline constexpr CMPIType CMPI_sint8 = 0x00C0;
inline constexpr CMPIType CMPI_sint16 = 0x00D0;
inline constexpr CMPIType CMPI_sint32 = 0x00E0;
inline constexpr CMPIType CMPI_sint64 = 0x00F0;
inline constexpr CMPIType CMPI_instance = 0x1000;
inline constexpr CMPIType CMPI_ref = 0x1100;
inline constexpr CMPIType CMPI_args = 0x1200;
inline constexpr CMPIType CMPI_class = 0x1300;
inline constexpr CMPIType CMPI_filter = 0x1400;
inline constexpr CMPIType CMPI_enumeration = 0x1500;
inline constexpr CMPIType CMPI_string = 0x1600;
inline constexpr CMPIType CMPI_chars = 0x1700;
inline constexpr CMPIType CMPI_dateTime = 0x1800;
inline constexpr CMPIType CMPI_ptr = 0x1900;
inline constexpr CMPIType CMPI_charsptr = 0x1A00;

inline constexpr CMPIType CMPI_booleanA = CMPI_ARRAY | CMPI_boolean;
inline constexpr CMPIType CMPI_char16A = CMPI_ARRAY | CMPI_char16;
inline constexpr CMPIType CMPI_real32A = CMPI_ARRAY | CMPI_real32;
inline constexpr CMPIType CMPI_real64A = CMPI_ARRAY | CMPI_real64;
inline constexpr CMPIType CMPI_uint8A = CMPI_ARRAY | CMPI_uint8;
inline constexpr CMPIType CMPI_uint16A = CMPI_ARRAY | CMPI_uint16;
inline constexpr CMPIType CMPI_uint32A = CMPI_ARRAY | CMPI_uint32;
inline constexpr CMPIType CMPI_uint64A = CMPI_ARRAY | CMPI_uint64;
inline constexpr CMPIType CMPI_sint8A = CMPI_ARRAY | CMPI_sint8;
inline constexpr CMPIType CMPI_sint16A = CMPI_ARRAY | CMPI_sint16;
inline constexpr CMPIType CMPI_sint32A = CMPI_ARRAY | CMPI_sint32;
inline constexpr CMPIType CMPI_sint64A = CMPI_ARRAY | CMPI_sint64;
inline constexpr CMPIType CMPI_instanceA = CMPI_ARRAY | CMPI_instance;
inline constexpr CMPIType CMPI_refA = CMPI_ARRAY | CMPI_ref;
inline constexpr CMPIType CMPI_stringA = CMPI_ARRAY | CMPI_string;
inline constexpr CMPIType CMPI_charsA = CMPI_ARRAY | CMPI_chars;
inline constexpr CMPIType CMPI_dateTimeA = CMPI_ARRAY | CMPI_dateTime;
inline constexpr CMPIType CMPI_charsptrA = CMPI_ARRAY | CMPI_charsptr;

inline constexpr CMPIType CMPI_keyInteger = CMPI_sint64;
inline constexpr CMPIType CMPI_keyString = CMPI_string;
inline constexpr CMPIType CMPI_keyBoolean = CMPI_boolean;
inline constexpr CMPIType CMPI_keyRef = CMPI_ref;

// --- value state: bits, to be tested one by one -----------------------------------------------------------

inline constexpr CMPIValueState CMPI_goodValue = 0;
inline constexpr CMPIValueState CMPI_nullValue = 0x0100;
inline constexpr CMPIValueState CMPI_keyValue = 0x0200;
inline constexpr CMPIValueState CMPI_notFound = 0x0400;
inline constexpr CMPIValueState CMPI_badValue = 0x8000;

// --- versions, invocation flags, context entries, capabilities ---------------------------------------------

inline constexpr CMPIVersion CMPIVersion100 = 100;
inline constexpr CMPIVersion CMPIVersion200 = 200;
inline constexpr CMPIVersion CMPIVersion210 = 210;
inline constexpr CMPIVersion CMPICurrentVersion = CMPIVersion100;

inline constexpr CMPIFlags CMPI_FLAG_LocalOnly = 1;
inline constexpr CMPIFlags CMPI_FLAG_DeepInheritance = 2;
inline constexpr CMPIFlags CMPI_FLAG_IncludeQualifiers = 4;
inline constexpr CMPIFlags CMPI_FLAG_IncludeClassOrigin = 8;

inline constexpr const char* CMPIInitNameSpace = "CMPIInitNameSpace";
inline constexpr const char* CMPIInvocationFlags = "CMPIInvocationFlags";
inline constexpr const char* CMPIPrincipal = "CMPIPrincipal";
inline constexpr const char* CMPIRole = "CMPIRole";
inline constexpr const char* CMPIAcceptLanguage = "CMPIAcceptLanguage";
inline constexpr const char* CMPIContentLanguage = "CMPIContentLanguage";

/// Each value includes the bits it depends on: test with (capabilities & X) == X.
inline constexpr unsigned int CMPI_MB_BasicRead = 0x00000001;
inline constexpr unsigned int CMPI_MB_BasicWrite = 0x00000003;
inline constexpr unsigned int CMPI_MB_InstanceManipulation = 0x00000007;
inline constexpr unsigned int CMPI_MB_AssociationTraversal = 0x00000009;
inline constexpr unsigned int CMPI_MB_QueryExecution = 0x00000011;
inline constexpr unsigned int CMPI_MB_QueryNormalization = 0x00000031;
inline constexpr unsigned int CMPI_MB_BasicQualifierSupport = 0x00000047;
inline constexpr unsigned int CMPI_MB_Indications = 0x00000081;
inline constexpr unsigned int CMPI_MB_OSEncapsulationSupport = 0x00000100;
