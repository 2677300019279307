/* SPDX-License-Identifier: Apache-2.0 */
// From the text on the command line to a source, and the reading that all verbs share.

#include "tools/dvsctl/sources/source.h"

#include <algorithm>

#include <fmt/format.h>

#include "form/encode.h"

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
            throw Error(ErrorKind::Usage, fmt::format("unknown kind of source \"{}:\"", word))
                .In(std::string(text))
                .Because("the kinds are " + Forms())
                .Try(fmt::format("for a path with a colon in it write file:{}", text));
    }
    return Schemes().front().open(text);
}

Error AbsentError(const Source &source) {
    return Error(source.AbsentKind(), "cannot read the state")
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

Error DamageError(const Source &source, const state::StateVerdict &verdict) {
    const state::StateFault &inner = verdict.located;
    Error error(ErrorKind::Malformed, "the state is damaged");
    error.source = source.Name();
    error.path = ShowPath(inner.path);
    if (source.HasOffsets()) error.offset = inner.offset;
    error.why = ShowFault(inner);
    if (verdict.first.offset != inner.offset && source.HasOffsets())
        error.why += fmt::format("; a load stops at byte {} already: {}", verdict.first.offset,
                                 ShowFault(verdict.first));
    error.next = source.HasOffsets() ? "dvsctl hexdump " + source.Name() +
                                           " shows the bytes around it; bring back a good copy"
                                     : "correct the document there";
    return error;
}

LoadedState LoadState(Context &context, Source &source) {
    return JudgeState(source, ReadState(context, source));
}

LoadedState JudgeState(const Source &source, StateBytes read) {
    LoadedState loaded{std::move(read), {}};
    const state::StateVerdict verdict = state::VerifyState(loaded.raw.bytes);
    if (verdict.first) {
        Error error = DamageError(source, verdict);
        if (!loaded.raw.complaint.empty()) error.why += "; " + loaded.raw.complaint;
        throw Error(error);
    }
    loaded.state = ParseState(loaded.raw.bytes);
    return loaded;
}

} // namespace dvs::ctl
