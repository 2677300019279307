/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_EMULATOR_EMULATOR_PROCESS_H
#define TESTS_EMULATOR_EMULATOR_PROCESS_H

// A dvs-emulator of a test's own: started, waited for until it says that it is ready, told to end.

#include <string>
#include <vector>

#include <sys/types.h>

namespace dvs::test {

/// A directory that goes with its contents.
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
    int status; // exit status, or 128 and the signal
    std::string out;
    std::string err;
};

/// Runs a program; argv[0] is its path.
Finished RunProgram(const std::vector<std::string> &argv);

class EmulatorProcess {
public:
    EmulatorProcess() = default;
    /// Ends it with SIGKILL if it still runs.
    ~EmulatorProcess();
    EmulatorProcess(const EmulatorProcess &) = delete;
    EmulatorProcess &operator=(const EmulatorProcess &) = delete;

    static std::string Binary();

    /// Starts it at `socket` with more options and waits for its ready line. False when it ended instead.
    bool Start(const std::string &socket, const std::vector<std::string> &options = {});

    /// Sends a signal and waits for the end; the exit status as in Finished.
    int Stop(int signal);
    bool IsRunning() const { return pid_ != -1; }
    pid_t Pid() const { return pid_; }
    const std::string &ReadyLine() const { return readyLine_; }

private:
    pid_t pid_ = -1;
    int out_ = -1;
    std::string readyLine_;
};

/// An emulator in a directory of its own that this process's device connects to.
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

/// Descriptors this process has open.
int OpenDescriptors();

/// A loop's count: the environment variable's, or the default.
unsigned CountFromEnvironment(const char *name, unsigned otherwise);

} // namespace dvs::test

#endif
