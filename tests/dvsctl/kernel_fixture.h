/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_DVSCTL_KERNEL_FIXTURE_H
#define TESTS_DVSCTL_KERNEL_FIXTURE_H

// Runs the real program against a real emulator process, which holds the small state of states.h.

#include <cstdlib>

#include "emulator/emulator_process.h"
#include "form/value.h"
#include "program.h"

namespace dvs::ctl::test {

class KernelTest : public ProgramTest {
protected:
    void SetUp() override {
        ProgramTest::SetUp();
        ASSERT_TRUE(emulator_.Start(Socket()));
        PutState("start.db", SmallState());
        ASSERT_EQ(Kernel({"copy", At("start.db"), "kernel:"}).status, 0);
    }
    void TearDown() override {
        if (emulator_.IsRunning()) emulator_.Stop(SIGKILL);
        ProgramTest::TearDown();
    }

    std::string Socket() const { return At("socket"); }

    /// Runs the program with the emulator as its device.
    Result Kernel(std::vector<std::string> args, std::string input = {}) const {
        return RunProgram({.args = std::move(args),
                           .input = std::move(input),
                           .environment = {"DVS_EMULATOR=" + Socket(), "DVS_CONFIGSTORE=" + At("store.db")}});
    }
    /// The same, with "kernel" before the words.
    Result Verb(std::vector<std::string> args, std::string input = {}) const {
        args.insert(args.begin(), "kernel");
        return Kernel(std::move(args), std::move(input));
    }
    void Fault(const std::string &fault) const { ASSERT_EQ(Verb({"exec", "", "fault " + fault}).status, 0); }
    /// The whole state as JSON text, to detect changes.
    std::string Everything() const { return Kernel({"show", "kernel:", "--json", "--raw"}).out; }

    dvs::test::EmulatorProcess emulator_;
};

} // namespace dvs::ctl::test

#endif
