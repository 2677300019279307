/* SPDX-License-Identifier: Apache-2.0 */
// Runs the completion script in a real bash: it must offer everything in the command table.

#include <algorithm>
#include <cstdlib>
#include <sstream>

#include <sys/wait.h>

#include "program.h"
#include "tools/dvsctl/cli/command.h"
#include "tools/dvsctl/sources/source.h"

namespace {

using namespace dvs::ctl::test;
using Words = std::vector<std::string>;

class Completion : public ProgramTest {
protected:
    void SetUp() override {
        ProgramTest::SetUp();
        Put("dvsctl.bash", Dvsctl({"--bash-completion"}).out);
        Put("state.db", "");
    }

    /// The completions offered for the last of the words.
    Words Offered(const Words &words) const {
        std::string script =
            "cd '" + At("") + "' && . ./dvsctl.bash && COMP_WORDS=('" DVS_BINARY_DIR "/bin/dvsctl'";
        for (const std::string &word : words)
            script += " '" + word + "'";
        script += ") && COMP_CWORD=" + std::to_string(words.size()) +
                  " && { _dvsctl; printf '%s\\n' \"${COMPREPLY[@]}\" >offered; }";
        Put("ask.bash", script);
        EXPECT_EQ(std::system(("bash '" + At("ask.bash") + "'").c_str()), 0) << script;
        std::istringstream lines(Get("offered"));
        Words offered;
        for (std::string line; std::getline(lines, line);)
            offered.push_back(line);
        return offered;
    }
    void ExpectOffered(const Words &words, const std::string &what) const {
        const Words offered = Offered(words);
        EXPECT_NE(std::ranges::find(offered, what), offered.end())
            << testing::PrintToString(words) << " does not offer " << what;
    }
};

Words Split(std::string_view name) {
    std::istringstream stream{std::string(name)};
    Words words;
    for (std::string word; stream >> word;)
        words.push_back(word);
    return words;
}

TEST_F(Completion, OffersEveryVerbAndEveryOptionOfIt) {
    for (const dvs::ctl::Command &command : dvs::ctl::Commands()) {
        Words words = Split(command.name);
        Words beginning(words.begin(), words.end() - 1);
        beginning.emplace_back(words.back().substr(0, 2));
        ExpectOffered(beginning, words.back());

        words.emplace_back("--");
        const Words offered = Offered(words);
        const auto expect = [&](std::span<const dvs::ctl::OptionRow> rows) {
            for (const dvs::ctl::OptionRow &row : rows) {
                const std::string option = std::string(row.name).substr(std::string(row.name).find(',') + 1);
                if (option[0] != '-') continue;
                EXPECT_NE(std::ranges::find(offered, option), offered.end()) << command.name << ' ' << option;
            }
        };
        expect(command.options);
        expect(dvs::ctl::CommonOptions());
    }
}

TEST_F(Completion, OffersSourcesAndPathsAfterAColonToo) {
    for (const dvs::ctl::Scheme &scheme : dvs::ctl::Schemes())
        ExpectOffered({"copy", "state.db", std::string(scheme.name).substr(0, 3)},
                      std::string(scheme.name) + ":");
    ExpectOffered({"--json", "show", "st"}, "state.db");
    ExpectOffered({"show", "file", ":"}, "state.db");
    ExpectOffered({"show", "file", ":", "sta"}, "state.db");
    ExpectOffered({"store", "import", "st"}, "state.db");
}

TEST_F(Completion, OffersValuesAndNames) {
    ExpectOffered({"store", "list", "--layer", "d"}, "desired");
    ExpectOffered({"kernel", "ports", "s", "--kind", "lo"}, "local-cache");
    ExpectOffered({"kernel", "prop", "set", "s", "x", "1", "--as", ""}, "number");
    ExpectOffered({"store", "list", "--store", ""}, "state.db");
    ExpectOffered({"props", "com.orbeno.etherswitch.port.v"}, "com.orbeno.etherswitch.port.vlan");
    EXPECT_EQ(Offered({"show", "--switch", "st"}), Words{""}); // ids are not completed
    ExpectOffered({"--"}, "--version");
    EXPECT_EQ(Offered({"no-such-verb", "stor"}), Words{"store"});
}

} // namespace
