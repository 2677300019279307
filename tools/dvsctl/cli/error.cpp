/* SPDX-License-Identifier: Apache-2.0 */
// The two faces of an error: lines for people, an object for programs.

#include "tools/dvsctl/cli/error.h"

#include <boost/json/object.hpp>
#include <boost/json/array.hpp>
#include <fmt/format.h>

#include "form/text.h"

namespace dvs::ctl {

namespace {

struct KindRow {
    ErrorKind kind;
    Exit status;
};

constexpr KindRow kKinds[] = {
    {ErrorKind::Warning, Exit::Done},        {ErrorKind::Failed, Exit::Failed},
    {ErrorKind::Usage, Exit::Usage},         {ErrorKind::Timeout, Exit::Timeout},
    {ErrorKind::NotThere, Exit::NotThere},   {ErrorKind::NoDevice, Exit::NoDevice},
    {ErrorKind::Malformed, Exit::Malformed}, {ErrorKind::Store, Exit::Store},
    {ErrorKind::Busy, Exit::Busy},
};

// What JSON output calls a status. In the order of Exit.
constexpr const char *kStatusNames[] = {"done",      "failed",      "usage",           "timeout",
                                        "not-there", "no-device",   "malformed-input", "store-error",
                                        "busy",      "diff-trouble"};

// Messages arrive from several places, with a line end or without.
std::string_view OneLine(std::string_view text) {
    while (!text.empty() && (text.back() == '\n' || text.back() == ' '))
        text.remove_suffix(1);
    return text;
}

void Line(std::string &to, std::string_view label, const std::string &text) {
    if (!text.empty()) to += fmt::format("  {:<7} {}\n", label, Escape(OneLine(text)));
}

void AddWhatAndWhy(boost::json::object &object, const Error &error) {
    const auto put = [&object](const char *key, const std::string &text) {
        if (!text.empty()) object[key] = ValidUtf8(OneLine(text));
    };
    put("what", error.title);
    put("source", error.source);
    put("path", error.path);
    if (error.offset) object["offset"] = *error.offset;
    put("field", error.field);
    put("why", error.why);
    if (!error.messages.empty()) {
        boost::json::array messages;
        for (const std::string &message : error.messages)
            messages.emplace_back(ValidUtf8(OneLine(message)));
        object["messages"] = std::move(messages);
    }
    put("next", error.next);
}

} // namespace

Exit ExitOf(ErrorKind kind) {
    for (const KindRow &row : kKinds)
        if (row.kind == kind) return row.status;
    return Exit::Failed;
}

std::string ErrorText(const Error &error, bool colour) {
    std::string text = colour ? "\x1b[1;31mdvsctl:\x1b[0m " : "dvsctl: ";
    text += Escape(OneLine(error.title)) + "\n";
    Line(text, "in:", error.source);
    std::string where = error.path;
    if (!error.field.empty()) where += (where.empty() ? "" : ", ") + std::string("field ") + error.field;
    if (error.offset)
        where +=
            fmt::format("{}byte offset {} (0x{:x})", where.empty() ? "" : ", ", *error.offset, *error.offset);
    Line(text, "where:", where);
    Line(text, "why:", error.why);
    for (const std::string &message : error.messages)
        Line(text, "cause:", message);
    Line(text, "next:", error.next);
    return text;
}

boost::json::object ErrorJson(const Error &error, Exit status) {
    boost::json::object object;
    object["status"] = static_cast<int>(status);
    object["name"] = kStatusNames[static_cast<std::size_t>(status)];
    AddWhatAndWhy(object, error);
    return object;
}

boost::json::object WarningJson(const Error &warning) {
    boost::json::object object;
    AddWhatAndWhy(object, warning);
    return object;
}

} // namespace dvs::ctl
