/* SPDX-License-Identifier: Apache-2.0 */
// The look of values, and bytes as digits.

#include "form/value.h"

#include <fmt/format.h>

#include "base/base64.h"
#include "form/model.h"

namespace dvs::form {

namespace {

// Shorter runs of letters in front of zeros, or without an end, are more often numbers than text.
constexpr std::size_t kLeastPaddedText = 4;
constexpr std::size_t kShownBytes = 24;
constexpr std::size_t kShownCharacters = 120;

// Widths of the slots that lists of port keys and of uplink names have.
constexpr std::size_t kSlots[] = {48, 81};

constexpr std::string_view kDigits = "0123456789abcdef";

int DigitValue(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    return -1;
}

// The text of a slot: plain, not empty, with a NUL behind it and nothing behind that. Empty when it is not
// so.
std::string_view SlotText(std::string_view slot) {
    const std::string_view text = slot.substr(0, slot.find('\0'));
    const bool good = text.size() < slot.size() && IsPlainText(text) &&
                      slot.find_first_not_of('\0', text.size()) == std::string_view::npos;
    return good ? text : std::string_view();
}

// The width of the slots when the value is a list of names; else 0.
std::size_t FindSlot(Bytes value) {
    constexpr std::size_t kCountSize = sizeof(std::uint32_t);
    if (value.size() <= kCountSize) return 0;
    const std::uint64_t count = *AsNumber(value.first(kCountSize));
    for (const std::size_t slot : kSlots) {
        if (value.size() - kCountSize != count * slot) continue;
        bool good = true;
        for (std::size_t at = kCountSize; good && at < value.size(); at += slot)
            good = !SlotText(AsText(value.subspan(at, slot))).empty();
        if (good) return slot;
    }
    return 0;
}

std::string ShowNames(Bytes value, std::size_t slot) {
    std::string text;
    for (const std::string_view name : NamesOf(value, slot))
        text += (text.empty() ? "[" : ", ") + Quote(name);
    return text + "]";
}

std::string ShowText(std::string_view text, bool full) {
    if (full || text.size() <= kShownCharacters) return Quote(text);
    std::size_t cut = kShownCharacters;
    while (cut > 0 && (static_cast<unsigned char>(text[cut]) & 0xc0) == 0x80)
        --cut; // not inside a character
    return fmt::format("{}… ({} bytes)", Quote(text.substr(0, cut)), text.size() + 1);
}

} // namespace

ValueLook LookAt(Bytes value) {
    const std::string_view all = AsText(value);
    const std::size_t length =
        all.find_last_not_of('\0') == std::string_view::npos ? 0 : all.find_last_not_of('\0') + 1;
    const std::string_view text = all.substr(0, length);
    const bool plain = length > 0 && text.find('\0') == std::string_view::npos && IsPlainText(text);
    if (plain && value.size() == length + 1) return {ValueForm::Text, text};
    if (const auto number = AsNumber(value)) return {ValueForm::Number, {}, *number};
    if (plain && length >= kLeastPaddedText) return {ValueForm::PaddedText, text};
    if (const std::size_t slot = FindSlot(value)) return {ValueForm::NameList, {}, 0, slot};
    return {ValueForm::Raw, {}};
}

std::vector<std::string_view> NamesOf(Bytes value, std::size_t slot) {
    std::vector<std::string_view> names;
    for (std::size_t at = sizeof(std::uint32_t); at + slot <= value.size(); at += slot)
        names.push_back(SlotText(AsText(value.subspan(at, slot))));
    return names;
}

std::string ShowValue(Bytes value, bool full) {
    const ValueLook look = LookAt(value);
    switch (look.form) {
    case ValueForm::Text: {
        // Three letters and a NUL may as well be a number.
        const auto number = AsNumber(value);
        return ShowText(look.text, full) + (number ? fmt::format(" (or {})", *number) : "");
    }
    case ValueForm::Number:
        return fmt::format("{}", look.number);
    case ValueForm::PaddedText:
        return fmt::format("{} ({} bytes{})", ShowText(look.text, full), value.size(),
                           value.size() == look.text.size() ? ", no NUL" : "");
    case ValueForm::NameList:
        return ShowNames(value, look.slot);
    case ValueForm::Raw:
        break;
    }
    if (value.empty()) return "(empty)";
    return fmt::format("{} ({})", Hex(value, full ? SIZE_MAX : kShownBytes), Count(value.size(), "byte"));
}

std::string ToHexDigits(Bytes bytes) {
    std::string out;
    out.reserve(bytes.size() * 2);
    for (const std::uint8_t byte : bytes) {
        out += kDigits[byte >> 4];
        out += kDigits[byte & 15];
    }
    return out;
}

std::string ToBase64(Bytes bytes) {
    std::string out(base::Base64Size(bytes.size()), '\0');
    base::EncodeBase64(out.data(), bytes.data(), bytes.size());
    return out;
}

std::optional<std::vector<std::uint8_t>> FromHexDigits(std::string_view text) {
    std::vector<std::uint8_t> out;
    out.reserve(text.size() / 2);
    for (std::size_t i = 0; i < text.size();) {
        if (!out.empty() && text[i] == ' ') ++i;
        if (text.size() - i < 2) return std::nullopt;
        const int high = DigitValue(text[i]), low = DigitValue(text[i + 1]);
        if (high < 0 || low < 0) return std::nullopt;
        out.push_back(static_cast<std::uint8_t>(high << 4 | low));
        i += 2;
    }
    return out;
}

std::optional<std::vector<std::uint8_t>> FromBase64(std::string_view text) {
    std::vector<std::uint8_t> out(base::DecodedBase64Size(text.size()));
    std::size_t size = 0;
    if (!base::DecodeBase64(text, out.data(), &size)) return std::nullopt;
    out.resize(size);
    return out;
}

} // namespace dvs::form
