#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <fstream>
#include <thread>

#include "Nx/Exceptions.h"
#include "Nx/HostModel.h"
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
    // Only the file is left: no temporary survived and the lock went with its last holder.
    EXPECT_EQ(entries(dir), (std::vector<std::string>{"counter"}));

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

    EXPECT_FALSE(Nx::File::writeAtomically(dir.file("missing/dir/file"), "x"));
    EXPECT_FALSE(Nx::File::writeAtomically(dir.path(), "x"));  // a directory is not replaced
}

TEST(File, WritesNeitherFollowLinksNorLeaveTheRoot) {
    ScratchDir dir;
    const std::string root = dir.file("root"), outside = dir.file("outside");
    ASSERT_TRUE(std::filesystem::create_directory(root) && std::filesystem::create_directory(outside));
    const std::string target = outside + "/target";
    ASSERT_TRUE(Nx::File::writeAtomically(target, "OUT\n"));
    ScopedEnv rootEnv("IPIF_ROOT", root);
    ScopedEnv dataEnv("IPIF_DATA_DIR", "");

    // A linked file is neither written through nor replaced, by any call or scope; reading follows it.
    const std::string link = root + "/ifcfg-eth0";
    ASSERT_EQ(::symlink(target.c_str(), link.c_str()), 0);
    bool edited = false;
    const auto edit = [&](std::string& content, bool) {
        edited = true;
        content = "X\n";
        return true;
    };
    EXPECT_FALSE(Nx::File::writeAtomically(link, "X\n"));
    EXPECT_FALSE(Nx::File::writeAtomically(link, "X\n", Nx::File::Scope::Named));
    EXPECT_FALSE(Nx::File::update(link, edit));
    EXPECT_FALSE(edited);
    EXPECT_TRUE(std::filesystem::is_symlink(link));
    EXPECT_EQ(slurp(link), "OUT\n");

    // A planted lock link leads nowhere: update refuses rather than create its target.
    const std::string lockLink = root + "/.ifcfg-eth1.lock";
    ASSERT_EQ(::symlink((outside + "/created").c_str(), lockLink.c_str()), 0);
    EXPECT_FALSE(Nx::File::update(root + "/ifcfg-eth1", edit));
    EXPECT_FALSE(std::filesystem::exists(outside + "/created"));

    // Outside the root, directly or through a linked directory, host files are not written; an
    // IPIF_DATA_DIR set elsewhere and a file named outright are.
    ASSERT_EQ(::symlink(outside.c_str(), (root + "/etc").c_str()), 0);
    EXPECT_FALSE(Nx::File::writeAtomically(outside + "/hostname", "h\n"));
    EXPECT_FALSE(Nx::File::update(root + "/etc/hostname", edit));
    EXPECT_FALSE(std::filesystem::exists(outside + "/hostname"));
    EXPECT_TRUE(Nx::File::writeAtomically(root + "/hostname", "h\n"));
    EXPECT_TRUE(Nx::File::writeAtomically(outside + "/model", "m\n", Nx::File::Scope::Named));
    ScopedEnv elsewhere("IPIF_DATA_DIR", outside);
    EXPECT_TRUE(Nx::File::update(outside + "/ifcfg-eth2", edit));
}

TEST(File, WritersRemoveOnlyTheTemporariesDeadWritersLeft) {
    ScratchDir dir;
    const std::string path = dir.file("ifcfg-eth0");
    ASSERT_TRUE(Nx::File::writeAtomically(path, "A\n"));
    const auto plant = [&](const std::string& name, time_t age) {
        const std::string file = dir.file(name);
        std::ofstream(file) << "half";
        const struct timespec times[2] = {{0, UTIME_OMIT}, {::time(nullptr) - age, 0}};
        ASSERT_EQ(::utimensat(AT_FDCWD, file.c_str(), times, 0), 0);
    };
    plant(".ifcfg-eth0.dead01", 3600);  // a killed writer's
    plant(".ifcfg-eth0.young1", 0);     // a writer's that has yet to lock it
    plant(".ifcfg-eth0.busy01", 3600);  // a slow writer's, locked
    plant(".ifcfg-eth1.dead02", 3600);  // another file's
    const int busy = ::open(dir.file(".ifcfg-eth0.busy01").c_str(), O_RDONLY | O_CLOEXEC);
    ASSERT_EQ(::flock(busy, LOCK_EX), 0);
    EXPECT_TRUE(Nx::File::writeAtomically(path, "B\n"));
    ::close(busy);
    EXPECT_EQ(entries(dir), (std::vector<std::string>{".ifcfg-eth0.busy01", ".ifcfg-eth0.young1",
                                                      ".ifcfg-eth1.dead02", "ifcfg-eth0"}));
    EXPECT_EQ(slurp(path), "B\n");
}

TEST(File, ReadsOnlyRegularFilesUpToTheCap) {
    ScratchDir dir;
    std::string content = "kept", error;
    const std::string device = dir.file("ifcfg-null");
    ASSERT_EQ(::symlink("/dev/null", device.c_str()), 0);
    EXPECT_FALSE(Nx::File::read(device, content, error));
    EXPECT_EQ(error, "not a regular file");
    EXPECT_EQ(content, "kept");
    try {
        Nx::HostModel::open("fixture:" + device);
        ADD_FAILURE() << "a device taken for a fixture";
    } catch (const Nx::InstrumentationException& e) {
        EXPECT_NE(std::string(e.what()).find("not a regular file"), std::string::npos) << e.what();
    }

    // A FIFO would wait for a writer forever: the child must come back refused in time.
    const std::string fifo = dir.file("host.model");
    ASSERT_EQ(::mkfifo(fifo.c_str(), 0600), 0);
    const pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        ::alarm(5);
        std::string text, why;
        ::_exit(!Nx::File::read(fifo, text, why) && why == "not a regular file" ? 0 : 1);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << "status " << status;

    const std::string big = dir.file("big");
    std::ofstream(big).close();
    for (std::size_t size : {Nx::File::kMaxReadSize, Nx::File::kMaxReadSize + 1}) {
        ASSERT_EQ(::truncate(big.c_str(), static_cast<off_t>(size)), 0);
        EXPECT_EQ(Nx::File::read(big, content, error), size == Nx::File::kMaxReadSize) << size;
    }
    EXPECT_EQ(content.size(), Nx::File::kMaxReadSize);
    EXPECT_EQ(error, "larger than 16 MiB");
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
