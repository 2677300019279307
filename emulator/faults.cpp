/* SPDX-License-Identifier: Apache-2.0 */
// Parses and applies faults; faults.h describes their form.

#include "emulator/faults.h"

#include <cerrno>
#include <charconv>
#include <cstring>

namespace {

using dvs::emulator::Drop;
using dvs::emulator::Fault;

struct ErrnoName {
    std::string_view name;
    int value;
};

// The errors a driver usually returns; others are given by number.
constexpr ErrnoName kErrnoNames[] = {
    {"EPERM", EPERM},   {"ENOENT", ENOENT},       {"EINTR", EINTR},   {"EIO", EIO},
    {"ENXIO", ENXIO},   {"EAGAIN", EAGAIN},       {"ENOMEM", ENOMEM}, {"EACCES", EACCES},
    {"EFAULT", EFAULT}, {"EBUSY", EBUSY},         {"EEXIST", EEXIST}, {"ENODEV", ENODEV},
    {"EINVAL", EINVAL}, {"ENOSPC", ENOSPC},       {"ENOTTY", ENOTTY}, {"EOPNOTSUPP", EOPNOTSUPP},
    {"EPROTO", EPROTO}, {"ETIMEDOUT", ETIMEDOUT},
};

constexpr int kMaxErrno = 4095;
constexpr uint64_t kMaxDelayMs = 3600 * 1000;

bool ParseNumber(std::string_view text, uint64_t max, uint64_t *number) {
    int base = 10;
    if (text.starts_with("0x")) {
        text.remove_prefix(2);
        base = 16;
    }
    const char *end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, *number, base);
    return error == std::errc() && stop == end && *number <= max;
}

bool ParseErrno(std::string_view text, uint64_t *number) {
    for (const ErrnoName &row : kErrnoNames) {
        if (row.name != text) continue;
        *number = static_cast<uint64_t>(row.value);
        return true;
    }
    return ParseNumber(text, kMaxErrno, number) && *number > 0;
}

bool ParseDelay(std::string_view text, uint64_t *ms) {
    uint64_t unit = 1;
    if (text.ends_with("ms")) {
        text.remove_suffix(2);
    } else if (text.ends_with("s")) {
        text.remove_suffix(1);
        unit = 1000;
    }
    if (!ParseNumber(text, kMaxDelayMs / unit, ms)) return false;
    *ms *= unit;
    return true;
}

bool SetDrop(std::string_view value, Fault *fault) {
    if (value != "" && value != "after") return false;
    fault->drop = value == "after" ? Drop::After : Drop::Before;
    return true;
}

bool SetField(std::string_view key, std::string_view value, Fault *fault) {
    uint64_t number = 0;
    if (key == "drop") return SetDrop(value, fault);
    if (key == "command") {
        if (!ParseNumber(value, INT32_MAX, &number)) return false;
        fault->command = static_cast<int32_t>(number);
    } else if (key == "nth") {
        if (!ParseNumber(value, UINT32_MAX, &number) || number == 0) return false;
        fault->nth = number;
    } else if (key == "status") {
        if (!ParseNumber(value, UINT32_MAX, &number) || number == 0) return false;
        fault->status = static_cast<HYP_ReturnStatus>(number);
    } else if (key == "errno") {
        if (!ParseErrno(value, &number)) return false;
        fault->error = static_cast<int>(number);
    } else if (key == "delay") {
        if (!ParseDelay(value, &number)) return false;
        fault->delay = std::chrono::milliseconds(number);
    } else {
        return false;
    }
    return true;
}

bool Parse(std::string_view text, Fault *fault, std::string *why) {
    fault->text = text;
    while (!text.empty()) {
        const std::string_view field = text.substr(0, text.find(','));
        text.remove_prefix(field.size() == text.size() ? field.size() : field.size() + 1);
        const std::size_t equals = field.find('=');
        const bool plain = equals == std::string_view::npos;
        const std::string_view value = plain ? std::string_view() : field.substr(equals + 1);
        if (SetField(field.substr(0, equals), value, fault)) continue;
        *why = "bad field \"" + std::string(field) + "\"";
        return false;
    }
    if (fault->Fails() || fault->drop != Drop::No || fault->delay.count() > 0) return true;
    *why = "no effect given: add status=, errno=, delay= or drop";
    return false;
}

} // namespace

namespace dvs::emulator {

bool Faults::Add(std::string_view text, std::string *why) {
    Fault fault;
    if (!Parse(text, &fault, why)) return false;
    faults_.push_back(std::move(fault));
    return true;
}

std::optional<Fault> Faults::Next(int32_t command) {
    std::optional<Fault> next;
    for (auto fault = faults_.begin(); fault != faults_.end();) {
        const bool matches = !fault->command || *fault->command == command;
        const bool due = matches && (fault->seen++, fault->nth == 0 || fault->seen == fault->nth);
        if (due && !next) next = *fault;
        // A fault with nth= is used up by its request even if an earlier fault applies to it.
        fault = due && fault->nth != 0 ? faults_.erase(fault) : fault + 1;
    }
    return next;
}

} // namespace dvs::emulator
