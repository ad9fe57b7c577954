// Rewriting KEY=value configuration files.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <string>
#include <thread>
#include <vector>

#include "Lindows/ConfigurationFile.h"
#include "TestFiles.h"

using namespace Nx::IPInterfaceProvider;
using testfiles::readFile;
using testfiles::writeFile;

namespace {

class ConfigurationFileTest : public ::testing::Test {
protected:
    testfiles::ScratchDir dir;
    const std::string file = dir.file("ifcfg-eth0");
};

TEST_F(ConfigurationFileTest, ReplacesEveryLineHoldingTheKeyAndAppendsOtherwise) {
    // Any line containing the key is replaced, comments and IPV6GATEWAY included.
    writeFile(file,
              "# GATEWAY is set by the installer\nDEVICE=eth0\nGATEWAY=10.0.0.1\nIPV6GATEWAY=fe80::1\nONBOOT=yes\n");
    modifyValue(file, "GATEWAY", "10.0.0.254");
    // Case matters: "onboot" is a new key.
    modifyValue(file, "onboot", "no");
    EXPECT_EQ(readFile(file),
              "GATEWAY=10.0.0.254\nDEVICE=eth0\nGATEWAY=10.0.0.254\nGATEWAY=10.0.0.254\nONBOOT=yes\nonboot=no\n");

    // A missing file is created; an unterminated last line stays a line of its own.
    EXPECT_TRUE(updateConfigurationValue(dir.file("ifcfg-eth1"), "CONFIG_NAME", ""));
    EXPECT_EQ(readFile(dir.file("ifcfg-eth1")), "CONFIG_NAME=\n");
    writeFile(file, "DEVICE=eth0");
    modifyValue(file, "PREFIX", "64");
    EXPECT_EQ(readFile(file), "DEVICE=eth0\nPREFIX=64\n");

    // Lines longer than any line buffer are kept whole, and a key far into a line is still found.
    const std::string filler(700, 'a');
    writeFile(file, "COMMENT=" + filler + "\nX=" + filler + " NETMASK\nY=1\n");
    ASSERT_EQ(::chmod(file.c_str(), 0600), 0);
    modifyValue(file, "NETMASK", "255.0.0.0");
    EXPECT_EQ(readFile(file), "COMMENT=" + filler + "\nNETMASK=255.0.0.0\nY=1\n");
    struct stat info {};
    ASSERT_EQ(::stat(file.c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0600u);  // the file keeps its mode
}

TEST_F(ConfigurationFileTest, RefusesUnsafeKeysAndValuesAndWritesNothing) {
    writeFile(file, "DEVICE=eth0\n");
    for (const std::string& value : {std::string("a b"), std::string("1.2.3.4\nBOOTPROTO=dhcp"), std::string("$(id)"),
                                     std::string("x;reboot"), std::string("a\0b", 3)}) {
        EXPECT_FALSE(updateConfigurationValue(file, "NETMASK", value)) << value;
        modifyValue(file, "NETMASK", value);
    }
    for (const std::string key : {"", "NET MASK", "A=B"}) EXPECT_FALSE(updateConfigurationValue(file, key, "1")) << key;
    EXPECT_EQ(readFile(file), "DEVICE=eth0\n");

    const std::string everyAllowed = "azAZ09.:-_/%,@+";
    EXPECT_TRUE(updateConfigurationValue(file, "Key_9", everyAllowed));
    EXPECT_EQ(readFile(file), "DEVICE=eth0\nKey_9=" + everyAllowed + "\n");
}

TEST_F(ConfigurationFileTest, ConcurrentWritersLoseNoUpdate) {
    // Two forked processes and this one, three threads each, rewrite one file at once.
    writeFile(file, "DEVICE=eth0\n");
    const auto key = [](int p, int t, int k) {
        return "P" + std::to_string(p) + "T" + std::to_string(t) + "K" + std::to_string(k);
    };
    const auto hammer = [&](int p) {
        std::vector<std::thread> writers;
        for (int t = 0; t < 3; ++t)
            writers.emplace_back([&, t] {
                for (int k = 0; k < 10; ++k) modifyValue(file, key(p, t, k), std::to_string(k));
            });
        for (std::thread& writer : writers) writer.join();
    };
    std::vector<pid_t> children;
    for (int p = 1; p <= 2; ++p) {
        const pid_t child = ::fork();
        ASSERT_GE(child, 0);
        if (child == 0) {
            hammer(p);
            ::_exit(0);
        }
        children.push_back(child);
    }
    hammer(0);
    for (pid_t child : children) {
        int status = 0;
        ASSERT_EQ(::waitpid(child, &status, 0), child);
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    }
    const std::string content = readFile(file);
    EXPECT_EQ(std::count(content.begin(), content.end(), '\n'), 1 + 3 * 3 * 10);  // nothing torn or doubled
    for (int p = 0; p <= 2; ++p)
        for (int t = 0; t < 3; ++t)
            for (int k = 0; k < 10; ++k)
                EXPECT_NE(content.find(key(p, t, k) + "=" + std::to_string(k) + "\n"), std::string::npos);
    // Neither a lock file nor a temporary stays behind.
    std::vector<std::string> left;
    for (const auto& entry : std::filesystem::directory_iterator(dir.path())) left.push_back(entry.path().filename());
    EXPECT_EQ(left, std::vector<std::string>{"ifcfg-eth0"});
}

TEST_F(ConfigurationFileTest, PathsFitTheBufferOrAreRefused) {
    testfiles::ScopedEnv env("IPIF_DATA_DIR", dir.path());
    std::string path;
    ASSERT_TRUE(configurationFilePath("eth0", path));
    EXPECT_EQ(path, dir.path() + "/ifcfg-eth0");

    const size_t room = 127 - (dir.path().size() + std::string("/ifcfg-").size());
    EXPECT_TRUE(configurationFilePath(std::string(room, 'e'), path));
    EXPECT_EQ(path.size(), 127u);
    path = "unchanged";
    EXPECT_FALSE(configurationFilePath(std::string(room + 1, 'e'), path));
    for (const std::string& bad : {std::string(""), std::string(".."), std::string("a/b"), std::string("eth0\0x", 6)})
        EXPECT_FALSE(configurationFilePath(bad, path)) << bad;
    EXPECT_EQ(path, "unchanged");
}

TEST_F(ConfigurationFileTest, NamesThatAreNotUtf8ReadTheFileTheyWrote) {
    testfiles::ScopedEnv env("IPIF_DATA_DIR", dir.path());
    std::string path, value;
    ASSERT_TRUE(configurationFilePath("e\xff\xfe", path));
    ASSERT_TRUE(updateConfigurationValue(path, "CONFIG_NAME", "lab"));
    EXPECT_EQ(readFile(dir.path() + "/ifcfg-e\xff\xfe"), "CONFIG_NAME=lab\n");
    ASSERT_TRUE(readConfigurationValue(path, "CONFIG_NAME", value));
    EXPECT_EQ(value, "lab");
}

}  // namespace
