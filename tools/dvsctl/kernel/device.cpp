/* SPDX-License-Identifier: Apache-2.0 */
// The child process of a device call, and what refusals mean to people. Leans on the platform's device only
// to ask whether there is one.

#include "tools/dvsctl/kernel/device.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <string_view>

#include <fmt/format.h>
#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include "dvs/hyp.h"
#include "platform/status_text.h"

namespace dvs::ctl {

namespace {

/// What the child sends before the messages (each with its NUL) and the reply, which ends with the pipe.
struct Head {
    HYP_ReturnStatus status;
    hyp::Failure failure;
    std::uint32_t numMessages;
    std::uint64_t messagesSize;
};

void SendAll(int fd, const void *bytes, std::size_t size) {
    const auto *at = static_cast<const char *>(bytes);
    while (size > 0) {
        const ssize_t sent = write(fd, at, size);
        if (sent < 0 && errno == EINTR) continue;
        if (sent <= 0) _exit(EXIT_FAILURE); // nobody reads any more
        at += sent;
        size -= static_cast<std::size_t>(sent);
    }
}

[[noreturn]] void RunChild(Context &context, const DeviceCall &call, int fd, pid_t parent) {
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (getppid() != parent) _exit(EXIT_FAILURE);
    std::vector<std::uint8_t> reply;
    Head head{};
    try {
        (void)context.log.Take(); // the parent has these
        const hyp::FailureObserver observer;
        head.status = call(reply);
        head.failure = observer.Last();
        std::string messages;
        for (const std::string &message : context.log.Take()) {
            messages += message.substr(0, message.find('\0')) + '\0';
            ++head.numMessages;
        }
        head.messagesSize = messages.size();
        SendAll(fd, &head, sizeof head);
        SendAll(fd, messages.data(), messages.size());
        SendAll(fd, reply.data(), reply.size());
    } catch (const std::exception &) {
        head = {HYP_NO_MEMORY, {}, 0, 0};
        SendAll(fd, &head, sizeof head);
    }
    _exit(EXIT_SUCCESS);
}

/// A child and the reading end of its pipe; ended and closed at the latest with this.
class Child {
public:
    Child(Context &context, const DeviceCall &call) {
        int ends[2];
        if (pipe2(ends, O_CLOEXEC) != 0) Fail(errno);
        const pid_t parent = getpid();
        pid_ = fork();
        if (pid_ == 0) {
            close(ends[0]);
            RunChild(context, call, ends[1], parent);
        }
        const int error = errno;
        close(ends[1]);
        fd_ = ends[0];
        if (pid_ < 0) {
            close(fd_);
            Fail(error);
        }
    }
    ~Child() {
        close(fd_);
        if (pid_ <= 0) return;
        // Not waited for: a child that hangs inside a driver does not even end by this.
        kill(pid_, SIGKILL);
        (void)waitpid(pid_, nullptr, WNOHANG);
    }
    Child(const Child &) = delete;
    Child &operator=(const Child &) = delete;

    /// All that the child sends. False when the deadline came first.
    bool ReadAll(const Deadline &deadline, std::vector<std::uint8_t> &bytes) {
        constexpr std::size_t kPiece = 64 * 1024;
        for (;;) {
            pollfd poller{fd_, POLLIN, 0};
            const int ready = poll(&poller, 1, deadline.MillisecondsLeft());
            if (ready < 0 && errno != EINTR) Fail(errno);
            if (ready == 0 && deadline.IsOver()) return false;
            if (ready <= 0) continue;
            const std::size_t had = bytes.size();
            bytes.resize(had + kPiece);
            const ssize_t got = read(fd_, bytes.data() + had, kPiece);
            bytes.resize(had + (got > 0 ? static_cast<std::size_t>(got) : 0));
            if (got == 0) return true;
            if (got < 0 && errno != EINTR) Fail(errno);
        }
    }

    /// The wait status; once.
    int Wait() {
        int status = 0;
        while (waitpid(pid_, &status, 0) < 0 && errno == EINTR) {
        }
        pid_ = -1;
        return status;
    }

private:
    [[noreturn]] static void Fail(int error) {
        throw Error(ErrorKind::Failed, "cannot call the switching module").Because(std::strerror(error));
    }

    pid_t pid_ = -1;
    int fd_ = -1;
};

[[noreturn]] void ThrowTimeout() {
    throw Error(ErrorKind::Timeout, "the switching module did not answer in time")
        .In("kernel:")
        .Because("what was asked for may still be carried out")
        .Try("look whether the module is alive (dvsctl kernel exec '' help), or wait longer: --timeout "
             "SECONDS");
}

[[noreturn]] void ThrowEnded(int status) {
    throw Error(ErrorKind::Failed, "the call to the switching module ended unexpectedly")
        .Because(WIFSIGNALED(status) ? fmt::format("its process ended by signal {}", WTERMSIG(status))
                                     : fmt::format("its process ended with status {}", WEXITSTATUS(status)))
        .Try("what was asked for may have been carried out: look before repeating it");
}

Answer Unpack(Bytes bytes, int status) {
    Head head;
    if (bytes.size() < sizeof head || !WIFEXITED(status) || WEXITSTATUS(status) != EXIT_SUCCESS)
        ThrowEnded(status);
    std::memcpy(&head, bytes.data(), sizeof head);
    bytes = bytes.subspan(sizeof head);
    std::string_view texts = AsText(bytes).substr(0, head.messagesSize);
    bytes = bytes.subspan(texts.size());
    Answer answer;
    answer.status = head.status;
    answer.failure = head.failure;
    for (; head.numMessages > 0; --head.numMessages) {
        const std::size_t end = std::min(texts.find('\0'), texts.size());
        answer.messages.emplace_back(texts.substr(0, end));
        texts.remove_prefix(std::min(end + 1, texts.size()));
    }
    answer.bytes.assign(bytes.begin(), bytes.end());
    return answer;
}

Error AbsentDeviceError(const Answer &answer, std::string title) {
    Error error(ErrorKind::NoDevice, std::move(title));
    error.source = "kernel:";
    error.messages = answer.messages;
    const char *emulator = secure_getenv("DVS_EMULATOR");
    if (emulator && *emulator) {
        error.why = fmt::format(
            "the switching module's device is not there, and no emulator answers at {} (DVS_EMULATOR)",
            emulator);
        error.next = fmt::format("start one, dvs-emulator --socket {}, or correct DVS_EMULATOR", emulator);
    } else {
        error.why = "the switching module's device is not there, or this user may not open it";
        error.next = "run on a host that has the module, as root; or try it without: "
                     "dvs-emulator run -- dvsctl ..., or set DVS_EMULATOR to the socket of a dvs-emulator";
    }
    return error;
}

struct Refusal {
    HYP_ReturnStatus status;
    ErrorKind kind;
    const char *why;
    const char *next;
};

// Statuses and what they mean here.
constexpr Refusal kRefusals[] = {
    {HYP_NOT_FOUND, ErrorKind::NotThere, "the module does not have it",
     "dvsctl show kernel: lists what there is"},
    {HYP_EXISTS, ErrorKind::Failed, "the module has it already", "with --may-exist that is no error"},
    {HYP_LIMIT_EXCEEDED, ErrorKind::Failed, "it is beyond a limit of the module or of the switch",
     "dvsctl show kernel: shows the ports in use and max_ports"},
    {HYP_BAD_PARAM, ErrorKind::Failed, "the module finds something wrong with what it was given",
     "check names, numbers and the value"},
    {HYP_NO_MEMORY, ErrorKind::Failed, "there is not enough memory", "free memory and repeat"},
    {HYP_NOT_SUPPORTED, ErrorKind::Failed, "the module does not know this command or this switch version",
     "use a version from 4 to 12, 100, or from 107 to 112"},
    {HYP_BAD_CHECKSUM, ErrorKind::Malformed, "a checksum does not match",
     "repeat; the module's state is damaged"},
};

} // namespace

Fetched::~Fetched() {
    DVSHYP_DataFree(start_);
}

Answer CallDevice(Context &context, const DeviceCall &call) {
    std::vector<std::uint8_t> bytes;
    Child child(context, call);
    if (!child.ReadAll(context.deadline, bytes)) ThrowTimeout();
    return Unpack(bytes, child.Wait());
}

Answer FetchFromDevice(Context &context, const FetchCall &call) {
    return CallDevice(context, [&](std::vector<std::uint8_t> &reply) {
        Fetched fetched;
        const HYP_ReturnStatus status = call(fetched.Out(), fetched.Size());
        if (status == HYP_OK) reply.assign(fetched.View().begin(), fetched.View().end());
        return status;
    });
}

Error DeviceError(const Answer &answer, std::string title) {
    if (answer.IsDeviceAbsent()) return AbsentDeviceError(answer, std::move(title));
    Error error(ErrorKind::Failed, std::move(title));
    error.source = "kernel:";
    error.messages = answer.messages;
    // The module's own errno explains more than the status does; EBUSY is a kind of its own.
    if (answer.failure.step == hyp::Step::Send && answer.failure.error == EBUSY) {
        error.kind = ErrorKind::Busy;
        error.why = "the module is busy";
        error.next = "repeat later";
        return error;
    }
    for (const Refusal &refusal : kRefusals) {
        if (refusal.status != answer.status) continue;
        error.kind = refusal.kind;
        error.why = fmt::format("{} ({})", refusal.why, HYP_ReturnStatusToString(answer.status));
        error.next = refusal.next;
        return error;
    }
    error.why = answer.status == HYP_FAILURE
                    ? "the call failed on its way, or the module gave no reason or a reply that is none"
                    : fmt::format("the module answered 0x{:08x} ({})", answer.status,
                                  HYP_ReturnStatusToString(answer.status));
    error.next = "look at the module's log, and at what it holds now: dvsctl show kernel:";
    return error;
}

void RequireOk(const Answer &answer, const std::string &title) {
    if (answer.status != HYP_OK) throw Error(DeviceError(answer, title));
}

} // namespace dvs::ctl
