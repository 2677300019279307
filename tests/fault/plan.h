/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_FAULT_PLAN_H
#define TESTS_FAULT_PLAN_H

// Decisions for the interposed functions, which query them before they call the real function. This code runs
// inside malloc, so it does not allocate, lock or call an interposed function.

#include <cstddef>
#include <cstdint>

namespace fault {

enum class Kind : unsigned {
    kAlloc,
    kOpen,
    kRead,
    kWrite,
    kFsync,
    kTruncate,
    kRename,
    kUnlink,
    kStat,
    kClose,
    kFlock,
    kLock,
    kChmod,
    kMkdir,
    kMmap,
    kIoctl,
    kSocket,
    kConnect,
    kSend,
    kRecv,
    kRandom,
    kReadlink,
    kNum
};

/// The file of a call, if it has one: a path relative to `dirFd`, or a descriptor.
struct Subject {
    int dirFd = -1;
    const char *path = nullptr;
    int fd = -1;
    int openFlags = 0;
};

struct Decision {
    enum class What { kPass, kFail, kShort } what = What::kPass;
    int error = 0;         // kFail
    std::size_t bytes = 0; // kShort: the maximum to transfer

    [[nodiscard]] bool Fails() const { return what == What::kFail; }
    [[nodiscard]] std::size_t Cut(std::size_t length) const {
        return what == What::kShort && bytes < length ? bytes : length;
    }
};

/// Counts the call and decides about it. A plan that kills the process does it here.
Decision Decide(Kind kind, const Subject &subject);

/// Returns true, with errno set, when the call must fail.
bool Fails(Kind kind, const Subject &subject);

/// Counts a block: allocated (+1) or freed (-1).
void NoteBlock(int change);

/// While it lives, the calling thread's calls do not count. For calls made by an interposed function itself.
class Quiet {
public:
    Quiet();
    ~Quiet();
    Quiet(const Quiet &) = delete;
    Quiet &operator=(const Quiet &) = delete;
};

} // namespace fault

#endif
