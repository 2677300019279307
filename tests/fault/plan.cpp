/* SPDX-License-Identifier: Apache-2.0 */
// Fault plans: their text form, the counters, and the decision about one call. Tests and the environment set
// the plan; the interpose_*.cpp files query it. This code runs inside malloc, so it uses only fixed tables,
// atomics and raw system calls.

#include "fault/plan.h"

#include <array>
#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <string_view>

#include <fcntl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include "fault/fault.h"

namespace fault {

namespace {

constexpr std::size_t kKindNum = static_cast<std::size_t>(Kind::kNum);

// In the order of Kind.
constexpr std::array<std::string_view, kKindNum> kKindNames = {
    "alloc",  "open",    "read",  "write", "fsync",  "truncate", "rename", "unlink",
    "stat",   "close",   "flock", "lock",  "chmod",  "mkdir",    "mmap",   "ioctl",
    "socket", "connect", "send",  "recv",  "random", "readlink"};

struct ErrorName {
    std::string_view name;
    int value;
};

#define ROW(name)                                                                                            \
    { #name, name }
constexpr ErrorName kErrorNames[] = {
    ROW(EACCES),      ROW(EAGAIN),  ROW(EBADF),  ROW(EBUSY),      ROW(ECONNREFUSED), ROW(ECONNRESET),
    ROW(EDQUOT),      ROW(EEXIST),  ROW(EFBIG),  ROW(EINTR),      ROW(EINVAL),       ROW(EIO),
    ROW(EISDIR),      ROW(EMFILE),  ROW(ENFILE), ROW(ENOENT),     ROW(ENOLCK),       ROW(ENOMEM),
    ROW(ENOSPC),      ROW(ENOTDIR), ROW(EPERM),  ROW(EPIPE),      ROW(EROFS),        ROW(ESTALE),
    ROW(EWOULDBLOCK), ROW(EXDEV),   ROW(ELOOP),  ROW(EOPNOTSUPP), ROW(ENAMETOOLONG)};
#undef ROW

enum class Effect { kError, kShort, kKill };

struct Plan {
    Kind kind = Kind::kNum;
    uint64_t nth = 0;      // the first call that fails, from 1
    bool andLater = false; // and every call after it
    uint32_t perMille = 0; // instead of nth: each call fails with this chance
    uint64_t seed = 1;     // of that chance
    Effect effect = Effect::kError;
    int error = 0;
    std::size_t bytes = 0;
    bool directOnly = false;  // only opens with O_DIRECT
    bool writersOnly = false; // only opens for writing
    std::array<char, 512> path{};
    std::atomic<uint64_t> calls{0};
};

constexpr std::size_t kMaxPlans = 8;

// Written by fault_arm while g_planNum is 0, read by calls while it is not.
std::array<Plan, kMaxPlans> g_plans;
std::atomic<std::size_t> g_planNum{0};
std::array<std::atomic<int64_t>, kKindNum> g_calls{};
std::atomic<int64_t> g_hits{0};
std::atomic<int64_t> g_blocks{0};

// The interposer may be preloaded, and other models of thread-local storage may allocate on first use.
thread_local int t_quiet __attribute__((tls_model("initial-exec"))) = 0;

// ---- text form ----

std::string_view CutAt(std::string_view *rest, char separator) {
    const std::size_t end = rest->find(separator);
    const std::string_view part = rest->substr(0, end);
    rest->remove_prefix(end == std::string_view::npos ? rest->size() : end + 1);
    return part;
}

bool ParseNumber(std::string_view text, uint64_t *number) {
    if (text.empty() || text.size() > 18) return false;
    *number = 0;
    for (const char digit : text) {
        if (digit < '0' || digit > '9') return false;
        *number = *number * 10 + static_cast<uint64_t>(digit - '0');
    }
    return true;
}

bool ParseWhen(std::string_view text, Plan *plan) {
    uint64_t number = 0;
    if (text.starts_with('~')) {
        if (!ParseNumber(text.substr(1), &number) || number > 1000) return false;
        plan->perMille = static_cast<uint32_t>(number);
        return true;
    }
    if (text.ends_with('+')) {
        plan->andLater = true;
        text.remove_suffix(1);
    }
    return ParseNumber(text, &plan->nth) && plan->nth > 0;
}

bool ParseError(std::string_view text, int *error) {
    for (const ErrorName &row : kErrorNames) {
        if (row.name != text) continue;
        *error = row.value;
        return true;
    }
    uint64_t number = 0;
    if (!ParseNumber(text, &number) || number == 0 || number > 4095) return false;
    *error = static_cast<int>(number);
    return true;
}

bool ParseOption(std::string_view text, Plan *plan) {
    uint64_t number = 0;
    if (text.starts_with("short=")) {
        plan->effect = Effect::kShort;
        if (!ParseNumber(text.substr(6), &number)) return false;
        plan->bytes = number;
        return true;
    }
    if (text.starts_with("seed=")) return ParseNumber(text.substr(5), &plan->seed);
    if (text == "kill") {
        plan->effect = Effect::kKill;
        return true;
    }
    if (text == "direct") return plan->directOnly = true;
    if (text == "writers") return plan->writersOnly = true;
    return ParseError(text, &plan->error);
}

bool ParsePlan(std::string_view text, Plan *plan) {
    plan->kind = Kind::kNum;
    plan->nth = plan->perMille = 0;
    plan->andLater = plan->directOnly = plan->writersOnly = false;
    plan->seed = 1;
    plan->effect = Effect::kError;
    plan->path[0] = '\0';
    plan->calls = 0;
    const std::string_view kind = CutAt(&text, ':');
    for (std::size_t i = 0; i < kKindNum; i++) {
        if (kKindNames[i] == kind) plan->kind = static_cast<Kind>(i);
    }
    plan->error = plan->kind == Kind::kAlloc ? ENOMEM : EIO;
    if (plan->kind == Kind::kNum || !ParseWhen(CutAt(&text, ':'), plan)) return false;
    while (!text.empty()) {
        if (text.starts_with("path=")) { // the last option: a path may contain the separator
            text.remove_prefix(5);
            if (text.size() >= plan->path.size()) return false;
            std::memcpy(plan->path.data(), text.data(), text.size());
            plan->path[text.size()] = '\0';
            return true;
        }
        if (!ParseOption(CutAt(&text, ':'), plan)) return false;
    }
    return true;
}

// ---- matching ----

using PathBuffer = std::array<char, 4200>;

/// The path of a descriptor; empty when there is none.
std::size_t PathOfFd(int fd, PathBuffer *out) {
    std::array<char, 32> link{"/proc/self/fd/"};
    std::array<char, 12> digits{};
    std::size_t num = 0;
    for (unsigned rest = static_cast<unsigned>(fd); num == 0 || rest > 0; rest /= 10)
        digits[num++] = static_cast<char>('0' + rest % 10);
    std::size_t at = std::strlen(link.data());
    while (num > 0)
        link[at++] = digits[--num];
    const long length = syscall(SYS_readlink, link.data(), out->data(), out->size() - 1);
    return length > 0 ? static_cast<std::size_t>(length) : 0;
}

bool IsUnder(const Subject &subject, std::string_view prefix) {
    PathBuffer full;
    std::size_t length = 0;
    if (!subject.path) {
        length = PathOfFd(subject.fd, &full);
    } else {
        if (subject.path[0] != '/') {
            if (subject.dirFd == AT_FDCWD) {
                const long size = syscall(SYS_getcwd, full.data(), full.size());
                length = size > 0 ? static_cast<std::size_t>(size) - 1 : 0;
            } else {
                length = PathOfFd(subject.dirFd, &full);
            }
            full[length++] = '/';
        }
        const std::size_t more = strnlen(subject.path, full.size() - length);
        std::memcpy(full.data() + length, subject.path, more);
        length += more;
    }
    return std::string_view(full.data(), length).starts_with(prefix);
}

bool IsSocketKind(Kind kind) {
    return kind == Kind::kSocket || kind == Kind::kConnect || kind == Kind::kSend || kind == Kind::kRecv;
}

bool Matches(const Plan &plan, Kind kind, const Subject &subject) {
    if (plan.kind != kind) return false;
    if (plan.directOnly && (subject.openFlags & O_DIRECT) == 0) return false;
    if (plan.writersOnly && (subject.openFlags & O_ACCMODE) == O_RDONLY) return false;
    const bool hasFile = kind != Kind::kAlloc && kind != Kind::kRandom && !IsSocketKind(kind);
    return plan.path[0] == '\0' || !hasFile || IsUnder(subject, plan.path.data());
}

/// The same calls fail for the same seed, regardless of the process's other calls.
bool IsChosen(const Plan &plan, uint64_t call) {
    uint64_t x = plan.seed * 0x9e3779b97f4a7c15u + call;
    x = (x ^ (x >> 30)) * 0xbf58476d1ce4e5b9u;
    x = (x ^ (x >> 27)) * 0x94d049bb133111ebu;
    return (x ^ (x >> 31)) % 1000 < plan.perMille;
}

bool IsHit(Plan *plan) {
    const uint64_t call = plan->calls.fetch_add(1) + 1;
    if (plan->perMille > 0) return IsChosen(*plan, call);
    return call == plan->nth || (plan->andLater && call > plan->nth);
}

__attribute__((constructor)) void ArmFromEnvironment() {
    const char *plan = std::getenv("DVS_FAULT");
    if (!plan || fault_arm(plan) == 0) return;
    constexpr std::string_view kMessage = "DVS_FAULT: this plan does not parse\n";
    (void)syscall(SYS_write, STDERR_FILENO, kMessage.data(), kMessage.size());
    _exit(2);
}

} // namespace

Decision Decide(Kind kind, const Subject &subject) {
    if (t_quiet > 0) return {};
    g_calls[static_cast<std::size_t>(kind)]++;
    const std::size_t num = g_planNum.load(std::memory_order_acquire);
    if (num == 0) return {};
    const int savedErrno = errno;
    Decision decision;
    for (std::size_t i = 0; i < num; i++) {
        Plan &plan = g_plans[i];
        if (!Matches(plan, kind, subject) || !IsHit(&plan)) continue;
        g_hits++;
        if (plan.effect == Effect::kKill) (void)syscall(SYS_kill, syscall(SYS_getpid), SIGKILL);
        decision.what = plan.effect == Effect::kShort ? Decision::What::kShort : Decision::What::kFail;
        decision.error = plan.error;
        decision.bytes = plan.bytes;
    }
    errno = savedErrno;
    return decision;
}

bool Fails(Kind kind, const Subject &subject) {
    const Decision decision = Decide(kind, subject);
    if (decision.Fails()) errno = decision.error;
    return decision.Fails();
}

void NoteBlock(int change) {
    g_blocks.fetch_add(change, std::memory_order_relaxed);
}

Quiet::Quiet() {
    t_quiet++;
}
Quiet::~Quiet() {
    t_quiet--;
}

} // namespace fault

extern "C" int fault_arm(const char *plan) {
    using namespace fault;
    g_planNum.store(0);
    for (auto &calls : g_calls)
        calls = 0;
    g_hits = 0;
    std::string_view rest(plan);
    std::size_t num = 0;
    while (!rest.empty()) {
        if (num == kMaxPlans || !ParsePlan(CutAt(&rest, ';'), &g_plans[num])) return -1;
        num++;
    }
    g_planNum.store(num, std::memory_order_release);
    return 0;
}

extern "C" void fault_disarm(void) {
    fault::g_planNum.store(0);
}

extern "C" int64_t fault_calls(const char *kind) {
    for (std::size_t i = 0; i < fault::kKindNum; i++) {
        if (fault::kKindNames[i] == kind) return fault::g_calls[i];
    }
    return -1;
}

extern "C" int64_t fault_hits(void) {
    return fault::g_hits;
}
extern "C" int64_t fault_live_blocks(void) {
    return fault::g_blocks;
}
extern "C" void fault_suspend(void) {
    fault::t_quiet++;
}
extern "C" void fault_resume(void) {
    fault::t_quiet--;
}
