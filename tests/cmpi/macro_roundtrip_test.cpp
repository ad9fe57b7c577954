// Macro-to-slot round trip: fake broker and object tables carry recording
// stubs placed at the published slot offsets (not by member name); every
// convenience macro must land on its slot with its arguments in order and hand
// back what the slot returned.
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <gtest/gtest.h>

#include <cstdarg>
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

enum Tab { BFT, EFT, CTX, RES, STR, ARR, ENU, INS, OBP, ARG, DTM, SEL, SCN, SUB, PRD, ERR };
const char* const kTabName[] = {"BrokerFT", "BrokerEncFT", "ContextFT",   "ResultFT",
                                "StringFT", "ArrayFT",     "EnumerationFT", "InstanceFT",
                                "ObjectPathFT", "ArgsFT",  "DateTimeFT",  "SelectExpFT",
                                "SelectCondFT", "SubCondFT", "PredicateFT", "ErrorFT"};

using Words = std::vector<std::uint64_t>;
struct Call {
  int tab;
  int slot;
  Words args;
};
std::vector<Call> g_calls;

template <class T>
std::uint64_t word(T v) {
  if constexpr (std::is_same_v<T, std::nullptr_t>) {
    return 0;
  } else if constexpr (std::is_pointer_v<T>) {
    return reinterpret_cast<std::uintptr_t>(v);
  } else if constexpr (std::is_floating_point_v<T>) {
    static_assert(sizeof(T) == sizeof(std::uint64_t));
    std::uint64_t w;
    std::memcpy(&w, &v, sizeof w);
    return w;
  } else {
    return static_cast<std::uint64_t>(v);
  }
}
template <class... T>
Words words(T... v) {
  return {word(v)...};
}

// What the stub at (tab, slot) returns: distinct per slot where the type allows.
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
  } else if constexpr (std::is_enum_v<R>) {
    return static_cast<R>(slot & 3);  // stay inside every enum's value range
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

// The variadic message slots also decode their (type, value) pairs.
void readPairs(Words& out, CMPICount n, va_list ap) {
  for (CMPICount i = 0; i < n; ++i) {
    const int type = va_arg(ap, int);
    out.push_back(static_cast<std::uint64_t>(type));
    switch (type) {
      case CMPI_sint32: out.push_back(word(va_arg(ap, long))); break;
      case CMPI_uint32: out.push_back(word(va_arg(ap, unsigned long))); break;
      case CMPI_sint64: out.push_back(word(va_arg(ap, long long))); break;
      case CMPI_uint64: out.push_back(word(va_arg(ap, unsigned long long))); break;
      case CMPI_real64: out.push_back(word(va_arg(ap, double))); break;
      case CMPI_boolean: out.push_back(word(va_arg(ap, int))); break;
      case CMPI_chars: out.push_back(word(va_arg(ap, char*))); break;
      case CMPI_string: out.push_back(word(va_arg(ap, CMPIString*))); break;
      default: return;  // unknown code: the rest cannot be decoded
    }
  }
}
CMPIString* getMessageStub(const CMPIBroker* mb, const char* id, const char* def, CMPIStatus* rc,
                           CMPICount n, ...) {
  Words a = words(mb, id, def, rc, n);
  va_list ap;
  va_start(ap, n);
  readPairs(a, n, ap);
  va_end(ap);
  g_calls.push_back({EFT, 14, a});
  return made<CMPIString*>(EFT, 14);
}
CMPIString* getMessage2Stub(const CMPIBroker* mb, const char* id, const CMPIMsgFileHandle fh,
                            const char* def, CMPIStatus* rc, CMPICount n, ...) {
  Words a = words(mb, id, fh, def, rc, n);
  va_list ap;
  va_start(ap, n);
  readPairs(a, n, ap);
  va_end(ap);
  g_calls.push_back({EFT, 20, a});
  return made<CMPIString*>(EFT, 20);
}

template <class T, class F>
void putAt(T& table, Lead lead, int slot, F fn) {
  const std::size_t off = slotOffset(lead, static_cast<std::size_t>(slot));
  ASSERT_LE(off + sizeof fn, sizeof table) << "slot " << slot << " lies outside the table";
  std::memcpy(reinterpret_cast<unsigned char*>(&table) + off, &fn, sizeof fn);
}
// Stub for the member the published table names at slot First+i, written at
// that slot's published offset.
template <int Tab, int First, auto... M, class T, std::size_t... I>
void fillFrom(T& table, Lead lead, std::index_sequence<I...>) {
  (putAt(table, lead, First + static_cast<int>(I),
         &Stub<Tab, First + static_cast<int>(I),
               std::remove_reference_t<decltype(table.*M)>>::fn),
   ...);
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
  CMPIContextFT ctxFt{};
  CMPIResultFT rsltFt{};
  CMPIStringFT strFt{};
  CMPIArrayFT arrFt{};
  CMPIEnumerationFT enFt{};
  CMPIInstanceFT instFt{};
  CMPIObjectPathFT opFt{};
  CMPIArgsFT argsFt{};
  CMPIDateTimeFT dtFt{};
  CMPISelectExpFT seFt{};
  CMPISelectCondFT scFt{};
  CMPISubCondFT subFt{};
  CMPIPredicateFT predFt{};
  CMPIErrorFT errFt{};

  CMPIBroker mb{&g_hdl, &bft, &eft, nullptr, nullptr};
  CMPIContext ctx{&g_hdl, &ctxFt};
  CMPIResult rslt{&g_hdl, &rsltFt};
  CMPIString str{&g_hdl, &strFt};
  CMPIArray arr{&g_hdl, &arrFt};
  CMPIEnumeration en{&g_hdl, &enFt};
  CMPIInstance inst{&g_hdl, &instFt};
  CMPIObjectPath op{&g_hdl, &opFt}, op2{&g_hdl, &opFt};
  CMPIArgs args{&g_hdl, &argsFt}, args2{&g_hdl, &argsFt};
  CMPIDateTime dt{&g_hdl, &dtFt};
  CMPISelectExp se{&g_hdl, &seFt};
  CMPISelectCond sc{&g_hdl, &scFt};
  CMPISubCond sub{&g_hdl, &subFt};
  CMPIPredicate pred{&g_hdl, &predFt};
  CMPIError err{&g_hdl, &errFt};

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
         &E::classPathIsA, &E::toString, &E::isOfType, &E::getType>(eft);
    putAt(eft, kOneInt, 14, &getMessageStub);
    fill<EFT, 15, &E::logMessage, &E::trace, &E::newCMPIError, &E::openMessageFile,
         &E::closeMessageFile>(eft);
    putAt(eft, kOneInt, 20, &getMessage2Stub);
    using C = CMPIContextFT;
    fill<CTX, 1, OBJ_RC(C), &C::getEntry, &C::getEntryAt, &C::getEntryCount, &C::addEntry>(ctxFt);
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
    using D = CMPIDateTimeFT;
    fill<DTM, 1, OBJ_RC(D), &D::getBinaryFormat, &D::getStringFormat, &D::isInterval>(dtFt);
    using S = CMPISelectExpFT;
    fill<SEL, 1, OBJ_RC(S), &S::evaluate, &S::getString, &S::getDOC, &S::getCOD,
         &S::evaluateUsingAccessor>(seFt);
    fill<SCN, 1, OBJ_RC(CMPISelectCondFT), &CMPISelectCondFT::getCountAndType,
         &CMPISelectCondFT::getSubCondAt>(scFt);
    using U = CMPISubCondFT;
    fill<SUB, 1, OBJ_RC(U), &U::getCount, &U::getPredicateAt, &U::getPredicate>(subFt);
    using Q = CMPIPredicateFT;
    fill<PRD, 1, OBJ_RC(Q), &Q::getData, &Q::evaluateUsingAccessor>(predFt);
    using X = CMPIErrorFT;
    fill<ERR, 1, OBJ_RC(X), &X::getErrorType, &X::getOtherErrorType, &X::getOwningEntity,
         &X::getMessageID, &X::getMessage, &X::getPerceivedSeverity, &X::getProbableCause,
         &X::getProbableCauseDescription, &X::getRecommendedActions, &X::getErrorSource,
         &X::getErrorSourceFormat, &X::getOtherErrorSourceFormat, &X::getCIMStatusCode,
         &X::getCIMStatusCodeDescription, &X::getMessageArguments, &X::setErrorType,
         &X::setOtherErrorType, &X::setProbableCauseDescription, &X::setRecommendedActions,
         &X::setErrorSource, &X::setErrorSourceFormat, &X::setOtherErrorSourceFormat,
         &X::setCIMStatusCodeDescription, &X::setMessageArguments>(errFt);
    g_calls.clear();
  }
};

CMPIData accessor(const char*, void*) { return CMPIData{}; }

struct Case {
  const char* macro;
  int tab;
  int slot;
  Words args;
  std::function<std::pair<std::uint64_t, std::uint64_t>()> run;  // {returned, slot's value}
};
template <class R>
std::pair<std::uint64_t, std::uint64_t> outcome(R r, int tab, int slot) {
  return {resultWord(r), resultWord(made<R>(tab, slot))};
}

class CmpiMacros : public ::testing::Test {
 protected:
  FakeBroker f;
  CMPIStatus st{};
  CMPIStatus* rc = &st;
  const char* props[2] = {"Name", nullptr};
  const char* keys[2] = {"Key", nullptr};
  const char** pl = props;
  const char** pl2 = keys;
  const char kS1[3] = "s1";
  const char kS2[3] = "s2";
  const char kS3[3] = "s3";
  const char kS4[3] = "s4";
  CMPIString* nameOut = nullptr;
  CMPIString* lhs = nullptr;
  CMPIString* rhs = nullptr;
  CMPIArray* proj = nullptr;
  CMPIMsgFileHandle fh = &g_hdl;
  int condType = 0;
  CMPIType predType = 0;
  CMPIPredOp predOp = CMPI_PredOp_Equals;
  CMPIAccessor* acc = &accessor;
  void* parm = &st;
  CMPICount idx = 7;
  CMPIUint16 u16 = 1500;
  CMPIUint64 usec = 0x0123456789ABCDEFULL;  // both halves must arrive on i386
  CMPIBoolean yes = 0x5A;                    // any non-zero byte is true

  void expectCall(const char* what, int tab, int slot, const Words& args) {
    ASSERT_EQ(g_calls.size(), 1u) << what << " made " << g_calls.size() << " calls";
    EXPECT_EQ(kTabName[g_calls[0].tab], std::string(kTabName[tab])) << what;
    EXPECT_EQ(g_calls[0].slot, slot) << what;
    EXPECT_EQ(g_calls[0].args, args) << what << ": arguments differ";
    g_calls.clear();
  }
};

#define C(TAB, SLOT, MACRO, ...) \
  Case{#MACRO, TAB, SLOT, words(__VA_ARGS__), [&] { return outcome(MACRO(__VA_ARGS__), TAB, SLOT); }}

TEST_F(CmpiMacros, EveryCallMacroHitsItsSlotWithItsArguments) {
  const Case cases[] = {
      C(BFT, 3, CBPrepareAttachThread, &f.mb, &f.ctx),
      C(BFT, 4, CBAttachThread, &f.mb, &f.ctx),
      C(BFT, 5, CBDetachThread, &f.mb, &f.ctx),
      C(BFT, 6, CBDeliverIndication, &f.mb, &f.ctx, kS1, &f.inst),
      C(BFT, 7, CBEnumInstanceNames, &f.mb, &f.ctx, &f.op, rc),
      C(BFT, 8, CBGetInstance, &f.mb, &f.ctx, &f.op, pl, rc),
      C(BFT, 9, CBCreateInstance, &f.mb, &f.ctx, &f.op, &f.inst, rc),
      C(BFT, 10, CBModifyInstance, &f.mb, &f.ctx, &f.op, &f.inst, pl),
      C(BFT, 11, CBDeleteInstance, &f.mb, &f.ctx, &f.op),
      C(BFT, 12, CBExecQuery, &f.mb, &f.ctx, &f.op, kS1, kS2, rc),
      C(BFT, 13, CBEnumInstances, &f.mb, &f.ctx, &f.op, pl, rc),
      C(BFT, 14, CBAssociators, &f.mb, &f.ctx, &f.op, kS1, kS2, kS3, kS4, pl, rc),
      C(BFT, 15, CBAssociatorNames, &f.mb, &f.ctx, &f.op, kS1, kS2, kS3, kS4, rc),
      C(BFT, 16, CBReferences, &f.mb, &f.ctx, &f.op, kS1, kS2, pl, rc),
      C(BFT, 17, CBReferenceNames, &f.mb, &f.ctx, &f.op, kS1, kS2, rc),
      C(BFT, 18, CBInvokeMethod, &f.mb, &f.ctx, &f.op2, kS1, &f.args, &f.args2, rc),
      C(BFT, 19, CBSetProperty, &f.mb, &f.ctx, &f.op, kS1, &u16, CMPI_uint16),
      C(BFT, 20, CBGetProperty, &f.mb, &f.ctx, &f.op, kS1, rc),
      C(EFT, 1, CMNewInstance, &f.mb, &f.op, rc),
      C(EFT, 2, CMNewObjectPath, &f.mb, kS1, kS2, rc),
      C(EFT, 3, CMNewArgs, &f.mb, rc),
      C(EFT, 4, CMNewString, &f.mb, kS1, rc),
      C(EFT, 5, CMNewArray, &f.mb, idx, CMPI_string, rc),
      C(EFT, 6, CMNewDateTime, &f.mb, rc),
      C(EFT, 7, CMNewDateTimeFromBinary, &f.mb, usec, yes, rc),
      C(EFT, 8, CMNewDateTimeFromChars, &f.mb, kS1, rc),
      C(EFT, 9, CMNewSelectExp, &f.mb, kS1, kS2, &proj, rc),
      C(EFT, 10, CMClassPathIsA, &f.mb, &f.op, kS1, rc),
      C(EFT, 11, CDToString, &f.mb, &f.inst, rc),
      C(EFT, 12, CDIsOfType, &f.mb, &f.inst, kS1, rc),
      C(EFT, 13, CDGetType, &f.mb, &f.inst, rc),
      C(EFT, 15, CMLogMessage, &f.mb, CMPI_SEV_WARNING, kS1, kS2, &f.str),
      C(EFT, 16, CMTraceMessage, &f.mb, CMPI_LEV_VERBOSE, kS1, kS2, &f.str),
      C(EFT, 17, CMNewCMPIError, &f.mb, kS1, kS2, kS3, ErrorSevHigh, Timeout, CMPI_RC_ERR_NOT_FOUND, rc),
      C(EFT, 18, CMOpenMessageFile, &f.mb, kS1, &fh),
      C(EFT, 19, CMCloseMessageFile, &f.mb, fh),
      C(CTX, 3, CMGetContextEntry, &f.ctx, kS1, rc),
      C(CTX, 4, CMGetContextEntryAt, &f.ctx, idx, &nameOut, rc),
      C(CTX, 5, CMGetContextEntryCount, &f.ctx, rc),
      C(CTX, 6, CMAddContextEntry, &f.ctx, kS1, &u16, CMPI_uint16),
      C(RES, 3, CMReturnData, &f.rslt, &u16, CMPI_uint16),
      C(RES, 4, CMReturnInstance, &f.rslt, &f.inst),
      C(RES, 5, CMReturnObjectPath, &f.rslt, &f.op2),
      C(RES, 6, CMReturnDone, &f.rslt),
      C(RES, 7, CMReturnError, &f.rslt, &f.err),
      C(STR, 3, CMGetCharsPtr, &f.str, rc),
      C(ARR, 3, CMGetArrayCount, &f.arr, rc),
      C(ARR, 4, CMGetArrayType, &f.arr, rc),
      C(ARR, 5, CMGetArrayElementAt, &f.arr, idx, rc),
      C(ARR, 6, CMSetArrayElementAt, &f.arr, idx, &u16, CMPI_uint16),
      C(ENU, 3, CMGetNext, &f.en, rc),
      C(ENU, 4, CMHasNext, &f.en, rc),
      C(ENU, 5, CMToArray, &f.en, rc),
      C(INS, 3, CMGetProperty, &f.inst, kS1, rc),
      C(INS, 4, CMGetPropertyAt, &f.inst, idx, &nameOut, rc),
      C(INS, 5, CMGetPropertyCount, &f.inst, rc),
      C(INS, 6, CMSetProperty, &f.inst, kS1, kS2, CMPI_chars),
      C(INS, 7, CMGetObjectPath, &f.inst, rc),
      C(INS, 8, CMSetPropertyFilter, &f.inst, pl, pl2),
      C(INS, 9, CMSetObjectPath, &f.inst, &f.op2),
      C(INS, 10, CMSetPropertyWithOrigin, &f.inst, kS1, &u16, CMPI_uint16, kS2),
      C(OBP, 3, CMSetNameSpace, &f.op, kS1),
      C(OBP, 4, CMGetNameSpace, &f.op, rc),
      C(OBP, 5, CMSetHostname, &f.op, kS1),
      C(OBP, 6, CMGetHostname, &f.op, rc),
      C(OBP, 7, CMSetClassName, &f.op, kS1),
      C(OBP, 8, CMGetClassName, &f.op, rc),
      C(OBP, 9, CMAddKey, &f.op, kS1, kS2, CMPI_chars),
      C(OBP, 10, CMGetKey, &f.op, kS1, rc),
      C(OBP, 11, CMGetKeyAt, &f.op, idx, &nameOut, rc),
      C(OBP, 12, CMGetKeyCount, &f.op, rc),
      C(OBP, 13, CMSetNameSpaceFromObjectPath, &f.op, &f.op2),
      C(OBP, 14, CMSetHostAndNameSpaceFromObjectPath, &f.op, &f.op2),
      C(OBP, 15, CMGetClassQualifier, &f.op, kS1, rc),
      C(OBP, 16, CMGetPropertyQualifier, &f.op, kS1, kS2, rc),
      C(OBP, 17, CMGetMethodQualifier, &f.op, kS1, kS2, rc),
      C(OBP, 18, CMGetParameterQualifier, &f.op, kS1, kS2, kS3, rc),
      C(OBP, 19, CMObjectPathToString, &f.op, rc),
      C(ARG, 3, CMAddArg, &f.args, kS1, &u16, CMPI_uint16),
      C(ARG, 4, CMGetArg, &f.args, kS1, rc),
      C(ARG, 5, CMGetArgAt, &f.args, idx, &nameOut, rc),
      C(ARG, 6, CMGetArgCount, &f.args, rc),
      C(DTM, 3, CMGetBinaryFormat, &f.dt, rc),
      C(DTM, 4, CMGetStringFormat, &f.dt, rc),
      C(DTM, 5, CMIsInterval, &f.dt, rc),
      C(SEL, 3, CMEvaluateSelExp, &f.se, &f.inst, rc),
      C(SEL, 4, CMGetSelExpString, &f.se, rc),
      C(SEL, 5, CMGetDoc, &f.se, rc),
      C(SEL, 6, CMGetCod, &f.se, rc),
      C(SEL, 7, CMEvaluateSelExpUsingAccessor, &f.se, acc, parm, rc),
      C(SCN, 3, CMGetSubCondCountAndType, &f.sc, &condType, rc),
      C(SCN, 4, CMGetSubCondAt, &f.sc, idx, rc),
      C(SUB, 3, CMGetPredicateCount, &f.sub, rc),
      C(SUB, 4, CMGetPredicateAt, &f.sub, idx, rc),
      C(SUB, 5, CMGetPredicate, &f.sub, kS1, rc),
      C(PRD, 3, CMGetPredicateData, &f.pred, &predType, &predOp, &lhs, &rhs),
      C(PRD, 4, CMEvaluatePredicateUsingAccessor, &f.pred, acc, parm, rc),
      C(ERR, 3, CMGetErrorType, &f.err, rc),
      C(ERR, 4, CMGetOtherErrorType, &f.err, rc),
      C(ERR, 5, CMGetOwningEntity, &f.err, rc),
      C(ERR, 6, CMGetMessageID, &f.err, rc),
      C(ERR, 7, CMGetErrorMessage, &f.err, rc),
      C(ERR, 8, CMGetPerceivedSeverity, &f.err, rc),
      C(ERR, 9, CMGetProbableCause, &f.err, rc),
      C(ERR, 10, CMGetProbableCauseDescription, &f.err, rc),
      C(ERR, 11, CMGetRecommendedActions, &f.err, rc),
      C(ERR, 12, CMGetErrorSource, &f.err, rc),
      C(ERR, 13, CMGetErrorSourceFormat, &f.err, rc),
      C(ERR, 14, CMGetOtherErrorSourceFormat, &f.err, rc),
      C(ERR, 15, CMGetCIMStatusCode, &f.err, rc),
      C(ERR, 16, CMGetCIMStatusCodeDescription, &f.err, rc),
      C(ERR, 17, CMGetMessageArguments, &f.err, rc),
      C(ERR, 18, CMSetErrorType, &f.err, OtherErrorType),
      C(ERR, 19, CMSetOtherErrorType, &f.err, kS1),
      C(ERR, 20, CMSetProbableCauseDescription, &f.err, kS1),
      C(ERR, 21, CMSetRecommendedActions, &f.err, &f.arr),
      C(ERR, 22, CMSetErrorSource, &f.err, kS1),
      C(ERR, 23, CMSetErrorSourceFormat, &f.err, CIMObjectHandle),
      C(ERR, 24, CMSetOtherErrorSourceFormat, &f.err, kS1),
      C(ERR, 25, CMSetCIMStatusCodeDescription, &f.err, kS1),
      C(ERR, 26, CMSetMessageArguments, &f.err, &f.arr)
  };
  for (const Case& c : cases) {
    const auto [returned, expected] = c.run();
    expectCall(c.macro, c.tab, c.slot, c.args);
    EXPECT_EQ(returned, expected) << c.macro << " lost the slot's return value";
  }
}

TEST_F(CmpiMacros, ReleaseCloneAndCharPtrUseTheCommonSlots) {
#define RC(TAB, obj) C(TAB, 1, CMRelease, obj), C(TAB, 2, CMClone, obj, rc)
  const Case cases[] = {RC(CTX, &f.ctx), RC(RES, &f.rslt), RC(STR, &f.str), RC(ARR, &f.arr),
                        RC(ENU, &f.en),  RC(INS, &f.inst), RC(OBP, &f.op),  RC(ARG, &f.args),
                        RC(DTM, &f.dt),  RC(SEL, &f.se),   RC(SCN, &f.sc),  RC(SUB, &f.sub),
                        RC(PRD, &f.pred), RC(ERR, &f.err)};
#undef RC
  for (const Case& c : cases) {
    const auto [returned, expected] = c.run();
    expectCall(c.macro, c.tab, c.slot, c.args);
    EXPECT_EQ(returned, expected) << c.macro;
  }
  // The string's characters come from getCharPtr, never from peeking at hdl.
  char* chars = CMGetCharPtr(&f.str);
  expectCall("CMGetCharPtr", STR, 3, words(&f.str, nullptr));
  EXPECT_EQ(chars, made<char*>(STR, 3));
  // Nested as in CMGetCharPtr(CMGetClassName(op, NULL)): one broker call, not two.
  int lookups = 0;
  auto lookup = [&] { return ++lookups, &f.str; };
  (void)CMGetCharPtr(lookup());
  (void)CMGetCharsPtr(lookup(), rc);
  EXPECT_EQ(lookups, 2);
  EXPECT_EQ(g_calls.size(), 2u);
  g_calls.clear();
  const CMPIString* missing = nullptr;  // a failed getClassName
  EXPECT_EQ(CMGetCharPtr(missing), nullptr);
  EXPECT_TRUE(g_calls.empty());
}

TEST_F(CmpiMacros, MessageMacrosPassCountThenTypedPairs) {
  CMPIString* s = CMGetMessage(&f.mb, kS1, kS2, rc,
                               CMFmtArgs5(CMFmtSint(-5), CMFmtUint(7u), CMFmtReal(2.5),
                                          CMFmtBoolean(yes), CMFmtChars(kS3)));
  EXPECT_EQ(s, made<CMPIString*>(EFT, 14));
  expectCall("CMGetMessage", EFT, 14,
             words(&f.mb, kS1, kS2, rc, 5, CMPI_sint32, -5L, CMPI_uint32, 7UL, CMPI_real64, 2.5,
                   CMPI_boolean, int{yes}, CMPI_chars, kS3));
  s = CMGetMessage2(&f.mb, kS1, fh, kS2, rc,
                    CMFmtArgs3(CMFmtSint64(-(1LL << 40)), CMFmtUint64(usec), CMFmtString(&f.str)));
  EXPECT_EQ(s, made<CMPIString*>(EFT, 20));
  expectCall("CMGetMessage2", EFT, 20,
             words(&f.mb, kS1, fh, kS2, rc, 3, CMPI_sint64, -(1LL << 40), CMPI_uint64, usec,
                   CMPI_string, &f.str));
  (void)CMGetMessage(&f.mb, kS1, kS2, nullptr, CMFmtArgs0());
  expectCall("CMGetMessage/CMFmtArgs0", EFT, 14, words(&f.mb, kS1, kS2, nullptr, 0));
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
  CMSetStatusWithString(none, CMPI_RC_ERR_FAILED, &f.str);
  CMSetStatusWithChars(&f.mb, none, CMPI_RC_ERR_FAILED, kS1);
  EXPECT_TRUE(g_calls.empty());
}

TEST_F(CmpiMacros, NullTestsAndBrokerFields) {
  CMPIInstance noHdl{nullptr, f.inst.ft};
  const CMPIInstance* absent = nullptr;
  EXPECT_TRUE(CMIsNullObject(absent));
  EXPECT_TRUE(CMIsNullObject(&noHdl));
  EXPECT_FALSE(CMIsNullObject(&f.inst));
  EXPECT_FALSE(CMIsNullObject(&f.mb));

  f.bft.brokerCapabilities = CMPI_MB_Supports_Extended_Error | CMPI_MB_Class_1;
  f.bft.brokerVersion = 200;
  f.bft.brokerName = "fake";
  EXPECT_EQ(CBGetBrokerCapabilities(&f.mb), 0x8003u);
  EXPECT_EQ(CBGetClassification(&f.mb), 0x8003u);
  EXPECT_EQ(CBBrokerVersion(&f.mb), 200u);
  EXPECT_STREQ(CBBrokerName(&f.mb), "fake");
  EXPECT_TRUE(g_calls.empty());
}

TEST_F(CmpiMacros, MacrosExpandTheSameWayInC) {
  const CMPIStatus s =
      ipif_cmpi_c_provider_flow(&f.mb, &f.ctx, &f.rslt, &f.op, &f.inst, &f.en);
  const std::vector<std::pair<int, int>> want = {
      {EFT, 1}, {OBP, 9}, {INS, 6}, {BFT, 13}, {ENU, 4}, {ENU, 3},
      {RES, 4}, {RES, 6}, {EFT, 4}};
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
