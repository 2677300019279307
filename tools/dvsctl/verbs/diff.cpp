/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl diff`: two sources compared by switch, property and port.

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/sources/source.h"
#include "tools/dvsctl/verbs/changes.h"
#include "tools/dvsctl/verbs/filter.h"
#include "tools/dvsctl/verbs/show.h"

namespace dvs::ctl {

namespace {

// A switch, port or property may be on one side only: that is a difference, not an error, unless neither has
// it.
void FilterBoth(Context &context, const Source &a, State &before, State &after) {
    Options lenient = context.options;
    lenient.ifExists = true;
    State untouched = before;
    ApplyFilter(lenient, a.Name(), before);
    ApplyFilter(lenient, a.Name(), after);
    if (before.switches.empty() && after.switches.empty())
        ApplyFilter(context.options, a.Name(), untouched); // throws
}

} // namespace

Exit RunDiff(Context &context) {
    const Options &options = context.options;
    const auto a = OpenSource(options.source), b = OpenSource(options.target);
    if (a->IsStandardOutput() && b->IsStandardOutput())
        throw Error(ErrorKind::Usage, "both sources are standard input").Try("name a file for one of them");
    LoadedState before = LoadState(context, *a), after = LoadState(context, *b);
    FilterBoth(context, *a, before.state, after.state);
    const auto changes = Compare(before.state, after.state, {options.order, options.ignoreTypes});
    if (options.json) {
        boost::json::object document = Envelope("diff");
        document["before"] = ValidUtf8(a->Name());
        document["after"] = ValidUtf8(b->Name());
        document["is_same"] = changes.empty();
        document["changes"] = ChangesJson(changes, options);
        context.out.Json(std::move(document));
    } else if (changes.empty()) {
        context.out.Remark(fmt::format("no differences: {}\n", ShowCount(CountState(before.state))));
    } else {
        if (!options.columns && !options.noHeadings)
            context.out.Remark(fmt::format("{}\n{}\n",
                                           context.out.Paint(Style::Removed, "--- " + ShowName(a->Name())),
                                           context.out.Paint(Style::Added, "+++ " + ShowName(b->Name()))));
        WriteChanges(changes, options, context.out);
        if (!options.columns) context.out.Remark(ShowChangeCount(changes) + "\n");
    }
    return changes.empty() ? Exit::Done : Exit::Failed;
}

} // namespace dvs::ctl
