// The provider library as an object manager sees it: its dynamic symbols, factories and function
// tables, and the request dispatch driven through the embedded host.
#include <cmpidt.h>
#include <cmpift.h>
#include <dlfcn.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <set>
#include <sstream>
#include <string>
#include <thread>
#include <vector>
#include <atomic>

#include "TestFiles.h"
#include "ipif/Host.h"

namespace fs = std::filesystem;

namespace {

const std::string kLibrary = std::string(IPIF_BINARY_DIR) + "/libIPInterfaceProvider.so";

std::string slurp(const std::string& path) {
    std::ifstream in(path);
    std::stringstream s;
    s << in.rdbuf();
    return s.str();
}

std::vector<std::string> lines(const std::string& text) {
    std::vector<std::string> out;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) out.push_back(line);
    return out;
}

std::string run(const std::string& command) {
    std::string out;
    FILE* pipe = popen(command.c_str(), "r");
    if (!pipe) return out;
    char buffer[512];
    while (fgets(buffer, sizeof buffer, pipe)) out += buffer;
    pclose(pipe);
    return out;
}

// A scratch directory with a copy of a fixture host, a log file, and an extra class registered to
// the provider that its class registry does not know.
class ProviderRequests : public ::testing::Test {
protected:
    void SetUp() override {
        dir_ = fs::temp_directory_path() / ("ipif-entry-" + std::to_string(getpid()));
        fs::create_directories(dir_);
        fs::copy_file(std::string(IPIF_TEST_FIXTURES) + "/host-basic.model", dir_ / "host.model",
                      fs::copy_options::overwrite_existing);
        std::ofstream(dir_ / "extra.mof") << "class KVRNX_NotInRegistry { [Key] string Name; };\n";
        std::ofstream(dir_ / "extra.reg") << "[KVRNX_NotInRegistry]\n   provider: IPInterfaceProvider\n"
                                             "   location: IPInterfaceProvider\n"
                                             "   type: instance method\n   namespace: root/cimv2\n";
        log_ = (dir_ / "provider.log").string();
        setenv("IPIF_HOST_MODEL", ("fixture:" + (dir_ / "host.model").string()).c_str(), 1);
        setenv("IPIF_DATA_DIR", (dir_.string() + "/").c_str(), 1);
        setenv("IPIF_LOG_FILE", log_.c_str(), 1);
        setenv("IPIF_LOG_LEVEL", "3000", 1);
    }
    void TearDown() override {
        host_.reset();
        fs::remove_all(dir_);
    }
    ipif::Host& host() {
        if (!host_) {
            ipif::HostOptions options;
            options.mofPaths = testfiles::projectMofPaths();
            options.mofPaths.push_back((dir_ / "extra.mof").string());
            options.regPaths = {std::string(IPIF_SOURCE_DIR) + "/mof/IPInterfaceProvider.reg",
                                (dir_ / "extra.reg").string()};
            options.providerDirs = {IPIF_BINARY_DIR};
            host_ = std::make_unique<ipif::Host>(options);
        }
        return *host_;
    }
    ipif::ObjectPath path(const std::string& text) { return host().parsePath(text); }

    fs::path dir_;
    std::string log_;
    std::unique_ptr<ipif::Host> host_;
};

}  // namespace

TEST(ProviderLibrary, ExportsOnlyTheFactoriesAndTheDocumentedGlobals) {
    std::set<std::string> exported;
    for (const std::string& line : lines(run("nm -D --defined-only -C " + kLibrary))) {
        std::istringstream fields(line);
        std::string address, type, name;
        fields >> address >> type;
        std::getline(fields >> std::ws, name);
        if (!name.empty()) exported.insert(name);
    }
    const std::set<std::string> expected = {
        "IPInterfaceProvider_Create_InstanceMI",  "IPInterfaceProvider_Create_AssociationMI",
        "IPInterfaceProvider_Create_MethodMI",    "Nx::IPInterfaceProvider::broker",
        "Nx::IPInterfaceProvider::instMIFT__",    "Nx::IPInterfaceProvider::assocMIFT__",
        "Nx::IPInterfaceProvider::methMIFT__",    "Nx::IPInterfaceProvider::slpClassName",
        "Nx::IPInterfaceProvider::slpMethodName", "Nx::IPInterfaceProvider::slpNameSpace",
        "Nx::IPInterfaceProvider::COPYRIGHT",
    };
    EXPECT_EQ(exported, expected);
}

TEST(ProviderLibrary, FactoriesKeepTheLastBrokerAndReturnFixedRecords) {
    void* lib = dlopen(kLibrary.c_str(), RTLD_NOW | RTLD_LOCAL);
    ASSERT_NE(lib, nullptr) << dlerror();
    using InstFactory = CMPIInstanceMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
    using AssocFactory = CMPIAssociationMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
    using MethFactory = CMPIMethodMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
    auto inst = reinterpret_cast<InstFactory>(dlsym(lib, "IPInterfaceProvider_Create_InstanceMI"));
    auto assoc = reinterpret_cast<AssocFactory>(dlsym(lib, "IPInterfaceProvider_Create_AssociationMI"));
    auto meth = reinterpret_cast<MethFactory>(dlsym(lib, "IPInterfaceProvider_Create_MethodMI"));
    auto brokerGlobal = static_cast<const CMPIBroker**>(dlsym(lib, "_ZN2Nx19IPInterfaceProvider6brokerE"));
    ASSERT_TRUE(inst && assoc && meth && brokerGlobal);

    CMPIBroker a{}, b{}, c{};
    CMPIStatus untouched = {CMPI_RC_ERR_FAILED, nullptr};
    CMPIMethodMI* m = meth(&a, nullptr, &untouched);
    CMPIInstanceMI* i = inst(&c, nullptr, &untouched);
    CMPIAssociationMI* s = assoc(&b, nullptr, &untouched);
    EXPECT_EQ(*brokerGlobal, &b);
    EXPECT_EQ(inst(&a, nullptr, nullptr), i);  // one static record per table
    EXPECT_EQ(*brokerGlobal, &a);
    EXPECT_EQ(untouched.rc, CMPI_RC_ERR_FAILED);

    EXPECT_EQ(i->hdl, nullptr);
    EXPECT_STREQ(i->ft->miName, "instanceIPInterfaceProvider");
    EXPECT_STREQ(s->ft->miName, "associationIPInterfaceProvider");
    EXPECT_STREQ(m->ft->miName, "methodIPInterfaceProvider");
    EXPECT_EQ(i->ft->ftVersion, 200);
    EXPECT_EQ(i->ft->miVersion, 200);
    EXPECT_EQ(s->ft->ftVersion, 200);
    EXPECT_EQ(m->ft->miVersion, 200);
    EXPECT_EQ(i->ft->cleanup(i, nullptr, 1).rc, CMPI_RC_OK);
    EXPECT_EQ(s->ft->cleanup(s, nullptr, 0).rc, CMPI_RC_OK);
    EXPECT_EQ(m->ft->cleanup(m, nullptr, 1).rc, CMPI_RC_OK);
    dlclose(lib);
}

// Factories called again while requests run (an object manager loading another interface of the
// library) must not race with the requests' reads of the broker; the ThreadSanitizer build checks.
TEST_F(ProviderRequests, FactoriesRunningBesideRequestsDoNotRace) {
    const size_t endpoints = host().enumerateInstanceNames("root/cimv2", "KVRNX_IPProtocolEndpoint").paths.size();
    ASSERT_GT(endpoints, 0u);
    void* lib = dlopen(kLibrary.c_str(), RTLD_NOW | RTLD_NOLOAD);
    ASSERT_NE(lib, nullptr) << "the host loads the provider from " << kLibrary;
    using InstFactory = CMPIInstanceMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
    auto inst = reinterpret_cast<InstFactory>(dlsym(lib, "IPInterfaceProvider_Create_InstanceMI"));
    auto brokerGlobal = static_cast<const CMPIBroker**>(dlsym(lib, "_ZN2Nx19IPInterfaceProvider6brokerE"));
    ASSERT_TRUE(inst && brokerGlobal);
    const CMPIBroker* given = __atomic_load_n(brokerGlobal, __ATOMIC_ACQUIRE);
    ASSERT_NE(given, nullptr);

    std::atomic<int> served{0};
    std::vector<std::thread> requests;
    for (int t = 0; t < 2; ++t)
        requests.emplace_back([&] {
            for (int i = 0; i < 20; ++i)
                if (host().enumerateInstanceNames("root/cimv2", "KVRNX_IPProtocolEndpoint").paths.size() == endpoints) ++served;
        });
    for (int i = 0; i < 200; ++i) inst(given, nullptr, nullptr);
    for (auto& t : requests) t.join();
    EXPECT_EQ(served.load(), 40);
    EXPECT_EQ(__atomic_load_n(brokerGlobal, __ATOMIC_ACQUIRE), given);
    dlclose(lib);
}

TEST_F(ProviderRequests, RefusesWhatItDoesNotServeWithTheDocumentedCodes) {
    const ipif::ObjectPath unknown = path("KVRNX_NotInRegistry.Name=\"x\"");
    const ipif::ObjectPath endpoint = path(
        "KVRNX_IPProtocolEndpoint.Name=\"eth0\",CreationClassName=\"KVRNX_IPProtocolEndpoint\","
        "SystemName=\"x\",SystemCreationClassName=\"KVRNX_ComputerSystem\"");
    ipif::Instance instance;
    instance.path = unknown;

    EXPECT_EQ(host().getInstance(unknown).rc, CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(host().enumerateInstances("root/cimv2", "KVRNX_NotInRegistry").rc, CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(host().enumerateInstanceNames("root/cimv2", "KVRNX_NotInRegistry").rc, CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(host().modifyInstance(unknown, instance).rc, CMPI_RC_ERR_NOT_SUPPORTED);
    for (const ipif::ObjectPath& p : {unknown, endpoint}) {
        instance.path = p;
        EXPECT_EQ(host().createInstance(p, instance).rc, CMPI_RC_ERR_NOT_SUPPORTED);
        EXPECT_EQ(host().deleteInstance(p).rc, CMPI_RC_ERR_NOT_SUPPORTED);
        EXPECT_EQ(host().execQuery("root/cimv2", p.className, "SELECT * FROM " + p.className, "WQL").rc,
                  CMPI_RC_ERR_NOT_SUPPORTED);
    }
    EXPECT_EQ(host().getInstance(path("KVRNX_IPElementCapabilities")).rc, CMPI_RC_ERR_NOT_SUPPORTED);

    // Methods: a class other than the endpoint and the service answers 5 as status and as data.
    ipif::Result other = host().invokeMethod(unknown, "RequestStateChange", ipif::Args());
    EXPECT_EQ(other.rc, CMPI_RC_ERR_INVALID_CLASS);
    ASSERT_TRUE(other.hasReturnValue);
    EXPECT_EQ(other.returnValue.asUnsigned(), 5u);
}

TEST_F(ProviderRequests, GetWhoseKeysMatchNothingSucceedsEmpty) {
    ipif::Result none = host().getInstance(path(
        "KVRNX_IPProtocolEndpoint.Name=\"nosuch0\",CreationClassName=\"KVRNX_IPProtocolEndpoint\","
        "SystemName=\"x\",SystemCreationClassName=\"KVRNX_ComputerSystem\""));
    EXPECT_EQ(none.rc, CMPI_RC_OK);
    EXPECT_TRUE(none.instances.empty());
    EXPECT_TRUE(none.done);
}

TEST_F(ProviderRequests, LogShowsTheMarkersAndVariablesOfARequest) {
    ASSERT_TRUE(host().enumerateInstanceNames("root/cimv2", "KVRNX_IPProtocolEndpoint").ok());
    const std::vector<std::string> log = lines(testfiles::readLogTexts(log_));
    const std::string separator(78, '=');
    // The first records of the request: separator, entry marker, the class id.
    auto entry = std::find_if(log.begin(), log.end(), [](const std::string& l) {
        return l.rfind("ENTERING: IPInterface_EnumInstanceNames() in IPInterfaceProvider.cpp [Line: ", 0) == 0;
    });
    ASSERT_NE(entry, log.end()) << testfiles::readLogTexts(log_);
    ASSERT_NE(entry, log.begin());
    EXPECT_EQ(*(entry - 1), separator);
    ASSERT_NE(entry + 1, log.end());
    EXPECT_EQ((entry + 1)->rfind("VARIABLE: 'classId' has Value '9' at line ", 0), 0u) << *(entry + 1);
    EXPECT_NE((entry + 1)->find(" in IPInterfaceProvider.cpp"), std::string::npos);
    // The request ends with the exit marker and the separator.
    auto exit = std::find_if(entry, log.end(), [](const std::string& l) {
        return l.rfind("EXITING: IPInterface_EnumInstanceNames() in IPInterfaceProvider.cpp [Line: ", 0) == 0;
    });
    ASSERT_NE(exit, log.end());
    ASSERT_NE(exit + 1, log.end());
    EXPECT_EQ(*(exit + 1), separator);
    // Delete writes a single METHOD line and no markers.
    const size_t before = lines(testfiles::readLogTexts(log_)).size();
    host().deleteInstance(path("KVRNX_IPProtocolEndpoint"));
    const std::vector<std::string> after = lines(testfiles::readLogTexts(log_));
    ASSERT_EQ(after.size(), before + 1);
    EXPECT_EQ(after.back().rfind("METHOD: IPInterface_DeleteInstance() was invoked in IPInterfaceProvider.cpp [Line: ", 0),
              0u);
}

TEST_F(ProviderRequests, AnExceptionInAModelEndsTheEnumerationWithWhatWasProduced) {
    // The second endpoint's state cannot be read: the host errors on it.
    std::string model = slurp((dir_ / "host.model").string());
    std::vector<std::string> text = lines(model);
    int endpoints = 0;
    for (std::string& line : text) {
        if (line.find("node 29 ") != std::string::npos) ++endpoints;
        const auto at = line.find("123 unsigned");
        if (endpoints == 2 && at != std::string::npos) {
            line.insert(at, "failing ");
            break;
        }
    }
    std::ofstream out(dir_ / "host.model");
    for (const std::string& line : text) out << line << '\n';
    out.close();

    ipif::Result r = host().enumerateInstances("root/cimv2", "KVRNX_IPProtocolEndpoint");
    EXPECT_EQ(r.rc, CMPI_RC_OK);
    EXPECT_EQ(r.instances.size(), 1u);
    EXPECT_FALSE(r.done);  // no end-of-results signal after an exception
    const std::string log = testfiles::readLogTexts(log_);
    EXPECT_NE(log.find("MESSAGE [File: IPInterfaceProvider.cpp, Line: "), std::string::npos);
    EXPECT_NE(log.find("could not be read from the host"), std::string::npos);
}
