/* SPDX-License-Identifier: Apache-2.0 */
// JSON documents as people read them (pretty.h). The JSON library writes every scalar; this file only breaks and indents
// lines.

#include "form/json/pretty.h"

#include <string>

#include <boost/json/serialize.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "form/text.h"

namespace dvs::form {

namespace {

namespace json = boost::json;

constexpr std::size_t kLineWidth = 120;

void AppendEscaped(std::string &out, const std::string &text);

void AppendScalar(std::string &out, const json::value &value) {
    AppendEscaped(out, json::serialize(value));
}

void AppendKey(std::string &out, json::string_view key) {
    AppendEscaped(out, json::serialize(key));
}

// The library leaves characters above 0x7e as they are; those that a terminal could act on become escapes.
// They can only stand inside strings, where an escape means the same.
void AppendEscaped(std::string &out, const std::string &text) {
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t start = at;
        const auto c = DecodeUtf8(text, &at);
        if (!c) {
            out += "\\ufffd"; // never from this program's own documents: they hold UTF-8 only
            ++at;
        } else if (IsPrintable(*c)) {
            out.append(text, start, at - start);
        } else if (*c < 0x10000) {
            out += fmt::format("\\u{:04x}", static_cast<unsigned>(*c));
        } else {
            const unsigned rest = static_cast<unsigned>(*c) - 0x10000;
            out += fmt::format("\\u{:04x}\\u{:04x}", 0xd800 + (rest >> 10), 0xdc00 + (rest & 0x3ff));
        }
    }
}

// Appends the value on one line. False, with `out` as it was, when that would pass the limit.
bool AppendFlat(std::string &out, const json::value &value, std::size_t limit) {
    const std::size_t start = out.size();
    bool fits = true, first = true;
    const auto separate = [&] {
        if (!first) out += ", ";
        first = false;
    };
    if (const json::object *object = value.if_object()) {
        out += "{";
        for (const auto &member : *object) {
            separate();
            AppendKey(out, member.key());
            out += ": ";
            fits = fits && AppendFlat(out, member.value(), limit);
            if (!fits) break;
        }
        out += "}";
    } else if (const json::array *array = value.if_array()) {
        out += "[";
        for (const json::value &element : *array) {
            separate();
            fits = fits && AppendFlat(out, element, limit);
            if (!fits) break;
        }
        out += "]";
    } else {
        AppendScalar(out, value);
    }
    if (fits && out.size() <= limit) return true;
    out.resize(start);
    return false;
}

// An object or array of plain members only: the unit that goes on one line.
bool IsLeaf(const json::value &value, int depth = 0) {
    if (depth > 2) return !value.is_structured();
    if (const json::object *object = value.if_object()) {
        for (const auto &member : *object)
            if (!IsLeaf(member.value(), depth + 1)) return false;
        return true;
    }
    if (const json::array *array = value.if_array()) {
        for (const json::value &element : *array)
            if (element.is_structured()) return false;
    }
    return true;
}

// A value in one of the forms of bytes: never broken, however long.
bool IsShort(const json::value &value) {
    const json::object *object = value.if_object();
    if (!object || object->size() > 2) return false;
    for (const auto &member : *object)
        if (member.value().is_structured()) return false;
    return true;
}

void Append(std::string &out, const json::value &value, std::size_t indent) {
    if (!value.is_structured()) {
        AppendScalar(out, value);
        return;
    }
    const std::size_t lineStart = out.rfind('\n') + 1; // 0 when there is none
    if (IsLeaf(value) && AppendFlat(out, value, IsShort(value) ? SIZE_MAX : lineStart + kLineWidth)) return;

    const bool isObject = value.is_object();
    if (isObject ? value.get_object().empty() : value.get_array().empty()) {
        out += isObject ? "{}" : "[]";
        return;
    }
    const std::string lead = "\n" + std::string(indent + 2, ' ');
    bool first = true;
    const auto next = [&] {
        if (!first) out += ',';
        first = false;
        out += lead;
    };
    out += isObject ? '{' : '[';
    if (isObject) {
        for (const auto &member : value.get_object()) {
            next();
            AppendKey(out, member.key());
            out += ": ";
            Append(out, member.value(), indent + 2);
        }
    } else {
        for (const json::value &element : value.get_array()) {
            next();
            Append(out, element, indent + 2);
        }
    }
    out += "\n" + std::string(indent, ' ') + (isObject ? '}' : ']');
}

} // namespace

std::string PrettyJson(const json::value &document) {
    std::string out;
    Append(out, document, 0);
    out += '\n';
    return out;
}

} // namespace dvs::form
