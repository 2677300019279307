/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_SOURCES_SOURCE_H
#define DVSCTL_SOURCES_SOURCE_H

// A source is a place that holds switch state, named "scheme:rest" on the command line (a plain path is
// file:). Verbs see only this interface; each scheme is a file in sources/ and a row of the table in
// sources/schemes.cpp. What all sources have in common is the serialized state buffer: it is what they read
// and what they are given to write.

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "form/model.h"
#include "form/text.h"
#include "tools/dvsctl/cli/context.h"

namespace dvs::ctl {

/// What was read: the state buffer, perhaps with padding behind it, not looked into yet.
struct StateBytes {
    std::vector<std::uint8_t> bytes;
    std::string complaint; ///< why the place is not in order although bytes came (tolerant reads only)
};

enum class ReadMode {
    Strict,   ///< refuse what the library would refuse to read
    Tolerant, ///< give whatever bytes there are, with a complaint: for looking at damage
};

class Source {
public:
    explicit Source(std::string name) : name_(std::move(name)) {}
    virtual ~Source() = default;
    Source(const Source &) = delete;
    Source &operator=(const Source &) = delete;

    /// The source as "scheme:rest".
    const std::string &Name() const { return name_; }

    /// True when byte offsets mean something to the user: the bytes lie in the source as they are.
    virtual bool HasOffsets() const { return false; }

    /// True when the bytes go to standard output, so that nothing else may.
    virtual bool IsStandardOutput() const { return false; }

    /// True when it keeps states beyond the host's uptime, so that what is volatile has no place in it.
    virtual bool KeepsPersistentState() const { return false; }

    /// Told before Read which source the state is copied to.
    virtual void CopiesTo(const Source &) {}

    /// The state, or nothing where the source holds none. Throws Error.
    virtual std::optional<StateBytes> Read(Context &context, ReadMode mode) = 0;

    /// Replaces what the source holds by a state that has been verified: the whole of it or, with an Error,
    /// nothing. Where --switch was given the state is that switch alone, and a source that ReplacesSingle
    /// keeps its other switches.
    virtual void Write(Context &context, Bytes state) = 0;

    /// The state that Read would give after such a Write. Changes nothing; throws what the Write would.
    virtual std::vector<std::uint8_t> Plan(Context &, Bytes state) { return {state.begin(), state.end()}; }

    /// Looks at more of the place than a Read does. Throws Error when something is wrong there.
    virtual void CheckPlace(Context &) {}

    /// True when a Write can replace one switch and leave the others.
    virtual bool ReplacesSingle() const { return false; }

    /// True when a source without switches holds something all the same: bytes that a Write would replace.
    virtual bool CountsWhenEmpty() const { return true; }

    /// Why Read found nothing, for the error of those who need something, and that error's kind.
    virtual std::string WhyAbsent() const { return "it does not exist"; }
    virtual ErrorKind AbsentKind() const { return ErrorKind::Failed; }

private:
    std::string name_;
};

struct Scheme {
    const char *name;                                       ///< "file"
    const char *form;                                       ///< "file:PATH"
    const char *summary;                                    ///< one line of help
    std::unique_ptr<Source> (*open)(std::string_view rest); ///< reads nothing yet
};

std::span<const Scheme> Schemes();

/// The source that the text names. Throws Error(Usage).
std::unique_ptr<Source> OpenSource(std::string_view text);

/// The error of a verb that needs a state where there is none.
Error AbsentError(const Source &source);

/// The source's name at the head of a line about it, for display: "state.db:", and "kernel:", whose colon is
/// there already.
std::string ShowLead(const Source &source);

/// Reads; where there is nothing, throws Error(Failed), or with --if-exists gives an empty state.
StateBytes ReadState(Context &context, Source &source, ReadMode mode = ReadMode::Strict);

/// The error that refuses a damaged state: where the innermost fault is, and where a load would stop.
Error DamageError(const Source &source, const state::StateVerdict &verdict);

/// A source's state, verified (Error(Malformed) when it is damaged): the bytes and their model.
struct LoadedState {
    StateBytes raw;
    State state;
};
LoadedState LoadState(Context &context, Source &source);
LoadedState JudgeState(const Source &source, StateBytes read);

} // namespace dvs::ctl

#endif
