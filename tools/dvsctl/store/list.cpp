/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl store list` and `dvsctl store history`: what a store holds, and what it held.

#include <algorithm>
#include <map>
#include <unordered_set>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "form/text.h"
#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/cli/table.h"
#include "tools/dvsctl/store/access.h"
#include "tools/dvsctl/store/verbs.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;

constexpr Column kListColumns[] = {
    // name, right, by default
    {"switch", false, true},
    {"name", false, true},
    {"layer", false, true},
    {"revision", true, true},
    {"time", false, true},
    {"size", true, true},
    {"key"},
    {"group"},
    {"component"},
};

constexpr Column kHistoryColumns[] = {
    // name, right, by default
    {"revision", true, true}, {"time", false, true}, {"event", false, true},   {"switch", false, true},
    {"layer", false, true},   {"size", true, true},  {"present", false, true},
};

bool IsWanted(const Options &options, const admin::Address &address) {
    return !options.layer || address.layer == LayerOf(options);
}

// A document came to be, or an object went.
struct Event {
    std::int64_t revision = 0, timeMs = 0;
    const char *what = "";
    admin::Address address;
    std::uint64_t bytes = 0;
    bool present = false;
};

std::vector<Event> EventsOf(const OpenStore &store) {
    const std::vector<admin::Entry> past = store.History();
    std::map<admin::Address, std::unordered_set<std::int64_t>> replacements; // revisions, by object
    for (const admin::Entry &entry : past)
        if (!entry.deleted) replacements[entry.address].insert(entry.ended);
    const auto came = [&](const admin::Entry &entry) {
        const auto object = replacements.find(entry.address);
        const bool replaced = object != replacements.end() && object->second.contains(entry.revision);
        return Event{entry.revision, entry.savedMs, replaced ? "changed" : "added",
                     entry.address,  entry.bytes,   entry.ended == 0};
    };
    std::vector<Event> events;
    for (const admin::Entry &entry : store.List())
        events.push_back(came(entry));
    for (const admin::Entry &entry : past) {
        events.push_back(came(entry));
        if (entry.deleted) events.push_back({entry.ended, entry.endedMs, "deleted", entry.address, 0, false});
    }
    std::stable_sort(events.begin(), events.end(),
                     [](const Event &a, const Event &b) { return a.revision > b.revision; });
    return events;
}

json::object EventJson(const Event &event) {
    json::object object;
    object["revision"] = event.revision;
    object["time"] = ShowTime(event.timeMs);
    object["event"] = event.what;
    object["switch"] = ValidUtf8(event.address.instance);
    object["layer"] = admin::LayerName(event.address.layer);
    if (event.bytes > 0) object["size"] = event.bytes;
    object["is_present"] = event.present;
    return object;
}

} // namespace

Exit RunStoreList(Context &context) {
    const Options &options = context.options;
    Table table(kListColumns, options);
    const std::string path = StorePathOf(options.store.value_or(""));
    if (options.ifExists && !IsStoreThere(path)) return ReportNothing(context, "store list", path, "objects");
    const OpenStore store(context, path, true);
    json::array objects;
    for (const admin::Entry &entry : store.List()) {
        if (!IsWanted(options, entry.address)) continue;
        const admin::Address &at = entry.address;
        const bool wantsName = options.json || table.Shows("name");
        const std::string name = wantsName ? NameInDocument(store.Document(at).value_or("")) : "";
        const char *layer = admin::LayerName(at.layer);
        table.Add({{ShowName(at.instance), Style::Name},
                   {Escape(name)},
                   {layer},
                   {std::to_string(entry.revision)},
                   {ShowTime(entry.savedMs), Style::Dim},
                   {std::to_string(entry.bytes)},
                   {Escape(at.key)},
                   {Escape(at.group)},
                   {Escape(at.component)}});
        json::object object;
        object["switch"] = ValidUtf8(at.instance);
        if (!name.empty()) object["name"] = ValidUtf8(name);
        object["layer"] = layer;
        object["revision"] = entry.revision;
        object["time"] = ShowTime(entry.savedMs);
        object["size"] = entry.bytes;
        object["key"] = ValidUtf8(at.key);
        object["group"] = ValidUtf8(at.group);
        object["component"] = ValidUtf8(at.component);
        objects.emplace_back(std::move(object));
    }
    if (options.json) {
        json::object document = Envelope("store list");
        document["store"] = ValidUtf8(path);
        document["latest_revision"] = store.LatestRevision();
        document["objects"] = std::move(objects);
        context.out.Json(std::move(document));
    } else if (objects.empty()) {
        context.out.Remark(fmt::format("{}: no objects\n", ShowName(StoreName(path))));
    } else {
        table.Write(context.out);
    }
    return Exit::Done;
}

Exit RunStoreHistory(Context &context) {
    const Options &options = context.options;
    Table table(kHistoryColumns, options);
    const std::optional<std::string> wanted = OnlySwitchOf(options);
    const std::string path = StorePathOf(options.store.value_or(""));
    if (options.ifExists && !IsStoreThere(path))
        return ReportNothing(context, "store history", path, "events");
    const OpenStore store(context, path, true);
    std::optional<admin::Address> only;
    if (wanted) only = FindObject(store, LayerOf(options), *wanted, true);
    json::array events;
    for (const Event &event : EventsOf(store)) {
        if (only ? *only != event.address : !IsWanted(options, event.address)) continue;
        table.Add({{std::to_string(event.revision)},
                   {ShowTime(event.timeMs), Style::Dim},
                   {event.what},
                   {ShowName(event.address.instance), Style::Name},
                   {admin::LayerName(event.address.layer)},
                   {event.bytes > 0 ? std::to_string(event.bytes) : ""},
                   {event.present ? "yes" : ""}});
        events.emplace_back(EventJson(event));
    }
    if (options.json) {
        json::object document = Envelope("store history");
        document["store"] = ValidUtf8(path);
        document["latest_revision"] = store.LatestRevision();
        document["events"] = std::move(events);
        context.out.Json(std::move(document));
    } else if (events.empty()) {
        context.out.Remark(fmt::format("{}: nothing has been saved yet\n", ShowName(StoreName(path))));
    } else {
        table.Write(context.out);
    }
    return Exit::Done;
}

} // namespace dvs::ctl
