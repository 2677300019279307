/* SPDX-License-Identifier: Apache-2.0 */
// A store in memory (backend.h): for planned changes, which are tried on a copy, and for tests. Readers see the
// last committed state, which never changes; a writer works on a copy of its own and replaces it at the end.

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <ctime>
#include <map>
#include <mutex>

#include "platform/embedded/configstore/backend/backend.h"

namespace configstore {

namespace {

struct Present {
    int64_t revision = 0;
    int64_t document = 0;
};

struct Past {
    Address address;
    Present row;
    int64_t ended = 0;
    bool deleted = false;
};

/// Everything that a store holds. Texts are shared between states.
struct State {
    std::map<Address, Present> present;
    std::vector<Past> past;                                    // in the order in which they ended
    std::vector<int64_t> savedMs;                              // of revision n at n - 1
    std::vector<std::shared_ptr<const std::string>> documents; // document n at n - 1
};

int64_t NowMs() {
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    return int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1000000;
}

} // namespace

class MemoryDatabase {
public:
    using StatePtr = std::shared_ptr<const State>;

    [[nodiscard]] StatePtr Committed() {
        const std::lock_guard guard(mutex_);
        return committed_;
    }
    /// Waits until there is no other writer. False once the time is over.
    [[nodiscard]] bool BeginWriting(int milliseconds) {
        std::unique_lock lock(mutex_);
        const auto isFree = [this] { return !isWriting_; };
        if (!writerEnded_.wait_for(lock, std::chrono::milliseconds(milliseconds), isFree)) return false;
        isWriting_ = true;
        return true;
    }
    /// `state` is null when the writer gives nothing back.
    void EndWriting(StatePtr state) {
        {
            const std::lock_guard guard(mutex_);
            if (state) committed_ = std::move(state);
            isWriting_ = false;
        }
        writerEnded_.notify_one();
    }

private:
    std::mutex mutex_; // guards all
    std::condition_variable writerEnded_;
    StatePtr committed_ = std::make_shared<State>();
    bool isWriting_ = false;
};

namespace {

class MemoryBackend final : public Backend {
public:
    MemoryBackend(std::shared_ptr<MemoryDatabase> database, FailureKeeper *failures)
        : database_(std::move(database)), failures_(failures) {}
    ~MemoryBackend() override { (void)Cancel(); }

    [[nodiscard]] bool IsReadOnly() const override { return false; }
    void SetBusyTimeout(int milliseconds) override { busyTimeoutMs_ = milliseconds; }

    int32_t Begin() override {
        if (!database_->BeginWriting(busyTimeoutMs_))
            return failures_->Fail(BUSY, "another writer does not end");
        try {
            working_ = std::make_shared<State>(*database_->Committed());
        } catch (...) {
            database_->EndWriting(nullptr);
            throw;
        }
        revision_ = 0;
        return OK;
    }
    int32_t Commit() override {
        database_->EndWriting(std::move(working_));
        return OK;
    }
    int32_t Cancel() override {
        if (working_) database_->EndWriting(nullptr);
        working_ = nullptr;
        return OK;
    }
    [[nodiscard]] bool InTransaction() const override { return working_ != nullptr; }

    int32_t Visit(const Address &address, Select select, const RowVisitor &visit) override {
        const auto state = Seen();
        const bool all = select == Select::Instances && address.instance.empty();
        for (auto at = state->present.lower_bound(address); at != state->present.end(); ++at) {
            Address bounds = at->first;
            if (all) bounds.instance.clear();
            if (bounds != address) break;
            const int32_t status = visit(RowOf(at->first, at->second), TextOf(*state, at->second.document));
            if (status != OK) return status;
        }
        return OK;
    }
    int32_t Find(const Address &address, std::optional<Row> *row) override {
        const auto state = Seen();
        const auto found = state->present.find(address);
        row->reset();
        if (found != state->present.end()) *row = RowOf(address, found->second);
        return OK;
    }
    int32_t List(std::vector<RowInfo> *rows) override {
        const auto state = Seen();
        for (const auto &[address, present] : state->present)
            rows->push_back(InfoOf(*state, address, present));
        return OK;
    }

    int32_t Put(const Address &address, std::string_view text, int64_t *document) override {
        working_->documents.push_back(std::make_shared<const std::string>(text));
        *document = static_cast<int64_t>(working_->documents.size());
        return PutBack(address, *document);
    }
    int32_t PutBack(const Address &address, int64_t document) override {
        TakeRevision();
        Present &present = working_->present[address];
        End(address, present, false);
        present = {revision_, document};
        return OK;
    }
    int32_t Delete(const Address &address) override {
        const auto found = working_->present.find(address);
        if (found == working_->present.end()) return NOT_FOUND;
        TakeRevision();
        End(address, found->second, true);
        working_->present.erase(found);
        return OK;
    }

    int32_t LatestRevision(int64_t *revision) override {
        *revision = static_cast<int64_t>(Seen()->savedMs.size());
        return OK;
    }
    int32_t FindAsOf(const Address &address, int64_t revision, std::optional<Row> *row) override {
        const auto state = Seen();
        row->reset();
        const auto found = state->present.find(address);
        if (found != state->present.end() && found->second.revision <= revision)
            *row = RowOf(address, found->second);
        for (const Past &past : state->past) {
            if (past.address == address && past.row.revision <= revision && past.ended > revision)
                *row = RowOf(address, past.row);
        }
        return OK;
    }
    int32_t History(std::vector<RowInfo> *rows) override {
        const auto state = Seen();
        for (const Past &past : state->past) {
            RowInfo &info = rows->emplace_back(InfoOf(*state, past.address, past.row));
            info.ended = past.ended;
            info.endedMs = SavedMs(*state, past.ended);
            info.deleted = past.deleted;
        }
        std::sort(rows->begin(), rows->end(), [](const RowInfo &a, const RowInfo &b) {
            return a.ended != b.ended ? a.ended > b.ended : a.address < b.address;
        });
        return OK;
    }
    int32_t ReadDocument(int64_t document, std::string *text) override {
        *text = TextOf(*Seen(), document);
        return OK;
    }

    int32_t VisitEverything(const RowVisitor &visit) override {
        const auto state = Seen();
        for (const auto &[address, present] : state->present) {
            const int32_t status = visit(RowOf(address, present), TextOf(*state, present.document));
            if (status != OK) return status;
        }
        for (const Past &past : state->past) {
            const int32_t status = visit(RowOf(past.address, past.row), TextOf(*state, past.row.document));
            if (status != OK) return status;
        }
        return OK;
    }
    int32_t CheckStorage(std::vector<std::string> *) override { return OK; }
    int32_t Backup(const std::string &) override {
        return failures_->Fail(FAILED, "a store in memory has no backup");
    }

private:
    [[nodiscard]] MemoryDatabase::StatePtr Seen() const {
        return working_ ? MemoryDatabase::StatePtr(working_) : database_->Committed();
    }
    static Row RowOf(const Address &address, const Present &present) {
        return {address, present.revision, present.document};
    }
    static std::string_view TextOf(const State &state, int64_t document) {
        return *state.documents[static_cast<std::size_t>(document - 1)];
    }
    static int64_t SavedMs(const State &state, int64_t revision) {
        return state.savedMs[static_cast<std::size_t>(revision - 1)];
    }
    static RowInfo InfoOf(const State &state, const Address &address, const Present &present) {
        return {RowOf(address, present), SavedMs(state, present.revision),
                TextOf(state, present.document).size()};
    }
    void TakeRevision() {
        if (revision_ != 0) return;
        working_->savedMs.push_back(NowMs());
        revision_ = static_cast<int64_t>(working_->savedMs.size());
    }
    /// A document that came in this very transaction was never to be seen and leaves nothing behind.
    void End(const Address &address, const Present &present, bool deleted) {
        if (present.revision != 0 && present.revision != revision_)
            working_->past.push_back({address, present, revision_, deleted});
    }

    std::shared_ptr<MemoryDatabase> database_;
    FailureKeeper *failures_;
    std::shared_ptr<State> working_; // of the open transaction
    int64_t revision_ = 0;           // of the open transaction, from its first change on
    int busyTimeoutMs_ = kBusyTimeoutMs;
};

} // namespace

std::shared_ptr<MemoryDatabase> NewMemoryDatabase() {
    return std::make_shared<MemoryDatabase>();
}

std::unique_ptr<Backend> OpenMemory(std::shared_ptr<MemoryDatabase> database, FailureKeeper *failures) {
    return std::make_unique<MemoryBackend>(std::move(database), failures);
}

} // namespace configstore
