/* SPDX-License-Identifier: Apache-2.0 */
// Starts and stops emulators for tests.

#include "emulator/emulator_process.h"

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <stdexcept>

#include <fcntl.h>
#include <poll.h>
#include <sys/wait.h>
#include <unistd.h>

namespace dvs::test {

namespace {

int StatusOf(pid_t child) {
    int status = 0;
    while (waitpid(child, &status, 0) == -1 && errno == EINTR) {
    }
    return WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
}

/// Returns whether the child ends soon. Does not reap it.
bool EndsWithinSeconds(pid_t child, int seconds) {
    for (int i = 0; i < seconds * 500; i++) {
        siginfo_t info{};
        if (waitid(P_PID, static_cast<id_t>(child), &info, WEXITED | WNOHANG | WNOWAIT) == 0 &&
            info.si_pid != 0)
            return true;
        usleep(2000);
    }
    return false;
}

pid_t Spawn(const std::vector<std::string> &words, int out, int err) {
    std::vector<char *> argv;
    for (const std::string &word : words)
        argv.push_back(const_cast<char *>(word.c_str()));
    argv.push_back(nullptr);
    const pid_t child = fork();
    if (child != 0) return child;
    if (out != -1) dup2(out, 1);
    if (err != -1) dup2(err, 2);
    std::signal(SIGHUP, SIG_DFL); // the tests may run under nohup
    execv(argv[0], argv.data());
    _exit(127);
}

} // namespace

TempDir::TempDir() {
    char name[] = "/tmp/dvs-test-XXXXXX";
    if (!mkdtemp(name)) throw std::runtime_error("mkdtemp");
    path_ = name;
}

TempDir::~TempDir() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
}

Finished RunProgram(const std::vector<std::string> &argv) {
    int out[2];
    int err[2];
    if (pipe2(out, O_CLOEXEC) != 0 || pipe2(err, O_CLOEXEC) != 0) throw std::runtime_error("pipe2");
    const pid_t child = Spawn(argv, out[1], err[1]);
    close(out[1]);
    close(err[1]);
    Finished finished{};
    pollfd polled[] = {{out[0], POLLIN, 0}, {err[0], POLLIN, 0}};
    std::string *const texts[] = {&finished.out, &finished.err};
    for (int open = 2; open > 0;) {
        poll(polled, 2, -1);
        for (int i = 0; i < 2; i++) {
            char buffer[4096];
            if (!polled[i].revents) continue;
            const ssize_t got = read(polled[i].fd, buffer, sizeof buffer);
            if (got > 0) {
                texts[i]->append(buffer, static_cast<std::size_t>(got));
            } else {
                close(polled[i].fd);
                polled[i].fd = -1;
                open--;
            }
        }
    }
    finished.status = StatusOf(child);
    return finished;
}

std::string EmulatorProcess::Binary() {
    return DVS_BINARY_DIR "/bin/dvs-emulator";
}

EmulatorProcess::~EmulatorProcess() {
    if (!IsRunning()) return;
    // SIGTERM first: on a normal exit, sanitizers and coverage write their reports. The wait is limited.
    kill(pid_, SIGTERM);
    if (!EndsWithinSeconds(pid_, 2)) kill(pid_, SIGKILL);
    Stop(0);
}

bool EmulatorProcess::Start(const std::string &socket, const std::vector<std::string> &options) {
    int out[2];
    if (pipe2(out, O_CLOEXEC) != 0) throw std::runtime_error("pipe2");
    std::vector<std::string> argv{Binary(), "--socket", socket};
    argv.insert(argv.end(), options.begin(), options.end());
    pid_ = Spawn(argv, out[1], -1);
    close(out[1]);
    readyLine_.clear();
    char byte = 0;
    while (read(out[0], &byte, 1) == 1 && byte != '\n')
        readyLine_ += byte;
    out_ = out[0];
    if (byte == '\n') return true;
    Stop(SIGKILL);
    return false;
}

int EmulatorProcess::Stop(int signal) {
    if (pid_ == -1) return -1;
    kill(pid_, signal);
    const int status = StatusOf(pid_);
    pid_ = -1;
    close(out_);
    out_ = -1;
    return status;
}

LiveEmulator::LiveEmulator(const std::vector<std::string> &options)
    : socket_(directory_ / "socket"), options_(options) {
    setenv("DVS_EMULATOR", socket_.c_str(), 1);
    if (!Restart()) throw std::runtime_error("the emulator did not start");
}

bool LiveEmulator::Restart() {
    if (process_.IsRunning()) process_.Stop(SIGKILL);
    return process_.Start(socket_, options_);
}

int OpenDescriptors() {
    int count = 0;
    for ([[maybe_unused]] const auto &entry : std::filesystem::directory_iterator("/proc/self/fd"))
        count++;
    return count - 1; // without the descriptor of the directory
}

unsigned CountFromEnvironment(const char *name, unsigned otherwise) {
    const char *text = std::getenv(name);
    return text ? static_cast<unsigned>(std::strtoul(text, nullptr, 10)) : otherwise;
}

} // namespace dvs::test
