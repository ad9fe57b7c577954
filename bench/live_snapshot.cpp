// How long the live backend takes to picture N interfaces, against `ip -o addr show` on the same
// namespace. Runs in a network namespace of its own, which disappears with the process.
//
//   ipif_bench_live [INTERFACES]     (default 1000; veth pairs, each end with an IPv4 and an IPv6
//                                     address, all up)
#include <sched.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "Nx/Instrumentation.h"
#include "Nx/LiveBackend.h"

namespace {

using Clock = std::chrono::steady_clock;
namespace P = Nx::NodeLexicon;

double milliseconds(Clock::duration d) { return std::chrono::duration<double, std::milli>(d).count(); }

// The median of several runs, in milliseconds.
double median(int runs, const std::function<void()>& body) {
    std::vector<double> times;
    for (int i = 0; i < runs; ++i) {
        const auto start = Clock::now();
        body();
        times.push_back(milliseconds(Clock::now() - start));
    }
    std::sort(times.begin(), times.end());
    return times[times.size() / 2];
}

bool makeInterfaces(int count) {
    FILE* batch = ::popen("ip -batch -", "w");
    if (!batch) return false;
    for (int pair = 0; pair < count / 2; ++pair) {
        std::fprintf(batch, "link add b%dx type veth peer name b%dy\n", pair, pair);
        for (int end = 0; end < 2; ++end) {
            const int k = 2 * pair + end;
            const char* name = end ? "y" : "x";
            std::fprintf(batch, "addr add 10.%d.%d.1/24 dev b%d%s\n", k / 256, k % 256, pair, name);
            std::fprintf(batch, "addr add 2001:db8:%x::1/64 dev b%d%s nodad\n", k, pair, name);
            std::fprintf(batch, "link set b%d%s up\n", pair, name);
        }
    }
    return ::pclose(batch) == 0;
}

// Reads what the endpoint adapter reads of every endpoint; returns how many there were.
int enumerate() {
    Nx::Instrumentation cursor;
    int endpoints = 0;
    std::string text;
    unsigned int number = 0;
    for (cursor.selectNode(P::IPEndpointNode); cursor; ++cursor) {
        ++endpoints;
        text = cursor.getNodeDescription();
        for (P::Properties p : {P::ElementName, P::IPv4Address, P::SubnetMask, P::IPv6Address, P::IPv4Gateway,
                                P::IPv6Gateway}) {
            cursor.getProperty(p, text);
        }
        for (P::Properties p : {P::AddressOrigin, P::IPv6AddressType, P::ProtocolIFType, P::IPVersion,
                                P::PrefixLength, P::AdminState}) {
            cursor.getProperty(p, number);
        }
    }
    return endpoints;
}

}  // namespace

int main(int argc, char** argv) {
    const int count = argc > 1 ? std::atoi(argv[1]) : 1000;
    if (count < 2) {
        std::fprintf(stderr, "usage: %s [INTERFACES >= 2]\n", argv[0]);
        return 2;
    }
    if (::unshare(CLONE_NEWNET) != 0) {
        std::fprintf(stderr, "cannot make a network namespace (%s); run as root\n", std::strerror(errno));
        return 1;
    }
    const auto made = Clock::now();
    if (std::system("ip link set lo up") != 0 || !makeInterfaces(count)) {
        std::fprintf(stderr, "could not create the interfaces\n");
        return 1;
    }
    std::printf("%d interfaces made in %.0f ms\n", count, milliseconds(Clock::now() - made));
    // Let IPv6 duplicate address detection on the link-local addresses finish: until then the
    // kernel keeps announcing changes, which would be measured as rebuilds.
    ::sleep(3);
    const int runs = 9;

    const double ip = median(runs, [] {
        if (std::system("ip -o addr show > /dev/null") != 0) std::fprintf(stderr, "ip failed\n");
    });
    // Cold runs use a fresh backend each; backends are dropped only after the timing, so that
    // their teardown is not measured as a request.
    std::vector<std::shared_ptr<Nx::HostModel::Backend>> fresh;
    for (int i = 0; i < 2 * runs; ++i) fresh.push_back(Nx::HostModel::openLiveBackend());
    std::size_t next = 0;
    const double cold = median(runs, [&] { fresh[next++]->snapshot(); });
    int endpoints = 0;
    const double coldWalk = median(runs, [&] {
        Nx::HostModel::setCurrent(fresh[next++]);
        endpoints = enumerate();
    });
    const double warmWalk = median(runs, [&] { endpoints = enumerate(); });
    auto backend = Nx::HostModel::openLiveBackend();
    backend->snapshot();
    const int calls = 10000;
    int rebuilds = 0;
    auto last = backend->snapshot();
    const auto start = Clock::now();
    for (int i = 0; i < calls; ++i) {
        auto now = backend->snapshot();
        rebuilds += now != last;
        last = std::move(now);
    }
    const double warmCall = milliseconds(Clock::now() - start) * 1000.0 / calls;

    std::printf("endpoints seen: %d\n", endpoints);
    std::printf("median of %d runs:\n", runs);
    std::printf("  ip -o addr show > /dev/null (with fork/exec)    %8.2f ms\n", ip);
    std::printf("  snapshot, cold (3 dumps + files + tree)         %8.2f ms  (%.2fx ip)\n", cold, cold / ip);
    std::printf("  enumeration, cold (first snapshot + walk)       %8.2f ms  (%.2fx ip)\n", coldWalk, coldWalk / ip);
    std::printf("  enumeration, warm (cached picture + walk)       %8.2f ms  (%.2fx ip)\n", warmWalk, warmWalk / ip);
    std::printf("  snapshot() when nothing changed                 %8.2f us per call (%d rebuilds in %d calls)\n",
                warmCall, rebuilds, calls);
    Nx::HostModel::setCurrent(nullptr);
    fresh.clear();
    return endpoints == count ? 0 : 1;
}
