/* SPDX-License-Identifier: Apache-2.0 */
// The line and its thread (progress.h). The library's call blocks, so somebody else has to tell the time.

#include "tools/dvsctl/store/progress.h"

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <thread>

#include <fmt/format.h>

#include "form/text.h"

namespace dvs::ctl {

namespace {

constexpr std::chrono::milliseconds kPatience{400}; // faster work needs no line
constexpr std::chrono::milliseconds kTick{200};

} // namespace

struct Progress::Ticker {
    Output &out;
    std::string text;
    std::mutex mutex;
    std::condition_variable wake;
    bool done = false; // guarded by mutex
    std::thread thread;

    void Run() {
        const auto start = std::chrono::steady_clock::now();
        bool shown = false;
        std::unique_lock lock(mutex);
        for (auto wait = kPatience; !wake.wait_for(lock, wait, [this] { return done; }); wait = kTick) {
            const std::chrono::duration<double> seconds = std::chrono::steady_clock::now() - start;
            out.Diagnose(fmt::format("\r{}: {:.1f} s ", text, seconds.count()));
            shown = true;
        }
        if (shown) out.Diagnose("\r\x1b[K");
    }
};

Progress::Progress(const Context &context, std::string text) {
    if (!context.out.ShowsProgress()) return;
    ticker_ = new Ticker{context.out, Escape(text), {}, {}, false, {}};
    try {
        ticker_->thread = std::thread([ticker = ticker_] { ticker->Run(); });
    } catch (const std::exception &) {
        delete ticker_; // no line, then
        ticker_ = nullptr;
    }
}

Progress::~Progress() {
    if (!ticker_) return;
    {
        const std::lock_guard guard(ticker_->mutex);
        ticker_->done = true;
    }
    ticker_->wake.notify_one();
    ticker_->thread.join();
    delete ticker_;
}

} // namespace dvs::ctl
