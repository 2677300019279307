/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_SWITCH_TABLE_H
#define DVSSTATE_SWITCH_TABLE_H

// The process-wide switch table and its lock, for the other files of this folder. dvs/state.h declares the
// exported operations on it.

#include <array>
#include <cstdint>
#include <string_view>

#include "dvs/state.h"

namespace dvs::state {

inline constexpr std::size_t kSwitchNum = 32;      // slots of the table
inline constexpr std::size_t kSwitchIdSize = 64;   // terminator included
inline constexpr std::size_t kClassNameSize = 128; // terminator included

// classFlags of a switch.
inline constexpr uint32_t kUnlimitedClass = 1; // exempt from maxPorts
inline constexpr uint32_t kOverlayClass = 2;

/// The flags of a class, by its whole name; 0 for classes with a limit of their own.
[[nodiscard]] uint32_t ClassFlags(std::string_view className);

/// Slot order is insertion order into the first free slot. Guarded by the lock "dvsstate".
extern std::array<DVSwitch *, kSwitchNum> dvsSwitchTable;

/// Holds the lock "dvsstate" for a scope.
class StateLock {
public:
    StateLock() : lock_(DVSwitchHandleLock()) {}
    ~StateLock() { DVSwitchHandleUnlock(lock_); }
    StateLock(const StateLock &) = delete;
    StateLock &operator=(const StateLock &) = delete;

private:
    MXUserRecLock *lock_;
};

/// Reads the host-wide port limit into uwMaxNumActivePortsSystemWide. Called by the first switch add, and by
/// callers that need the limit before it. The id is for the messages.
[[nodiscard]] HYP_ReturnStatus ReadHostLimit(const char *switchId);

/// The worker of DVSState_SwitchAdd. The class name comes from a buffer, so it may have any length.
[[nodiscard]] HYP_ReturnStatus DVSStateSwitchAdd(const char *switchId, std::string_view className,
                                                 uint32_t maxPorts, uint32_t version);

/// The worker of DVSState_SwitchRemove. The caller holds the lock.
[[nodiscard]] HYP_ReturnStatus DVSStateSwitchRemove(const char *switchId);

/// The slot of the first switch with this id; the end of the table if there is none. The caller holds the
/// lock.
[[nodiscard]] std::array<DVSwitch *, kSwitchNum>::iterator FindSlot(std::string_view switchId);

} // namespace dvs::state

#endif
