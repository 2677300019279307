/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_FAULT_SWEEP_H
#define TESTS_FAULT_SWEEP_H

// Runs a scenario repeatedly, each time in a forked child and with the fault one call later, until a round
// meets no fault:
//
//     fault::Sweep("write:%:ENOSPC", [](fault::Child &child) { return DVSFile_Write(path, buf, len); },
//                  [](uint64_t k, const fault::Report &report) { EXPECT_EQ(report.status, HYP_WRITE_ERROR);
//                  });
//
// The `%` of the plan (README.md) becomes 1, 2, 3, …; a plan without one runs once. The scenario runs with
// the fault armed; prepare its data before, in the parent, or through Child::Unfaulted. A Report returns its
// result and its effect on heap, descriptors and locks. `check` runs in the parent, so that EXPECT_… works in
// it. A child that crashes or hangs fails the test.

#include <cstdint>
#include <functional>
#include <string>

namespace fault {

struct Report {
    uint32_t status = 0;      // what the scenario returned
    int64_t hits = 0;         // faults that the scenario met; 0 in the last round only
    int64_t leakedBlocks = 0; // heap blocks that the scenario leaked
    int leakedFds = 0;        // descriptors the scenario left open
    bool lockHeld = false;    // Child::CheckLock found a lock that another thread cannot get
    bool crashed = false;     // ended by a signal, a timeout or its own exit
    std::string notes;        // what Child::Note collected
};

class Child {
public:
    /// Runs `work` without faults and without counting its calls. Its allocations must still be balanced.
    void Unfaulted(const std::function<void()> &work);

    /// Adds a text to the report, up to 8 KiB in all. Does not allocate.
    void Note(const char *text);

    /// A sink for DVSLog_SetSink, with this Child as argument, that notes every message.
    static void NoteMessage(int level, const char *text, void *child);

    /// Sweep calls this after each round, without faults, for each lock to check: takes and releases it in a
    /// separate thread. A lock that it does not get within 5 s is held.
    void CheckLock(const std::function<void()> &take, const std::function<void()> &release);

private:
    friend struct ChildAccess;
    std::string *notes_ = nullptr;
    bool lockHeld_ = false;
};

struct Options {
    // Distance between the faults of two rounds.
    uint64_t step = 1;
    uint64_t maxRounds = 20000;
    // Of one round.
    unsigned timeoutSeconds = 60;
    // Run in the child before and after the scenario, without faults. Heap blocks and descriptors are counted
    // around all three, so the last must release what the first creates.
    std::function<void(Child &)> prepare;
    std::function<void(Child &)> conclude;
    // Runs all three once beforehand, so that one-time allocations of the process do not count as leaks.
    bool warmUp = false;
};

using Scenario = std::function<uint32_t(Child &)>;
using Check = std::function<void(uint64_t k, const Report &)>;

/// Runs the rounds and returns their number, including the last one without a fault. Fails the test when the
/// plan does not parse, a child crashes, or faults still occur after `maxRounds`.
uint64_t Sweep(const std::string &plan, const Scenario &scenario, const Check &check,
               const Options &options = {});

/// A number from an environment variable; `fallback` when it is unset or not a number.
uint64_t FromEnvironment(const char *variable, uint64_t fallback);

} // namespace fault

#endif
