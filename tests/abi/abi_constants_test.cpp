// Numeric values of every CMPI constant a provider or broker exchanges:
// type codes, value states, return codes, flags, severities, levels,
// capability bits, error enums and the interface version.
#include <cmpift.h>

#include <string_view>

#include <gtest/gtest.h>

namespace
{

// ---- Interface version -----------------------------------------------------

static_assert(CMPIVersion100 == 100);
static_assert(CMPIVersion200 == 200);
static_assert(CMPICurrentVersion == 200);
#if !defined(CMPI_VER_200) || !defined(CMPI_VER_100) || !defined(CMPI_VER_86)
#error "Selecting interface version 200 must enable all 2.0 members"
#endif

// ---- CMPIType codes
// ----------------------------------------------------------

static_assert(CMPI_INTEGER == 0x00C0);
static_assert(CMPI_INTEGERA == 0x20C0);
static_assert(CMPI_null == 0x0000);
static_assert(CMPI_ARRAY == 0x2000);
static_assert(CMPI_SIMPLE == 0x0002);
static_assert(CMPI_SIMPLEA == 0x2002);
static_assert(CMPI_boolean == 0x0002);
static_assert(CMPI_booleanA == 0x2002);
static_assert(CMPI_char16 == 0x0003);
static_assert(CMPI_char16A == 0x2003);
static_assert(CMPI_REAL == 0x0008);
static_assert(CMPI_REALA == 0x2008);
static_assert(CMPI_real32 == 0x0008);
static_assert(CMPI_real32A == 0x2008);
static_assert(CMPI_real64 == 0x000C);
static_assert(CMPI_real64A == 0x200C);
static_assert(CMPI_UINT == 0x0080);
static_assert(CMPI_UINTA == 0x2080);
static_assert(CMPI_uint8 == 0x0080);
static_assert(CMPI_uint8A == 0x2080);
static_assert(CMPI_uint16 == 0x0090);
static_assert(CMPI_uint16A == 0x2090);
static_assert(CMPI_uint32 == 0x00A0);
static_assert(CMPI_uint32A == 0x20A0);
static_assert(CMPI_uint64 == 0x00B0);
static_assert(CMPI_uint64A == 0x20B0);
static_assert(CMPI_SINT == 0x00C0);
static_assert(CMPI_SINTA == 0x20C0);
static_assert(CMPI_sint8 == 0x00C0);
static_assert(CMPI_sint8A == 0x20C0);
static_assert(CMPI_sint16 == 0x00D0);
static_assert(CMPI_sint16A == 0x20D0);
static_assert(CMPI_sint32 == 0x00E0);
static_assert(CMPI_sint32A == 0x20E0);
static_assert(CMPI_sint64 == 0x00F0);
static_assert(CMPI_sint64A == 0x20F0);
static_assert(CMPI_ENC == 0x1000);
static_assert(CMPI_ENCA == 0x3000);
static_assert(CMPI_instance == 0x1000);
static_assert(CMPI_instanceA == 0x3000);
static_assert(CMPI_ref == 0x1100);
static_assert(CMPI_refA == 0x3100);
static_assert(CMPI_args == 0x1200);
static_assert(CMPI_class == 0x1300);
static_assert(CMPI_filter == 0x1400);
static_assert(CMPI_enumeration == 0x1500);
static_assert(CMPI_string == 0x1600);
static_assert(CMPI_stringA == 0x3600);
static_assert(CMPI_chars == 0x1700);
static_assert(CMPI_charsA == 0x3700);
static_assert(CMPI_dateTime == 0x1800);
static_assert(CMPI_dateTimeA == 0x3800);
static_assert(CMPI_ptr == 0x1900);
static_assert(CMPI_charsptr == 0x1A00);
static_assert(CMPI_charsptrA == 0x3A00);
static_assert(CMPI_Byte == 0x00C0);
static_assert(CMPI_ByteA == 0x20C0);
static_assert(CMPI_Short == 0x00D0);
static_assert(CMPI_ShortA == 0x20D0);
static_assert(CMPI_Int == 0x00E0);
static_assert(CMPI_IntA == 0x20E0);
static_assert(CMPI_Long == 0x00F0);
static_assert(CMPI_LongA == 0x20F0);
static_assert(CMPI_Float == 0x0008);
static_assert(CMPI_FloatA == 0x2008);
static_assert(CMPI_Double == 0x000C);
static_assert(CMPI_DoubleA == 0x200C);
static_assert(CMPI_keyInteger == 0x00F0);
static_assert(CMPI_keyString == 0x1600);
static_assert(CMPI_keyBoolean == 0x0002);
static_assert(CMPI_keyRef == 0x1100);
static_assert(CMPI_charString == 0x1600);
static_assert(CMPI_integerString == 0x16F0);
static_assert(CMPI_realString == 0x160C);
static_assert(CMPI_numericString == 0x16FC);
static_assert(CMPI_booleanString == 0x1602);
static_assert(CMPI_dateTimeString == 0x1E00);
static_assert(CMPI_classNameString == 0x1700);
static_assert(CMPI_nameString == 0x1E00);

// Each array code is its element code with the array bit set.
static_assert(CMPI_uint16A == (CMPI_ARRAY | CMPI_uint16));
static_assert(CMPI_stringA == (CMPI_ARRAY | CMPI_string));
static_assert((CMPI_refA & ~CMPI_ARRAY) == CMPI_ref);

// ---- Value states --------------------------------------------------------

static_assert(CMPI_goodValue == 0);
static_assert(CMPI_nullValue == 0x0100);
static_assert(CMPI_keyValue == 0x0200);
static_assert(CMPI_notFound == 0x0400);
static_assert(CMPI_badValue == 0x8000);

// ---- Return codes --------------------------------------------------------

static_assert(CMPI_RC_OK == 0);
static_assert(CMPI_RC_ERR_FAILED == 1);
static_assert(CMPI_RC_ERR_ACCESS_DENIED == 2);
static_assert(CMPI_RC_ERR_INVALID_NAMESPACE == 3);
static_assert(CMPI_RC_ERR_INVALID_PARAMETER == 4);
static_assert(CMPI_RC_ERR_INVALID_CLASS == 5);
static_assert(CMPI_RC_ERR_NOT_FOUND == 6);
static_assert(CMPI_RC_ERR_NOT_SUPPORTED == 7);
static_assert(CMPI_RC_ERR_CLASS_HAS_CHILDREN == 8);
static_assert(CMPI_RC_ERR_CLASS_HAS_INSTANCES == 9);
static_assert(CMPI_RC_ERR_INVALID_SUPERCLASS == 10);
static_assert(CMPI_RC_ERR_ALREADY_EXISTS == 11);
static_assert(CMPI_RC_ERR_NO_SUCH_PROPERTY == 12);
static_assert(CMPI_RC_ERR_TYPE_MISMATCH == 13);
static_assert(CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED == 14);
static_assert(CMPI_RC_ERR_INVALID_QUERY == 15);
static_assert(CMPI_RC_ERR_METHOD_NOT_AVAILABLE == 16);
static_assert(CMPI_RC_ERR_METHOD_NOT_FOUND == 17);
static_assert(CMPI_RC_NO_MORE_ELEMENTS == 18);
static_assert(CMPI_RC_DO_NOT_UNLOAD == 50);
static_assert(CMPI_RC_NEVER_UNLOAD == 51);
static_assert(CMPI_RC_ERR_INVALID_HANDLE == 60);
static_assert(CMPI_RC_ERR_INVALID_DATA_TYPE == 61);
static_assert(CMPI_RC_ERROR_SYSTEM == 100);
static_assert(CMPI_RC_ERROR == 200);

// ---- Invocation flags and context entry names ------------------------------

static_assert(CMPI_FLAG_LocalOnly == 1);
static_assert(CMPI_FLAG_DeepInheritance == 2);
static_assert(CMPI_FLAG_IncludeQualifiers == 4);
static_assert(CMPI_FLAG_IncludeClassOrigin == 8);

static_assert(std::string_view{CMPIPrincipal} == "CMPIPrincipal");
static_assert(std::string_view{CMPIInvocationFlags} == "CMPIInvocationFlags");
static_assert(std::string_view{CMPIInitNameSpace} == "CMPIInitNameSpace");
static_assert(std::string_view{CMPIRole} == "CMPIRole");
static_assert(std::string_view{CMPIAcceptLanguage} == "CMPIAcceptLanguage");
static_assert(std::string_view{CMPIContentLanguage} == "CMPIContentLanguage");

// ---- Severities, trace levels, predicates, select conditions
// -----------------

static_assert(CMPI_SEV_ERROR == 1);
static_assert(CMPI_SEV_INFO == 2);
static_assert(CMPI_SEV_WARNING == 3);
static_assert(CMPI_DEV_DEBUG == 4);

static_assert(CMPI_LEV_INFO == 1);
static_assert(CMPI_LEV_WARNING == 2);
static_assert(CMPI_LEV_VERBOSE == 3);

static_assert(CMPI_PredOp_Equals == 1);
static_assert(CMPI_PredOp_NotEquals == 2);
static_assert(CMPI_PredOp_LessThan == 3);
static_assert(CMPI_PredOp_GreaterThanOrEquals == 4);
static_assert(CMPI_PredOp_GreaterThan == 5);
static_assert(CMPI_PredOp_LessThanOrEquals == 6);
static_assert(CMPI_PredOp_Isa == 7);
static_assert(CMPI_PredOp_NotIsa == 8);
static_assert(CMPI_PredOp_Like == 9);
static_assert(CMPI_PredOp_NotLike == 10);
static_assert(CMPI_PredOp_Not_Null == 11);
static_assert(CMPI_PredOp_Null == 12);
static_assert(CMPI_PredOp_And == 13);
static_assert(CMPI_PredOp_Or == 14);

static_assert(CMPI_COND_DOC == 0);
static_assert(CMPI_COND_COD == 1);

// ---- Broker capability bits
// --------------------------------------------------

static_assert(CMPI_MB_Class_0 == 0x1);
static_assert(CMPI_MB_Class_1 == 0x3);
static_assert(CMPI_MB_Class_2 == 0x7);
static_assert(CMPI_MB_Supports_PropertyMI == 0x100);
static_assert(CMPI_MB_Supports_IndicationMI == 0x200);
static_assert(CMPI_MB_Supports_IndicationPolling == 0x400);
static_assert(CMPI_MB_Supports_QueryNormalization == 0x800);
static_assert(CMPI_MB_Supports_Qualifier == 0x1000);
static_assert(CMPI_MB_Supports_Schema == 0x3000);
static_assert(CMPI_MB_Supports_MemEnhancements == 0x4000);
static_assert(CMPI_MB_Supports_Extended_Error == 0x8000);
static_assert(CMPI_MB_BasicRead == 0x1);
static_assert(CMPI_MB_BasicWrite == 0x3);
static_assert(CMPI_MB_InstanceManipulation == 0x7);
static_assert(CMPI_MB_AssociationTraversal == 0x9);
static_assert(CMPI_MB_QueryExecution == 0x11);
static_assert(CMPI_MB_QueryNormalization == 0x31);
static_assert(CMPI_MB_Indications == 0x81);
static_assert(CMPI_MB_BasicQualifierSupport == 0x47);
static_assert(CMPI_MB_OSEncapsulationSupport == 0x100);

// ---- Extended error enums
// ----------------------------------------------------

static_assert(UnknownErrorType == 0);
static_assert(OtherErrorType == 1);
static_assert(CommunicationsError == 2);
static_assert(QualityOfServiceError == 3);
static_assert(SoftwareError == 4);
static_assert(HardwareError == 5);
static_assert(EnvironmentalError == 6);
static_assert(SecurityError == 7);
static_assert(Oversubscription_Error == 8);
static_assert(UnavailableResourceError == 9);
static_assert(UnsupportedOperationError == 10);

static_assert(ErrorSevUnknown == 0);
static_assert(ErrorSevLow == 2);
static_assert(ErrorSevMedium == 3);
static_assert(ErrorSevHigh == 4);
static_assert(ErrorSevFatal == 5);

static_assert(CMPIErrSrcUnknown == 0);
static_assert(CMPIErrSrcOther == 1);
static_assert(CIMObjectHandle == 2);

static_assert(ErrorProbCauseUnknown == 0);
static_assert(ErrorProbCauseOther == 1);
static_assert(Adapter_Card_Error == 2);
static_assert(Application_Subsystem_Failure == 3);
static_assert(Bandwidth_Reduced == 4);
static_assert(Connection_Establishment_Error == 5);
static_assert(Communications_Protocol_Error == 6);
static_assert(Communications_Subsystem_Failure == 7);
static_assert(ConfigurationCustomization_Error == 8);
static_assert(Congestion == 9);
static_assert(Corrupt_Data == 10);
static_assert(CPU_Cycles_Limit_Exceeded == 11);
static_assert(DatasetModem_Error == 12);
static_assert(Degraded_Signal == 13);
static_assert(DTE_DCE_Interface_Error == 14);
static_assert(Enclosure_Door_Open == 15);
static_assert(Equipment_Malfunction == 16);
static_assert(Excessive_Vibration == 17);
static_assert(File_Format_Error == 18);
static_assert(Fire_Detected == 19);
static_assert(Flood_Detected == 20);
static_assert(Framing_Error == 21);
static_assert(HVAC_Problem == 22);
static_assert(Humidity_Unacceptable == 23);
static_assert(IO_Device_Error == 24);
static_assert(Input_Device_Error == 25);
static_assert(LAN_Error == 26);
static_assert(Non_Toxic_Leak_Detected == 27);
static_assert(Local_Node_Transmission_Error == 28);
static_assert(Loss_of_Frame == 29);
static_assert(Loss_of_Signal == 30);
static_assert(Material_Supply_Exhausted == 31);
static_assert(Multiplexer_Problem == 32);
static_assert(Out_of_Memory == 33);
static_assert(Output_Device_Error == 34);
static_assert(Performance_Degraded == 35);
static_assert(Power_Problem == 36);
static_assert(Pressure_Unacceptable == 37);
static_assert(Processor_Problem == 38);
static_assert(Pump_Failure == 39);
static_assert(Queue_Size_Exceeded == 40);
static_assert(Receive_Failure == 41);
static_assert(Receiver_Failure == 42);
static_assert(Remote_Node_Transmission_Error == 43);
static_assert(Resource_at_or_Nearing_Capacity == 44);
static_assert(Response_Time_Excessive == 45);
static_assert(Retransmission_Rate_Excessive == 46);
static_assert(Software_Error == 47);
static_assert(Software_Program_Abnormally_Terminated == 48);
static_assert(Software_Program_Error == 49);
static_assert(Storage_Capacity_Problem == 50);
static_assert(Temperature_Unacceptable == 51);
static_assert(Threshold_Crossed == 52);
static_assert(Timing_Problem == 53);
static_assert(Toxic_Leak_Detected == 54);
static_assert(Transmit_Failure == 55);
static_assert(Transmitter_Failure == 56);
static_assert(Underlying_Resource_Unavailable == 57);
static_assert(Version_Mismatch == 58);
static_assert(Previous_Alert_Cleared == 59);
static_assert(Login_Attempts_Failed == 60);
static_assert(Software_Virus_Detected == 61);
static_assert(Hardware_Security_Breached == 62);
static_assert(Denial_of_Service_Detected == 63);
static_assert(Security_Credential_Mismatch == 64);
static_assert(Unauthorized_Access == 65);
static_assert(Alarm_Received == 66);
static_assert(Loss_of_Pointer == 67);
static_assert(Payload_Mismatch == 68);
static_assert(Transmission_Error == 69);
static_assert(Excessive_Error_Rate == 70);
static_assert(Trace_Problem == 71);
static_assert(Element_Unavailable == 72);
static_assert(Element_Missing == 73);
static_assert(Loss_of_Multi_Frame == 74);
static_assert(Broadcast_Channel_Failure == 75);
static_assert(Invalid_Message_Received == 76);
static_assert(Routing_Failure == 77);
static_assert(Backplane_Failure == 78);
static_assert(Identifier_Duplication == 79);
static_assert(Protection_Path_Failure == 80);
static_assert(Sync_Loss_or_Mismatch == 81);
static_assert(Terminal_Problem == 82);
static_assert(Real_Time_Clock_Failure == 83);
static_assert(Antenna_Failure == 84);
static_assert(Battery_Charging_Failure == 85);
static_assert(Disk_Failure == 86);
static_assert(Frequency_Hopping_Failure == 87);
static_assert(Loss_of_Redundancy == 88);
static_assert(Power_Supply_Failure == 89);
static_assert(Signal_Quality_Problem == 90);
static_assert(Battery_Discharging == 91);
static_assert(Battery_Failure == 92);
static_assert(Commercial_Power_Problem == 93);
static_assert(Fan_Failure == 94);
static_assert(Engine_Failure == 95);
static_assert(Sensor_Failure == 96);
static_assert(Fuse_Failure == 97);
static_assert(Generator_Failure == 98);
static_assert(Low_Battery == 99);
static_assert(Low_Fuel == 100);
static_assert(Low_Water == 101);
static_assert(Explosive_Gas == 102);
static_assert(High_Winds == 103);
static_assert(Ice_Buildup == 104);
static_assert(Smoke == 105);
static_assert(Memory_Mismatch == 106);
static_assert(Out_of_CPU_Cycles == 107);
static_assert(Software_Environment_Problem == 108);
static_assert(Software_Download_Failure == 109);
static_assert(Element_Reinitialized == 110);
static_assert(Timeout == 111);
static_assert(Logging_Problems == 112);
static_assert(Leak_Detected_113 == 113);
static_assert(Protection_Mechanism_Failure == 114);
static_assert(Protecting_Resource_Failure == 115);
static_assert(Database_Inconsistency == 116);
static_assert(Authentication_Failure == 117);
static_assert(Breach_of_Confidentiality == 118);
static_assert(Cable_Tamper == 119);
static_assert(Delayed_Information == 120);
static_assert(Duplicate_Information == 121);
static_assert(Information_Missing == 122);
static_assert(Information_Modification == 123);
static_assert(Information_Out_of_Sequence == 124);
static_assert(Key_Expired == 125);
static_assert(Non_Repudiation_Failure == 126);
static_assert(Out_of_Hours_Activity == 127);
static_assert(Out_of_Service == 128);
static_assert(Procedural_Error == 129);
static_assert(Unexpected_Information == 130);

// ---- Runtime use of the constants ------------------------------------------

bool isArrayType(CMPIType type)
{
    return (type & CMPI_ARRAY) != 0;
}

CMPIType elementType(CMPIType type)
{
    return static_cast<CMPIType>(type & ~CMPI_ARRAY);
}

TEST(Constants, ArrayCodesDecomposeIntoElementCodes)
{
    EXPECT_TRUE(isArrayType(CMPI_uint16A));
    EXPECT_TRUE(isArrayType(CMPI_stringA));
    EXPECT_FALSE(isArrayType(CMPI_chars));
    EXPECT_FALSE(isArrayType(CMPI_dateTime));
    EXPECT_EQ(elementType(CMPI_uint16A), CMPI_uint16);
    EXPECT_EQ(elementType(CMPI_stringA), CMPI_string);
    EXPECT_EQ(elementType(CMPI_instanceA), CMPI_instance);
}

TEST(Constants, InvocationFlagsCombineAsDistinctBits)
{
    const CMPIFlags flags = CMPI_FLAG_LocalOnly | CMPI_FLAG_IncludeClassOrigin;
    EXPECT_EQ(flags, 9u);
    EXPECT_EQ(flags & CMPI_FLAG_DeepInheritance, 0u);
    EXPECT_EQ(flags & CMPI_FLAG_IncludeQualifiers, 0u);
}

} // namespace
