/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_EMULATOR_EMULATOR_PROCESS_H
#define TESTS_EMULATOR_EMULATOR_PROCESS_H

// A separate dvs-emulator for a test: starts it, waits for its ready line, stops it.

#include <string>
#include <vector>

#include <sys/types.h>

namespace dvs::test {

/// A temporary directory; removed with its contents in the destructor.
class TempDir {
public:
    TempDir();
    ~TempDir();
    TempDir(const TempDir &) = delete;
    TempDir &operator=(const TempDir &) = delete;
    const std::string &Path() const { return path_; }
    std::string operator/(const std::string &name) const { return path_ + "/" + name; }

private:
    std::string path_;
};

/// The outcome of a program that ran to its end.
struct Finished {
    int status; // exit status, or 128 plus the signal
    std::string out;
    std::string err;
};

/// Runs a program; argv[0] is its path.
Finished RunProgram(const std::vector<std::string> &argv);

class EmulatorProcess {
public:
    EmulatorProcess() = default;
    /// Kills it with SIGKILL if it still runs.
    ~EmulatorProcess();
    EmulatorProcess(const EmulatorProcess &) = delete;
    EmulatorProcess &operator=(const EmulatorProcess &) = delete;

    static std::string Binary();

    /// Starts it at `socket` with more options and waits for its ready line. Returns false if it exits
    /// instead.
    bool Start(const std::string &socket, const std::vector<std::string> &options = {});

    /// Sends a signal and waits for the exit; the status is as in Finished.
    int Stop(int signal);
    bool IsRunning() const { return pid_ != -1; }
    pid_t Pid() const { return pid_; }
    const std::string &ReadyLine() const { return readyLine_; }

private:
    pid_t pid_ = -1;
    int out_ = -1;
    std::string readyLine_;
};

/// An emulator in its own directory; this process's device connects to it.
class LiveEmulator {
public:
    explicit LiveEmulator(const std::vector<std::string> &options = {});
    bool Restart();
    const std::string &Socket() const { return socket_; }
    EmulatorProcess &Process() { return process_; }
    const TempDir &Directory() const { return directory_; }

private:
    TempDir directory_;
    std::string socket_;
    std::vector<std::string> options_;
    EmulatorProcess process_;
};

/// The number of this process's open descriptors.
int OpenDescriptors();

/// A loop count: the value of the environment variable, or the default.
unsigned CountFromEnvironment(const char *name, unsigned otherwise);

} // namespace dvs::test

#endif
