/* SPDX-License-Identifier: Apache-2.0 */
// Fails every system call and every allocation of the documented sequences in turn.

#include "dvsfile/state_dir.h"

#include <cerrno>
#include <cstring>

#include "fault/sweep.h"

namespace {

const std::string kOld(700, 'o');
const std::string kNew(1500, 'n');

constexpr int kErrors[] = {EINTR, EIO, ENOSPC, EROFS, EACCES, EMFILE};

class FileFaults : public StateDir {
protected:
    FileFaults() {
        options_.prepare = [](fault::Child &child) { DVSLog_SetSink(fault::Child::NoteMessage, &child); };
    }

    /// One write under a fault plan, over an old file. Checks the report for leaks.
    fault::Report Write(const std::string &plan, bool viaTemp) {
        std::filesystem::remove(path_ + ".tmp");
        Put(path_, Padded(kOld));
        fault::Report last;
        fault::Sweep(
            plan,
            [&](fault::Child &) {
                return DVSFile_WriteClassical(path_.c_str(), kNew.data(), static_cast<uint32_t>(kNew.size()),
                                              viaTemp);
            },
            [&last](uint64_t, const fault::Report &report) {
                EXPECT_EQ(report.leakedBlocks, 0);
                EXPECT_EQ(report.leakedFds, 0);
                last = report;
            },
            options_);
        return last;
    }

    fault::Report Read(const std::string &plan) {
        fault::Report last;
        fault::Sweep(
            plan, [&](fault::Child &) { return ReadBack(path_).status; },
            [&last](uint64_t, const fault::Report &report) {
                EXPECT_EQ(report.leakedBlocks, 0);
                EXPECT_EQ(report.leakedFds, 0);
                last = report;
            },
            options_);
        return last;
    }

    fault::Options options_;
};

struct WriteRow {
    const char *call; // kind and which
    HYP_ReturnStatus status;
    const char *before; // the message around the file's name; "" for none
    const char *after;
};

const WriteRow kWriteRows[] = {
    {"open:1", HYP_OK, "", ""}, // falls back to the plain open
    {"open:1+", HYP_IO_ERROR, "failed to open dvsfile ", " for write, error: "},
    {"truncate:1", HYP_IO_ERROR, "failed to truncate dvsfile ", ", error: "},
    {"write:1", HYP_WRITE_ERROR, "failed to write dvsfile ", ", error: "},
    {"rename:1", HYP_WRITE_ERROR, "failed to rename dvsfile ", ", error: "},
    {"close:1", HYP_OK, "", ""}, // a failed close is ignored
};

TEST_F(FileFaults, FailedWriteViaTemporaryFileKeepsTheOldFile) {
    for (const WriteRow &row : kWriteRows) {
        for (const int error : kErrors) {
            SCOPED_TRACE(std::string(row.call) + " " + std::strerror(error));
            const fault::Report report = Write(std::string(row.call) + ":" + std::to_string(error), true);
            EXPECT_GT(report.hits, 0);
            EXPECT_EQ(report.status, row.status);
            const std::string target = path_ + ".tmp";
            EXPECT_EQ(report.notes,
                      *row.before ? row.before + target + row.after + std::strerror(error) + "\n" : "");
            EXPECT_EQ(Contents(path_), Padded(row.status == HYP_OK ? kNew : kOld));
        }
    }
}

TEST_F(FileFaults, FailedWriteInPlaceReturnsItsStatus) {
    for (const WriteRow &row : kWriteRows) {
        if (std::strncmp(row.call, "rename", 6) == 0) continue;
        for (const int error : kErrors) {
            SCOPED_TRACE(std::string(row.call) + " " + std::strerror(error));
            const fault::Report report = Write(std::string(row.call) + ":" + std::to_string(error), false);
            EXPECT_GT(report.hits, 0);
            EXPECT_EQ(report.status, row.status);
            EXPECT_EQ(report.notes,
                      *row.before ? row.before + path_ + row.after + std::strerror(error) + "\n" : "");
            if (row.status == HYP_WRITE_ERROR) {
                EXPECT_EQ(Contents(path_).size(), 1u);
            }
            if (row.status == HYP_OK) {
                EXPECT_EQ(Contents(path_), Padded(kNew));
            }
        }
    }
}

TEST_F(FileFaults, ShortWriteIsAWriteError) {
    for (const char *count : {"0", "1", "512", "1535"}) {
        SCOPED_TRACE(count);
        const fault::Report report = Write(std::string("write:1:short=") + count, true);
        EXPECT_EQ(report.hits, 1);
        EXPECT_EQ(report.status, HYP_WRITE_ERROR);
        EXPECT_TRUE(report.notes.starts_with("failed to write dvsfile " + path_ + ".tmp, error: "))
            << report.notes;
        EXPECT_EQ(Contents(path_), Padded(kOld));
    }
}

TEST_F(FileFaults, FailedRenameKeepsTheTemporaryFile) {
    EXPECT_EQ(Write("rename:1:EACCES", true).status, HYP_WRITE_ERROR);
    EXPECT_EQ(Contents(path_ + ".tmp"), Padded(kNew));
}

TEST_F(FileFaults, WriteReturnsNoMemoryWhenAnyAllocationFails) {
    for (const bool viaTemp : {false, true}) {
        for (int k = 1; k <= (viaTemp ? 2 : 1); k++) {
            const fault::Report report = Write("alloc:" + std::to_string(k), viaTemp);
            EXPECT_EQ(report.hits, 1);
            EXPECT_EQ(report.status, HYP_NO_MEMORY);
            if (viaTemp) {
                EXPECT_EQ(Contents(path_), Padded(kOld));
            }
        }
        const fault::Report report = Write(viaTemp ? "alloc:3" : "alloc:2", viaTemp);
        EXPECT_EQ(report.hits, 0) << "an allocation that this test does not expect";
        EXPECT_EQ(report.status, HYP_OK);
    }
}

TEST_F(FileFaults, FailedReadReturnsItsStatus) {
    Put(path_, Padded(kOld));
    for (const int error : kErrors) {
        SCOPED_TRACE(std::strerror(error));
        const std::string tail = ":" + std::to_string(error);
        EXPECT_EQ(Read("open:1" + tail).status, HYP_OK) << "falls back to the plain open";
        const fault::Report report = Read("open:1+" + tail);
        EXPECT_EQ(report.status, HYP_NOT_FOUND);
        EXPECT_EQ(report.notes,
                  "failed to open dvsfile " + path_ + " for read, error: " + std::strerror(error) + "\n");
        EXPECT_EQ(Read("stat:1" + tail).status, HYP_FILE_EMPTY);
        EXPECT_EQ(Read("stat:1" + tail).notes, "");
        EXPECT_EQ(Read("read:1" + tail).status, HYP_READ_ERROR);
        EXPECT_EQ(Read("read:1" + tail).notes, "");
        EXPECT_EQ(Read("close:1" + tail).status, HYP_OK);
    }
    for (const char *count : {"0", "1", "512"}) {
        const fault::Report report = Read(std::string("read:1:short=") + count);
        EXPECT_EQ(report.hits, 1);
        EXPECT_EQ(report.status, HYP_READ_ERROR);
    }
}

TEST_F(FileFaults, ReadReturnsNoMemory) {
    Put(path_, Padded(kOld));
    const fault::Report report = Read("alloc:1");
    EXPECT_EQ(report.hits, 1);
    EXPECT_EQ(report.status, HYP_NO_MEMORY);
    EXPECT_EQ(Read("alloc:2").hits, 0);
}

} // namespace
