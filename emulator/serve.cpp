/* SPDX-License-Identifier: Apache-2.0 */
// The life of one emulator: limits, state, socket, signals, state again.

#include "emulator/serve.h"

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>

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

/// A descriptor that becomes readable when the process is told to end.
int EndSignals() {
    sigset_t signals;
    sigemptyset(&signals);
    for (const int signal : {SIGTERM, SIGINT, SIGHUP})
        sigaddset(&signals, signal);
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
