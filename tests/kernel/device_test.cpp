/* SPDX-License-Identifier: Apache-2.0 */
// The device channel: cached and fresh descriptors, growing buffers, command execution, messages, the lock.

#include <cerrno>
#include <cstring>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "emulator/hyp_support.h"
#include "kernel/fake_device.h"

namespace dvs::test {
namespace {

constexpr const char *kPath = "/pelo/devices/char/hypdriver/dvsdev";
const std::string kNoDevice = std::string("-1:failed to open dvsdev device ") + kPath + "\n";

class DeviceChannel : public testing::Test, protected FakeDeviceTest {};

uint32_t WordAt(const DeviceCall &call, std::size_t offset) {
    uint32_t word = 0;
    std::memcpy(&word, call.record.data() + offset, sizeof word);
    return word;
}

TEST_F(DeviceChannel, TruncatesLongTextsToTheirFields) {
    const std::string text(300, 'x');
    EXPECT_EQ(DVSHYP_PortDataClear(text.c_str(), text.c_str(), text.c_str()), HYP_OK);
    EXPECT_EQ(device.calls.at(0).record, RecordBytes()
                                             .Text(0, std::string(63, 'x'))
                                             .Text(64, std::string(47, 'x'))
                                             .Text(112, std::string(127, 'x'))
                                             .Bytes());
}

TEST_F(DeviceChannel, TruncatesTextsOfTheFieldsSizeByOne) {
    EXPECT_EQ(DVSHYP_PortRemove(std::string(64, 's').c_str(), std::string(48, 'p').c_str()), HYP_OK);
    EXPECT_EQ(device.calls.at(0).record,
              RecordBytes().Text(0, std::string(63, 's')).Text(64, std::string(47, 'p')).Bytes());
}

TEST_F(DeviceChannel, WithoutADeviceEveryCallFailsWithOneMessage) {
    device.present = false;
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_FAILURE);
    EXPECT_EQ(Exec("help").status, HYP_FAILURE);
    EXPECT_EQ(log.lines, std::vector<std::string>(4, kNoDevice));
    EXPECT_EQ(device.openedPaths, std::vector<std::string>(4, kPath));
    EXPECT_TRUE(device.calls.empty());
}

TEST_F(DeviceChannel, NextCallUsesADeviceThatAppears) {
    device.present = false;
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
    device.present = true;
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_OK);
}

TEST_F(DeviceChannel, MessagesGoToStandardErrorWhateverTheLevels) {
    DVSLog_SetSink(nullptr, nullptr);
    dvs_debug = dvsdata_debug = -1;
    device.present = false;
    testing::internal::CaptureStderr();
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_FAILURE);
    EXPECT_EQ(testing::internal::GetCapturedStderr(), kNoDevice.substr(3));
}

TEST_F(DeviceChannel, PlainCallsShareOneDescriptorThatIsNeverClosed) {
    for (int i = 0; i < 5; i++)
        EXPECT_EQ(DVSHYP_StateCleanup(), HYP_OK);
    EXPECT_EQ(device.opened, 1U);
    EXPECT_EQ(device.closed, 0U);
}

TEST_F(DeviceChannel, ConcurrentFirstCallsKeepOneDescriptor) {
    std::vector<std::thread> threads;
    for (int i = 0; i < 8; i++)
        threads.emplace_back([] { EXPECT_EQ(DVSHYP_StateCleanup(), HYP_OK); });
    for (std::thread &thread : threads)
        thread.join();
    EXPECT_EQ(device.opened - device.closed, 1U);
}

TEST_F(DeviceChannel, FetchesAndExecutionsOpenAndCloseTheirOwn) {
    device.replies[Command::StateGet] = "state";
    device.replies[Command::CmdExec] = "reply";
    EXPECT_EQ(Fetch(DVSHYP_StateGet).text, "state");
    EXPECT_EQ(Exec("help").text, "reply");
    EXPECT_EQ(device.opened, 2U);
    EXPECT_EQ(device.closed, 2U);
    EXPECT_NE(device.calls[0].fd, device.calls[1].fd);
}

TEST_F(DeviceChannel, SuccessfulCallIgnoresTheRecordsStatus) {
    device.script = {{0, HYP_EXISTS, -1, {}}};
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_OK);
    device.script = {{0, HYP_LIMIT_EXCEEDED, 2, "ab"}};
    EXPECT_EQ(Fetch(DVSHYP_StateGet).text, "ab");
}

TEST_F(DeviceChannel, FailedCallReturnsThePresetStatusByDefault) {
    device.script = {{EIO, -1, -1, {}}};
    DVSHYPRequest request{};
    request.status = HYP_EXISTS;
    EXPECT_EQ(DVSHYP_Ioctl(1, &request), HYP_FAILURE);
}

TEST_F(DeviceChannel, PrintsErrorsOtherThanMissingObjects) {
    device.script = {{ENOENT, HYP_NOT_FOUND, -1, {}}, {EEXIST, HYP_EXISTS, -1, {}}};
    EXPECT_EQ(DVSHYP_PortFind("s", "p"), HYP_NOT_FOUND);
    EXPECT_TRUE(log.lines.empty());
    EXPECT_EQ(DVSHYP_PortFind("s", "p"), HYP_EXISTS);
    EXPECT_EQ(log.lines, std::vector<std::string>{"-1:ioctl failed: File exists\n"});
}

TEST_F(DeviceChannel, ReceivingCallsPrintNothingWhenTheyFail) {
    device.script = {{EIO, HYP_BAD_PARAM, -1, {}}, {EIO, HYP_BAD_PARAM, -1, {}}};
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_BAD_PARAM);
    EXPECT_EQ(Exec("x").status, HYP_BAD_PARAM);
    EXPECT_TRUE(log.lines.empty());
}

TEST_F(DeviceChannel, FetchOf100000BytesTakesTwoCalls) {
    device.replies[Command::StateGet] = std::string(100000, 'v');
    void *out = nullptr;
    uint32_t outLen = 0;
    EXPECT_EQ(DVSHYP_StateGet(&out, &outLen), HYP_OK);
    EXPECT_EQ(outLen, 100000U);
    ASSERT_EQ(device.calls.size(), 2U);
    EXPECT_EQ(WordAt(device.calls[0], 260), 32768U);
    EXPECT_EQ(WordAt(device.calls[1], 260), 100000U);
    EXPECT_EQ(WordAt(device.calls[1], 256), 0x0bad0001U);
    DVSHYP_DataFree(out);
}

TEST_F(DeviceChannel, FetchStopsWhenTheModuleReportsNoLargerSize) {
    device.script = {{ENOSPC, HYP_LIMIT_EXCEEDED, 40000, {}}, {ENOSPC, HYP_LIMIT_EXCEEDED, 40000, {}}};
    int marker = 0;
    void *out = &marker;
    uint32_t outLen = 0;
    EXPECT_EQ(DVSHYP_StateGet(&out, &outLen), HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(out, nullptr);
    EXPECT_EQ(outLen, 40000U);
    EXPECT_EQ(device.calls.size(), 2U);
}

TEST_F(DeviceChannel, FetchStopsWhenTheModuleReportsASmallerSize) {
    device.script = {{ENOSPC, HYP_LIMIT_EXCEEDED, 10, {}}};
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_LIMIT_EXCEEDED);
    EXPECT_EQ(device.calls.size(), 1U);
}

TEST_F(DeviceChannel, FetchThatFailsToOpenKeepsItsLength) {
    device.present = false;
    int marker = 0;
    void *out = &marker;
    uint32_t outLen = 77;
    EXPECT_EQ(DVSHYP_StateGet(&out, &outLen), HYP_FAILURE);
    EXPECT_EQ(out, nullptr);
    EXPECT_EQ(outLen, 77U);
}

TEST_F(DeviceChannel, RejectsAReplyLongerThanTheBuffer) {
    for (const int64_t claimed : {int64_t{32769}, int64_t{0xFFFFFFFF}}) {
        device.script = {{0, -1, claimed, {}}, {0, -1, claimed, {}}};
        void *out = &device;
        uint32_t outLen = 77;
        EXPECT_EQ(DVSHYP_StateGet(&out, &outLen), HYP_FAILURE);
        EXPECT_EQ(out, nullptr);
        EXPECT_EQ(outLen, 0U);
        out = &device;
        EXPECT_EQ(DVSHYP_CmdExec("", "x", nullptr, 0, &out, &outLen), HYP_FAILURE);
        EXPECT_EQ(out, nullptr);
        EXPECT_EQ(outLen, 0U);
    }
}

TEST_F(DeviceChannel, FailedReceiveNeverReturnsSuccess) {
    device.script = {{EIO, HYP_OK, -1, {}}, {EIO, HYP_OK, -1, {}}};
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_FAILURE);
    EXPECT_EQ(Exec("x").status, HYP_FAILURE);
}

TEST_F(DeviceChannel, CmdExecFillsItsOwnFields) {
    const char in[] = "input";
    device.replies[Command::CmdExec] = "out";
    EXPECT_EQ(Fetch(DVSHYP_CmdExec, "s", std::string(200, 'c').c_str(), in, uint32_t{5}).text, "out");
    RecordBytes expected;
    expected.Text(0, "s").Text(272, std::string(127, 'c')).Word(400, 5).Address(404, in).Word(412, 32768);
    std::string record = device.calls.at(0).record;
    EXPECT_NE(record.substr(416), std::string(8, '\0'));
    record.replace(416, 8, 8, '\0');
    EXPECT_EQ(record, expected.Bytes());
}

TEST_F(DeviceChannel, CmdExecRetriesAtAnUnchangedSize) {
    for (int i = 0; i < 500; i++)
        device.script.push_back({ENOSPC, HYP_LIMIT_EXCEEDED, i < 250 ? -1 : 10, {}});
    device.script.push_back({0, -1, 2, "ok"});
    const Bytes reply = Exec("x");
    EXPECT_EQ(reply.status, HYP_OK);
    EXPECT_EQ(reply.text, "ok");
    EXPECT_EQ(device.calls.size(), 501U);
}

TEST_F(DeviceChannel, CmdExecAcceptsASizeOfZero) {
    device.script = {{ENOSPC, HYP_LIMIT_EXCEEDED, 0, {}}, {0, -1, 0, {}}};
    EXPECT_EQ(Exec("x").status, HYP_OK);
    device.script = {{ENOSPC, HYP_LIMIT_EXCEEDED, 0, {}}, {0, -1, 1, {}}};
    EXPECT_EQ(Exec("x").status, HYP_FAILURE);
}

TEST_F(DeviceChannel, CmdExecReturnsTheModulesLength) {
    device.script = {{EINVAL, HYP_BAD_PARAM, 123, {}}};
    void *out = &device;
    uint32_t outLen = 0;
    EXPECT_EQ(DVSHYP_CmdExec("", "x", nullptr, 0, &out, &outLen), HYP_BAD_PARAM);
    EXPECT_EQ(out, nullptr);
    EXPECT_EQ(outLen, 123U);
}

TEST_F(DeviceChannel, DataFreeAcceptsNull) {
    DVSHYP_DataFree(nullptr);
}

TEST_F(DeviceChannel, LockIsRecursive) {
    MXUserRecLock *first = DVSwitchHYPLock();
    MXUserRecLock *second = DVSwitchHYPLock();
    EXPECT_EQ(first, second);
    DVSwitchHYPUnlock(second);
    DVSwitchHYPUnlock(first);
    DVSwitchHYPUnlock(nullptr);
}

TEST_F(DeviceChannel, LockExcludesOtherThreads) {
    int shared = 0;
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; i++) {
        threads.emplace_back([&] {
            for (int round = 0; round < 1000; round++) {
                MXUserRecLock *lock = DVSwitchHYPLock();
                shared++;
                DVSwitchHYPUnlock(lock);
            }
        });
    }
    for (std::thread &thread : threads)
        thread.join();
    EXPECT_EQ(shared, 4000);
}

#ifndef NDEBUG
TEST_F(DeviceChannel, LockIsTakenBeforeTheStateLock) {
    EXPECT_DEATH(
        {
            MXUserRecLock *state = DVSwitchHandleLock();
            MXUserRecLock *hyp = DVSwitchHYPLock();
            DVSwitchHYPUnlock(hyp);
            DVSwitchHandleUnlock(state);
        },
        "lock order violated: \"dvshyp\"");
    MXUserRecLock *hyp = DVSwitchHYPLock();
    MXUserRecLock *state = DVSwitchHandleLock();
    DVSwitchHandleUnlock(state);
    DVSwitchHYPUnlock(hyp);
}
#endif

} // namespace
} // namespace dvs::test
