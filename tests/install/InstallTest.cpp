// `cmake --install` of the build into a scratch prefix, then the tree moved elsewhere and its
// ipif run from an unrelated directory: it must serve the providers from the moved tree alone,
// so neither a build path nor the install prefix may be compiled in.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <cstdlib>
#include <filesystem>
#include <string>

#include "TestFiles.h"

namespace {

struct Outcome {
    int exit = -1;
    std::string out;
};

// Runs a shell command with stdout and stderr in the result.
Outcome run(const testfiles::ScratchDir& dir, const std::string& command) {
    std::string log = dir.file("run.log");
    int status = std::system((command + " >" + log + " 2>&1").c_str());
    Outcome r;
    if (WIFEXITED(status)) r.exit = WEXITSTATUS(status);
    r.out = testfiles::readFile(log);
    return r;
}

TEST(Install, MovedTreeServesTheProvidersOnItsOwn) {
    testfiles::ScratchDir dir;
    const std::string staged = dir.file("staged"), moved = dir.file("moved");
    Outcome install = run(dir, std::string(IPIF_CMAKE_COMMAND) + " --install " IPIF_BINARY_DIR " --prefix " + staged +
                               " --component ipif");
    ASSERT_EQ(install.exit, 0) << install.out;
    std::filesystem::rename(staged, moved);

    const std::string data = moved + "/" IPIF_INSTALL_DATADIR "/", providers = moved + "/" IPIF_INSTALL_PROVIDERDIR "/";
    for (const std::string& f :
         {providers + "libIPInterfaceProvider.so", providers + "libIPInterfaceCompanion.so",
          data + "KVRNX_IPInterface.mof", data + "KVRNX_Companion.mof", data + "IPInterfaceProvider.reg",
          data + "IPInterfaceCompanion.reg", data + "embedded/CIM_Parents.mof",
          data + "pegasus/IPInterfaceProvider.mof", data + "pegasus/IPInterfaceCompanion.mof"})
        EXPECT_TRUE(testfiles::fileExists(f)) << f;

    const std::string ipif = "cd " + dir.path() +
                             " && env -u IPIF_MOF_DIR -u IPIF_REG -u IPIF_PROVIDER_PATH -u IPIF_SHARE_DIR "
                             "IPIF_HOST_MODEL=fixture:" IPIF_TEST_FIXTURES "/host-basic.model " +
                             moved + "/" IPIF_INSTALL_BINDIR "/ipif ein KVRNX_IPProtocolEndpoint";
    Outcome names = run(dir, ipif);
    EXPECT_EQ(names.exit, 0) << names.out;
    EXPECT_EQ(names.out.rfind("root/cimv2:KVRNX_IPProtocolEndpoint.", 0), 0u) << names.out;
    for (const char* nic : {"Name=\"eth0\"", "Name=\"eth1\""}) EXPECT_NE(names.out.find(nic), std::string::npos) << names.out;

    // What the moved tree lacks is missing: nothing falls back to the build's copies.
    std::filesystem::remove(providers + "libIPInterfaceProvider.so");
    Outcome noProvider = run(dir, ipif);
    EXPECT_NE(noProvider.exit, 0) << noProvider.out;
    EXPECT_NE(noProvider.out.find("libIPInterfaceProvider.so"), std::string::npos) << noProvider.out;
    std::filesystem::remove(data + "KVRNX_IPInterface.mof");
    Outcome noMof = run(dir, ipif);
    EXPECT_NE(noMof.exit, 0) << noMof.out;
    EXPECT_NE(noMof.out.find("KVRNX_IPProtocolEndpoint"), std::string::npos) << noMof.out;
}

}  // namespace
