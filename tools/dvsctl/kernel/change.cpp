/* SPDX-License-Identifier: Apache-2.0 */
// A dry run carries the change out on a copy: the module's state is fetched into the library's switch table,
// in a child process, where the same operation is made and the table serialized before and after. So it meets
// the refusals of the real one, and the difference is shown by the same code as everywhere.

#include "tools/dvsctl/kernel/change.h"

#include <cstring>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "dvs/hyp.h"
#include "form/model.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/verbs/changes.h"

namespace dvs::ctl {

namespace {

std::string Sentence(const KernelChange &change, const std::string &verb) {
    const std::string what =
        change.target.switchId.empty() ? "the module's state" : ShowTarget(change.target);
    return verb + " " + Escape(what + change.detail);
}

/// What became of it.
enum class Outcome { Changed, WasThere, WasAbsent, Planned };

struct Plan {
    std::vector<std::uint8_t> bytes; // the state before, then the state after
    State before, after;
};

HYP_ReturnStatus SerializeTable(std::vector<std::uint8_t> &to) {
    Fetched serialized;
    const HYP_ReturnStatus status = DVSState_ConfigSerialize(serialized.Out(), serialized.Size());
    if (status == HYP_OK) to.insert(to.end(), serialized.View().begin(), serialized.View().end());
    return status;
}

// A load gives switches of some classes the host's limit; here they keep the module's.
void KeepLimits(Bytes state) {
    for (const Switch &sw : ParseState(state).switches) {
        DVSwitch *loaded = DVSState_SwitchFind(std::string(sw.name).c_str());
        if (const auto limit = sw.Number(Role::MaxPorts); loaded && limit) loaded->newMaxPorts = *limit;
    }
}

HYP_ReturnStatus PlanOnTable(const KernelChange &change, std::vector<std::uint8_t> &reply) {
    Fetched state;
    HYP_ReturnStatus status = DVSHYP_StateGet(state.Out(), state.Size());
    if (status != HYP_OK) return status;
    status = DVSState_ConfigDeserialize(state.View().data(), *state.Size());
    if (status != HYP_OK) return status;
    KeepLimits(state.View());
    status = SerializeTable(reply);
    if (status == HYP_OK) status = change.plan(change.target);
    if (status == HYP_OK) status = SerializeTable(reply);
    return status;
}

Plan Unpack(std::vector<std::uint8_t> bytes) {
    Plan plan;
    plan.bytes = std::move(bytes);
    plan.before = ParseState(plan.bytes);
    plan.after = ParseState(Bytes(plan.bytes).subspan(plan.before.size));
    return plan;
}

void Report(Context &context, const KernelChange &change, Outcome outcome,
            const std::vector<Change> &changes) {
    Output &out = context.out;
    if (context.options.json) {
        boost::json::object document = Envelope(change.command);
        AddTargetJson(document, change.target);
        document["is_changed"] = outcome == Outcome::Changed;
        if (outcome == Outcome::WasThere || outcome == Outcome::WasAbsent)
            document["was_there"] = outcome == Outcome::WasThere;
        if (outcome == Outcome::Planned) document["changes"] = ChangesJson(changes, context.options);
        out.Json(std::move(document));
        return;
    }
    switch (outcome) {
    case Outcome::Changed:
        out.Remark(Sentence(change, change.past) + "\n");
        break;
    case Outcome::WasThere:
        out.Remark(fmt::format("{} is there already: left as it is\n", Escape(ShowTarget(change.target))));
        break;
    case Outcome::WasAbsent:
        out.Remark(fmt::format("{} is not there: nothing to do\n", Escape(ShowTarget(change.target))));
        break;
    case Outcome::Planned:
        out.Write(Sentence(change, "would " + change.infinitive) + "\n");
        WriteChanges(changes, context.options, out);
        if (changes.empty())
            out.Remark(change.isInState ? "the module's state would stay the same\n"
                                        : "no state shows this change\n");
        out.Remark("nothing was changed (--dry-run)\n");
        break;
    }
}

} // namespace

Exit CarryOut(Context &context, KernelChange change) {
    const Options &options = context.options;
    const std::string title = "cannot " + Sentence(change, change.infinitive);
    const Answer answer =
        CallFor(context, change.target, title, [&](const Target &target, std::vector<std::uint8_t> &reply) {
            change.target = target; // in the child, where the ids of aliases are known
            return options.dryRun ? PlanOnTable(change, reply) : change.send(target);
        });
    if (answer.status == HYP_NOT_FOUND) { // with --if-exists only
        Report(context, change, Outcome::WasAbsent, {});
    } else if (answer.status == HYP_EXISTS && options.mayExist) {
        Report(context, change, Outcome::WasThere, {});
    } else {
        RequireOk(answer, title);
        if (change.warning) context.out.Warn(*change.warning);
        if (!options.dryRun) {
            Report(context, change, Outcome::Changed, {});
        } else {
            const Plan plan = Unpack(answer.bytes);
            Report(context, change, Outcome::Planned, Compare(plan.before, plan.after, {}));
        }
    }
    return Exit::Done;
}

} // namespace dvs::ctl
