/* SPDX-License-Identifier: Apache-2.0 */
// The emulator as a program: its options, its state file, its termination, and `run`.

#include <algorithm>
#include <array>
#include <barrier>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <thread>

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include "dvs/dvs.h"
#include "emulator/emulator_process.h"
#include "emulator/hyp_support.h"
#include "emulator/listen.h"

namespace dvs::test {
namespace {

using Words = std::vector<std::string>;

Finished Emulator(const Words &options) {
    Words argv{EmulatorProcess::Binary()};
    argv.insert(argv.end(), options.begin(), options.end());
    return RunProgram(argv);
}

std::string ReadWhole(const std::string &path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

TEST(EmulatorOptions, WrongCommandLinesExitWithStatusTwo) {
    unsetenv("DVS_EMULATOR");
    const Words wrong[] = {{},
                           {"--socket"},
                           {"--socket=/tmp/x"},
                           {"--unknown"},
                           {"--socket", "/tmp/x", "--sync"},
                           {"--socket", "/tmp/x", "--max-ports", "0"},
                           {"--socket", "/tmp/x", "--max-ports", "12x"},
                           {"--socket", "/tmp/x", "--fault", "command=3"},
                           {"run"},
                           {"run", "--"},
                           {"run", "true"}};
    for (const Words &words : wrong) {
        const Finished finished = Emulator(words);
        EXPECT_EQ(finished.status, 2) << testing::PrintToString(words);
        EXPECT_EQ(finished.out, "");
        EXPECT_EQ(finished.err.rfind("dvs-emulator: ", 0), 0U) << finished.err;
    }
}

TEST(EmulatorOptions, HelpAndVersionGoToStandardOutput) {
    EXPECT_EQ(Emulator({"--version"}).out.rfind("dvs-emulator 1.", 0), 0U);
    const Finished help = Emulator({"--help"});
    EXPECT_EQ(help.status, 0);
    for (const char *option : {"--socket", "--state", "--max-ports", "--sync", "--fault", "run"})
        EXPECT_NE(help.out.find(option), std::string::npos) << option;
}

class EmulatorSocket : public testing::Test {
protected:
    TempDir directory_;
    std::string socket_ = directory_ / "socket";
};

TEST_F(EmulatorSocket, IsForItsOwnerOnlyUnderAnyUmask) {
    const mode_t mask = umask(0);
    EmulatorProcess process;
    ASSERT_TRUE(process.Start(socket_));
    umask(mask);
    struct stat status {};
    ASSERT_EQ(stat(socket_.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777, 0600U);
    EXPECT_TRUE(S_ISSOCK(status.st_mode));
}

TEST_F(EmulatorSocket, IsRemovedWithTheEmulator) {
    EmulatorProcess process;
    ASSERT_TRUE(process.Start(socket_));
    EXPECT_EQ(process.Stop(SIGTERM), 0);
    EXPECT_FALSE(std::filesystem::exists(socket_));
}

TEST_F(EmulatorSocket, IsReplacedOnlyWhenItsEmulatorIsDead) {
    EmulatorProcess first;
    ASSERT_TRUE(first.Start(socket_));
    const Finished second = Emulator({"--socket", socket_});
    EXPECT_EQ(second.status, 1);
    EXPECT_NE(second.err.find("is in use"), std::string::npos) << second.err;
    first.Stop(SIGKILL);
    ASSERT_TRUE(std::filesystem::exists(socket_));
    EXPECT_TRUE(first.Start(socket_));
}

// A socket without a listener, as a killed emulator leaves it.
void LeaveStaleSocket(const std::string &path) {
    std::string why;
    const int fd = emulator::ListenAt(path, &why);
    ASSERT_NE(fd, -1) << why;
    close(fd);
}

TEST_F(EmulatorSocket, StaleSocketIsReplacedByOneOfManyThreads) {
    constexpr std::size_t kStarters = 8;
    for (unsigned round = CountFromEnvironment("DVS_START_ROUNDS", 100); round > 0; --round) {
        LeaveStaleSocket(socket_);
        std::array<int, kStarters> fds{};
        std::array<std::string, kStarters> why;
        std::barrier start(static_cast<std::ptrdiff_t>(kStarters));
        {
            std::vector<std::jthread> threads;
            for (std::size_t i = 0; i < kStarters; ++i)
                threads.emplace_back([&, i] {
                    start.arrive_and_wait();
                    fds[i] = emulator::ListenAt(socket_, &why[i]);
                });
        }
        EXPECT_EQ(std::ranges::count(fds, -1), kStarters - 1) << round;
        for (std::size_t i = 0; i < kStarters; ++i) {
            if (fds[i] == -1)
                EXPECT_NE(why[i].find("is in use"), std::string::npos) << why[i];
            else
                close(fds[i]);
        }
    }
}

TEST_F(EmulatorSocket, StaleSocketIsReplacedByOneOfManyEmulators) {
    constexpr int kStarters = 8;
    for (unsigned round = CountFromEnvironment("DVS_START_ROUNDS", 5); round > 0; --round) {
        {
            EmulatorProcess dead;
            ASSERT_TRUE(dead.Start(socket_));
            dead.Stop(SIGKILL);
        }
        std::array<EmulatorProcess, kStarters> starters;
        std::array<bool, kStarters> isServing{};
        {
            std::vector<std::jthread> threads;
            for (std::size_t i = 0; i < kStarters; ++i)
                threads.emplace_back([&, i] { isServing[i] = starters[i].Start(socket_); });
        }
        ASSERT_EQ(std::ranges::count(isServing, true), 1) << round;
        // The path leads to that emulator: a second connection reaches it.
        EXPECT_NE(Emulator({"--socket", socket_}).err.find("is in use"), std::string::npos);
        for (EmulatorProcess &starter : starters)
            if (starter.IsRunning()) {
                EXPECT_EQ(starter.Stop(SIGTERM), 0);
            }
        ASSERT_FALSE(std::filesystem::exists(socket_));
    }
}

TEST_F(EmulatorSocket, ExitsWithStatusOneInAMissingDirectory) {
    const std::string absent = directory_ / "absent/";
    const Finished finished = Emulator({"--socket", absent + "socket"});
    EXPECT_EQ(finished.status, 1);
    EXPECT_NE(finished.err.find(absent), std::string::npos) << finished.err;
}

TEST_F(EmulatorSocket, NeverReplacesAnotherFile) {
    std::ofstream(socket_) << "precious";
    EXPECT_EQ(Emulator({"--socket", socket_}).status, 1);
    EXPECT_EQ(ReadWhole(socket_), "precious");
    EXPECT_EQ(Emulator({"--socket", std::string(200, 'x')}).status, 1);
    EXPECT_EQ(Emulator({"--socket", directory_ / "no/such/directory"}).status, 1);
}

TEST_F(EmulatorSocket, OtherUsersAreRejected) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can switch to another user";
    EmulatorProcess process;
    ASSERT_TRUE(process.Start(socket_));
    // Opens the modes to everyone, so that only the check of the peer's user can fail.
    ASSERT_EQ(chmod(directory_.Path().c_str(), 0777), 0);
    ASSERT_EQ(chmod(socket_.c_str(), 0777), 0);
    const pid_t child = fork();
    if (child == 0) {
        if (setuid(65534) != 0) _exit(9);
        setenv("DVS_EMULATOR", socket_.c_str(), 1);
        _exit(DVSHYP_StateCleanup() == HYP_OK ? 1 : 0);
    }
    int status = 0;
    waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
}

class EmulatorState : public EmulatorSocket {
protected:
    EmulatorState() { setenv("DVS_EMULATOR", socket_.c_str(), 1); }
    void Change() {
        ASSERT_EQ(DVSHYP_SwitchAdd("s1", "vswitch", 0, 110), HYP_OK);
        ASSERT_EQ(AddPort("s1", "p1", {{"a", "1"}}), HYP_OK);
        ASSERT_EQ(AddPort("s1", "z1", {}, 3), HYP_OK);
    }
    std::string state_ = directory_ / "state";
    EmulatorProcess process_;
};

TEST_F(EmulatorState, IsSavedOnExitAndLoadedOnStart) {
    ASSERT_TRUE(process_.Start(socket_, {"--state", state_}));
    Change();
    const std::string live = Fetch(DVSHYP_StateGet).text;
    EXPECT_EQ(process_.Stop(SIGTERM), 0);
    EXPECT_EQ(ReadWhole(state_).substr(0, live.size()), live);
    struct stat status {};
    ASSERT_EQ(stat(state_.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777, 0600U);
    ASSERT_TRUE(process_.Start(socket_, {"--state", state_}));
    EXPECT_EQ(Fetch(DVSHYP_StateGet).text, live);
}

TEST_F(EmulatorState, SyncSavesEveryChange) {
    ASSERT_TRUE(process_.Start(socket_, {"--state", state_, "--sync"}));
    Change();
    const std::string live = Fetch(DVSHYP_StateGet).text;
    process_.Stop(SIGKILL);
    EXPECT_EQ(ReadWhole(state_).substr(0, live.size()), live);
}

TEST_F(EmulatorState, SaveCommandSavesAtOnce) {
    ASSERT_TRUE(process_.Start(socket_, {"--state", state_}));
    Change();
    EXPECT_FALSE(std::filesystem::exists(state_));
    EXPECT_EQ(Exec("save").text, "saved\n");
    const std::string live = Fetch(DVSHYP_StateGet).text;
    EXPECT_EQ(ReadWhole(state_).substr(0, live.size()), live);
}

TEST_F(EmulatorState, SaveFailsWithoutAFile) {
    ASSERT_TRUE(process_.Start(socket_));
    EXPECT_EQ(Exec("save").status, HYP_BAD_PARAM);
}

TEST_F(EmulatorState, RejectsADamagedFileWithStatusSixAndKeepsIt) {
    ASSERT_TRUE(process_.Start(socket_, {"--state", state_}));
    Change();
    ASSERT_EQ(process_.Stop(SIGTERM), 0);
    const std::string good = ReadWhole(state_);
    std::string damaged = good;
    damaged[100] ^= 1;
    for (const std::string &contents :
         {damaged, good.substr(0, 300), std::string(), std::string(512, '\0')}) {
        std::ofstream(state_, std::ios::binary) << contents;
        const Finished finished = Emulator({"--socket", socket_, "--state", state_});
        EXPECT_EQ(finished.status, 6) << finished.err;
        EXPECT_NE(finished.err.find(state_), std::string::npos);
        EXPECT_EQ(ReadWhole(state_), contents);
    }
}

TEST_F(EmulatorState, UnreadableFileIsNotTreatedAsNew) {
    std::filesystem::create_directory(state_);
    EXPECT_NE(Emulator({"--socket", socket_, "--state", state_}).status, 0);
    EXPECT_TRUE(std::filesystem::is_directory(state_));
}

TEST_F(EmulatorState, FileThatFailsStatIsNotTreatedAsNew) {
    const std::string below = state_ + "/below";
    std::ofstream(state_) << "a file, no directory";
    const Finished finished = Emulator({"--socket", socket_, "--state", below});
    EXPECT_NE(finished.status, 0);
    EXPECT_NE(finished.err.find(below + ": Not a directory"), std::string::npos) << finished.err;
}

TEST_F(EmulatorState, ExitsWithStatusOneWhenTheSaveFails) {
    ASSERT_TRUE(process_.Start(socket_, {"--state", directory_ / "absent/state"}));
    EXPECT_EQ(Exec("save").status, HYP_IO_ERROR);
    EXPECT_EQ(process_.Stop(SIGTERM), 1);
    ASSERT_TRUE(process_.Start(socket_, {"--state", directory_ / "absent/state", "--sync"}));
    EXPECT_EQ(DVSHYP_SwitchAdd("s1", "vswitch", 0, 110), HYP_IO_ERROR);
}

TEST_F(EmulatorState, MaxPortsSetsTheHostsAndTheLibrarysLimit) {
    ASSERT_TRUE(process_.Start(socket_, {"--max-ports", "2"}));
    ASSERT_EQ(DVSHYP_SwitchAdd("s1", "vswitch", 0, 110), HYP_OK);
    EXPECT_EQ(AddPort("s1", "a"), HYP_OK);
    EXPECT_EQ(AddPort("s1", "b"), HYP_OK);
    EXPECT_EQ(AddPort("s1", "c"), HYP_LIMIT_EXCEEDED);
    // This process reads the limit from the emulator on first use of its own table.
    setenv("DVS_MAX_PORTS", "77", 1);
    ASSERT_EQ(DVSState_SwitchAdd("own", "vswitch", 0, 110), HYP_OK);
    EXPECT_EQ(uwMaxNumActivePortsSystemWide, 2U);
    EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
}

TEST_F(EmulatorState, EnvironmentSetsTheLimitWithoutTheOption) {
    setenv("DVS_MAX_PORTS", "3", 1);
    ASSERT_TRUE(process_.Start(socket_));
    EXPECT_NE(Exec("stats").text.find("port-limit 3\n"), std::string::npos);
    setenv("DVS_MAX_PORTS", "nonsense", 1);
    EXPECT_EQ(Emulator({"--socket", directory_ / "other"}).status, 2);
}

TEST_F(EmulatorState, SignalsShutItDownCleanly) {
    for (const int signal : {SIGTERM, SIGINT, SIGHUP}) {
        ASSERT_TRUE(process_.Start(socket_, {"--state", state_}));
        ASSERT_EQ(DVSHYP_StateCleanup(), HYP_OK);
        EXPECT_EQ(process_.Stop(signal), 0);
        EXPECT_TRUE(std::filesystem::remove(state_));
    }
}

/// An emulator in an unusual process environment.
class EmulatorSurroundings : public EmulatorState {
protected:
    ~EmulatorSurroundings() override {
        if (pid_ != -1) End();
    }

    /// Starts it after `prepare` in its process, and waits until it serves.
    template <class Prepare> bool StartAfter(Prepare prepare) {
        const std::string binary = EmulatorProcess::Binary();
        pid_ = fork();
        if (pid_ == 0) {
            prepare();
            execl(binary.c_str(), binary.c_str(), "--socket", socket_.c_str(), nullptr);
            _exit(127);
        }
        return Serves();
    }

    bool Serves() {
        testing::internal::CaptureStderr();
        bool serves = false;
        for (int i = 0; i < 500 && !serves && waitpid(pid_, nullptr, WNOHANG) == 0; i++) {
            serves = DVSHYP_StateCleanup() == HYP_OK;
            usleep(10 * 1000);
        }
        testing::internal::GetCapturedStderr();
        return serves;
    }

    int End() {
        kill(pid_, SIGTERM);
        int status = -1;
        waitpid(pid_, &status, 0);
        pid_ = -1;
        return status;
    }

    pid_t pid_ = -1;
};

TEST_F(EmulatorSurroundings, StartsWithoutAReaderOfTheReadyLine) {
    ASSERT_TRUE(StartAfter([] {
        int pipe[2];
        if (pipe2(pipe, O_CLOEXEC) != 0) _exit(126);
        dup2(pipe[1], STDOUT_FILENO);
        close(pipe[0]);
    }));
    EXPECT_EQ(End(), 0);
    EXPECT_FALSE(std::filesystem::exists(socket_));
}

TEST_F(EmulatorSurroundings, OpensDevNullForMissingStandardStreams) {
    ASSERT_TRUE(StartAfter([] {
        for (int fd = 0; fd <= STDERR_FILENO; fd++)
            close(fd);
    }));
    const std::string descriptors = "/proc/" + std::to_string(pid_) + "/fd/";
    for (const char *fd : {"0", "1", "2"})
        EXPECT_EQ(std::filesystem::read_symlink(descriptors + fd), "/dev/null") << fd;
    EXPECT_EQ(End(), 0);
}

TEST_F(EmulatorSurroundings, IgnoresSighupUnderNohup) {
    ASSERT_TRUE(StartAfter([] { std::signal(SIGHUP, SIG_IGN); }));
    kill(pid_, SIGHUP);
    usleep(50 * 1000); // time to exit, if it handled the signal
    EXPECT_TRUE(Serves());
    EXPECT_EQ(End(), 0);
}

class EmulatorRun : public testing::Test {
protected:
    Finished Run(const Words &options, const std::string &script) {
        Words argv{"run"};
        argv.insert(argv.end(), options.begin(), options.end());
        for (const char *word : {"--", "/bin/sh", "-c"})
            argv.emplace_back(word);
        argv.push_back(script);
        return Emulator(argv);
    }
};

TEST_F(EmulatorRun, GivesTheCommandItsOwnEmulatorAndStore) {
    const Finished finished =
        Run({}, "test -S \"$DVS_EMULATOR\" && dirname \"$DVS_EMULATOR\" \"$DVS_CONFIGSTORE\"");
    EXPECT_EQ(finished.status, 0) << finished.err;
    const std::string directory = finished.out.substr(0, finished.out.find('\n'));
    EXPECT_EQ(finished.out, directory + "\n" + directory + "\n");
    EXPECT_FALSE(std::filesystem::exists(directory));
}

TEST_F(EmulatorRun, ReturnsTheCommandsStatus) {
    EXPECT_EQ(Run({}, "exit 42").status, 42);
    EXPECT_EQ(Run({}, "kill -9 $$").status, 137);
    EXPECT_EQ(Emulator({"run", "--", "/no/such/program"}).status, 127);
    EXPECT_EQ(Emulator({"run", "--", "/etc/passwd"}).status, 126);
}

TEST_F(EmulatorRun, ReturnsADistinctStatusWhenTheEmulatorFails) {
    TempDir directory;
    std::ofstream(directory / "state") << "damaged";
    const Finished finished = Run({"--state", directory / "state"}, "echo started");
    EXPECT_EQ(finished.status, 6);
    EXPECT_EQ(finished.out, "");
}

TEST_F(EmulatorRun, ForwardsSignalsToTheCommand) {
    const Finished finished = Run(
        {},
        "trap 'exit 7' TERM; kill -TERM $PPID; i=0; while [ $i -lt 500 ]; do sleep 0.01; i=$((i+1)); done");
    EXPECT_EQ(finished.status, 7) << finished.err;
}

TEST_F(EmulatorRun, StartsNothingWithoutATemporaryDirectory) {
    TempDir directory;
    setenv("TMPDIR", (directory / "absent").c_str(), 1);
    const Finished finished = Run({}, "echo started");
    unsetenv("TMPDIR");
    EXPECT_EQ(finished.status, 1);
    EXPECT_EQ(finished.out, "");
    EXPECT_NE(finished.err.find("no temporary directory: No such file"), std::string::npos) << finished.err;
}

TEST_F(EmulatorRun, SavesTheStateOfTheCommand) {
    TempDir directory;
    EXPECT_EQ(Run({"--state", directory / "state"}, "true").status, 0);
    EXPECT_EQ(ReadWhole(directory / "state").size(), 512U);
}

} // namespace
} // namespace dvs::test
