/* SPDX-License-Identifier: Apache-2.0 */
// Formatted text blocks, the checked copy, error texts, status texts and the host's log.

#include "platform/runtime.h"
#include "platform/status_text.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <set>
#include <string>
#include <thread>

#include <unistd.h>

namespace {

using Text = std::unique_ptr<char, decltype(&std::free)>;

TEST(SafeAsprintf, FormatsIntoANewBlock) {
    size_t length = 0;
    const Text text(Str_SafeAsprintf(&length, "%s.%s", "/x/state", "tmp"), &std::free);
    ASSERT_TRUE(text);
    EXPECT_STREQ(text.get(), "/x/state.tmp");
    EXPECT_EQ(length, std::strlen("/x/state.tmp"));
}

TEST(SafeAsprintf, LengthIsOptional) {
    const Text text(Str_SafeAsprintf(nullptr, "%d", 7), &std::free);
    EXPECT_STREQ(text.get(), "7");
}

TEST(SafeAsprintf, AcceptsLongTexts) {
    const std::string part(100000, 'p');
    size_t length = 0;
    const Text text(Str_SafeAsprintf(&length, "<%s>", part.c_str()), &std::free);
    EXPECT_EQ(text.get(), "<" + part + ">");
    EXPECT_EQ(length, part.size() + 2);
}

TEST(Strcpy, CopiesWhatFitsExactly) {
    char dst[4] = {'x', 'x', 'x', 'x'};
    EXPECT_EQ(Str_Strcpy(dst, "abc", sizeof dst), dst);
    EXPECT_STREQ(dst, "abc");
}

TEST(StrcpyDeath, AbortsWhenTheTextDoesNotFit) {
    char dst[4];
    EXPECT_DEATH(Str_Strcpy(dst, "abcd", sizeof dst),
                 "text of 4 characters does not fit into 4 bytes: \"abcd\"");
    EXPECT_DEATH(Str_Strcpy(dst, "", 0), "does not fit into 0 bytes");
}

TEST(Errno2String, ReturnsTheSystemsText) {
    EXPECT_STREQ(Err_Errno2String(EACCES), std::strerror(EACCES));
    EXPECT_STREQ(Err_Errno2String(ENOSPC), std::strerror(ENOSPC));
    EXPECT_STREQ(Err_Errno2String(99999), "Unknown error 99999");
}

TEST(Errno2String, UnknownNumbersDoNotShareABufferBetweenThreads) {
    const std::string mine = Err_Errno2String(99999);
    const char *text = Err_Errno2String(99999);
    std::thread([] { EXPECT_STREQ(Err_Errno2String(88888), "Unknown error 88888"); }).join();
    EXPECT_EQ(text, mine);
}

TEST(StatusText, EveryStatusHasItsOwn) {
    const HYP_ReturnStatus known[] = {
        HYP_OK,        HYP_FAILURE,       HYP_NOT_FOUND,   HYP_EXISTS,     HYP_LIMIT_EXCEEDED,
        HYP_BAD_PARAM, HYP_FILE_EMPTY,    HYP_IO_ERROR,    HYP_READ_ERROR, HYP_WRITE_ERROR,
        HYP_NO_MEMORY, HYP_NOT_SUPPORTED, HYP_BAD_CHECKSUM};
    std::set<std::string> texts;
    for (const HYP_ReturnStatus status : known)
        texts.insert(HYP_ReturnStatusToString(status));
    EXPECT_EQ(texts.size(), std::size(known));
    EXPECT_FALSE(texts.contains(HYP_ReturnStatusToString(0x12345678)));
    EXPECT_FALSE(texts.contains(""));
}

__attribute__((format(printf, 2, 3))) void Log(uint32_t level, const char *format, ...) {
    va_list args;
    va_start(args, format);
    LogV(level, format, args);
    va_end(args);
}

TEST(HostLog, StampsOneLinePerMessage) {
    testing::internal::CaptureStderr();
    Log(2, "failed: %s\n", "why");
    const std::string line = testing::internal::GetCapturedStderr();
    int year = 0, pid = 0, end = 0;
    const int fields =
        std::sscanf(line.c_str(), "%4d-%*2d-%*2dT%*2d:%*2d:%*2d.%*3dZ dvs[%d] level 2: failed: why\n%n",
                    &year, &pid, &end);
    EXPECT_EQ(fields, 2) << line;
    EXPECT_EQ(static_cast<std::size_t>(end), line.size()) << line;
    EXPECT_GE(year, 2024);
    EXPECT_EQ(pid, getpid());
}

TEST(HostLog, AddsAMissingLineEnd) {
    testing::internal::CaptureStderr();
    Log(0, "no line end");
    const std::string line = testing::internal::GetCapturedStderr();
    EXPECT_TRUE(line.ends_with("level 0: no line end\n")) << line;
}

TEST(HostLog, KeepsLongMessagesWhole) {
    for (const std::size_t size : {900u, 980u, 1000u, 1024u, 5000u}) {
        const std::string text(size, 'm');
        testing::internal::CaptureStderr();
        Log(1, "%s\n", text.c_str());
        EXPECT_TRUE(testing::internal::GetCapturedStderr().ends_with("level 1: " + text + "\n")) << size;
    }
}

TEST(HostLog, KeepsErrno) {
    testing::internal::CaptureStderr();
    errno = EXDEV;
    Log(2, "x\n");
    EXPECT_EQ(errno, EXDEV);
    testing::internal::GetCapturedStderr();
}

} // namespace
