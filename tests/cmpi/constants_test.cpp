// Every constant that crosses the broker boundary, against its published value:
// a single wrong code is a silent interoperability bug.
#include <cmpidt.h>
#include <cmpift.h>

#include <gtest/gtest.h>

#include <cstring>

namespace {

struct Constant {
  const char* name;
  long long got;
  long long want;
};

#define K(name, value) Constant{#name, static_cast<long long>(name), static_cast<long long>(value)}

const Constant kConstants[] = {
    K(CMPI_null, 0), K(CMPI_SIMPLE, 2), K(CMPI_boolean, 2),
    K(CMPI_char16, 3), K(CMPI_REAL, 8), K(CMPI_real32, 8),
    K(CMPI_real64, 12), K(CMPI_UINT, 128), K(CMPI_uint8, 128),
    K(CMPI_uint16, 144), K(CMPI_uint32, 160), K(CMPI_uint64, 176),
    K(CMPI_SINT, 192), K(CMPI_sint8, 192), K(CMPI_sint16, 208),
    K(CMPI_sint32, 224), K(CMPI_sint64, 240), K(CMPI_INTEGER, 192),
    K(CMPI_ENC, 4096), K(CMPI_instance, 4096), K(CMPI_ref, 4352),
    K(CMPI_args, 4608), K(CMPI_class, 4864), K(CMPI_filter, 5120),
    K(CMPI_enumeration, 5376), K(CMPI_string, 5632), K(CMPI_chars, 5888),
    K(CMPI_dateTime, 6144), K(CMPI_ptr, 6400), K(CMPI_charsptr, 6656),
    K(CMPI_ARRAY, 8192), K(CMPI_SIMPLEA, 8194), K(CMPI_booleanA, 8194),
    K(CMPI_char16A, 8195), K(CMPI_REALA, 8200), K(CMPI_real32A, 8200),
    K(CMPI_real64A, 8204), K(CMPI_UINTA, 8320), K(CMPI_uint8A, 8320),
    K(CMPI_uint16A, 8336), K(CMPI_uint32A, 8352), K(CMPI_uint64A, 8368),
    K(CMPI_SINTA, 8384), K(CMPI_sint8A, 8384), K(CMPI_sint16A, 8400),
    K(CMPI_sint32A, 8416), K(CMPI_sint64A, 8432), K(CMPI_INTEGERA, 8384),
    K(CMPI_ENCA, 12288), K(CMPI_stringA, 13824), K(CMPI_charsA, 14080),
    K(CMPI_dateTimeA, 14336), K(CMPI_instanceA, 12288), K(CMPI_refA, 12544),
    K(CMPI_charsptrA, 14848), K(CMPI_keyInteger, 240), K(CMPI_keyString, 5632),
    K(CMPI_keyBoolean, 2), K(CMPI_keyRef, 4352), K(CMPI_charString, 5632),
    K(CMPI_integerString, 5872), K(CMPI_realString, 5644), K(CMPI_numericString, 5884),
    K(CMPI_booleanString, 5634), K(CMPI_dateTimeString, 7680), K(CMPI_classNameString, 5888),
    K(CMPI_nameString, 7680), K(CMPI_Byte, 192), K(CMPI_Short, 208),
    K(CMPI_Int, 224), K(CMPI_Long, 240), K(CMPI_Float, 8),
    K(CMPI_Double, 12), K(CMPI_ByteA, 8384), K(CMPI_ShortA, 8400),
    K(CMPI_IntA, 8416), K(CMPI_LongA, 8432), K(CMPI_FloatA, 8200),
    K(CMPI_DoubleA, 8204), K(CMPI_goodValue, 0), K(CMPI_nullValue, 256),
    K(CMPI_keyValue, 512), K(CMPI_notFound, 1024), K(CMPI_badValue, 32768),
    K(CMPI_RC_OK, 0), K(CMPI_RC_ERR_FAILED, 1), K(CMPI_RC_ERR_ACCESS_DENIED, 2),
    K(CMPI_RC_ERR_INVALID_NAMESPACE, 3), K(CMPI_RC_ERR_INVALID_PARAMETER, 4), K(CMPI_RC_ERR_INVALID_CLASS, 5),
    K(CMPI_RC_ERR_NOT_FOUND, 6), K(CMPI_RC_ERR_NOT_SUPPORTED, 7), K(CMPI_RC_ERR_CLASS_HAS_CHILDREN, 8),
    K(CMPI_RC_ERR_CLASS_HAS_INSTANCES, 9), K(CMPI_RC_ERR_INVALID_SUPERCLASS, 10), K(CMPI_RC_ERR_ALREADY_EXISTS, 11),
    K(CMPI_RC_ERR_NO_SUCH_PROPERTY, 12), K(CMPI_RC_ERR_TYPE_MISMATCH, 13), K(CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, 14),
    K(CMPI_RC_ERR_INVALID_QUERY, 15), K(CMPI_RC_ERR_METHOD_NOT_AVAILABLE, 16), K(CMPI_RC_ERR_METHOD_NOT_FOUND, 17),
    K(CMPI_RC_DO_NOT_UNLOAD, 50), K(CMPI_RC_NEVER_UNLOAD, 51), K(CMPI_RC_ERR_INVALID_HANDLE, 60),
    K(CMPI_RC_ERR_INVALID_DATA_TYPE, 61), K(CMPI_RC_ERROR_SYSTEM, 100), K(CMPI_RC_ERROR, 200),
    K(CMPI_FLAG_LocalOnly, 1), K(CMPI_FLAG_DeepInheritance, 2), K(CMPI_FLAG_IncludeQualifiers, 4),
    K(CMPI_FLAG_IncludeClassOrigin, 8), K(CMPI_MB_Class_0, 0x00000001), K(CMPI_MB_Class_1, 0x00000003),
    K(CMPI_MB_Class_2, 0x00000007), K(CMPI_MB_Supports_PropertyMI, 0x00000100), K(CMPI_MB_Supports_IndicationMI, 0x00000200),
    K(CMPI_MB_Supports_IndicationPolling, 0x00000400), K(CMPI_MB_Supports_QueryNormalization, 0x00000800), K(CMPI_MB_Supports_Qualifier, 0x00001000),
    K(CMPI_MB_Supports_Schema, 0x00003000), K(CMPI_MB_Supports_MemEnhancements, 0x00004000), K(CMPI_MB_Supports_Extended_Error, 0x00008000),
    K(CMPI_MB_BasicRead, 0x00000001), K(CMPI_MB_BasicWrite, 0x00000003), K(CMPI_MB_InstanceManipulation, 0x00000007),
    K(CMPI_MB_AssociationTraversal, 0x00000009), K(CMPI_MB_QueryExecution, 0x00000011), K(CMPI_MB_QueryNormalization, 0x00000031),
    K(CMPI_MB_Indications, 0x00000081), K(CMPI_MB_BasicQualifierSupport, 0x00000047), K(CMPI_MB_OSEncapsulationSupport, 0x00000100),
    K(CMPI_PredOp_Equals, 1), K(CMPI_PredOp_NotEquals, 2), K(CMPI_PredOp_LessThan, 3),
    K(CMPI_PredOp_GreaterThanOrEquals, 4), K(CMPI_PredOp_GreaterThan, 5), K(CMPI_PredOp_LessThanOrEquals, 6),
    K(CMPI_PredOp_Isa, 7), K(CMPI_PredOp_NotIsa, 8), K(CMPI_PredOp_Like, 9),
    K(CMPI_PredOp_NotLike, 10), K(CMPI_PredOp_Not_Null, 11), K(CMPI_PredOp_Null, 12),
    K(CMPI_PredOp_And, 13), K(CMPI_PredOp_Or, 14), K(CMPI_SEV_ERROR, 1),
    K(CMPI_SEV_INFO, 2), K(CMPI_SEV_WARNING, 3), K(CMPI_DEV_DEBUG, 4),
    K(CMPI_LEV_INFO, 1), K(CMPI_LEV_WARNING, 2), K(CMPI_LEV_VERBOSE, 3),
    K(CMPI_COND_DOC, 0), K(CMPI_COND_COD, 1), K(UnknownErrorType, 0),
    K(OtherErrorType, 1), K(CommunicationsError, 2), K(QualityOfServiceError, 3),
    K(SoftwareError, 4), K(HardwareError, 5), K(EnvironmentalError, 6),
    K(SecurityError, 7), K(Oversubscription_Error, 8), K(UnavailableResourceError, 9),
    K(UnsupportedOperationError, 10), K(ErrorSevUnknown, 0), K(ErrorSevLow, 2),
    K(ErrorSevMedium, 3), K(ErrorSevHigh, 4), K(ErrorSevFatal, 5),
    K(CMPIErrSrcUnknown, 0), K(CMPIErrSrcOther, 1), K(CIMObjectHandle, 2),
    K(ErrorProbCauseUnknown, 0), K(Adapter_Card_Error, 2),
    K(Leak_Detected_113, 113), K(Unexpected_Information, 130),
    K(CMPIVersion100, 100), K(CMPIVersion200, 200), K(CMPICurrentVersion, 200),
};

TEST(CmpiConstants, EveryValueMatchesTheBrokers) {
  for (const Constant& c : kConstants) EXPECT_EQ(c.got, c.want) << c.name;
}

TEST(CmpiConstants, TypesAndStatesKeepTheirWireWidth) {
  // CMPIType/CMPIValueState are 2-byte unsigned: CMPI_badValue must not turn
  // negative, and the array flag must survive the round trip.
  CMPIData d{};
  d.type = CMPI_charsptrA;
  d.state = CMPI_badValue | CMPI_keyValue;
  EXPECT_EQ(d.type, 0x3A00);
  EXPECT_EQ(d.state, 0x8200);
  EXPECT_NE(CMIsArray(d), 0);
  EXPECT_NE(CMIsKeyValue(d), 0);
  EXPECT_EQ(CMIsNullValue(d), 0);
}

TEST(CmpiConstants, ContextEntryNamesSpellThemselves) {
  const std::pair<const char*, const char*> names[] = {
      {CMPIInitNameSpace, "CMPIInitNameSpace"},   {CMPIInvocationFlags, "CMPIInvocationFlags"},
      {CMPIPrincipal, "CMPIPrincipal"},           {CMPIRole, "CMPIRole"},
      {CMPIAcceptLanguage, "CMPIAcceptLanguage"}, {CMPIContentLanguage, "CMPIContentLanguage"}};
  for (const auto& [got, want] : names) EXPECT_STREQ(got, want);
}

}  // namespace
