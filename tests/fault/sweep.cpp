/* SPDX-License-Identifier: Apache-2.0 */
// Runs rounds of one scenario in forked children (sweep.h). A child sends its result through a pipe and exits
// with _exit, so that the parent's buffers are not flushed twice and its test framework does not run twice.

#include "fault/sweep.h"

#include <gtest/gtest.h>

#include <atomic>
#include <cerrno>
#include <charconv>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <thread>

#include <dirent.h>
#include <sys/wait.h>
#include <unistd.h>

#include "fault/fault.h"

#ifdef DVS_COVERAGE
extern "C" void __gcov_dump(void); // _exit would lose the coverage counters
#endif

namespace fault {

namespace {

constexpr std::size_t kNotesSize = 8192;

/// The header that precedes the notes in the pipe.
struct Wire {
    uint32_t status;
    int64_t hits;
    int64_t leakedBlocks;
    int leakedFds;
    bool lockHeld;
};

int CountFds() {
    DIR *stream = opendir("/proc/self/fd");
    int num = 0;
    while (readdir(stream))
        num++;
    closedir(stream);
    return num;
}

void WriteAll(int fd, const void *data, std::size_t size) {
    const char *at = static_cast<const char *>(data);
    while (size > 0) {
        const ssize_t written = write(fd, at, size);
        if (written <= 0) _exit(3);
        at += written;
        size -= static_cast<std::size_t>(written);
    }
}

std::string ReadAll(int fd) {
    std::string all;
    char chunk[4096];
    for (;;) {
        const ssize_t got = read(fd, chunk, sizeof chunk);
        if (got < 0 && errno == EINTR) continue;
        if (got <= 0) return all;
        all.append(chunk, static_cast<std::size_t>(got));
    }
}

} // namespace

struct ChildAccess {
    static void SetNotes(Child *child, std::string *notes) { child->notes_ = notes; }
    static bool LockHeld(const Child &child) { return child.lockHeld_; }
};

void Child::Unfaulted(const std::function<void()> &work) {
    fault_suspend();
    work();
    fault_resume();
}

void Child::Note(const char *text) {
    if (notes_ && notes_->size() + std::strlen(text) <= notes_->capacity()) notes_->append(text);
}

void Child::NoteMessage(int, const char *text, void *child) {
    static_cast<Child *>(child)->Note(text);
}

void Child::CheckLock(const std::function<void()> &take, const std::function<void()> &release) {
    static std::atomic<bool> free;
    free = false;
    std::thread other([&] {
        take();
        release();
        free = true;
    });
    for (int i = 0; i < 5000 && !free; i++)
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    if (free) {
        other.join();
        return;
    }
    other.detach();
    lockHeld_ = true;
}

namespace {

[[noreturn]] void RunChild(int out, const std::string &plan, const Scenario &scenario,
                           const Options &options) {
    alarm(options.timeoutSeconds);
    std::string notes;
    notes.reserve(kNotesSize);
    Child child;
    ChildAccess::SetNotes(&child, &notes);
    Wire wire{};
    const auto round = [&](const char *armed) {
        if (options.prepare) options.prepare(child);
        if (fault_arm(armed) != 0) _exit(2);
        wire.status = scenario(child);
        wire.hits = fault_hits();
        fault_disarm();
        if (options.conclude) options.conclude(child);
    };
    if (options.warmUp) round("");
    notes.clear();
    const int fds = CountFds();
    const int64_t blocks = fault_live_blocks();
    round(plan.c_str());
    wire.leakedBlocks = fault_live_blocks() - blocks;
    wire.leakedFds = CountFds() - fds;
    wire.lockHeld = ChildAccess::LockHeld(child);
    WriteAll(out, &wire, sizeof wire);
    WriteAll(out, notes.data(), notes.size());
#ifdef DVS_COVERAGE
    __gcov_dump();
#endif
    _exit(0);
}

Report RunRound(const std::string &plan, const Scenario &scenario, const Options &options) {
    Report report;
    report.crashed = true;
    int ends[2];
    if (pipe(ends) != 0) return report;
    const pid_t pid = fork();
    if (pid == 0) {
        close(ends[0]);
        RunChild(ends[1], plan, scenario, options);
    }
    close(ends[1]);
    const std::string told = ReadAll(ends[0]);
    close(ends[0]);
    int how = 0;
    while (waitpid(pid, &how, 0) < 0 && errno == EINTR) {
    }
    if (!WIFEXITED(how) || WEXITSTATUS(how) != 0 || told.size() < sizeof(Wire)) {
        report.notes = WIFSIGNALED(how) ? "signal " + std::to_string(WTERMSIG(how))
                                        : "exit status " + std::to_string(WEXITSTATUS(how));
        return report;
    }
    Wire wire;
    std::memcpy(&wire, told.data(), sizeof wire);
    return {wire.status,   wire.hits, wire.leakedBlocks,       wire.leakedFds,
            wire.lockHeld, false,     told.substr(sizeof wire)};
}

} // namespace

uint64_t Sweep(const std::string &plan, const Scenario &scenario, const Check &check,
               const Options &options) {
    const std::size_t mark = plan.find('%');
    uint64_t rounds = 0;
    for (uint64_t k = 1; rounds < options.maxRounds; k += options.step) {
        std::string armed = plan;
        if (mark != std::string::npos) armed.replace(mark, 1, std::to_string(k));
        SCOPED_TRACE("fault " + armed);
        const Report report = RunRound(armed, scenario, options);
        rounds++;
        if (report.crashed) {
            ADD_FAILURE() << "the child ended with " << report.notes;
            return rounds;
        }
        check(k, report);
        if (report.hits == 0 || mark == std::string::npos || testing::Test::HasFatalFailure()) return rounds;
    }
    ADD_FAILURE() << "still faults after " << rounds << " rounds of " << plan;
    return rounds;
}

uint64_t FromEnvironment(const char *variable, uint64_t fallback) {
    const char *text = std::getenv(variable);
    uint64_t number = 0;
    if (!text) return fallback;
    const auto [stop, error] = std::from_chars(text, text + std::strlen(text), number);
    return error == std::errc() && *stop == '\0' ? number : fallback;
}

} // namespace fault
