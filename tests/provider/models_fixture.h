// Shared set-up of the model tests: every test gets its own data directory for ifcfg files, so no
// test can reach the host's network scripts, and a helper to learn the host name the models see.
#pragma once

#include <gtest/gtest.h>
#include <unistd.h>

#include <string>

#include "TestFiles.h"
#include "TestHostModel.h"

namespace modeltest {

class ModelTest : public ::testing::Test {
protected:
    std::string ifcfg(const std::string& ifname) const { return dataDir.file("ifcfg-" + ifname); }

    testfiles::ScratchDir dataDir;
    testfiles::ScopedEnv dataDirEnv{"IPIF_DATA_DIR", dataDir.path() + "/"};
};

inline std::string hostName() {
    char buffer[256] = {};
    if (::gethostname(buffer, sizeof buffer - 1) != 0) return std::string();
    return buffer;
}

}  // namespace modeltest
