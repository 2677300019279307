/* SPDX-License-Identifier: Apache-2.0 */
// The two faces of an error: lines for people, an object for programs.

#include "tools/dvsctl/error.h"

#include <boost/json/object.hpp>
#include <boost/json/array.hpp>
#include <fmt/format.h>

#include "tools/dvsctl/text.h"

namespace dvs::ctl {

namespace {

struct StatusName {
    Exit status;
    const char *name;
};

constexpr StatusName kStatusNames[] = {
    {Exit::Done, "done"},
    {Exit::Failed, "failed"},
    {Exit::Usage, "usage"},
    {Exit::Timeout, "timeout"},
    {Exit::NotThere, "not-there"},
    {Exit::NoDevice, "no-device"},
    {Exit::Malformed, "malformed-input"},
    {Exit::Store, "store-error"},
    {Exit::Busy, "busy"},
    {Exit::DiffTrouble, "diff-trouble"},
};

// Messages arrive from several places, with a line end or without.
std::string_view OneLine(std::string_view text) {
    while (!text.empty() && (text.back() == '\n' || text.back() == ' '))
        text.remove_suffix(1);
    return text;
}

void Line(std::string &to, std::string_view label, const std::string &text) {
    if (!text.empty()) to += fmt::format("  {:<7} {}\n", label, Escape(OneLine(text)));
}

} // namespace

const char *ExitName(Exit status) {
    for (const StatusName &row : kStatusNames)
        if (row.status == status) return row.name;
    return "failed";
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

boost::json::object ErrorJson(const Error &error) {
    boost::json::object object;
    const auto put = [&object](const char *key, const std::string &text) {
        if (!text.empty()) object[key] = ValidUtf8(OneLine(text));
    };
    object["status"] = static_cast<int>(error.status);
    object["name"] = ExitName(error.status);
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
    return object;
}

} // namespace dvs::ctl
