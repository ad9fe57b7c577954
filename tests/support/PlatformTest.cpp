#include "Nx/PlatformUtilities.h"
#include "SupportTestUtil.h"

#include <fstream>

using namespace supporttest;
using Nx::PlatformUtilities;

TEST(PlatformUtilities, DataDirectoryAndHostPaths) {
    {
        ScopedEnv data("IPIF_DATA_DIR", "/tmp/ifcfg");
        EXPECT_EQ(PlatformUtilities::getMerrowDataDir(), "/tmp/ifcfg/");
    }
    {
        ScopedEnv data("IPIF_DATA_DIR", "");
        ScopedEnv root("IPIF_ROOT", "/srv/host/");
        EXPECT_EQ(PlatformUtilities::getMerrowDataDir(), "/srv/host/etc/sysconfig/network-scripts/");
        EXPECT_EQ(PlatformUtilities::hostPath("/etc/resolv.conf"), "/srv/host/etc/resolv.conf");
    }
    {
        ScopedEnv data("IPIF_DATA_DIR", "");
        ScopedEnv root("IPIF_ROOT", "/");
        EXPECT_EQ(PlatformUtilities::getMerrowDataDir(), "/etc/sysconfig/network-scripts/");
        EXPECT_EQ(PlatformUtilities::hostPath("/etc/vmware-release"), "/etc/vmware-release");
    }
}

TEST(PlatformUtilities, CommandSeamRecordsRefusesOrDelegates) {
    ScratchDir dir;
    const std::string record = dir.file("commands");
    const std::string witness = dir.file("witness");
    std::string output = "stale";
    {
        ScopedEnv mode("IPIF_COMMANDS", "record:" + record);
        EXPECT_TRUE(PlatformUtilities::runCommand("/etc/init.d/network restart ", output));
        EXPECT_EQ(output, "");
        EXPECT_TRUE(PlatformUtilities::runCommand("touch " + witness, output));
        EXPECT_TRUE(PlatformUtilities::requestReboot());
        EXPECT_EQ(slurp(record), "/etc/init.d/network restart \ntouch " + witness + "\nreboot\n");

        // A dry run can be given the answers of another host; other commands still print nothing.
        std::ofstream(dir.file("answers")) << "rpm -q\tnope\nrpm -qa | grep NetworkManager*\tNetworkManager-1.0\n";
        ScopedEnv answers("IPIF_COMMAND_ANSWERS", dir.file("answers"));
        EXPECT_TRUE(PlatformUtilities::runCommand("rpm -qa | grep NetworkManager*", output));
        EXPECT_EQ(output, "NetworkManager-1.0\n");
        EXPECT_TRUE(PlatformUtilities::runCommand("rpm -qa", output));
        EXPECT_EQ(output, "");
    }
    {
        // A misspelt mode must neither run nor record anything.
        ScopedEnv mode("IPIF_COMMANDS", "recrod:" + record);
        EXPECT_FALSE(PlatformUtilities::runCommand("touch " + witness, output));
        EXPECT_FALSE(PlatformUtilities::requestReboot());
    }
    EXPECT_FALSE(Nx::File::exists(witness));

    std::vector<std::string> seen;
    PlatformUtilities::setCommandRunner([&](const std::string& command, std::string& out) {
        seen.push_back(command);
        out = "ran " + command;
        return command != "reboot";
    });
    {
        ScopedEnv mode("IPIF_COMMANDS", "record:" + record);  // an installed runner wins
        EXPECT_TRUE(PlatformUtilities::runCommand("cat /etc/vmware-release | grep 4", output));
        EXPECT_EQ(output, "ran cat /etc/vmware-release | grep 4");
        EXPECT_FALSE(PlatformUtilities::requestReboot());
    }
    PlatformUtilities::setCommandRunner(nullptr);
    EXPECT_EQ(seen, (std::vector<std::string>{"cat /etc/vmware-release | grep 4", "reboot"}));

    // The default runs the shell and hands back what it printed.
    ScopedEnv mode("IPIF_COMMANDS", "run");
    EXPECT_TRUE(PlatformUtilities::runCommand("printf 'one\\ntwo\\n'; echo three", output));
    EXPECT_EQ(output, "one\ntwo\nthree\n");
}
