#include <sched.h>
#include <sys/mount.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <syslog.h>
#include <unistd.h>

#include <cstring>
#include <map>
#include <regex>
#include <thread>

#include "SupportTestUtil.h"
#include "TestFiles.h"
#include "Trace.h"

using namespace supporttest;

namespace {

const std::string kComponent = "Tarvo.IPInterfaceProvider";
const std::string kSeparator(78, '=');

// Failure records of the other tests go nowhere instead of the system log.
class QuietLog : public ::testing::Environment {
public:
    void SetUp() override {
        ::setenv("IPIF_LOG_FILE", "/dev/null", 0);
        TALog::TALogger::reconfigure();
    }
};
const auto* const quietLog = ::testing::AddGlobalTestEnvironment(new QuietLog);

// Points the logger at files in a scratch directory for one test.
class LogFiles {
public:
    explicit LogFiles(const std::string& level)
        : log_(dir_.file("log")), trace_(dir_.file("trace")), logEnv_("IPIF_LOG_FILE", log_),
          traceEnv_("IPIF_TRACE_FILE", trace_), levelEnv_("IPIF_LOG_LEVEL", level) {
        TALog::TALogger::reconfigure();
    }
    std::string log() const { return testfiles::readLogTexts(log_); }
    std::string rawLog() const { return slurp(log_); }
    std::string trace() const { return slurp(trace_); }

private:
    // Destroyed last, once the environment is restored.
    struct Restore {
        ~Restore() { TALog::TALogger::reconfigure(); }
    } restore_;
    ScratchDir dir_;
    std::string log_, trace_;
    ScopedEnv logEnv_, traceEnv_, levelEnv_;
};

}  // namespace

TEST(Tokenize, SplitsOnAnyDelimiterWithoutEmptyTokens) {
    std::vector<std::string> tokens{"kept"};
    Nx::Tokenize("  a,,b ", tokens, " ,");
    EXPECT_EQ(tokens, (std::vector<std::string>{"kept", "a", "b"}));

    std::vector<std::string> none;
    Nx::Tokenize("", none, " ,");
    Nx::Tokenize(", ,,  ,", none, " ,");
    EXPECT_TRUE(none.empty());

    std::vector<std::string> whole;
    Nx::Tokenize("eth0:1", whole, " ,");
    EXPECT_EQ(whole, (std::vector<std::string>{"eth0:1"}));

    std::vector<std::string> edges;
    Nx::Tokenize("x;y;", edges, ";");
    Nx::Tokenize("z", edges);
    EXPECT_EQ(edges, (std::vector<std::string>{"x", "y", "z"}));
}

TEST(TraceFormats, EveryHelperAndMessageType) {
    EXPECT_STREQ(Nx::trace("ipAddress", "Model.cpp", 12, "10.0.0.1"),
                 "VARIABLE: 'ipAddress' has Value '10.0.0.1' at line 12 in Model.cpp");
    EXPECT_STREQ(Nx::trace("count", "Model.cpp", 7, 42u), "VARIABLE: 'count' has Value '42' at line 7 in Model.cpp");

    EXPECT_STREQ(Nx::trace("F.cpp", "getName", 3, Nx::ENTERING), "ENTERING: getName() in F.cpp [Line: 3]");
    EXPECT_STREQ(Nx::trace("F.cpp", "getName", 4, Nx::EXITING), "EXITING: getName() in F.cpp [Line: 4]");
    EXPECT_STREQ(Nx::trace("F.cpp", "getName", 5, Nx::METHOD_INVOKED), "METHOD: getName() was invoked in F.cpp [Line: 5]");
    EXPECT_STREQ(Nx::trace("F.cpp", "it failed", 6, Nx::FREE_MESSAGE), "MESSAGE [File: F.cpp, Line: 6]: it failed");
    EXPECT_STREQ(Nx::trace("F.cpp", "getName", 8, static_cast<Nx::MessageType>(7)), "");

    EXPECT_STREQ(Nx::tracepara("F.cpp", "setFilter", 9, "0x1 0x2", Nx::ENTERING),
                 "ENTERING: setFilter() in F.cpp [Line: 9],Parameters List: 0x1 0x2");
    EXPECT_STREQ(Nx::tracepara("F.cpp", "setFilter", 10, "p", Nx::EXITING),
                 "EXITING: setFilter() in F.cpp [Line: 10],Parameters List: p");
    EXPECT_STREQ(Nx::tracepara("F.cpp", "setFilter", 11, "p", Nx::METHOD_INVOKED),
                 "METHOD: setFilter() was invoked in F.cpp [Line: 11],Parameters List: p");
    EXPECT_STREQ(Nx::tracepara("F.cpp", "note", 12, "p", Nx::FREE_MESSAGE),
                 "MESSAGE [File: F.cpp, Line: 12]: note,Parameters List: p");
    EXPECT_STREQ(Nx::tracepara("F.cpp", "setFilter", 13, "p", static_cast<Nx::MessageType>(7)), "");

    // Each helper has its own buffer: one result survives calls of the others.
    const char* text = Nx::trace("a", "f", 1, "x");
    Nx::trace("b", "f", 2, 5u);
    Nx::trace("f", "g", 3, Nx::ENTERING);
    Nx::tracepara("f", "g", 4, "p", Nx::EXITING);
    EXPECT_STREQ(text, "VARIABLE: 'a' has Value 'x' at line 1 in f");
}

TEST(TraceFormats, OverlongTextIsCutInsideTheBufferAndThreadsDoNotMix) {
    const std::string value(2000, 'v');
    const std::string full = "VARIABLE: 'big' has Value '" + value + "' at line 1 in F.cpp";
    const char* text = Nx::trace("big", "F.cpp", 1, value.c_str());
    ASSERT_EQ(std::strlen(text), 511u);
    EXPECT_EQ(full.compare(0, 511, text), 0);
    EXPECT_EQ(std::strlen(Nx::tracepara("F.cpp", "f", 1, value.c_str(), Nx::ENTERING)), 511u);
    EXPECT_EQ(std::strlen(Nx::trace("F.cpp", value.c_str(), 1, Nx::FREE_MESSAGE)), 511u);

    // Per-thread buffers: a thread's text is never overwritten by another thread's.
    auto hammer = [](const char* name, bool& clean) {
        const std::string expected = std::string("VARIABLE: '") + name + "' has Value 'v' at line 1 in T.cpp";
        clean = true;
        for (int i = 0; i < 20000; ++i) clean = (expected == Nx::trace(name, "T.cpp", 1, "v")) && clean;
    };
    bool clean1 = false, clean2 = false;
    std::thread one(hammer, "first", std::ref(clean1)), two(hammer, "second-thread", std::ref(clean2));
    one.join();
    two.join();
    EXPECT_TRUE(clean1 && clean2);
}

TEST(Logging, ProviderMarkersByteForByte) {
    LogFiles files("4000");
    Nx::markProviderEntry(kComponent, "IPInterfaceProvider", "IPInterface_GetInstance", 120);
    Nx::markProviderExit(kComponent, "IPInterfaceProvider", "IPInterface_GetInstance", 131);
    EXPECT_EQ(files.log(), kSeparator + "\n" +
                               "ENTERING: IPInterface_GetInstance() in IPInterfaceProvider [Line: 120]\n" +
                               "EXITING: IPInterface_GetInstance() in IPInterfaceProvider [Line: 131]\n" +
                               kSeparator + "\n");
    // The trace copy carries the level, component and the marker's own function name.
    auto traced = lines(files.trace());
    ASSERT_EQ(traced.size(), 4u);
    EXPECT_NE(traced[0].find(" 4000 Tarvo.IPInterfaceProvider markProviderEntry "), std::string::npos);
    EXPECT_EQ(traced[1].substr(traced[1].size() - 31), "IPInterfaceProvider [Line: 120]");
    EXPECT_NE(traced[3].find(" markProviderExit "), std::string::npos);
    EXPECT_EQ(traced[3].substr(traced[3].size() - 80), ": " + kSeparator);
}

TEST(Logging, ThresholdRoutesByLevel) {
    for (const char* bogus : {"bogus", "4000x", "-1", "99999999999", " "}) {
        // Not a level: said once as an error, and the default threshold 6000 holds.
        LogFiles files(bogus);
        EXPECT_NE(TALog::TALogger::configurationError().find("IPIF_LOG_LEVEL"), std::string::npos) << bogus;
        Nx::logRecord(kComponent, "f", "F.cpp", 1, 3000, "entry");
        Nx::logRecord(kComponent, "f", "F.cpp", 2, 4000, "variable");
        Nx::logRecord(kComponent, "f", "F.cpp", 3, 6000, "failure\nforged record");
        auto logged = lines(files.log());
        ASSERT_EQ(logged.size(), 2u) << bogus;
        EXPECT_EQ(logged[0].rfind("IPIF_LOG_LEVEL=\"", 0), 0u) << logged[0];
        EXPECT_EQ(logged[1], "failure forged record");
        EXPECT_EQ(lines(files.trace()).size(), 1u);
    }
    {
        LogFiles files("3000");
        Nx::logRecord(kComponent, "f", "F.cpp", 1, 2999, "below");
        Nx::logRecord(kComponent, "f", "F.cpp", 1, 3000, "entry");
        Nx::logRecord(kComponent, "f", "F.cpp", 1, 6000, "failure");
        EXPECT_EQ(files.log(), "entry\nfailure\n");
        EXPECT_EQ(TALog::TALogger::configurationError(), "");
        // Each file line says when (UTC, ms), how bad, and which process.
        const std::regex head(R"(\d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\.\d{3}Z (DEBUG|ERROR) (\d+) (entry|failure))");
        auto raw = lines(files.rawLog());
        ASSERT_EQ(raw.size(), 2u);
        std::smatch m;
        ASSERT_TRUE(std::regex_match(raw[0], m, head)) << raw[0];
        EXPECT_EQ(m[1], "DEBUG");
        EXPECT_EQ(m[2], std::to_string(::getpid()));
        ASSERT_TRUE(std::regex_match(raw[1], m, head)) << raw[1];
        EXPECT_EQ(m[1], "ERROR");
    }
}

// Loaded by an object manager, the library must leave the process's syslog identity alone.
TEST(Logging, SyslogKeepsTheHostProcessIdentity) {
    int fds[2];
    ASSERT_EQ(::pipe(fds), 0);
    pid_t pid = ::fork();
    ASSERT_GE(pid, 0);
    if (pid == 0) {
        // A private /dev holding our own /dev/log, in a mount namespace of this child only.
        ::close(fds[0]);
        auto fail = [&](const char* why) {
            (void)!::write(fds[1], why, std::strlen(why));
            ::_exit(2);
        };
        if (::unshare(CLONE_NEWNS) != 0 || ::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
            ::mount("tmpfs", "/dev", "tmpfs", 0, nullptr) != 0)
            fail("SKIP");
        int sink = ::socket(AF_UNIX, SOCK_DGRAM, 0);
        sockaddr_un addr{};
        addr.sun_family = AF_UNIX;
        std::strcpy(addr.sun_path, "/dev/log");
        if (sink < 0 || ::bind(sink, reinterpret_cast<sockaddr*>(&addr), sizeof addr) != 0) fail("bind");
        ::unsetenv("IPIF_LOG_FILE");
        ::setenv("IPIF_LOG_LEVEL", "6000", 1);
        TALog::TALogger::reconfigure();
        ::openlog("cimserver", LOG_NDELAY, LOG_DAEMON);
        ::syslog(LOG_INFO, "host before");
        Nx::logRecord(kComponent, "f", "F.cpp", 1, 6000, "provider record");
        ::syslog(LOG_INFO, "host after");
        std::string got;
        char buffer[512];
        for (int i = 0; i < 3; ++i) {
            ssize_t n = ::recv(sink, buffer, sizeof buffer, MSG_DONTWAIT);
            if (n > 0) got.append(buffer, static_cast<size_t>(n)) += '\n';
        }
        (void)!::write(fds[1], got.data(), got.size());
        ::_exit(0);
    }
    ::close(fds[1]);
    std::string got;
    char buffer[512];
    for (ssize_t n; (n = ::read(fds[0], buffer, sizeof buffer)) > 0;) got.append(buffer, static_cast<size_t>(n));
    ::close(fds[0]);
    int status = 0;
    ASSERT_EQ(::waitpid(pid, &status, 0), pid);
    if (got == "SKIP") GTEST_SKIP() << "no mount namespace here";
    ASSERT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << got;
    auto received = lines(got);
    ASSERT_EQ(received.size(), 3u) << got;
    for (const std::string& line : received) EXPECT_NE(line.find("cimserver: "), std::string::npos) << line;
    EXPECT_NE(received[1].find("cimserver: IPInterfaceProvider: provider record"), std::string::npos) << received[1];
}

// The shorthands format (and evaluate) a record's text only when the record is written: a dropped
// record leaves every trace buffer as it was.
TEST(Logging, DroppedRecordsAreNeverFormatted) {
    const auto traceAll = [](int& evaluated) {
        NX_VAR(kComponent, "name", (++evaluated, "value"));
        NX_VAR(kComponent, "number", 7u);
        NX_ENTER(kComponent);
        NX_ENTER_PARAMS(kComponent, (++evaluated, "p=1"));
        NX_MESSAGE(kComponent, 3000, "note");
        Nx::markProviderEntry(kComponent, "F.cpp", "request", 1);
    };
    const char* buffers[] = {Nx::trace("v", "S", 1, "s"), Nx::trace("n", "S", 1, 1u),
                             Nx::trace("S", "f", 1, Nx::ENTERING), Nx::tracepara("S", "f", 1, "s", Nx::ENTERING)};
    std::vector<std::string> before(std::begin(buffers), std::end(buffers));
    int evaluated = 0;
    {
        LogFiles files("4001");
        traceAll(evaluated);
        EXPECT_EQ(evaluated, 0);
        for (size_t i = 0; i < before.size(); ++i) EXPECT_EQ(buffers[i], before[i]) << i;
        EXPECT_EQ(files.trace(), "");
    }
    LogFiles files("3000");
    traceAll(evaluated);
    EXPECT_EQ(evaluated, 2);
    for (size_t i = 0; i < before.size(); ++i) EXPECT_NE(buffers[i], before[i]) << i;
    EXPECT_EQ(lines(files.trace()).size(), 7u);
    EXPECT_NE(files.trace().find("ENTERING: operator()() in TraceTest.cpp"), std::string::npos);
}

TEST(Logging, AppendsFromThreadsAndProcessesNeverInterleave) {
    LogFiles files("3000");
    const std::string line(300, 'x');
    auto writer = [&](char mark) {
        std::string text = std::string(1, mark) + line;
        for (int i = 0; i < 500; ++i) Nx::logRecord(kComponent, "f", "F.cpp", i, 6000, text.c_str());
    };
    std::vector<pid_t> children;
    for (char mark : {'p', 'q'}) {
        pid_t pid = ::fork();
        ASSERT_GE(pid, 0);
        if (pid == 0) {
            writer(mark);
            ::_exit(0);
        }
        children.push_back(pid);
    }
    std::thread a(writer, 'a'), b(writer, 'b');
    a.join();
    b.join();
    for (pid_t pid : children) {
        int status = 0;
        ASSERT_EQ(::waitpid(pid, &status, 0), pid);
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    }
    std::map<char, int> counts;
    for (const std::string& l : lines(files.log())) {
        ASSERT_EQ(l.size(), line.size() + 1);
        ASSERT_EQ(l.substr(1), line);
        ++counts[l[0]];
    }
    EXPECT_EQ(counts, (std::map<char, int>{{'a', 500}, {'b', 500}, {'p', 500}, {'q', 500}}));
}
