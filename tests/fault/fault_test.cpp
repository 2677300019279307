/* SPDX-License-Identifier: Apache-2.0 */
// Tests the interposer: each kind of call fails exactly when its plan says so.

#include "fault/fault.h"
#include "fault/sweep.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <new>
#include <string>
#include <vector>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/random.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/uio.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

class Fault : public testing::Test {
protected:
    Fault() {
        char name[] = "/tmp/dvs-fault-XXXXXX";
        dir_ = mkdtemp(name);
        file_ = dir_ + "/file";
        fd_ = open(file_.c_str(), O_RDWR | O_CREAT, 0600);
        EXPECT_EQ(write(fd_, "0123456789", 10), 10);
    }
    ~Fault() override {
        fault_disarm();
        close(fd_);
        std::error_code ignored;
        std::filesystem::remove_all(dir_, ignored);
    }
    std::string dir_, file_;
    int fd_ = -1;
};

/// One call of each kind that needs at most a file descriptor. Returns -1 with errno, or another value.
struct OneCall {
    const char *kind;
    long (*call)(int fd, const char *path);
};

const OneCall kCalls[] = {
    {"open", [](int, const char *path) { return static_cast<long>(open(path, O_RDONLY)); }},
    {"open",
     [](int, const char *path) { return static_cast<long>(openat(AT_FDCWD, path, O_RDONLY | O_CLOEXEC)); }},
    {"open", [](int, const char *path) { return fopen(path, "r") ? 0L : -1L; }},
    {"read",
     [](int fd, const char *) {
         char c;
         return static_cast<long>(read(fd, &c, 1));
     }},
    {"read",
     [](int fd, const char *) {
         char c;
         return static_cast<long>(pread(fd, &c, 1, 0));
     }},
    {"read",
     [](int fd, const char *) {
         char c;
         iovec v{&c, 1};
         return static_cast<long>(readv(fd, &v, 1));
     }},
    {"write", [](int fd, const char *) { return static_cast<long>(write(fd, "x", 1)); }},
    {"write", [](int fd, const char *) { return static_cast<long>(pwrite(fd, "x", 1, 0)); }},
    {"write",
     [](int fd, const char *) {
         char c = 'x';
         iovec v{&c, 1};
         return static_cast<long>(pwritev(fd, &v, 1, 0));
     }},
    {"fsync", [](int fd, const char *) { return static_cast<long>(fsync(fd)); }},
    {"fsync", [](int fd, const char *) { return static_cast<long>(fdatasync(fd)); }},
    {"truncate", [](int fd, const char *) { return static_cast<long>(ftruncate(fd, 10)); }},
    {"rename", [](int, const char *path) { return static_cast<long>(rename(path, path)); }},
    {"rename",
     [](int, const char *path) { return static_cast<long>(renameat(AT_FDCWD, path, AT_FDCWD, path)); }},
    {"stat",
     [](int fd, const char *) {
         struct stat s;
         return static_cast<long>(fstat(fd, &s));
     }},
    {"stat",
     [](int, const char *path) {
         struct stat s;
         return static_cast<long>(stat(path, &s));
     }},
    {"stat",
     [](int, const char *path) {
         struct stat s;
         return static_cast<long>(fstatat(AT_FDCWD, path, &s, 0));
     }},
    {"close", [](int fd, const char *) { return static_cast<long>(close(dup(fd))); }},
    {"flock", [](int fd, const char *) { return static_cast<long>(flock(fd, LOCK_EX)); }},
    {"lock",
     [](int fd, const char *) {
         struct flock l {};
         l.l_type = F_WRLCK;
         return static_cast<long>(fcntl(fd, F_SETLK, &l));
     }},
    {"chmod", [](int fd, const char *) { return static_cast<long>(fchmod(fd, 0600)); }},
    {"unlink",
     [](int, const char *path) { return static_cast<long>(unlink((std::string(path) + "2").c_str())); }},
    {"mkdir",
     [](int, const char *path) { return static_cast<long>(mkdir((std::string(path) + "3").c_str(), 0700)); }},
    {"socket", [](int, const char *) { return static_cast<long>(socket(AF_UNIX, SOCK_STREAM, 0)); }},
    {"send", [](int fd, const char *) { return static_cast<long>(send(fd, "x", 1, 0)); }},
    {"recv",
     [](int fd, const char *) {
         char c;
         return static_cast<long>(recv(fd, &c, 1, 0));
     }},
    {"random",
     [](int, const char *) {
         char c;
         return static_cast<long>(getrandom(&c, 1, 0));
     }},
};

TEST_F(Fault, EachKindFailsWithTheChosenError) {
    for (const OneCall &row : kCalls) {
        SCOPED_TRACE(std::string(row.kind) + " #" + std::to_string(&row - kCalls));
        ASSERT_EQ(fault_arm((std::string(row.kind) + ":1:EDQUOT").c_str()), 0);
        errno = 0;
        const long result = row.call(fd_, file_.c_str());
        const int error = errno;
        const int64_t hits = fault_hits();
        fault_disarm();
        EXPECT_EQ(result, -1);
        EXPECT_EQ(error, EDQUOT);
        EXPECT_EQ(hits, 1);
    }
}

TEST_F(Fault, OnlyTheNthCallFails) {
    ASSERT_EQ(fault_arm("write:3:ENOSPC"), 0);
    EXPECT_EQ(pwrite(fd_, "a", 1, 0), 1);
    EXPECT_EQ(pwrite(fd_, "b", 1, 1), 1);
    EXPECT_EQ(pwrite(fd_, "c", 1, 2), -1);
    EXPECT_EQ(pwrite(fd_, "d", 1, 3), 1);
    EXPECT_EQ(fault_calls("write"), 4);
    EXPECT_EQ(fault_hits(), 1);
}

TEST_F(Fault, PlusFailsAllLaterCalls) {
    ASSERT_EQ(fault_arm("fsync:2+"), 0);
    EXPECT_EQ(fsync(fd_), 0);
    EXPECT_EQ(fsync(fd_), -1);
    EXPECT_EQ(fsync(fd_), -1);
    EXPECT_EQ(errno, EIO);
}

TEST_F(Fault, ShortCountsTransferThatManyBytes) {
    ASSERT_EQ(fault_arm("write:1:short=2;read:1:short=3"), 0);
    EXPECT_EQ(pwrite(fd_, "abcdef", 6, 0), 2);
    char got[8] = {};
    EXPECT_EQ(pread(fd_, got, 6, 0), 3);
    EXPECT_STREQ(got, "ab2");
}

TEST_F(Fault, ShortCountsTruncateVectors) {
    ASSERT_EQ(fault_arm("write:1:short=3"), 0);
    char first[] = "ab", second[] = "cd";
    const iovec vector[] = {{first, 2}, {second, 2}};
    EXPECT_EQ(pwritev(fd_, vector, 2, 0), 3);
    char got[8] = {};
    EXPECT_EQ(pread(fd_, got, 5, 0), 5);
    EXPECT_STREQ(got, "abc34");
}

TEST_F(Fault, PathLimitsAPlanToFilesBelowIt) {
    const std::string other = dir_ + "-other";
    ASSERT_EQ(fault_arm(("open:1+:EACCES:path=" + dir_ + "/").c_str()), 0);
    EXPECT_EQ(open(file_.c_str(), O_RDONLY), -1);
    const int fd = open("/dev/null", O_RDONLY);
    EXPECT_GE(fd, 0);
    close(fd);
    const int dirFd = open(dir_.c_str(), O_RDONLY | O_DIRECTORY);
    ASSERT_GE(dirFd, 0);
    EXPECT_EQ(openat(dirFd, "file", O_RDONLY), -1) << "relative to a descriptor";
    ASSERT_EQ(fault_arm(("write:1+:EIO:path=" + file_).c_str()), 0);
    EXPECT_EQ(pwrite(fd_, "x", 1, 0), -1) << "through a descriptor";
    close(dirFd);
}

TEST_F(Fault, DirectLimitsAPlanToOpensForDirectInput) {
    ASSERT_EQ(fault_arm("open:1+:EINVAL:direct"), 0);
    EXPECT_EQ(open(file_.c_str(), O_RDONLY | O_DIRECT), -1);
    EXPECT_EQ(errno, EINVAL);
    const int fd = open(file_.c_str(), O_RDONLY);
    EXPECT_GE(fd, 0);
    close(fd);
}

TEST_F(Fault, FailedCloseClosesTheDescriptor) {
    const int fd = dup(fd_);
    ASSERT_EQ(fault_arm("close:1:EIO"), 0);
    EXPECT_EQ(close(fd), -1);
    fault_disarm();
    EXPECT_EQ(fcntl(fd, F_GETFD), -1);
}

TEST_F(Fault, RandomPlansAreReproducibleBySeed) {
    const auto run = [this](const char *plan) {
        EXPECT_EQ(fault_arm(plan), 0);
        std::string pattern;
        for (int i = 0; i < 200; i++)
            pattern += pwrite(fd_, "x", 1, 0) == 1 ? '.' : 'X';
        return pattern;
    };
    const std::string first = run("write:~100:EIO:seed=7");
    EXPECT_EQ(run("write:~100:EIO:seed=7"), first);
    EXPECT_NE(run("write:~100:EIO:seed=8"), first);
    EXPECT_NE(first.find('X'), std::string::npos);
    EXPECT_NE(first.find('.'), std::string::npos);
}

TEST_F(Fault, KillEndsTheProcessAtTheCall) {
    const pid_t pid = fork();
    if (pid == 0) {
        fault_arm("write:2:kill");
        (void)!pwrite(fd_, "AB", 2, 0);
        (void)!pwrite(fd_, "CD", 2, 2);
        _exit(0);
    }
    int how = 0;
    ASSERT_EQ(waitpid(pid, &how, 0), pid);
    EXPECT_TRUE(WIFSIGNALED(how) && WTERMSIG(how) == SIGKILL);
    char got[5] = {};
    EXPECT_EQ(pread(fd_, got, 4, 0), 4);
    EXPECT_STREQ(got, "AB23");
}

TEST_F(Fault, SuspendedCallsNeitherCountNorFail) {
    ASSERT_EQ(fault_arm("write:1:EIO"), 0);
    fault_suspend();
    EXPECT_EQ(pwrite(fd_, "x", 1, 0), 1);
    fault_resume();
    EXPECT_EQ(fault_calls("write"), 0);
    EXPECT_EQ(pwrite(fd_, "x", 1, 0), -1);
}

TEST_F(Fault, RejectsMalformedPlans) {
    for (const char *plan :
         {"writ:1", "write", "write:", "write:0", "write:x", "write:1:EWHAT", "write:~1001",
          "write:1:short=", "write:1:seed=x", "write:1;bad", "write:1:5000"})
        EXPECT_EQ(fault_arm(plan), -1) << plan;
    EXPECT_EQ(fault_arm(""), 0);
    EXPECT_EQ(fault_calls("nonsense"), -1);
}

TEST(FaultAlloc, EveryWayToAllocateFails) {
    static void *block;
    const auto fails = [](auto &&call) {
        fault_arm("alloc:1");
        const bool failed = call();
        asm volatile("" : : "r"(block) : "memory"); // prevents the compiler from removing the allocation
        const bool met = fault_hits() == 1;
        fault_disarm();
        return failed && met;
    };
    EXPECT_TRUE(fails([&] { return !(block = std::malloc(10)); }));
    EXPECT_TRUE(fails([&] { return !(block = std::calloc(2, 10)); }));
    EXPECT_TRUE(fails([&] { return !(block = std::realloc(nullptr, 10)); }));
    EXPECT_TRUE(fails([&] { return !(block = std::aligned_alloc(64, 64)); }));
    EXPECT_TRUE(fails([&] {
        void *aligned = nullptr;
        return posix_memalign(&aligned, 64, 64) == ENOMEM;
    }));
    EXPECT_TRUE(fails([&] { return !(block = ::operator new(10, std::nothrow)); }));
    EXPECT_TRUE(fails([&] { return !(block = ::operator new[](10, std::nothrow)); }));
    EXPECT_TRUE(fails([&] {
        try {
            block = ::operator new(10);
        } catch (const std::bad_alloc &) {
            return true;
        }
        return false;
    }));
    EXPECT_TRUE(fails([&] {
        try {
            block = new char[10];
            asm volatile("" : : "r"(block) : "memory");
        } catch (const std::bad_alloc &) {
            return true;
        }
        return false;
    }));
}

TEST(FaultAlloc, LiveBlocksAreCounted) {
    const int64_t before = fault_live_blocks();
    void *block = std::malloc(10);
    EXPECT_EQ(fault_live_blocks(), before + 1);
    block = std::realloc(block, 100000);
    EXPECT_EQ(fault_live_blocks(), before + 1);
    auto *object = new std::vector<int>(100);
    EXPECT_EQ(fault_live_blocks(), before + 3);
    delete object;
    std::free(block);
    EXPECT_EQ(fault_live_blocks(), before);
}

// ---- the sweep ----

/// Makes three allocations; with `leak`, leaks the first when a later one fails.
uint32_t ThreeBlocks(bool leak) {
    void *first = std::malloc(1), *second = first ? std::malloc(2) : nullptr,
         *third = second ? std::malloc(3) : nullptr;
    const uint32_t status = third ? 0 : 1;
    std::free(third);
    std::free(second);
    if (third || !leak) std::free(first);
    return status;
}

TEST(FaultSweep, RunsUntilNoFaultOccurs) {
    std::vector<uint32_t> statuses;
    const uint64_t rounds = fault::Sweep(
        "alloc:%", [](fault::Child &) { return ThreeBlocks(false); },
        [&statuses](uint64_t, const fault::Report &report) {
            statuses.push_back(report.status);
            EXPECT_EQ(report.leakedBlocks, 0);
            EXPECT_EQ(report.leakedFds, 0);
        });
    EXPECT_EQ(rounds, 4u);
    EXPECT_EQ(statuses, (std::vector<uint32_t>{1, 1, 1, 0}));
}

TEST(FaultSweep, DetectsLeakedBlocksAndDescriptors) {
    fault::Sweep(
        "alloc:2", [](fault::Child &) { return (void)!dup(0), ThreeBlocks(true); },
        [](uint64_t, const fault::Report &report) {
            EXPECT_EQ(report.leakedBlocks, 1);
            EXPECT_EQ(report.leakedFds, 1);
        });
}

TEST(FaultSweep, CollectsNotes) {
    fault::Sweep(
        "alloc:%",
        [](fault::Child &child) {
            child.Note("a note");
            return 0u;
        },
        [](uint64_t, const fault::Report &report) { EXPECT_EQ(report.notes, "a note"); });
}

TEST(FaultSweep, DetectsAHeldLock) {
    static pthread_mutex_t mutex = PTHREAD_MUTEX_INITIALIZER;
    const auto run = [](bool hold) {
        bool held = false;
        fault::Options options;
        options.conclude = [](fault::Child &child) {
            child.CheckLock([] { pthread_mutex_lock(&mutex); }, [] { pthread_mutex_unlock(&mutex); });
        };
        fault::Sweep(
            "alloc:%",
            [hold](fault::Child &) { return hold ? static_cast<uint32_t>(pthread_mutex_lock(&mutex)) : 0u; },
            [&held](uint64_t, const fault::Report &report) { held = report.lockHeld; }, options);
        return held;
    };
    EXPECT_FALSE(run(false));
    EXPECT_TRUE(run(true));
}

} // namespace
