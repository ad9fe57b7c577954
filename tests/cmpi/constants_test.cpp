// The constants that cross the broker boundary in this project, against their
// published values: a single wrong code is a silent interoperability bug.
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <gtest/gtest.h>

namespace {

struct Constant {
  const char* name;
  long long got;
  long long want;
};

#define K(name, value) Constant{#name, static_cast<long long>(name), static_cast<long long>(value)}

const Constant kConstants[] = {
    // Type codes: every scalar, every encapsulated type, and the arrays in use.
    K(CMPI_null, 0), K(CMPI_boolean, 2), K(CMPI_char16, 3), K(CMPI_real32, 8), K(CMPI_real64, 12),
    K(CMPI_uint8, 128), K(CMPI_uint16, 144), K(CMPI_uint32, 160), K(CMPI_uint64, 176),
    K(CMPI_sint8, 192), K(CMPI_sint16, 208), K(CMPI_sint32, 224), K(CMPI_sint64, 240),
    K(CMPI_instance, 4096), K(CMPI_ref, 4352), K(CMPI_args, 4608), K(CMPI_class, 4864),
    K(CMPI_filter, 5120), K(CMPI_enumeration, 5376), K(CMPI_string, 5632), K(CMPI_chars, 5888),
    K(CMPI_dateTime, 6144), K(CMPI_ptr, 6400), K(CMPI_charsptr, 6656), K(CMPI_ARRAY, 8192),
    K(CMPI_uint16A, 8336), K(CMPI_stringA, 13824), K(CMPI_charsA, 14080), K(CMPI_refA, 12544),
    // Value states.
    K(CMPI_goodValue, 0), K(CMPI_nullValue, 256), K(CMPI_keyValue, 512), K(CMPI_notFound, 1024),
    K(CMPI_badValue, 32768),
    // Return codes.
    K(CMPI_RC_OK, 0), K(CMPI_RC_ERR_FAILED, 1), K(CMPI_RC_ERR_ACCESS_DENIED, 2),
    K(CMPI_RC_ERR_INVALID_NAMESPACE, 3), K(CMPI_RC_ERR_INVALID_PARAMETER, 4),
    K(CMPI_RC_ERR_INVALID_CLASS, 5), K(CMPI_RC_ERR_NOT_FOUND, 6), K(CMPI_RC_ERR_NOT_SUPPORTED, 7),
    K(CMPI_RC_ERR_CLASS_HAS_CHILDREN, 8), K(CMPI_RC_ERR_CLASS_HAS_INSTANCES, 9),
    K(CMPI_RC_ERR_INVALID_SUPERCLASS, 10), K(CMPI_RC_ERR_ALREADY_EXISTS, 11),
    K(CMPI_RC_ERR_NO_SUCH_PROPERTY, 12), K(CMPI_RC_ERR_TYPE_MISMATCH, 13),
    K(CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, 14), K(CMPI_RC_ERR_INVALID_QUERY, 15),
    K(CMPI_RC_ERR_METHOD_NOT_AVAILABLE, 16), K(CMPI_RC_ERR_METHOD_NOT_FOUND, 17),
    K(CMPI_RC_DO_NOT_UNLOAD, 50), K(CMPI_RC_NEVER_UNLOAD, 51), K(CMPI_RC_ERR_INVALID_HANDLE, 60),
    K(CMPI_RC_ERR_INVALID_DATA_TYPE, 61), K(CMPI_RC_ERROR_SYSTEM, 100), K(CMPI_RC_ERROR, 200),
    // What the host announces, and the level both sides build for.
    K(CMPI_MB_InstanceManipulation, 0x7), K(CMPI_MB_AssociationTraversal, 0x9),
    K(CMPI_MB_OSEncapsulationSupport, 0x100), K(CMPI_MB_Supports_MemEnhancements, 0x4000),
    K(CMPICurrentVersion, 200),
};

TEST(CmpiConstants, EveryValueMatchesTheBrokers) {
  for (const Constant& c : kConstants) EXPECT_EQ(c.got, c.want) << c.name;
  EXPECT_STREQ(CMPIInitNameSpace, "CMPIInitNameSpace");
  EXPECT_STREQ(CMPIInvocationFlags, "CMPIInvocationFlags");
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

}  // namespace
