/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_LIST_INTERNAL_H
#define DVSDATA_LIST_INTERNAL_H

// Internal operations on property lists for other layers of the library: lists with names of known length,
// removal of a given entry, writing whole nested images into one block, and reading nested buffers in place.
// Implemented in list.cpp, image_writer.cpp and buffer_reader.cpp.

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <span>
#include <string_view>

#include "dvs/data.h"
#include "dvsdata/buffer_fault.h"
#include "dvsdata/format.h"
#include "dvsdata/open_buffer.h"

namespace dvs::data {

// ---- Lists ----

/// DVSData_Append for a name that need not be NUL-terminated. Truncates the name to 127 characters.
[[nodiscard]] HYP_ReturnStatus Append(DVSData *list, std::string_view name, const void *data,
                                      std::uint32_t dataLen, std::uint32_t propType);

/// Removes and frees the entry after `previous` (null: the head), which must exist. Removes exactly this
/// entry, even if others have the same name. Prints the message of DVSDataRemove.
void RemoveAfter(DVSData *list, DVSDataEntry *previous);

// The messages of lists, also for code that does a list's work in place. `serialSize` is the list's size, or
// the entry's where an entry is written.

void EmitAllocating();
void EmitAllocated(std::uint32_t serialSize);
/// The two messages around each addition to a list.
void EmitAdding(std::string_view name, std::uint32_t dataLen, std::uint32_t startSize);
void EmitAdded(std::string_view name, std::uint32_t serialSize);
void EmitUpdated(std::string_view name, std::uint32_t dataLen, std::uint32_t serialSize);
void EmitRemoved(std::string_view name, std::uint32_t dataLen, std::uint32_t propType,
                 std::uint32_t serialSize);
/// Message for serializing a switch version older than the format.
void EmitOldVersion(std::uint32_t version);
void EmitBufferSize(std::uint32_t bufSize);
void EmitWriting(std::string_view name, std::uint32_t dataLen, std::uint32_t entrySize);

/// HYP_BAD_PARAM after a message.
[[nodiscard]] HYP_ReturnStatus EntryTooLarge(std::string_view name, std::uint32_t dataLen,
                                             std::uint32_t serialSize);

/// The size of the entry for a value of that length; HYP_BAD_PARAM for lengths at which 32-bit sizes wrap.
[[nodiscard]] inline HYP_ReturnStatus CheckedEntrySize(std::string_view name, std::uint32_t dataLen,
                                                       std::uint32_t *serialSize) {
    *serialSize = EntrySize(dataLen);
    if (dataLen <= *serialSize && *serialSize <= UINT32_MAX - kImageOffset) [[likely]]
        return HYP_OK;
    return EntryTooLarge(name, dataLen, *serialSize);
}

/// Name comparison of lookups: equal, or equal in the first 128 characters. `field` is any 128-byte name
/// field.
[[nodiscard]] inline bool NameMatches(const char *field, std::string_view name) {
    if (name.size() >= kNameSize) [[unlikely]]
        return std::memcmp(field, name.data(), kNameSize) == 0;
    // Most names share a long prefix, so compare the end first.
    return field[name.size()] == '\0' && (name.empty() || field[name.size() - 1] == name.back()) &&
           std::memcmp(field, name.data(), name.size()) == 0;
}

// ---- Writing ----

/// Selects the entries that a serialization excludes. Keeps() prints the filter's trace.
class Filter {
public:
    static Filter None() { return {}; }
    /// Excludes names that contain `needle`, but never the persist flag's key. Null excludes nothing.
    static Filter WithoutName(const char *needle) { return {needle ? Kind::Name : Kind::None, needle, 0}; }
    /// Excludes type words with any bit of `mask`.
    static Filter WithoutTypes(std::uint32_t mask) { return {Kind::Type, nullptr, mask}; }

    [[nodiscard]] bool IsNone() const { return kind_ == Kind::None; }
    [[nodiscard]] bool Keeps(const DVSDataEntry *entry) const;

private:
    enum class Kind : std::uint8_t { None, Name, Type };
    Filter() = default;
    Filter(Kind kind, const char *needle, std::uint32_t mask) : kind_(kind), needle_(needle), mask_(mask) {}

    Kind kind_ = Kind::None;
    const char *needle_ = nullptr;
    std::uint32_t mask_ = 0;
};

/// Size of the buffer from serializing `list` through `filter`.
[[nodiscard]] std::uint32_t SerializedSize(const DVSData *list, const Filter &filter);

/// Writes nested buffers front to back into one block of known size. Every byte is written once and summed
/// once: a finished buffer adds its sum to the enclosing one.
///
///     ImageWriter writer(block);
///     writer.BeginBuffer();                                  // state
///     writer.BeginEntry(switchId, 0x10, switchBufferSize);
///     writer.BeginBuffer();                                  //   switch
///     writer.Entry("switchVersion", 0x10, AsBytes(version));
///     writer.BeginEntry("globalPropList", 0x10, SerializedSize(list, filter));
///     status = writer.List(list, filter);                    //     a whole list as a buffer
///     writer.EndEntry();
///     writer.EndBuffer();
///     writer.EndEntry();
///     writer.EndBuffer();
///     ok = writer.Complete();
///
/// Never writes past the end of the block. Complete() returns whether everything fitted exactly.
class ImageWriter {
public:
    static constexpr std::size_t kMaxDepth = 4;

    explicit ImageWriter(std::span<std::uint8_t> block) : begin_(block.data()), size_(block.size()) {}

    void BeginBuffer();
    void EndBuffer();
    /// Writes the fixed part of an entry. Its value, of exactly `dataLen` bytes, must be written next.
    void BeginEntry(std::string_view name, std::uint32_t propType, std::uint32_t dataLen);
    void EndEntry();
    void Entry(std::string_view name, std::uint32_t propType, Bytes value);

    /// Copies the entry's image.
    void Image(const DVSDataEntry *entry) { Put(&entry->serialSize, entry->serialSize); }

    /// An entry that a list's buffer contains after those of the list.
    struct Extra {
        std::string_view name;
        std::uint32_t propType;
        Bytes value;
    };

    /// Writes the whole list as one buffer of `bufSize` bytes, `extra` (may be null) included. Checks and
    /// messages are those of DVSData_Serialize after the header. HYP_LIMIT_EXCEEDED: the list's size does not
    /// match its entries; discard the output.
    [[nodiscard]] HYP_ReturnStatus List(const DVSData *list, const Filter &filter, std::uint32_t bufSize,
                                        const Extra *extra = nullptr);

    [[nodiscard]] std::size_t Position() const { return at_; }
    [[nodiscard]] bool Complete() const { return !failed_ && depth_ == 0 && at_ == size_; }

private:
    struct Level {
        OpenBuffer buffer;
        std::size_t entryEnd; // of the current entry
    };

    std::uint8_t *Claim(std::size_t size);
    void Put(const void *bytes, std::size_t size);
    void Zero(std::size_t size);
    HYP_ReturnStatus Refuse(HYP_ReturnStatus status);

    std::uint8_t *begin_;
    std::size_t size_;
    std::size_t at_ = 0;
    std::array<Level, kMaxDepth> levels_{};
    std::size_t depth_ = 0;
    bool failed_ = false; // permanent: later writes are no-ops
};

// ---- Reading ----

/// The sum of a value if the enclosing buffer has computed it, so that no byte is summed twice.
struct KnownSum {
    bool known = false;
    std::uint32_t sum = 0;
};

/// One entry, in place.
struct EntryRef {
    std::uint32_t offset;  // in the buffer
    std::uint32_t size;    // as stored in the entry
    std::string_view name; // up to the NUL, at most 127 characters, as a list would store it
    std::uint32_t propType;
    Bytes value;
    KnownSum sum; // of the value, if the buffer was opened with PartSums
};

/// Prints the library's message about a fault and returns its status.
[[gnu::cold]] HYP_ReturnStatus Refuse(const Fault &fault);

/// Cuts `buf` to the length its header says. HYP_BAD_PARAM.
[[nodiscard]] HYP_ReturnStatus CutToLength(Bytes *buf);

enum class PartSums : bool { No, Yes };

/// Walks a buffer with the checks, order of failures and messages of DVSData_DeserializeWithPropType.
class BufferReader {
public:
    /// Checks the header and the checksum. HYP_BAD_PARAM, HYP_BAD_CHECKSUM.
    [[nodiscard]] HYP_ReturnStatus Open(Bytes buf, KnownSum known = {}, PartSums parts = PartSums::No);
    /// Returns the next entry of any type. HYP_NOT_FOUND after the last one; HYP_BAD_PARAM.
    [[nodiscard]] HYP_ReturnStatus Next(EntryRef *entry);
    /// Suppresses the message for each entry: for a second walk.
    void Quiet() { quiet_ = true; }

private:
    static constexpr std::size_t kMaxParts = 32;

    std::uint32_t SumParts();

    Bytes buf_; // cut to the length in the header
    std::uint32_t offset_ = 0;
    std::uint32_t size_ = 0; // of the last returned entry
    std::uint32_t index_ = 0;
    std::array<std::uint32_t, kMaxParts> parts_{};
    std::uint32_t numParts_ = 0;
    bool quiet_ = false;
};

/// A serialized list read in place. Open returns the status of DVSData_DeserializeWithPropType, with the same
/// messages; Next returns the entries that its list would hold. Copies and allocates nothing.
class InPlaceList {
public:
    [[nodiscard]] HYP_ReturnStatus Open(Bytes buf, std::uint32_t typeMask = kDeserializeTypeMask,
                                        KnownSum known = {}, PartSums parts = PartSums::No);
    /// False after the last entry.
    bool Next(EntryRef *entry);
    void Rewind() { reader_ = start_; }

private:
    BufferReader start_, reader_;
    std::uint32_t typeMask_ = 0;
};

/// Placement of entries when a list is read. Own: each in its own block, as lists with a caller's allocator
/// promise. Shared: in one block with the handle, for lists on the process heap, where callers see no
/// difference.
enum class EntryBlocks : bool { Own, Shared };

/// DVSData_DeserializeWithPropType for a value whose sum may be known already.
[[nodiscard]] HYP_ReturnStatus ReadList(DVSData **list, Bytes buf, DVSDataAllocFn allocFn,
                                        DVSDataFreeFn freeFn, std::uint32_t typeMask = kDeserializeTypeMask,
                                        KnownSum known = {}, EntryBlocks blocks = EntryBlocks::Own);

} // namespace dvs::data

#endif
