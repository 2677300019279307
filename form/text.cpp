/* SPDX-License-Identifier: Apache-2.0 */
// Decoding, escaping, measuring and matching of text. Knows nothing of states or commands.

#include "form/text.h"

#include <algorithm>
#include <iterator>

#include <fmt/format.h>

#include "base/utf8.h"

namespace dvs::form {

namespace {

struct Range {
    char32_t first, last;
};

// Characters that are valid but must not be shown as they are: controls, zero width, direction changes, byte
// order mark, line and paragraph separators, tags and private planes. Ascending.
constexpr Range kHidden[] = {
    {0x0000, 0x001f}, {0x007f, 0x009f}, {0x00ad, 0x00ad},   {0x061c, 0x061c},    {0x180e, 0x180e},
    {0x200b, 0x200f}, {0x2028, 0x202e}, {0x2060, 0x206f},   {0xe000, 0xf8ff},    {0xfeff, 0xfeff},
    {0xfff0, 0xfffb}, {0xfffe, 0xffff}, {0xe0000, 0xe0fff}, {0xf0000, 0x10ffff},
};

// Characters that take two columns, coarsely: Hangul, CJK, full-width forms, emoji. Ascending.
constexpr Range kWide[] = {
    {0x1100, 0x115f}, {0x2e80, 0x303e}, {0x3041, 0xa4cf}, {0xac00, 0xd7a3},   {0xf900, 0xfaff},
    {0xfe30, 0xfe6f}, {0xff00, 0xff60}, {0xffe0, 0xffe6}, {0x1f300, 0x1faff}, {0x20000, 0x3fffd},
};

// Characters that combine with the one before them, coarsely. Ascending.
constexpr Range kCombining[] = {
    {0x0300, 0x036f}, {0x0483, 0x0489}, {0x0591, 0x05bd}, {0x064b, 0x065f}, {0x1ab0, 0x1aff},
    {0x1dc0, 0x1dff}, {0x20d0, 0x20ff}, {0xfe00, 0xfe0f}, {0xfe20, 0xfe2f},
};

bool IsIn(std::span<const Range> ranges, char32_t c) {
    const auto behind =
        std::upper_bound(ranges.begin(), ranges.end(), c,
                         [](char32_t value, const Range &range) { return value < range.first; });
    return behind != ranges.begin() && c <= std::prev(behind)->last;
}

// How many characters the text starts with that are plain ASCII: one byte and one column each, shown as they
// are. Nearly all text is, and whole states are made of texts.
std::size_t PlainAscii(std::string_view text) {
    std::size_t length = 0;
    while (length < text.size() && text[length] >= 0x20 && text[length] < 0x7f)
        ++length;
    return length;
}

std::string EscapeWith(std::string_view text, bool quotes) {
    std::string out;
    out.reserve(text.size());
    for (std::size_t at = 0; at < text.size();) {
        std::size_t plain = PlainAscii(text.substr(at));
        plain = std::min(plain, text.substr(at, plain).find_first_of(quotes ? "\\\"" : "\\"));
        out += text.substr(at, plain);
        at += plain;
        if (at == text.size()) break;
        const std::size_t start = at;
        const auto c = DecodeUtf8(text, &at);
        if (!c) {
            out += fmt::format("\\x{:02x}", static_cast<unsigned char>(text[at++]));
        } else if (*c == '\n') {
            out += "\\n";
        } else if (*c == '\r') {
            out += "\\r";
        } else if (*c == '\t') {
            out += "\\t";
        } else if (*c == '\\' || (quotes && *c == '"')) {
            out += '\\';
            out += text[start];
        } else if (!IsPrintable(*c)) {
            out += *c < 0x80 ? fmt::format("\\x{:02x}", static_cast<unsigned>(*c))
                             : fmt::format("\\u{{{:x}}}", static_cast<unsigned>(*c));
        } else {
            out += text.substr(start, at - start);
        }
    }
    return out;
}

// Matches one character against a `[…]` set that starts at pattern[at]; moves behind it. Empty when it never
// closes.
std::optional<bool> MatchSet(std::string_view pattern, std::size_t *at, char c) {
    std::size_t i = *at + 1;
    const bool negated = i < pattern.size() && (pattern[i] == '!' || pattern[i] == '^');
    if (negated) ++i;
    bool found = false;
    for (bool first = true; i < pattern.size() && (first || pattern[i] != ']'); first = false) {
        const auto low = static_cast<unsigned char>(pattern[i]);
        auto high = low;
        if (i + 2 < pattern.size() && pattern[i + 1] == '-' && pattern[i + 2] != ']') {
            high = static_cast<unsigned char>(pattern[i + 2]);
            i += 2;
        }
        ++i;
        const auto value = static_cast<unsigned char>(c);
        found = found || (low <= value && value <= high);
    }
    if (i >= pattern.size()) return std::nullopt;
    *at = i + 1;
    return found != negated;
}

// Matches one character against the pattern element at pattern[at] (not `*`); moves behind it.
bool MatchOne(std::string_view pattern, std::size_t *at, char c) {
    switch (pattern[*at]) {
    case '?':
        ++*at;
        return true;
    case '[':
        if (const auto matched = MatchSet(pattern, at, c)) return *matched;
        break;
    case '\\':
        if (*at + 1 < pattern.size()) ++*at;
        break;
    default:
        break;
    }
    return pattern[(*at)++] == c;
}

} // namespace

std::optional<char32_t> DecodeUtf8(std::string_view text, std::size_t *at) {
    const char *const start = text.data() + *at;
    const std::size_t length = base::Utf8Length(start, text.data() + text.size());
    if (length == 0) return std::nullopt;
    const auto byte = [start](std::size_t i) { return static_cast<unsigned char>(start[i]); };
    char32_t value = length == 1 ? byte(0) : byte(0) & (0x7fu >> length);
    for (std::size_t i = 1; i < length; ++i)
        value = (value << 6) | (byte(i) & 0x3fu);
    *at += length;
    return value;
}

bool IsUtf8(std::string_view text) {
    for (std::size_t at = PlainAscii(text); at < text.size();)
        if (!DecodeUtf8(text, &at)) return false;
    return true;
}

bool IsPrintable(char32_t character) {
    return !IsIn(kHidden, character);
}

bool IsPlainText(std::string_view text) {
    for (std::size_t at = PlainAscii(text); at < text.size();) {
        const auto c = DecodeUtf8(text, &at);
        if (!c || !(IsPrintable(*c) || *c == '\t' || *c == '\n' || *c == '\r')) return false;
    }
    return true;
}

std::string Escape(std::string_view text) {
    return EscapeWith(text, false);
}

std::string Quote(std::string_view text) {
    return '"' + EscapeWith(text, true) + '"';
}

std::string ShowName(std::string_view name) {
    const bool boundsShow = !name.empty() && name.front() != ' ' && name.back() != ' ' && name.front() != '"';
    return boundsShow ? Escape(name) : Quote(name);
}

std::string ValidUtf8(std::string_view text) {
    std::string out;
    out.reserve(text.size());
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t start = at;
        if (DecodeUtf8(text, &at)) {
            out += text.substr(start, at - start);
        } else {
            out += "\xef\xbf\xbd";
            ++at;
        }
    }
    return out;
}

std::size_t Width(std::string_view text) {
    std::size_t width = PlainAscii(text);
    for (std::size_t at = width; at < text.size();) {
        const auto c = DecodeUtf8(text, &at);
        if (!c) ++at;
        if (c && IsIn(kCombining, *c)) continue;
        width += c && IsIn(kWide, *c) ? 2 : 1;
    }
    return width;
}

std::string Count(std::uint64_t number, std::string_view noun, std::string_view plural) {
    return fmt::format("{} {}", number, number == 1 ? noun : plural);
}

std::string Hex(Bytes bytes, std::size_t most) {
    std::string out;
    for (std::size_t i = 0; i < std::min(bytes.size(), most); ++i)
        out += fmt::format("{}{:02x}", i ? " " : "", bytes[i]);
    if (bytes.size() > most) out += " …";
    return out;
}

bool GlobMatch(std::string_view pattern, std::string_view text) {
    // The classic walk: on a mismatch, go back to the last star and let it take one character more.
    std::size_t p = 0, t = 0, star = std::string_view::npos, resume = 0;
    while (t < text.size()) {
        if (p < pattern.size() && pattern[p] == '*') {
            star = p++;
            resume = t;
            continue;
        }
        if (p < pattern.size() && MatchOne(pattern, &p, text[t])) {
            ++t;
            continue;
        }
        if (star == std::string_view::npos) return false;
        p = star + 1;
        t = ++resume;
    }
    while (p < pattern.size() && pattern[p] == '*')
        ++p;
    return p == pattern.size();
}

} // namespace dvs::form
