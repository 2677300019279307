/* SPDX-License-Identifier: Apache-2.0 */
// The observers of failed device calls: one list per thread, innermost first. The device channel reports to
// them.

#include "kernel/failure.h"

namespace dvs::hyp {

namespace {

constinit thread_local FailureObserver *t_innermost = nullptr;

} // namespace

FailureObserver::FailureObserver() : outer_(t_innermost) {
    t_innermost = this;
}

FailureObserver::~FailureObserver() {
    t_innermost = outer_;
}

void Observe(const Failure &failure) {
    if (t_innermost) t_innermost->last_ = failure;
}

} // namespace dvs::hyp
