/* SPDX-License-Identifier: Apache-2.0 */
// store: and store-desired: the host's configuration store. Reading is the library's load, writing its
// checked save, so that a copy is what an agent's save or load would be.

#include <cstdlib>
#include <malloc.h>
#include <memory>

#include <fmt/format.h>

#include "configstore/load.h"
#include "configstore/save.h"
#include "dvs/status.h"
#include "form/encode.h"
#include "form/model.h"
#include "platform/status_text.h"
#include "tools/dvsctl/sources/files.h"
#include "tools/dvsctl/sources/schemes.h"
#include "tools/dvsctl/store/access.h"
#include "tools/dvsctl/store/progress.h"
#include "tools/dvsctl/store/scratch.h"
#include "tools/dvsctl/verbs/show.h"
#include "tools/dvsctl/verbs/version_warning.h"

namespace dvs::ctl {

namespace {

// Statuses of the library itself begin here; smaller ones are the store's.
constexpr std::int32_t kFirstLibraryStatus = HYP_FAILURE;

struct FreeBuffer {
    void operator()(void *buffer) const { std::free(buffer); }
};

// A state as the library hands it out.
struct LibraryBuffer {
    std::unique_ptr<void, FreeBuffer> buffer;
    std::uint32_t length = 0;

    std::vector<std::uint8_t> Copy() const {
        const auto *bytes = static_cast<const std::uint8_t *>(buffer.get());
        return {bytes, bytes + length};
    }
};

// Looking at a state and saving it take its size and more in many small blocks each. What their ends leave of
// them in the heap would add to what the next step takes.
void GiveBackFreedMemory() {
#ifdef __GLIBC__
    (void)malloc_trim(0);
#endif
}

std::size_t CountLayer(const OpenStore &store, admin::Layer layer) {
    std::size_t count = 0;
    for (const admin::Entry &entry : store.List())
        count += entry.address.layer == layer;
    return count;
}

class StoreSource : public Source {
public:
    StoreSource(const char *scheme, std::string path, bool desired)
        : Source(std::string(scheme) + path), path_(std::move(path)), desired_(desired) {}

    bool CountsWhenEmpty() const override { return false; }
    bool ReplacesSingle() const override { return true; }
    bool KeepsPersistentState() const override { return true; }

    std::optional<StateBytes> Read(Context &context, ReadMode mode) override {
        if (!FileExists(path_)) return std::nullopt;
        const OpenStore store(context, path_, true); // tells what is wrong with it, and changes nothing
        if (desired_) RefuseUnequalLayers(store);
        try {
            return StateBytes{Load(context, store.get()).Copy(), {}};
        } catch (Error &error) {
            // For looks at what would be replaced, switches that do not load are damage like any other.
            if (mode == ReadMode::Tolerant && error.kind == ErrorKind::Store) error.isDamage = true;
            throw;
        }
    }

    void Write(Context &context, Bytes state) override {
        RefuseDesired();
        const OpenStore store(context, path_, false);
        store.AwaitTurn(context, "cannot save to the config store");
        const Progress progress(context, "saving " + ShowCount(CountState(ParseState(state))));
        GiveBackFreedMemory();
        Save(context, store.get(), state);
        (void)LoadSaved(context, store.get(), state);
    }

    std::vector<std::uint8_t> Plan(Context &context, Bytes state) override {
        RefuseDesired();
        const ScratchStore scratch(context, path_);
        Save(context, scratch.get(), state);
        if (const auto loaded = LoadSaved(context, scratch.get(), state)) return loaded->Copy();
        return {state.begin(), state.end()}; // what it would hold, although nobody could read it
    }

    void CheckPlace(Context &context) override {
        if (!FileExists(path_)) return;
        const OpenStore store(context, path_, true);
        std::vector<admin::Problem> problems;
        store.Require(admin::Check(store.get(), &problems), "cannot check the config store");
        if (problems.empty()) return;
        Error error(ErrorKind::Store, "the config store is damaged");
        error.source = Name();
        error.why = problems.front().where + ": " + problems.front().what;
        if (problems.size() > 1)
            error.why += fmt::format(" (and {})", Count(problems.size() - 1, "more problem"));
        error.next = "dvsctl store check lists everything; dvsctl store restore brings back past documents";
        throw Error(error);
    }

    ErrorKind AbsentKind() const override { return ErrorKind::Store; }
    std::string WhyAbsent() const override { return "there is no database file"; }

private:
    void RefuseDesired() const {
        if (desired_)
            throw Error(ErrorKind::Usage, "store-desired: can only be read")
                .In(Name())
                .Because("saves write the current configuration; the desired one is its users' own")
                .Try("dvsctl store import --layer desired FILE puts a document there");
    }

    void RefuseUnequalLayers(const OpenStore &store) const {
        const std::size_t desired = CountLayer(store, admin::Layer::Desired);
        const std::size_t current = CountLayer(store, admin::Layer::Current);
        if (desired != current)
            throw Error(ErrorKind::Store, "cannot load the desired switches")
                .In(Name())
                .Because(fmt::format("the desired layer has {}, the current one {}: a load matches them by "
                                     "position and wants as many of both",
                                     Count(desired, "object"), Count(current, "object")))
                .Try("dvsctl store list shows both layers");
    }

    // The state that has just been saved, as the store gives it back. A save takes states that no load does:
    // then nothing, and a warning.
    std::optional<LibraryBuffer> LoadSaved(Context &context, configstore::Store *store, Bytes state) {
        GiveBackFreedMemory();
        try {
            return Load(context, store);
        } catch (const Error &error) {
            if (error.kind != ErrorKind::Busy) context.out.Warn(UnloadableWarning(ParseState(state), error));
            return std::nullopt;
        }
    }

    LibraryBuffer Load(Context &context, configstore::Store *store) {
        (void)context.log.Take(); // earlier messages have been reported
        void *out = nullptr;
        std::uint32_t length = 0;
        const std::int32_t status = config::LoadState(store, desired_, &out, &length);
        LibraryBuffer loaded{std::unique_ptr<void, FreeBuffer>(out), length};
        if (status == 0 && out) return loaded;
        Error error = Failure(context, store, status, "cannot load the switches of the config store");
        if (status == 0) error.why = "the load ended at a switch that it could not load, and gave nothing";
        if (error.kind == ErrorKind::Malformed || error.kind == ErrorKind::NotThere ||
            error.kind == ErrorKind::Failed)
            error.kind = ErrorKind::Store; // what is wrong here lies in the store
        error.next = "dvsctl store check looks for damage; dvsctl store export shows a switch's document";
        throw Error(error);
    }

    void Save(Context &context, configstore::Store *store, Bytes state) const {
        // The state was narrowed to the one switch then.
        std::optional<std::string> single;
        if (context.options.switchId) single = std::string(ParseState(state).switches.at(0).name);
        (void)context.log.Take();
        const std::int32_t status =
            config::SaveStateChecked(store, state.data(), static_cast<std::uint32_t>(state.size()),
                                     single ? single->c_str() : nullptr);
        if (status != 0) throw Error(Failure(context, store, status, "the config store refuses the state"));
    }

    Error Failure(Context &context, const configstore::Store *store, std::int32_t status,
                  std::string title) const {
        Error error = StoreError(status, std::move(title), path_, admin::LastFailure(store));
        error.source = Name();
        if (status < 0) {
            error.kind = ErrorKind::Malformed;
            error.why = "a value is not one that the config store can express";
        } else if (status >= kFirstLibraryStatus) {
            const auto library = static_cast<HYP_ReturnStatus>(status);
            error.kind = library == HYP_LIMIT_EXCEEDED || library == HYP_NO_MEMORY ? ErrorKind::Failed
                                                                                   : ErrorKind::Malformed;
            error.why = HYP_ReturnStatusToString(library);
        }
        for (std::string &message : context.log.TakeErrors())
            error.messages.push_back(std::move(message));
        return error;
    }

    std::string path_;
    bool desired_;
};

} // namespace

std::unique_ptr<Source> OpenStoreSource(std::string_view path) {
    return std::make_unique<StoreSource>("store:", StorePathOf(path), false);
}

std::unique_ptr<Source> OpenStoreDesiredSource(std::string_view path) {
    return std::make_unique<StoreSource>("store-desired:", StorePathOf(path), true);
}

} // namespace dvs::ctl
