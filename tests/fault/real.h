/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_FAULT_REAL_H
#define TESTS_FAULT_REAL_H

// The function that an interposed one wraps: the next of that name in the search order, from the C library or
// from a sanitizer's runtime.

#include <atomic>
#include <cstdlib>

#include <dlfcn.h>

#include "fault/plan.h"

namespace fault {

template <typename Function> class Real {
public:
    explicit constexpr Real(const char *name) : name_(name) {}

    template <typename... Args> decltype(auto) operator()(Args... args) { return Get()(args...); }

    [[nodiscard]] bool IsKnown() const { return function_.load(std::memory_order_acquire) != nullptr; }

    Function *Get() {
        Function *function = function_.load(std::memory_order_acquire);
        if (!function) {
            const Quiet quiet;
            function = reinterpret_cast<Function *>(dlsym(RTLD_NEXT, name_));
            if (!function)
                std::abort(); // this system has no such function, so no valid caller exists
            function_.store(function, std::memory_order_release);
        }
        return function;
    }

private:
    const char *name_;
    std::atomic<Function *> function_{nullptr};
};

} // namespace fault

#endif
