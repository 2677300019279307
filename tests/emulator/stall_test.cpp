/* SPDX-License-Identifier: Apache-2.0 */
// Idle peers at the emulator's socket: no call may wait forever. setsockopt is wrapped at link time to
// shorten the embedded device's timeout of 30 s.

#include <cstring>

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <sys/un.h>
#include <unistd.h>

#include "dvs/dvs.h"
#include "emulator/emulator_process.h"
#include "platform/device.h"
#include "platform/kit.h"

extern "C" int __real_setsockopt(int fd, int level, int name, const void *value, socklen_t size);

extern "C" int __wrap_setsockopt(int fd, int level, int name, const void *value, socklen_t size) {
    const timeval moment{0, 50 * 1000};
    const bool limit = level == SOL_SOCKET && (name == SO_SNDTIMEO || name == SO_RCVTIMEO);
    return __real_setsockopt(fd, level, name, limit ? &moment : value, size);
}

namespace dvs::test {
namespace {

/// Listens but never accepts. The backlog has room for one connection.
class IdlePeer : public testing::Test {
protected:
    IdlePeer() : fd_(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        const std::string path = directory_ / "socket";
        std::strcpy(address.sun_path, path.c_str());
        EXPECT_EQ(bind(fd_, reinterpret_cast<const sockaddr *>(&address), sizeof address), 0);
        EXPECT_EQ(listen(fd_, 0), 0);
        setenv("DVS_EMULATOR", path.c_str(), 1);
        testing::internal::CaptureStderr();
        alarm(20); // turns a hang into a failure
    }
    ~IdlePeer() override {
        alarm(0);
        testing::internal::GetCapturedStderr();
        close(fd_);
    }

    TempDir directory_;
    int fd_;
};

TEST_F(IdlePeer, FailsLikeAMissingDeviceWhenTheBacklogIsFull) {
    const int first = HostDevice_Open("/nonexistent/device");
    ASSERT_NE(first, -1);
    EXPECT_EQ(HostDevice_Open("/nonexistent/device"), -1);
    EXPECT_EQ(errno, ENOENT);
    void *out = nullptr;
    uint32_t outLen = 0;
    EXPECT_EQ(DVSHYP_StateGet(&out, &outLen), HYP_FAILURE);
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
    HostDevice_Close(first);
}

TEST_F(IdlePeer, FailsWhenThePeerStopsReading) {
    const std::string value(32 << 20, 'v');
    EXPECT_EQ(DVSHYP_StateInit(value.data(), static_cast<uint32_t>(value.size())), HYP_FAILURE);
}

TEST_F(IdlePeer, FailsWhenThePeerSendsNoLimit) {
    uint32_t limit = 0;
    EXPECT_EQ(KIT_Get(KIT_NODE_net_maxPortsSystemWide, nullptr, &limit, sizeof limit), HYP_FAILURE);
}

} // namespace
} // namespace dvs::test
