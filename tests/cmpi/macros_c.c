/* A provider-shaped sequence of macros compiled as C99 -pedantic; the C++
 * round-trip test runs it against the fake broker and checks the slots hit. */
#include <cmpimacs.h>

CMPIStatus ipif_cmpi_c_provider_flow(const CMPIBroker* mb, const CMPIContext* ctx,
                                     const CMPIResult* rslt, CMPIObjectPath* op,
                                     CMPIInstance* inst, CMPIEnumeration* en);

CMPIStatus ipif_cmpi_c_provider_flow(const CMPIBroker* mb, const CMPIContext* ctx,
                                     const CMPIResult* rslt, CMPIObjectPath* op,
                                     CMPIInstance* inst, CMPIEnumeration* en) {
  CMPIStatus st = {CMPI_RC_OK, NULL};
  CMPIUint16 mtu = 1500;
  const char* props[] = {"Name", NULL};

  (void)CMNewInstance(mb, op, &st);
  CMAddKey(op, "Name", "eth0", CMPI_chars);
  CMSetProperty(inst, "MTU", &mtu, CMPI_uint16);
  (void)CBEnumInstances(mb, ctx, op, props, &st);
  if (CMHasNext(en, &st)) {
    CMPIData d = CMGetNext(en, &st);
    (void)d;
  }
  if (CMIsNullObject(inst))
    CMReturn(CMPI_RC_ERR_FAILED);
  else
    CMReturnInstance(rslt, inst);
  CMSetStatus(&st, CMPI_RC_OK);
  CMReturnDone(rslt);
  CMReturnWithChars(mb, CMPI_RC_ERR_NOT_FOUND, "gone");
}
