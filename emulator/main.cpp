/* SPDX-License-Identifier: Apache-2.0 */
// dvs-emulator: runs the hypervisor kernel's switching module as an ordinary process.

#include <cstdio>
#include <exception>

#include "emulator/serve.h"

using namespace dvs::emulator;

namespace {

int Main(int argc, char **argv) {
    Options options;
    std::string why;
    if (!ParseOptions(argc, argv, &options, &why)) {
        PrintError(why + "; see --help");
        return kExitUsage;
    }
    switch (options.mode) {
    case Mode::Help:
        PrintHelp();
        return std::fflush(stdout) == 0 ? kExitDone : kExitFailed;
    case Mode::Version:
        std::puts("dvs-emulator " DVS_VERSION);
        return std::fflush(stdout) == 0 ? kExitDone : kExitFailed;
    case Mode::Run:
        return RunCommand(std::move(options));
    case Mode::Serve:
        break;
    }
    return Serve(options, [&] {
        std::printf("dvs-emulator ready on %s\n", options.socket.c_str());
        std::fflush(stdout);
    });
}

} // namespace

int main(int argc, char **argv) {
    try {
        return Main(argc, argv);
    } catch (const std::exception &error) {
        PrintError(error.what());
        return kExitFailed;
    }
}
