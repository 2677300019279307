/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_COMMON_H
#define CONFIGSTORE_CONVERTERS_COMMON_H

// What the converters share: bytes in and out of packed values, texts of fixed slots, enumeration tables, and
// owners for everything the store hands out. No converter frees by hand or reads past the value it was given.
//
// Values are little-endian, as is every host this library runs on.

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <optional>
#include <span>

#include "configstore/converters/converter.h"
#include "configstore/layouts/layout.h"
#include "configstore/log.h"
#include "configstore/maps/prop_frame.h"
#include "platform/configstore.h"

namespace dvs::convert {

using config::kFailed;

// --- Fields of packed values. The caller has checked that the field lies inside. ---

template <typename T> [[nodiscard]] inline T Get(std::span<const uint8_t> value, std::size_t offset) {
    T field;
    std::memcpy(&field, value.data() + offset, sizeof field);
    return field;
}
template <typename T> inline void Put(std::span<uint8_t> value, std::size_t offset, T field) {
    std::memcpy(value.data() + offset, &field, sizeof field);
}
[[nodiscard]] inline uint16_t GetU16(std::span<const uint8_t> value, std::size_t offset) {
    return Get<uint16_t>(value, offset);
}
[[nodiscard]] inline uint32_t GetU32(std::span<const uint8_t> value, std::size_t offset) {
    return Get<uint32_t>(value, offset);
}
inline void PutU16(std::span<uint8_t> value, std::size_t offset, uint16_t field) {
    Put(value, offset, field);
}
inline void PutU32(std::span<uint8_t> value, std::size_t offset, uint32_t field) {
    Put(value, offset, field);
}

/// Whether `count` records of `recordSize` bytes lie behind the first `headerSize` bytes of the value.
[[nodiscard]] inline bool HoldsRecords(std::span<const uint8_t> value, std::size_t headerSize, uint64_t count,
                                       std::size_t recordSize) {
    return value.size() >= headerSize && count <= (value.size() - headerSize) / recordSize;
}

/// The count that a value of equal records begins with; nothing where so many do not lie behind it.
[[nodiscard]] inline std::optional<uint32_t> CountOf(std::span<const uint8_t> value, std::size_t recordSize) {
    if (value.size() < sizeof(uint32_t)) return std::nullopt;
    const uint32_t count = GetU32(value, 0);
    if (!HoldsRecords(value, sizeof count, count, recordSize)) return std::nullopt;
    return count;
}

/// Whether the value begins with `text` and its NUL. A shorter value is simply not equal.
[[nodiscard]] inline bool BeginsWithText(std::span<const uint8_t> value, const char *text) {
    const std::size_t size = std::strlen(text) + 1;
    return value.size() >= size && std::memcmp(value.data(), text, size) == 0;
}

// --- Texts inside a value ---

/// A NUL-terminated text for the store out of bytes that need not have a NUL: it runs from the first byte of
/// `bytes` to the first NUL, else to their end. Lent where the NUL is there, copied where it is not.
class Text {
public:
    explicit Text(std::span<const uint8_t> bytes);
    /// Null when there was no memory for the copy; else valid as long as this and the bytes.
    [[nodiscard]] const char *get() const { return text_; }

private:
    char small_[64];
    std::unique_ptr<char, decltype(&std::free)> large_{nullptr, &std::free};
    const char *text_ = nullptr;
};

/// SetValueStr and AppendValueString of the text at the start of `bytes`. kFailed when there was no memory
/// for it.
[[nodiscard]] int32_t SetText(configstore::Object *object, const char *name, std::span<const uint8_t> bytes);
[[nodiscard]] int32_t AppendText(configstore::Object *object, const char *list,
                                 std::span<const uint8_t> bytes);

/// Copies `text` with its NUL to `offset` the way an unbounded copy into a slot would: it may run into the
/// slots behind, but it stops at the end of `value`, whose last byte stays NUL.
void CopyUnbounded(std::span<uint8_t> value, std::size_t offset, const char *text);

/// Copies as much of `text` as `slot` holds beside a NUL. Bytes behind the NUL are left as they are.
void CopyBounded(std::span<uint8_t> slot, const char *text);

/// A zeroed block for a value under construction. False when there is no memory.
class Block {
public:
    [[nodiscard]] bool Allocate(std::size_t size) {
        bytes_.reset(static_cast<uint8_t *>(std::calloc(size ? size : 1, 1)));
        size_ = bytes_ ? size : 0;
        return bytes_ != nullptr;
    }
    [[nodiscard]] std::span<uint8_t> bytes() const { return {bytes_.get(), size_}; }

private:
    std::unique_ptr<uint8_t, decltype(&std::free)> bytes_{nullptr, &std::free};
    std::size_t size_ = 0;
};

/// DVSData_Update of the list under construction; the status is the converter's.
[[nodiscard]] int32_t StoreAs(const LoadArgs &args, std::string_view key, std::span<const uint8_t> value,
                              uint32_t propType);
/// The same with the row's key and type.
[[nodiscard]] inline int32_t Store(const LoadArgs &args, std::span<const uint8_t> value) {
    return StoreAs(args, args.key, value, args.propType);
}
template <typename T> [[nodiscard]] inline int32_t StoreNumber(const LoadArgs &args, T number) {
    uint8_t bytes[sizeof number];
    std::memcpy(bytes, &number, sizeof number);
    return Store(args, bytes);
}

/// A uint32 of the store into its field. One that cannot be read leaves the field as it is.
void LoadNumber(configstore::Object *object, const char *name, std::span<uint8_t> value,
                layout::Slot<uint32_t> slot);

// --- Enumeration tables: text of a value, and the way back ---

/// The text at `index`; null for an empty slot and for an index outside of the table.
[[nodiscard]] const char *EnumText(std::span<const char *const> table, uint32_t index);

/// The index of the exact text. Empty slots at the table's start are passed over, the first one after them
/// ends it.
[[nodiscard]] std::optional<uint32_t> EnumIndex(std::span<const char *const> table, const char *text);

// --- Owners of what the store hands out. Each call frees what an earlier one brought. ---

/// A string value or a generated instance id.
class StoreText {
public:
    StoreText() = default;
    ~StoreText() { Release(); }
    StoreText(const StoreText &) = delete;
    StoreText &operator=(const StoreText &) = delete;
    [[nodiscard]] int32_t Read(configstore::Object *object, const char *name) {
        return configstore::GetValueStr(object, name, Renew());
    }
    [[nodiscard]] int32_t Generate() { return configstore::GenerateInstanceId(Renew()); }
    /// Null before a successful call.
    [[nodiscard]] const char *get() const { return text_; }
    /// The text's bytes with the NUL.
    [[nodiscard]] std::span<const uint8_t> bytes() const {
        if (!text_) return {};
        return {reinterpret_cast<const uint8_t *>(text_), std::strlen(text_) + 1};
    }

private:
    void Release() {
        if (text_) configstore::FreeString(text_);
        text_ = nullptr;
    }
    char **Renew() {
        Release();
        return &text_;
    }
    char *text_ = nullptr;
};

/// A list of strings. After a failed or absent read it is empty.
class StoreTexts {
public:
    StoreTexts() = default;
    ~StoreTexts() { Release(); }
    StoreTexts(const StoreTexts &) = delete;
    StoreTexts &operator=(const StoreTexts &) = delete;
    [[nodiscard]] int32_t Read(configstore::Object *object, const char *name) {
        Release();
        return configstore::GetValueStringArray(object, name, &texts_, &count_);
    }
    [[nodiscard]] std::span<char *const> items() const {
        if (!texts_ || count_ < 1) return {};
        return {texts_, static_cast<std::size_t>(count_)};
    }

private:
    void Release() {
        if (texts_) configstore::FreeStringArray(texts_, count_);
        texts_ = nullptr;
        count_ = 0;
    }
    char **texts_ = nullptr;
    int32_t count_ = 0;
};

/// A binary value.
class StoreBytes {
public:
    StoreBytes() = default;
    ~StoreBytes() { Release(); }
    StoreBytes(const StoreBytes &) = delete;
    StoreBytes &operator=(const StoreBytes &) = delete;
    [[nodiscard]] int32_t Read(configstore::Object *object, const char *name) {
        Release();
        return configstore::GetValueBinary(object, name, &data_, &size_);
    }
    [[nodiscard]] std::span<const uint8_t> bytes() const {
        if (!data_) return {};
        return {static_cast<const uint8_t *>(data_), size_};
    }

private:
    void Release() {
        if (data_) configstore::FreeBinary(data_);
        data_ = nullptr;
        size_ = 0;
    }
    void *data_ = nullptr;
    uint32_t size_ = 0;
};

/// A filter spec on one name, as lists of instances are read and emptied with.
class Filter {
public:
    Filter() = default;
    ~Filter() {
        if (spec_) configstore::DestroyFilterSpecObject(spec_);
    }
    Filter(const Filter &) = delete;
    Filter &operator=(const Filter &) = delete;
    [[nodiscard]] int32_t Create(const char *name) {
        return configstore::CreateFilterSpecObject(name, "", "", "", &spec_);
    }
    [[nodiscard]] const configstore::FilterSpec *get() const { return spec_; }

private:
    configstore::FilterSpec *spec_ = nullptr;
};

/// The filter specs that one load has made so far: every port is asked for the same lists.
class KnownFilters {
public:
    /// The spec on one name, made when it is asked for first; good until the next call. A status, and
    /// nothing in `spec`, when it cannot be made.
    [[nodiscard]] int32_t Get(const char *name, const configstore::FilterSpec **spec);

private:
    static constexpr std::size_t kNum = 8;
    static constexpr std::size_t kNameSize = 32; // with the terminator

    struct Known {
        char name[kNameSize];
        Filter filter;
    };
    Known known_[kNum];
    std::size_t num_ = 0;
    std::optional<Filter> other_; // for which there was no room
};

/// The instances of one list, in the store's order. Empty after a failed or absent read.
class Instances {
public:
    Instances() = default;
    ~Instances() { Release(); }
    Instances(const Instances &) = delete;
    Instances &operator=(const Instances &) = delete;
    [[nodiscard]] int32_t Read(configstore::Object *parent, const configstore::FilterSpec *spec) {
        Release();
        return configstore::GetSubObjectInstances(parent, spec, &objects_, &count_);
    }
    /// Both steps at once, for callers to whom a failed filter spec is a failed read.
    [[nodiscard]] int32_t Read(configstore::Object *parent, const char *name) {
        Filter filter;
        const int32_t status = filter.Create(name);
        return status ? status : Read(parent, filter.get());
    }
    /// The same with the filter specs of the load.
    [[nodiscard]] int32_t Read(const LoadArgs &args, configstore::Object *parent, const char *name) {
        const configstore::FilterSpec *spec = nullptr;
        const int32_t status = args.context.filters->Get(name, &spec);
        return status ? status : Read(parent, spec);
    }
    [[nodiscard]] std::span<configstore::Object *const> items() const {
        if (!objects_ || count_ < 1) return {};
        return {objects_, static_cast<std::size_t>(count_)};
    }

private:
    void Release() {
        if (objects_) configstore::FreeSubObjectArray(objects_);
        objects_ = nullptr;
        count_ = 0;
    }
    configstore::Object **objects_ = nullptr;
    int32_t count_ = 0;
};

} // namespace dvs::convert

#endif
