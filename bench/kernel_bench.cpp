/* SPDX-License-Identifier: Apache-2.0 */
// The kernel interface with an emulator: round trips against a bare socket pair that carries the same bytes,
// and the retrieval of the persistent state against loading and serializing that state. Nanoseconds of real
// time, because half of the work is another process's.

#include <benchmark/benchmark.h>

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include "bench/ratio.h"
#include "dvs/dvs.h"
#include "emulator/emulator_process.h"
#include "emulator/hyp_support.h"
#include "platform/embedded/emulator_wire.h"

namespace {

using dvs::test::Fetch;

const ratio::Goal kGoals[] = {
    {"call", 1.5},
    {"fetch/1MB", 1.5},
    {"persistent/4096", 3.0},
    {"persistent/16384", 3.0},
};

constexpr std::size_t kValueSize = 1 << 20;
constexpr std::size_t kRequestSize = sizeof(dvs::wire::RequestHeader) + dvs::wire::kRecordSize;
constexpr std::size_t kReplySize = sizeof(dvs::wire::ReplyHeader);
constexpr const char *kSwitch = "bench";

void SendAll(int fd, const char *data, std::size_t size) {
    while (size > 0) {
        const ssize_t sent = send(fd, data, size, MSG_NOSIGNAL);
        if (sent <= 0) _exit(0);
        data += sent;
        size -= static_cast<std::size_t>(sent);
    }
}

void ReceiveAll(int fd, char *data, std::size_t size) {
    while (size > 0) {
        const ssize_t got = recv(fd, data, size, 0);
        if (got <= 0) _exit(0);
        data += got;
        size -= static_cast<std::size_t>(got);
    }
}

/// A child that replies to requests of one size with replies of the given sizes, in turn.
class Echo {
public:
    explicit Echo(std::vector<std::size_t> replies) {
        int fds[2];
        if (socketpair(AF_UNIX, SOCK_STREAM, 0, fds) != 0) std::abort();
        child_ = fork();
        if (child_ == 0) {
            close(fds[0]);
            std::vector<char> buffer(kReplySize + kValueSize);
            for (std::size_t turn = 0;; turn++) {
                ReceiveAll(fds[1], buffer.data(), kRequestSize);
                SendAll(fds[1], buffer.data(), replies[turn % replies.size()]);
            }
        }
        close(fds[1]);
        fd_ = fds[0];
    }
    ~Echo() {
        close(fd_);
        waitpid(child_, nullptr, 0);
    }
    void Exchange(char *buffer, std::size_t replySize) const {
        SendAll(fd_, buffer, kRequestSize);
        ReceiveAll(fd_, buffer, replySize);
    }

private:
    pid_t child_ = -1;
    int fd_ = -1;
};

void Call(benchmark::State &state) {
    for (auto _ : state) {
        if (DVSHYP_PortFind(kSwitch, "p") != HYP_OK) state.SkipWithError("the call failed");
    }
}
BENCHMARK(Call)->Name("call/dvs")->UseRealTime();

void CallFloor(benchmark::State &state) {
    const Echo echo({kReplySize});
    std::vector<char> buffer(kRequestSize);
    for (auto _ : state)
        echo.Exchange(buffer.data(), kReplySize);
}
BENCHMARK(CallFloor)->Name("call/floor")->UseRealTime();

void FetchValue(benchmark::State &state) {
    for (auto _ : state) {
        void *out = nullptr;
        uint32_t size = 0;
        if (DVSHYP_GlobalPropGet(kSwitch, "large", &out, &size) != HYP_OK)
            state.SkipWithError("the fetch failed");
        DVSHYP_DataFree(out);
    }
}
BENCHMARK(FetchValue)->Name("fetch/1MB/dvs")->UseRealTime();

void FetchFloor(benchmark::State &state) {
    const Echo echo({kReplySize, kReplySize + kValueSize});
    std::vector<char> buffer(kReplySize + kValueSize);
    for (auto _ : state) {
        echo.Exchange(buffer.data(), kReplySize);
        echo.Exchange(buffer.data(), kReplySize + kValueSize);
    }
}
BENCHMARK(FetchFloor)->Name("fetch/1MB/floor")->UseRealTime();

/// One switch with `ports` ports of twelve values each.
std::string MakeState(int ports) {
    const std::string value(150, 'v');
    dvs::test::Pairs pairs;
    for (int i = 0; i < 12; i++)
        pairs.emplace_back("com.orbeno.bench.port.value." + std::to_string(i), value);
    const std::string data = dvs::test::PortData(pairs);
    if (DVSState_SwitchAdd(kSwitch, "vswitch", 0, 12) != HYP_OK) std::abort();
    DVSwitch *sw = DVSState_SwitchFind(kSwitch);
    for (int i = 0; i < ports; i++) {
        const std::string id = "port-" + std::to_string(i);
        if (DVSState_PortAddDeserialize(sw, id.c_str(), data.data(), static_cast<uint32_t>(data.size())) !=
            HYP_OK)
            std::abort();
    }
    void *out = nullptr;
    uint32_t size = 0;
    if (DVSState_ConfigSerialize(&out, &size) != HYP_OK || DVSState_ConfigReset() != HYP_OK) std::abort();
    std::string bytes(static_cast<const char *>(out), size);
    std::free(out);
    return bytes;
}

void Persistent(benchmark::State &state, int ports) {
    const std::string bytes = MakeState(ports);
    if (DVSHYP_StateInit(bytes.data(), static_cast<uint32_t>(bytes.size())) != HYP_OK)
        state.SkipWithError("the state was refused");
    for (auto _ : state) {
        void *out = nullptr;
        uint32_t size = 0;
        if (DVSHYP_PersistentStateGet(&out, &size) != HYP_OK || size != bytes.size())
            state.SkipWithError("the retrieval failed");
        DVSHYP_DataFree(out);
    }
}

void PersistentFloor(benchmark::State &state, int ports) {
    const std::string bytes = MakeState(ports);
    for (auto _ : state) {
        void *out = nullptr;
        uint32_t size = 0;
        if (DVSState_ConfigDeserialize(bytes.data(), static_cast<uint32_t>(bytes.size())) != HYP_OK ||
            DVSState_ConfigSerialize(&out, &size) != HYP_OK || DVSState_ConfigReset() != HYP_OK)
            state.SkipWithError("the state did not pass");
        std::free(out);
    }
}
BENCHMARK_CAPTURE(Persistent, 4096, 4096)->Name("persistent/4096/dvs")->UseRealTime();
BENCHMARK_CAPTURE(PersistentFloor, 4096, 4096)->Name("persistent/4096/floor")->UseRealTime();
BENCHMARK_CAPTURE(Persistent, 16384, 16384)->Name("persistent/16384/dvs")->UseRealTime();
BENCHMARK_CAPTURE(PersistentFloor, 16384, 16384)->Name("persistent/16384/floor")->UseRealTime();

} // namespace

int main(int argc, char **argv) {
    const dvs::test::LiveEmulator emulator;
    const std::string value(kValueSize, 'v');
    const std::string port = dvs::test::PortData({});
    if (DVSHYP_SwitchAdd(kSwitch, "vswitch", 0, 12) != HYP_OK ||
        DVSHYP_PortAdd(kSwitch, "p", port.data(), static_cast<uint32_t>(port.size())) != HYP_OK ||
        DVSHYP_GlobalPropSet(kSwitch, "large", value.data(), kValueSize, 16) != HYP_OK)
        return 1;
    return ratio::Main(argc, argv, kGoals);
}
