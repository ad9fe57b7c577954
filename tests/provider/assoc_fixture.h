// Set-up of the association tests: the built provider and its companion (which serves the computer
// systems and LAN endpoints at the far ends) loaded by the embedded host over a scratch copy of
// tests/fixtures/host-basic.model, with the log captured.
//
// Objects are written in a short form, both to build request paths and to compare results:
//   EP:eth0  ASD:Computer%eth0%static  ST:Computer%eth0  SAP:eth0_IPv4  CAPS:eth0  LAN:eth0
//   CS (the host)  SP (the service processor)  SVC (the configuration service)
// Endpoints, gateways and LAN endpoints of the service processor read "EP:usb0/BMC"; a system
// name that is neither the host's nor the service processor's is appended as "/<name>".
#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "TestFiles.h"
#include "ipif/Host.h"
#include "models_fixture.h"

namespace assoctest {

const std::string kSource = IPIF_SOURCE_DIR;
// The short form kinds and their classes.
const std::vector<std::pair<std::string, std::string>> kKinds = {
    {"EP", "KVRNX_IPProtocolEndpoint"},
    {"SAP", "KVRNX_IPRemoteServiceAccessPoint"},
    {"LAN", "KVRNX_LANEndpoint"},
    {"ASD", "KVRNX_IPAssignmentSettingData"},
    {"ST", "KVRNX_StaticIPAssignmentSettingData"},
    {"CAPS", "KVRNX_IPEnabledLogicalElementCapabilities"},
    {"CS", "KVRNX_ComputerSystem"},
    {"SP", "KVRNX_SPComputerSystem"},
    {"SVC", "KVRNX_IPConfigurationService"}};

class AssocTest : public ::testing::Test {
protected:
    AssocTest() { std::filesystem::copy_file(std::string(IPIF_TEST_FIXTURES) + "/host-basic.model", model); }

    // The host, built on first use. Without the companion, only this provider is registered.
    ipif::Host& host(bool companion = true) {
        if (!host_) {
            ipif::HostOptions options;
            options.mofPaths = testfiles::projectMofPaths();
            options.regPaths = {kSource + "/mof/IPInterfaceProvider.reg"};
            if (companion) options.regPaths.push_back(kSource + "/mof/IPInterfaceCompanion.reg");
            options.providerDirs = {IPIF_BINARY_DIR};
            host_ = std::make_unique<ipif::Host>(options);
        }
        return *host_;
    }

    static std::string classOf(const std::string& kind) {
        for (const auto& [k, cls] : kKinds)
            if (k == kind) return cls;
        return "";
    }
    std::string systemOf(const std::string& name) const { return name == "usb0" ? "BMC:-1" : hostName; }
    std::string systemClassOf(const std::string& name) const {
        return name == "usb0" ? "KVRNX_SPComputerSystem" : "KVRNX_ComputerSystem";
    }

    // The request path of a short form; anything else is taken as path text (a bare class name
    // gives the keyless class path).
    ipif::ObjectPath path(const std::string& form) {
        const auto colon = form.find(':');
        const std::string kind = form.substr(0, colon), cls = classOf(kind);
        std::string arg = colon == std::string::npos ? "" : form.substr(colon + 1);
        if (arg.size() > 4 && arg.compare(arg.size() - 4, 4, "/BMC") == 0) arg.resize(arg.size() - 4);
        const auto q = [](const std::string& v) { return ipif::quote(v); };
        const std::string iface = arg.substr(0, arg.find('_'));
        std::string text = form;
        if (kind == "EP" || kind == "SAP" || kind == "LAN")
            text = cls + ".SystemCreationClassName=" + q(kind == "LAN" ? classOf("CS") : systemClassOf(iface)) +
                   ",SystemName=" + q(systemOf(iface)) + ",CreationClassName=" + q(cls) + ",Name=" + q(arg);
        else if (kind == "ASD" || kind == "ST" || kind == "CAPS")
            text = cls + ".InstanceID=" + q(arg);
        else if (kind == "CS" || kind == "SP")
            text = cls + ".CreationClassName=" + q(cls) + ",Name=" + q(kind == "CS" ? hostName : "BMC:-1");
        else if (kind == "SVC")
            text = cls + ".SystemCreationClassName=\"KVRNX_ComputerSystem\",SystemName=" + q(hostName) +
                   ",CreationClassName=" + q(cls) + ",Name=\"IPConfigService\"";
        return host().parsePath(text);
    }

    // The short form of a result path; a system that is not the expected one shows as "/<name>".
    std::string shortForm(const ipif::ObjectPath& p) const {
        std::string kind;
        for (const auto& [k, cls] : kKinds)
            if (ipif::equalsIgnoreCase(cls, p.className)) kind = k;
        if (kind.empty()) return p.className;
        const auto text = [&](const char* key) {
            const ipif::Value* v = p.keys.find(key);
            return v && !v->isNull() ? v->asString() : std::string("?");
        };
        if (kind == "ASD" || kind == "ST" || kind == "CAPS") return kind + ":" + text("InstanceID");
        if (kind == "CS" || kind == "SP") {
            const std::string expected = kind == "CS" ? hostName : "BMC:-1";
            return text("Name") == expected ? kind : kind + "/" + text("Name");
        }
        const std::string form = kind == "SVC" ? kind : kind + ":" + text("Name"), system = text("SystemName");
        if (system == "BMC:-1") return form + "/BMC";
        return system == hostName ? form : form + "/" + system;
    }
    std::string shortForm(const ipif::Instance& i) const { return shortForm(i.path); }
    template <class T>
    std::vector<std::string> shortForms(const std::vector<T>& items) const {
        std::vector<std::string> forms;
        for (const T& item : items) forms.push_back(shortForm(item));
        return forms;
    }

    size_t logged(const std::string& text) const {
        const std::string all = log();
        size_t count = 0;
        for (size_t at = all.find(text); at != std::string::npos; at = all.find(text, at + 1)) ++count;
        return count;
    }
    std::string log() const { return testfiles::readLogTexts(scratch.file("log")); }

    testfiles::ScratchDir scratch;
    const std::string model = scratch.file("host.model");
    testfiles::ScopedEnv hostModelEnv{"IPIF_HOST_MODEL", "fixture:" + model};
    testfiles::ScopedEnv dataDirEnv{"IPIF_DATA_DIR", scratch.path() + "/"};
    testfiles::ScopedEnv logFileEnv{"IPIF_LOG_FILE", scratch.file("log")};
    testfiles::ScopedEnv logLevelEnv{"IPIF_LOG_LEVEL", "3000"};
    const std::string hostName = modeltest::hostName();
    std::unique_ptr<ipif::Host> host_;
};

}  // namespace assoctest
