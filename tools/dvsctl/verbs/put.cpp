/* SPDX-License-Identifier: Apache-2.0 */
// Writing a verified state (put.h).

#include "tools/dvsctl/verbs/put.h"

#include <algorithm>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/verbs/changes.h"
#include "tools/dvsctl/verbs/show.h"

namespace dvs::ctl {

namespace {

/// What the target holds before, as far as it can be told.
struct Target {
    bool exists = false;
    bool isSound = true;
    std::string damage;
    LoadedState loaded;
};

Target LookAtTarget(Context &context, Source &to) {
    Target target;
    if (to.IsStandardOutput()) return target;
    std::optional<StateBytes> read;
    try {
        read = to.Read(context, ReadMode::Tolerant);
        target.exists = read.has_value();
    } catch (const Error &error) {
        if (error.kind != ErrorKind::Malformed && !error.isDamage) throw;
        target.exists = true;
        target.damage = error.why;
    }
    if (read && read->bytes.empty()) target.damage = read->complaint;
    if (read && !read->bytes.empty()) {
        const state::StateVerdict verdict = state::VerifyState(read->bytes);
        if (verdict.first)
            target.damage = ShowFault(verdict.located);
        else
            target.loaded.raw = std::move(*read);
    }
    target.isSound = target.damage.empty();
    target.loaded.state = ParseState(target.loaded.raw.bytes);
    return target;
}

// Whether a write would replace something, as --no-replace means it.
bool IsTaken(const Source &to, const Target &target, const State &state) {
    if (!target.exists || !target.isSound) return target.exists;
    const auto &held = target.loaded.state.switches;
    if (to.CountsWhenEmpty()) return true;
    if (!to.ReplacesSingle() || state.switches.size() != 1) return !held.empty();
    return std::any_of(held.begin(), held.end(),
                       [&](const Switch &sw) { return sw.name == state.switches.front().name; });
}

void RefuseIfTaken(const Options &options, const Source &to, const Target &target, const State &state) {
    if (!options.noReplace || !IsTaken(to, target, state)) return;
    throw Error(ErrorKind::Failed, "the target holds something already")
        .In(to.Name())
        .Because("--no-replace was given")
        .Try("name another target, or leave --no-replace out");
}

struct Outcome {
    const PutJob &job;
    const Source &to;
    StateCount count;
    std::size_t bytes;
    bool isWritten;
};

void ReportPlan(Context &context, const Outcome &outcome, const Target &target,
                const std::vector<Change> &changes) {
    Output &out = context.out;
    if (!target.exists)
        out.Write(fmt::format("would create {}\n", ShowName(outcome.to.Name())));
    else if (!target.isSound)
        out.Write(fmt::format("would replace {}, which holds no sound state: {}\n",
                              ShowName(outcome.to.Name()), Escape(target.damage)));
    else if (changes.empty())
        out.Write(fmt::format("would change nothing in {}\n", ShowName(outcome.to.Name())));
    else
        out.Write(fmt::format("would change {} {}\n", ShowLead(outcome.to), ShowChangeCount(changes)));
    WriteChanges(changes, context.options, out);
    out.Remark("nothing was written (--dry-run)\n");
}

void Report(Context &context, const Outcome &outcome, const Target &target,
            const std::vector<Change> &changes) {
    const Options &options = context.options;
    const Source *from = outcome.job.from;
    if (!options.json) {
        if (options.dryRun)
            ReportPlan(context, outcome, target, changes);
        else if (!outcome.to.IsStandardOutput())
            context.out.Remark(fmt::format("{} {}{} to {}\n", outcome.job.did, ShowCount(outcome.count),
                                           from ? " from " + ShowName(from->Name()) : "",
                                           ShowName(outcome.to.Name())));
        return;
    }
    boost::json::object document = Envelope(outcome.job.verb);
    if (from) document["from"] = ValidUtf8(from->Name());
    document["to"] = ValidUtf8(outcome.to.Name());
    document["is_written"] = outcome.isWritten;
    document["bytes"] = outcome.bytes;
    document["summary"] = CountJson(outcome.count);
    if (options.dryRun) {
        document["target_exists"] = target.exists;
        document["target_is_sound"] = target.exists && target.isSound;
        document["changes"] = ChangesJson(changes, options);
    }
    context.out.Json(std::move(document));
}

} // namespace

void CheckPutOptions(const Options &options, const Source &to) {
    if (options.json && to.IsStandardOutput())
        throw Error(ErrorKind::Usage, "--json and the target json:- both want standard output")
            .Try("leave --json out, or name a file as the target");
    if (options.mayExist && options.noReplace)
        throw Error(ErrorKind::Usage, "--may-exist and --no-replace exclude each other");
}

Exit PutState(Context &context, const PutJob &job, LoadedState loaded, Source &to) {
    const Options &options = context.options;
    const Bytes state = Bytes(loaded.raw.bytes).first(loaded.state.size);
    Outcome outcome{job, to, CountState(loaded.state), state.size(), false};

    Target target;
    std::vector<Change> changes;
    if (options.dryRun || options.noReplace) target = LookAtTarget(context, to);
    RefuseIfTaken(options, to, target, loaded.state);
    LoadedState planned;
    if (options.dryRun) {
        planned = JudgeState(to, {to.Plan(context, state), {}});
        changes = Compare(target.loaded.state, planned.state, {});
    } else {
        loaded.state.switches = {}; // a third of the bytes' size that the write can have
        to.Write(context, state);
        outcome.isWritten = true;
    }
    Report(context, outcome, target, changes);
    return Exit::Done;
}

void ReportNothingPut(Context &context, const PutJob &job, const Source &to) {
    Report(context, {job, to, {}, 0, false}, {}, {});
}

} // namespace dvs::ctl
