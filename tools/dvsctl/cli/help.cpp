/* SPDX-License-Identifier: Apache-2.0 */
// Help texts from the table's rows, so that they cannot fall behind what the parser accepts.

#include "tools/dvsctl/cli/help.h"

#include <algorithm>
#include <cctype>
#include <numeric>
#include <utility>
#include <vector>

#include <fmt/format.h>

#include "tools/dvsctl/sources/source.h"

namespace dvs::ctl {

namespace {

constexpr std::string_view kStatuses = R"(Exit status:
  0  done; for diff: same
  1  refused or failed; for diff: different, and only that
  2  wrong usage
  3  timeout
  4  the switch, port or property is not there
  5  the switching module's device is absent
  6  malformed input
  7  config store error
  8  busy
  9  other trouble of a diff
)";

constexpr std::string_view kEnvironment = R"(Environment:
  DVS_CONFIGSTORE  the config store's database, where none is named (default: /var/lib/dvs/configstore.db)
  DVS_EMULATOR     the socket of a dvs-emulator that stands in for the switching module's device
  NO_COLOR         set to anything: no colour, also on a terminal
  PAGER            the pager for output longer than the terminal (default: less; empty or cat: none)
)";

bool IsOperand(const OptionRow &row) {
    return row.name[0] != '-';
}

bool IsOptional(const OptionRow &row) {
    return std::holds_alternative<std::optional<std::string> Options::*>(row.target);
}

std::string Left(const OptionRow &row) {
    std::string left = row.name;
    if (const auto comma = left.find(','); comma != std::string::npos) left.insert(comma + 1, " ");
    if (row.value) left += std::string(" ") + row.value;
    return left;
}

using Lines = std::vector<std::pair<std::string, std::string>>;

std::string Aligned(const Lines &lines) {
    std::size_t width = 0;
    for (const auto &[left, right] : lines)
        width = std::max(width, left.size());
    std::string text;
    for (const auto &[left, right] : lines)
        text += fmt::format("  {:<{}}  {}\n", left, width, right);
    return text;
}

std::string Section(std::string_view title, const Lines &lines) {
    return lines.empty() ? std::string() : fmt::format("{}:\n{}\n", title, Aligned(lines));
}

Lines RowLines(std::span<const OptionRow> rows, bool operands) {
    Lines lines;
    for (const OptionRow &row : rows)
        if (IsOperand(row) == operands) lines.emplace_back(Left(row), row.help);
    return lines;
}

std::string SourceSection() {
    Lines lines;
    for (const Scheme &scheme : Schemes())
        lines.emplace_back(scheme.form, scheme.summary);
    return Section("Sources", lines);
}

std::size_t Distance(std::string_view a, std::string_view b) {
    std::vector<std::size_t> row(b.size() + 1);
    std::iota(row.begin(), row.end(), std::size_t{0});
    for (std::size_t i = 0; i < a.size(); ++i) {
        std::size_t diagonal = row[0]++;
        for (std::size_t j = 0; j < b.size(); ++j) {
            const std::size_t substituted = diagonal + (a[i] == b[j] ? 0 : 1);
            diagonal = row[j + 1];
            row[j + 1] = std::min({substituted, diagonal + 1, row[j] + 1});
        }
    }
    return row[b.size()];
}

} // namespace

std::string OverviewHelp() {
    Lines verbs;
    for (const Command &command : Commands())
        verbs.emplace_back(command.name, command.summary);
    return "Usage: dvsctl VERB [OPERANDS] [OPTIONS]\n\n"
           "Looks at, checks, compares and copies the state of distributed virtual switches, wherever it is "
           "kept.\n\n" +
           Section("Verbs", verbs) + SourceSection() +
           Section("Options of every verb", RowLines(CommonOptions(), false)) + std::string(kStatuses) +
           "\n" + std::string(kEnvironment) +
           "\n`dvsctl VERB --help` explains a verb, with examples. `dvsctl --version` prints the version.\n"
           "`. <(dvsctl --bash-completion)` makes bash complete its words.\n";
}

std::string CommandHelp(const Command &command) {
    std::string usage = fmt::format("Usage: dvsctl {}", command.name);
    for (const OptionRow &row : command.options)
        if (IsOperand(row))
            usage += IsOptional(row) ? fmt::format(" [{}]", row.name) : fmt::format(" {}", row.name);
    std::string text = usage + " [OPTIONS]\n\n" + command.summary + ".\n\n";
    if (*command.details) text += std::string(command.details) + "\n";
    text += Section("Operands", RowLines(command.options, true));
    text += Section("Options", RowLines(command.options, false));
    text += SourceSection();
    text += Section("Options of every verb", RowLines(CommonOptions(), false));
    text += std::string("Examples:\n") + command.examples;
    return text;
}

std::string NearestCommand(std::string_view word) {
    std::string nearest;
    std::size_t least = 3; // farther is another word
    for (const Command &command : Commands()) {
        const std::size_t distance = Distance(word, command.name);
        if (distance < least && distance < word.size()) {
            least = distance;
            nearest = command.name;
        }
    }
    return nearest;
}

} // namespace dvs::ctl
