/* SPDX-License-Identifier: Apache-2.0 */
// Runs one emulator: sets the limits, loads the state, creates the socket, handles signals, saves the state.

#include "emulator/serve.h"

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include <fcntl.h>
#include <sys/signalfd.h>
#include <unistd.h>

#include "emulator/server.h"
#include "platform/embedded/host_limits.h"
#include "platform/kit.h"
#include "platform/status_text.h"

namespace dvs::emulator {

namespace {

/// Sets the port limit before anything uses it. Unsets DVS_EMULATOR, so that the emulator does not ask itself
/// for the limit.
bool InitPortLimit(uint32_t maxPorts) {
    unsetenv("DVS_EMULATOR");
    if (maxPorts > 0) DVSHost_SetMaxPorts(maxPorts);
    uint32_t limit = 0;
    const HYP_ReturnStatus status = KIT_Get(KIT_NODE_net_maxPortsSystemWide, nullptr, &limit, sizeof limit);
    if (status != HYP_OK) PrintError(std::string("DVS_MAX_PORTS: ") + HYP_ReturnStatusToString(status));
    uwMaxNumActivePortsSystemWide = limit;
    return status == HYP_OK;
}

/// Opens /dev/null for missing standard streams. Otherwise the next opened files would take their numbers,
/// and messages would go to a client or into the state file.
void OpenStandardStreams() {
    int fd = 0;
    while (fd != -1 && fd <= STDERR_FILENO)
        fd = open("/dev/null", O_RDWR);
    if (fd != -1) close(fd);
}

/// True under nohup, which asks a program to survive its terminal. SIGINT does not count: shells ignore it
/// for background programs.
bool IgnoresHangup() {
    struct sigaction action {};
    return sigaction(SIGHUP, nullptr, &action) == 0 && action.sa_handler == SIG_IGN;
}

/// Returns a descriptor that becomes readable on a termination signal.
int TerminationSignals() {
    // The reader of the ready line may be gone.
    std::signal(SIGPIPE, SIG_IGN);
    sigset_t signals;
    sigemptyset(&signals);
    for (const int signal : {SIGTERM, SIGINT})
        sigaddset(&signals, signal);
    if (!IgnoresHangup()) sigaddset(&signals, SIGHUP);
    sigprocmask(SIG_BLOCK, &signals, nullptr);
    return signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK);
}

/// The exit status for a state file that cannot be loaded.
int LoadFailure(HYP_ReturnStatus status) {
    switch (status) {
    case HYP_READ_ERROR:
    case HYP_NO_MEMORY:
    case HYP_NOT_FOUND: // it exists but is not readable
        return kExitFailed;
    default:
        return kExitDamaged;
    }
}

} // namespace

void PrintError(const std::string &text) {
    std::fprintf(stderr, "dvs-emulator: %s\n", text.c_str());
}

int Serve(const Options &options, const std::function<void()> &ready) {
    OpenStandardStreams();
    const int stopFd = TerminationSignals();
    if (!InitPortLimit(options.maxPorts)) return kExitUsage;
    Module module(options.state, options.sync);
    module.FaultTable() = options.faults;
    std::string why;
    HYP_ReturnStatus status = module.LoadState(&why);
    if (status != HYP_OK) {
        PrintError(why);
        return LoadFailure(status);
    }
    {
        Server server(&module);
        if (stopFd == -1 || !server.Listen(options.socket, &why)) {
            PrintError(stopFd == -1 ? std::strerror(errno) : why);
            return kExitFailed;
        }
        ready();
        server.Run(stopFd);
    }
    close(stopFd);
    status = module.SaveState();
    if (status == HYP_OK) return kExitDone;
    PrintError(options.state + ": cannot be saved: " + HYP_ReturnStatusToString(status));
    return kExitFailed;
}

} // namespace dvs::emulator
