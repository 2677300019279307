/* SPDX-License-Identifier: Apache-2.0 */
// Child processes, with and without a terminal.

#include "program.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <thread>

#include <boost/json/parse.hpp>
#include <fcntl.h>
#include <pty.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

namespace dvs::ctl::test {

namespace {

std::string ReadToEnd(int fd) {
    std::string text;
    std::array<char, 4096> piece{};
    for (;;) {
        const ssize_t got = read(fd, piece.data(), piece.size());
        if (got < 0 && errno == EINTR) continue;
        if (got <= 0) return text; // a terminal whose other side is closed reads as EIO
        text.append(piece.data(), static_cast<std::size_t>(got));
    }
}

void AwaitEnd(pid_t child, Result &result) {
    int status = 0;
    rusage usage{};
    while (wait4(child, &status, 0, &usage) < 0 && errno == EINTR) {
    }
    result.status = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
    result.peakKilobytes = usage.ru_maxrss;
}

[[noreturn]] void Become(const std::vector<std::string> &args, const std::vector<std::string> &environment) {
    std::vector<std::string> words = {DVS_BINARY_DIR "/bin/dvsctl"};
    words.insert(words.end(), args.begin(), args.end());
    std::vector<char *> argv, envp;
    for (std::string &word : words)
        argv.push_back(word.data());
    argv.push_back(nullptr);
    std::vector<std::string> variables = {"PATH=/usr/bin:/bin", "TERM=xterm", "LANG=C.UTF-8"};
    variables.insert(variables.end(), environment.begin(), environment.end());
    if (const char *options = std::getenv("ASAN_OPTIONS"))
        variables.push_back(std::string("ASAN_OPTIONS=") + options);
    for (std::string &variable : variables)
        envp.push_back(variable.data());
    envp.push_back(nullptr);
    execve(argv[0], argv.data(), envp.data());
    _exit(125);
}

} // namespace

Result RunProgram(const Run &run) {
    std::array<int, 2> in{}, out{}, err{};
    EXPECT_EQ(pipe(in.data()), 0);
    EXPECT_EQ(pipe(out.data()), 0);
    EXPECT_EQ(pipe(err.data()), 0);
    const pid_t child = fork();
    if (child == 0) {
        dup2(in[0], STDIN_FILENO);
        dup2(out[1], STDOUT_FILENO);
        dup2(err[1], STDERR_FILENO);
        for (int fd = STDERR_FILENO + 1; fd < 64; ++fd)
            close(fd);
        if (run.outPath == "-") {
            close(STDOUT_FILENO);
        } else if (!run.outPath.empty()) {
            const int file = open(run.outPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
            dup2(file, STDOUT_FILENO);
        }
        Become(run.args, run.environment);
    }
    close(in[0]);
    close(out[1]);
    close(err[1]);
    Result result;
    std::thread errors([&] { result.err = ReadToEnd(err[0]); });
    std::thread feeder([&] {
        if (!run.input.empty() && write(in[1], run.input.data(), run.input.size()) < 0) return;
        if (!run.openInput) close(in[1]);
    });
    result.out = ReadToEnd(out[0]);
    feeder.join();
    errors.join();
    if (run.openInput) close(in[1]);
    close(out[0]);
    close(err[0]);
    AwaitEnd(child, result);
    return result;
}

Result RunInTerminal(const std::vector<std::string> &args, const std::vector<std::string> &environment,
                     int rows) {
    winsize size{static_cast<unsigned short>(rows), 200, 0, 0};
    int terminal = -1;
    const pid_t child = forkpty(&terminal, nullptr, nullptr, &size);
    if (child == 0) Become(args, environment);
    Result result;
    if (child == -1) {
        ADD_FAILURE() << "no pseudo-terminal available: " << std::strerror(errno);
        return result;
    }
    result.out = ReadToEnd(terminal);
    close(terminal);
    AwaitEnd(child, result);
    return result;
}

void ProgramTest::SetUp() {
    std::string name = testing::TempDir() + "/dvsctl-XXXXXX";
    ASSERT_NE(mkdtemp(name.data()), nullptr);
    directory_ = name;
}

void ProgramTest::TearDown() {
    std::filesystem::remove_all(directory_);
}

void ProgramTest::PutState(std::string_view name, Buffer state) const {
    state.resize((state.size() + 511) / 512 * 512);
    Put(name, AsText(state));
}

void ProgramTest::Put(std::string_view name, std::string_view contents) const {
    std::ofstream file(At(name), std::ios::binary);
    file << contents;
}

std::string ProgramTest::Get(std::string_view name) const {
    std::ifstream file(At(name), std::ios::binary);
    std::stringstream contents;
    contents << file.rdbuf();
    return contents.str();
}

std::vector<std::string> ProgramTest::Files() const {
    std::vector<std::string> names;
    for (const auto &entry : std::filesystem::directory_iterator(directory_))
        names.push_back(entry.path().filename());
    std::sort(names.begin(), names.end());
    return names;
}

boost::json::value Json(const Result &result) {
    boost::json::error_code code;
    boost::json::value document = boost::json::parse(result.out, code);
    EXPECT_FALSE(code) << code.message() << " in:\n"
                       << result.out << "\nand on standard error:\n"
                       << result.err;
    return document;
}

} // namespace dvs::ctl::test
