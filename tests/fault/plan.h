/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_FAULT_PLAN_H
#define TESTS_FAULT_PLAN_H

// What the interposed functions ask before they call the real one. Nothing here allocates, locks or calls an
// interposed function: it all runs inside malloc.

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

/// The file a call is about, as far as it is about one: a path relative to `dirFd`, or a descriptor.
struct Subject {
    int dirFd = -1;
    const char *path = nullptr;
    int fd = -1;
    int openFlags = 0;
};

struct Decision {
    enum class What { kPass, kFail, kShort } what = What::kPass;
    int error = 0;         // kFail
    std::size_t bytes = 0; // kShort: at most so many

    [[nodiscard]] bool Fails() const { return what == What::kFail; }
    [[nodiscard]] std::size_t Cut(std::size_t length) const {
        return what == What::kShort && bytes < length ? bytes : length;
    }
};

/// Counts the call and says what becomes of it. A plan that kills the process does it here.
Decision Decide(Kind kind, const Subject &subject);

/// True, with errno set, when the call is to fail.
bool Fails(Kind kind, const Subject &subject);

/// A block has come into being (+1) or gone (-1).
void NoteBlock(int change);

/// Keeps the calls made meanwhile by the calling thread out of the counts: what an interposed function itself
/// calls.
class Quiet {
public:
    Quiet();
    ~Quiet();
    Quiet(const Quiet &) = delete;
    Quiet &operator=(const Quiet &) = delete;
};

} // namespace fault

#endif
