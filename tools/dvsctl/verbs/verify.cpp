/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl verify`: every nested buffer looked at, the first fault by path and offset. A report about damage
// is this verb's result, so it goes to standard output.

#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "dvsstate/switch_table.h"
#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/sources/source.h"
#include "tools/dvsctl/verbs/show.h"

namespace dvs::ctl {

namespace {

StateCount ToCount(const state::StateCounts &counts) {
    return {counts.switches, counts.ports, counts.properties};
}

// Damage of the state, of the place that holds it, or of both. Empty: sound.
std::optional<Error> FindDamage(const Source &source, const StateBytes &read,
                                const state::StateVerdict &verdict) {
    if (verdict.first) {
        Error error = DamageError(source, verdict);
        if (!read.complaint.empty()) error.why += "; besides, " + read.complaint;
        return error;
    }
    if (read.complaint.empty()) return std::nullopt;
    Error error(ErrorKind::Malformed, "the state is sound, but what holds it is not");
    error.source = source.Name();
    error.why = read.complaint;
    error.next = "the library refuses such a file; bring back a good copy";
    return error;
}

void WriteReport(Context &context, const Source &source, const std::optional<Error> &damage,
                 const state::StateVerdict &verdict, std::size_t size) {
    Output &out = context.out;
    const StateCount sound = ToCount(verdict.sound), all = ToCount(verdict.all);
    if (!damage) {
        out.Remark(fmt::format("{} {}, {} in {}\n", ShowLead(source), out.Paint(Style::Good, "sound"),
                               ShowCount(all), Count(size, "byte")));
        return;
    }
    out.Write(fmt::format("{} {}\n", ShowLead(source), out.Paint(Style::Bad, damage->title)));
    std::string where = Escape(damage->path);
    if (damage->offset)
        where += fmt::format("{}byte offset {} (0x{:x})", where.empty() ? "" : ", ", *damage->offset,
                             *damage->offset);
    if (!where.empty()) out.Write(fmt::format("  where:  {}\n", where));
    out.Write(fmt::format("  why:    {}\n", Escape(damage->why)));
    out.Write(fmt::format("  sound:  {} of {}, {} of {}, {} of {}\n", sound.switches,
                          Count(all.switches, "switch", "switches"), sound.ports, Count(all.ports, "port"),
                          sound.properties, Count(all.properties, "property", "properties")));
    if (!damage->next.empty()) out.Write(fmt::format("  next:   {}\n", Escape(damage->next)));
}

// Limits of ports differ from host to host, so a state may exceed those of this one. The switch table is as
// large everywhere.
void WarnOfTooManySwitches(Context &context, const Source &source, Bytes state) {
    if (state::VerifyState(state, UINT32_MAX).first.kind != state::StateFaultKind::TooManySwitches) return;
    context.out.Warn(
        Error(ErrorKind::Warning, "no host loads this state")
            .In(source.Name())
            .Because(fmt::format("it has more switches than the {} of the switch table", state::kSwitchNum))
            .Try("take some out in the JSON form, or copy single ones with --switch"));
}

} // namespace

Exit RunVerify(Context &context) {
    const auto source = OpenSource(context.options.source);
    source->CheckPlace(context); // what is wrong with the place explains what is wrong with the state
    const StateBytes read = ReadState(context, *source, ReadMode::Tolerant);
    const state::StateVerdict verdict = state::VerifyState(read.bytes);
    const std::optional<Error> damage = FindDamage(*source, read, verdict);
    if (!damage) WarnOfTooManySwitches(context, *source, read.bytes);
    if (context.options.json) {
        boost::json::object document = Envelope("verify");
        document["source"] = ValidUtf8(source->Name());
        document["is_sound"] = !damage;
        document["bytes"] = read.bytes.size();
        document["sound"] = CountJson(ToCount(verdict.sound));
        document["all"] = CountJson(ToCount(verdict.all));
        if (damage) document["error"] = ErrorJson(*damage, ExitOf(damage->kind));
        context.out.Json(std::move(document));
    } else {
        WriteReport(context, *source, damage, verdict, read.bytes.size());
    }
    return damage ? ExitOf(damage->kind) : Exit::Done;
}

} // namespace dvs::ctl
