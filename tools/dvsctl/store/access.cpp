/* SPDX-License-Identifier: Apache-2.0 */
// Opening stores, and what their statuses mean to a user (access.h).

#include "tools/dvsctl/store/access.h"

#include <charconv>
#include <ctime>

#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>
#include <unistd.h>

#include "configstore/switch_object.h"
#include "tools/dvsctl/sources/files.h"
#include "tools/dvsctl/store/document.h"
#include "tools/dvsctl/store/progress.h"

namespace dvs::ctl {

namespace {

struct StatusRow {
    std::int32_t status;
    ErrorKind kind;
    const char *next;
};

constexpr StatusRow kStatuses[] = {
    {configstore::BUSY, ErrorKind::Busy, "try again, or wait longer with --timeout"},
    {configstore::BAD_PARAMETER, ErrorKind::Malformed, ""},
    {configstore::SCHEMA_VIOLATION, ErrorKind::Malformed, "dvsctl schema FIELD explains a field"},
    {configstore::EXISTS, ErrorKind::Failed, "name another file, or give --may-exist"},
    {configstore::NOT_FOUND, ErrorKind::NotThere,
     "dvsctl store list and dvsctl store history show what there is"},
    {configstore::CORRUPT, ErrorKind::Store,
     "dvsctl store check says more; bring back a copy that dvsctl store backup made"},
    {configstore::IO_ERROR, ErrorKind::Store, "check the path, its owner and mode, and the room on the disk"},
};

const StatusRow *RowOf(std::int32_t status) {
    for (const StatusRow &row : kStatuses)
        if (row.status == status) return &row;
    return nullptr;
}

} // namespace

std::string StorePathOf(std::string_view given) {
    std::string path = given.empty() ? admin::DefaultPath() : std::string(given);
    if (path == ":memory:")
        throw Error(ErrorKind::Usage, "a store in memory ends with the program that has it")
            .Try("name a database file: store:PATH, --store PATH, or DVS_CONFIGSTORE");
    return path;
}

std::string StoreName(const std::string &path) {
    return "store:" + path;
}

ErrorKind StoreErrorKind(std::int32_t status) {
    const StatusRow *row = RowOf(status);
    return row ? row->kind : ErrorKind::Store;
}

Error StoreError(std::int32_t status, std::string title, const std::string &path,
                 const configstore::Failure *failure) {
    Error error(StoreErrorKind(status), std::move(title));
    error.source = StoreName(path);
    error.why = admin::StatusText(status);
    if (failure) error.messages.push_back(configstore::Text(*failure));
    if (const StatusRow *row = RowOf(status)) error.next = row->next;
    return error;
}

Error NoStoreError(const std::string &path) {
    return Error(ErrorKind::Store, "there is no config store")
        .In(StoreName(path))
        .Because("the database file does not exist")
        .Try("check the path (store:PATH, --store PATH or DVS_CONFIGSTORE); the first save makes a store");
}

Error NoSwitchError(const std::string &path, std::string_view name, admin::Layer layer) {
    return Error(ErrorKind::NotThere, "there is no switch \"" + std::string(name) + "\"")
        .In(StoreName(path))
        .Because(fmt::format("the {} layer has no object of that id or name", admin::LayerName(layer)))
        .Try("dvsctl store list shows what there is");
}

OpenStore::OpenStore(Context &context, const std::string &path, bool readOnly) : path_(path) {
    if (readOnly && !FileExists(path)) throw Error(NoStoreError(path));
    configstore::Failure failure;
    if (const std::int32_t status = admin::Open(path, readOnly, &store_, &failure); status != configstore::OK)
        throw Error(StoreError(status, "cannot open the config store", path_,
                               failure.status != 0 ? &failure : nullptr));
    if (readOnly) ReopenWritable();
    admin::SetBusyTimeout(store_, context.deadline.MillisecondsLeft());
}

// The last connection to a database removes its log files when it closes, unless it is read-only. The file is known
// to be a store by now, so a connection that could write does no harm.
void OpenStore::ReopenWritable() {
    configstore::Store *writable = nullptr;
    if (access(path_.c_str(), W_OK) != 0 || admin::Open(path_, false, &writable) != configstore::OK) return;
    configstore::DestroyStore(store_);
    store_ = writable;
}

void OpenStore::Require(std::int32_t status, const char *title) const {
    if (status != configstore::OK) throw Error(StoreError(status, title, path_, admin::LastFailure(store_)));
}

void OpenStore::AwaitTurn(Context &context, const char *title) const {
    {
        const Progress progress(context, "waiting for other writers of " + path_);
        std::int64_t revision = 0;
        std::int32_t status = configstore::BeginTransaction(store_);
        if (status == configstore::OK) status = admin::LatestRevision(store_, &revision);
        (void)configstore::CancelTransaction(store_); // nothing has been written
        Require(status, title);
    }
    admin::SetBusyTimeout(store_, context.deadline.MillisecondsLeft());
}

std::vector<admin::Entry> OpenStore::List() const {
    std::vector<admin::Entry> entries;
    Require(admin::List(store_, &entries), "cannot list the config store");
    return entries;
}

std::vector<admin::Entry> OpenStore::History() const {
    std::vector<admin::Entry> entries;
    Require(admin::History(store_, &entries), "cannot read the config store's history");
    return entries;
}

std::int64_t OpenStore::LatestRevision() const {
    std::int64_t revision = 0;
    Require(admin::LatestRevision(store_, &revision), "cannot read the config store's history");
    return revision;
}

std::optional<std::string> OpenStore::Document(const admin::Address &address) const {
    std::string document;
    const std::int32_t status = admin::Export(store_, address, &document);
    if (status == configstore::NOT_FOUND) return std::nullopt;
    Require(status, "cannot read a document of the config store");
    return document;
}

std::optional<std::string> OpenStore::DocumentAsOf(const admin::Address &address,
                                                   std::int64_t revision) const {
    std::string document;
    const std::int32_t status = admin::ExportAsOf(store_, address, revision, &document);
    if (status == configstore::NOT_FOUND) return std::nullopt;
    Require(status, "cannot read a past document of the config store");
    return document;
}

admin::Layer LayerOf(const Options &options) {
    if (!options.layer || *options.layer == "current") return admin::Layer::Current;
    if (*options.layer == "desired") return admin::Layer::Desired;
    throw Error(ErrorKind::Usage, "there is no layer \"" + *options.layer + "\"")
        .Because("the layers are current and desired");
}

admin::Address SwitchAddress(admin::Layer layer, std::string id) {
    return {layer, config::kKey, config::kGroup, config::kComponent, std::move(id)};
}

admin::Address FindObject(const OpenStore &store, admin::Layer layer, const std::string &text,
                          bool withPast) {
    const std::vector<admin::Entry> entries = store.List();
    for (const admin::Entry &entry : entries)
        if (entry.address.layer == layer && entry.address.instance == text) return entry.address;
    if (withPast)
        for (const admin::Entry &past : store.History())
            if (past.address.layer == layer && past.address.instance == text) return past.address;
    for (const admin::Entry &entry : entries)
        if (entry.address.layer == layer &&
            NameInDocument(store.Document(entry.address).value_or("")) == text)
            return entry.address;
    if (withPast)
        for (const admin::Entry &past : store.History())
            if (past.address.layer == layer &&
                NameInDocument(store.DocumentAsOf(past.address, past.revision).value_or("")) == text)
                return past.address;
    throw Error(NoSwitchError(store.Path(), text, layer));
}

std::optional<std::string> OnlySwitchOf(const Options &options) {
    if (options.name && options.switchId && *options.name != *options.switchId)
        throw Error(ErrorKind::Usage, "SWITCH and --switch name two switches")
            .Because("both mean the only switch to look at")
            .Try("leave one of them out");
    return options.name ? options.name : options.switchId;
}

std::string NameInDocument(std::string_view document) {
    const auto value = ReadDocument(document);
    if (!value || !value->is_object()) return {};
    const auto *name = value->as_object().if_contains("name");
    return name && name->is_string() ? std::string(name->as_string()) : std::string();
}

std::string ShowTime(std::int64_t milliseconds) {
    const std::time_t seconds = static_cast<std::time_t>(milliseconds / 1000);
    std::tm utc{};
    char text[40];
    if (!gmtime_r(&seconds, &utc) || std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &utc) == 0)
        return "-";
    return text;
}

std::optional<std::int64_t> RevisionOf(const Options &options) {
    if (!options.revision) return std::nullopt;
    const std::string &text = *options.revision;
    std::int64_t revision = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), revision);
    if (error != std::errc() || end != text.data() + text.size() || revision < 0)
        throw Error(ErrorKind::Usage, "--revision wants a number that is not negative")
            .Because("dvsctl store history lists them");
    return revision;
}

} // namespace dvs::ctl
