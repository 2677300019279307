/* SPDX-License-Identifier: Apache-2.0 */
// The parts of the converters' shared helpers that are more than a line (configstore/converters/common.h).

#include "configstore/converters/common.h"

#include <algorithm>

#include "dvsdata/growing_image.h"

namespace dvs::convert {

Text::Text(std::span<const uint8_t> bytes) {
    if (bytes.empty()) {
        text_ = "";
        return;
    }
    if (std::memchr(bytes.data(), 0, bytes.size())) {
        text_ = reinterpret_cast<const char *>(bytes.data());
        return;
    }
    char *copy = small_;
    if (bytes.size() >= sizeof small_) {
        large_.reset(static_cast<char *>(std::malloc(bytes.size() + 1)));
        if (!large_) return;
        copy = large_.get();
    }
    std::memcpy(copy, bytes.data(), bytes.size());
    copy[bytes.size()] = '\0';
    text_ = copy;
}

int32_t SetText(configstore::Object *object, const char *name, std::span<const uint8_t> bytes) {
    const Text text(bytes);
    return text.get() ? configstore::SetValueStr(object, name, text.get()) : kFailed;
}

int32_t AppendText(configstore::Object *object, const char *list, std::span<const uint8_t> bytes) {
    const Text text(bytes);
    return text.get() ? configstore::AppendValueString(object, list, text.get()) : kFailed;
}

void CopyUnbounded(std::span<uint8_t> value, std::size_t offset, const char *text) {
    if (offset >= value.size()) return;
    CopyBounded(value.subspan(offset), text);
}

void CopyBounded(std::span<uint8_t> slot, const char *text) {
    if (slot.empty()) return;
    const std::size_t length = strnlen(text, slot.size() - 1);
    std::memcpy(slot.data(), text, length);
    slot[length] = 0;
}

int32_t StoreAs(const LoadArgs &args, std::string_view key, std::span<const uint8_t> value,
                uint32_t propType) {
    return static_cast<int32_t>(args.list->Update(key, value, propType));
}

void LoadNumber(configstore::Object *object, const char *name, std::span<uint8_t> value,
                layout::Slot<uint32_t> slot) {
    uint32_t number = 0;
    if (configstore::GetValueUint32(object, name, &number) == 0) Put(value, slot, number);
}

int32_t KnownFilters::Get(const char *name, const configstore::FilterSpec **spec) {
    for (std::size_t i = 0; i < num_; ++i) {
        if (known_[i].name[0] != name[0] || std::strcmp(known_[i].name, name) != 0) continue;
        *spec = known_[i].filter.get();
        return 0;
    }
    const std::size_t length = strnlen(name, kNameSize);
    const bool fits = num_ < kNum && length < kNameSize;
    Filter &filter = fits ? known_[num_].filter : other_.emplace();
    if (const int32_t status = filter.Create(name)) return status;
    *spec = filter.get();
    if (fits) std::memcpy(known_[num_++].name, name, length + 1);
    return 0;
}

const char *EnumText(std::span<const char *const> table, uint32_t index) {
    return index < table.size() ? table[index] : nullptr;
}

std::optional<uint32_t> EnumIndex(std::span<const char *const> table, const char *text) {
    const auto first =
        std::find_if(table.begin(), table.end(), [](const char *slot) { return slot != nullptr; });
    for (auto slot = first; slot != table.end() && *slot; ++slot) {
        if (std::strcmp(*slot, text) == 0) return static_cast<uint32_t>(slot - table.begin());
    }
    return std::nullopt;
}

} // namespace dvs::convert
