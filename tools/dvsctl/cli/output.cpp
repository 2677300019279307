/* SPDX-License-Identifier: Apache-2.0 */
// Delivery of output: whole or not at all, to a terminal with colour and pager, to anything else plain.

#include "tools/dvsctl/cli/output.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include "form/json/pretty.h"
#include "tools/dvsctl/cli/error.h"
#include "tools/dvsctl/cli/options.h"

namespace dvs::ctl {

namespace {

constexpr std::size_t kDrainSize = 256 * 1024;

bool IsSet(const char *name) {
    const char *value = std::getenv(name);
    return value && *value;
}

bool IsDumb() {
    const char *term = std::getenv("TERM");
    return !term || !*term || std::strcmp(term, "dumb") == 0;
}

// 0, or the errno that ended the writing.
int WriteAll(int fd, std::string_view text) {
    while (!text.empty()) {
        const ssize_t written = write(fd, text.data(), text.size());
        if (written < 0 && errno == EINTR) continue;
        if (written < 0) return errno;
        if (written == 0) return EIO;
        text.remove_prefix(static_cast<std::size_t>(written));
    }
    return 0;
}

[[noreturn]] void ThrowOutputError(int error) {
    Error failure(ErrorKind::Failed, "cannot write to standard output");
    failure.why = std::strerror(error);
    failure.isSilent = error == EPIPE; // `dvsctl … | head` is a failure, but no news
    failure.next =
        "what was printed so far is not complete; free space or name another destination, and repeat";
    throw failure;
}

const char *Code(Style style) {
    switch (style) {
    case Style::Plain:
        return "";
    case Style::Heading:
        return "1";
    case Style::Name:
        return "36";
    case Style::Dim:
        return "2";
    case Style::Added:
        return "32";
    case Style::Removed:
        return "31";
    case Style::Changed:
        return "33";
    case Style::Bad:
        return "1;31";
    case Style::Good:
        return "32";
    }
    return "";
}

// While it lives, the terminal's interrupts are the pager's: it shares the terminal, and would be left on it
// alone.
class InterruptsIgnored {
public:
    InterruptsIgnored() : interrupt_(std::signal(SIGINT, SIG_IGN)), quit_(std::signal(SIGQUIT, SIG_IGN)) {}
    ~InterruptsIgnored() { Restore(); }
    InterruptsIgnored(const InterruptsIgnored &) = delete;
    InterruptsIgnored &operator=(const InterruptsIgnored &) = delete;

    void Restore() const {
        std::signal(SIGINT, interrupt_);
        std::signal(SIGQUIT, quit_);
    }

private:
    void (*interrupt_)(int);
    void (*quit_)(int);
};

// The reader's end of a pipe to the pager; -1 when it could not be started.
int StartPager(const char *command, const InterruptsIgnored &ours, pid_t *child) {
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) return -1;
    *child = fork();
    if (*child == 0) {
        dup2(ends[0], STDIN_FILENO);
        setenv("LESS", "FRX", 0);
        std::signal(SIGPIPE, SIG_DFL);
        ours.Restore();
        execl("/bin/sh", "sh", "-c", command, static_cast<char *>(nullptr));
        _exit(127);
    }
    close(ends[0]);
    if (*child > 0) return ends[1];
    close(ends[1]);
    return -1;
}

} // namespace

void ReserveStandardDescriptors() {
    for (int fd = STDIN_FILENO; fd <= STDERR_FILENO; ++fd)
        if (fcntl(fd, F_GETFD) < 0 && errno == EBADF)
            (void)open("/dev/null",
                       fd == STDIN_FILENO ? O_WRONLY : O_RDONLY); // lands on fd, the lowest free one
}

Output::~Output() = default;

Output::Output() : terminal_(isatty(STDOUT_FILENO) == 1), errorTerminal_(isatty(STDERR_FILENO) == 1) {
    const bool colourful = !IsSet("NO_COLOR") && !IsDumb();
    colour_ = terminal_ && colourful;
    errorColour_ = errorTerminal_ && colourful;
}

void Output::Configure(const Options &options) {
    quiet_ = options.quiet;
    pager_ = !options.noPager;
}

void Output::Write(std::string_view text) {
    pending_ += text;
    if (!terminal_ && pending_.size() >= kDrainSize) Drain();
}

void Output::Remark(std::string_view text) {
    if (!quiet_) Write(text);
}

void Output::Warn(Error warning) {
    warnings_.push_back(std::move(warning));
}

void Output::Json(boost::json::object document) {
    for (const Error &warning : warnings_) {
        boost::json::value &list = document["warnings"];
        (list.is_array() ? list.get_array() : list.emplace_array()).emplace_back(WarningJson(warning));
    }
    warnings_.clear();
    Write(PrettyJson(std::move(document)));
}

void Output::Discard() {
    pending_.clear();
    warnings_.clear();
}

void Output::Drain() {
    const int error = WriteAll(STDOUT_FILENO, pending_);
    pending_.clear();
    if (error != 0) ThrowOutputError(error);
}

bool Output::Page() {
    const char *command = std::getenv("PAGER");
    if (!pager_ || !terminal_ || IsDumb()) return false;
    if (!command) command = "less";
    if (!*command || std::strcmp(command, "cat") == 0) return false;
    winsize size{};
    if (ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) != 0 || size.ws_row == 0) return false;
    if (std::count(pending_.begin(), pending_.end(), '\n') < size.ws_row) return false;

    pid_t child = -1;
    const InterruptsIgnored interrupts;
    const int to = StartPager(command, interrupts, &child);
    if (to < 0) return false;
    const int error = WriteAll(to, pending_);
    close(to);
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    // A pager that is not installed must not cost the reader the text. One that was left early has shown
    // enough.
    if (WIFEXITED(status) && (WEXITSTATUS(status) == 127 || WEXITSTATUS(status) == 126)) return false;
    pending_.clear();
    if (error != 0 && error != EPIPE) ThrowOutputError(error);
    return true;
}

void Output::Finish() {
    if (!pending_.empty() && !Page()) Drain();
    for (Error &warning : warnings_) {
        warning.title = "warning: " + warning.title;
        Diagnose(ErrorText(warning, errorColour_));
    }
    warnings_.clear();
}

void Output::Diagnose(std::string_view text) {
    (void)WriteAll(STDERR_FILENO, text);
}

std::string Output::Paint(Style style, std::string_view text) const {
    if (!colour_ || style == Style::Plain || text.empty()) return std::string(text);
    return std::string("\x1b[") + Code(style) + "m" + std::string(text) + "\x1b[0m";
}

} // namespace dvs::ctl
