// Shared by the live tests: a network namespace of the test's own with IPIF_ROOT pointing at a
// scratch directory (both vanish when the test ends), and what ip(8) says about it.
#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sched.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>
#include <string>
#include <vector>

namespace livetest {

// Runs a shell command (stderr folded into the output).
inline std::string run(const std::string& command, int* status = nullptr) {
    std::string output;
    FILE* pipe = ::popen((command + " 2>&1").c_str(), "r");
    if (!pipe) return output;
    char buffer[4096];
    while (std::fgets(buffer, sizeof buffer, pipe)) output += buffer;
    const int rc = ::pclose(pipe);
    if (status) *status = rc;
    return output;
}

inline std::vector<std::string> words(const std::string& line) {
    std::vector<std::string> result;
    std::istringstream in(line);
    for (std::string w; in >> w;) result.push_back(w);
    return result;
}

inline std::vector<std::string> lines(const std::string& text) {
    std::vector<std::string> result;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) result.push_back(line);
    return result;
}

inline std::string slurp(const std::string& path) {
    std::ifstream in(path);
    std::stringstream content;
    content << in.rdbuf();
    return content.str();
}

inline void spit(const std::string& path, const std::string& content) {
    std::filesystem::create_directories(std::filesystem::path(path).parent_path());
    std::ofstream(path) << content;
}

inline std::string hostName() {
    char name[HOST_NAME_MAX + 1] = {};
    ::gethostname(name, sizeof name - 1);
    return name;
}

inline std::string dottedMask(int prefix) {
    std::string mask;
    for (int octet = 0; octet < 4; ++octet) {
        const int bits = std::max(0, std::min(8, prefix - 8 * octet));
        mask += (octet ? "." : "") + std::to_string((0xff00 >> bits) & 0xff);
    }
    return mask;
}

// What ip(8) says about one interface.
struct IpView {
    int index = 0;  // ip's (the kernel's) order
    bool up = false;
    std::vector<std::string> ipv4;  // primary addresses, address/prefix, in ip's order
    std::vector<std::string> ipv6;  // global addresses, address/prefix
    std::string gateway4, gateway6;
};

inline std::map<std::string, IpView> askIp() {
    std::map<std::string, IpView> view;
    for (const std::string& line : lines(run("ip -o link show"))) {
        const std::vector<std::string> w = words(line);
        if (w.size() < 3) continue;
        std::string name = w[1].substr(0, w[1].find_first_of("@:"));
        std::string flags = w[2];  // <BROADCAST,MULTICAST,UP,LOWER_UP>
        flags.front() = ',';
        flags.back() = ',';
        view[name].up = flags.find(",UP,") != std::string::npos;
        view[name].index = std::atoi(w[0].c_str());
    }
    for (const std::string& line : lines(run("ip -o addr show"))) {
        const std::vector<std::string> w = words(line);
        if (w.size() < 4) continue;
        IpView& v = view[w[1]];
        if (w[2] == "inet" && line.find(" secondary ") == std::string::npos) v.ipv4.push_back(w[3]);
        if (w[2] == "inet6" && line.find(" scope global ") != std::string::npos) v.ipv6.push_back(w[3]);
    }
    for (const char* family : {"-4", "-6"}) {
        for (const std::string& line : lines(run(std::string("ip ") + family + " route show default table main"))) {
            const std::vector<std::string> w = words(line);
            for (std::size_t i = 0; i + 3 < w.size(); ++i) {
                if (w[i] == "via" && w[i + 2] == "dev") {
                    std::string& gateway = family[1] == '4' ? view[w[i + 3]].gateway4 : view[w[i + 3]].gateway6;
                    if (gateway.empty()) gateway = w[i + 1];
                }
            }
        }
    }
    view.erase("lo");
    return view;
}

// Each test in a network namespace of its own, entered by this thread (children it starts inherit
// it), and a scratch IPIF_ROOT with a resolver file. TearDown returns to the original namespace;
// nothing the test made survives it, as long as nothing else still holds the namespace.
class LiveNamespace : public ::testing::Test {
protected:
    void SetUp() override {
        home_ = ::open("/proc/self/ns/net", O_RDONLY | O_CLOEXEC);
        if (home_ < 0) GTEST_SKIP() << "cannot open /proc/self/ns/net: " << std::strerror(errno);
        if (::unshare(CLONE_NEWNET) != 0) GTEST_SKIP() << "the kernel refuses a network namespace: " << std::strerror(errno);
        inNamespace_ = true;
        char pattern[] = "/tmp/ipif-live-XXXXXX";
        ASSERT_NE(::mkdtemp(pattern), nullptr);
        root_ = pattern;
        ::setenv("IPIF_ROOT", root_.c_str(), 1);
        ::setenv("IPIF_COMMANDS", ("record:" + root_ + "/commands").c_str(), 1);
        ::unsetenv("IPIF_DATA_DIR");
        ::unsetenv("IPIF_BMC_INTERFACES");
        spit(root_ + "/etc/resolv.conf", "# generated\nnameserver 192.0.2.53\nsearch a.example b.example\noptions ndots:2\n");
        sh("ip link set lo up");
    }

    void TearDown() override {
        if (inNamespace_ && ::setns(home_, CLONE_NEWNET) != 0) {
            std::fprintf(stderr, "cannot return to the original network namespace: %s\n", std::strerror(errno));
            std::abort();  // later tests must not run in a namespace they did not make
        }
        if (home_ >= 0) ::close(home_);
        if (!root_.empty()) std::filesystem::remove_all(root_);
        for (const char* name : {"IPIF_ROOT", "IPIF_COMMANDS", "IPIF_BMC_INTERFACES"}) ::unsetenv(name);
    }

    void sh(const std::string& command) {
        int status = -1;
        const std::string output = run(command, &status);
        ASSERT_EQ(status, 0) << command << ": " << output;
    }

    // A bridge, va/vb with both families and both default routes on va, wa with IPv6 only, wb down.
    void buildNetwork() {
        for (const char* command : {
                 "ip link add br0 type bridge", "ip addr add 192.0.2.1/24 dev br0", "ip link set br0 up",
                 "ip link add va type veth peer name vb", "ip link set va up", "ip link set vb up",
                 "ip addr add 10.1.0.2/24 dev va", "ip addr add 10.1.0.3/24 dev va",
                 "ip -6 addr add 2001:db8:1::2/64 dev va nodad", "ip route add default via 10.1.0.1 dev va",
                 "ip -6 route add default via 2001:db8:1::1 dev va", "ip link add wa type veth peer name wb",
                 "ip link set wa up", "ip -6 addr add 2001:db8:2::2/48 dev wa nodad",
                 "ip addr add 10.2.0.2/16 dev wb"}) {
            sh(command);
        }
    }

    std::string ifcfg(const std::string& name) const { return root_ + "/etc/sysconfig/network-scripts/ifcfg-" + name; }

    int home_ = -1;
    bool inNamespace_ = false;
    std::string root_;
};

}  // namespace livetest
