// Macro-to-slot round trip for the macros this project uses (and a few
// representative others): fake broker and object tables carry recording stubs
// placed at the published slot offsets (not by member name); each macro must
// land on its slot with its arguments in order and hand back what the slot
// returned.
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <functional>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "abi_slots.h"

extern "C" CMPIStatus ipif_cmpi_c_provider_flow(const CMPIBroker* mb, const CMPIContext* ctx,
                                                const CMPIResult* rslt, CMPIObjectPath* op,
                                                CMPIInstance* inst, CMPIEnumeration* en);

namespace {

using namespace cmpitest;

enum Tab { BFT, EFT, RES, STR, ARR, ENU, INS, OBP, ARG };

using Words = std::vector<std::uint64_t>;
struct Call {
  int tab;
  int slot;
  Words args;
};
std::vector<Call> g_calls;

template <class T>
std::uint64_t word(T v) {
  if constexpr (std::is_same_v<T, std::nullptr_t>)
    return 0;
  else if constexpr (std::is_pointer_v<T>)
    return reinterpret_cast<std::uintptr_t>(v);
  else
    return static_cast<std::uint64_t>(v);
}
template <class... T>
Words words(T... v) {
  return {word(v)...};
}

// What the stub at (tab, slot) returns: distinct per slot.
template <class R>
R made(int tab, int slot) {
  const std::uint64_t mark = 0x1000u + static_cast<std::uint64_t>(tab) * 0x40u + slot;
  if constexpr (std::is_void_v<R>) {
    return;
  } else if constexpr (std::is_same_v<R, CMPIStatus>) {
    return CMPIStatus{static_cast<CMPIrc>(slot), reinterpret_cast<CMPIString*>(mark * 16)};
  } else if constexpr (std::is_same_v<R, CMPIData>) {
    CMPIData d{};
    d.type = static_cast<CMPIType>(mark);
    d.value.uint64 = mark << 24;
    return d;
  } else if constexpr (std::is_pointer_v<R>) {
    return reinterpret_cast<R>(static_cast<std::uintptr_t>(mark * 16));
  } else {
    return static_cast<R>(mark);
  }
}
std::uint64_t resultWord(CMPIStatus s) { return word(s.msg) ^ static_cast<std::uint64_t>(s.rc); }
std::uint64_t resultWord(CMPIData d) { return d.value.uint64 ^ d.type; }
template <class T>
std::uint64_t resultWord(T v) {
  return word(v);
}

template <int Tab, int Slot, class F>
struct Stub;
template <int Tab, int Slot, class R, class... A>
struct Stub<Tab, Slot, R (*)(A...)> {
  static R fn(A... a) {
    g_calls.push_back({Tab, Slot, {word(a)...}});
    return made<R>(Tab, Slot);
  }
};
template <int Tab, int Slot, class R, class... A>  // the message slots
struct Stub<Tab, Slot, R (*)(A..., ...)> {
  static R fn(A... a, ...) {
    g_calls.push_back({Tab, Slot, {word(a)...}});
    return made<R>(Tab, Slot);
  }
};

// Stub for the member the published table names at slot First+i, written at
// that slot's published offset.
template <int Tab, int First, auto... M, class T, std::size_t... I>
void fillFrom(T& table, Lead lead, std::index_sequence<I...>) {
  auto put = [&](std::size_t slot, auto fn) {
    const std::size_t off = slotOffset(lead, slot);
    ASSERT_LE(off + sizeof fn, sizeof table) << "slot " << slot << " lies outside the table";
    std::memcpy(reinterpret_cast<unsigned char*>(&table) + off, &fn, sizeof fn);
  };
  (put(First + I, &Stub<Tab, First + int(I), std::remove_reference_t<decltype(table.*M)>>::fn), ...);
}
template <int Tab, int First, auto... M, class T>
void fill(T& table, Lead lead = kOneInt) {
  fillFrom<Tab, First, M...>(table, lead, std::make_index_sequence<sizeof...(M)>{});
}

char g_hdl;  // a non-NULL handle for every fake object

#define OBJ_RC(T) &T::release, &T::clone
struct FakeBroker {
  CMPIBrokerFT bft{};
  CMPIBrokerEncFT eft{};
  CMPIResultFT rsltFt{};
  CMPIStringFT strFt{};
  CMPIArrayFT arrFt{};
  CMPIEnumerationFT enFt{};
  CMPIInstanceFT instFt{};
  CMPIObjectPathFT opFt{};
  CMPIArgsFT argsFt{};

  CMPIBroker mb{&g_hdl, &bft, &eft, nullptr, nullptr};
  CMPIContext ctx{&g_hdl, nullptr};
  CMPIResult rslt{&g_hdl, &rsltFt};
  CMPIString str{&g_hdl, &strFt};
  CMPIArray arr{&g_hdl, &arrFt};
  CMPIEnumeration en{&g_hdl, &enFt};
  CMPIInstance inst{&g_hdl, &instFt};
  CMPIObjectPath op{&g_hdl, &opFt}, op2{&g_hdl, &opFt};
  CMPIArgs args{&g_hdl, &argsFt}, args2{&g_hdl, &argsFt};

  FakeBroker() {
    using B = CMPIBrokerFT;
    fill<BFT, 3, &B::prepareAttachThread, &B::attachThread, &B::detachThread,
         &B::deliverIndication, &B::enumerateInstanceNames, &B::getInstance, &B::createInstance,
         &B::modifyInstance, &B::deleteInstance, &B::execQuery, &B::enumerateInstances,
         &B::associators, &B::associatorNames, &B::references, &B::referenceNames,
         &B::invokeMethod, &B::setProperty, &B::getProperty>(bft, kTwoIntsAndName);
    using E = CMPIBrokerEncFT;
    fill<EFT, 1, &E::newInstance, &E::newObjectPath, &E::newArgs, &E::newString, &E::newArray,
         &E::newDateTime, &E::newDateTimeFromBinary, &E::newDateTimeFromChars, &E::newSelectExp,
         &E::classPathIsA, &E::toString, &E::isOfType, &E::getType, &E::getMessage,
         &E::logMessage, &E::trace, &E::newCMPIError, &E::openMessageFile, &E::closeMessageFile,
         &E::getMessage2>(eft);
    using R = CMPIResultFT;
    fill<RES, 1, OBJ_RC(R), &R::returnData, &R::returnInstance, &R::returnObjectPath,
         &R::returnDone, &R::returnError>(rsltFt);
    fill<STR, 1, OBJ_RC(CMPIStringFT), &CMPIStringFT::getCharPtr>(strFt);
    using A = CMPIArrayFT;
    fill<ARR, 1, OBJ_RC(A), &A::getSize, &A::getSimpleType, &A::getElementAt, &A::setElementAt>(
        arrFt);
    using N = CMPIEnumerationFT;
    fill<ENU, 1, OBJ_RC(N), &N::getNext, &N::hasNext, &N::toArray>(enFt);
    using I = CMPIInstanceFT;
    fill<INS, 1, OBJ_RC(I), &I::getProperty, &I::getPropertyAt, &I::getPropertyCount,
         &I::setProperty, &I::getObjectPath, &I::setPropertyFilter, &I::setObjectPath,
         &I::setPropertyWithOrigin>(instFt);
    using P = CMPIObjectPathFT;
    fill<OBP, 1, OBJ_RC(P), &P::setNameSpace, &P::getNameSpace, &P::setHostname,
         &P::getHostname, &P::setClassName, &P::getClassName, &P::addKey, &P::getKey,
         &P::getKeyAt, &P::getKeyCount, &P::setNameSpaceFromObjectPath,
         &P::setHostAndNameSpaceFromObjectPath, &P::getClassQualifier, &P::getPropertyQualifier,
         &P::getMethodQualifier, &P::getParameterQualifier, &P::toString>(opFt);
    using G = CMPIArgsFT;
    fill<ARG, 1, OBJ_RC(G), &G::addArg, &G::getArg, &G::getArgAt, &G::getArgCount>(argsFt);
    g_calls.clear();
  }
};

class CmpiMacros : public ::testing::Test {
 protected:
  FakeBroker f;
  CMPIStatus st{};
  CMPIStatus* rc = &st;
  const char* props[2] = {"Name", nullptr};
  const char* keys[2] = {"Key", nullptr};
  const char** pl = props;
  const char kS1[3] = "s1";
  const char kS2[3] = "s2";
  const char kS3[3] = "s3";
  const char kS4[3] = "s4";
  CMPIString* nameOut = nullptr;
  CMPICount idx = 7;
  CMPIUint16 u16 = 1500;
  CMPIUint64 usec = 0x0123456789ABCDEFULL;  // both halves must arrive on i386
  CMPIBoolean yes = 0x5A;                    // any non-zero byte is true

  void expectCall(const std::string& what, int tab, int slot, const Words& args) {
    ASSERT_EQ(g_calls.size(), 1u) << what << " made " << g_calls.size() << " calls";
    EXPECT_EQ(std::make_pair(g_calls[0].tab, g_calls[0].slot), std::make_pair(tab, slot)) << what;
    EXPECT_EQ(g_calls[0].args, args) << what << ": arguments differ";
    g_calls.clear();
  }
};

struct Case {
  const char* macro;
  int tab;
  int slot;
  Words args;
  std::function<std::pair<std::uint64_t, std::uint64_t>()> run;  // {returned, slot's value}
};
#define C(TAB, SLOT, MACRO, ...)                                   \
  Case{#MACRO, TAB, SLOT, words(__VA_ARGS__), [&] {                \
         auto r = MACRO(__VA_ARGS__);                              \
         return std::make_pair(resultWord(r), resultWord(made<decltype(r)>(TAB, SLOT))); \
       }}

TEST_F(CmpiMacros, EachCallMacroHitsItsSlotWithItsArguments) {
  const Case cases[] = {
      C(BFT, 8, CBGetInstance, &f.mb, &f.ctx, &f.op, pl, rc),
      C(BFT, 13, CBEnumInstances, &f.mb, &f.ctx, &f.op, pl, rc),
      C(BFT, 14, CBAssociators, &f.mb, &f.ctx, &f.op, kS1, kS2, kS3, kS4, pl, rc),
      C(BFT, 18, CBInvokeMethod, &f.mb, &f.ctx, &f.op2, kS1, &f.args, &f.args2, rc),
      C(EFT, 1, CMNewInstance, &f.mb, &f.op, rc),
      C(EFT, 2, CMNewObjectPath, &f.mb, kS1, kS2, rc),
      C(EFT, 3, CMNewArgs, &f.mb, rc),
      C(EFT, 4, CMNewString, &f.mb, kS1, rc),
      C(EFT, 5, CMNewArray, &f.mb, idx, CMPI_string, rc),
      C(EFT, 7, CMNewDateTimeFromBinary, &f.mb, usec, yes, rc),
      C(EFT, 10, CMClassPathIsA, &f.mb, &f.op, kS1, rc),
      C(EFT, 11, CDToString, &f.mb, &f.inst, rc),
      C(RES, 3, CMReturnData, &f.rslt, &u16, CMPI_uint16),
      C(RES, 4, CMReturnInstance, &f.rslt, &f.inst),
      C(RES, 5, CMReturnObjectPath, &f.rslt, &f.op2),
      C(RES, 6, CMReturnDone, &f.rslt),
      C(STR, 3, CMGetCharsPtr, &f.str, rc),
      C(ARR, 3, CMGetArrayCount, &f.arr, rc),
      C(ARR, 5, CMGetArrayElementAt, &f.arr, idx, rc),
      C(ARR, 6, CMSetArrayElementAt, &f.arr, idx, &u16, CMPI_uint16),
      C(ENU, 3, CMGetNext, &f.en, rc),
      C(ENU, 4, CMHasNext, &f.en, rc),
      C(INS, 3, CMGetProperty, &f.inst, kS1, rc),
      C(INS, 6, CMSetProperty, &f.inst, kS1, kS2, CMPI_chars),
      C(INS, 7, CMGetObjectPath, &f.inst, rc),
      C(INS, 8, CMSetPropertyFilter, &f.inst, pl, keys),
      C(OBP, 3, CMSetNameSpace, &f.op, kS1),
      C(OBP, 4, CMGetNameSpace, &f.op, rc),
      C(OBP, 8, CMGetClassName, &f.op, rc),
      C(OBP, 9, CMAddKey, &f.op, kS1, kS2, CMPI_chars),
      C(OBP, 10, CMGetKey, &f.op, kS1, rc),
      C(OBP, 11, CMGetKeyAt, &f.op, idx, &nameOut, rc),
      C(OBP, 12, CMGetKeyCount, &f.op, rc),
      C(OBP, 19, CMObjectPathToString, &f.op, rc),
      C(ARG, 3, CMAddArg, &f.args, kS1, &u16, CMPI_uint16),
      C(ARG, 4, CMGetArg, &f.args, kS1, rc),
      C(INS, 2, CMClone, &f.inst, rc),
      C(OBP, 2, CMClone, &f.op, rc),
  };
  for (const Case& c : cases) {
    const auto [returned, expected] = c.run();
    expectCall(c.macro, c.tab, c.slot, c.args);
    EXPECT_EQ(returned, expected) << c.macro << " lost the slot's return value";
  }
  (void)CMRelease(&f.args);
  expectCall("CMRelease", ARG, 1, words(&f.args));

  // The string's characters come from getCharPtr, never from peeking at hdl;
  // nested as in CMGetCharPtr(CMGetClassName(op, NULL)) the inner call runs once.
  int lookups = 0;
  auto lookup = [&] { return ++lookups, &f.str; };
  EXPECT_EQ(CMGetCharPtr(lookup()), made<char*>(STR, 3));
  EXPECT_EQ(lookups, 1);
  expectCall("CMGetCharPtr", STR, 3, words(&f.str, nullptr));
  const CMPIString* missing = nullptr;  // a failed getClassName
  EXPECT_EQ(CMGetCharPtr(missing), nullptr);
  EXPECT_TRUE(g_calls.empty());
}

// Statement macros, shaped as a provider uses them (unbraced if/else included).
CMPIStatus returnVia(int how, const CMPIBroker* mb, CMPIString* msg) {
  if (how == 0)
    CMReturn(CMPI_RC_ERR_NOT_FOUND);
  else if (how == 1)
    CMReturnWithString(CMPI_RC_ERR_FAILED, msg);
  else
    CMReturnWithChars(mb, CMPI_RC_ERR_ACCESS_DENIED, "denied");
}

TEST_F(CmpiMacros, StatusMacrosFillAndReturnStatus) {
  CMPIStatus s = returnVia(0, &f.mb, &f.str);
  EXPECT_EQ(s.rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(s.msg, nullptr);
  s = returnVia(1, &f.mb, &f.str);
  EXPECT_EQ(s.rc, CMPI_RC_ERR_FAILED);
  EXPECT_EQ(s.msg, &f.str);
  EXPECT_TRUE(g_calls.empty());
  s = returnVia(2, &f.mb, &f.str);
  EXPECT_EQ(s.rc, CMPI_RC_ERR_ACCESS_DENIED);
  EXPECT_EQ(s.msg, made<CMPIString*>(EFT, 4));  // message made by newString
  ASSERT_EQ(g_calls.size(), 1u);
  EXPECT_STREQ(reinterpret_cast<const char*>(g_calls[0].args.at(1)), "denied");
  expectCall("CMReturnWithChars", EFT, 4, words(&f.mb, g_calls[0].args.at(1), nullptr));

  CMPIStatus out{CMPI_RC_ERROR, &f.str};
  CMSetStatus(&out, CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_EQ(out.rc, CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_EQ(out.msg, nullptr);
  CMSetStatusWithString(&out, CMPI_RC_ERR_INVALID_CLASS, &f.str);
  EXPECT_EQ(out.rc, CMPI_RC_ERR_INVALID_CLASS);
  EXPECT_EQ(out.msg, &f.str);
  CMSetStatusWithChars(&f.mb, &out, CMPI_RC_ERR_FAILED, kS1);
  expectCall("CMSetStatusWithChars", EFT, 4, words(&f.mb, kS1, nullptr));
  EXPECT_EQ(out.rc, CMPI_RC_ERR_FAILED);
  EXPECT_EQ(out.msg, made<CMPIString*>(EFT, 4));
  // Brokers pass NULL for "no status wanted": nothing is written or allocated.
  CMPIStatus* none = nullptr;
  CMSetStatus(none, CMPI_RC_ERR_FAILED);
  CMSetStatusWithChars(&f.mb, none, CMPI_RC_ERR_FAILED, kS1);
  EXPECT_TRUE(g_calls.empty());

  CMPIInstance noHdl{nullptr, f.inst.ft};
  EXPECT_TRUE(CMIsNullObject(static_cast<const CMPIInstance*>(nullptr)));
  EXPECT_TRUE(CMIsNullObject(&noHdl));
  EXPECT_FALSE(CMIsNullObject(&f.inst));
}

TEST_F(CmpiMacros, MacrosExpandTheSameWayInC) {
  const CMPIStatus s = ipif_cmpi_c_provider_flow(&f.mb, &f.ctx, &f.rslt, &f.op, &f.inst, &f.en);
  const std::vector<std::pair<int, int>> want = {{EFT, 1}, {OBP, 9}, {INS, 6}, {BFT, 13}, {ENU, 4},
                                                 {ENU, 3}, {RES, 4}, {RES, 6}, {EFT, 4}};
  std::vector<std::pair<int, int>> got;
  for (const Call& c : g_calls) got.emplace_back(c.tab, c.slot);
  EXPECT_EQ(got, want);
  ASSERT_EQ(g_calls.size(), want.size());
  // CMPI_chars values travel as the char* itself; other types as a pointer to the value.
  EXPECT_STREQ(reinterpret_cast<const char*>(g_calls[1].args.at(2)), "eth0");
  EXPECT_EQ(g_calls[1].args.at(3), word(CMPI_chars));
  EXPECT_EQ(g_calls[2].args.at(3), word(CMPI_uint16));
  EXPECT_EQ(s.rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(s.msg, made<CMPIString*>(EFT, 4));
}

}  // namespace
