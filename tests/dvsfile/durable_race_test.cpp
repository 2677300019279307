/* SPDX-License-Identifier: Apache-2.0 */
// Several processes use one state file: writers wait for each other, readers see whole versions only.
// DVS_TEST_SAVES sets the number of saves per writer.

#include "dvsfile/state_dir.h"

#include <charconv>
#include <chrono>
#include <cstring>
#include <thread>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

using DurableRace = StateDir;

uint32_t SavesPerWriter() {
    const char *text = std::getenv("DVS_TEST_SAVES");
    uint32_t number = 100;
    if (text) std::from_chars(text, text + std::strlen(text), number);
    return number;
}

/// A version that can be verified: its number, and a size and a fill derived from the number.
std::string Version(uint32_t number) {
    std::string bytes(64 + number * 37 % 5000, static_cast<char>('a' + number % 26));
    std::memcpy(bytes.data(), &number, sizeof number);
    return bytes;
}

pid_t StartWriter(const std::string &path, uint32_t first, uint32_t num) {
    const pid_t pid = fork();
    if (pid != 0) return pid;
    for (uint32_t i = 0; i < num; i++) {
        const std::string bytes = Version(first + i);
        if (DVSFile_WriteDurable(path.c_str(), bytes.data(), static_cast<uint32_t>(bytes.size())) != HYP_OK)
            _exit(1);
    }
    _exit(0);
}

TEST_F(DurableRace, ReadsDuringTwoWritersSeeWholeVersions) {
    const uint32_t saves = SavesPerWriter();
    const std::string first = Version(0);
    ASSERT_EQ(DVSFile_WriteDurable(path_.c_str(), first.data(), static_cast<uint32_t>(first.size())), HYP_OK);
    pid_t writers[] = {StartWriter(path_, 1, saves), StartWriter(path_, 1000000, saves)};
    std::set<uint32_t> seen;
    int running = 2;
    while (running > 0) {
        const ReadBack back(path_);
        ASSERT_EQ(back.status, HYP_OK);
        uint32_t number = 0;
        std::memcpy(&number, back.buf, sizeof number);
        ASSERT_EQ(back.Bytes(), Padded(Version(number))) << number;
        seen.insert(number);
        for (pid_t &pid : writers) {
            int how = 0;
            if (pid <= 0 || waitpid(pid, &how, WNOHANG) != pid) continue;
            EXPECT_TRUE(WIFEXITED(how) && WEXITSTATUS(how) == 0) << "a writer's save failed";
            pid = 0;
            running--;
        }
    }
    EXPECT_GT(seen.size(), 2u);
    EXPECT_EQ(Names(dir_), std::set<std::string>{"state"});
}

TEST_F(DurableRace, WriterWaitsForTheLock) {
    const int fd = open(dir_.c_str(), O_RDONLY | O_DIRECTORY);
    ASSERT_EQ(flock(fd, LOCK_EX), 0);
    std::thread holder([fd] {
        std::this_thread::sleep_for(std::chrono::milliseconds(150));
        flock(fd, LOCK_UN);
    });
    EXPECT_EQ(DVSFile_WriteDurable(path_.c_str(), "new", 3), HYP_OK);
    holder.join();
    close(fd);
    EXPECT_EQ(Contents(path_), Padded("new"));
}

// The only test that waits in real time: the limit of 10 s is documented.
TEST_F(DurableRace, WriterTimesOutAfterTenSeconds) {
    const int fd = open(dir_.c_str(), O_RDONLY | O_DIRECTORY);
    ASSERT_EQ(flock(fd, LOCK_EX), 0);
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(DVSFile_WriteDurable(path_.c_str(), "new", 3), HYP_IO_ERROR);
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::seconds(10));
    close(fd);
    EXPECT_TRUE(Names(dir_).empty());
}

} // namespace
