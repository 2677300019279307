/* SPDX-License-Identifier: Apache-2.0 */
// Tests the durable write: results, modes, links, obstacles at the path, and the directory's lock.

#include "dvsfile/file_internal.h"
#include "dvsfile/state_dir.h"

#include <climits>
#include <filesystem>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;

class DurableWrite : public StateDir {
protected:
    HYP_ReturnStatus Write(const std::string &path, const std::string &bytes) {
        return DVSFile_WriteDurable(path.c_str(), bytes.data(), static_cast<uint32_t>(bytes.size()));
    }
    /// A temporary name that a writer of the state file could have left; `tail` distinguishes several.
    std::string StaleName(char tail) const { return dir_ + "/.state.dvs-" + std::string(31, '0') + tail; }
};

TEST_F(DurableWrite, PadsLikeThePlainWrite) {
    for (const std::size_t size : {1u, 164u, 511u, 512u, 513u, 70000u}) {
        const std::string bytes(size, 'b');
        ASSERT_EQ(Write(path_, bytes), HYP_OK);
        EXPECT_EQ(Contents(path_), Padded(bytes));
        const ReadBack back(path_);
        EXPECT_EQ(back.status, HYP_OK);
        EXPECT_EQ(back.Bytes(), Padded(bytes));
    }
    EXPECT_EQ(Names(dir_), std::set<std::string>{"state"});
    EXPECT_TRUE(messages_.empty());
}

TEST_F(DurableWrite, LeavesOtherFilesUnpadded) {
    ASSERT_EQ(dvs::file::WriteDurable(path_.c_str(), "text\n", 5, std::chrono::seconds(5),
                                      dvs::file::Padding::None),
              HYP_OK);
    EXPECT_EQ(Contents(path_), "text\n");
    EXPECT_EQ(Mode(path_) & 07777, 0600u);
}

TEST_F(DurableWrite, RejectsNoBytesAndTouchesNothing) {
    Put(path_, "old");
    Put(StaleName('1'), "stale");
    EXPECT_EQ(DVSFile_WriteDurable(path_.c_str(), "x", 0), HYP_BAD_PARAM);
    EXPECT_EQ(DVSFile_WriteDurable(path_.c_str(), nullptr, 1), HYP_BAD_PARAM);
    EXPECT_EQ(DVSFile_WriteDurable(path_.c_str(), "x", 0xffffffff), HYP_BAD_PARAM);
    EXPECT_EQ(DVSFile_WriteDurable(nullptr, "x", 1), HYP_NO_MEMORY);
    EXPECT_EQ(Contents(path_), "old");
    EXPECT_TRUE(fs::exists(StaleName('1')));
    EXPECT_TRUE(messages_.empty());
}

TEST_F(DurableWrite, SetsMode0600UnderAnyUmask) {
    for (const mode_t mask : {0u, 022u, 077u, 0177u, 0277u, 0777u}) {
        const mode_t before = umask(mask);
        const HYP_ReturnStatus fresh = Write(path_, "new");
        const mode_t freshMode = Mode(path_);
        chmod(path_.c_str(), 0644);
        const HYP_ReturnStatus again = Write(path_, "newer");
        const mode_t againMode = Mode(path_);
        umask(before);
        EXPECT_EQ(fresh, HYP_OK) << mask;
        EXPECT_EQ(again, HYP_OK) << mask;
        EXPECT_EQ(freshMode & 07777, 0600u) << mask;
        EXPECT_EQ(againMode & 07777, 0600u) << mask;
        fs::remove(path_);
    }
}

TEST_F(DurableWrite, WorksOnANameInTheWorkingDirectory) {
    const fs::path before = fs::current_path();
    fs::current_path(dir_);
    const HYP_ReturnStatus status = Write("state", "new");
    fs::current_path(before);
    EXPECT_EQ(status, HYP_OK);
    EXPECT_EQ(Contents(path_), Padded("new"));
}

TEST_F(DurableWrite, AcceptsTheLongestName) {
    const std::string path = dir_ + "/" + std::string(NAME_MAX, 'n');
    EXPECT_EQ(Write(path, "new"), HYP_OK);
    EXPECT_EQ(Contents(path), Padded("new"));
}

TEST_F(DurableWrite, KeepsOtherHardLinksOfTheOldFile) {
    Put(path_, "old");
    fs::create_hard_link(path_, dir_ + "/other");
    EXPECT_EQ(Write(path_, "new"), HYP_OK);
    EXPECT_EQ(Contents(dir_ + "/other"), "old");
}

// ---- links ----

TEST_F(DurableWrite, FollowsALinkAndKeepsIt) {
    fs::create_directory(dir_ + "/real");
    Put(dir_ + "/real/file", "old");
    fs::create_symlink("real/file", path_);              // relative to the link
    fs::create_symlink(path_, dir_ + "/second");         // absolute, and a chain
    fs::create_symlink(dir_ + "/real", dir_ + "/alias"); // of a directory: the kernel follows it
    for (const std::string &path : {path_, dir_ + "/second", dir_ + "/alias/file"}) {
        ASSERT_EQ(Write(path, "through " + path), HYP_OK);
        EXPECT_EQ(Contents(dir_ + "/real/file"), Padded("through " + path));
    }
    EXPECT_TRUE(fs::is_symlink(path_));
    EXPECT_TRUE(fs::is_symlink(dir_ + "/second"));
    EXPECT_EQ(Names(dir_ + "/real"), std::set<std::string>{"file"});
}

TEST_F(DurableWrite, CreatesTheTargetOfADanglingLink) {
    fs::create_directory(dir_ + "/real");
    fs::create_symlink("real/absent", path_);
    ASSERT_EQ(Write(path_, "new"), HYP_OK);
    EXPECT_TRUE(fs::is_symlink(path_));
    EXPECT_EQ(Contents(dir_ + "/real/absent"), Padded("new"));
    EXPECT_EQ(Mode(dir_ + "/real/absent") & 07777, 0600u);
}

TEST_F(DurableWrite, RejectsALoopOfLinks) {
    fs::create_symlink("second", path_);
    fs::create_symlink("state", dir_ + "/second");
    EXPECT_EQ(Write(path_, "new"), HYP_IO_ERROR);
    EXPECT_EQ(Messages(),
              "failed to open dvsfile " + path_ + " for write, error: Too many levels of symbolic links\n");
}

TEST_F(DurableWrite, RejectsAPathThatIsTooLong) {
    EXPECT_EQ(Write(dir_ + "/" + std::string(5000, 'x'), "new"), HYP_IO_ERROR);
    EXPECT_TRUE(Messages().ends_with("error: File name too long\n"));
    fs::create_symlink(std::string(4000, 'x'), path_);
    EXPECT_EQ(Write(dir_ + std::string(200, '/') + "state", "new"), HYP_IO_ERROR)
        << "a link target that is too long";
}

// ---- obstacles at the path ----

TEST_F(DurableWrite, ReturnsIoErrorWithoutADirectory) {
    EXPECT_EQ(Write(dir_ + "/none/state", "new"), HYP_IO_ERROR);
    EXPECT_EQ(Messages(),
              "failed to open dvsfile " + dir_ + "/none/state for write, error: No such file or directory\n");
    EXPECT_EQ(Write("", "new"), HYP_IO_ERROR);
    EXPECT_EQ(Write(dir_ + "/", "new"), HYP_IO_ERROR);
}

TEST_F(DurableWrite, ReturnsWriteErrorForADirectory) {
    fs::create_directory(path_);
    EXPECT_EQ(Write(path_, "new"), HYP_WRITE_ERROR);
    EXPECT_EQ(Messages(), "failed to rename dvsfile " + path_ + ", error: Is a directory\n");
    EXPECT_TRUE(fs::is_directory(path_));
    EXPECT_EQ(Names(dir_), std::set<std::string>{"state"});
}

TEST_F(DurableWrite, DoesNotReplaceAFifoOrASocket) {
    alarm(30);
    ASSERT_EQ(mkfifo(path_.c_str(), 0600), 0);
    EXPECT_EQ(Write(path_, "new"), HYP_IO_ERROR);
    EXPECT_TRUE(S_ISFIFO(Mode(path_)));
    fs::remove(path_);
    const int fd = socket(AF_UNIX, SOCK_STREAM, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path_.copy(address.sun_path, sizeof address.sun_path - 1);
    ASSERT_EQ(bind(fd, reinterpret_cast<sockaddr *>(&address), sizeof address), 0);
    EXPECT_EQ(Write(path_, "new"), HYP_IO_ERROR);
    EXPECT_TRUE(S_ISSOCK(Mode(path_)));
    close(fd);
}

TEST_F(DurableWrite, RemovesItsOwnStaleFiles) {
    Put(dir_ + "/precious", "precious");
    Put(StaleName('1'), "left by a killed writer");
    fs::create_hard_link(dir_ + "/precious", StaleName('2'));
    ASSERT_EQ(Write(path_, "new"), HYP_OK);
    EXPECT_EQ(Names(dir_), (std::set<std::string>{"state", "precious"}));
    EXPECT_EQ(Contents(dir_ + "/precious"), "precious");
}

TEST_F(DurableWrite, KeepsFilesOfOtherNames) {
    Put(dir_ + "/precious", "precious");
    fs::create_symlink("precious", StaleName('1'));
    fs::create_directory(StaleName('2'));
    ASSERT_EQ(mkfifo(StaleName('3').c_str(), 0600), 0);
    fs::create_symlink("precious", dir_ + "/state.tmp");
    Put(dir_ + "/.other.dvs-" + std::string(32, '0'), "another file's");
    Put(StaleName('1') + "1", "one digit too many");
    Put(dir_ + "/.state.dvs-" + std::string(32, 'G'), "no digits");
    std::set<std::string> names = Names(dir_);
    ASSERT_EQ(Write(path_, "new"), HYP_OK);
    names.insert("state");
    EXPECT_EQ(Names(dir_), names);
    EXPECT_EQ(Contents(dir_ + "/precious"), "precious");
}

TEST_F(DurableWrite, KeepsThePlainWritesTemporaryFile) {
    for (const char *kind : {"directory", "fifo", "link"}) {
        const std::string temp = path_ + ".tmp";
        if (kind[0] == 'd') fs::create_directory(temp);
        if (kind[0] == 'f') {
            ASSERT_EQ(mkfifo(temp.c_str(), 0600), 0);
        }
        if (kind[0] == 'l') fs::create_symlink("/nowhere/at/all", temp);
        EXPECT_EQ(Write(path_, kind), HYP_OK);
        EXPECT_EQ(Contents(path_), Padded(kind));
        fs::remove(temp);
    }
}

// ---- the lock ----

TEST_F(DurableWrite, TimesOutWhenTheDirectoryStaysLocked) {
    Put(path_, "old");
    Put(StaleName('1'), "may be in use by the lock's holder");
    const int fd = open(dir_.c_str(), O_RDONLY | O_DIRECTORY);
    ASSERT_EQ(flock(fd, LOCK_EX), 0);
    EXPECT_EQ(dvs::file::WriteDurable(path_.c_str(), "new", 3, std::chrono::milliseconds(50)), HYP_IO_ERROR);
    EXPECT_EQ(Messages(), "failed to lock the directory of dvsfile " + path_ +
                              ", error: Resource temporarily unavailable\n");
    EXPECT_EQ(Contents(path_), "old");
    EXPECT_TRUE(fs::exists(StaleName('1')));
    close(fd);
    EXPECT_EQ(Write(path_, "new"), HYP_OK) << "the lock is free again";
}

TEST_F(DurableWrite, ReleasesTheLock) {
    EXPECT_EQ(Write(path_, "new"), HYP_OK);
    fs::create_directory(dir_ + "/d");
    EXPECT_EQ(Write(dir_ + "/d", "new"), HYP_WRITE_ERROR);
    const int fd = open(dir_.c_str(), O_RDONLY | O_DIRECTORY);
    EXPECT_EQ(flock(fd, LOCK_EX | LOCK_NB), 0);
    close(fd);
}

} // namespace
