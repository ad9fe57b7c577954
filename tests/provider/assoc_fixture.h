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

#include <cctype>
#include <filesystem>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "TestFiles.h"
#include "ipif/Host.h"
#include "models_fixture.h"

namespace assoctest {

const std::string kSource = IPIF_SOURCE_DIR;

class AssocTest : public ::testing::Test {
protected:
    AssocTest() { std::filesystem::copy_file(std::string(IPIF_TEST_FIXTURES) + "/host-basic.model", model); }

    // The host, built on first use. Without the companion, only this provider is registered.
    ipif::Host& host(bool companion = true) {
        if (!host_) {
            ipif::HostOptions options;
            options.mofPaths = {kSource + "/mof"};
            options.regPaths = {kSource + "/mof/IPInterfaceProvider.reg"};
            if (companion) options.regPaths.push_back(kSource + "/mof/IPInterfaceCompanion.reg");
            options.providerDirs = {IPIF_BINARY_DIR};
            host_ = std::make_unique<ipif::Host>(options);
        }
        return *host_;
    }

    std::string systemOf(const std::string& name) const { return name == "usb0" ? "BMC:-1" : hostName; }
    std::string systemClassOf(const std::string& name) const {
        return name == "usb0" ? "KVRNX_SPComputerSystem" : "KVRNX_ComputerSystem";
    }

    // The request path of a short form; a bare class name gives the keyless class path.
    ipif::ObjectPath path(const std::string& form) {
        const auto colon = form.find(':');
        const std::string kind = form.substr(0, colon);
        std::string arg = colon == std::string::npos ? "" : form.substr(colon + 1);
        if (arg.size() > 4 && arg.compare(arg.size() - 4, 4, "/BMC") == 0) arg.resize(arg.size() - 4);
        const auto q = [](const std::string& v) { return ipif::quote(v); };
        std::string text;
        if (kind == "EP" || kind == "SAP" || kind == "LAN") {
            const std::string cls = kind == "EP"    ? "KVRNX_IPProtocolEndpoint"
                                    : kind == "SAP" ? "KVRNX_IPRemoteServiceAccessPoint"
                                                    : "KVRNX_LANEndpoint";
            const std::string iface = arg.substr(0, arg.find('_'));
            text = cls +
                   ".SystemCreationClassName=" + q(kind == "LAN" ? "KVRNX_ComputerSystem" : systemClassOf(iface)) +
                   ",SystemName=" + q(systemOf(iface)) + ",CreationClassName=" + q(cls) + ",Name=" + q(arg);
        } else if (kind == "ASD" || kind == "ST" || kind == "CAPS") {
            text = std::string(kind == "ASD"  ? "KVRNX_IPAssignmentSettingData"
                               : kind == "ST" ? "KVRNX_StaticIPAssignmentSettingData"
                                              : "KVRNX_IPEnabledLogicalElementCapabilities") +
                   ".InstanceID=" + q(arg);
        } else if (kind == "CS") {
            text = "KVRNX_ComputerSystem.CreationClassName=\"KVRNX_ComputerSystem\",Name=" + q(hostName);
        } else if (kind == "SP") {
            text = "KVRNX_SPComputerSystem.CreationClassName=\"KVRNX_SPComputerSystem\",Name=\"BMC:-1\"";
        } else if (kind == "SVC") {
            text = "KVRNX_IPConfigurationService.SystemCreationClassName=\"KVRNX_ComputerSystem\",SystemName=" +
                   q(hostName) + ",CreationClassName=\"KVRNX_IPConfigurationService\",Name=\"IPConfigService\"";
        } else {
            text = form;
        }
        return host().parsePath(text);
    }

    // The short form of a result path.
    std::string shortForm(const ipif::ObjectPath& p) const {
        static const std::map<std::string, std::string> kinds = {{"kvrnx_ipprotocolendpoint", "EP"},
                                                                 {"kvrnx_ipassignmentsettingdata", "ASD"},
                                                                 {"kvrnx_staticipassignmentsettingdata", "ST"},
                                                                 {"kvrnx_ipremoteserviceaccesspoint", "SAP"},
                                                                 {"kvrnx_ipenabledlogicalelementcapabilities", "CAPS"},
                                                                 {"kvrnx_lanendpoint", "LAN"},
                                                                 {"kvrnx_computersystem", "CS"},
                                                                 {"kvrnx_spcomputersystem", "SP"},
                                                                 {"kvrnx_ipconfigurationservice", "SVC"}};
        std::string cls;
        for (char c : p.className) cls += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        auto kind = kinds.find(cls);
        if (kind == kinds.end()) return p.className;
        const auto text = [&](const char* key) {
            const ipif::Value* v = p.keys.find(key);
            return v && !v->isNull() ? v->asString() : std::string("?");
        };
        if (kind->second == "ASD" || kind->second == "ST" || kind->second == "CAPS")
            return kind->second + ":" + text("InstanceID");
        if (kind->second == "CS") return text("Name") == hostName ? "CS" : "CS/" + text("Name");
        if (kind->second == "SP") return text("Name") == "BMC:-1" ? "SP" : "SP/" + text("Name");
        std::string form = kind->second == "SVC" ? "SVC" : kind->second + ":" + text("Name");
        const std::string system = text("SystemName");
        if (system == "BMC:-1") return form + "/BMC";
        return system == hostName ? form : form + "/" + system;
    }

    std::vector<std::string> shortForms(const std::vector<ipif::ObjectPath>& paths) const {
        std::vector<std::string> forms;
        for (const auto& p : paths) forms.push_back(shortForm(p));
        return forms;
    }
    std::vector<std::string> shortForms(const std::vector<ipif::Instance>& instances) const {
        std::vector<std::string> forms;
        for (const auto& i : instances) forms.push_back(shortForm(i.path));
        return forms;
    }

    size_t logged(const std::string& text) const {
        const std::string all = testfiles::readFile(scratch.file("log"));
        size_t count = 0;
        for (size_t at = all.find(text); at != std::string::npos; at = all.find(text, at + 1)) ++count;
        return count;
    }
    std::string log() const { return testfiles::readFile(scratch.file("log")); }

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
