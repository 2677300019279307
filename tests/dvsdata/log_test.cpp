/* SPDX-License-Identifier: Apache-2.0 */
// Each message reaches the sink whole, in one call. Without a sink, messages go to the streams again.

#include "dvsdata/log.h"

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "dvs/log.h"

namespace {

using Messages = std::vector<std::pair<int, std::string>>;

void Collect(int level, const char *text, void *arg) { static_cast<Messages *>(arg)->emplace_back(level, text); }

__attribute__((format(printf, 2, 3))) void Emit(int level, const char *format, ...) {
    va_list args;
    va_start(args, format);
    dvs::log::ToStream(stdout, level, format, args);
    va_end(args);
}

class LogSink : public testing::Test {
protected:
    void TearDown() override { DVSLog_SetSink(nullptr, nullptr); }
    Messages messages_;
};

TEST_F(LogSink, ReceivesTextAndLevel) {
    DVSLog_SetSink(Collect, &messages_);
    Emit(2, "port %s: %d\n", "p1", 7);
    ASSERT_EQ(messages_.size(), 1u);
    EXPECT_EQ(messages_[0].first, 2);
    EXPECT_EQ(messages_[0].second, "port p1: 7\n");
}

TEST_F(LogSink, ReceivesLongMessagesWhole) {
    DVSLog_SetSink(Collect, &messages_);
    // Covers every length around the size of the stack buffer.
    for (std::size_t size = 0; size < 5000; size += size < 1030 ? 1 : 993) {
        const std::string name(size, 'x');
        messages_.clear();
        Emit(0, "%s\n", name.c_str());
        ASSERT_EQ(messages_.size(), 1u);
        ASSERT_EQ(messages_[0].second, name + "\n");
    }
}

TEST_F(LogSink, NullRestoresTheStream) {
    DVSLog_SetSink(Collect, &messages_);
    DVSLog_SetSink(nullptr, nullptr);
    testing::internal::CaptureStdout();
    Emit(0, "to stdout\n");
    EXPECT_EQ(testing::internal::GetCapturedStdout(), "to stdout\n");
    EXPECT_TRUE(messages_.empty());
}

} // namespace
