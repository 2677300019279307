/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl copy`: a verified state from one source to another. Nothing is written before everything has been
// read and judged; what then goes wrong leaves the target as it was.

#include <utility>

#include <fmt/format.h>

#include "form/encode.h"
#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/sources/source.h"
#include "tools/dvsctl/verbs/filter.h"
#include "tools/dvsctl/verbs/put.h"

namespace dvs::ctl {

namespace {

// The state of the one switch that --switch asks for.
LoadedState OnlySwitch(Context &context, const Source &from, const LoadedState &loaded) {
    State narrowed = loaded.state;
    Options wanted = context.options;
    wanted.ifExists = false; // there is nothing to copy then
    ApplyFilter(wanted, from.Name(), narrowed);
    std::vector<NewEntry> entries;
    for (const Switch &sw : narrowed.switches)
        entries.push_back({std::string(sw.name), sw.type, {sw.value.begin(), sw.value.end()}});
    return JudgeState(from, {EncodeList(entries), {}});
}

Exit NothingToCopy(Context &context, const PutJob &job, const Source &to) {
    if (!context.options.json)
        context.out.Remark(fmt::format("nothing to copy: {} is not there\n", ShowName(job.from->Name())));
    else
        ReportNothingPut(context, job, to);
    return Exit::Done;
}

} // namespace

Exit RunCopy(Context &context) {
    const Options &options = context.options;
    const auto from = OpenSource(options.source), to = OpenSource(options.target);
    const PutJob job{"copy", "copied", from.get()};
    CheckPutOptions(options, *to);

    from->CopiesTo(*to);
    // Here an absent source is not an empty state: copying that would empty the target.
    std::optional<StateBytes> read = from->Read(context, ReadMode::Strict);
    if (!read && options.ifExists) return NothingToCopy(context, job, *to);
    if (!read) throw Error(AbsentError(*from));
    LoadedState loaded = JudgeState(*from, std::move(*read));
    if (options.switchId) loaded = OnlySwitch(context, *from, loaded);
    return PutState(context, job, std::move(loaded), *to);
}

} // namespace dvs::ctl
