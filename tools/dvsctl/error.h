/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_ERROR_H
#define DVSCTL_ERROR_H

// What dvsctl says when something goes wrong: one record with what failed, where, why and what to do next,
// thrown where the trouble is found and shown once, by the command line (cli.cpp), as text or as JSON.

#include <cstdint>
#include <exception>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <boost/json/fwd.hpp>

namespace dvs::ctl {

/// The program's exit statuses. They are an interface: scripts branch on them.
enum class Exit : int {
    Done = 0,        ///< done; for `diff`: same
    Failed = 1,      ///< refused or failed; for `diff`: different, and only that
    Usage = 2,       ///< wrong usage
    Timeout = 3,     ///< the time given with --timeout ran out
    NotThere = 4,    ///< the switch, port or property is not there
    NoDevice = 5,    ///< the switching module's device is absent
    Malformed = 6,   ///< the input is damaged or not what it should be
    Store = 7,       ///< the config store failed
    Busy = 8,        ///< someone else holds what is needed
    DiffTrouble = 9, ///< `diff` failed in a way that is 1 elsewhere
};

/// The word JSON output uses for a status ("malformed-input").
const char *ExitName(Exit status);

struct Error : std::exception {
    Error(Exit status_, std::string what_) : status(status_), title(std::move(what_)) {}

    // Builders, so that a throw reads as a sentence.
    Error &&In(std::string text) && { return Put(source, std::move(text)); }
    Error &&At(std::string text) && { return Put(path, std::move(text)); }
    Error &&Field(std::string text) && { return Put(field, std::move(text)); }
    Error &&Because(std::string text) && { return Put(why, std::move(text)); }
    Error &&Try(std::string text) && { return Put(next, std::move(text)); }
    Error &&Offset(std::uint64_t value) && {
        offset = value;
        return std::move(*this);
    }

    const char *what() const noexcept override { return title.c_str(); }

    Exit status;
    std::string title;                   ///< what failed
    std::string source;                  ///< where: the source as the user named it
    std::string path;                    ///< where: switch, port and property, or the path in a JSON document
    std::string field;                   ///< where: the field of a record
    std::optional<std::uint64_t> offset; ///< where: byte offset in the source
    std::string why;                     ///< why
    std::vector<std::string> messages;   ///< why: what the library said meanwhile
    std::string next;                    ///< what to do next
    bool isDamage = false;               ///< what is there is damaged, whatever the status
    bool isSilent = false;               ///< nobody wants to read it: the reader of the output left

private:
    Error &&Put(std::string &member, std::string &&text) {
        member = std::move(text);
        return std::move(*this);
    }
};

/// The error as lines of text, escaped for a terminal. `colour` marks the first word.
std::string ErrorText(const Error &error, bool colour);

/// The error as the member "error" of a JSON document.
boost::json::object ErrorJson(const Error &error);

} // namespace dvs::ctl

#endif
