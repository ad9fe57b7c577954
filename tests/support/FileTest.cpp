#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <thread>

#include "Nx/PropertyFile.h"
#include "Nx/String.h"
#include "SupportTestUtil.h"

using namespace supporttest;

namespace {

std::vector<std::string> entries(const ScratchDir& dir) {
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(dir.path())) names.push_back(entry.path().filename());
    std::sort(names.begin(), names.end());
    return names;
}

mode_t modeOf(const std::string& path) {
    struct stat info;
    return ::stat(path.c_str(), &info) == 0 ? (info.st_mode & 07777) : 0;
}

const std::string kFiller = "\n" + std::string(8192, 'x') + "\n";

// Adds one to the number in the file; counts contents that were not a whole number followed by
// the whole filler (a torn file). The filler makes a write in place likely to be seen half done.
bool increment(const std::string& path, std::atomic<int>& torn) {
    return Nx::File::update(path, [&](std::string& content, bool exists) {
        long value = 0;
        if (exists) {
            size_t used = 0;
            try {
                value = std::stol(content, &used);
            } catch (...) {
                used = 0;
            }
            if (used == 0 || content.substr(used) != kFiller) ++torn;
        }
        content = std::to_string(value + 1) + kFiller;
        return true;
    });
}

}  // namespace

TEST(File, UpdateLosesNothingUnderThreadsAndProcesses) {
    ScratchDir dir;
    const std::string path = dir.file("counter");
    const int perWriter = 150, threads = 3, processes = 3;
    std::atomic<int> torn{0};
    std::vector<pid_t> children;
    for (int p = 0; p < processes; ++p) {
        pid_t pid = ::fork();
        ASSERT_GE(pid, 0);
        if (pid == 0) {
            std::atomic<int> childTorn{0};
            bool ok = true;
            for (int i = 0; i < perWriter && ok; ++i) ok = increment(path, childTorn);
            ::_exit(ok && childTorn == 0 ? 0 : 1);
        }
        children.push_back(pid);
    }
    std::vector<std::thread> workers;
    std::atomic<int> failures{0};
    for (int t = 0; t < threads; ++t)
        workers.emplace_back([&] {
            for (int i = 0; i < perWriter; ++i)
                if (!increment(path, torn)) ++failures;
        });
    for (auto& worker : workers) worker.join();
    for (pid_t pid : children) {
        int status = 0;
        ASSERT_EQ(::waitpid(pid, &status, 0), pid);
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << "a child lost its way or saw a torn file";
    }
    EXPECT_EQ(failures, 0);
    EXPECT_EQ(torn, 0);
    const std::string expected = std::to_string(perWriter * (threads + processes)) + kFiller;
    EXPECT_TRUE(slurp(path) == expected) << "counter at " << std::atol(slurp(path).c_str());
    // Only the file and its lock are left: no temporary survived.
    EXPECT_EQ(entries(dir), (std::vector<std::string>{".counter.lock", "counter"}));

    // A declined edit leaves the file alone.
    EXPECT_FALSE(Nx::File::update(path, [](std::string& content, bool) {
        content = "garbage";
        return false;
    }));
    EXPECT_TRUE(slurp(path) == expected);
}

TEST(File, WriteAtomicallyKeepsTheOldFileOnAnyFailure) {
    ScratchDir dir;
    const std::string path = dir.file("ifcfg-eth0");
    ASSERT_TRUE(Nx::File::writeAtomically(path, "OLD=1\n"));
    EXPECT_EQ(modeOf(path), 0644u);
    ASSERT_EQ(::chmod(path.c_str(), 0600), 0);

    for (const char* step : {"create", "write", "fsync", "rename"}) {
        Nx::File::setFailureHook([step](const std::string& at) { return at == step; });
        EXPECT_FALSE(Nx::File::writeAtomically(path, std::string(100000, 'n'))) << step;
        EXPECT_EQ(slurp(path), "OLD=1\n") << step;
        EXPECT_EQ(entries(dir), (std::vector<std::string>{"ifcfg-eth0"})) << "temporary left after " << step;
    }
    Nx::File::setFailureHook(nullptr);

    ASSERT_TRUE(Nx::File::writeAtomically(path, "NEW=2\n"));
    EXPECT_EQ(slurp(path), "NEW=2\n");
    EXPECT_EQ(modeOf(path), 0600u);  // the replaced file keeps its mode

    // Through a symbolic link the target changes and the link stays a link.
    const std::string link = dir.file("resolv.conf");
    ASSERT_EQ(::symlink(path.c_str(), link.c_str()), 0);
    ASSERT_TRUE(Nx::File::writeAtomically(link, "VIA=link\n"));
    EXPECT_TRUE(std::filesystem::is_symlink(link));
    EXPECT_EQ(slurp(path), "VIA=link\n");

    EXPECT_FALSE(Nx::File::writeAtomically(dir.file("missing/dir/file"), "x"));
    EXPECT_FALSE(Nx::File::writeAtomically(dir.path(), "x"));  // a directory is not replaced
}

TEST(PropertyFile, ReadsKeyValueLines) {
    ScratchDir dir;
    const std::string path = dir.file("ifcfg-eth0");
    ASSERT_TRUE(Nx::File::writeAtomically(path,
                                          "# GATEWAY=commented\n"
                                          "\n"
                                          "DEVICE=eth0\n"
                                          "  BOOTPROTO = static  \n"
                                          "IPADDR=\"192.168.1.10\"\n"
                                          "NAME='office lan'\n"
                                          "HALF=\"open\n"
                                          "GATEWAY=192.168.1.1\n"
                                          "GATEWAY=192.168.1.254\n"
                                          "noequals\n"
                                          "EMPTY=\n"
                                          "CONFIG_NAME=Büro"));
    Nx::PropertyFile file{Nx::File::Path(Nx::make_wstring(path))};
    EXPECT_EQ(Nx::make_string(file.getValue(L"DEVICE")), "");  // not open yet
    ASSERT_TRUE(file.open(1));
    EXPECT_EQ(Nx::make_string(file.getValue(L"DEVICE")), "eth0");
    EXPECT_EQ(Nx::make_string(file.getValue(L"BOOTPROTO")), "static");
    EXPECT_EQ(Nx::make_string(file.getValue(L"IPADDR")), "192.168.1.10");
    EXPECT_EQ(Nx::make_string(file.getValue(L"NAME")), "office lan");
    EXPECT_EQ(Nx::make_string(file.getValue(L"HALF")), "\"open");
    EXPECT_EQ(Nx::make_string(file.getValue(L"GATEWAY")), "192.168.1.1");
    EXPECT_EQ(Nx::make_string(file.getValue(L"EMPTY")), "");
    EXPECT_EQ(Nx::make_string(file.getValue(L"MISSING")), "");
    EXPECT_EQ(Nx::make_string(file.getValue(L"CONFIG_NAME")), "B\xC3\xBCro");
    file.close();
    EXPECT_EQ(Nx::make_string(file.getValue(L"DEVICE")), "");

    Nx::PropertyFile missing{Nx::File::Path(dir.file("ifcfg-none"))};
    EXPECT_FALSE(missing.open(1));
    EXPECT_TRUE(Nx::File::exists(Nx::make_wstring(path)));
    EXPECT_FALSE(Nx::File::exists(dir.file("ifcfg-none")));
}

TEST(String, Utf8ConversionsRoundTripAndKeepBadBytes) {
    const std::string text = "eth0 Gr\xC3\xBC\xC3\x9F" "e \xE2\x82\xAC \xF0\x9D\x84\x9E";
    const std::wstring wide = Nx::make_wstring(text);
    EXPECT_EQ(wide, L"eth0 Gr\u00fc\u00dfe \u20ac \U0001D11E");
    EXPECT_EQ(Nx::make_string(wide), text);
    // A stray continuation byte, a truncated sequence, an overlong '/' and an encoded surrogate:
    // each byte of them stands as U+DC80..U+DCFF and comes back as itself.
    const std::string bad = "a\x80" "b\xE2\x82" "c\xC0\xAF" "d\xED\xA0\x80" "e\xFF";
    const std::wstring escaped = Nx::make_wstring(bad);
    EXPECT_EQ(escaped.substr(0, 6), std::wstring({L'a', wchar_t(0xDC80), L'b', wchar_t(0xDCE2), wchar_t(0xDC82), L'c'}));
    EXPECT_EQ(Nx::make_string(escaped), bad);
    std::string every;
    for (int c = 1; c < 256; ++c) every += static_cast<char>(c);
    EXPECT_EQ(Nx::make_string(Nx::make_wstring(every + text + bad)), every + text + bad);
    // Only those code points become bytes: other lone surrogates still become U+FFFD.
    EXPECT_EQ(Nx::make_string(std::wstring(1, static_cast<wchar_t>(0xD800))), "\xEF\xBF\xBD");
    EXPECT_EQ(Nx::make_string(std::wstring(1, static_cast<wchar_t>(0xDC7F))), "\xEF\xBF\xBD");
    EXPECT_EQ(Nx::make_string(L""), "");
}
