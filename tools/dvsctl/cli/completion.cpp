/* SPDX-License-Identifier: Apache-2.0 */
// The completion script (completion.h): the rows of the command table as cases of a shell function. Whatever
// is added to the table is completed without further ado. The build writes the script for the installation.

#include "tools/dvsctl/cli/completion.h"

#include <algorithm>
#include <map>
#include <string_view>
#include <vector>

#include <fmt/format.h>

#include "tools/dvsctl/cli/command.h"
#include "tools/dvsctl/sources/source.h"

namespace dvs::ctl {

namespace {

/// What is offered where a value or an operand is wanted, by the name it has in the table. What is not here
/// is not completed.
struct ValueRow {
    const char *name;
    const char *offer; ///< a function of the script with its arguments
};

constexpr ValueRow kValues[] = {
    {"PATH", "_dvsctl_files"},
    {"LAYER", "_dvsctl_words current desired"},
    {"FORM", "_dvsctl_words text number hex json"},
    {"KIND", "_dvsctl_words active shadow zombie local-cache"},
    {"GLOB", "_dvsctl_names"},
};
constexpr ValueRow kOperands[] = {
    {"SRC", "_dvsctl_sources"},  {"A", "_dvsctl_sources"},  {"B", "_dvsctl_sources"},
    {"FROM", "_dvsctl_sources"}, {"TO", "_dvsctl_sources"}, {"FILE", "_dvsctl_files"},
    {"NAME", "_dvsctl_names"},
};

const char *OfferFor(std::span<const ValueRow> rows, std::string_view name) {
    const auto row = std::ranges::find_if(rows, [&](const ValueRow &value) { return name == value.name; });
    return row == rows.end() ? nullptr : row->offer;
}

// "-q,--quiet" as two words.
std::string Spellings(const OptionRow &row) {
    std::string text = row.name;
    std::ranges::replace(text, ',', ' ');
    return text;
}

std::string OptionWords(std::span<const OptionRow> rows) {
    std::string words;
    for (const OptionRow &row : rows)
        if (row.name[0] == '-') words += (words.empty() ? "" : " ") + Spellings(row);
    return words;
}

// The words that may follow each beginning of a verb: "" -> show … store, "store" -> list …
std::map<std::string, std::vector<std::string>> Followers() {
    std::map<std::string, std::vector<std::string>> followers;
    for (const Command &command : Commands()) {
        std::string before;
        for (std::string_view rest = command.name; !rest.empty();) {
            const std::size_t space = std::min(rest.find(' '), rest.size());
            const std::string word(rest.substr(0, space));
            auto &words = followers[before];
            if (std::ranges::find(words, word) == words.end()) words.push_back(word);
            before += (before.empty() ? "" : " ") + word;
            rest.remove_prefix(std::min(space + 1, rest.size()));
        }
    }
    return followers;
}

std::string VerbCases() {
    std::string cases;
    for (const auto &[before, words] : Followers())
        cases += fmt::format("    '{}') words='{}' ;;\n", before, fmt::join(words, " "));
    return cases;
}

// Options of one name take the same kind of value everywhere.
std::string ValueCases() {
    std::map<std::string, std::string> offers;
    const auto add = [&](std::span<const OptionRow> rows) {
        for (const OptionRow &row : rows) {
            if (row.name[0] != '-' || !row.value) continue;
            const char *offer = OfferFor(kValues, row.value);
            offers[row.name] = offer ? offer : ":";
        }
    };
    add(CommonOptions());
    for (const Command &command : Commands())
        add(command.options);
    std::string cases;
    for (const auto &[name, offer] : offers)
        cases += fmt::format("    {}) {}; return ;;\n", name, offer);
    return cases;
}

std::string CommandCases() {
    std::string cases;
    for (const Command &command : Commands()) {
        const char *offer = nullptr;
        for (const OptionRow &row : command.options)
            if (row.name[0] != '-' && !offer) offer = OfferFor(kOperands, row.name);
        cases += fmt::format("    '{}') words='{}' offer='{}' ;;\n", command.name,
                             OptionWords(command.options), offer ? offer : ":");
    }
    return cases;
}

std::string SchemeWords() {
    std::string words;
    for (const Scheme &scheme : Schemes())
        words += fmt::format("{}{}:", words.empty() ? "" : " ", scheme.name);
    return words;
}

constexpr const char *kScript = R"(# SPDX-License-Identifier: Apache-2.0
# Completion of dvsctl's command lines for bash. Written by `dvsctl --bash-completion`.
# shellcheck shell=bash disable=SC2207 # names with blanks are not completed

_dvsctl_words() {{ COMPREPLY=($(compgen -W "$*" -- "$cur")); }}
_dvsctl_files() {{ COMPREPLY=($(compgen -f -- "$cur")); }}
# shellcheck disable=SC2046 # one word a name
_dvsctl_names() {{ _dvsctl_words $("${{COMP_WORDS[0]}}" props --columns name --no-headings 2>/dev/null); }}
_dvsctl_sources() {{
    COMPREPLY=($(compgen -W '{schemes}' -- "$cur") $(compgen -f -- "$cur"))
    if [[ ${{#COMPREPLY[@]}} -eq 1 && ${{COMPREPLY[0]}} == *: ]]; then
        compopt -o nospace 2>/dev/null
    fi
}}

_dvsctl() {{
    local cur=${{COMP_WORDS[COMP_CWORD]}} prev=${{COMP_WORDS[COMP_CWORD - 1]}} verb='' words='' offer='' word i
    COMPREPLY=()

    # The shell takes a colon for a word of its own; what follows a scheme is a path.
    if [[ $cur == : ]]; then
        cur=''
        _dvsctl_files
        return
    elif [[ $prev == : ]]; then
        _dvsctl_files
        return
    fi
    case $prev in
{values}    esac

    # The verb is as many of the words as make one.
    for ((i = 1; i < COMP_CWORD; i++)); do
        word=${{verb:+$verb }}${{COMP_WORDS[i]}}
        case $word in
        {beginnings}) verb=$word ;;
        esac
    done
    case $verb in
{verbs}{commands}    esac
    if [[ $cur == -* ]]; then
        [[ -n $offer ]] || words=''
        [[ -n $verb ]] || words='--version --bash-completion'
        # shellcheck disable=SC2086 # options are words
        _dvsctl_words $words {common} -h --help
    elif [[ -n $offer ]]; then
        $offer
    else
        # shellcheck disable=SC2086
        _dvsctl_words $words
    fi
}}

complete -o filenames -F _dvsctl dvsctl
)";

std::string Beginnings() {
    std::string text;
    const auto add = [&](const std::string &words) {
        text += fmt::format("{}'{}'", text.empty() ? "" : " | ", words);
    };
    for (const auto &[before, words] : Followers())
        if (!before.empty()) add(before);
    for (const Command &command : Commands())
        add(command.name);
    return text;
}

} // namespace

std::string BashCompletion() {
    return fmt::format(kScript, fmt::arg("schemes", SchemeWords()), fmt::arg("values", ValueCases()),
                       fmt::arg("beginnings", Beginnings()), fmt::arg("verbs", VerbCases()),
                       fmt::arg("commands", CommandCases()),
                       fmt::arg("common", OptionWords(CommonOptions())));
}

} // namespace dvs::ctl
