/* SPDX-License-Identifier: Apache-2.0 */
// From the text on the command line to a source, and the reading that all verbs share.

#include "tools/dvsctl/source.h"

#include <algorithm>

#include <fmt/format.h>

#include "tools/dvsctl/encode.h"

namespace dvs::ctl {

namespace {

// A word that could be meant as a scheme: letters and hyphens only.
bool LooksLikeScheme(std::string_view word) {
    return !word.empty() && std::all_of(word.begin(), word.end(),
                                        [](unsigned char c) { return (c >= 'a' && c <= 'z') || c == '-'; });
}

std::string Forms() {
    std::string forms;
    for (const Scheme &scheme : Schemes())
        forms += fmt::format("{}{}", forms.empty() ? "" : ", ", scheme.form);
    return forms;
}

} // namespace

std::unique_ptr<Source> OpenSource(std::string_view text) {
    const std::size_t colon = text.find(':');
    if (colon != std::string_view::npos) {
        const std::string_view word = text.substr(0, colon);
        for (const Scheme &scheme : Schemes())
            if (word == scheme.name) return scheme.open(text.substr(colon + 1));
        if (LooksLikeScheme(word))
            throw Error(Exit::Usage, fmt::format("unknown kind of source \"{}:\"", word))
                .In(std::string(text))
                .Because("the kinds are " + Forms())
                .Try(fmt::format("for a path with a colon in it write file:{}", text));
    }
    return Schemes().front().open(text);
}

Error AbsentError(const Source &source) {
    return Error(source.AbsentStatus(), "cannot read the state")
        .In(source.Name())
        .Because(source.WhyAbsent())
        .Try("check the name; with --if-exists an absent source is no error");
}

std::string ShowLead(const Source &source) {
    const std::string name = ShowName(source.Name());
    return name.ends_with(':') ? name : name + ":";
}

StateBytes ReadState(Context &context, Source &source, ReadMode mode) {
    if (auto state = source.Read(context, mode)) return std::move(*state);
    if (context.options.ifExists) return {EncodeList({}), {}};
    throw Error(AbsentError(source));
}

} // namespace dvs::ctl
