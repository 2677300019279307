/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_OUTPUT_H
#define DVSCTL_CLI_OUTPUT_H

// Standard output and standard error of the program. Output is a promise: what does not reach its reader
// whole is a failure. Colour and pager belong to terminals only; NO_COLOR and PAGER are honoured.

#include <string>
#include <string_view>
#include <vector>

#include <boost/json/fwd.hpp>

#include "form/error.h"
#include "tools/dvsctl/form.h"

namespace dvs::ctl {

struct Options;

enum class Style { Plain, Heading, Name, Dim, Added, Removed, Changed, Bad, Good };

class Output {
public:
    /// Looks at the terminal once. Call ReserveStandardDescriptors before anything is opened.
    Output();
    ~Output();
    Output(const Output &) = delete;
    Output &operator=(const Output &) = delete;

    /// Takes over what the options say about quiet and pager.
    void Configure(const Options &options);

    /// Results. Must be escaped already. Gathered, and passed on in large pieces where no terminal waits.
    void Write(std::string_view text);

    /// Remarks beside the result ("copied …"): like Write, unless --quiet.
    void Remark(std::string_view text);

    /// What was done all the same, and has a consequence that nobody expects: behind the results on standard
    /// error, also with --quiet, or as "warnings" of the JSON document. Its status does not count.
    void Warn(Error warning);

    /// One JSON document and a line end.
    void Json(boost::json::object document);

    /// Passes on what is gathered, through a pager where it is longer than the terminal. Throws Error(Failed)
    /// when standard output does not take everything. Call once, at the end.
    void Finish();

    /// What was written and not yet passed on is dropped, so that an error can be the only document.
    void Discard();

    /// Lines for people on standard error; failures are ignored, there is nobody left to tell.
    void Diagnose(std::string_view text);

    /// The text in a style, as it is where standard output has no colour.
    std::string Paint(Style style, std::string_view text) const;

    bool ErrorColour() const { return errorColour_; }

    /// True when verbs should show how long work is coming along (standard error is a terminal).
    bool ShowsProgress() const { return errorTerminal_ && !quiet_; }

private:
    void Drain();
    bool Page();

    std::string pending_;
    std::vector<Error> warnings_;
    bool terminal_ = false, errorTerminal_ = false, colour_ = false, errorColour_ = false;
    bool quiet_ = false, pager_ = true;
};

/// Opens /dev/null, the wrong way round, for each of the descriptors 0 to 2 that the caller closed: otherwise
/// the next file opened would become standard output and be written over.
void ReserveStandardDescriptors();

} // namespace dvs::ctl

#endif
