// Binary layout of the CMPI headers, pinned at compile time to the published
// x86_64 / i386 numbers (the column is chosen by this build's pointer size).
// A moved, missing or widened member fails the build of this test.
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <gtest/gtest.h>

#include <pthread.h>

#include <cstddef>
#include <iterator>
#include <type_traits>

#include "abi_slots.h"

namespace {

using namespace cmpitest;

#define SIZE(T, a, b) static_assert(sizeof(T) == col(a, b), "sizeof " #T);
#define AT(T, m, a, b) static_assert(offsetof(T, m) == col(a, b), #T "::" #m);

// ---- Scalars, values, status, handles ------------------------------------
SIZE(CMPIBoolean, 1, 1) SIZE(CMPIChar16, 2, 2) SIZE(CMPIType, 2, 2) SIZE(CMPIValueState, 2, 2)
SIZE(CMPIUint64, 8, 8) SIZE(CMPISint64, 8, 8) SIZE(CMPIReal64, 8, 8) SIZE(CMPICount, 4, 4)
SIZE(CMPIFlags, 4, 4) SIZE(CMPIrc, 4, 4) SIZE(CMPIPredOp, 4, 4) SIZE(CMPISeverity, 4, 4)
SIZE(CMPILevel, 4, 4) SIZE(CMPIErrorProbableCause, 4, 4) SIZE(CMPIMsgFileHandle, 8, 4)
static_assert(alignof(CMPIUint64) == col(8, 4) && alignof(CMPIReal64) == col(8, 4), "i386 4-aligns 64-bit");
static_assert(alignof(CMPIValue) == col(8, 4) && alignof(CMPIData) == col(8, 4), "union alignment");
SIZE(CMPIValuePtr, 16, 8) AT(CMPIValuePtr, length, 8, 4)
SIZE(CMPIValue, 16, 8) SIZE(CMPIData, 24, 12) AT(CMPIData, state, 2, 2) AT(CMPIData, value, 8, 4)
SIZE(CMPIStatus, 16, 8) AT(CMPIStatus, msg, 8, 4)
SIZE(CMPIBroker, 40, 20) AT(CMPIBroker, bft, 8, 4) AT(CMPIBroker, eft, 16, 8)
AT(CMPIBroker, xft, 24, 12) AT(CMPIBroker, mft, 32, 16)
SIZE(CMPIContext, 16, 8) SIZE(CMPIResult, 16, 8) SIZE(CMPIString, 16, 8) SIZE(CMPIArray, 16, 8)
SIZE(CMPIEnumeration, 16, 8) SIZE(CMPIInstance, 16, 8) SIZE(CMPIObjectPath, 16, 8)
SIZE(CMPIArgs, 16, 8) SIZE(CMPIDateTime, 16, 8) SIZE(CMPISelectExp, 16, 8)
SIZE(CMPISelectCond, 16, 8) SIZE(CMPISubCond, 16, 8) SIZE(CMPIPredicate, 16, 8)
SIZE(CMPIError, 16, 8) SIZE(CMPIInstanceMI, 16, 8) SIZE(CMPIAssociationMI, 16, 8)
SIZE(CMPIMethodMI, 16, 8) SIZE(CMPIPropertyMI, 16, 8) SIZE(CMPIIndicationMI, 16, 8)
AT(CMPIString, ft, 8, 4) AT(CMPIInstanceMI, ft, 8, 4)

// ---- Every function table: size, first and last slot, hot slots -----------
SIZE(CMPIBrokerFT, 160, 84) AT(CMPIBrokerFT, brokerVersion, 4, 4) AT(CMPIBrokerFT, brokerName, 8, 8)
AT(CMPIBrokerFT, prepareAttachThread, 16, 12) AT(CMPIBrokerFT, enumerateInstanceNames, 48, 28)
AT(CMPIBrokerFT, getInstance, 56, 32) AT(CMPIBrokerFT, enumerateInstances, 96, 52)
AT(CMPIBrokerFT, associators, 104, 56) AT(CMPIBrokerFT, getProperty, 152, 80)
SIZE(CMPIBrokerEncFT, 168, 84) AT(CMPIBrokerEncFT, newInstance, 8, 4)
AT(CMPIBrokerEncFT, newString, 32, 16) AT(CMPIBrokerEncFT, classPathIsA, 80, 40)
AT(CMPIBrokerEncFT, trace, 128, 64) AT(CMPIBrokerEncFT, newCMPIError, 136, 68)
AT(CMPIBrokerEncFT, getMessage2, 160, 80)
SIZE(CMPIBrokerExtFT, 168, 84) AT(CMPIBrokerExtFT, resolveFileName, 8, 4)
AT(CMPIBrokerExtFT, createThreadKey, 64, 32) AT(CMPIBrokerExtFT, signalCondition, 160, 80)
SIZE(CMPIBrokerMemFT, 120, 60) AT(CMPIBrokerMemFT, mark, 8, 4) AT(CMPIBrokerMemFT, freeSelectExp, 112, 56)
SIZE(CMPIContextFT, 56, 28) AT(CMPIContextFT, release, 8, 4) AT(CMPIContextFT, addEntry, 48, 24)
SIZE(CMPIResultFT, 64, 32) AT(CMPIResultFT, release, 8, 4) AT(CMPIResultFT, returnInstance, 32, 16)
AT(CMPIResultFT, returnError, 56, 28)
SIZE(CMPIStringFT, 32, 16) AT(CMPIStringFT, release, 8, 4) AT(CMPIStringFT, getCharPtr, 24, 12)
SIZE(CMPIArrayFT, 56, 28) AT(CMPIArrayFT, release, 8, 4) AT(CMPIArrayFT, setElementAt, 48, 24)
SIZE(CMPIEnumerationFT, 48, 24) AT(CMPIEnumerationFT, release, 8, 4)
AT(CMPIEnumerationFT, getNext, 24, 12) AT(CMPIEnumerationFT, hasNext, 32, 16)
AT(CMPIEnumerationFT, toArray, 40, 20)
SIZE(CMPIInstanceFT, 88, 44) AT(CMPIInstanceFT, release, 8, 4) AT(CMPIInstanceFT, setProperty, 48, 24)
AT(CMPIInstanceFT, setPropertyWithOrigin, 80, 40)
SIZE(CMPIObjectPathFT, 160, 80) AT(CMPIObjectPathFT, release, 8, 4)
AT(CMPIObjectPathFT, addKey, 72, 36) AT(CMPIObjectPathFT, toString, 152, 76)
SIZE(CMPIArgsFT, 56, 28) AT(CMPIArgsFT, release, 8, 4) AT(CMPIArgsFT, getArgCount, 48, 24)
SIZE(CMPIDateTimeFT, 48, 24) AT(CMPIDateTimeFT, release, 8, 4) AT(CMPIDateTimeFT, isInterval, 40, 20)
SIZE(CMPISelectExpFT, 64, 32) AT(CMPISelectExpFT, release, 8, 4)
AT(CMPISelectExpFT, evaluateUsingAccessor, 56, 28)
SIZE(CMPISelectCondFT, 40, 20) AT(CMPISelectCondFT, release, 8, 4)
AT(CMPISelectCondFT, getSubCondAt, 32, 16)
SIZE(CMPISubCondFT, 48, 24) AT(CMPISubCondFT, release, 8, 4) AT(CMPISubCondFT, getPredicate, 40, 20)
SIZE(CMPIPredicateFT, 40, 20) AT(CMPIPredicateFT, release, 8, 4)
AT(CMPIPredicateFT, evaluateUsingAccessor, 32, 16)
SIZE(CMPIErrorFT, 216, 108) AT(CMPIErrorFT, release, 8, 4) AT(CMPIErrorFT, getMessageArguments, 136, 68)
AT(CMPIErrorFT, setErrorType, 144, 72) AT(CMPIErrorFT, setMessageArguments, 208, 104)
SIZE(CMPIInstanceMIFT, 80, 44) AT(CMPIInstanceMIFT, miVersion, 4, 4) AT(CMPIInstanceMIFT, miName, 8, 8)
AT(CMPIInstanceMIFT, cleanup, 16, 12) AT(CMPIInstanceMIFT, execQuery, 72, 40)
SIZE(CMPIAssociationMIFT, 56, 32) AT(CMPIAssociationMIFT, miName, 8, 8)
AT(CMPIAssociationMIFT, cleanup, 16, 12) AT(CMPIAssociationMIFT, referenceNames, 48, 28)
SIZE(CMPIMethodMIFT, 32, 20) AT(CMPIMethodMIFT, miName, 8, 8) AT(CMPIMethodMIFT, cleanup, 16, 12)
AT(CMPIMethodMIFT, invokeMethod, 24, 16)
SIZE(CMPIPropertyMIFT, 48, 28) AT(CMPIPropertyMIFT, miName, 8, 8)
AT(CMPIPropertyMIFT, cleanup, 16, 12) AT(CMPIPropertyMIFT, setPropertyWithOrigin, 40, 24)
SIZE(CMPIIndicationMIFT, 72, 40) AT(CMPIIndicationMIFT, miName, 8, 8)
AT(CMPIIndicationMIFT, cleanup, 16, 12) AT(CMPIIndicationMIFT, mustPoll, 32, 20)
AT(CMPIIndicationMIFT, disableIndications, 64, 36)

// ---- Every slot of every table, in slot order ------------------------------
// Returns the first slot whose member sits elsewhere, 0 when all are in place.
template <std::size_t N>
constexpr std::size_t misplacedSlot(Lead lead, std::size_t first, const std::size_t (&off)[N]) {
  for (std::size_t i = 0; i < N; ++i)
    if (off[i] != slotOffset(lead, first + i)) return first + i;
  return 0;
}
#define SLOTS(T, lead, first, ...)                                                 \
  namespace slots_##T {                                                            \
  using S = T;                                                                     \
  static_assert(misplacedSlot(lead, first, {__VA_ARGS__}) == 0, #T " slot order"); \
  }
#define O(m) offsetof(S, m)

SLOTS(CMPIBrokerFT, kTwoIntsAndName, 3, O(prepareAttachThread), O(attachThread), O(detachThread),
      O(deliverIndication), O(enumerateInstanceNames), O(getInstance), O(createInstance),
      O(modifyInstance), O(deleteInstance), O(execQuery), O(enumerateInstances), O(associators),
      O(associatorNames), O(references), O(referenceNames), O(invokeMethod), O(setProperty),
      O(getProperty))
SLOTS(CMPIBrokerEncFT, kOneInt, 1, O(newInstance), O(newObjectPath), O(newArgs), O(newString),
      O(newArray), O(newDateTime), O(newDateTimeFromBinary), O(newDateTimeFromChars),
      O(newSelectExp), O(classPathIsA), O(toString), O(isOfType), O(getType), O(getMessage),
      O(logMessage), O(trace), O(newCMPIError), O(openMessageFile), O(closeMessageFile),
      O(getMessage2))
SLOTS(CMPIBrokerExtFT, kOneInt, 1, O(resolveFileName), O(newThread), O(joinThread), O(exitThread),
      O(cancelThread), O(threadSleep), O(threadOnce), O(createThreadKey), O(destroyThreadKey),
      O(getThreadSpecific), O(setThreadSpecific), O(newMutex), O(destroyMutex), O(lockMutex),
      O(unlockMutex), O(newCondition), O(destroyCondition), O(condWait), O(timedCondWait),
      O(signalCondition))
SLOTS(CMPIBrokerMemFT, kOneInt, 1, O(mark), O(release), O(cmpiMalloc), O(cmpiCalloc),
      O(cmpiRealloc), O(cmpiStrDup), O(cmpiFree), O(freeInstance), O(freeObjectPath), O(freeArgs),
      O(freeString), O(freeArray), O(freeDateTime), O(freeSelectExp))
SLOTS(CMPIContextFT, kOneInt, 1, O(release), O(clone), O(getEntry), O(getEntryAt),
      O(getEntryCount), O(addEntry))
SLOTS(CMPIResultFT, kOneInt, 1, O(release), O(clone), O(returnData), O(returnInstance),
      O(returnObjectPath), O(returnDone), O(returnError))
SLOTS(CMPIStringFT, kOneInt, 1, O(release), O(clone), O(getCharPtr))
SLOTS(CMPIArrayFT, kOneInt, 1, O(release), O(clone), O(getSize), O(getSimpleType),
      O(getElementAt), O(setElementAt))
SLOTS(CMPIEnumerationFT, kOneInt, 1, O(release), O(clone), O(getNext), O(hasNext), O(toArray))
SLOTS(CMPIInstanceFT, kOneInt, 1, O(release), O(clone), O(getProperty), O(getPropertyAt),
      O(getPropertyCount), O(setProperty), O(getObjectPath), O(setPropertyFilter),
      O(setObjectPath), O(setPropertyWithOrigin))
SLOTS(CMPIObjectPathFT, kOneInt, 1, O(release), O(clone), O(setNameSpace), O(getNameSpace),
      O(setHostname), O(getHostname), O(setClassName), O(getClassName), O(addKey), O(getKey),
      O(getKeyAt), O(getKeyCount), O(setNameSpaceFromObjectPath),
      O(setHostAndNameSpaceFromObjectPath), O(getClassQualifier), O(getPropertyQualifier),
      O(getMethodQualifier), O(getParameterQualifier), O(toString))
SLOTS(CMPIArgsFT, kOneInt, 1, O(release), O(clone), O(addArg), O(getArg), O(getArgAt),
      O(getArgCount))
SLOTS(CMPIDateTimeFT, kOneInt, 1, O(release), O(clone), O(getBinaryFormat), O(getStringFormat),
      O(isInterval))
SLOTS(CMPISelectExpFT, kOneInt, 1, O(release), O(clone), O(evaluate), O(getString), O(getDOC),
      O(getCOD), O(evaluateUsingAccessor))
SLOTS(CMPISelectCondFT, kOneInt, 1, O(release), O(clone), O(getCountAndType), O(getSubCondAt))
SLOTS(CMPISubCondFT, kOneInt, 1, O(release), O(clone), O(getCount), O(getPredicateAt),
      O(getPredicate))
SLOTS(CMPIPredicateFT, kOneInt, 1, O(release), O(clone), O(getData), O(evaluateUsingAccessor))
SLOTS(CMPIErrorFT, kOneInt, 1, O(release), O(clone), O(getErrorType), O(getOtherErrorType),
      O(getOwningEntity), O(getMessageID), O(getMessage), O(getPerceivedSeverity),
      O(getProbableCause), O(getProbableCauseDescription), O(getRecommendedActions),
      O(getErrorSource), O(getErrorSourceFormat), O(getOtherErrorSourceFormat),
      O(getCIMStatusCode), O(getCIMStatusCodeDescription), O(getMessageArguments),
      O(setErrorType), O(setOtherErrorType), O(setProbableCauseDescription),
      O(setRecommendedActions), O(setErrorSource), O(setErrorSourceFormat),
      O(setOtherErrorSourceFormat), O(setCIMStatusCodeDescription), O(setMessageArguments))
SLOTS(CMPIInstanceMIFT, kTwoIntsAndName, 3, O(cleanup), O(enumerateInstanceNames),
      O(enumerateInstances), O(getInstance), O(createInstance), O(modifyInstance),
      O(deleteInstance), O(execQuery))
SLOTS(CMPIAssociationMIFT, kTwoIntsAndName, 3, O(cleanup), O(associators), O(associatorNames),
      O(references), O(referenceNames))
SLOTS(CMPIMethodMIFT, kTwoIntsAndName, 3, O(cleanup), O(invokeMethod))
SLOTS(CMPIPropertyMIFT, kTwoIntsAndName, 3, O(cleanup), O(setProperty), O(getProperty),
      O(setPropertyWithOrigin))
SLOTS(CMPIIndicationMIFT, kTwoIntsAndName, 3, O(cleanup), O(authorizeFilter), O(mustPoll),
      O(activateFilter), O(deActivateFilter), O(enableIndications), O(disableIndications))

// ---- Signatures where a same-size mistake would still pass the offsets ---
template <class T, class U>
constexpr bool same = std::is_same_v<T, U>;
static_assert(same<CMPIBoolean, unsigned char> && same<CMPIType, unsigned short> &&
                  same<CMPIValueState, unsigned short> && same<CMPIUint64, unsigned long long>,
              "CMPIBoolean is no bool; type and state are 2-byte unsigned");
static_assert(same<decltype(CMPIBrokerFT::brokerCapabilities), unsigned int>, "not unsigned long");
static_assert(sizeof(CMPI_THREAD_KEY_TYPE) == sizeof(pthread_key_t), "brokers write a pthread_key_t");
static_assert(same<decltype(CMPIIndicationMIFT::mustPoll),
                   CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*,
                                  const char*, const CMPIObjectPath*)>,
              "mustPoll has no CMPIResult* at this level");
static_assert(same<decltype(CMPIIndicationMIFT::enableIndications),
                   CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*)> &&
                  same<decltype(CMPIIndicationMIFT::disableIndications),
                       CMPIStatus (*)(CMPIIndicationMI*, const CMPIContext*)>,
              "enable/disableIndications return CMPIStatus (a hidden pointer on i386)");
static_assert(same<decltype(CMPIPropertyMIFT::setProperty),
                   CMPIStatus (*)(CMPIPropertyMI*, const CMPIContext*, const CMPIResult*,
                                  const CMPIObjectPath*, const char*, CMPIData)>,
              "property MI takes CMPIData by value");
static_assert(same<decltype(CMPIBrokerFT::invokeMethod),
                   CMPIData (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*,
                                const char*, const CMPIArgs*, CMPIArgs*, CMPIStatus*)>,
              "invokeMethod returns CMPIData by value");
static_assert(same<decltype(CMPIBrokerEncFT::getMessage),
                   CMPIString* (*)(const CMPIBroker*, const char*, const char*, CMPIStatus*,
                                   CMPICount, ...)>,
              "getMessage is variadic after the count");
static_assert(same<decltype(CMPIBrokerEncFT::logMessage),
                   CMPIStatus (*)(const CMPIBroker*, int, const char*, const char*,
                                  const CMPIString*)>,
              "logMessage takes the severity as int");
static_assert(same<decltype(CMPIEnumerationFT::getNext),
                   CMPIData (*)(const CMPIEnumeration*, CMPIStatus*)> &&
                  same<decltype(CMPIEnumerationFT::hasNext),
                       CMPIBoolean (*)(const CMPIEnumeration*, CMPIStatus*)>,
              "getNext before hasNext");
static_assert(same<decltype(CMPIBrokerEncFT::newDateTimeFromBinary),
                   CMPIDateTime* (*)(const CMPIBroker*, CMPIUint64, CMPIBoolean, CMPIStatus*)>,
              "64-bit time takes two stack slots on i386");

// Anything non-trivial would be returned and passed indirectly under the
// Itanium C++ ABI and silently break every CMPIStatus/CMPIData call.
template <class... T>
constexpr bool plainC = ((std::is_trivially_copyable_v<T> && std::is_standard_layout_v<T>)&&...);
static_assert(plainC<CMPIValue, CMPIData, CMPIStatus, CMPIValuePtr, CMPIBroker, CMPIContext,
                     CMPIResult, CMPIString, CMPIArray, CMPIEnumeration, CMPIInstance,
                     CMPIObjectPath, CMPIArgs, CMPIDateTime, CMPISelectExp, CMPISelectCond,
                     CMPISubCond, CMPIPredicate, CMPIError, CMPIInstanceMI, CMPIBrokerFT,
                     CMPIBrokerEncFT, CMPIBrokerExtFT, CMPIInstanceFT, CMPIInstanceMIFT,
                     CMPIIndicationMIFT>,
              "CMPI structs stay plain C aggregates");

// A brace initializer sets uint64, the first member.
constexpr CMPIValue kBraced = {0x1122334455667788ULL};
static_assert(kBraced.uint64 == 0x1122334455667788ULL, "CMPIValue member order");

extern "C" const std::size_t ipif_cmpi_c_layout[];
extern "C" const std::size_t ipif_cmpi_c_layout_count;

#define CMPI_ALIGNOF(t) alignof(t)
#define CMPI_LAYOUT(expr) static_cast<std::size_t>(expr),
const std::size_t kCxxLayout[] = {
#include "layout_list.h"
};

TEST(CmpiLayout, CAndCxxCompileTheSameLayout) {
  ASSERT_EQ(ipif_cmpi_c_layout_count, std::size(kCxxLayout));
  for (std::size_t i = 0; i < std::size(kCxxLayout); ++i)
    EXPECT_EQ(ipif_cmpi_c_layout[i], kCxxLayout[i]) << "entry " << i << " of layout_list.h";
}

}  // namespace
