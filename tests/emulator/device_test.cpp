/* SPDX-License-Identifier: Apache-2.0 */
// The embedded device over the emulator's socket: the stream must behave like a device across threads, forks,
// restarts and the death of either side.

#include <atomic>
#include <cerrno>
#include <csignal>
#include <fstream>
#include <thread>

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include "dvs/dvs.h"
#include "emulator/emulator_process.h"
#include "emulator/hyp_support.h"
#include "platform/device.h"

namespace dvs::test {
namespace {

constexpr const char *kPath = "/pelo/devices/char/hypdriver/dvsdev";

class EmbeddedDevice : public testing::Test {
protected:
    LiveEmulator emulator_;
};

uint64_t CallsOf(int command) {
    const std::string stats = Exec("stats").text;
    const std::string line = "\ncommand " + std::to_string(command) + " ";
    const std::size_t at = stats.find(line);
    return at == std::string::npos ? 0 : std::strtoull(stats.c_str() + at + line.size(), nullptr, 10);
}

TEST(EmbeddedDeviceAlone, FailsLikeAMissingFileWithoutAnEmulator) {
    for (const char *value : {static_cast<const char *>(nullptr), "", "/no/such/socket", "/etc/passwd"}) {
        if (value)
            setenv("DVS_EMULATOR", value, 1);
        else
            unsetenv("DVS_EMULATOR");
        errno = 0;
        EXPECT_EQ(HostDevice_Open(kPath), -1);
        EXPECT_EQ(errno, ENOENT);
    }
    testing::internal::CaptureStderr();
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              std::string("failed to open dvsdev device ") + kPath + "\n");
}

TEST(EmbeddedDeviceAlone, OpensAnExistingFileAsTheDevice) {
    TempDir directory;
    const std::string path = directory / "device";
    std::ofstream(path) << "x";
    const int fd = HostDevice_Open(path.c_str());
    ASSERT_GE(fd, 0);
    EXPECT_NE(fcntl(fd, F_GETFD) & FD_CLOEXEC, 0);
    DVSHYPRequest request{};
    EXPECT_EQ(HostDevice_Ioctl(fd, NumberOf(Command::PortFind), &request), -1);
    EXPECT_EQ(errno, ENOTTY);
    EXPECT_EQ(HostDevice_Close(fd), 0);
    EXPECT_EQ(HostDevice_Close(fd), -1);
}

TEST(EmbeddedDeviceAlone, NextCallUsesAnEmulatorThatAppears) {
    unsetenv("DVS_EMULATOR");
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
    LiveEmulator emulator;
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_OK);
}

TEST_F(EmbeddedDevice, LimitsAreReadWithoutADevice) {
    ASSERT_EQ(DVSState_SwitchAdd("own", "vswitch", 0, 110), HYP_OK);
    EXPECT_EQ(uwMaxNumActivePortsSystemWide, 65536U);
    EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
}

TEST_F(EmbeddedDevice, NullBufferWithALengthIsEfault) {
    ASSERT_EQ(DVSHYP_SwitchAdd("s", "vswitch", 0, 110), HYP_OK);
    const int fd = HostDevice_Open(kPath);
    for (const device::CommandRow &row : device::kCommands) {
        if (row.transfer == device::Transfer::None) continue;
        DVSHYPRequest request{};
        request.status = HYP_FAILURE;
        request.dataLen = 10;
        request.cmdOutLen = 10;
        EXPECT_EQ(HostDevice_Ioctl(fd, NumberOf(row.command), &request), -1);
        EXPECT_EQ(errno, EFAULT) << row.name;
        EXPECT_EQ(request.status, HYP_FAILURE);
    }
    HostDevice_Close(fd);
}

TEST_F(EmbeddedDevice, NullBufferQueriesTheSize) {
    const int fd = HostDevice_Open(kPath);
    DVSHYPRequest request{};
    EXPECT_EQ(HostDevice_Ioctl(fd, NumberOf(Command::StateGet), &request), -1);
    EXPECT_EQ(errno, ENOSPC);
    EXPECT_EQ(request.status, HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(request.dataLen, 16U);
    HostDevice_Close(fd);
}

TEST_F(EmbeddedDevice, RejectsStatesAbove256MebibytesWithoutSending) {
    const int fd = HostDevice_Open(kPath);
    DVSHYPRequest request{};
    request.data = 4096; // never read
    request.dataLen = (256U << 20) + 1;
    EXPECT_EQ(HostDevice_Ioctl(fd, NumberOf(Command::StateInit), &request), -1);
    EXPECT_EQ(errno, ENOSPC);
    EXPECT_EQ(request.status, HYP_LIMIT_EXCEEDED);
    HostDevice_Close(fd);
}

TEST_F(EmbeddedDevice, CachedDescriptorKeepsItsNumberAcrossARestart) {
    ASSERT_EQ(DVSHYP_StateCleanup(), HYP_OK);
    const int descriptors = OpenDescriptors();
    for (int round = 0; round < 5; round++) {
        ASSERT_TRUE(emulator_.Restart());
        EXPECT_EQ(DVSHYP_StateCleanup(), HYP_OK);
        EXPECT_EQ(OpenDescriptors(), descriptors);
    }
}

TEST_F(EmbeddedDevice, CallsFailWhileTheEmulatorIsDownAndRecover) {
    ASSERT_EQ(DVSHYP_StateCleanup(), HYP_OK);
    emulator_.Process().Stop(SIGTERM);
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_FAILURE);
    ASSERT_TRUE(emulator_.Restart());
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_OK);
}

TEST_F(EmbeddedDevice, LostReplyIsEioAndIsNotRetried) {
    ASSERT_EQ(Exec("fault " + FaultOf(Command::SwitchAdd, "nth=1,drop=after")).status, HYP_OK);
    const int fd = HostDevice_Open(kPath);
    DVSHYPRequest request{};
    request.status = HYP_FAILURE;
    std::strcpy(request.switchName, "s");
    std::strcpy(request.propName, "vswitch");
    EXPECT_EQ(HostDevice_Ioctl(fd, NumberOf(Command::SwitchAdd), &request), -1);
    EXPECT_EQ(errno, EIO);
    EXPECT_EQ(request.status, HYP_FAILURE);
    EXPECT_EQ(CallsOf(4), 1U);
    EXPECT_EQ(HostDevice_Ioctl(fd, NumberOf(Command::SwitchAdd), &request), -1);
    EXPECT_EQ(errno, EEXIST);
    HostDevice_Close(fd);
}

TEST_F(EmbeddedDevice, ForkedChildGetsItsOwnConnection) {
    ASSERT_EQ(DVSHYP_SwitchAdd("s", "vswitch", 0, 110), HYP_OK);
    std::vector<pid_t> children;
    for (int i = 0; i < 4; i++) {
        const pid_t child = fork();
        if (child == 0) {
            for (int round = 0; round < 500; round++) {
                if (DVSHYP_PortFind("s", "none") != HYP_NOT_FOUND || DVSHYP_SwitchAssociate("s") != HYP_OK)
                    _exit(1);
            }
            _exit(0);
        }
        children.push_back(child);
    }
    for (int round = 0; round < 500; round++) {
        ASSERT_EQ(DVSHYP_PortFind("s", "none"), HYP_NOT_FOUND);
        ASSERT_EQ(DVSHYP_SwitchDissociate("s"), HYP_OK);
    }
    for (const pid_t child : children) {
        int status = 0;
        waitpid(child, &status, 0);
        EXPECT_EQ(status, 0);
    }
}

TEST_F(EmbeddedDevice, ForkDuringACallDoesNotBlockTheChild) {
    ASSERT_EQ(Exec("fault " + FaultOf(Command::PortFind, "nth=1,delay=400")).status, HYP_OK);
    ASSERT_EQ(DVSHYP_StateCleanup(), HYP_OK);
    std::thread busy([] { EXPECT_EQ(DVSHYP_PortFind("s", "p"), HYP_NOT_FOUND); });
    usleep(100 * 1000);
    const pid_t child = fork();
    if (child == 0) {
        alarm(5); // the parent's thread may hold the descriptor's mutex
        _exit(DVSHYP_StateCleanup() == HYP_OK ? 0 : 1);
    }
    int status = 0;
    waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
    busy.join();
}

TEST_F(EmbeddedDevice, DoesNotTouchADescriptorThatTheProgramReused) {
    const int fd = HostDevice_Open(kPath);
    TempDir directory;
    const int other = open((directory / "file").c_str(), O_RDWR | O_CREAT, 0600);
    ASSERT_EQ(dup2(other, fd), fd); // can happen in an agent that daemonizes
    DVSHYPRequest request{};
    EXPECT_EQ(HostDevice_Ioctl(fd, NumberOf(Command::PortFind), &request), -1);
    EXPECT_EQ(errno, EBADF);
    EXPECT_EQ(lseek(other, 0, SEEK_END), 0);
    close(other);
    HostDevice_Close(fd);
}

TEST_F(EmbeddedDevice, DescriptorsAreCloseOnExecAndReopen) {
    const int before = OpenDescriptors();
    for (int i = 0; i < 100; i++) {
        const int fd = HostDevice_Open(kPath);
        EXPECT_NE(fcntl(fd, F_GETFD) & FD_CLOEXEC, 0);
        EXPECT_EQ(HostDevice_Close(fd), 0);
        EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_OK);
    }
    EXPECT_EQ(OpenDescriptors(), before);
}

TEST_F(EmbeddedDevice, AtLeast128ConnectionsAreServedAtOnce) {
    std::vector<int> descriptors;
    for (int i = 0; i < 200; i++) {
        descriptors.push_back(HostDevice_Open(kPath));
        ASSERT_GE(descriptors.back(), 0) << i;
    }
    for (const int fd : descriptors) {
        DVSHYPRequest request{};
        EXPECT_EQ(HostDevice_Ioctl(fd, NumberOf(Command::StateSanitize), &request), 0) << fd;
    }
    for (const int fd : descriptors)
        HostDevice_Close(fd);
}

TEST_F(EmbeddedDevice, OneProcessCannotTakeAllConnections) {
    std::vector<int> descriptors;
    for (int i = 0; i < 400; i++)
        descriptors.push_back(HostDevice_Open(kPath));
    const pid_t child = fork();
    if (child == 0) _exit(Fetch(DVSHYP_StateGet).status == HYP_OK ? 0 : 1);
    int status = 0;
    waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
    for (const int fd : descriptors)
        HostDevice_Close(fd);
}

TEST_F(EmbeddedDevice, ClientsKilledInMidRequestDoNoHarm) {
    const unsigned rounds = CountFromEnvironment("DVS_TEST_KILLED_CLIENTS", 30);
    ASSERT_EQ(DVSHYP_SwitchAdd("s", "vswitch", 0, 110), HYP_OK);
    const int before = OpenDescriptors();
    const std::string value(4 << 20, 'v');
    for (unsigned round = 0; round < rounds; round++) {
        const pid_t child = fork();
        if (child == 0) {
            for (;;)
                (void)DVSHYP_HostPropSet("s", "n", value.data(), static_cast<uint32_t>(value.size()), 16);
        }
        usleep(1000 + 137 * (round % 40));
        kill(child, SIGKILL);
        waitpid(child, nullptr, 0);
        ASSERT_EQ(DVSHYP_SwitchAssociate("s"), HYP_OK);
    }
    const Bytes kept = Fetch(DVSHYP_HostPropGet, "s", "n");
    EXPECT_TRUE(kept.status == HYP_NOT_FOUND || kept.text == value);
    EXPECT_EQ(OpenDescriptors(), before);
    // Their connections are closed too: another process may use as many.
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_OK);
}

/// Adds ports one after another while the emulator is killed and restarted from its saved state.
TEST(EmulatorRestarts, NoAddRunsTwiceAndLostRepliesFail) {
    TempDir directory;
    const std::string state = directory / "state";
    LiveEmulator emulator({"--state", state, "--sync"});
    ASSERT_EQ(DVSHYP_SwitchAdd("s", "vswitch", 0, 110), HYP_OK);
    const int before = OpenDescriptors();
    const unsigned restarts = CountFromEnvironment("DVS_TEST_RESTARTS", 8);
    std::atomic<bool> done = false;
    std::thread killer([&] {
        for (unsigned i = 0; i < restarts; i++) {
            usleep(30 * 1000 + 1700 * (i % 7));
            ASSERT_TRUE(emulator.Restart());
        }
        done = true;
    });
    unsigned added = 0;
    unsigned unknown = 0;
    std::vector<std::string> certain;
    testing::internal::CaptureStderr();
    for (unsigned i = 0; !done; i++) {
        const std::string port = "p" + std::to_string(i);
        const HYP_ReturnStatus status = AddPort("s", port);
        // Each id is added once, so a repeated add would fail visibly.
        EXPECT_NE(status, HYP_EXISTS) << port;
        if (status == HYP_OK)
            certain.push_back(port), added++;
        else
            unknown++;
    }
    killer.join();
    testing::internal::GetCapturedStderr();
    for (const std::string &port : certain)
        EXPECT_EQ(DVSHYP_PortFind("s", port.c_str()), HYP_OK) << port;
    EXPECT_GT(added, 0U);
    EXPECT_EQ(OpenDescriptors(), before);
    std::printf("%u ports added for certain, %u unknown, over %u restarts\n", added, unknown, restarts);
}

TEST_F(EmbeddedDevice, TerminationFinishesInFlightRequests) {
    ASSERT_EQ(Exec("fault " + FaultOf(Command::SwitchAdd, "nth=1,delay=60s")).status, HYP_OK);
    ASSERT_EQ(DVSHYP_StateCleanup(), HYP_OK);
    HYP_ReturnStatus status = HYP_FAILURE;
    std::thread asking([&] { status = DVSHYP_SwitchAdd("s", "vswitch", 0, 110); });
    usleep(100 * 1000);
    EXPECT_EQ(emulator_.Process().Stop(SIGTERM), 0);
    asking.join();
    EXPECT_EQ(status, HYP_OK);
}

TEST_F(EmbeddedDevice, ThreadsShareTheInterface) {
    const unsigned seconds = CountFromEnvironment("DVS_TEST_THREAD_SECONDS", 2);
    ASSERT_EQ(DVSHYP_SwitchAdd("s", "vswitch", 0, 110), HYP_OK);
    ASSERT_EQ(AddPort("s", "p", {{"com.vendor.a", "v"}}), HYP_OK);
    std::atomic<bool> stop = false;
    std::vector<std::thread> threads;
    for (int i = 0; i < 8; i++) {
        threads.emplace_back([&, i] {
            const std::string port = "t" + std::to_string(i);
            while (!stop) {
                EXPECT_EQ(AddPort("s", port), HYP_OK);
                EXPECT_EQ(Fetch(DVSHYP_PortStateGet, "s", port.c_str()).status, HYP_OK);
                EXPECT_EQ(Fetch(DVSHYP_PersistentStateGet).status, HYP_OK);
                EXPECT_EQ(Exec("stats").status, HYP_OK);
                DVSHYPPortList *ports = nullptr;
                EXPECT_EQ(DVSHYP_SwitchPortList("s", &ports, 1), HYP_OK);
                DVSHYP_DataFree(ports);
                DVSData *list = nullptr;
                EXPECT_EQ(DVSHYP_VendorGlobalPropList("s", &list, 16), HYP_OK);
                DVSData_Free(list);
                EXPECT_EQ(DVSHYP_PortRemove("s", port.c_str()), HYP_OK);
            }
        });
    }
    sleep(seconds);
    stop = true;
    for (std::thread &thread : threads)
        thread.join();
}

} // namespace
} // namespace dvs::test
