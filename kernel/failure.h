/* SPDX-License-Identifier: Apache-2.0 */
#ifndef KERNEL_FAILURE_H
#define KERNEL_FAILURE_H

// Why a device call failed, as a record. The exported functions return the module's status and print a message; a
// caller in the same process that needs the errno observes it here instead of reading the message.

#include <cstdint>

namespace dvs::hyp {

/// The step of a device call that failed.
enum class Step : uint8_t {
    None,     ///< the last device call succeeded, or there was none
    Open,     ///< the device could not be opened
    Send,     ///< the request failed
    Reply,    ///< the module claims more bytes than the receive buffer holds
    Allocate, ///< no memory for the receive buffer
};

/// What failed in a device call. Plain bytes: may be copied through a pipe.
struct Failure {
    Step step = Step::None;
    int error = 0; ///< errno of Open and Send; otherwise 0
};

/// While it lives, receives the outcome of each device call of its thread. Observers nest; the innermost receives.
class FailureObserver {
public:
    FailureObserver();
    ~FailureObserver();
    FailureObserver(const FailureObserver &) = delete;
    FailureObserver &operator=(const FailureObserver &) = delete;

    /// The outcome of this thread's last device call.
    const Failure &Last() const { return last_; }

private:
    friend void Observe(const Failure &failure);

    Failure last_;
    FailureObserver *outer_;
};

/// Passes an outcome to the thread's innermost observer, if there is one. Leaves errno as it is.
void Observe(const Failure &failure);

} // namespace dvs::hyp

#endif
