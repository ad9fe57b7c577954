// Rewriting KEY=value configuration files.
#include <gtest/gtest.h>
#include <sys/stat.h>

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
    writeFile(file,
              "# GATEWAY is set by the installer\n"
              "DEVICE=eth0\n"
              "GATEWAY=10.0.0.1\n"
              "IPV6GATEWAY=fe80::1\n"
              "ONBOOT=yes\n");
    modifyValue(file, "GATEWAY", "10.0.0.254");
    EXPECT_EQ(readFile(file),
              "GATEWAY=10.0.0.254\n"
              "DEVICE=eth0\n"
              "GATEWAY=10.0.0.254\n"
              "GATEWAY=10.0.0.254\n"
              "ONBOOT=yes\n");

    modifyValue(file, "NETMASK", "255.255.255.0");
    EXPECT_EQ(readFile(file).substr(readFile(file).size() - 22), "NETMASK=255.255.255.0\n");

    // Matching is case-sensitive: "onboot" is a new key.
    modifyValue(file, "onboot", "no");
    EXPECT_NE(readFile(file).find("ONBOOT=yes\n"), std::string::npos);
    EXPECT_NE(readFile(file).find("onboot=no\n"), std::string::npos);
}

TEST_F(ConfigurationFileTest, CreatesMissingFilesAndCopesWithOddLines) {
    EXPECT_TRUE(updateConfigurationValue(file, "CONFIG_NAME", ""));
    EXPECT_EQ(readFile(file), "CONFIG_NAME=\n");

    // An unterminated last line stays a line of its own.
    writeFile(file, "DEVICE=eth0");
    modifyValue(file, "PREFIX", "64");
    EXPECT_EQ(readFile(file), "DEVICE=eth0\nPREFIX=64\n");

    // Lines far longer than any line buffer are kept whole; a key beyond the first 511 bytes of
    // a line is still found, and a long line without it is not cut up.
    const std::string filler(700, 'a');
    writeFile(file, "COMMENT=" + filler + "\nX=" + filler + " NETMASK\nY=1\n");
    modifyValue(file, "NETMASK", "255.0.0.0");
    EXPECT_EQ(readFile(file), "COMMENT=" + filler + "\nNETMASK=255.0.0.0\nY=1\n");

    // The file keeps its mode.
    ASSERT_EQ(::chmod(file.c_str(), 0600), 0);
    modifyValue(file, "Y", "2");
    struct stat info {};
    ASSERT_EQ(::stat(file.c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0600u);
}

TEST_F(ConfigurationFileTest, RefusesUnsafeKeysAndValuesAndWritesNothing) {
    writeFile(file, "DEVICE=eth0\n");
    const std::vector<std::string> unsafeValues{"a b",  "1.2.3.4\nBOOTPROTO=dhcp", "x;reboot", "$(id)", "`id`",
                                                "\"q\"", "'q'", "a\\b", "a#b", "a=b", "a*", std::string("a\0b", 3), "\xc3\xa9"};
    for (const std::string& value : unsafeValues) {
        EXPECT_FALSE(updateConfigurationValue(file, "NETMASK", value)) << value;
        modifyValue(file, "NETMASK", value);
    }
    for (const std::string key : {"", "NET MASK", "A=B", "KEY\n", "K-1", "K.1"}) {
        EXPECT_FALSE(updateConfigurationValue(file, key, "1")) << key;
    }
    EXPECT_EQ(readFile(file), "DEVICE=eth0\n");

    const std::string everyAllowed = "azAZ09.:-_/%,@+";
    EXPECT_TRUE(isSafeConfigurationValue(everyAllowed));
    EXPECT_TRUE(updateConfigurationValue(file, "Key_9", everyAllowed));
    EXPECT_EQ(readFile(file), "DEVICE=eth0\nKey_9=" + everyAllowed + "\n");
}

TEST_F(ConfigurationFileTest, ConcurrentWritersLoseNoUpdate) {
    writeFile(file, "DEVICE=eth0\n");
    const int threads = 6, keysPerThread = 15;
    std::vector<std::thread> writers;
    for (int t = 0; t < threads; ++t) {
        writers.emplace_back([this, t] {
            for (int k = 0; k < keysPerThread; ++k)
                modifyValue(file, "K" + std::to_string(t) + "X" + std::to_string(k), std::to_string(k));
        });
    }
    for (std::thread& writer : writers) writer.join();
    const std::string content = readFile(file);
    for (int t = 0; t < threads; ++t)
        for (int k = 0; k < keysPerThread; ++k)
            EXPECT_NE(content.find("K" + std::to_string(t) + "X" + std::to_string(k) + "=" + std::to_string(k) + "\n"),
                      std::string::npos)
                << t << "/" << k;
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
    EXPECT_EQ(path, "unchanged");
    for (const std::string& bad : {std::string(""), std::string("."), std::string(".."), std::string("../eth0"),
                                   std::string("a/b"), std::string("eth0\0x", 6)})
        EXPECT_FALSE(configurationFilePath(bad, path)) << bad;
}

}  // namespace
