/* SPDX-License-Identifier: Apache-2.0 */
// The port limit a program set for itself. An object file of its own, so that a program that brings its own
// system-information interface can still link whatever calls the setter.

#include "platform/embedded/host_limits.h"

#include <atomic>

namespace {

constinit std::atomic<uint32_t> g_maxPorts{0};

} // namespace

extern "C" void DVSHost_SetMaxPorts(uint32_t ports) {
    g_maxPorts.store(ports, std::memory_order_relaxed);
}

extern "C" uint32_t DVSHost_MaxPorts(void) {
    return g_maxPorts.load(std::memory_order_relaxed);
}
