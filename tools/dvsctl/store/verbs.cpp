/* SPDX-License-Identifier: Apache-2.0 */
// Reports of the store verbs (verbs.h).

#include "form/text.h"
#include "tools/dvsctl/store/verbs.h"

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <fmt/format.h>

#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/sources/files.h"
#include "tools/dvsctl/store/document.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;

const char *WordOf(const ObjectChange &change) {
    return !change.before ? "added" : !change.after ? "removed" : "changed";
}

void WriteObject(Context &context, const ObjectChange &change) {
    Output &out = context.out;
    const bool added = !change.before, removed = !change.after;
    const Style style = added ? Style::Added : removed ? Style::Removed : Style::Changed;
    const char *mark = added ? "+" : removed ? "-" : "~";
    const char *layer = change.address.layer == admin::Layer::Current ? "" : " (desired)";
    out.Write(
        out.Paint(style, fmt::format("{} switch {}{}", mark, ShowName(change.address.instance), layer)) +
        "\n");
    if (!added && !removed)
        WriteFieldChanges(CompareDocuments(change.before, change.after), "    ", context.options.full, out);
}

} // namespace

bool IsStoreThere(const std::string &path) {
    return FileExists(path);
}

Exit ReportNothing(Context &context, const char *command, const std::string &path, const char *member) {
    if (context.options.json) {
        json::object document = Envelope(command);
        document["store"] = ValidUtf8(path);
        document[member] = json::array();
        context.out.Json(std::move(document));
    } else {
        context.out.Remark(fmt::format("{}: there is no config store\n", ShowName(StoreName(path))));
    }
    return Exit::Done;
}

void WriteReport(Context &context, const ChangeReport &report) {
    const bool dryRun = context.options.dryRun;
    std::vector<const ObjectChange *> changes;
    for (const ObjectChange &change : report.changes)
        if (change.before != change.after) changes.push_back(&change);
    if (context.options.json) {
        json::object document = Envelope(report.command);
        document["store"] = ValidUtf8(report.path);
        document["is_done"] = !dryRun;
        json::array objects;
        for (const ObjectChange *change : changes) {
            json::object object;
            object["change"] = WordOf(*change);
            object["switch"] = ValidUtf8(change->address.instance);
            object["layer"] = admin::LayerName(change->address.layer);
            object["fields"] = FieldChangesJson(CompareDocuments(change->before, change->after));
            objects.emplace_back(std::move(object));
        }
        document["changes"] = std::move(objects);
        context.out.Json(std::move(document));
        return;
    }
    if (!dryRun) {
        context.out.Remark(report.done + "\n");
        return;
    }
    context.out.Write(changes.empty()
                          ? fmt::format("would change nothing in {}\n", ShowName(StoreName(report.path)))
                          : fmt::format("would change {} in {}\n", Count(changes.size(), "object"),
                                        ShowName(StoreName(report.path))));
    for (const ObjectChange *change : changes)
        WriteObject(context, *change);
    context.out.Remark("nothing was written (--dry-run)\n");
}

} // namespace dvs::ctl
