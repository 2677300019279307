/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_FAULT_REAL_H
#define TESTS_FAULT_REAL_H

// The function an interposed one stands in front of: the next of that name in the search order, which is the
// C library's, or a sanitizer's in front of it.

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
                std::abort(); // this system has no such function: nobody can have called it in earnest
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
