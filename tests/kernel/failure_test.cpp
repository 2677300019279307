/* SPDX-License-Identifier: Apache-2.0 */
// The record of a failed device call: which step failed and its errno, per thread, without a message text.

#include <cerrno>
#include <thread>

#include <gtest/gtest.h>

#include "emulator/hyp_support.h"
#include "kernel/failure.h"
#include "kernel/fake_device.h"

namespace dvs::test {
namespace {

using hyp::FailureObserver;

class FailureRecord : public testing::Test, protected FakeDeviceTest {
protected:
    FailureObserver observer;

    void Expect(hyp::Step step, int error) const {
        EXPECT_EQ(observer.Last().step, step);
        EXPECT_EQ(observer.Last().error, error);
    }
};

TEST_F(FailureRecord, IsEmptyBeforeACallAndAfterASuccess) {
    Expect(hyp::Step::None, 0);
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_OK);
    Expect(hyp::Step::None, 0);
}

TEST_F(FailureRecord, RecordsAFailedOpen) {
    for (const int error : {ENOENT, EACCES, EBUSY}) {
        device.present = false;
        device.openError = error;
        EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
        Expect(hyp::Step::Open, error);
        EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_FAILURE);
        Expect(hyp::Step::Open, error);
        EXPECT_EQ(Exec("help").status, HYP_FAILURE);
        Expect(hyp::Step::Open, error);
    }
}

TEST_F(FailureRecord, RecordsTheErrnoOfAFailedRequest) {
    device.script = {{EBUSY, HYP_FAILURE, -1, {}},
                     {EBUSY, HYP_FAILURE, -1, {}},
                     {EIO, HYP_BAD_PARAM, -1, {}},
                     {ENOENT, HYP_NOT_FOUND, -1, {}}};
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
    Expect(hyp::Step::Send, EBUSY);
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_FAILURE);
    Expect(hyp::Step::Send, EBUSY);
    EXPECT_EQ(Exec("help").status, HYP_BAD_PARAM);
    Expect(hyp::Step::Send, EIO);
    EXPECT_EQ(DVSHYP_PortFind("s", "p"), HYP_NOT_FOUND);
    Expect(hyp::Step::Send, ENOENT);
}

TEST_F(FailureRecord, RecordsAReplyLongerThanTheBuffer) {
    device.script = {{0, -1, 32769, {}}, {0, -1, 32769, {}}};
    EXPECT_EQ(Fetch(DVSHYP_StateGet).status, HYP_FAILURE);
    Expect(hyp::Step::Reply, 0);
    EXPECT_EQ(Exec("help").status, HYP_FAILURE);
    Expect(hyp::Step::Reply, 0);
}

TEST_F(FailureRecord, OfAGrowingFetchComesFromItsLastCall) {
    device.script = {{ENOSPC, HYP_LIMIT_EXCEEDED, 40000, {}}, {0, -1, 2, "ok"}};
    EXPECT_EQ(Fetch(DVSHYP_StateGet).text, "ok");
    Expect(hyp::Step::None, 0);
}

TEST_F(FailureRecord, GoesToTheInnermostObserver) {
    device.script = {{EBUSY, HYP_FAILURE, -1, {}}, {EIO, HYP_FAILURE, -1, {}}};
    {
        const FailureObserver inner;
        EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
        EXPECT_EQ(inner.Last().error, EBUSY);
        Expect(hyp::Step::None, 0);
    }
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
    Expect(hyp::Step::Send, EIO);
}

TEST_F(FailureRecord, IsPerThread) {
    device.script = {{EBUSY, HYP_FAILURE, -1, {}}};
    std::thread([] {
        const FailureObserver other;
        EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
        EXPECT_EQ(other.Last().error, EBUSY);
    }).join();
    Expect(hyp::Step::None, 0);
}

TEST_F(FailureRecord, PreservesErrnoForTheMessage) {
    device.script = {{EBUSY, HYP_FAILURE, -1, {}}};
    EXPECT_EQ(DVSHYP_StateCleanup(), HYP_FAILURE);
    EXPECT_EQ(log.lines, std::vector<std::string>{"-1:ioctl failed: Device or resource busy\n"});
}

} // namespace
} // namespace dvs::test
