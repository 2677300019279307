/* SPDX-License-Identifier: Apache-2.0 */
// The life of one emulator: limits, state, socket, signals, state again.

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

/// Settles the port limit before anything needs it. The process must not ask an emulator for it: it is the
/// emulator.
bool SettleLimit(uint32_t maxPorts) {
    unsetenv("DVS_EMULATOR");
    if (maxPorts > 0) DVSHost_SetMaxPorts(maxPorts);
    uint32_t limit = 0;
    const HYP_ReturnStatus status = KIT_Get(KIT_NODE_net_maxPortsSystemWide, nullptr, &limit, sizeof limit);
    if (status != HYP_OK) Complain(std::string("DVS_MAX_PORTS: ") + HYP_ReturnStatusToString(status));
    uwMaxNumActivePortsSystemWide = limit;
    return status == HYP_OK;
}

/// Started without its standard streams, what is opened first would take their numbers, and messages would go
/// there: to a client, or into the state file.
void HoldStandardStreams() {
    int fd = 0;
    while (fd != -1 && fd <= STDERR_FILENO)
        fd = open("/dev/null", O_RDWR);
    if (fd != -1) close(fd);
}

/// Whoever starts programs under nohup means them to outlive the terminal. SIGINT is another matter: shells
/// ignore it for whatever they start in the background.
bool OutlivesTerminal() {
    struct sigaction action {};
    return sigaction(SIGHUP, nullptr, &action) == 0 && action.sa_handler == SIG_IGN;
}

/// A descriptor that becomes readable when the process is told to end.
int EndSignals() {
    // Nobody has to listen to the ready line.
    std::signal(SIGPIPE, SIG_IGN);
    sigset_t signals;
    sigemptyset(&signals);
    for (const int signal : {SIGTERM, SIGINT})
        sigaddset(&signals, signal);
    if (!OutlivesTerminal()) sigaddset(&signals, SIGHUP);
    sigprocmask(SIG_BLOCK, &signals, nullptr);
    return signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK);
}

/// What a state file that cannot be taken over means for the caller.
int LoadFailure(HYP_ReturnStatus status) {
    switch (status) {
    case HYP_READ_ERROR:
    case HYP_NO_MEMORY:
    case HYP_NOT_FOUND: // it is there, but may not be read
        return kExitFailed;
    default:
        return kExitDamaged;
    }
}

} // namespace

void Complain(const std::string &text) {
    std::fprintf(stderr, "dvs-emulator: %s\n", text.c_str());
}

int Serve(const Options &options, const std::function<void()> &ready) {
    HoldStandardStreams();
    const int stopFd = EndSignals();
    if (!SettleLimit(options.maxPorts)) return kExitUsage;
    Module module(options.state, options.sync);
    module.FaultTable() = options.faults;
    std::string why;
    HYP_ReturnStatus status = module.LoadState(&why);
    if (status != HYP_OK) {
        Complain(why);
        return LoadFailure(status);
    }
    {
        Server server(&module);
        if (stopFd == -1 || !server.Listen(options.socket, &why)) {
            Complain(stopFd == -1 ? std::strerror(errno) : why);
            return kExitFailed;
        }
        ready();
        server.Run(stopFd);
    }
    close(stopFd);
    status = module.SaveState();
    if (status == HYP_OK) return kExitDone;
    Complain(options.state + ": not saved: " + HYP_ReturnStatusToString(status));
    return kExitFailed;
}

} // namespace dvs::emulator
