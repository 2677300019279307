/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_DVSCTL_PROGRAM_H
#define TESTS_DVSCTL_PROGRAM_H

// Runs the real program like a shell or a script, and captures its output.

#include <string>
#include <string_view>
#include <vector>

#include <boost/json/value.hpp>
#include <gtest/gtest.h>

#include "form/states.h"

namespace dvs::ctl::test {

using namespace form;
using namespace form::test;

struct Result {
    int status = -1; ///< exit status, or 128 plus the terminating signal
    std::string out, err;
    long peakKilobytes = 0; ///< peak memory
};

struct Run {
    std::vector<std::string> args = {};
    std::string input = {};                    ///< written to standard input, which is then closed
    std::vector<std::string> environment = {}; ///< "NAME=value", added to a small fixed environment
    std::string outPath = {}; ///< file for standard output instead ("-": closed)
    bool openInput = false;   ///< standard input is a pipe that stays open
};

Result RunProgram(const Run &run);

/// Runs the program in a terminal of that many rows. The output is the terminal's (with \r\n line ends).
Result RunInTerminal(const std::vector<std::string> &args, const std::vector<std::string> &environment,
                     int rows = 24);

/// A separate directory for each test, with some states in it; removed after the test.
class ProgramTest : public testing::Test {
protected:
    void SetUp() override;
    void TearDown() override;

    [[nodiscard]] Result Dvsctl(std::vector<std::string> args) const {
        return RunProgram({.args = std::move(args)});
    }
    /// The path of a file in the directory.
    [[nodiscard]] std::string At(std::string_view name) const { return directory_ + "/" + std::string(name); }
    /// Writes the bytes, padded like a state file.
    void PutState(std::string_view name, Buffer state) const;
    void Put(std::string_view name, std::string_view contents) const;
    [[nodiscard]] std::string Get(std::string_view name) const;
    [[nodiscard]] std::vector<std::string> Files() const;

private:
    std::string directory_;
};

/// The only JSON document on standard output.
boost::json::value Json(const Result &result);

} // namespace dvs::ctl::test

#endif
