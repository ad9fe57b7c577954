#include "CMPI/CMPIProtocolEndpoint.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerCMPIProtocolEndpoint = "Tarvo.IPInterfaceProvider";

CMPIProtocolEndpoint::CMPIProtocolEndpoint(const CMPIBroker* broker, const CMPIContext* context,
                                           const std::string& nameSpace)
    : CMPIAdapter(broker, context, nameSpace, loggerCMPIProtocolEndpoint, NX_FILE, __func__) {}

CMPIProtocolEndpoint::CMPIProtocolEndpoint(const CMPIBroker* broker, const CMPIContext* context,
                                           const CMPIObjectPath* path)
    : CMPIAdapter(broker, context, path, loggerCMPIProtocolEndpoint, NX_FILE) {
    constructedAt(__func__, path, [&] { setObjectPath(path); });
}

// The class keys are ours by construction; only system and interface name select.
void CMPIProtocolEndpoint::setObjectPath(const CMPIObjectPath* path) {
    filterByKeys(__func__, TraceParams(" objectPath=", path), path,
                 {{"SystemName", IPprotocolEndpoint::FilterType::BySystemName},
                  {"Name", IPprotocolEndpoint::FilterType::ByName}});
}

CMPIObjectPath* CMPIProtocolEndpoint::getObjectPath() {
    return objectPath(__func__, "KVRNX_IPProtocolEndpoint", [this](CMPIObjectPath* path) {
        copyKey(path, "Name", &IPprotocolEndpoint::getName);
        copyKey(path, "CreationClassName", &IPprotocolEndpoint::getCreationClassName);
        copyKey(path, "SystemName", &IPprotocolEndpoint::getSystemName);
        copyKey(path, "SystemCreationClassName", &IPprotocolEndpoint::getSystemCreationClassName);
    });
}

CMPIInstance* CMPIProtocolEndpoint::getCMPIInstance(const char** properties) {
    // The property list is the object manager's to apply; every property is offered.
    return instanceOf(__func__, properties, nullptr, this, [this, function = __func__](CMPIInstance* instance) {
        using M = IPprotocolEndpoint;
        copyProperty<std::string>(instance, "ElementName", &M::getElementName);
        copyProperty<std::string>(instance, "Description", &M::getDescription);
        copyProperty<std::string>(instance, "IPv4Address", &M::getIPv4Address);
        copyProperty<std::string>(instance, "IPv6Address", &M::getIPv6Address);
        copyProperty<std::string>(instance, "SubnetMask", &M::getSubnetMask);
        // The class declares PrefixLength uint8; the host reports a wider number.
        copyProperty<unsigned int, unsigned char>(instance, "PrefixLength", &M::getPrefixLength);
        copyProperty<unsigned short>(instance, "IPv6SubnetPrefixLength", &M::getIPv6SubnetPrefixLength);
        copyProperty<unsigned short>(instance, "AddressType", &M::getAddressType);
        copyProperty<unsigned short>(instance, "IPv6AddressType", &M::getIPv6AddressType);
        copyProperty<unsigned short>(instance, "IPVersionSupport", &M::getIPVersionSupport);
        copyProperty<unsigned short>(instance, "ProtocolIFType", &M::getProtocolIFType);
        copyProperty<unsigned short>(instance, "EnabledState", &M::getEnabledState);
        copyProperty<unsigned short>(instance, "RequestedState", &M::getRequestedState);
        unsigned short origin = 0;
        if (model.getAddressOrigin(origin)) {
            tracer.variable(function, __LINE__, "IPOrigin in u16", static_cast<unsigned>(origin));
            ProviderUtilities::setProperty(instance, "AddressOrigin", origin);
        }
        copyProperty<std::string>(instance, "SystemCreationClassName", &M::getSystemCreationClassName);
        copyProperty<std::string>(instance, "SystemName", &M::getSystemName);
        copyProperty<std::string>(instance, "CreationClassName", &M::getCreationClassName);
        copyProperty<std::string>(instance, "Name", &M::getName);
        copyProperty<std::string>(instance, "NameFormat", &M::getNameFormat);
    });
}

CMPIStatus CMPIProtocolEndpoint::modifyInstance(const CMPIInstance* newInstance) {
    const TraceParams params(" newInstance=", newInstance);
    NX_ENTER_PARAMS(loggerCMPIProtocolEndpoint, params.c_str());
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIObjectPath* path = newInstance ? CMGetObjectPath(newInstance, nullptr) : nullptr;
    if (path) {
        setObjectPath(path);
        NX_VAR(loggerCMPIProtocolEndpoint, "objstring", ProviderUtilities::toString(broker, path).c_str());
    }
    // Each accepted value is applied at once; a later rejection does not undo an earlier write.
    unsigned short origin = 0;
    if (ProviderUtilities::getProperty(newInstance, "AddressOrigin", origin)) {
        NX_VAR(loggerCMPIProtocolEndpoint, "AddressOrigin", static_cast<unsigned>(origin));
        model.setAddressOrigin(origin);
    }
    std::string address;
    if (ProviderUtilities::getProperty(newInstance, "IPv4Address", address)) {
        NX_VAR(loggerCMPIProtocolEndpoint, "IPv4Address:", address.c_str());
        if (ProviderUtilities::ValidateInput(address, "") == 0) {
            status = refuseProperty("IPv4Address");
        } else {
            model.setIPv4Address(address);
        }
    }
    std::string mask;
    if (status.rc == CMPI_RC_OK && ProviderUtilities::getProperty(newInstance, "SubnetMask", mask)) {
        NX_VAR(loggerCMPIProtocolEndpoint, "SubnetMask:", mask.c_str());
        if (ProviderUtilities::ValidateInput(mask, "") == 0) {
            status = refuseProperty("SubnetMask");
        } else {
            model.setSubnetMask(mask);
        }
    }
    NX_EXIT_PARAMS(loggerCMPIProtocolEndpoint, params.c_str());
    return status;
}

CMPIUint32 CMPIProtocolEndpoint::executeMethod(const CMPIArgs* in, CMPIArgs* out, CMPIStatus* status) {
    NX_METHOD(loggerCMPIProtocolEndpoint);
    const auto refuse = [&](CMPIrc rc, const char* text) -> CMPIUint32 {
        if (status) *status = makeStatus(rc, text);
        return 4;
    };

    const CMPIData requested = argument(in, "RequestedState");
    if (requested.type != CMPI_uint16) return refuse(CMPI_RC_ERR_INVALID_PARAMETER, "Invalid Type of Parameter");
    // Only its type matters: the state change is made at once.
    const CMPIData timeout = argument(in, "TimeoutPeriod");
    if (timeout.type != CMPI_dateTime)
        return refuse(CMPI_RC_ERR_INVALID_PARAMETER, "Invalid Type of TimeOut Parameter");

    const unsigned short state = (requested.state & CMPI_nullValue) ? 0 : requested.value.uint16;
    NX_VAR(loggerCMPIProtocolEndpoint, "RequestedState", static_cast<unsigned>(state));
    if (state != 2 && state != 3 && state != 11)
        return refuse(CMPI_RC_ERR_FAILED, "Invalid Value of RequestedState Parameter");
    // Clients have always been told this text when the host refuses the change.
    if (!model.setEnabledState(state)) return refuse(CMPI_RC_ERR_FAILED, "Invalid Type of TimeOut Parameter");

    NX_MESSAGE(loggerCMPIProtocolEndpoint, 3000, "Calling CMNewObjectPath for ConcreteJob");
    if (returnJob(out)) NX_MESSAGE(loggerCMPIProtocolEndpoint, 3000, "Job Created Successfully");
    return 0;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
