// The numbers that host and provider exchange. All are fixed by the CMPI standard
// (Open Group, version 2.0); a program built against other headers has these.
#include <cmpift.h>
#include <gtest/gtest.h>

#include <string_view>
#include <type_traits>

namespace {

TEST(CmpiValues, Versions) {
    EXPECT_EQ(CMPIVersion100, 100);
    EXPECT_EQ(CMPIVersion200, 200);
    EXPECT_EQ(CMPI_VERSION, 200);
    EXPECT_EQ(CMPICurrentVersion, 200);
}

TEST(CmpiValues, SixtyFourBitIntegersAreLongLong) {
    EXPECT_TRUE((std::is_same_v<CMPIUint64, unsigned long long>));
    EXPECT_TRUE((std::is_same_v<CMPISint64, long long>));
}

TEST(CmpiValues, Types) {
    EXPECT_EQ(CMPI_null, 0x0000);
    EXPECT_EQ(CMPI_boolean, 0x0002);
    EXPECT_EQ(CMPI_char16, 0x0003);
    EXPECT_EQ(CMPI_real32, 0x0008);
    EXPECT_EQ(CMPI_real64, 0x000c);
    EXPECT_EQ(CMPI_uint8, 0x0080);
    EXPECT_EQ(CMPI_uint16, 0x0090);
    EXPECT_EQ(CMPI_uint32, 0x00a0);
    EXPECT_EQ(CMPI_uint64, 0x00b0);
    EXPECT_EQ(CMPI_sint8, 0x00c0);
    EXPECT_EQ(CMPI_sint16, 0x00d0);
    EXPECT_EQ(CMPI_sint32, 0x00e0);
    EXPECT_EQ(CMPI_sint64, 0x00f0);
    EXPECT_EQ(CMPI_instance, 0x1000);
    EXPECT_EQ(CMPI_ref, 0x1100);
    EXPECT_EQ(CMPI_args, 0x1200);
    EXPECT_EQ(CMPI_class, 0x1300);
    EXPECT_EQ(CMPI_filter, 0x1400);
    EXPECT_EQ(CMPI_enumeration, 0x1500);
    EXPECT_EQ(CMPI_string, 0x1600);
    EXPECT_EQ(CMPI_chars, 0x1700);
    EXPECT_EQ(CMPI_dateTime, 0x1800);
    EXPECT_EQ(CMPI_ptr, 0x1900);
    EXPECT_EQ(CMPI_charsptr, 0x1a00);
}

TEST(CmpiValues, Masks) {
    EXPECT_EQ(CMPI_SIMPLE, 0x0002);
    EXPECT_EQ(CMPI_REAL, 0x0008);
    EXPECT_EQ(CMPI_UINT, 0x0080);
    EXPECT_EQ(CMPI_SINT, 0x00c0);
    EXPECT_EQ(CMPI_INTEGER, 0x00c0);
    EXPECT_EQ(CMPI_ENC, 0x1000);
    EXPECT_EQ(CMPI_ARRAY, 0x2000);
    EXPECT_EQ(CMPI_SIMPLEA, 0x2002);
    EXPECT_EQ(CMPI_REALA, 0x2008);
    EXPECT_EQ(CMPI_UINTA, 0x2080);
    EXPECT_EQ(CMPI_SINTA, 0x20c0);
    EXPECT_EQ(CMPI_INTEGERA, 0x20c0);
    EXPECT_EQ(CMPI_ENCA, 0x3000);
}

TEST(CmpiValues, ArrayTypes) {
    EXPECT_EQ(CMPI_booleanA, 0x2002);
    EXPECT_EQ(CMPI_char16A, 0x2003);
    EXPECT_EQ(CMPI_real32A, 0x2008);
    EXPECT_EQ(CMPI_real64A, 0x200c);
    EXPECT_EQ(CMPI_uint8A, 0x2080);
    EXPECT_EQ(CMPI_uint16A, 0x2090);
    EXPECT_EQ(CMPI_uint32A, 0x20a0);
    EXPECT_EQ(CMPI_uint64A, 0x20b0);
    EXPECT_EQ(CMPI_sint8A, 0x20c0);
    EXPECT_EQ(CMPI_sint16A, 0x20d0);
    EXPECT_EQ(CMPI_sint32A, 0x20e0);
    EXPECT_EQ(CMPI_sint64A, 0x20f0);
    EXPECT_EQ(CMPI_stringA, 0x3600);
    EXPECT_EQ(CMPI_charsA, 0x3700);
    EXPECT_EQ(CMPI_dateTimeA, 0x3800);
    EXPECT_EQ(CMPI_instanceA, 0x3000);
    EXPECT_EQ(CMPI_refA, 0x3100);
    EXPECT_EQ(CMPI_charsptrA, 0x3a00);
}

TEST(CmpiValues, TypesOfKeysPredicatesAndOldNames) {
    EXPECT_EQ(CMPI_keyInteger, 0x00f0);
    EXPECT_EQ(CMPI_keyString, 0x1600);
    EXPECT_EQ(CMPI_keyBoolean, 0x0002);
    EXPECT_EQ(CMPI_keyRef, 0x1100);
    EXPECT_EQ(CMPI_charString, 0x1600);
    EXPECT_EQ(CMPI_integerString, 0x16f0);
    EXPECT_EQ(CMPI_realString, 0x160c);
    EXPECT_EQ(CMPI_numericString, 0x16fc);
    EXPECT_EQ(CMPI_booleanString, 0x1602);
    EXPECT_EQ(CMPI_dateTimeString, 0x1e00);
    EXPECT_EQ(CMPI_classNameString, 0x1700);
    EXPECT_EQ(CMPI_nameString, 0x1e00);
    EXPECT_EQ(CMPI_Byte, 0x00c0);
    EXPECT_EQ(CMPI_Short, 0x00d0);
    EXPECT_EQ(CMPI_Int, 0x00e0);
    EXPECT_EQ(CMPI_Long, 0x00f0);
    EXPECT_EQ(CMPI_Float, 0x0008);
    EXPECT_EQ(CMPI_Double, 0x000c);
    EXPECT_EQ(CMPI_ByteA, 0x20c0);
    EXPECT_EQ(CMPI_ShortA, 0x20d0);
    EXPECT_EQ(CMPI_IntA, 0x20e0);
    EXPECT_EQ(CMPI_LongA, 0x20f0);
    EXPECT_EQ(CMPI_FloatA, 0x2008);
    EXPECT_EQ(CMPI_DoubleA, 0x200c);
}

TEST(CmpiValues, StatesOfValues) {
    EXPECT_EQ(CMPI_goodValue, 0x0000);
    EXPECT_EQ(CMPI_nullValue, 0x0100);
    EXPECT_EQ(CMPI_keyValue, 0x0200);
    EXPECT_EQ(CMPI_notFound, 0x0400);
    EXPECT_EQ(CMPI_badValue, 0x8000);
}

TEST(CmpiValues, ReturnCodes) {
    EXPECT_EQ(CMPI_RC_OK, 0);
    EXPECT_EQ(CMPI_RC_ERR_FAILED, 1);
    EXPECT_EQ(CMPI_RC_ERR_ACCESS_DENIED, 2);
    EXPECT_EQ(CMPI_RC_ERR_INVALID_NAMESPACE, 3);
    EXPECT_EQ(CMPI_RC_ERR_INVALID_PARAMETER, 4);
    EXPECT_EQ(CMPI_RC_ERR_INVALID_CLASS, 5);
    EXPECT_EQ(CMPI_RC_ERR_NOT_FOUND, 6);
    EXPECT_EQ(CMPI_RC_ERR_NOT_SUPPORTED, 7);
    EXPECT_EQ(CMPI_RC_ERR_CLASS_HAS_CHILDREN, 8);
    EXPECT_EQ(CMPI_RC_ERR_CLASS_HAS_INSTANCES, 9);
    EXPECT_EQ(CMPI_RC_ERR_INVALID_SUPERCLASS, 10);
    EXPECT_EQ(CMPI_RC_ERR_ALREADY_EXISTS, 11);
    EXPECT_EQ(CMPI_RC_ERR_NO_SUCH_PROPERTY, 12);
    EXPECT_EQ(CMPI_RC_ERR_TYPE_MISMATCH, 13);
    EXPECT_EQ(CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, 14);
    EXPECT_EQ(CMPI_RC_ERR_INVALID_QUERY, 15);
    EXPECT_EQ(CMPI_RC_ERR_METHOD_NOT_AVAILABLE, 16);
    EXPECT_EQ(CMPI_RC_ERR_METHOD_NOT_FOUND, 17);
    EXPECT_EQ(CMPI_RC_DO_NOT_UNLOAD, 50);
    EXPECT_EQ(CMPI_RC_NEVER_UNLOAD, 51);
    EXPECT_EQ(CMPI_RC_ERR_INVALID_HANDLE, 60);
    EXPECT_EQ(CMPI_RC_ERR_INVALID_DATA_TYPE, 61);
    EXPECT_EQ(CMPI_RC_ERROR_SYSTEM, 100);
    EXPECT_EQ(CMPI_RC_ERROR, 200);
}

TEST(CmpiValues, FlagsAndContextEntries) {
    EXPECT_EQ(CMPI_FLAG_LocalOnly, 1);
    EXPECT_EQ(CMPI_FLAG_DeepInheritance, 2);
    EXPECT_EQ(CMPI_FLAG_IncludeQualifiers, 4);
    EXPECT_EQ(CMPI_FLAG_IncludeClassOrigin, 8);
    EXPECT_EQ(std::string_view(CMPIInitNameSpace), "CMPIInitNameSpace");
    EXPECT_EQ(std::string_view(CMPIInvocationFlags), "CMPIInvocationFlags");
    EXPECT_EQ(std::string_view(CMPIPrincipal), "CMPIPrincipal");
    EXPECT_EQ(std::string_view(CMPIRole), "CMPIRole");
    EXPECT_EQ(std::string_view(CMPIAcceptLanguage), "CMPIAcceptLanguage");
    EXPECT_EQ(std::string_view(CMPIContentLanguage), "CMPIContentLanguage");
}

TEST(CmpiValues, Capabilities) {
    EXPECT_EQ(CMPI_MB_BasicRead, 0x1);
    EXPECT_EQ(CMPI_MB_BasicWrite, 0x3);
    EXPECT_EQ(CMPI_MB_InstanceManipulation, 0x7);
    EXPECT_EQ(CMPI_MB_AssociationTraversal, 0x9);
    EXPECT_EQ(CMPI_MB_QueryExecution, 0x11);
    EXPECT_EQ(CMPI_MB_QueryNormalization, 0x31);
    EXPECT_EQ(CMPI_MB_BasicQualifierSupport, 0x47);
    EXPECT_EQ(CMPI_MB_Indications, 0x81);
    EXPECT_EQ(CMPI_MB_OSEncapsulationSupport, 0x100);
    EXPECT_EQ(CMPI_MB_Supports_MemEnhancements, 0x4000);
    EXPECT_EQ(CMPI_MB_Supports_Extended_Error, 0x8000);
}

TEST(CmpiValues, PredicateOperations) {
    EXPECT_EQ(CMPI_PredOp_Equals, 1);
    EXPECT_EQ(CMPI_PredOp_NotEquals, 2);
    EXPECT_EQ(CMPI_PredOp_LessThan, 3);
    EXPECT_EQ(CMPI_PredOp_GreaterThanOrEquals, 4);
    EXPECT_EQ(CMPI_PredOp_GreaterThan, 5);
    EXPECT_EQ(CMPI_PredOp_LessThanOrEquals, 6);
    EXPECT_EQ(CMPI_PredOp_Isa, 7);
    EXPECT_EQ(CMPI_PredOp_NotIsa, 8);
    EXPECT_EQ(CMPI_PredOp_Like, 9);
    EXPECT_EQ(CMPI_PredOp_NotLike, 10);
    EXPECT_EQ(CMPI_PredOp_Not_Null, 11);
    EXPECT_EQ(CMPI_PredOp_Null, 12);
    EXPECT_EQ(CMPI_PredOp_And, 13);
    EXPECT_EQ(CMPI_PredOp_Or, 14);
}

TEST(CmpiValues, SeveritiesAndLevels) {
    EXPECT_EQ(CMPI_SEV_ERROR, 1);
    EXPECT_EQ(CMPI_SEV_INFO, 2);
    EXPECT_EQ(CMPI_SEV_WARNING, 3);
    EXPECT_EQ(CMPI_DEV_DEBUG, 4);
    EXPECT_EQ(CMPI_LEV_INFO, 1);
    EXPECT_EQ(CMPI_LEV_WARNING, 2);
    EXPECT_EQ(CMPI_LEV_VERBOSE, 3);
    EXPECT_EQ(CMPI_COND_DOC, 0);
    EXPECT_EQ(CMPI_COND_COD, 1);
}

TEST(CmpiValues, Errors) {
    EXPECT_EQ(UnknownErrorType, 0);
    EXPECT_EQ(OtherErrorType, 1);
    EXPECT_EQ(CommunicationsError, 2);
    EXPECT_EQ(QualityOfServiceError, 3);
    EXPECT_EQ(SoftwareError, 4);
    EXPECT_EQ(HardwareError, 5);
    EXPECT_EQ(EnvironmentalError, 6);
    EXPECT_EQ(SecurityError, 7);
    EXPECT_EQ(Oversubscription_Error, 8);
    EXPECT_EQ(UnavailableResourceError, 9);
    EXPECT_EQ(UnsupportedOperationError, 10);
    EXPECT_EQ(ErrorSevUnknown, 0);
    EXPECT_EQ(ErrorSevLow, 2);
    EXPECT_EQ(ErrorSevMedium, 3);
    EXPECT_EQ(ErrorSevHigh, 4);
    EXPECT_EQ(ErrorSevFatal, 5);
    EXPECT_EQ(CMPIErrSrcUnknown, 0);
    EXPECT_EQ(CMPIErrSrcOther, 1);
    EXPECT_EQ(CIMObjectHandle, 2);
}

TEST(CmpiValues, ProbableCausesOfErrors) {
    // Every tenth, the neighbours of the one that is misspelt elsewhere, and the ends:
    // one left out or doubled between them would move the next.
    EXPECT_EQ(ErrorProbCauseUnknown, 0);
    EXPECT_EQ(ErrorProbCauseOther, 1);
    EXPECT_EQ(Corrupt_Data, 10);
    EXPECT_EQ(Flood_Detected, 20);
    EXPECT_EQ(Loss_of_Signal, 30);
    EXPECT_EQ(Queue_Size_Exceeded, 40);
    EXPECT_EQ(Storage_Capacity_Problem, 50);
    EXPECT_EQ(Login_Attempts_Failed, 60);
    EXPECT_EQ(Excessive_Error_Rate, 70);
    EXPECT_EQ(Protection_Path_Failure, 80);
    EXPECT_EQ(Signal_Quality_Problem, 90);
    EXPECT_EQ(Low_Fuel, 100);
    EXPECT_EQ(Element_Reinitialized, 110);
    EXPECT_EQ(Logging_Problems, 112);
    EXPECT_EQ(Leak_Detected, 113);
    EXPECT_EQ(Protection_Mechanism_Failure, 114);
    EXPECT_EQ(Delayed_Information, 120);
    EXPECT_EQ(Unexpected_Information, 130);
}

TEST(CmpiValues, EnumerationsAreFourBytesWide) {
    EXPECT_EQ(sizeof(CMPIrc), 4U);
    EXPECT_EQ(sizeof(CMPIPredOp), 4U);
    EXPECT_EQ(sizeof(CMPISeverity), 4U);
    EXPECT_EQ(sizeof(CMPIErrorProbableCause), 4U);
}

}  // namespace
