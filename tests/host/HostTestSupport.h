// Shared by the host tests: a host over the test MOF, registrations and providers.
#pragma once

#include <string>

#include "ipif/Host.h"

inline ipif::HostOptions testHostOptions() {
    ipif::HostOptions o;
    o.mofPaths = {IPIF_HOST_TEST_DIR "/test.mof"};
    o.regPaths = {IPIF_HOST_TEST_DIR "/test.reg"};
    o.providerDirs = {IPIF_TEST_PROVIDER_DIR};
    return o;
}

inline ipif::ObjectPath widgetPath(const std::string& id) {
    ipif::ObjectPath p("root/cimv2", "IPIFTEST_Widget");
    p.keys.set("InstanceID", ipif::Value::string(id));
    return p;
}
