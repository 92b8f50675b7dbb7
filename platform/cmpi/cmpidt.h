/* CMPI 2.0 data types (C and C++): binary layout of level 200 of the Open
 * Group standard on LP64 Linux. Every size and offset is asserted in
 * tests/platform/cmpi. All names, the reserved-looking tags included, are the
 * standard's. */
#ifndef CMPIDT_H
#define CMPIDT_H

#include "cmpios.h"
#include "cmpipl.h"

#define CMPIVersion100 100
#define CMPIVersion200 200

#ifndef CMPI_VERSION
#define CMPI_VERSION CMPIVersion200
#endif

#if CMPI_VERSION == 200
#define CMPI_VER_200 1
#define CMPI_VER_100 1
#define CMPICurrentVersion CMPIVersion200
#else
#error "these headers offer CMPI level 200 only"
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* Records. Their function tables are in cmpift.h. */
typedef struct _CMPIBroker CMPIBroker;
typedef struct _CMPIContext CMPIContext;
typedef struct _CMPIResult CMPIResult;
typedef struct _CMPIString CMPIString;
typedef struct _CMPIArray CMPIArray;
typedef struct _CMPIEnumeration CMPIEnumeration;
typedef struct _CMPIInstance CMPIInstance;
typedef struct _CMPIObjectPath CMPIObjectPath;
typedef struct _CMPIArgs CMPIArgs;
typedef struct _CMPIDateTime CMPIDateTime;
typedef struct _CMPISelectExp CMPISelectExp;
typedef struct _CMPISelectCond CMPISelectCond;
typedef struct _CMPISubCond CMPISubCond;
typedef struct _CMPIPredicate CMPIPredicate;
typedef struct _CMPIError CMPIError;
typedef struct _CMPIInstanceMI CMPIInstanceMI;
typedef struct _CMPIAssociationMI CMPIAssociationMI;
typedef struct _CMPIMethodMI CMPIMethodMI;
typedef struct _CMPIPropertyMI CMPIPropertyMI;
typedef struct _CMPIIndicationMI CMPIIndicationMI;

typedef struct _CMPIBrokerFT CMPIBrokerFT;
typedef struct _CMPIBrokerEncFT CMPIBrokerEncFT;
typedef struct _CMPIBrokerExtFT CMPIBrokerExtFT;
typedef struct _CMPIBrokerMemFT CMPIBrokerMemFT;
typedef struct _CMPIContextFT CMPIContextFT;
typedef struct _CMPIResultFT CMPIResultFT;
typedef struct _CMPIStringFT CMPIStringFT;
typedef struct _CMPIArrayFT CMPIArrayFT;
typedef struct _CMPIEnumerationFT CMPIEnumerationFT;
typedef struct _CMPIInstanceFT CMPIInstanceFT;
typedef struct _CMPIObjectPathFT CMPIObjectPathFT;
typedef struct _CMPIArgsFT CMPIArgsFT;
typedef struct _CMPIDateTimeFT CMPIDateTimeFT;
typedef struct _CMPISelectExpFT CMPISelectExpFT;
typedef struct _CMPISelectCondFT CMPISelectCondFT;
typedef struct _CMPISubCondFT CMPISubCondFT;
typedef struct _CMPIPredicateFT CMPIPredicateFT;
typedef struct _CMPIErrorFT CMPIErrorFT;
typedef struct _CMPIInstanceMIFT CMPIInstanceMIFT;
typedef struct _CMPIAssociationMIFT CMPIAssociationMIFT;
typedef struct _CMPIMethodMIFT CMPIMethodMIFT;
typedef struct _CMPIPropertyMIFT CMPIPropertyMIFT;
typedef struct _CMPIIndicationMIFT CMPIIndicationMIFT;

/* Scalar types. */
typedef unsigned char CMPIBoolean;
typedef unsigned short CMPIChar16;
typedef unsigned char CMPIUint8;
typedef unsigned short CMPIUint16;
typedef unsigned int CMPIUint32;
typedef unsigned long long CMPIUint64;
typedef signed char CMPISint8;
typedef short CMPISint16;
typedef signed int CMPISint32;
typedef long long CMPISint64;
typedef float CMPIReal32;
typedef double CMPIReal64;

typedef unsigned int CMPICount;
typedef unsigned int CMPIFlags;
typedef unsigned short CMPIType;
typedef unsigned short CMPIValueState;
typedef void* CMPIMsgFileHandle;
typedef void CMPIGcStat;

/* CMPIType. The masks overlap (UINT is set in signed types too): compare
 * whole values, with CMPI_ARRAY taken off first. */
#define CMPI_null ((CMPIType)0x0000)
#define CMPI_SIMPLE ((CMPIType)0x0002)
#define CMPI_REAL ((CMPIType)0x0008)
#define CMPI_UINT ((CMPIType)0x0080)
#define CMPI_SINT ((CMPIType)0x00c0)
#define CMPI_INTEGER ((CMPIType)(CMPI_UINT | CMPI_SINT))
#define CMPI_ENC ((CMPIType)0x1000)
#define CMPI_ARRAY ((CMPIType)0x2000)

#define CMPI_boolean ((CMPIType)0x0002)
#define CMPI_char16 ((CMPIType)0x0003)
#define CMPI_real32 ((CMPIType)0x0008)
#define CMPI_real64 ((CMPIType)0x000c)
#define CMPI_uint8 ((CMPIType)0x0080)
#define CMPI_uint16 ((CMPIType)0x0090)
#define CMPI_uint32 ((CMPIType)0x00a0)
#define CMPI_uint64 ((CMPIType)0x00b0)
#define CMPI_sint8 ((CMPIType)0x00c0)
#define CMPI_sint16 ((CMPIType)0x00d0)
#define CMPI_sint32 ((CMPIType)0x00e0)
#define CMPI_sint64 ((CMPIType)0x00f0)
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
#define CMPI_charsptr ((CMPIType)0x1a00)

#define CMPI_booleanA ((CMPIType)(CMPI_ARRAY | CMPI_boolean))
#define CMPI_char16A ((CMPIType)(CMPI_ARRAY | CMPI_char16))
#define CMPI_real32A ((CMPIType)(CMPI_ARRAY | CMPI_real32))
#define CMPI_real64A ((CMPIType)(CMPI_ARRAY | CMPI_real64))
#define CMPI_uint8A ((CMPIType)(CMPI_ARRAY | CMPI_uint8))
#define CMPI_uint16A ((CMPIType)(CMPI_ARRAY | CMPI_uint16))
#define CMPI_uint32A ((CMPIType)(CMPI_ARRAY | CMPI_uint32))
#define CMPI_uint64A ((CMPIType)(CMPI_ARRAY | CMPI_uint64))
#define CMPI_sint8A ((CMPIType)(CMPI_ARRAY | CMPI_sint8))
#define CMPI_sint16A ((CMPIType)(CMPI_ARRAY | CMPI_sint16))
#define CMPI_sint32A ((CMPIType)(CMPI_ARRAY | CMPI_sint32))
#define CMPI_sint64A ((CMPIType)(CMPI_ARRAY | CMPI_sint64))
#define CMPI_stringA ((CMPIType)(CMPI_ARRAY | CMPI_string))
#define CMPI_charsA ((CMPIType)(CMPI_ARRAY | CMPI_chars))
#define CMPI_dateTimeA ((CMPIType)(CMPI_ARRAY | CMPI_dateTime))
#define CMPI_instanceA ((CMPIType)(CMPI_ARRAY | CMPI_instance))
#define CMPI_refA ((CMPIType)(CMPI_ARRAY | CMPI_ref))
#define CMPI_charsptrA ((CMPIType)(CMPI_ARRAY | CMPI_charsptr))
#define CMPI_SIMPLEA ((CMPIType)(CMPI_ARRAY | CMPI_SIMPLE))
#define CMPI_REALA ((CMPIType)(CMPI_ARRAY | CMPI_REAL))
#define CMPI_UINTA ((CMPIType)(CMPI_ARRAY | CMPI_UINT))
#define CMPI_SINTA ((CMPIType)(CMPI_ARRAY | CMPI_SINT))
#define CMPI_INTEGERA ((CMPIType)(CMPI_ARRAY | CMPI_INTEGER))
#define CMPI_ENCA ((CMPIType)(CMPI_ARRAY | CMPI_ENC))

#define CMPI_keyInteger CMPI_sint64
#define CMPI_keyString CMPI_string
#define CMPI_keyBoolean CMPI_boolean
#define CMPI_keyRef CMPI_ref

/* Types of predicates only; charString, classNameString and nameString share
 * their values with other types. */
#define CMPI_charString ((CMPIType)0x1600)
#define CMPI_integerString ((CMPIType)0x16f0)
#define CMPI_realString ((CMPIType)0x160c)
#define CMPI_numericString ((CMPIType)0x16fc)
#define CMPI_booleanString ((CMPIType)0x1602)
#define CMPI_dateTimeString ((CMPIType)0x1e00)
#define CMPI_classNameString ((CMPIType)0x1700)
#define CMPI_nameString ((CMPIType)0x1e00)

#ifndef CMPI_NO_SYNONYM_SUPPORT
#define CMPI_Byte CMPI_sint8
#define CMPI_Short CMPI_sint16
#define CMPI_Int CMPI_sint32
#define CMPI_Long CMPI_sint64
#define CMPI_Float CMPI_real32
#define CMPI_Double CMPI_real64
#define CMPI_ByteA CMPI_sint8A
#define CMPI_ShortA CMPI_sint16A
#define CMPI_IntA CMPI_sint32A
#define CMPI_LongA CMPI_sint64A
#define CMPI_FloatA CMPI_real32A
#define CMPI_DoubleA CMPI_real64A
#endif

/* CMPIValueState. */
#define CMPI_goodValue ((CMPIValueState)0x0000)
#define CMPI_nullValue ((CMPIValueState)0x0100)
#define CMPI_keyValue ((CMPIValueState)0x0200)
#define CMPI_notFound ((CMPIValueState)0x0400)
#define CMPI_badValue ((CMPIValueState)0x8000)

typedef struct _CMPIValuePtr {
    void* ptr;
    CMPICount length;
} CMPIValuePtr;

/* Assign members by name: header issues differ in which member comes first.
 * Only the member that the accompanying CMPIType names is meaningful. */
typedef union _CMPIValue {
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
} CMPIValue;

typedef struct _CMPIData {
    CMPIType type;
    CMPIValueState state;
    CMPIValue value;
} CMPIData;

typedef CMPIData CMPIAccessor(const char* propertyName, void* parm);
typedef CMPI_THREAD_RETURN(CMPI_THREAD_CDECL* CMPIThreadFunc)(void* parm);
typedef void (*CMPIThreadOnceFunc)(void);
typedef void (*CMPIThreadKeyCleanupFunc)(void* key);

/* Return codes; 1 to 17 equal the CIM status codes. */
typedef enum _CMPIrc {
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

typedef struct _CMPIStatus {
    CMPIrc rc;
    CMPIString* msg; /* null without a text */
} CMPIStatus;

/* CMPIFlags and the names of context entries. */
#define CMPI_FLAG_LocalOnly 1
#define CMPI_FLAG_DeepInheritance 2
#define CMPI_FLAG_IncludeQualifiers 4
#define CMPI_FLAG_IncludeClassOrigin 8
#define CMPIInitNameSpace "CMPIInitNameSpace"
#define CMPIInvocationFlags "CMPIInvocationFlags"
#define CMPIPrincipal "CMPIPrincipal"
#define CMPIRole "CMPIRole"
#define CMPIAcceptLanguage "CMPIAcceptLanguage"
#define CMPIContentLanguage "CMPIContentLanguage"

/* brokerCapabilities: test with (capabilities & mask) == mask. */
#define CMPI_MB_BasicRead 0x1
#define CMPI_MB_BasicWrite 0x3
#define CMPI_MB_InstanceManipulation 0x7
#define CMPI_MB_AssociationTraversal 0x9
#define CMPI_MB_QueryExecution 0x11
#define CMPI_MB_QueryNormalization 0x31
#define CMPI_MB_BasicQualifierSupport 0x47
#define CMPI_MB_Indications 0x81
#define CMPI_MB_OSEncapsulationSupport 0x100
#define CMPI_MB_Supports_MemEnhancements 0x4000
#define CMPI_MB_Supports_Extended_Error 0x8000

typedef enum _CMPIPredOp {
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
    CMPI_PredOp_Not_Null = 11,
    CMPI_PredOp_Null = 12,
    CMPI_PredOp_And = 13,
    CMPI_PredOp_Or = 14
} CMPIPredOp;

typedef enum _CMPISeverity {
    CMPI_SEV_ERROR = 1,
    CMPI_SEV_INFO = 2,
    CMPI_SEV_WARNING = 3,
    CMPI_DEV_DEBUG = 4
} CMPISeverity;

typedef enum _CMPILevel { CMPI_LEV_INFO = 1, CMPI_LEV_WARNING = 2, CMPI_LEV_VERBOSE = 3 } CMPILevel;

typedef enum _CMPIErrorType {
    UnknownErrorType = 0,
    OtherErrorType = 1,
    CommunicationsError = 2,
    QualityOfServiceError = 3,
    SoftwareError = 4,
    HardwareError = 5,
    EnvironmentalError = 6,
    SecurityError = 7,
    Oversubscription_Error = 8,
    UnavailableResourceError = 9,
    UnsupportedOperationError = 10
} CMPIErrorType;

typedef enum _CMPIErrorSeverity {
    ErrorSevUnknown = 0,
    ErrorSevLow = 2,
    ErrorSevMedium = 3,
    ErrorSevHigh = 4,
    ErrorSevFatal = 5
} CMPIErrorSeverity;

typedef enum _CMPIErrorSrcFormat {
    CMPIErrSrcUnknown = 0,
    CMPIErrSrcOther = 1,
    CIMObjectHandle = 2
} CMPIErrorSrcFormat;

typedef enum _CMPISelectCondType { CMPI_COND_DOC = 0, CMPI_COND_COD = 1 } CMPISelectCondType;

typedef enum _CMPIErrorProbableCause {
    ErrorProbCauseUnknown = 0,
    ErrorProbCauseOther,
    Adapter_Card_Error,
    Application_Subsystem_Failure,
    Bandwidth_Reduced,
    Connection_Establishment_Error,
    Communications_Protocol_Error,
    Communications_Subsystem_Failure,
    ConfigurationCustomization_Error,
    Congestion,
    Corrupt_Data,
    CPU_Cycles_Limit_Exceeded,
    DatasetModem_Error,
    Degraded_Signal,
    DTE_DCE_Interface_Error,
    Enclosure_Door_Open,
    Equipment_Malfunction,
    Excessive_Vibration,
    File_Format_Error,
    Fire_Detected,
    Flood_Detected,
    Framing_Error,
    HVAC_Problem,
    Humidity_Unacceptable,
    IO_Device_Error,
    Input_Device_Error,
    LAN_Error,
    Non_Toxic_Leak_Detected,
    Local_Node_Transmission_Error,
    Loss_of_Frame,
    Loss_of_Signal,
    Material_Supply_Exhausted,
    Multiplexer_Problem,
    Out_of_Memory,
    Output_Device_Error,
    Performance_Degraded,
    Power_Problem,
    Pressure_Unacceptable,
    Processor_Problem,
    Pump_Failure,
    Queue_Size_Exceeded,
    Receive_Failure,
    Receiver_Failure,
    Remote_Node_Transmission_Error,
    Resource_at_or_Nearing_Capacity,
    Response_Time_Excessive,
    Retransmission_Rate_Excessive,
    Software_Error,
    Software_Program_Abnormally_Terminated,
    Software_Program_Error,
    Storage_Capacity_Problem,
    Temperature_Unacceptable,
    Threshold_Crossed,
    Timing_Problem,
    Toxic_Leak_Detected,
    Transmit_Failure,
    Transmitter_Failure,
    Underlying_Resource_Unavailable,
    Version_Mismatch,
    Previous_Alert_Cleared,
    Login_Attempts_Failed,
    Software_Virus_Detected,
    Hardware_Security_Breached,
    Denial_of_Service_Detected,
    Security_Credential_Mismatch,
    Unauthorized_Access,
    Alarm_Received,
    Loss_of_Pointer,
    Payload_Mismatch,
    Transmission_Error,
    Excessive_Error_Rate,
    Trace_Problem,
    Element_Unavailable,
    Element_Missing,
    Loss_of_Multi_Frame,
    Broadcast_Channel_Failure,
    Invalid_Message_Received,
    Routing_Failure,
    Backplane_Failure,
    Identifier_Duplication,
    Protection_Path_Failure,
    Sync_Loss_or_Mismatch,
    Terminal_Problem,
    Real_Time_Clock_Failure,
    Antenna_Failure,
    Battery_Charging_Failure,
    Disk_Failure,
    Frequency_Hopping_Failure,
    Loss_of_Redundancy,
    Power_Supply_Failure,
    Signal_Quality_Problem,
    Battery_Discharging,
    Battery_Failure,
    Commercial_Power_Problem,
    Fan_Failure,
    Engine_Failure,
    Sensor_Failure,
    Fuse_Failure,
    Generator_Failure,
    Low_Battery,
    Low_Fuel,
    Low_Water,
    Explosive_Gas,
    High_Winds,
    Ice_Buildup,
    Smoke,
    Memory_Mismatch,
    Out_of_CPU_Cycles,
    Software_Environment_Problem,
    Software_Download_Failure,
    Element_Reinitialized,
    Timeout,
    Logging_Problems,
    Leak_Detected,
    Protection_Mechanism_Failure,
    Protecting_Resource_Failure,
    Database_Inconsistency,
    Authentication_Failure,
    Breach_of_Confidentiality,
    Cable_Tamper,
    Delayed_Information,
    Duplicate_Information,
    Information_Missing,
    Information_Modification,
    Information_Out_of_Sequence,
    Key_Expired,
    Non_Repudiation_Failure,
    Out_of_Hours_Activity,
    Out_of_Service,
    Procedural_Error,
    Unexpected_Information
} CMPIErrorProbableCause;

#ifdef __cplusplus
}
#endif

#endif
