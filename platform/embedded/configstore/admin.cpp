/* SPDX-License-Identifier: Apache-2.0 */
// The operators' functions (admin.h): opening, listing, documents in and out, backup.

#include "platform/embedded/configstore/admin.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <unistd.h>

#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/log.h"
#include "platform/embedded/configstore/oracle.h"
#include "platform/embedded/configstore/store.h"

namespace configstore::admin {

namespace {

FilterSpec SpecOf(const Address &address) {
    return {address.key, address.group, address.component, address.instance};
}

constexpr const char *kListSql =
    "SELECT layer, key, grp, component, instance, o.revision, saved_ms, length(CAST(d.text AS BLOB)) "
    "FROM object_row o JOIN document d ON d.id = o.document JOIN revision r ON r.revision = o.revision "
    "ORDER BY layer, key, grp, component, instance";

std::string Where(const Address &address) {
    return std::string(LayerName(address.layer)) + ' ' + address.key + '/' + address.group + '/' +
           address.component + '[' + address.instance + ']';
}

/// The compiled check, which is cheap, comes first: the general validator sees sound documents only.
int32_t CheckCompiled(const std::string &key, const std::string &group, std::string_view json,
                      std::vector<Problem> *problems) {
    Tree tree(key, group, "", "");
    if (!tree.shape) {
        problems->push_back({key + '/' + group, "there is no schema for such objects"});
        return BAD_PARAMETER;
    }
    std::string why, where;
    if (!ReadDocument(json, Reading::Strict, &tree, &why, &where)) {
        problems->push_back({where, why});
        return BAD_PARAMETER;
    }
    const Object *const bad = FindViolation(&tree);
    if (bad) problems->push_back({PathOf(bad), Describe(bad)});
    return bad ? SCHEMA_VIOLATION : OK;
}

} // namespace

const char *LayerName(Layer layer) {
    return layer == Layer::Current ? kCurrentLayer : kDesiredLayer;
}

const char *StatusText(int32_t status) {
    switch (status) {
    case OK:
        return "done";
    case BUSY:
        return "another process is writing to the config store";
    case BAD_PARAMETER:
        return "not something the config store can take";
    case SCHEMA_VIOLATION:
        return "the schema does not allow it";
    case EXISTS:
        return "it exists already";
    case NOT_FOUND:
        return "not there";
    case CORRUPT:
        return "the config store is damaged";
    case IO_ERROR:
        return "the config store cannot be read or written";
    case NO_MEMORY:
        return "out of memory";
    default:
        return "the config store failed";
    }
}

int32_t Open(const std::string &path, bool readOnly, Store **store) {
    if (!store) return BAD_PARAMETER;
    return Guarded([&] {
        std::unique_ptr<Store> opened;
        const int32_t status = OpenStore(path.empty() ? StorePath() : path,
                                         readOnly ? Access::ReadOnly : Access::ReadWrite, &opened);
        if (status == OK) *store = opened.release();
        return status;
    });
}

std::string DefaultPath() {
    return StorePath();
}

void SetBusyTimeout(Store *store, int milliseconds) {
    sqlite3_busy_timeout(store->db.get(), milliseconds);
}

int32_t List(Store *store, std::vector<Entry> *entries) {
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] {
        Statement statement(store, kListSql);
        std::vector<Entry> found;
        while (statement.Step()) {
            Entry entry{};
            entry.address = {statement.Text(0) == kDesiredLayer ? Layer::Desired : Layer::Current,
                             std::string(statement.Text(1)), std::string(statement.Text(2)),
                             std::string(statement.Text(3)), std::string(statement.Text(4))};
            entry.revision = statement.Integer(5);
            entry.savedMs = statement.Integer(6);
            entry.bytes = static_cast<uint64_t>(statement.Integer(7));
            found.push_back(std::move(entry));
        }
        if (statement.Status() == OK) *entries = std::move(found);
        return statement.Status();
    });
}

int32_t Export(Store *store, const Address &address, std::string *json) {
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] {
        Statement statement(store,
                            "SELECT text FROM object_row o JOIN document d ON d.id = o.document "
                            "WHERE layer = ? AND key = ? AND grp = ? AND component = ? AND instance = ?");
        statement.Bind(LayerName(address.layer)).Bind(address.key).Bind(address.group);
        statement.Bind(address.component).Bind(address.instance);
        if (!statement.Step())
            return statement.Status() == OK ? static_cast<int32_t>(NOT_FOUND) : statement.Status();
        *json = statement.Text(0);
        return static_cast<int32_t>(OK);
    });
}

int32_t CheckDocument(const std::string &key, const std::string &group, std::string_view json,
                      std::vector<Problem> *problems) {
    return Guarded([&]() -> int32_t {
        const int32_t status = CheckCompiled(key, group, json, problems);
        if (status != OK) return status;
        static const Oracle oracle(SchemaText(key, group), Strictness::Import);
        std::vector<Finding> findings;
        if (oracle.Accepts(json, &findings)) return OK;
        for (Finding &finding : findings)
            problems->push_back({std::move(finding.path), std::move(finding.what)});
        return SCHEMA_VIOLATION;
    });
}

int32_t Import(Store *store, const Address &address, std::string_view json, std::vector<Problem> *problems) {
    if (const int32_t status = Ready(store); status != OK) return status;
    const int32_t checked = CheckDocument(address.key, address.group, json, problems);
    if (checked != OK) {
        for (const Problem &problem : *problems)
            Log("config store %s: import of %s: %s%s%s", store->path.c_str(), Where(address).c_str(),
                problem.where.c_str(), problem.where.empty() ? "" : ": ", problem.what.c_str());
        return checked;
    }
    return Guarded([&] {
        const FilterSpec spec = SpecOf(address);
        std::unique_ptr<Tree> tree;
        const int32_t status = LoadTree(store, spec, json, &tree);
        return status == OK ? SaveTree(store, LayerName(address.layer), tree.get()) : status;
    });
}

int32_t Delete(Store *store, const Address &address) {
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&] {
        OwnTransaction transaction(store);
        int32_t status = transaction.Status();
        if (status == OK) status = DeleteRow(store, LayerName(address.layer), SpecOf(address));
        return status == OK ? transaction.Commit() : status;
    });
}

namespace {

/// Copies all pages in one step: it takes a read transaction, so that writers do not disturb it.
int32_t CopyInto(Store *store, const std::string &path) {
    sqlite3 *raw = nullptr;
    const int opened = sqlite3_open_v2(path.c_str(), &raw, SQLITE_OPEN_READWRITE, nullptr);
    const Database target(raw);
    if (opened != SQLITE_OK) return StatusOf(opened);
    sqlite3_backup *const backup = sqlite3_backup_init(raw, "main", store->db.get(), "main");
    if (!backup) return StatusOf(sqlite3_errcode(raw));
    const int stepped = sqlite3_backup_step(backup, -1);
    const int finished = sqlite3_backup_finish(backup);
    if (stepped != SQLITE_DONE && finished == SQLITE_OK) return StatusOf(stepped);
    if (finished != SQLITE_OK)
        Log("config store %s: backup to %s: %s", store->path.c_str(), path.c_str(), sqlite3_errmsg(raw));
    return StatusOf(finished);
}

int32_t SyncFile(const std::string &path) {
    const int fd = open(path.c_str(), O_RDONLY | O_CLOEXEC);
    if (fd < 0) return IO_ERROR;
    const int32_t status = fsync(fd) == 0 ? static_cast<int32_t>(OK) : static_cast<int32_t>(IO_ERROR);
    close(fd);
    return status;
}

} // namespace

int32_t Backup(Store *store, const std::string &path) {
    if (const int32_t status = Ready(store); status != OK) return status;
    return Guarded([&]() -> int32_t {
        const int fd = open(path.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
        if (fd < 0) {
            const int error = errno;
            Log("config store %s: backup to %s: %s", store->path.c_str(), path.c_str(), std::strerror(error));
            return error == EEXIST ? EXISTS : IO_ERROR;
        }
        close(fd);
        const std::string name = path.front() == '/' ? path : "./" + path;
        int32_t status = CopyInto(store, name);
        if (status == OK) status = SyncFile(path);
        if (status != OK) {
            (void)unlink(path.c_str());
            (void)unlink((path + "-journal").c_str());
        }
        return status;
    });
}

std::string_view Schema(std::string_view key, std::string_view group) {
    return SchemaText(key, group);
}

} // namespace configstore::admin
