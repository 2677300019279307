/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_KERNEL_DEVICE_H
#define DVSCTL_KERNEL_DEVICE_H

// Calls to the switching module under --timeout. The library waits for the device for as long as the device
// likes, so each call runs in a child process, which is given up when the time is over: a module that hangs
// does not hang the operator, and whatever the call left in the library's switch table is gone with it.

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "dvs/status.h"
#include "form/text.h"
#include "kernel/failure.h"
#include "tools/dvsctl/cli/context.h"

namespace dvs::ctl {

/// What came of a call that came to its end.
struct Answer {
    HYP_ReturnStatus status = HYP_OK;
    hyp::Failure failure;              ///< of a refusal: which step of the device call failed
    std::vector<std::uint8_t> bytes;   ///< what the call handed back
    std::vector<std::string> messages; ///< what the library said

    /// True when the device could not be opened.
    bool IsDeviceAbsent() const { return status != HYP_OK && failure.step == hyp::Step::Open; }
};

/// The buffer a library call hands out, released with it.
class Fetched {
public:
    Fetched() = default;
    ~Fetched();
    Fetched(const Fetched &) = delete;
    Fetched &operator=(const Fetched &) = delete;

    void **Out() { return &start_; }
    std::uint32_t *Size() { return &size_; }
    Bytes View() const { return start_ ? Bytes(static_cast<const std::uint8_t *>(start_), size_) : Bytes(); }

private:
    void *start_ = nullptr;
    std::uint32_t size_ = 0;
};

/// A library call: its status, and through `reply` what it hands back.
using DeviceCall = std::function<HYP_ReturnStatus(std::vector<std::uint8_t> &reply)>;

/// Makes the call in a child process. Throws Error(Timeout) when it takes too long, Error(Failed) when the
/// child did not come to its end.
Answer CallDevice(Context &context, const DeviceCall &call);

/// The same for the common shape: a library function that hands out a buffer.
using FetchCall = std::function<HYP_ReturnStatus(void **out, std::uint32_t *size)>;
Answer FetchFromDevice(Context &context, const FetchCall &call);

/// The error for an answer that is a refusal: `title` says what was wanted.
Error DeviceError(const Answer &answer, std::string title);

/// Throws DeviceError unless the answer is a success.
void RequireOk(const Answer &answer, const std::string &title);

} // namespace dvs::ctl

#endif
