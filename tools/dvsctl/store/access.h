/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_STORE_ACCESS_H
#define DVSCTL_STORE_ACCESS_H

// How dvsctl gets at a config store: which database is meant, opening it with the time that --timeout leaves,
// and store statuses as errors with the store's record of the failure as their cause. Used by the store sources
// and the store verbs; uses the operators' functions (platform/embedded/configstore/admin.h).

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/embedded/configstore/admin.h"
#include "tools/dvsctl/cli/context.h"

namespace dvs::ctl {

namespace admin = configstore::admin;

/// The database that `given` names; where it is empty, the one that the library would open. Throws
/// Error(Usage) for a store in memory, which ends with this program.
std::string StorePathOf(std::string_view given);

/// "store:PATH".
std::string StoreName(const std::string &path);

/// The exit status for a store status other than 0.
ErrorKind StoreErrorKind(std::int32_t status);

/// The error for a store status other than 0; `failure` is the store's record of it, or null.
Error StoreError(std::int32_t status, std::string title, const std::string &path,
                 const configstore::Failure *failure);

/// The error of those who need a store where there is none.
Error NoStoreError(const std::string &path);

/// The error of those who need an object that the store does not hold.
Error NoSwitchError(const std::string &path, std::string_view name, admin::Layer layer);

/// One open store.
class OpenStore {
public:
    /// Throws Error. Reading never makes a database: where there is none, that is an error.
    OpenStore(Context &context, const std::string &path, bool readOnly);
    ~OpenStore() { configstore::DestroyStore(store_); }
    OpenStore(const OpenStore &) = delete;
    OpenStore &operator=(const OpenStore &) = delete;

    [[nodiscard]] configstore::Store *get() const { return store_; }
    [[nodiscard]] const std::string &Path() const { return path_; }

    /// Throws the error for a status other than 0.
    void Require(std::int32_t status, const char *title) const;
    /// Waits for other writers as long as --timeout allows, with a line of progress; throws the error of a store
    /// that cannot be written. Another writer may come in afterwards: the store's calls wait for it as long as is
    /// left.
    void AwaitTurn(Context &context, const char *title) const;

    [[nodiscard]] std::vector<admin::Entry> List() const;
    [[nodiscard]] std::vector<admin::Entry> History() const;
    [[nodiscard]] std::int64_t LatestRevision() const;
    /// The object's document; nothing where there is none.
    [[nodiscard]] std::optional<std::string> Document(const admin::Address &address) const;
    /// As of a revision; nothing where there was none.
    [[nodiscard]] std::optional<std::string> DocumentAsOf(const admin::Address &address,
                                                          std::int64_t revision) const;

private:
    void ReopenWritable();

    configstore::Store *store_ = nullptr;
    std::string path_;
};

/// The layer that --layer names, the current one by default. Throws Error(Usage).
admin::Layer LayerOf(const Options &options);

/// The address of a switch's object.
admin::Address SwitchAddress(admin::Layer layer, std::string id);

/// The object that the text names: by switch id, else by the switch's name; with `withPast`, also one that is
/// gone.
/// Throws Error(NotThere).
admin::Address FindObject(const OpenStore &store, admin::Layer layer, const std::string &text, bool withPast);

/// The switch that verbs for one switch or all are given, as an operand or with --switch; nothing for all.
/// Throws Error(Usage) when both are given and differ.
std::optional<std::string> OnlySwitchOf(const Options &options);

/// The member "name" of a document; empty where there is none.
std::string NameInDocument(std::string_view document);

/// Milliseconds since 1970 as "2026-11-21T11:40:02Z".
std::string ShowTime(std::int64_t milliseconds);

/// The number that --revision gives; nothing without it. Throws Error(Usage).
std::optional<std::int64_t> RevisionOf(const Options &options);

} // namespace dvs::ctl

#endif
