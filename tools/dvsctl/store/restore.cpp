/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl store restore`: one switch, or the whole store, as of a revision.

#include <algorithm>
#include <set>

#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "form/text.h"
#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/store/access.h"
#include "tools/dvsctl/store/document.h"
#include "tools/dvsctl/store/verbs.h"

namespace dvs::ctl {

namespace {

std::set<admin::Address> AllAddresses(const OpenStore &store) {
    std::set<admin::Address> addresses;
    for (const admin::Entry &entry : store.List())
        addresses.insert(entry.address);
    for (const admin::Entry &past : store.History())
        addresses.insert(past.address);
    return addresses;
}

std::optional<boost::json::value> Parsed(const std::optional<std::string> &text) {
    if (!text) return std::nullopt;
    auto document = ReadDocument(*text);
    return document ? document : boost::json::value(ValidUtf8(*text));
}

ObjectChange PlanOne(const OpenStore &store, const admin::Address &address, std::int64_t revision) {
    return {address, Parsed(store.Document(address)), Parsed(store.DocumentAsOf(address, revision))};
}

void CheckRevision(const OpenStore &store, std::int64_t revision) {
    const std::int64_t latest = store.LatestRevision();
    if (revision > latest)
        throw Error(ErrorKind::Failed, fmt::format("there is no revision {} yet", revision))
            .In(StoreName(store.Path()))
            .Because(fmt::format("the latest is {}", latest))
            .Try("dvsctl store history lists them");
}

std::vector<ObjectChange> Plan(const OpenStore &store, const std::optional<admin::Address> &only,
                               std::int64_t revision) {
    if (!only) {
        std::vector<ObjectChange> plan;
        for (const admin::Address &address : AllAddresses(store))
            plan.push_back(PlanOne(store, address, revision));
        return plan;
    }
    ObjectChange change = PlanOne(store, *only, revision);
    if (!change.after)
        throw Error(ErrorKind::NotThere,
                    fmt::format("the store held no such switch as of revision {}", revision))
            .In(StoreName(store.Path()))
            .Try("dvsctl store history shows when it was there; dvsctl store delete removes it");
    return {std::move(change)};
}

} // namespace

Exit RunStoreRestore(Context &context) {
    const Options &options = context.options;
    const auto revision = RevisionOf(options);
    if (!revision)
        throw Error(ErrorKind::Usage, "store restore needs --revision N")
            .Try("dvsctl store history lists the revisions");
    const std::string path = StorePathOf(options.store.value_or(""));
    const std::optional<std::string> wanted = OnlySwitchOf(options);
    std::optional<admin::Address> only;
    std::vector<ObjectChange> plan;
    {
        const OpenStore store(context, path, true);
        CheckRevision(store, *revision);
        if (wanted) only = FindObject(store, LayerOf(options), *wanted, true);
        plan = Plan(store, only, *revision);
    }
    if (!options.dryRun) {
        const OpenStore store(context, path, false);
        std::vector<admin::Change> changes;
        if (only)
            store.Require(admin::RestoreObject(store.get(), *only, *revision), "cannot restore the switch");
        else
            store.Require(admin::RestoreStore(store.get(), *revision, &changes), "cannot restore the store");
    }
    const auto changed =
        std::count_if(plan.begin(), plan.end(), [](const ObjectChange &c) { return c.before != c.after; });
    const std::string what = only ? "switch " + ShowName(only->instance) : ShowName(StoreName(path));
    WriteReport(context, {"store restore", path,
                          fmt::format("restored {} as of revision {}: {}", what, *revision,
                                      Count(static_cast<std::uint64_t>(changed), "object") + " changed"),
                          std::move(plan)});
    return Exit::Done;
}

} // namespace dvs::ctl
