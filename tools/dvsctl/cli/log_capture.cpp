/* SPDX-License-Identifier: Apache-2.0 */
// The sink of the library's messages.

#include "tools/dvsctl/cli/log_capture.h"

#include <algorithm>
#include <cstdio>
#include <utility>

#include "dvs/configstore.h"
#include "dvs/log.h"
#include "form/text.h"

namespace dvs::ctl {

namespace {

constexpr std::size_t kMostKept = 8;

} // namespace

LogCapture::LogCapture() : storeLevel_(dvsconfigstore_debug) {
    SetVerbose(false);
    DVSLog_SetSink(Receive, this);
}

LogCapture::~LogCapture() {
    DVSLog_SetSink(nullptr, nullptr);
    dvsconfigstore_debug = storeLevel_;
}

// Traces that nobody reads are not only formatted in vain: a load that is followed builds lists in lists, at
// twice the memory.
void LogCapture::SetVerbose(bool verbose) {
    verbose_ = verbose;
    dvsconfigstore_debug = verbose ? storeLevel_ : std::min(storeLevel_, 0);
}

std::vector<std::string> LogCapture::Take() {
    std::vector<std::string> texts;
    for (Message &message : std::exchange(messages_, {}))
        texts.push_back(std::move(message.text));
    return texts;
}

std::vector<std::string> LogCapture::TakeErrors() {
    std::erase_if(messages_, [](const Message &message) { return message.level < 0; });
    return Take();
}

void LogCapture::Receive(int level, const char *text, void *self) {
    auto &capture = *static_cast<LogCapture *>(self);
    std::string line = text;
    while (!line.empty() && line.back() == '\n')
        line.pop_back();
    if (capture.verbose_) std::fprintf(stderr, "libdvs: %s\n", form::Escape(line).c_str());
    if (level > 0) return;
    if (capture.messages_.size() == kMostKept) capture.messages_.erase(capture.messages_.begin());
    capture.messages_.push_back({level, std::move(line)});
}

} // namespace dvs::ctl
