// Binary layout of the CMPI headers, pinned at compile time to the published
// x86_64 / i386 numbers (the column is chosen by this build's pointer size).
// A moved, missing or widened member fails the build of this test.
#include <cmpidt.h>
#include <cmpift.h>

#include <pthread.h>

#include <cstddef>
#include <type_traits>

#include "abi_slots.h"

namespace {

using namespace cmpitest;

#define SIZE(T, a, b) static_assert(sizeof(T) == col(a, b), "sizeof " #T);
#define AT(T, m, a, b) static_assert(offsetof(T, m) == col(a, b), #T "::" #m);

// ---- Scalars, values, status, handles ------------------------------------
SIZE(CMPIBoolean, 1, 1) SIZE(CMPIChar16, 2, 2) SIZE(CMPIType, 2, 2) SIZE(CMPIValueState, 2, 2)
SIZE(CMPIUint64, 8, 8) SIZE(CMPICount, 4, 4) SIZE(CMPIrc, 4, 4) SIZE(CMPIMsgFileHandle, 8, 4)
static_assert(alignof(CMPIUint64) == col(8, 4) && alignof(CMPIReal64) == col(8, 4), "i386 4-aligns 64-bit");
static_assert(alignof(CMPIValue) == col(8, 4) && alignof(CMPIData) == col(8, 4), "union alignment");
SIZE(CMPIValuePtr, 16, 8) AT(CMPIValuePtr, length, 8, 4)
SIZE(CMPIValue, 16, 8) SIZE(CMPIData, 24, 12) AT(CMPIData, state, 2, 2) AT(CMPIData, value, 8, 4)
SIZE(CMPIStatus, 16, 8) AT(CMPIStatus, msg, 8, 4)
SIZE(CMPIBroker, 40, 20) AT(CMPIBroker, bft, 8, 4) AT(CMPIBroker, eft, 16, 8)
AT(CMPIBroker, xft, 24, 12) AT(CMPIBroker, mft, 32, 16)
SIZE(CMPIInstance, 16, 8) SIZE(CMPIObjectPath, 16, 8) AT(CMPIString, ft, 8, 4) AT(CMPIInstanceMI, ft, 8, 4)

// ---- Tables nothing here fills or calls: size, first and last slot ---------
SIZE(CMPISelectExpFT, 64, 32) AT(CMPISelectExpFT, release, 8, 4)
AT(CMPISelectExpFT, evaluateUsingAccessor, 56, 28)
SIZE(CMPISelectCondFT, 40, 20) AT(CMPISelectCondFT, release, 8, 4)
AT(CMPISelectCondFT, getSubCondAt, 32, 16)
SIZE(CMPISubCondFT, 48, 24) AT(CMPISubCondFT, release, 8, 4) AT(CMPISubCondFT, getPredicate, 40, 20)
SIZE(CMPIPredicateFT, 40, 20) AT(CMPIPredicateFT, release, 8, 4)
AT(CMPIPredicateFT, evaluateUsingAccessor, 32, 16)
SIZE(CMPIErrorFT, 216, 108) AT(CMPIErrorFT, release, 8, 4) AT(CMPIErrorFT, setMessageArguments, 208, 104)
SIZE(CMPIPropertyMIFT, 48, 28) AT(CMPIPropertyMIFT, cleanup, 16, 12)
AT(CMPIPropertyMIFT, setPropertyWithOrigin, 40, 24)
SIZE(CMPIIndicationMIFT, 72, 40) AT(CMPIIndicationMIFT, cleanup, 16, 12)
AT(CMPIIndicationMIFT, disableIndications, 64, 36)

// ---- Tables the host fills and the provider calls or exports --------------
// The size plus every slot in order (size = last slot + one pointer, so the
// arithmetic in abi_slots.h is itself held to the published numbers).
SIZE(CMPIBrokerFT, 160, 84) SIZE(CMPIBrokerEncFT, 168, 84) SIZE(CMPIBrokerExtFT, 168, 84)
SIZE(CMPIBrokerMemFT, 120, 60) SIZE(CMPIContextFT, 56, 28) SIZE(CMPIResultFT, 64, 32)
SIZE(CMPIStringFT, 32, 16) SIZE(CMPIArrayFT, 56, 28) SIZE(CMPIEnumerationFT, 48, 24)
SIZE(CMPIInstanceFT, 88, 44) SIZE(CMPIObjectPathFT, 160, 80) SIZE(CMPIArgsFT, 56, 28)
SIZE(CMPIDateTimeFT, 48, 24) SIZE(CMPIInstanceMIFT, 80, 44) SIZE(CMPIAssociationMIFT, 56, 32)
SIZE(CMPIMethodMIFT, 32, 20)
AT(CMPIBrokerFT, brokerVersion, 4, 4) AT(CMPIBrokerFT, brokerName, 8, 8)
AT(CMPIInstanceMIFT, miVersion, 4, 4) AT(CMPIInstanceMIFT, miName, 8, 8)

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
SLOTS(CMPIInstanceMIFT, kTwoIntsAndName, 3, O(cleanup), O(enumerateInstanceNames),
      O(enumerateInstances), O(getInstance), O(createInstance), O(modifyInstance),
      O(deleteInstance), O(execQuery))
SLOTS(CMPIAssociationMIFT, kTwoIntsAndName, 3, O(cleanup), O(associators), O(associatorNames),
      O(references), O(referenceNames))
SLOTS(CMPIMethodMIFT, kTwoIntsAndName, 3, O(cleanup), O(invokeMethod))

// ---- Signatures where a same-size mistake would still pass the offsets ---
template <class T, class U>
constexpr bool same = std::is_same_v<T, U>;
static_assert(same<CMPIBoolean, unsigned char> && same<CMPIType, unsigned short> &&
                  same<CMPIValueState, unsigned short> && same<CMPIUint64, unsigned long long>,
              "CMPIBoolean is no bool; type and state are 2-byte unsigned");
static_assert(same<decltype(CMPIBrokerFT::brokerCapabilities), unsigned int>, "not unsigned long");
static_assert(sizeof(CMPI_THREAD_KEY_TYPE) == sizeof(pthread_key_t), "brokers write a pthread_key_t");
static_assert(same<decltype(CMPIBrokerFT::invokeMethod),
                   CMPIData (*)(const CMPIBroker*, const CMPIContext*, const CMPIObjectPath*,
                                const char*, const CMPIArgs*, CMPIArgs*, CMPIStatus*)>,
              "invokeMethod returns CMPIData by value");
static_assert(same<decltype(CMPIEnumerationFT::getNext),
                   CMPIData (*)(const CMPIEnumeration*, CMPIStatus*)> &&
                  same<decltype(CMPIEnumerationFT::hasNext),
                       CMPIBoolean (*)(const CMPIEnumeration*, CMPIStatus*)>,
              "getNext before hasNext");
static_assert(same<decltype(CMPIBrokerEncFT::getMessage),
                   CMPIString* (*)(const CMPIBroker*, const char*, const char*, CMPIStatus*,
                                   CMPICount, ...)>,
              "getMessage is variadic after the count");
static_assert(same<decltype(CMPIBrokerEncFT::newDateTimeFromBinary),
                   CMPIDateTime* (*)(const CMPIBroker*, CMPIUint64, CMPIBoolean, CMPIStatus*)>,
              "64-bit time takes two stack slots on i386");

// Anything non-trivial would be returned and passed indirectly under the
// Itanium C++ ABI and silently break every CMPIStatus/CMPIData call.
template <class... T>
constexpr bool plainC = ((std::is_trivially_copyable_v<T> && std::is_standard_layout_v<T>)&&...);
static_assert(plainC<CMPIValue, CMPIData, CMPIStatus, CMPIBroker, CMPIInstance, CMPIObjectPath,
                     CMPIBrokerFT, CMPIInstanceFT, CMPIInstanceMIFT>,
              "CMPI structs stay plain C aggregates");

// A brace initializer sets uint64, the first member.
constexpr CMPIValue kBraced = {0x1122334455667788ULL};
static_assert(kBraced.uint64 == 0x1122334455667788ULL, "CMPIValue member order");

}  // namespace
