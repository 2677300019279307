/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_ERROR_H
#define DVSCTL_CLI_ERROR_H

// Errors (form/error.h) as the program shows them: exit status, lines for people, an object for programs.

#include <string>

#include <boost/json/fwd.hpp>

#include "form/error.h"
#include "tools/dvsctl/form.h"

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

/// The exit status of an error.
Exit ExitOf(ErrorKind kind);

/// The error as lines of text, escaped for a terminal. `colour` marks the first word.
std::string ErrorText(const Error &error, bool colour);

/// The error as the member "error" of a JSON document, with the status that the program ends with.
boost::json::object ErrorJson(const Error &error, Exit status);

/// The error as a warning: without a status.
boost::json::object WarningJson(const Error &warning);

} // namespace dvs::ctl

#endif
