/* SPDX-License-Identifier: Apache-2.0 */
// Fails every system call and every allocation of the durable write in turn, and kills writers at each call.

#include "dvsfile/file_internal.h"
#include "dvsfile/state_dir.h"

#include <cerrno>
#include <csignal>
#include <cstring>

#include <sys/wait.h>
#include <unistd.h>

#include "fault/fault.h"
#include "fault/sweep.h"

namespace {

const std::string kOld(700, 'o');
const std::string kNew(1500, 'n');

constexpr int kErrors[] = {EINTR, EIO, ENOSPC, EROFS, EACCES, EMFILE};

class DurableFaults : public StateDir {
protected:
    DurableFaults() {
        options_.prepare = [](fault::Child &child) { DVSLog_SetSink(fault::Child::NoteMessage, &child); };
    }

    /// One write under a fault plan, over an old file and a stale temporary file. Checks what holds after
    /// every failure: the file is whole, old or new; nothing leaks; no temporary file remains.
    fault::Report Write(const std::string &plan,
                        std::chrono::milliseconds lockWait = std::chrono::seconds(5)) {
        Put(path_, Padded(kOld));
        Put(dir_ + "/.state.dvs-" + std::string(32, '0'), "stale");
        fault::Report last;
        fault::Sweep(
            plan,
            [&](fault::Child &) {
                return dvs::file::WriteDurable(path_.c_str(), kNew.data(), static_cast<uint32_t>(kNew.size()),
                                               lockWait);
            },
            [&](uint64_t, const fault::Report &report) {
                EXPECT_EQ(report.leakedBlocks, 0);
                EXPECT_EQ(report.leakedFds, 0);
                last = report;
            },
            options_);
        const std::string now = Contents(path_);
        EXPECT_TRUE(now == Padded(kOld) || now == Padded(kNew)) << "neither old nor new";
        std::set<std::string> names = Names(dir_);
        names.erase(".state.dvs-" + std::string(32, '0'));
        EXPECT_EQ(names, std::set<std::string>{"state"});
        return last;
    }

    fault::Options options_;
};

struct Row {
    const char *call;
    HYP_ReturnStatus status;
    const char *before; // the message around the file's name; "" for none
    const char *after;
    bool isNew; // what the path holds afterwards
};

const Row kRows[] = {
    {"readlink:1", HYP_IO_ERROR, "failed to open dvsfile ", " for write, error: ", false},
    // the directory; the scan for stale files, which may fail; the temporary file
    {"open:1", HYP_IO_ERROR, "failed to open dvsfile ", " for write, error: ", false},
    {"open:2", HYP_OK, "", "", true},
    {"open:3", HYP_IO_ERROR, "failed to open dvsfile ", " for write, error: ", false},
    // stat of the path and of the stale file: both may fail
    {"stat:1", HYP_OK, "", "", true},
    {"stat:2", HYP_OK, "", "", true},
    {"unlink:1", HYP_OK, "", "", true},
    {"chmod:1", HYP_IO_ERROR, "failed to open dvsfile ", " for write, error: ", false},
    {"fsync:1", HYP_WRITE_ERROR, "failed to write dvsfile ", ", error: ", false},
    {"rename:1", HYP_WRITE_ERROR, "failed to rename dvsfile ", ", error: ", false},
    {"fsync:2", HYP_WRITE_ERROR, "failed to write dvsfile ", ", error: ", true},
    {"close:1", HYP_OK, "", "", true},
    {"close:2", HYP_OK, "", "", true},
    {"flock:2", HYP_OK, "", "", true}, // the unlock
};

TEST_F(DurableFaults, EachFailedCallLeavesTheOldOrTheNewFile) {
    for (const Row &row : kRows) {
        for (const int error : kErrors) {
            SCOPED_TRACE(std::string(row.call) + " " + std::strerror(error));
            const fault::Report report = Write(std::string(row.call) + ":" + std::to_string(error));
            EXPECT_GT(report.hits, 0);
            EXPECT_EQ(report.status, row.status);
            EXPECT_EQ(report.notes,
                      *row.before ? row.before + path_ + row.after + std::strerror(error) + "\n" : "");
            EXPECT_EQ(Contents(path_), Padded(row.isNew ? kNew : kOld));
        }
    }
}

TEST_F(DurableFaults, FailedWriteReturnsWriteErrorAndEintrIsRetried) {
    for (const char *call : {"write:1", "write:2"}) {
        for (const int error : kErrors) {
            SCOPED_TRACE(std::string(call) + " " + std::strerror(error));
            const fault::Report report = Write(std::string(call) + ":" + std::to_string(error));
            EXPECT_EQ(report.hits, 1);
            EXPECT_EQ(report.status,
                      error == EINTR ? HYP_ReturnStatus{HYP_OK} : HYP_ReturnStatus{HYP_WRITE_ERROR});
            EXPECT_EQ(Contents(path_), Padded(error == EINTR ? kNew : kOld));
        }
    }
}

TEST_F(DurableFaults, ShortWritesAreContinued) {
    for (const char *count : {"1", "511", "512", "1000"}) {
        SCOPED_TRACE(count);
        for (const char *which : {"1", "2", "1+"}) {
            if (which[1] == '+' && std::strlen(count) < 3) continue; // one byte at a time is too slow
            const fault::Report report = Write(std::string("write:") + which + ":short=" + count);
            EXPECT_EQ(report.status, HYP_OK);
            EXPECT_EQ(Contents(path_), Padded(kNew));
        }
    }
}

TEST_F(DurableFaults, WriteWithoutProgressDoesNotHang) {
    const fault::Report report = Write("write:1+:short=0");
    EXPECT_EQ(report.status, HYP_WRITE_ERROR);
    EXPECT_EQ(report.notes, "failed to write dvsfile " + path_ + ", error: No space left on device\n");
    EXPECT_EQ(Contents(path_), Padded(kOld));
}

TEST_F(DurableFaults, LockIsRetriedUnlessItIsUnsupported) {
    EXPECT_EQ(Write("flock:1:EINTR").status, HYP_OK);
    EXPECT_EQ(Write("flock:1:EWOULDBLOCK").status, HYP_OK);
    EXPECT_EQ(Write("flock:1:ENOLCK").status, HYP_IO_ERROR);
    EXPECT_EQ(Contents(path_), Padded(kOld));
    EXPECT_EQ(Write("flock:1+:EWOULDBLOCK", std::chrono::milliseconds(40)).status, HYP_IO_ERROR);
    EXPECT_EQ(Contents(path_), Padded(kOld));
}

TEST_F(DurableFaults, TemporaryNamesAreRetriedUnlessAllExist) {
    EXPECT_EQ(Write("open:3:EEXIST").status, HYP_OK);
    EXPECT_EQ(Write("open:1+:EEXIST:writers").status, HYP_IO_ERROR);
    EXPECT_EQ(Contents(path_), Padded(kOld));
}

TEST_F(DurableFaults, FailsWithoutRandomBytes) {
    EXPECT_EQ(Write("random:1:EINTR").status, HYP_OK);
    EXPECT_EQ(Write("random:1:EIO").status, HYP_IO_ERROR);
    EXPECT_EQ(Write("random:1:short=8").status, HYP_IO_ERROR);
    EXPECT_EQ(Contents(path_), Padded(kOld));
}

TEST_F(DurableFaults, NeedsNoMemory) {
    const fault::Report report = Write("alloc:%");
    EXPECT_EQ(report.status, HYP_OK);
    EXPECT_EQ(Write("alloc:1+").status, HYP_OK) << "the stale file may stay, the save must not fail";
    EXPECT_EQ(Contents(path_), Padded(kNew));
}

TEST_F(DurableFaults, KilledWriterLeavesAWholeFileAndIsCleanedUp) {
    for (const char *call : {"open:1", "flock:1", "open:2", "open:3", "chmod:1", "write:1", "write:2",
                             "fsync:1", "rename:1", "fsync:2", "close:2"}) {
        SCOPED_TRACE(call);
        Put(path_, Padded(kOld));
        const pid_t pid = fork();
        if (pid == 0) {
            fault_arm((std::string(call) + ":kill").c_str());
            (void)DVSFile_WriteDurable(path_.c_str(), kNew.data(), static_cast<uint32_t>(kNew.size()));
            _exit(0);
        }
        int how = 0;
        ASSERT_EQ(waitpid(pid, &how, 0), pid);
        EXPECT_TRUE(WIFSIGNALED(how) && WTERMSIG(how) == SIGKILL);
        const std::string now = Contents(path_);
        EXPECT_TRUE(now == Padded(kOld) || now == Padded(kNew));
        EXPECT_EQ(DVSFile_WriteDurable(path_.c_str(), "after", 5), HYP_OK);
        EXPECT_EQ(Contents(path_), Padded("after"));
        EXPECT_EQ(Names(dir_), std::set<std::string>{"state"});
    }
}

} // namespace
