/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl store export`, `import` and `delete`: single documents, out and in.

#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "form/json/parse.h"
#include "form/json/pretty.h"
#include "form/model.h"
#include "form/text.h"
#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/sources/files.h"
#include "tools/dvsctl/sources/source.h"
#include "tools/dvsctl/store/access.h"
#include "tools/dvsctl/store/document.h"
#include "tools/dvsctl/store/verbs.h"
#include "tools/dvsctl/verbs/version_warning.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;

std::string ReadInput(Context &context, const std::string &file) {
    if (file == "-") return ReadStandardInput(context, "-");
    if (!FileExists(file))
        throw Error(ErrorKind::Failed, "cannot read the document").In(file).Because("it does not exist");
    return ReadWholeFile(context, file, file, Accept::Pipes);
}

// The switch that a document says it is; empty where it does not say.
std::string UuidOf(const json::value &document) {
    const json::value *uuid = document.is_object() ? document.as_object().if_contains("uuid") : nullptr;
    return uuid && uuid->is_string() ? std::string(uuid->as_string()) : std::string();
}

// The switch that a document is for: the one it says it is, unless the command line says.
std::string InstanceOf(const Options &options, const std::string &file, const json::value &document) {
    if (options.switchId) return *options.switchId;
    if (std::string uuid = UuidOf(document); !uuid.empty()) return uuid;
    throw Error(ErrorKind::Malformed, "the document does not say whose it is")
        .In(file)
        .Field("uuid")
        .Because("a switch's document has its id there")
        .Try("add it, or give the id with --switch");
}

Error RefusedDocument(std::int32_t status, const std::string &file,
                      const std::vector<admin::Problem> &problems) {
    Error error(StoreErrorKind(status), "the document is refused, and nothing was stored");
    error.source = file;
    error.why = admin::StatusText(status);
    error.next = "dvsctl schema FIELD explains a field";
    if (problems.empty()) return error;
    error.field = problems.front().where;
    error.why = problems.front().what;
    for (std::size_t i = 1; i < problems.size() && i < 8; ++i)
        error.messages.push_back(problems[i].where + (problems[i].where.empty() ? "" : ": ") +
                                 problems[i].what);
    return error;
}

// The document in the store's eyes. Its JSON is looked at first, for line and column. Neither look makes a
// document of it, for it may be anything.
void CheckInput(const admin::Address &address, const std::string &file, const std::string &text) {
    try {
        if (!IsJsonObject(text)) throw Error(ErrorKind::Malformed, "a switch's document is a JSON object");
    } catch (Error &error) {
        if (error.source.empty()) error.source = file;
        throw;
    }
    std::vector<admin::Problem> problems;
    const std::int32_t status = admin::CheckDocument(address.key, address.group, text, &problems);
    if (status != configstore::OK) throw Error(RefusedDocument(status, file, problems));
}

// Saves and loads know a stored switch by what its document says, wherever that stands.
void WarnOfAnotherUuid(Context &context, const std::string &file, const std::string &instance,
                       const json::value &document) {
    const std::string uuid = UuidOf(document);
    if (uuid.empty() || uuid == instance) return;
    context.out.Warn(Error(ErrorKind::Warning,
                           fmt::format("the document of switch {} says that it is switch {}", instance, uuid))
                         .In(file)
                         .Field("uuid")
                         .Because("a load takes it for that one, and a save of all switches fails at it")
                         .Try("write the switch's own id there and import the document again"));
}

// Nothing is required of a document, but the loads require some of it. One switch that does not load keeps all
// others from it, so that is told at once.
void WarnIfUnloadable(Context &context, const std::string &path) {
    try {
        (void)LoadState(context, *OpenSource("store:" + path));
    } catch (const Error &error) {
        if (error.kind != ErrorKind::Busy) context.out.Warn(UnloadableWarning({}, error));
    }
}

} // namespace

Exit RunStoreExport(Context &context) {
    const Options &options = context.options;
    const auto revision = RevisionOf(options);
    const std::string path = StorePathOf(options.store.value_or(""));
    const OpenStore store(context, path, true);
    const admin::Address address = FindObject(store, LayerOf(options), options.source, revision.has_value());
    const auto text = revision ? store.DocumentAsOf(address, *revision) : store.Document(address);
    if (!text)
        throw Error(ErrorKind::NotThere,
                    revision ? fmt::format("the store held no such switch as of revision {}", *revision)
                             : std::string("the switch is gone"))
            .In(StoreName(path))
            .Try("dvsctl store history shows when it was there");
    const auto document = ReadDocument(*text);
    if (options.json) {
        json::object result = Envelope("store export");
        result["store"] = ValidUtf8(path);
        result["switch"] = ValidUtf8(address.instance);
        result["layer"] = admin::LayerName(address.layer);
        result["document"] = document ? *document : json::value(ValidUtf8(*text));
        context.out.Json(std::move(result));
        return Exit::Done;
    }
    const std::string pretty = document ? PrettyJson(*document) : Escape(*text) + "\n";
    if (!options.name || *options.name == "-") {
        context.out.Write(pretty);
        return Exit::Done;
    }
    ReplaceFile(context, *options.name, *options.name, AsBytes(pretty), FileForm::Document);
    context.out.Remark(
        fmt::format("exported switch {} to {}\n", ShowName(address.instance), Escape(*options.name)));
    return Exit::Done;
}

Exit RunStoreImport(Context &context) {
    const Options &options = context.options;
    const std::string path = StorePathOf(options.store.value_or(""));
    const std::string text = ReadInput(context, options.source);
    CheckInput(SwitchAddress(LayerOf(options), "x"), options.source, text);
    const json::value document = ReadDocument(text).value();
    const admin::Address address =
        SwitchAddress(LayerOf(options), InstanceOf(options, options.source, document));
    std::optional<json::value> before;
    if (IsStoreThere(path)) {
        const OpenStore store(context, path, true);
        if (const auto held = store.Document(address)) before = ReadDocument(*held);
    }
    if (before && options.noReplace)
        throw Error(ErrorKind::Failed, "the store holds that switch already")
            .In(StoreName(path))
            .Because("--no-replace was given");
    if (!options.dryRun) {
        const OpenStore store(context, path, false);
        std::vector<admin::Problem> problems;
        store.Require(admin::Import(store.get(), address, text, &problems), "cannot import the document");
    }
    WarnOfAnotherUuid(context, options.source, address.instance, document);
    if (!options.dryRun && address.layer == admin::Layer::Current) WarnIfUnloadable(context, path);
    WriteReport(context, {"store import",
                          path,
                          fmt::format("imported switch {} into {}", ShowName(address.instance),
                                      ShowName(StoreName(path))),
                          {{address, before, document}}});
    return Exit::Done;
}

Exit RunStoreDelete(Context &context) {
    const Options &options = context.options;
    const std::string path = StorePathOf(options.store.value_or(""));
    const admin::Layer layer = LayerOf(options);
    if (options.ifExists && !IsStoreThere(path))
        return ReportNothing(context, "store delete", path, "changes");
    // Looked at for reading first, so that a store that is not there is not made.
    admin::Address address;
    std::optional<json::value> before;
    try {
        const OpenStore store(context, path, true);
        address = FindObject(store, layer, options.source, false);
        before = ReadDocument(store.Document(address).value_or("null"));
    } catch (const Error &error) {
        if (error.kind != ErrorKind::NotThere || !options.ifExists) throw;
        WriteReport(context, {"store delete", path, "nothing to delete: the switch is not there", {}});
        return Exit::Done;
    }
    if (!options.dryRun) {
        const OpenStore store(context, path, false);
        const std::int32_t status = admin::Delete(store.get(), address);
        if (status != configstore::NOT_FOUND || !options.ifExists)
            store.Require(status, "cannot delete the switch");
    }
    WriteReport(context, {"store delete",
                          path,
                          fmt::format("deleted switch {} from {}; dvsctl store restore brings it back",
                                      ShowName(address.instance), ShowName(StoreName(path))),
                          {{address, before ? before : json::value(nullptr), std::nullopt}}});
    return Exit::Done;
}

} // namespace dvs::ctl
