/* The headers compiled as C11 (-pedantic), held to the same published numbers
 * as the C++ build, so nothing may depend on the language (bool for
 * CMPIBoolean, a C++-only member, a differently sized enum...). */
#include <cmpift.h>

#include <stddef.h>

#define COL(x86_64, i386) (sizeof(void*) == 8 ? (size_t)(x86_64) : (size_t)(i386))
#define SIZE(t, a, b) _Static_assert(sizeof(t) == COL(a, b), "sizeof " #t);
#define AT(t, m, a, b) _Static_assert(offsetof(t, m) == COL(a, b), #t "." #m);

_Static_assert(sizeof(void*) == 8 || sizeof(void*) == 4, "x86_64 or i386 only");

SIZE(CMPIBoolean, 1, 1) SIZE(CMPIType, 2, 2) SIZE(CMPIValueState, 2, 2) SIZE(CMPIrc, 4, 4)
SIZE(CMPIPredOp, 4, 4) SIZE(CMPIErrorType, 4, 4) SIZE(CMPI_THREAD_KEY_TYPE, 4, 4)
_Static_assert(_Alignof(CMPIData) == COL(8, 4) && _Alignof(CMPIValue) == COL(8, 4), "alignment");
SIZE(CMPIValue, 16, 8) SIZE(CMPIData, 24, 12) SIZE(CMPIStatus, 16, 8) SIZE(CMPIValuePtr, 16, 8)
SIZE(CMPIBroker, 40, 20) SIZE(CMPIString, 16, 8) SIZE(CMPIInstanceMI, 16, 8)
AT(CMPIData, state, 2, 2) AT(CMPIData, value, 8, 4) AT(CMPIStatus, msg, 8, 4)
AT(CMPIBroker, mft, 32, 16)
SIZE(CMPIBrokerFT, 160, 84) SIZE(CMPIBrokerEncFT, 168, 84) SIZE(CMPIBrokerExtFT, 168, 84)
SIZE(CMPIBrokerMemFT, 120, 60) SIZE(CMPIContextFT, 56, 28) SIZE(CMPIResultFT, 64, 32)
SIZE(CMPIStringFT, 32, 16) SIZE(CMPIArrayFT, 56, 28) SIZE(CMPIEnumerationFT, 48, 24)
SIZE(CMPIInstanceFT, 88, 44) SIZE(CMPIObjectPathFT, 160, 80) SIZE(CMPIArgsFT, 56, 28)
SIZE(CMPIDateTimeFT, 48, 24) SIZE(CMPISelectExpFT, 64, 32) SIZE(CMPISelectCondFT, 40, 20)
SIZE(CMPISubCondFT, 48, 24) SIZE(CMPIPredicateFT, 40, 20) SIZE(CMPIErrorFT, 216, 108)
SIZE(CMPIInstanceMIFT, 80, 44) SIZE(CMPIAssociationMIFT, 56, 32) SIZE(CMPIMethodMIFT, 32, 20)
SIZE(CMPIPropertyMIFT, 48, 28) SIZE(CMPIIndicationMIFT, 72, 40)
AT(CMPIBrokerFT, brokerName, 8, 8) AT(CMPIBrokerFT, getProperty, 152, 80)
AT(CMPIBrokerEncFT, getMessage2, 160, 80) AT(CMPIEnumerationFT, hasNext, 32, 16)
AT(CMPIInstanceMIFT, miName, 8, 8) AT(CMPIInstanceMIFT, execQuery, 72, 40)

_Static_assert(CMPI_uint16 == 144 && CMPI_chars == 0x1700 && CMPI_ARRAY == 0x2000, "type codes");
_Static_assert(CMPI_nullValue == 0x100 && CMPI_keyValue == 0x200, "value states");
_Static_assert(CMPI_RC_ERR_NOT_FOUND == 6 && CMPI_RC_ERROR == 200, "return codes");
_Static_assert(CMPICurrentVersion == 200, "CMPI level");

