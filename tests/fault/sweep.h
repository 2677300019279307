/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_FAULT_SWEEP_H
#define TESTS_FAULT_SWEEP_H

// Runs a scenario over and over, each time in a forked child and with the fault one call later, until it
// meets none:
//
//     fault::Sweep("write:%:ENOSPC", [](fault::Child &child) { return DVSFile_Write(path, buf, len); },
//                  [](uint64_t k, const fault::Report &report) { EXPECT_EQ(report.status, HYP_WRITE_ERROR);
//                  });
//
// The `%` of the plan (README.md) becomes 1, 2, 3, …; a plan without one runs once. The scenario runs with
// the fault armed; what it needs is made before, in the parent, or through Child::Unfaulted. Its result, and
// what it did to heap, descriptors and locks, comes back as a Report; `check` runs in the parent, so that
// EXPECT_… works in it. A child that crashes or hangs fails the test by itself.

#include <cstdint>
#include <functional>
#include <string>

namespace fault {

struct Report {
    uint32_t status = 0;      // what the scenario returned
    int64_t hits = 0;         // faults that the scenario met; 0 in the last round only
    int64_t leakedBlocks = 0; // heap blocks the scenario left behind
    int leakedFds = 0;        // descriptors the scenario left open
    bool lockHeld = false;    // Child::CheckLock found a lock that another thread cannot get
    bool crashed = false;     // ended by a signal, by a timeout or by an exit of its own
    std::string notes;        // what Child::Note collected
};

class Child {
public:
    /// Runs `work` without faults and outside the counts of calls; its allocations still have to be balanced.
    void Unfaulted(const std::function<void()> &work);

    /// Keeps a text for the report, up to 8 KiB in all. Allocates nothing.
    void Note(const char *text);

    /// A sink for DVSLog_SetSink with this Child as argument: notes every message.
    static void NoteMessage(int level, const char *text, void *child);

    /// Called by Sweep after each round, without faults, for each lock to look at: takes and releases it in a
    /// thread of its own. A lock that it does not get within five seconds is held.
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
    // Run in the child before the scenario and after it, without faults. Heap blocks and descriptors are
    // counted around all three, so what the first makes the last has to release.
    std::function<void(Child &)> prepare;
    std::function<void(Child &)> conclude;
    // Go through the three once beforehand, so that what the process keeps from a first use is no leak.
    bool warmUp = false;
};

using Scenario = std::function<uint32_t(Child &)>;
using Check = std::function<void(uint64_t k, const Report &)>;

/// Runs the rounds and gives their number, the last one without a fault included. Fails the test when the
/// plan does not parse, a child crashes, or the faults do not come to an end within `maxRounds`.
uint64_t Sweep(const std::string &plan, const Scenario &scenario, const Check &check,
               const Options &options = {});

/// A number from an environment variable; `fallback` when it is not set or is not one.
uint64_t FromEnvironment(const char *variable, uint64_t fallback);

} // namespace fault

#endif
