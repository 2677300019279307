/* SPDX-License-Identifier: Apache-2.0 */
// Opening a database file that nobody vouches for (sqlite.h).

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/configstore.h"
#include "platform/embedded/configstore/backend/backend.h"
#include "platform/embedded/configstore/backend/sqlite.h"
#include "platform/embedded/configstore/backend/sqlite_tables.h"

namespace configstore {

namespace {

constexpr mode_t kFileMode = 0600;
constexpr mode_t kDirectoryMode = 0700;
constexpr mode_t kOthersBits = 0077;

int32_t Fail(FailureKeeper *failures, const char *what, int error) {
    return failures->Fail(IO_ERROR, std::string(what) + ": " + std::strerror(error));
}

/// Makes the file and its directory, for the owner only. SQLite itself would use the umask.
int32_t CreateFile(const std::string &path, FailureKeeper *failures) {
    const std::size_t slash = path.rfind('/');
    if (slash != std::string::npos && slash > 0) {
        const std::string directory = path.substr(0, slash);
        if (mkdir(directory.c_str(), kDirectoryMode) != 0 && errno != EEXIST)
            return Fail(failures, "the directory cannot be made", errno);
    }
    const int fd = open(path.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, kFileMode);
    if (fd < 0)
        return errno == EEXIST ? static_cast<int32_t>(OK) : Fail(failures, "the file cannot be made", errno);
    close(fd);
    return OK;
}

/// The path has to name a regular file: through a link or a device the store might write elsewhere.
int32_t CheckFile(Access access, FailureKeeper *failures) {
    const std::string &path = failures->Path();
    struct stat info {};
    if (lstat(path.c_str(), &info) != 0) {
        if (errno != ENOENT || access == Access::ReadOnly)
            return Fail(failures, "the file cannot be opened", errno);
        const int32_t status = CreateFile(path, failures);
        if (status != OK) return status;
        if (lstat(path.c_str(), &info) != 0) return Fail(failures, "the file cannot be opened", errno);
    }
    if (!S_ISREG(info.st_mode)) {
        const char *const what = S_ISLNK(info.st_mode)   ? "a symbolic link"
                                 : S_ISDIR(info.st_mode) ? "a directory"
                                                         : "not a regular file";
        return failures->Fail(IO_ERROR, std::string("this is ") + what + "; name the database file itself");
    }
    // Each name would have a write-ahead log of its own.
    if (info.st_nlink > 1)
        return failures->Fail(IO_ERROR, "this file has " + std::to_string(info.st_nlink) +
                                            " names (hard links); a store must have one");
    // Copies and restored backups often have wider modes. Another owner's file keeps its mode.
    if (access == Access::ReadWrite && (info.st_mode & kOthersBits) != 0 && info.st_uid == geteuid())
        (void)chmod(path.c_str(), info.st_mode & ~kOthersBits & 07777);
    return OK;
}

/// Nothing in the file is trusted: no functions from its schema, no writes to what SQLite keeps for itself.
int32_t Harden(const Connection &connection, bool keepLog) {
    sqlite3 *const db = connection.db.get();
    sqlite3_extended_result_codes(db, 1);
    sqlite3_busy_timeout(db, kBusyTimeoutMs);
    const struct {
        int option, value;
    } kOptions[] = {
        {SQLITE_DBCONFIG_DEFENSIVE, 1},              //
        {SQLITE_DBCONFIG_TRUSTED_SCHEMA, 0},         //
        {SQLITE_DBCONFIG_ENABLE_TRIGGER, 0},         //
        {SQLITE_DBCONFIG_ENABLE_VIEW, 0},            // the views are for people
        {SQLITE_DBCONFIG_NO_CKPT_ON_CLOSE, keepLog}, // closing must not change a file that may not be ours
    };
    for (const auto &option : kOptions) {
        if (sqlite3_db_config(db, option.option, option.value, nullptr) != SQLITE_OK) return FAILED;
    }
    int32_t status = Execute(connection, "PRAGMA cell_size_check=ON");
    if (status == OK)
        status =
            Execute(connection, "PRAGMA mmap_size=0"); // a file cut short would be a signal, not an error
    return status;
}

int32_t Connect(Access access, Connection *connection) {
    std::string name = connection->failures->Path();
    if (name.front() != '/') name.insert(0, "./"); // never a URI, whatever it looks like
    const int flags = access == Access::ReadWrite ? SQLITE_OPEN_READWRITE : SQLITE_OPEN_READONLY;
    sqlite3 *db = nullptr;
    const int rc = sqlite3_open_v2(name.c_str(), &db, flags, nullptr);
    connection->db.reset(db);
    if (rc == SQLITE_OK) return OK;
    Failure failure(StatusOf(rc),
                    std::string("the file cannot be opened: ") + (db ? sqlite3_errmsg(db) : "no memory"));
    failure.sqliteCode = rc;
    return connection->failures->Fail(std::move(failure));
}

} // namespace

int32_t OpenDatabase(Access access, Connection *connection) {
    // Without a log there is nothing that closing could move into the file, and its own empty one goes away.
    struct stat log {};
    const bool keepLog = stat((connection->failures->Path() + "-wal").c_str(), &log) == 0 && log.st_size > 0;
    int32_t status = CheckFile(access, connection->failures);
    if (status == OK) status = Connect(access, connection);
    if (status == OK) status = Harden(*connection, keepLog);
    if (status != OK) return status;
    connection->isReadOnly = sqlite3_db_readonly(connection->db.get(), "main") != 0;
    status = Migrate(*connection);
    if (status != OK) return status;
    const int rc = sqlite3_db_config(connection->db.get(), SQLITE_DBCONFIG_NO_CKPT_ON_CLOSE, 0, nullptr);
    return rc == SQLITE_OK ? OK : FAILED;
}

} // namespace configstore
