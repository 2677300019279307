/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_FORMAT_H
#define DVSDATA_FORMAT_H

// The serialized form of a property list: the one definition of its sizes, offsets and checksum. Used by the
// list, the writer, the readers and the read-only view.
//
// All numbers are little-endian, every entry starts on a 4-byte boundary of the buffer.
//
//   buffer   offset  size
//                 0     4  total length: header, entries and end marker
//                 4     4  checksum, see Checksum()
//                 8     2  version, 1
//                10     2  reserved: written as 0, ignored by readers
//                12        entries, then the end marker, a u32 0
//
//   entry    offset  size
//                 0     4  entry size: (value length + 146) rounded down to a multiple of 4
//                 4   128  name, NUL-terminated; bytes after the NUL written as 0
//               132     4  property type word
//               136     4  value length
//               140        value, then padding up to the entry size (2 to 5 bytes when written here),
//                          written as 0

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <span>
#include <string_view>

#include "dvs/data.h"

namespace dvs::data {

static_assert(std::endian::native == std::endian::little, "images are copied, not converted");

using Bytes = std::span<const std::uint8_t>;

inline constexpr std::uint32_t kTotalLengthOffset = 0;
inline constexpr std::uint32_t kChecksumOffset = 4;
inline constexpr std::uint32_t kVersionOffset = 8;
inline constexpr std::uint32_t kReservedOffset = 10;
inline constexpr std::uint32_t kHeaderSize = 12;
inline constexpr std::uint32_t kMarkerSize = 4;
inline constexpr std::uint32_t kMinBufferSize = kHeaderSize + kMarkerSize;
inline constexpr std::uint16_t kFormatVersion = 1;

inline constexpr std::uint32_t kEntrySizeOffset = 0;
inline constexpr std::uint32_t kNameOffset = 4;
inline constexpr std::uint32_t kNameSize = 128;
inline constexpr std::uint32_t kMaxNameLen = kNameSize - 1;
inline constexpr std::uint32_t kPropTypeOffset = kNameOffset + kNameSize;
inline constexpr std::uint32_t kDataLenOffset = kPropTypeOffset + 4;
inline constexpr std::uint32_t kEntryFixedSize = kDataLenOffset + 4;
/// Readers reject an entry with less room than this besides its value; EntrySize() always leaves at least
/// this much.
inline constexpr std::uint32_t kMinEntryRoom = 143;

/// The checksum excludes the header and the first 20 bytes of the first entry (its size and 16 characters of
/// its name).
inline constexpr std::uint32_t kUnsummedSize = 32;

inline constexpr std::uint32_t kDefaultPropType = 0x20;
inline constexpr std::uint32_t kPropKindMask = 0xfc;
/// DVSData_Deserialize skips entries with none of these bits.
inline constexpr std::uint32_t kDeserializeTypeMask = 0x800000fc;

/// Size of the serialized entry for a value of this length. Wraps for lengths close to 4 GiB; see
/// DVSData_Append.
constexpr std::uint32_t EntrySize(std::uint32_t dataLen) {
    return (dataLen + (kMinEntryRoom + 3)) & ~3u;
}
static_assert(EntrySize(0) == 144 && EntrySize(1) == 144 && EntrySize(2) == 148 && EntrySize(6) == 152);

// The in-memory entry holds its serialized image after the link pointer.
inline constexpr std::size_t kImageOffset = offsetof(DVSDataEntry, serialSize);
static_assert(kImageOffset == sizeof(void *));
static_assert(offsetof(DVSDataEntry, name) == kImageOffset + kNameOffset);
static_assert(offsetof(DVSDataEntry, propType) == kImageOffset + kPropTypeOffset);
static_assert(offsetof(DVSDataEntry, dataLen) == kImageOffset + kDataLenOffset);
static_assert(offsetof(DVSDataEntry, data) == kImageOffset + kEntryFixedSize);

// Buffer accessors: buffers come from outside and may be unaligned.
inline std::uint32_t Load32(const void *from) {
    std::uint32_t value;
    std::memcpy(&value, from, sizeof value);
    return value;
}
inline std::uint16_t Load16(const void *from) {
    std::uint16_t value;
    std::memcpy(&value, from, sizeof value);
    return value;
}
inline void Store32(void *to, std::uint32_t value) {
    std::memcpy(to, &value, sizeof value);
}
inline void Store16(void *to, std::uint16_t value) {
    std::memcpy(to, &value, sizeof value);
}

/// Fills a name field: at most 127 characters, then zeros. Copies in pieces of fixed size: for a small
/// variable length compilers emit string instructions, which cost more than the rest of an append.
inline void StoreName(void *field, std::string_view name) {
    constexpr std::size_t kPiece = 16;
    auto *const to = static_cast<char *>(field);
    const std::size_t size = name.size() < kMaxNameLen ? name.size() : kMaxNameLen;
    using Wide = char __attribute__((vector_size(64)));
    const Wide zeros{};
    std::memcpy(to, &zeros, sizeof zeros);
    std::memcpy(to + sizeof zeros, &zeros, sizeof zeros);
    static_assert(2 * sizeof zeros == kNameSize);
    if (size < kPiece) {
        for (std::size_t at = 0; at < size; ++at)
            to[at] = name[at];
        return;
    }
    for (std::size_t at = 0; at + kPiece <= size; at += kPiece)
        std::memcpy(to + at, name.data() + at, kPiece);
    std::memcpy(to + size - kPiece, name.data() + size - kPiece, kPiece);
}

/// Wrapping sum of the u32 words of `bytes`, plus each byte of an incomplete last word. The sum of a whole is
/// the sum of its pieces if every piece except the last has a length that is a multiple of 4.
[[nodiscard]] std::uint32_t Sum(Bytes bytes);

/// Sum() without processor extensions, for tests that compare the two.
[[nodiscard]] std::uint32_t SumBaseline(Bytes bytes);

/// Checksum of a whole buffer: the sum of all but its first 32 bytes; 0 for a buffer of up to 32 bytes.
[[nodiscard]] inline std::uint32_t Checksum(Bytes buffer) {
    return buffer.size() <= kUnsummedSize ? 0 : Sum(buffer.subspan(kUnsummedSize));
}

} // namespace dvs::data

#endif
