/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_BUFFER_CHECK_H
#define DVSDATA_BUFFER_CHECK_H

// The checks of a serialized list, for its readers and its view. Each finds a fault and prints nothing.
// Offsets count from the start of the buffer.
//
// No byte outside the given ones is read. Callers check the lengths first, cut the bytes to the header's
// total length, and then walk: every step checks an entry's size against the bytes left before the walk moves
// past the entry.

#include <cstddef>
#include <cstdint>

#include "dvsdata/buffer_fault.h"
#include "dvsdata/format.h"

namespace dvs::data {

/// TooShort, LengthTooSmall, LengthTooLarge.
[[nodiscard]] inline Fault CheckLengths(Bytes bytes) {
    const auto size = static_cast<std::uint32_t>(bytes.size());
    if (bytes.size() < kMinBufferSize) return {FaultKind::TooShort, bytes.size(), size, kMinBufferSize};
    const std::uint32_t total = Load32(bytes.data() + kTotalLengthOffset);
    if (total < kMinBufferSize) return {FaultKind::LengthTooSmall, kTotalLengthOffset, total, kMinBufferSize};
    if (total > bytes.size()) return {FaultKind::LengthTooLarge, kTotalLengthOffset, total, size};
    return {};
}

/// Version. The lengths must be sound.
[[nodiscard]] inline Fault CheckVersion(Bytes buffer) {
    const std::uint16_t version = Load16(buffer.data() + kVersionOffset);
    if (version == kFormatVersion) return {};
    return {FaultKind::Version, kVersionOffset, version, kFormatVersion};
}

/// Checksum. The lengths must be sound; `computed` is the checksum of the buffer.
[[nodiscard]] inline Fault CheckChecksum(Bytes buffer, std::uint32_t computed) {
    const std::uint32_t stored = Load32(buffer.data() + kChecksumOffset);
    if (stored == computed) return {};
    return {FaultKind::Checksum, kChecksumOffset, stored, computed};
}

enum class Step : std::uint8_t { Entry, End, Fault };

/// An entry whose sizes are sound.
struct CheckedEntry {
    const std::uint8_t *at;
    std::uint32_t size, dataLen;
};

/// The size of the entry at `offset`, which is at most the buffer's size. NoMarker, EntryTooLarge.
inline Step CheckEntrySize(Bytes buffer, std::size_t offset, std::uint32_t *size, Fault *fault) {
    const auto left = static_cast<std::uint32_t>(buffer.size() - offset);
    if (left < kMarkerSize) [[unlikely]] {
        *fault = {FaultKind::NoMarker, offset, left, kMarkerSize};
        return Step::Fault;
    }
    *size = Load32(buffer.data() + offset + kEntrySizeOffset);
    if (*size == 0) return Step::End;
    if (*size <= left) [[likely]]
        return Step::Entry;
    *fault = {FaultKind::EntryTooLarge, offset, *size, left};
    return Step::Fault;
}

/// The same, and checks that the entry has room for its fixed part and its value. Also EntryLengths.
inline Step CheckEntry(Bytes buffer, std::size_t offset, CheckedEntry *entry, Fault *fault) {
    std::uint32_t size = 0;
    if (const Step step = CheckEntrySize(buffer, offset, &size, fault); step != Step::Entry) return step;
    const std::uint8_t *const at = buffer.data() + offset;
    // The room check rejects every size below 143, so also an entry without a whole fixed part.
    const std::uint32_t dataLen = buffer.size() - offset >= kEntryFixedSize ? Load32(at + kDataLenOffset) : 0;
    if (dataLen > size || size - dataLen < kMinEntryRoom) [[unlikely]] {
        *fault = {FaultKind::EntryLengths, offset, dataLen, size};
        return Step::Fault;
    }
    *entry = {at, size, dataLen};
    return Step::Entry;
}

} // namespace dvs::data

#endif
