/* SPDX-License-Identifier: Apache-2.0 */
#ifndef FORM_ERROR_H
#define FORM_ERROR_H

// A failure as a record: what kind it is, what failed, where, why. Thrown where the trouble is found. A program
// turns it into words and an exit status; nothing below a program prints it.

#include <cstdint>
#include <exception>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace dvs::form {

/// What callers and programs tell failures apart by.
enum class ErrorKind : std::uint8_t {
    Warning,   ///< no failure: it was done, with a consequence that somebody should know
    Failed,    ///< refused or failed
    Usage,     ///< what was asked for makes no sense
    Timeout,   ///< somebody else did not answer in time
    NotThere,  ///< a switch, port or property is not there
    NoDevice,  ///< the switching module's device is absent
    Malformed, ///< the input is damaged or not what it should be
    Store,     ///< the config store failed
    Busy,      ///< someone else holds what is needed
};

struct Error : std::exception {
    Error(ErrorKind kind_, std::string what_) : kind(kind_), title(std::move(what_)) {}

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

    ErrorKind kind;
    std::string title;                   ///< what failed
    std::string source;                  ///< where: the source as the user named it
    std::string path;                    ///< where: switch, port and property, or the path in a JSON document
    std::string field;                   ///< where: the field of a record
    std::optional<std::uint64_t> offset; ///< where: byte offset in the source
    std::string why;                     ///< why
    std::vector<std::string> messages;   ///< why: what the library said meanwhile
    std::string next;                    ///< what to do next
    bool isDamage = false;               ///< what is there is damaged, whatever the kind
    bool isSilent = false;               ///< nobody wants to read it: the reader of the output left

private:
    Error &&Put(std::string &member, std::string &&text) {
        member = std::move(text);
        return std::move(*this);
    }
};

} // namespace dvs::form

#endif
