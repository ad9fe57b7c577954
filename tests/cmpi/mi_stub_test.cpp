// The MI stub macros as a provider uses them: built with hidden visibility
// (like the provider library), the factories must still be exported under
// their plain C names, and every table slot must hold the right function.
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <gtest/gtest.h>

#include <dlfcn.h>

#include <cstdint>
#include <cstring>
#include <vector>

#include "abi_slots.h"

namespace {

const CMPIBroker* g_broker = nullptr;
const CMPIContext* g_hookCtx = nullptr;
const CMPIBroker* g_hookBroker = nullptr;
int g_hookRuns = 0;

#define OK_STATUS CMReturn(CMPI_RC_OK)

// clang-format off
CMPIStatus Ipif_Cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) { OK_STATUS; }
CMPIStatus Ipif_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) { OK_STATUS; }
CMPIStatus Ipif_EnumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char**) { OK_STATUS; }
CMPIStatus Ipif_GetInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char**) { OK_STATUS; }
CMPIStatus Ipif_CreateInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const CMPIInstance*) { OK_STATUS; }
CMPIStatus Ipif_ModifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const CMPIInstance*, const char**) { OK_STATUS; }
CMPIStatus Ipif_DeleteInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) { OK_STATUS; }
CMPIStatus Ipif_ExecQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*) { OK_STATUS; }
CMPIStatus Ipif_AssociationCleanup(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) { OK_STATUS; }
CMPIStatus Ipif_Associators(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*, const char*, const char*, const char**) { OK_STATUS; }
CMPIStatus Ipif_AssociatorNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*, const char*, const char*) { OK_STATUS; }
CMPIStatus Ipif_References(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*, const char**) { OK_STATUS; }
CMPIStatus Ipif_ReferenceNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const char*) { OK_STATUS; }
CMPIStatus Ipif_MethodCleanup(CMPIMethodMI*, const CMPIContext*, CMPIBoolean) { OK_STATUS; }
CMPIStatus Ipif_InvokeMethod(CMPIMethodMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const CMPIArgs*, CMPIArgs*) { OK_STATUS; }
CMPIStatus Ipif_PropertyCleanup(CMPIPropertyMI*, const CMPIContext*, CMPIBoolean) { OK_STATUS; }
CMPIStatus Ipif_SetProperty(CMPIPropertyMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*, const CMPIData) { OK_STATUS; }
CMPIStatus Ipif_GetProperty(CMPIPropertyMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*) { OK_STATUS; }
CMPIStatus Ipif_IndicationCleanup(CMPIIndicationMI*, const CMPIContext*, CMPIBoolean) { OK_STATUS; }
CMPIStatus Ipif_AuthorizeFilter(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*, const char*, const CMPIObjectPath*, const char*) { OK_STATUS; }
CMPIStatus Ipif_MustPoll(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*, const char*, const CMPIObjectPath*) { OK_STATUS; }
CMPIStatus Ipif_ActivateFilter(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*, const char*, const CMPIObjectPath*, CMPIBoolean) { OK_STATUS; }
CMPIStatus Ipif_DeActivateFilter(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*, const char*, const CMPIObjectPath*, CMPIBoolean) { OK_STATUS; }
CMPIStatus Ipif_EnableIndications(CMPIIndicationMI*, const CMPIContext*) { OK_STATUS; }
CMPIStatus Ipif_DisableIndications(CMPIIndicationMI*, const CMPIContext*) { OK_STATUS; }
// clang-format on

}  // namespace

CMInstanceMIStub(Ipif_, IpifTest, g_broker, (g_hookCtx = ctx, g_hookBroker = g_broker, ++g_hookRuns))
CMAssociationMIStub(Ipif_, IpifTest, g_broker, CMNoHook)
CMMethodMIStub(Ipif_, IpifTest, g_broker, CMNoHook)
CMPropertyMIStub(Ipif_, IpifTest, g_broker, CMNoHook)
CMIndicationMIStub(Ipif_, IpifTest, g_broker, ++g_hookRuns)

namespace {

using namespace cmpitest;

template <class F>
std::uintptr_t addr(F fn) {
  return reinterpret_cast<std::uintptr_t>(fn);
}

// Function pointer stored at published slot k of an MI table.
std::uintptr_t slotAt(const void* table, std::size_t k) {
  void (*fn)() = nullptr;
  std::memcpy(&fn, static_cast<const unsigned char*>(table) + slotOffset(kTwoIntsAndName, k),
              sizeof fn);
  return addr(fn);
}

struct Factory {
  const char* symbol;
  std::uintptr_t address;
  const void* (*create)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
  const char* miName;
  std::vector<std::uintptr_t> slots;  // slot 3 (cleanup) onwards; 0 = must be NULL
};

template <class MI, MI* (*F)(const CMPIBroker*, const CMPIContext*, CMPIStatus*)>
const void* createTable(const CMPIBroker* b, const CMPIContext* c, CMPIStatus* rc) {
  MI* mi = F(b, c, rc);
  EXPECT_EQ(mi->hdl, nullptr);
  return mi->ft;
}

TEST(CmpiMiStubs, FactoriesAreExportedAndFillEverySlot) {
  const Factory factories[] = {
      {"IpifTest_Create_InstanceMI", addr(&IpifTest_Create_InstanceMI),
       &createTable<CMPIInstanceMI, &IpifTest_Create_InstanceMI>, "instanceIpifTest",
       {addr(&Ipif_Cleanup), addr(&Ipif_EnumInstanceNames), addr(&Ipif_EnumInstances),
        addr(&Ipif_GetInstance), addr(&Ipif_CreateInstance), addr(&Ipif_ModifyInstance),
        addr(&Ipif_DeleteInstance), addr(&Ipif_ExecQuery)}},
      {"IpifTest_Create_AssociationMI", addr(&IpifTest_Create_AssociationMI),
       &createTable<CMPIAssociationMI, &IpifTest_Create_AssociationMI>, "associationIpifTest",
       {addr(&Ipif_AssociationCleanup), addr(&Ipif_Associators), addr(&Ipif_AssociatorNames),
        addr(&Ipif_References), addr(&Ipif_ReferenceNames)}},
      {"IpifTest_Create_MethodMI", addr(&IpifTest_Create_MethodMI),
       &createTable<CMPIMethodMI, &IpifTest_Create_MethodMI>, "methodIpifTest",
       {addr(&Ipif_MethodCleanup), addr(&Ipif_InvokeMethod)}},
      {"IpifTest_Create_PropertyMI", addr(&IpifTest_Create_PropertyMI),
       &createTable<CMPIPropertyMI, &IpifTest_Create_PropertyMI>, "propertyIpifTest",
       {addr(&Ipif_PropertyCleanup), addr(&Ipif_SetProperty), addr(&Ipif_GetProperty), 0}},
      {"IpifTest_Create_IndicationMI", addr(&IpifTest_Create_IndicationMI),
       &createTable<CMPIIndicationMI, &IpifTest_Create_IndicationMI>, "IndicationIpifTest",
       {addr(&Ipif_IndicationCleanup), addr(&Ipif_AuthorizeFilter), addr(&Ipif_MustPoll),
        addr(&Ipif_ActivateFilter), addr(&Ipif_DeActivateFilter), addr(&Ipif_EnableIndications),
        addr(&Ipif_DisableIndications)}},
  };
  const CMPIBroker broker{};
  const CMPIContext ctx{};
  CMPIString marker{};
  for (const Factory& f : factories) {
    SCOPED_TRACE(f.symbol);
    // A broker finds the factory by its plain name even though this file is
    // compiled with -fvisibility=hidden.
    EXPECT_EQ(addr(dlsym(RTLD_DEFAULT, f.symbol)), f.address);

    g_broker = nullptr;
    CMPIStatus rc{CMPI_RC_ERR_NOT_FOUND, &marker};  // the factory must leave it alone
    const void* table = f.create(&broker, &ctx, &rc);
    EXPECT_EQ(g_broker, &broker);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(rc.msg, &marker);

    // Leading fields are identical in every MI table: ftVersion, miVersion, miName.
    const auto* lead = static_cast<const CMPIMethodMIFT*>(table);
    EXPECT_EQ(lead->ftVersion, 200);
    EXPECT_EQ(lead->miVersion, 200);
    EXPECT_STREQ(lead->miName, f.miName);
    for (std::size_t i = 0; i < f.slots.size(); ++i)
      EXPECT_EQ(slotAt(table, 3 + i), f.slots[i]) << "slot " << 3 + i;
  }
}

TEST(CmpiMiStubs, HookRunsAfterTheBrokerIsStored) {
  const CMPIBroker broker{};
  const CMPIContext ctx{};
  CMPIStatus rc{CMPI_RC_OK, nullptr};
  g_hookRuns = 0;
  g_hookCtx = nullptr;
  g_hookBroker = nullptr;
  CMPIInstanceMI* mi = IpifTest_Create_InstanceMI(&broker, &ctx, &rc);
  EXPECT_EQ(g_hookRuns, 1);
  EXPECT_EQ(g_hookCtx, &ctx);        // the hook sees the factory's context
  EXPECT_EQ(g_hookBroker, &broker);  // ...and the broker already stored
  // The handle is static: a second load returns the same MI.
  EXPECT_EQ(IpifTest_Create_InstanceMI(&broker, &ctx, &rc), mi);
  (void)IpifTest_Create_MethodMI(&broker, &ctx, &rc);
  EXPECT_EQ(g_hookRuns, 2);  // CMNoHook adds nothing
  (void)IpifTest_Create_IndicationMI(&broker, &ctx, &rc);
  EXPECT_EQ(g_hookRuns, 3);
}

}  // namespace
