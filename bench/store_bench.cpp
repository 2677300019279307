/* SPDX-License-Identifier: Apache-2.0 */
// Saves one switch to the config store and loads it back, against SQLite alone writing and reading one ready
// document of the same size: in one run, on the same disk, with the same durability. Prints milliseconds (of
// the fastest round), ratios, nanoseconds per property and the peak memory. See README.md.
//
//   store_bench [--ports N[,N…]] [--kind usual|structured] [--rounds N] [--dir DIRECTORY]

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <functional>
#include <sqlite3.h>
#include <string>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>
#include <vector>

#include "bench/port_settings.h"
#include "dvs/configstore.h"
#include "dvs/log.h"
#include "dvs/state.h"

namespace {

using store_bench::kPortKinds;
using store_bench::kSettingsOfAPort;
using store_bench::PortKind;
using store_bench::Setting;

[[noreturn]] void Fail(const char *what) {
    std::fprintf(stderr, "store_bench: %s failed\n", what);
    std::exit(1);
}

void Check(bool good, const char *what) {
    if (!good) Fail(what);
}

struct State {
    void *buffer = nullptr;
    uint32_t len = 0;
};

State BuildState(const PortKind &kind, int ports, int version) {
    constexpr const char *kSwitch = "50 2d 6b 7c 1a 2b 3c 4d-5e 6f 70 81 92 a3 b4 c5";
    Check(DVSState_SwitchAdd(kSwitch, "etherswitch", static_cast<uint32_t>(ports), 9) == HYP_OK, "the switch");
    const std::string name("bench", 6);
    Check(DVSState_GlobalPropSet(kSwitch, "com.orbeno.common.alias", name.data(), static_cast<uint32_t>(name.size()), 0x20) ==
              HYP_OK,
          "the alias");
    const uint32_t number = 9;
    Check(DVSState_GlobalPropSet(kSwitch, "com.orbeno.common.version", &number, 4, 0x20) == HYP_OK, "the version");
    for (int port = 0; port < ports; port++) {
        DVSData *data = nullptr;
        Check(DVSData_Alloc(&data, [](uint64_t size) { return std::malloc(size); }, [](void *block) { std::free(block); }) == HYP_OK,
              "a port's list");
        for (const Setting &setting : kind.settings(port, version))
            Check(DVSData_Append(data, setting.key, setting.value.data(), static_cast<uint32_t>(setting.value.size()),
                                 setting.type) == HYP_OK,
                  "a setting");
        Check(DVSState_PortAdd(kSwitch, std::to_string(port).c_str(), data) == HYP_OK, "a port");
    }
    State state;
    Check(DVSState_ConfigSerialize(&state.buffer, &state.len) == HYP_OK, "the state's buffer");
    Check(DVSState_ConfigReset() == HYP_OK, "the reset");
    return state;
}

/// The time of the fastest round. Calls `prepare` before each round, untimed.
double FastestMs(int rounds, const std::function<void(int)> &work, const std::function<void()> &prepare = {}) {
    double fastest = 0;
    for (int round = 0; round < rounds; round++) {
        if (prepare) prepare();
        const auto start = std::chrono::steady_clock::now();
        work(round);
        const double took = std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - start).count();
        if (round == 0 || took < fastest) fastest = took;
    }
    return fastest;
}

long PeakMegabytes() {
    rusage usage{};
    getrusage(RUSAGE_SELF, &usage);
    return usage.ru_maxrss / 1024;
}

void RemoveDatabase(const std::string &path) {
    for (const char *suffix : {"", "-wal", "-shm"})
        std::filesystem::remove(path + suffix);
}

/// Plain SQLite with the store's durability: a table of documents.
class Plain {
  public:
    explicit Plain(std::string path) : path_(std::move(path)) { Open(); }
    ~Plain() { sqlite3_close(db_); }
    void Open() {
        Check(sqlite3_open(path_.c_str(), &db_) == SQLITE_OK, "sqlite3_open");
        Run("PRAGMA journal_mode=WAL");
        Run("PRAGMA synchronous=FULL");
        Run("CREATE TABLE IF NOT EXISTS document (id TEXT PRIMARY KEY, text TEXT)");
    }
    void Close() {
        sqlite3_close(db_);
        db_ = nullptr;
    }
    void Store(const std::string &text) {
        Run("BEGIN IMMEDIATE");
        sqlite3_stmt *statement = nullptr;
        sqlite3_prepare_v2(db_, "REPLACE INTO document VALUES ('one', ?)", -1, &statement, nullptr);
        sqlite3_bind_text64(statement, 1, text.data(), text.size(), SQLITE_STATIC, SQLITE_UTF8);
        Check(sqlite3_step(statement) == SQLITE_DONE, "the document");
        sqlite3_finalize(statement);
        Run("COMMIT");
    }
    std::string Read() {
        sqlite3_stmt *statement = nullptr;
        sqlite3_prepare_v2(db_, "SELECT text FROM document WHERE id = 'one'", -1, &statement, nullptr);
        Check(sqlite3_step(statement) == SQLITE_ROW, "the document's row");
        std::string text(reinterpret_cast<const char *>(sqlite3_column_text(statement, 0)),
                         static_cast<std::size_t>(sqlite3_column_bytes(statement, 0)));
        sqlite3_finalize(statement);
        return text;
    }

  private:
    void Run(const char *sql) { Check(sqlite3_exec(db_, sql, nullptr, nullptr, nullptr) == SQLITE_OK, sql); }
    std::string path_;
    sqlite3 *db_ = nullptr;
};

std::string StoredDocument(const std::string &path) {
    sqlite3 *db = nullptr;
    Check(sqlite3_open(path.c_str(), &db) == SQLITE_OK, "the store");
    sqlite3_stmt *statement = nullptr;
    sqlite3_prepare_v2(db, "SELECT document FROM object", -1, &statement, nullptr);
    Check(sqlite3_step(statement) == SQLITE_ROW, "the stored object");
    std::string text(reinterpret_cast<const char *>(sqlite3_column_text(statement, 0)),
                     static_cast<std::size_t>(sqlite3_column_bytes(statement, 0)));
    sqlite3_finalize(statement);
    sqlite3_close(db);
    return text;
}

void Bench(const PortKind &kind, int ports, int rounds, const std::string &directory) {
    const std::string path = directory + "/store.db";
    setenv("DVS_CONFIGSTORE", path.c_str(), 1);
    std::filesystem::remove_all(directory);
    std::filesystem::create_directories(directory);
    const State states[2] = {BuildState(kind, ports, 0), BuildState(kind, ports, 1)};
    const long before = PeakMegabytes();
    // Alternate two documents, so that each save changes something.
    const auto saveOne = [&](int round) {
        const State &state = states[round % 2];
        Check(DVSState_SaveBufToConfigStore(state.buffer, state.len) == 0, "the save");
    };
    const double first = FastestMs(rounds, saveOne, [&] { RemoveDatabase(path); });
    const double save = FastestMs(rounds, [&](int round) { saveOne(rounds + round); });
    const long peak = PeakMegabytes();
    const double load = FastestMs(rounds, [&](int) {
        void *out = nullptr;
        uint32_t len = 0;
        Check(DVSState_LoadFromConfigStoreAsBuf(&out, &len, false) == 0 && out, "the load");
        std::free(out);
    });
    const std::string document = StoredDocument(path);
    const std::string plainPath = directory + "/plain.db";
    Plain plain(plainPath);
    plain.Store(document);
    // If kept open, SQLite checkpoints its log only once in several commits; average over them.
    constexpr int kInARow = 6;
    const auto storeInARow = [&](int) {
        for (int i = 0; i < kInARow; i++)
            plain.Store(document);
    };
    const double plainStore = FastestMs(rounds, storeInARow) / kInARow;
    const double plainRead = FastestMs(rounds, [&](int) { Check(plain.Read().size() == document.size(), "the read"); });
    plain.Close();
    const auto around = [&](const std::function<void()> &work, const std::function<void()> &prepare = {}) {
        const auto opened = [&](int) {
            plain.Open();
            work();
            plain.Close();
        };
        return FastestMs(rounds, opened, prepare);
    };
    const double openStore = around([&] { plain.Store(document); });
    const double openRead = around([&] { (void)plain.Read(); });
    const double makeStore = around([&] { plain.Store(document); }, [&] { RemoveDatabase(plainPath); });
    const double properties = static_cast<double>(ports) * kSettingsOfAPort;
    const auto row = [&](const char *work, double ours, double sqlite) {
        std::printf("%-46s %9.2f %9.2f %7.2f %9.0f\n", work, ours, sqlite, ours / sqlite, ours * 1e6 / properties);
    };
    std::printf("%d ports x %zu %s settings: a document of %zu bytes, a state of %u\n", ports, kSettingsOfAPort, kind.name,
                document.size(), states[0].len);
    std::printf("peak memory of saving: %ld MB, with the two states; before the first save: %ld MB\n", peak, before);
    std::printf("%-46s %9s %9s %7s %9s\n", "milliseconds", "ours", "SQLite", "ratio", "ns/prop");
    row("first save, SQLite kept open", first, plainStore);
    row("first save, SQLite makes a database too", first, makeStore);
    row("save again (history), SQLite kept open", save, plainStore);
    row("save again (history), SQLite opened each time", save, openStore);
    row("load, SQLite kept open", load, plainRead);
    row("load, SQLite opened each time", load, openRead);
    row("save again and load, SQLite kept open", save + load, plainStore + plainRead);
    row("save again and load, SQLite opened each time", save + load, openStore + openRead);
    for (const State &state : states)
        std::free(state.buffer);
    std::filesystem::remove_all(directory);
}

/// Runs in a separate process, so that no run reuses another's memory. A single run stays in this process,
/// which suits profilers.
void RunApart(bool apart, const std::function<void()> &run) {
    if (!apart) return run();
    const pid_t child = fork();
    Check(child >= 0, "the fork");
    if (child == 0) {
        run();
        std::exit(0);
    }
    int status = 0;
    Check(waitpid(child, &status, 0) == child && status == 0, "one of the runs");
}

} // namespace

int main(int argc, char **argv) {
    std::string ports = "4096,16384";
    std::string directory = std::filesystem::temp_directory_path() / ("store_bench." + std::to_string(getpid()));
    std::string kinds;
    int rounds = 15;
    for (int i = 1; i + 1 < argc; i += 2) {
        if (std::strcmp(argv[i], "--ports") == 0) ports = argv[i + 1];
        if (std::strcmp(argv[i], "--kind") == 0) kinds = argv[i + 1];
        if (std::strcmp(argv[i], "--rounds") == 0) rounds = std::max(1, std::atoi(argv[i + 1]));
        if (std::strcmp(argv[i], "--dir") == 0) directory = std::string(argv[i + 1]) + "/store_bench";
    }
    dvsconfigstore_debug = dvs_debug = dvsdata_debug = -1;
    setenv("DVS_MAX_PORTS", "131072", 0);
    std::vector<std::pair<const PortKind *, int>> runs;
    for (char *at = ports.data(); *at; at += *at == ',') {
        const int count = static_cast<int>(std::strtol(at, &at, 10));
        for (const PortKind &kind : kPortKinds) {
            if (kinds.empty() || kinds == kind.name) runs.emplace_back(&kind, count);
        }
    }
    for (const auto &run : runs)
        RunApart(runs.size() > 1, [&] { Bench(*run.first, run.second, rounds, directory); });
    return 0;
}
