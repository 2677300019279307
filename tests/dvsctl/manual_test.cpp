/* SPDX-License-Identifier: Apache-2.0 */
// The manual page is written by hand; it must name everything in the command table.

#include <cctype>
#include <fstream>
#include <sstream>

#include <gtest/gtest.h>

#include "tools/dvsctl/cli/command.h"
#include "tools/dvsctl/sources/source.h"

namespace {

using namespace dvs::ctl;

// The page's text without font changes, escapes and quotes.
std::string Page() {
    std::ifstream file(DVS_SOURCE_DIR "/docs/dvsctl.1");
    std::ostringstream text;
    text << file.rdbuf();
    const std::string source = text.str();
    std::string page;
    for (std::size_t at = 0; at < source.size(); ++at) {
        if (source[at] == '"') continue;
        if (source[at] != '\\') {
            page += source[at];
            continue;
        }
        ++at;
        if (at < source.size() && source[at] == 'f')
            ++at; // the font's letter
        else if (at < source.size())
            page += source[at];
    }
    return page;
}

void ExpectWord(const std::string &page, const std::string &word) {
    const auto isPart = [](char c) { return std::isalpha(static_cast<unsigned char>(c)) || c == '-'; };
    for (std::size_t at = 0; (at = page.find(word, at)) != std::string::npos; ++at) {
        const std::size_t end = at + word.size();
        if ((at == 0 || !isPart(page[at - 1])) && (end == page.size() || !isPart(page[end]))) return;
    }
    ADD_FAILURE() << "docs/dvsctl.1 does not name " << word;
}

TEST(Manual, NamesEveryVerbOptionAndSource) {
    const std::string page = Page();
    ASSERT_FALSE(page.empty());
    const auto expectOptions = [&](std::span<const OptionRow> rows) {
        for (const OptionRow &row : rows) {
            std::istringstream names(row.name);
            for (std::string name; std::getline(names, name, ',');)
                if (name[0] == '-') ExpectWord(page, name);
        }
    };
    expectOptions(CommonOptions());
    for (const Command &command : Commands()) {
        std::istringstream words(command.name);
        for (std::string word; words >> word;)
            ExpectWord(page, word);
        expectOptions(command.options);
    }
    for (const Scheme &scheme : Schemes())
        EXPECT_NE(page.find(std::string(scheme.name) + ":"), std::string::npos) << scheme.name;
}

} // namespace
