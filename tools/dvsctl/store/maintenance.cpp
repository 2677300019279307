/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl store check`, `backup` and `upgrade`: care for the database as a whole.

#include <cerrno>
#include <cstdio>
#include <cstring>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fcntl.h>
#include <fmt/format.h>
#include <unistd.h>

#include "configstore/upgrade.h"
#include "form/model.h"
#include "form/text.h"
#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/sources/files.h"
#include "tools/dvsctl/sources/source.h"
#include "tools/dvsctl/store/access.h"
#include "tools/dvsctl/store/document.h"
#include "tools/dvsctl/store/scratch.h"
#include "tools/dvsctl/store/verbs.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;

constexpr const char *kUpgradeTitle = "cannot carry the state file over";

// The backup's name is durable once its directory is.
void SyncDirectoryOf(const std::string &path) {
    const std::size_t slash = path.rfind('/');
    const std::string directory = slash == std::string::npos ? "." : slash == 0 ? "/" : path.substr(0, slash);
    const int fd = open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    const bool synced = fd >= 0 && fsync(fd) == 0;
    const int error = errno;
    if (fd >= 0) close(fd);
    if (!synced)
        throw Error(ErrorKind::Failed, "the backup may not survive a power cut")
            .In(path)
            .Because(std::string("its directory cannot be synced: ") + std::strerror(error));
}

// Replaces a file that is there by a copy that is whole: made beside it, then renamed over it.
void ReplaceBackup(const OpenStore &store, const std::string &target) {
    const std::string beside = fmt::format("{}.dvsctl-{}", target, getpid());
    store.Require(admin::Backup(store.get(), beside), "cannot back up the config store");
    if (std::rename(beside.c_str(), target.c_str()) == 0) return;
    const int error = errno;
    (void)unlink(beside.c_str());
    throw Error(ErrorKind::Failed, "cannot replace the file").In(target).Because(std::strerror(error));
}

// What an upgrade would bring, from the library's own work on a copy.
std::vector<ObjectChange> PlanUpgrade(Context &context, const std::string &path, const std::string &file) {
    const ScratchStore scratch(context, path);
    std::vector<ObjectChange> plan;
    for (ScratchStore::Object &object : scratch.Objects())
        plan.push_back({object.address, ReadDocument(object.document), std::nullopt});
    const std::int32_t status = config::UpgradeFromFile(scratch.get(), file.c_str());
    if (status != 0) throw Error(StoreError(status, kUpgradeTitle, path, admin::LastFailure(scratch.get())));
    for (const ScratchStore::Object &object : scratch.Objects()) {
        ObjectChange *known = nullptr;
        for (ObjectChange &change : plan)
            if (change.address.layer == object.address.layer &&
                change.address.instance == object.address.instance)
                known = &change;
        if (!known) known = &plan.emplace_back(ObjectChange{object.address, std::nullopt, std::nullopt});
        known->after = ReadDocument(object.document);
    }
    return plan;
}

} // namespace

Exit RunStoreCheck(Context &context) {
    const Options &options = context.options;
    const std::string path = StorePathOf(options.store.value_or(""));
    if (options.ifExists && !IsStoreThere(path))
        return ReportNothing(context, "store check", path, "problems");
    const OpenStore store(context, path, true);
    std::vector<admin::Problem> problems;
    store.Require(admin::Check(store.get(), &problems), "cannot check the config store");
    if (options.json) {
        json::object document = Envelope("store check");
        document["store"] = ValidUtf8(path);
        document["is_sound"] = problems.empty();
        json::array list;
        for (const admin::Problem &problem : problems) {
            json::object object;
            object["where"] = ValidUtf8(problem.where);
            object["what"] = ValidUtf8(problem.what);
            list.emplace_back(std::move(object));
        }
        document["problems"] = std::move(list);
        context.out.Json(std::move(document));
    } else if (problems.empty()) {
        context.out.Remark(fmt::format("{}: {}, {}, {} past\n", ShowName(StoreName(path)),
                                       context.out.Paint(Style::Good, "sound"),
                                       Count(store.List().size(), "document"), store.History().size()));
    } else {
        context.out.Write(fmt::format("{}: {}\n", ShowName(StoreName(path)),
                                      context.out.Paint(Style::Bad, Count(problems.size(), "problem"))));
        for (const admin::Problem &problem : problems)
            context.out.Write(fmt::format("  {}: {}\n", Escape(problem.where), Escape(problem.what)));
        context.out.Write("  next:   dvsctl store restore brings back past documents; a damaged database "
                          "needs a backup\n");
    }
    return problems.empty() ? Exit::Done : Exit::Store;
}

Exit RunStoreBackup(Context &context) {
    const Options &options = context.options;
    const std::string path = StorePathOf(options.store.value_or(""));
    const std::string &target = options.target;
    const bool exists = FileExists(target);
    if (exists && !options.mayExist)
        throw Error(ErrorKind::Failed, "the backup's file is there already")
            .In(target)
            .Because("a backup does not replace another one by itself")
            .Try("name another file, or give --may-exist");
    const OpenStore store(context, path, true);
    if (!options.dryRun) {
        if (exists)
            ReplaceBackup(store, target);
        else
            store.Require(admin::Backup(store.get(), target), "cannot back up the config store");
        SyncDirectoryOf(target);
    }
    if (options.json) {
        json::object document = Envelope("store backup");
        document["store"] = ValidUtf8(path);
        document["to"] = ValidUtf8(target);
        document["is_done"] = !options.dryRun;
        document["latest_revision"] = store.LatestRevision();
        context.out.Json(std::move(document));
    } else if (options.dryRun) {
        context.out.Write(fmt::format("would {} {} with revision {} of {}\n", exists ? "replace" : "create",
                                      ShowName(target), store.LatestRevision(), ShowName(StoreName(path))));
        context.out.Remark("nothing was written (--dry-run)\n");
    } else {
        context.out.Remark(fmt::format("backed up {} at revision {} to {}\n", ShowName(StoreName(path)),
                                       store.LatestRevision(), ShowName(target)));
    }
    return Exit::Done;
}

Exit RunStoreUpgrade(Context &context) {
    const Options &options = context.options;
    const std::string path = StorePathOf(options.store.value_or(""));
    // The library takes an unreadable or damaged file for one without switches, and says nothing.
    const auto file = OpenSource("file:" + options.source);
    const LoadedState loaded = LoadState(context, *file);
    std::vector<ObjectChange> plan = PlanUpgrade(context, path, options.source);
    if (!options.dryRun) {
        const OpenStore store(context, path, false);
        store.AwaitTurn(context, kUpgradeTitle);
        store.Require(config::UpgradeFromFile(store.get(), options.source.c_str()), kUpgradeTitle);
    }
    WriteReport(context, {"store upgrade", path,
                          fmt::format("carried the identity of the switches in {} over to {}",
                                      ShowName(options.source), ShowName(StoreName(path))),
                          std::move(plan)});
    return Exit::Done;
}

} // namespace dvs::ctl
