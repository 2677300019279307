/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_LOG_CAPTURE_H
#define DVSCTL_CLI_LOG_CAPTURE_H

// Catches the library's messages, so that they become the cause in dvsctl's own errors instead of lines
// between its output. With --verbose they are also printed on standard error as they come.

#include <cstdint>
#include <string>
#include <vector>

namespace dvs::ctl {

class LogCapture {
public:
    /// Becomes the library's sink until it is destroyed, and has it say errors only until then.
    LogCapture();
    ~LogCapture();
    LogCapture(const LogCapture &) = delete;
    LogCapture &operator=(const LogCapture &) = delete;

    /// With `verbose`, messages are printed as well, traces among them.
    void SetVerbose(bool verbose);

    /// The messages since the last call, without traces, oldest first (at most the last few).
    std::vector<std::string> Take();
    /// The same without those that the library prints at any level, which are no errors as a rule.
    std::vector<std::string> TakeErrors();

private:
    static void Receive(int level, const char *text, void *self);

    const std::int32_t storeLevel_; // of the config store's messages, as it was
    struct Message {
        int level;
        std::string text;
    };
    std::vector<Message> messages_;
    bool verbose_ = false;
};

} // namespace dvs::ctl

#endif
