/* SPDX-License-Identifier: Apache-2.0 */
// A hostile module: every verb about the module gets invalid replies and must fail quickly, with a documented
// status and only an error message.

#include <algorithm>
#include <cerrno>
#include <thread>

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include "dvs/status.h"
#include "kernel_fixture.h"
#include "platform/embedded/emulator_wire.h"

namespace {

using namespace dvs::ctl::test;
using Words = std::vector<std::string>;

// A module that sends the same bytes on each connection, regardless of the request.
class Liar {
public:
    Liar(const std::string &path, std::string reply) : reply_(std::move(reply)) {
        listener_ = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        path.copy(address.sun_path, sizeof address.sun_path - 1);
        EXPECT_EQ(bind(listener_, reinterpret_cast<sockaddr *>(&address), sizeof address), 0);
        EXPECT_EQ(listen(listener_, 8), 0);
        thread_ = std::thread([this] { Serve(); });
    }
    ~Liar() {
        shutdown(listener_, SHUT_RDWR);
        thread_.join();
        close(listener_);
    }
    Liar(const Liar &) = delete;
    Liar &operator=(const Liar &) = delete;

private:
    void Serve() {
        for (int peer; (peer = accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC)) >= 0; close(peer)) {
            char request[4096];
            if (recv(peer, request, sizeof request, 0) > 0)
                (void)send(peer, reply_.data(), reply_.size(), MSG_NOSIGNAL);
        }
    }

    std::string reply_;
    int listener_ = -1;
    std::thread thread_;
};

constexpr std::uint32_t kSame = 0xfffffffe; ///< replaced by the payload's size

/// A reply whose header fields can differ from the data that follows.
struct Reply {
    std::string payload = {};
    std::uint32_t claimed = kSame;
    int error = 0;
    std::uint32_t status = 0;
    std::uint32_t announced = kSame;

    std::string Bytes() const {
        const auto size = static_cast<std::uint32_t>(payload.size());
        dvs::wire::ReplyHeader header{};
        header.magic = dvs::wire::kMagic;
        header.version = dvs::wire::kVersion;
        header.error = error;
        header.status = status;
        header.dataLen = header.cmdOutLen = claimed == kSame ? size : claimed;
        header.payloadSize = announced == kSame ? size : announced;
        return std::string(reinterpret_cast<const char *>(&header), sizeof header) + payload;
    }
};

struct Lie {
    const char *name;
    std::string bytes;
};

std::string Good() {
    return std::string(dvs::form::AsText(SmallState()));
}

std::string Flipped() {
    std::string state = Good();
    state[state.size() / 2] = static_cast<char>(state[state.size() / 2] ^ 0x40);
    return state;
}

std::string LongerThanItIs() {
    std::string state = Good();
    state[0] = static_cast<char>(state[0] + 4);
    return state;
}

std::string WithoutNul() {
    Buffer state = SmallState();
    std::fill_n(state.begin() + 16, 128, std::uint8_t{'n'}); // the whole id field of the first switch
    Mend(state);
    return std::string(dvs::form::AsText(state));
}

std::string WrongIds() {
    return std::string(dvs::form::AsText(dvs::form::EncodeList(
        std::vector<dvs::form::NewEntry>{MakeSwitch("other", {}, {}, {MakeList("", {})})})));
}

std::string WithMagic(std::string reply) {
    reply[0] = static_cast<char>(reply[0] + 1);
    return reply;
}

std::vector<Lie> Lies() {
    return {
        {"hangs up", {}},
        {"one byte of a header", "x"},
        {"half a header", Reply{}.Bytes().substr(0, 12)},
        {"no header", std::string(4096, '\xff')},
        {"another magic", WithMagic(Reply{}.Bytes())},
        {"nothing", Reply{}.Bytes()},
        {"one byte", Reply{.payload = "x"}.Bytes()},
        {"fifteen bytes", Reply{.payload = std::string(15, 'x')}.Bytes()},
        {"claims more than it sends", Reply{.payload = "short", .claimed = 100}.Bytes()},
        {"claims all there is", Reply{.payload = "x", .claimed = 0xffffffff}.Bytes()},
        {"claims less than it sends", Reply{.payload = Good(), .claimed = 20}.Bytes()},
        {"announces more than it sends", Reply{.payload = "x", .announced = 1000}.Bytes()},
        {"announces all there is", Reply{.payload = "x", .announced = 0xffffffff}.Bytes()},
        {"unchanged with limit exceeded",
         Reply{.claimed = 32768, .error = ENOSPC, .status = HYP_LIMIT_EXCEEDED}.Bytes()},
        {"shrinks with limit exceeded",
         Reply{.claimed = 3, .error = ENOSPC, .status = HYP_LIMIT_EXCEEDED}.Bytes()},
        {"grows beyond what is allowed",
         Reply{.claimed = 0x7fffffff, .error = ENOSPC, .status = HYP_LIMIT_EXCEEDED}.Bytes()},
        {"fails with success", Reply{.claimed = 8, .error = EIO}.Bytes()},
        {"a status nobody knows", Reply{.error = EIO, .status = 0xdeadbeef}.Bytes()},
        {"an error nobody knows", Reply{.error = 100000, .status = HYP_BAD_PARAM}.Bytes()},
        {"no list", Reply{.payload = std::string(64, '\xff')}.Bytes()},
        {"a list with a wrong sum",
         Reply{.payload = std::string("\x10\0\0\0\1\2\3\4\1\0\0\0\0\0\0\0", 16)}.Bytes()},
        {"one bit off", Reply{.payload = Flipped()}.Bytes()},
        {"longer than it is", Reply{.payload = LongerThanItIs()}.Bytes()},
        {"zeroes", Reply{.payload = std::string(4096, '\0')}.Bytes()},
        // Valid bytes, but not the requested data.
        {"wrong ids", Reply{.payload = WrongIds()}.Bytes()},
        {"no NUL", Reply{.payload = WithoutNul()}.Bytes()},
        {"a state whatever is asked", Reply{.payload = Good()}.Bytes()},
    };
}

/// A verb, and whether it must trust a reply because only the module has the data.
struct Verb {
    Words words;
    bool believes = false;
};

const Verb kReaders[] = {
    {{"show", "kernel:"}},
    {{"verify", "kernel:"}},
    {{"show", "kernel:", "--persistent"}},
    {{"copy", "kernel:", "json:-"}},
    {{"kernel", "prop", "get", "a", "x"}, true},
    {{"kernel", "prop", "get", "a", "x", "--host"}, true},
    {{"kernel", "prop", "get", "a", "x", "--port", "1"}, true},
    {{"kernel", "prop", "get", "a", "x", "--smartnic"}, true},
    {{"kernel", "port", "state", "a", "1"}},
    {{"kernel", "port", "state", "a", "1", "--persistent"}},
    {{"kernel", "uplink", "get", "a", "1", "0"}, true},
    {{"kernel", "ports", "a"}},
    {{"kernel", "vendor-props", "a"}},
    {{"kernel", "vendor-props", "a", "--port", "1"}},
    {{"kernel", "extra-props", "a"}},
    {{"kernel", "overlay-props", "a"}},
    {{"kernel", "find-external-id", "a", "id"}},
    {{"kernel", "exec", "a", "text"}, true},
};
const Verb kChanges[] = {
    {{"kernel", "switch", "add", "a", "--class", "c", "--max-ports", "5", "--switch-version", "8"}, true},
    {{"kernel", "switch", "remove", "a"}, true},
    {{"kernel", "switch", "associate", "a"}, true},
    {{"kernel", "switch", "dissociate", "a"}, true},
    {{"kernel", "switch", "set-version", "a", "8"}, true},
    {{"kernel", "switch", "set-max-ports", "a", "8"}, true},
    {{"kernel", "prop", "set", "a", "x", "text"}, true},
    {{"kernel", "prop", "clear", "a", "x"}, true},
    {{"kernel", "port", "add", "a", "1"}, true},
    {{"kernel", "port", "remove", "a", "1"}, true},
    {{"kernel", "port", "find", "a", "1"}, true},
    {{"kernel", "uplink", "set", "a", "1", "0", "text"}, true},
    {{"kernel", "state", "sanitize"}, true},
    {{"kernel", "state", "cleanup"}, true},
    {{"kernel", "state", "cleanup", "--dry-run"}},
};

class LyingModule : public ProgramTest {
protected:
    // Each verb gets every `stride`-th lie, with a different offset than its neighbour. Every verb and every
    // lie is tried.
    template <std::size_t N> void TellAll(const Verb (&verbs)[N], std::size_t stride) {
        const std::vector<Lie> lies = Lies();
        ASSERT_GE(lies.size(), 20U);
        for (std::size_t i = 0; i < lies.size(); ++i) {
            const std::string path = At("liar" + std::to_string(i));
            const Liar liar(path, lies[i].bytes);
            for (std::size_t j = i % stride; j < N; j += stride)
                Try(verbs[j], lies[i], path);
        }
    }

private:
    void Try(const Verb &verb, const Lie &lie, const std::string &path) {
        const Result result =
            RunProgram({.args = verb.words, .environment = {"DVS_EMULATOR=" + path, "DVS_MAX_PORTS=100"}});
        const auto about = [&] {
            return testing::PrintToString(verb.words) + ": " + lie.name + ": " + result.err;
        };
        if (verb.believes && result.status == 0) return;
        // A valid state is accepted, even another switch's.
        const bool isSound = std::string(lie.name) == "wrong ids" || std::string(lie.name) == "no NUL" ||
                             std::string(lie.name) == "a state whatever is asked";
        if (isSound && result.status == 0) return;
        EXPECT_TRUE(result.status == 1 || result.status == 4 || result.status == 6)
            << result.status << ' ' << about();
        EXPECT_NE(result.err + result.out, "") << about();
    }
};

TEST_F(LyingModule, ReadersFailForEveryKindOfLie) {
    TellAll(kReaders, 5);
}

TEST_F(LyingModule, ChangesFailOrTrustTheReply) {
    TellAll(kChanges, 7);
}

} // namespace
