/* SPDX-License-Identifier: Apache-2.0 */
// Tests the documented sequences of writing and reading: sizes, padding, statuses, messages, and paths that
// are not regular files.

#include "dvsfile/state_dir.h"

#include <cstdint>
#include <cstring>

#include <fcntl.h>
#include <unistd.h>

#include "fault/fault.h"

namespace {

using FileWrite = StateDir;
using FileRead = StateDir;

TEST_F(FileWrite, Pads164BytesToOneBlock) {
    const std::string bytes(164, 'b');
    ASSERT_EQ(DVSFile_Write(path_.c_str(), bytes.data(), 164), HYP_OK);
    EXPECT_EQ(Contents(path_), Padded(bytes));
    EXPECT_EQ(Contents(path_).size(), 512u);
    const ReadBack back(path_);
    ASSERT_EQ(back.status, HYP_OK);
    EXPECT_EQ(back.len, 512u);
    EXPECT_EQ(reinterpret_cast<uintptr_t>(back.buf) % 512, 0u);
    EXPECT_LT(back.alignOffset, 512u);
    EXPECT_EQ(back.Bytes(), Padded(bytes));
    EXPECT_TRUE(messages_.empty());
}

TEST_F(FileWrite, Pads513BytesToTwoBlocks) {
    const std::string bytes(513, 'c');
    ASSERT_EQ(DVSFile_Write(path_.c_str(), bytes.data(), 513), HYP_OK);
    EXPECT_EQ(Contents(path_), Padded(bytes));
    EXPECT_EQ(Contents(path_).size(), 1024u);
}

TEST_F(FileWrite, DoesNotPadAWholeBlock) {
    const std::string bytes(512, 'd');
    ASSERT_EQ(DVSFile_WriteClassical(path_.c_str(), bytes.data(), 512, false), HYP_OK);
    EXPECT_EQ(Contents(path_), bytes);
}

TEST_F(FileWrite, OfNoBytesLeavesOneByteThatReadsReject) {
    for (const bool viaTemp : {false, true}) {
        ASSERT_EQ(DVSFile_WriteClassical(path_.c_str(), nullptr, 0, viaTemp), HYP_OK);
        EXPECT_EQ(Contents(path_).size(), 1u);
        EXPECT_EQ(ReadBack(path_).status, HYP_IO_ERROR);
    }
}

TEST_F(FileWrite, TruncatesALongerFile) {
    Put(path_, std::string(5000, 'o'));
    Put(path_ + ".tmp", std::string(5000, 'o'));
    for (const bool viaTemp : {false, true}) {
        ASSERT_EQ(DVSFile_WriteClassical(path_.c_str(), "new", 3, viaTemp), HYP_OK);
        EXPECT_EQ(Contents(path_), Padded("new"));
    }
    EXPECT_EQ(Names(dir_), std::set<std::string>{"state"});
}

TEST_F(FileWrite, CreatesFilesForTheOwnerOnly) {
    ASSERT_EQ(DVSFile_Write(path_.c_str(), "x", 1), HYP_OK);
    EXPECT_EQ(Mode(path_) & 07777, 0600u);
}

TEST_F(FileWrite, FailingRenameLeavesTheTemporaryFile) {
    std::filesystem::create_directory(path_);
    EXPECT_EQ(DVSFile_Write(path_.c_str(), "new", 3), HYP_WRITE_ERROR);
    EXPECT_EQ(Contents(path_ + ".tmp"), Padded("new"));
    EXPECT_EQ(Messages(), "failed to rename dvsfile " + path_ + ".tmp, error: Is a directory\n");
}

TEST_F(FileWrite, ReturnsIoErrorWithoutADirectory) {
    const std::string path = dir_ + "/none/state";
    EXPECT_EQ(DVSFile_Write(path.c_str(), "x", 1), HYP_IO_ERROR);
    EXPECT_EQ(Messages(),
              "failed to open dvsfile " + path + ".tmp for write, error: No such file or directory\n");
    messages_.clear();
    EXPECT_EQ(DVSFile_WriteClassical(path.c_str(), "x", 1, false), HYP_IO_ERROR);
    EXPECT_EQ(Messages(),
              "failed to open dvsfile " + path + " for write, error: No such file or directory\n");
}

TEST_F(FileWrite, ReturnsIoErrorForADirectory) {
    EXPECT_EQ(DVSFile_WriteClassical(dir_.c_str(), "x", 1, false), HYP_IO_ERROR);
    EXPECT_EQ(Messages(), "failed to open dvsfile " + dir_ + " for write, error: Is a directory\n");
}

TEST_F(FileWrite, OntoAFifoDoesNotHang) {
    alarm(30);
    ASSERT_EQ(mkfifo(path_.c_str(), 0600), 0);
    EXPECT_EQ(DVSFile_WriteClassical(path_.c_str(), "x", 1, false), HYP_IO_ERROR) << "the FIFO has no reader";
    messages_.clear();
    const int reader = open(path_.c_str(), O_RDONLY | O_NONBLOCK);
    EXPECT_EQ(DVSFile_WriteClassical(path_.c_str(), "x", 1, false), HYP_IO_ERROR) << "no truncate on a FIFO";
    EXPECT_EQ(Messages(), "failed to truncate dvsfile " + path_ + ", error: Invalid argument\n");
    close(reader);
}

TEST_F(FileWrite, ReturnsNoMemoryForANullPath) {
    EXPECT_EQ(DVSFile_WriteClassical(nullptr, "x", 1, false), HYP_NO_MEMORY);
    EXPECT_EQ(DVSFile_WriteClassical(nullptr, "x", 1, true), HYP_NO_MEMORY);
}

TEST_F(FileWrite, RejectsANullBufferAndFourGigabytes) {
    Put(path_, "old");
    for (const bool viaTemp : {false, true}) {
        EXPECT_EQ(DVSFile_WriteClassical(path_.c_str(), nullptr, 1, viaTemp), HYP_BAD_PARAM);
        EXPECT_EQ(DVSFile_WriteClassical(path_.c_str(), "x", 0xffffffff, viaTemp), HYP_BAD_PARAM);
        EXPECT_EQ(DVSFile_WriteClassical(path_.c_str(), "x", 0xfffffe01, viaTemp), HYP_BAD_PARAM);
    }
    EXPECT_EQ(Contents(path_), "old");
    EXPECT_EQ(Names(dir_), std::set<std::string>{"state"});
}

TEST_F(FileRead, ReturnsNotFoundForAMissingFile) {
    EXPECT_EQ(ReadBack(path_).status, HYP_NOT_FOUND);
    EXPECT_EQ(Messages(),
              "failed to open dvsfile " + path_ + " for read, error: No such file or directory\n");
}

TEST_F(FileRead, ReturnsFileEmptyForAnEmptyFile) {
    Put(path_, "");
    EXPECT_EQ(ReadBack(path_).status, HYP_FILE_EMPTY);
    EXPECT_TRUE(messages_.empty());
}

TEST_F(FileRead, ReturnsIoErrorFor1000Bytes) {
    Put(path_, std::string(1000, 'x'));
    EXPECT_EQ(ReadBack(path_).status, HYP_IO_ERROR);
    EXPECT_EQ(Messages(), "failed to verify dvsfile " + path_ + " with length 1000\n");
}

TEST_F(FileRead, OfAFifoDoesNotHang) {
    alarm(30);
    ASSERT_EQ(mkfifo(path_.c_str(), 0600), 0);
    EXPECT_EQ(ReadBack(path_).status, HYP_FILE_EMPTY);
}

TEST_F(FileRead, OfADirectoryFails) {
    EXPECT_NE(ReadBack(dir_).status, HYP_OK);
}

TEST_F(FileRead, RejectsFourGigabytesBeforeAllocating) {
    for (const off_t size : {off_t{1} << 32, (off_t{1} << 32) + 1, off_t{1} << 40}) {
        Put(path_, "");
        ASSERT_EQ(truncate(path_.c_str(), size), 0);
        void *buf = nullptr;
        uint32_t len = 0, alignOffset = 0;
        ASSERT_EQ(fault_arm(""), 0);
        const HYP_ReturnStatus status = DVSFile_Read(path_.c_str(), &buf, &len, &alignOffset);
        EXPECT_EQ(fault_calls("alloc"), 0);
        EXPECT_EQ(status, HYP_BAD_PARAM);
    }
    EXPECT_TRUE(messages_.empty());
}

TEST_F(FileRead, KeepsItsOutputsOnFailure) {
    Put(path_, std::string(1000, 'x'));
    void *buf = this;
    uint32_t len = 1, alignOffset = 2;
    for (const std::string &path : {path_, dir_ + "/none"}) {
        EXPECT_NE(DVSFile_ReadClassical(path.c_str(), &buf, &len, &alignOffset), HYP_OK);
        EXPECT_EQ(buf, this);
        EXPECT_EQ(len, 1u);
        EXPECT_EQ(alignOffset, 2u);
    }
}

TEST_F(FileRead, RejectsNullArguments) {
    void *buf = nullptr;
    uint32_t len = 0, alignOffset = 0;
    EXPECT_EQ(DVSFile_Read(nullptr, &buf, &len, &alignOffset), HYP_NOT_FOUND);
    EXPECT_EQ(DVSFile_Read(path_.c_str(), nullptr, &len, &alignOffset), HYP_BAD_PARAM);
    EXPECT_EQ(DVSFile_Read(path_.c_str(), &buf, nullptr, &alignOffset), HYP_BAD_PARAM);
    EXPECT_EQ(DVSFile_Read(path_.c_str(), &buf, &len, nullptr), HYP_BAD_PARAM);
}

class FileDirect : public StateDir {
protected:
    ~FileDirect() override { fault_disarm(); }
    void WriteAndRead(const std::string &path) {
        for (const bool viaTemp : {false, true}) {
            ASSERT_EQ(DVSFile_WriteClassical(path.c_str(), "state", 5, viaTemp), HYP_OK);
            const ReadBack back(path);
            ASSERT_EQ(back.status, HYP_OK);
            EXPECT_EQ(back.Bytes(), Padded("state"));
        }
        EXPECT_TRUE(messages_.empty());
    }
};

TEST_F(FileDirect, IsTriedFirstByEveryOpen) {
    ASSERT_EQ(fault_arm("open:1+:EINVAL:direct"), 0);
    WriteAndRead(path_);
    EXPECT_EQ(fault_hits(), 4) << "two writes and two reads";
}

TEST_F(FileDirect, WriteSucceedsOnAMemoryFileSystem) {
    char name[] = "/dev/shm/dvs-file-XXXXXX";
    if (!mkdtemp(name)) GTEST_SKIP() << "no /dev/shm on this machine";
    WriteAndRead(std::string(name) + "/state");
    std::filesystem::remove_all(name);
}

TEST(FileLog, GoesToTheSystemLogWithoutASink) {
    testing::internal::CaptureStderr();
    void *buf = nullptr;
    uint32_t len = 0, alignOffset = 0;
    EXPECT_EQ(DVSFile_Read("/nowhere/state", &buf, &len, &alignOffset), HYP_NOT_FOUND);
    const std::string text = testing::internal::GetCapturedStderr();
    EXPECT_TRUE(text.ends_with(
        " level 2: failed to open dvsfile /nowhere/state for read, error: No such file or directory\n"))
        << text;
}

} // namespace
