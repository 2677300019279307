/* SPDX-License-Identifier: Apache-2.0 */
// `dvs-emulator run`: a private emulator and configuration store for one command. Uses three processes: the
// parent waits and cleans up, one child serves, the other runs the command.

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include "emulator/serve.h"

namespace dvs::emulator {

namespace {

/// A directory for the socket and the store; the destructor removes it with its contents.
class PrivateDirectory {
public:
    PrivateDirectory() {
        const char *base = secure_getenv("TMPDIR");
        path_ = std::string(base && *base ? base : "/tmp") + "/dvs-emulator-XXXXXX";
        if (!mkdtemp(path_.data())) path_.clear();
    }
    ~PrivateDirectory() {
        std::error_code ignored; // best effort
        if (!path_.empty()) std::filesystem::remove_all(path_, ignored);
    }
    PrivateDirectory(const PrivateDirectory &) = delete;
    PrivateDirectory &operator=(const PrivateDirectory &) = delete;

    const std::string &Path() const { return path_; }

private:
    std::string path_;
};

int StatusOf(pid_t child) {
    int status = 0;
    while (waitpid(child, &status, 0) == -1) {
        if (errno != EINTR) return kExitFailed;
    }
    return WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
}

/// Starts the serving child and waits until it is ready. If it fails, returns -1 and sets `*exitStatus` to
/// its exit status.
pid_t StartEmulator(const Options &options, int *exitStatus) {
    int ready[2];
    *exitStatus = kExitFailed;
    if (pipe(ready) != 0) return -1;
    const pid_t parent = getpid();
    const pid_t child = fork();
    if (child == 0) {
        close(ready[0]);
        // Terminal signals go to the command only. The emulator ends when this process signals it or exits.
        setpgid(0, 0);
        prctl(PR_SET_PDEATHSIG, SIGTERM);
        if (getppid() != parent) _exit(kExitFailed);
        const auto tell = [&] { (void)!write(ready[1], "", 1); };
        std::exit(Serve(options, tell)); // runs exit handlers: sanitizers and coverage report at exit
    }
    close(ready[1]);
    char byte = 0;
    const bool serves = child != -1 && read(ready[0], &byte, 1) == 1;
    close(ready[0]);
    if (serves) return child;
    if (child != -1) *exitStatus = StatusOf(child);
    return -1;
}

pid_t StartCommand(const Options &options, const std::string &directory, const sigset_t &signals) {
    const pid_t child = fork();
    if (child != 0) return child;
    setenv("DVS_EMULATOR", options.socket.c_str(), 1);
    setenv("DVS_CONFIGSTORE", (directory + "/configstore.db").c_str(), 1);
    sigprocmask(SIG_SETMASK, &signals, nullptr);
    execvp(options.command[0], options.command.data());
    const int error = errno;
    PrintError(std::string(options.command[0]) + ": " + std::strerror(error));
    _exit(error == ENOENT ? 127 : 126);
}

/// Waits for the command and forwards termination signals to it.
int WaitForCommand(pid_t command, const sigset_t &passedOn) {
    for (;;) {
        const int signal = sigwaitinfo(&passedOn, nullptr);
        int status = 0;
        if (signal == SIGCHLD && waitpid(command, &status, WNOHANG) == command)
            return WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
        if (signal > 0 && signal != SIGCHLD) kill(command, signal);
    }
}

} // namespace

int RunCommand(Options options) {
    // If SIGCHLD is inherited as ignored, the command's end is not reported.
    std::signal(SIGCHLD, SIG_DFL);
    const PrivateDirectory directory;
    if (directory.Path().empty()) {
        PrintError(std::string("no temporary directory: ") + std::strerror(errno));
        return kExitFailed;
    }
    if (options.socket.empty()) options.socket = directory.Path() + "/socket";
    int status = kExitFailed;
    const pid_t emulator = StartEmulator(options, &status);
    if (emulator == -1) return status;
    sigset_t waited;
    sigset_t before;
    sigemptyset(&waited);
    for (const int signal : {SIGCHLD, SIGTERM, SIGINT, SIGHUP, SIGQUIT})
        sigaddset(&waited, signal);
    sigprocmask(SIG_BLOCK, &waited, &before);
    const pid_t command = StartCommand(options, directory.Path(), before);
    if (command != -1)
        status = WaitForCommand(command, waited);
    else
        PrintError(std::strerror(errno));
    kill(emulator, SIGTERM);
    const int emulatorStatus = StatusOf(emulator);
    // If the state could not be saved, do not return the command's success.
    return status == kExitDone ? emulatorStatus : status;
}

} // namespace dvs::emulator
