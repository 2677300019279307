/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_DVSCTL_PROGRAM_H
#define TESTS_DVSCTL_PROGRAM_H

// Runs the real program the way a shell or a script does, and keeps what came out.

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
    int status = -1; ///< exit status, or 128 plus the signal that ended it
    std::string out, err;
    long peakKilobytes = 0; ///< the most memory that it had at once
};

struct Run {
    std::vector<std::string> args = {};
    std::string input = {};                    ///< on standard input, which then ends
    std::vector<std::string> environment = {}; ///< "NAME=value", beside a fixed small environment
    std::string outPath = {}; ///< standard output goes to this file instead ("-": it is closed)
    bool openInput = false;   ///< standard input is a pipe that nobody closes
};

Result RunProgram(const Run &run);

/// The program in a terminal of that many rows; its output as the terminal got it (with \r\n line ends).
Result RunInTerminal(const std::vector<std::string> &args, const std::vector<std::string> &environment,
                     int rows = 24);

/// A directory of its own for each test, removed afterwards, with some states in it.
class ProgramTest : public testing::Test {
protected:
    void SetUp() override;
    void TearDown() override;

    [[nodiscard]] Result Dvsctl(std::vector<std::string> args) const {
        return RunProgram({.args = std::move(args)});
    }
    /// Path of a file of the test.
    [[nodiscard]] std::string At(std::string_view name) const { return directory_ + "/" + std::string(name); }
    /// Writes the bytes, padded to what state files need.
    void PutState(std::string_view name, Buffer state) const;
    void Put(std::string_view name, std::string_view contents) const;
    [[nodiscard]] std::string Get(std::string_view name) const;
    [[nodiscard]] std::vector<std::string> Files() const;

private:
    std::string directory_;
};

/// The one JSON document on standard output.
boost::json::value Json(const Result &result);

} // namespace dvs::ctl::test

#endif
