/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_LIST_INTERNAL_H
#define DVSDATA_LIST_INTERNAL_H

// What the other layers of the library may use of property lists beyond the exported functions: work on lists
// with names of known length, removal of one very entry, writing whole nested images into one block, and
// reading nested buffers where they lie. Leans on format.h; implemented in list.cpp, image_writer.cpp and
// buffer_reader.cpp.

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <span>
#include <string_view>

#include "dvs/data.h"
#include "dvsdata/format.h"
#include "dvsdata/open_buffer.h"

namespace dvs::data {

// ---- Lists ----

/// DVSData_Append for a name that need not end in NUL. Characters from the 128th on are cut.
[[nodiscard]] HYP_ReturnStatus Append(DVSData *list, std::string_view name, const void *data,
                                      std::uint32_t dataLen, std::uint32_t propType);

/// Removes and frees the entry behind `previous` (null: the head), which must exist: the one that was judged,
/// also among namesakes. Prints the message of DVSDataRemove.
void RemoveAfter(DVSData *list, DVSDataEntry *previous);

// The lines that lists print, also for those who do a list's work in place. `serialSize` is the list's,
// except where an entry is written: there it is the entry's.

void EmitAllocating();
void EmitAllocated(std::uint32_t serialSize);
/// The two lines that frame each addition to a list.
void EmitAdding(std::string_view name, std::uint32_t dataLen, std::uint32_t startSize);
void EmitAdded(std::string_view name, std::uint32_t serialSize);
void EmitUpdated(std::string_view name, std::uint32_t dataLen, std::uint32_t serialSize);
void EmitRemoved(std::string_view name, std::uint32_t dataLen, std::uint32_t propType,
                 std::uint32_t serialSize);
/// Serialization for a switch of a version that is older than the format.
void EmitOldVersion(std::uint32_t version);
void EmitBufferSize(std::uint32_t bufSize);
void EmitWriting(std::string_view name, std::uint32_t dataLen, std::uint32_t entrySize);

/// Name comparison of lookups: equal, or equal in the first 128 characters. `field` is any 128-byte name
/// field.
[[nodiscard]] inline bool NameMatches(const char *field, std::string_view name) {
    if (name.size() >= kNameSize) [[unlikely]]
        return std::memcmp(field, name.data(), kNameSize) == 0;
    // Most names differ only behind a long common beginning, so the end is compared first.
    return field[name.size()] == '\0' && (name.empty() || field[name.size() - 1] == name.back()) &&
           std::memcmp(field, name.data(), name.size()) == 0;
}

// ---- Writing ----

/// Which entries a serialization leaves out. Asking prints the filter's trace.
class Filter {
public:
    static Filter None() { return {}; }
    /// Leaves out names that contain `needle`; the persist flag's key always stays. Null is no filter.
    static Filter WithoutName(const char *needle) { return {needle ? Kind::Name : Kind::None, needle, 0}; }
    /// Leaves out type words with any bit of `mask`.
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

/// Size of the buffer that serializing `list` through `filter` makes.
[[nodiscard]] std::uint32_t SerializedSize(const DVSData *list, const Filter &filter);

/// Writes nested buffers front to back into one block whose size was worked out beforehand. Every byte is
/// written once and summed once: a finished buffer hands its sum to the one around it.
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
/// The block stays untouched behind its end whatever is written; Complete() tells whether everything fitted
/// exactly.
class ImageWriter {
public:
    static constexpr std::size_t kMaxDepth = 4;

    explicit ImageWriter(std::span<std::uint8_t> block) : begin_(block.data()), size_(block.size()) {}

    void BeginBuffer();
    void EndBuffer();
    /// The fixed part of an entry whose value, of exactly `dataLen` bytes, is written next.
    void BeginEntry(std::string_view name, std::uint32_t propType, std::uint32_t dataLen);
    void EndEntry();
    void Entry(std::string_view name, std::uint32_t propType, Bytes value);

    /// A copy of the entry's image.
    void Image(const DVSDataEntry *entry) { Put(&entry->serialSize, entry->serialSize); }

    /// An entry that a list's buffer carries behind those of the list.
    struct Extra {
        std::string_view name;
        std::uint32_t propType;
        Bytes value;
    };

    /// The whole list as one buffer, with the checks and messages of DVSData_Serialize from its header on. A
    /// list of `bufSize` bytes, `extra` (may be null) included. HYP_LIMIT_EXCEEDED: the list's size and its
    /// entries do not agree; what was written is to be thrown away.
    [[nodiscard]] HYP_ReturnStatus List(const DVSData *list, const Filter &filter, std::uint32_t bufSize,
                                        const Extra *extra = nullptr);

    [[nodiscard]] std::size_t Position() const { return at_; }
    [[nodiscard]] bool Complete() const { return !failed_ && depth_ == 0 && at_ == size_; }

private:
    struct Level {
        OpenBuffer buffer;
        std::size_t entryEnd; // of the entry being written
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
    bool failed_ = false; // for good: nothing is written any more
};

// ---- Reading ----

/// A sum known from the buffer around a value, so that no byte need be summed twice.
struct KnownSum {
    bool known = false;
    std::uint32_t sum = 0;
};

/// One entry where it lies.
struct EntryRef {
    std::uint32_t offset;  // in the buffer
    std::uint32_t size;    // as the entry says
    std::string_view name; // up to the NUL, at most 127 characters: what a list would store
    std::uint32_t propType;
    Bytes value;
    KnownSum sum; // of the value, when the buffer was opened with parts summed
};

// The checks that all readers share, each with its message.

/// Cuts `buf` to the length its header says. HYP_BAD_PARAM.
[[nodiscard]] HYP_ReturnStatus CheckLengths(Bytes *buf);
/// HYP_BAD_CHECKSUM when `computed` is not what the header says.
[[nodiscard]] HYP_ReturnStatus CheckChecksum(Bytes buf, std::uint32_t computed);
/// HYP_BAD_PARAM: an entry that runs past the end.
[[nodiscard]] HYP_ReturnStatus BlockTooLarge(std::uint32_t size);
/// HYP_BAD_PARAM: less than an end marker is left behind an entry.
[[nodiscard]] HYP_ReturnStatus NoMarker();

enum class PartSums : bool { No, Yes };

/// Goes through a buffer with the checks, order of failures and messages of DVSData_DeserializeWithPropType.
class BufferReader {
public:
    /// Everything up to the checksum. HYP_BAD_PARAM, HYP_BAD_CHECKSUM.
    [[nodiscard]] HYP_ReturnStatus Open(Bytes buf, KnownSum known = {}, PartSums parts = PartSums::No);
    /// The next entry, of whatever type. HYP_NOT_FOUND behind the last one; HYP_BAD_PARAM.
    [[nodiscard]] HYP_ReturnStatus Next(EntryRef *entry);
    /// No line for each entry any more: for a second walk.
    void Quiet() { quiet_ = true; }

private:
    static constexpr std::size_t kMaxParts = 32;

    std::uint32_t SumParts();

    Bytes buf_; // as long as the header says
    std::uint32_t offset_ = 0;
    std::uint32_t size_ = 0; // of the entry handed out last
    std::uint32_t index_ = 0;
    std::array<std::uint32_t, kMaxParts> parts_{};
    std::uint32_t numParts_ = 0;
    bool quiet_ = false;
};

/// A serialized list read in place: Open says what DVSData_DeserializeWithPropType would say, with the same
/// messages, and Next gives the entries that its list would hold. Copies, allocates and keeps nothing.
class InPlaceList {
public:
    [[nodiscard]] HYP_ReturnStatus Open(Bytes buf, std::uint32_t typeMask = kDeserializeTypeMask,
                                        KnownSum known = {}, PartSums parts = PartSums::No);
    /// False behind the last entry.
    bool Next(EntryRef *entry);
    void Rewind() { reader_ = start_; }

private:
    BufferReader start_, reader_;
    std::uint32_t typeMask_ = 0;
};

/// Where the entries of a list that is read lie: each in a block of its own, which is what lists with a
/// caller's allocator promise, or in one block with the handle. The latter is for lists on the process heap,
/// where nobody can tell.
enum class EntryBlocks : bool { Own, Shared };

/// DVSData_DeserializeWithPropType for a value whose sum may be known.
[[nodiscard]] HYP_ReturnStatus ReadList(DVSData **list, Bytes buf, DVSDataAllocFn allocFn,
                                        DVSDataFreeFn freeFn, std::uint32_t typeMask = kDeserializeTypeMask,
                                        KnownSum known = {}, EntryBlocks blocks = EntryBlocks::Own);

} // namespace dvs::data

#endif
