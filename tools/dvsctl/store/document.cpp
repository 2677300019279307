/* SPDX-License-Identifier: Apache-2.0 */
// Reading and comparing documents (document.h).

#include "tools/dvsctl/store/document.h"

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/parse.hpp>
#include <boost/json/serialize.hpp>
#include <fmt/format.h>

#include "form/text.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;

constexpr std::size_t kMostDepth = 512; // the store itself takes no deeper ones
constexpr std::size_t kShownBytes = 100;

std::string Below(const std::string &path, std::string_view member) {
    return path.empty() ? std::string(member) : fmt::format("{}/{}", path, member);
}

// A whole object that came or went is one change; at the root its members are, for a document has no name.
void Walk(const std::string &path, const json::value *before, const json::value *after,
          std::vector<FieldChange> &changes) {
    if (before && after && before->is_object() && after->is_object()) {
        for (const auto &[key, value] : before->as_object())
            Walk(Below(path, key), &value, after->as_object().if_contains(key), changes);
        for (const auto &[key, value] : after->as_object())
            if (!before->as_object().contains(key)) Walk(Below(path, key), nullptr, &value, changes);
        return;
    }
    if (before && after && *before == *after) return;
    FieldChange &change = changes.emplace_back();
    change.path = path;
    if (before) change.before = *before;
    if (after) change.after = *after;
}

std::string OneLine(const json::value &value, bool full) {
    std::string text = Escape(json::serialize(value));
    if (full || text.size() <= kShownBytes) return text;
    std::size_t cut = kShownBytes;
    while (cut > 0 && (static_cast<unsigned char>(text[cut]) & 0xc0) == 0x80)
        --cut; // not inside a character
    return text.substr(0, cut) + "…";
}

} // namespace

std::optional<json::value> ReadDocument(std::string_view text) {
    json::parse_options options;
    options.max_depth = kMostDepth;
    options.allow_invalid_utf8 = true;
    json::error_code code;
    json::value value = json::parse(text, code, {}, options);
    if (code) return std::nullopt;
    return value;
}

std::vector<FieldChange> CompareDocuments(const std::optional<json::value> &before,
                                          const std::optional<json::value> &after) {
    std::vector<FieldChange> changes;
    if (before || after) Walk("", before ? &*before : nullptr, after ? &*after : nullptr, changes);
    return changes;
}

void WriteFieldChanges(const std::vector<FieldChange> &changes, std::string_view indent, bool full,
                       Output &out) {
    for (const FieldChange &change : changes) {
        const std::string path = change.path.empty() ? "(document)" : Escape(change.path);
        const bool added = !change.before, removed = !change.after;
        const std::string values =
            added     ? OneLine(*change.after, full)
            : removed ? OneLine(*change.before, full)
                      : fmt::format("{} -> {}", OneLine(*change.before, full), OneLine(*change.after, full));
        const char mark = added ? '+' : removed ? '-' : '~';
        const Style style = added ? Style::Added : removed ? Style::Removed : Style::Changed;
        out.Write(
            fmt::format("{}{}\n", indent, out.Paint(style, fmt::format("{} {}: {}", mark, path, values))));
    }
}

json::array FieldChangesJson(const std::vector<FieldChange> &changes) {
    json::array array;
    for (const FieldChange &change : changes) {
        json::object object;
        object["change"] = !change.before ? "added" : !change.after ? "removed" : "changed";
        object["field"] = ValidUtf8(change.path);
        if (change.before) object["before"] = *change.before;
        if (change.after) object["after"] = *change.after;
        array.emplace_back(std::move(object));
    }
    return array;
}

} // namespace dvs::ctl
