/* SPDX-License-Identifier: Apache-2.0 */
// SQLite behind the store (database.h): statements, errors, and the opening of a file that nobody vouches
// for.

#include "platform/embedded/configstore/database.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <mutex>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/embedded/configstore/log.h"
#include "platform/embedded/configstore/migrations.h"

namespace configstore {

namespace {

constexpr mode_t kFileMode = 0600;
constexpr mode_t kDirectoryMode = 0700;
constexpr mode_t kOthersBits = 0077;
constexpr const char *kMemoryUri = "file:/dvs-configstore?vfs=memdb";

int32_t Fail(const std::string &path, const char *what, int error) {
    Log("config store %s: %s: %s", path.c_str(), what, std::strerror(error));
    return IO_ERROR;
}

/// Makes the file and its directory, for the owner only. SQLite itself would use the umask.
int32_t CreateFile(const std::string &path) {
    const std::size_t slash = path.rfind('/');
    if (slash != std::string::npos && slash > 0) {
        const std::string directory = path.substr(0, slash);
        if (mkdir(directory.c_str(), kDirectoryMode) != 0 && errno != EEXIST)
            return Fail(path, "the directory cannot be made", errno);
    }
    const int fd = open(path.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, kFileMode);
    if (fd < 0)
        return errno == EEXIST ? static_cast<int32_t>(OK) : Fail(path, "the file cannot be made", errno);
    close(fd);
    return OK;
}

/// What the path leads to has to be a file of its own: through a link or a device the store might write
/// elsewhere.
int32_t CheckFile(const std::string &path, Access access) {
    struct stat info {};
    if (lstat(path.c_str(), &info) != 0) {
        if (errno != ENOENT || access == Access::ReadOnly)
            return Fail(path, "the file cannot be opened", errno);
        const int32_t status = CreateFile(path);
        if (status != OK) return status;
        if (lstat(path.c_str(), &info) != 0) return Fail(path, "the file cannot be opened", errno);
    }
    if (!S_ISREG(info.st_mode)) {
        const char *const what = S_ISLNK(info.st_mode)   ? "a symbolic link"
                                 : S_ISDIR(info.st_mode) ? "a directory"
                                                         : "not a regular file";
        Log("config store %s: this is %s; name the database file itself", path.c_str(), what);
        return IO_ERROR;
    }
    // Copies and restored backups often come with wider modes. Whose file it is not, cannot be helped.
    if (access == Access::ReadWrite && (info.st_mode & kOthersBits) != 0 && info.st_uid == geteuid())
        (void)chmod(path.c_str(), info.st_mode & ~kOthersBits & 07777);
    return OK;
}

/// The in-memory database lives while a connection to it does: this one keeps it for the process.
int32_t KeepMemoryDatabase() {
    static std::mutex mutex;
    static Database keeper;
    const std::lock_guard guard(mutex);
    if (keeper) return OK;
    sqlite3 *db = nullptr;
    const int rc = sqlite3_open_v2(kMemoryUri, &db,
                                   SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE | SQLITE_OPEN_URI, nullptr);
    Database opened(db);
    if (rc != SQLITE_OK) return StatusOf(rc);
    // The database is made with the first access to it, not by opening it.
    if (sqlite3_exec(db, "PRAGMA schema_version", nullptr, nullptr, nullptr) != SQLITE_OK) return FAILED;
    keeper = std::move(opened);
    return OK;
}

/// Nothing in the file is trusted: no functions from its schema, no writes to what SQLite keeps for itself.
int32_t Harden(Store *store, bool keepLog) {
    sqlite3 *const db = store->db.get();
    sqlite3_extended_result_codes(db, 1);
    sqlite3_busy_timeout(db, kBusyTimeoutMs);
    const struct {
        int option, value;
    } kOptions[] = {
        {SQLITE_DBCONFIG_DEFENSIVE, 1},              //
        {SQLITE_DBCONFIG_TRUSTED_SCHEMA, 0},         //
        {SQLITE_DBCONFIG_ENABLE_TRIGGER, 0},         //
        {SQLITE_DBCONFIG_ENABLE_VIEW, 0},            // ours are for people
        {SQLITE_DBCONFIG_NO_CKPT_ON_CLOSE, keepLog}, // closing must not change what may not be ours
    };
    for (const auto &option : kOptions) {
        if (sqlite3_db_config(db, option.option, option.value, nullptr) != SQLITE_OK) return FAILED;
    }
    int32_t status = Execute(store, "PRAGMA cell_size_check=ON");
    if (status == OK)
        status = Execute(store, "PRAGMA mmap_size=0"); // a file cut short would be a signal, not an error
    return status;
}

int32_t OpenFile(Store *store, Access access) {
    int flags = access == Access::ReadWrite ? SQLITE_OPEN_READWRITE : SQLITE_OPEN_READONLY;
    std::string name = store->path;
    if (store->path == kMemoryPath) {
        const int32_t status = KeepMemoryDatabase();
        if (status != OK) return status;
        flags |= SQLITE_OPEN_URI | SQLITE_OPEN_CREATE;
        name = kMemoryUri;
    } else {
        const int32_t status = CheckFile(store->path, access);
        if (status != OK) return status;
        if (name.front() != '/') name.insert(0, "./"); // never a URI, whatever it looks like
    }
    sqlite3 *db = nullptr;
    const int rc = sqlite3_open_v2(name.c_str(), &db, flags, nullptr);
    store->db.reset(db);
    if (rc == SQLITE_OK) return OK;
    Log("config store %s: the file cannot be opened: %s", store->path.c_str(),
        db ? sqlite3_errmsg(db) : "no memory");
    return StatusOf(rc);
}

} // namespace

int32_t StatusOf(int rc) {
    switch (rc & 0xff) {
    case SQLITE_OK:
    case SQLITE_ROW:
    case SQLITE_DONE:
        return OK;
    case SQLITE_BUSY:
    case SQLITE_LOCKED:
        return BUSY;
    case SQLITE_NOMEM:
        return NO_MEMORY;
    case SQLITE_CORRUPT:
    case SQLITE_NOTADB:
        return CORRUPT;
    case SQLITE_FULL:
    case SQLITE_IOERR:
    case SQLITE_CANTOPEN:
    case SQLITE_READONLY:
    case SQLITE_PERM:
        return IO_ERROR;
    case SQLITE_TOOBIG:
        return BAD_PARAMETER;
    default:
        return FAILED;
    }
}

void NoteLostTransaction(Store *store, int32_t status) {
    // SQLite rolls back by itself on some failures. What came after would be saved on its own, outside any
    // transaction: it is refused with the same status until the caller cancels.
    if (store->inTransaction && store->refusal == OK && sqlite3_get_autocommit(store->db.get()))
        store->refusal = status;
}

Statement::Statement(Store *store, const char *sql) : store_(store) {
    const int rc = sqlite3_prepare_v2(store->db.get(), sql, -1, &statement_, nullptr);
    if (rc != SQLITE_OK) Note(rc);
}

void Statement::Note(int rc) {
    status_ = StatusOf(rc);
    if (rc == SQLITE_OK || rc == SQLITE_ROW || rc == SQLITE_DONE) return;
    const char *const text = sqlite3_errmsg(store_->db.get());
    const char *const hint =
        (rc & 0xff) == SQLITE_FULL ? " (make room; nothing of this transaction has been saved)" : "";
    Log("config store %s: %s (result %d)%s", store_->path.c_str(), text, rc, hint);
    NoteLostTransaction(store_, status_);
}

Statement &Statement::Bind(std::string_view text) {
    parameter_++;
    if (status_ == OK) {
        const char *const data = text.data() ? text.data() : "";
        const int rc =
            sqlite3_bind_text64(statement_, parameter_, data, text.size(), SQLITE_STATIC, SQLITE_UTF8);
        if (rc != SQLITE_OK) Note(rc);
    }
    return *this;
}

Statement &Statement::Bind(int64_t value) {
    parameter_++;
    if (status_ == OK) {
        const int rc = sqlite3_bind_int64(statement_, parameter_, value);
        if (rc != SQLITE_OK) Note(rc);
    }
    return *this;
}

bool Statement::Step() {
    if (status_ != OK) return false;
    const int rc = sqlite3_step(statement_);
    if (rc == SQLITE_ROW) return true;
    Note(rc);
    return false;
}

void Statement::Reset() {
    sqlite3_reset(statement_);
    parameter_ = 0;
}

std::string_view Statement::Text(int column) {
    const auto *const text = reinterpret_cast<const char *>(sqlite3_column_text(statement_, column));
    const int size = sqlite3_column_bytes(statement_, column);
    return text ? std::string_view(text, static_cast<std::size_t>(size)) : std::string_view();
}

int32_t Execute(Store *store, const char *sql) {
    Statement statement(store, sql);
    while (statement.Step()) {
    }
    return statement.Status();
}

std::string StorePath() {
    // Not for programs that run with more rights than their caller: the caller's environment decides nothing
    // there.
    const char *const path = secure_getenv("DVS_CONFIGSTORE");
    return path && *path ? path : kDefaultPath;
}

int32_t OpenStore(const std::string &path, Access access, std::unique_ptr<Store> *out) {
    auto store = std::make_unique<Store>();
    store->path = path;
    // Without a log there is nothing that closing could move into the file, and its own empty one goes away.
    struct stat log {};
    const bool keepLog = stat((path + "-wal").c_str(), &log) == 0 && log.st_size > 0;
    int32_t status = OpenFile(store.get(), access);
    if (status == OK) status = Harden(store.get(), keepLog);
    if (status != OK) return status;
    store->readOnly = sqlite3_db_readonly(store->db.get(), "main") != 0;
    status = Migrate(store.get());
    if (status != OK) return status;
    if (sqlite3_db_config(store->db.get(), SQLITE_DBCONFIG_NO_CKPT_ON_CLOSE, 0, nullptr) != SQLITE_OK)
        return FAILED;
    *out = std::move(store);
    return OK;
}

} // namespace configstore
