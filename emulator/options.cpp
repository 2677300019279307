/* SPDX-License-Identifier: Apache-2.0 */
// Parses the command line with one table of options. A value is the word after its option.

#include "emulator/options.h"

#include <charconv>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string_view>

namespace dvs::emulator {

namespace {

using Setter = bool (*)(Options *, std::string_view value, std::string *why);

bool SetMaxPorts(Options *options, std::string_view value, std::string *why) {
    const char *end = value.data() + value.size();
    const auto [stop, error] = std::from_chars(value.data(), end, options->maxPorts);
    if (error == std::errc() && stop == end && options->maxPorts > 0) return true;
    *why = "--max-ports requires a number of 1 or more";
    return false;
}

bool SetFault(Options *options, std::string_view value, std::string *why) {
    if (options->faults.Add(value, why)) return true;
    *why = "--fault: " + *why;
    return false;
}

struct Row {
    std::string_view name;
    std::string_view value; // placeholder in the help; empty for an option without a value
    std::string_view help;
    Setter set;
};

constexpr Row kRows[] = {
    {"--socket", "PATH", "listen on this socket (default: $DVS_EMULATOR)",
     [](Options *options, std::string_view value, std::string *) { return options->socket = value, true; }},
    {"--state", "FILE", "load the state from this file and save it there at exit",
     [](Options *options, std::string_view value, std::string *) { return options->state = value, true; }},
    {"--max-ports", "N", "ports of the whole host (default: $DVS_MAX_PORTS, else 65536)", SetMaxPorts},
    {"--sync", "", "save the state after every change",
     [](Options *options, std::string_view, std::string *) { return options->sync = true; }},
    {"--fault", "SPEC", "inject a fault: 'command=19,nth=3,status=0x0bad0014' (repeatable)", SetFault},
    {"--help", "", "print this help",
     [](Options *options, std::string_view, std::string *) { return options->mode = Mode::Help, true; }},
    {"--version", "", "print the version",
     [](Options *options, std::string_view, std::string *) { return options->mode = Mode::Version, true; }},
};

const Row *FindRow(std::string_view name) {
    for (const Row &row : kRows) {
        if (row.name == name) return &row;
    }
    return nullptr;
}

bool UsageError(std::string text, std::string *why) {
    *why = std::move(text);
    return false;
}

bool Complete(Options *options, std::string *why) {
    if (options->mode == Mode::Help || options->mode == Mode::Version) return true;
    if (options->sync && options->state.empty()) return UsageError("--sync requires --state", why);
    if (options->mode == Mode::Run) {
        if (options->command.empty()) return UsageError("run requires a command after --", why);
        options->command.push_back(nullptr);
        return true;
    }
    const char *fromEnvironment = secure_getenv("DVS_EMULATOR");
    if (options->socket.empty() && fromEnvironment) options->socket = fromEnvironment;
    return !options->socket.empty() || UsageError("--socket PATH is missing", why);
}

} // namespace

bool ParseOptions(int argc, char **argv, Options *options, std::string *why) {
    int i = 1;
    if (argc > 1 && std::strcmp(argv[1], "run") == 0) {
        options->mode = Mode::Run;
        i++;
    }
    for (; i < argc; i++) {
        const std::string_view word = argv[i];
        if (options->mode == Mode::Run && word == "--") {
            options->command.assign(argv + i + 1, argv + argc);
            break;
        }
        const Row *row = FindRow(word);
        if (!row) return UsageError("unknown option \"" + std::string(word) + "\"", why);
        const bool valued = !row->value.empty();
        if (valued && i + 1 == argc) return UsageError(std::string(word) + " requires a value", why);
        if (!row->set(options, valued ? argv[++i] : "", why)) return false;
    }
    return Complete(options, why);
}

void PrintHelp() {
    std::puts(
        "usage: dvs-emulator [OPTIONS]\n"
        "       dvs-emulator run [OPTIONS] -- COMMAND...\n\n"
        "Runs the hypervisor kernel's switching module as an ordinary process on a Unix socket. `run`\n"
        "starts a private emulator and configuration store for one command and exits with its status.\n");
    for (const Row &row : kRows) {
        const std::string usage = std::string(row.name) + ' ' + std::string(row.value);
        std::printf("  %-18s %.*s\n", usage.c_str(), static_cast<int>(row.help.size()), row.help.data());
    }
}

} // namespace dvs::emulator
