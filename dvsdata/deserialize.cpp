/* SPDX-License-Identifier: Apache-2.0 */
// The exported ways to read a buffer: into a list, or a single value without one. Leans on the readers of
// list_internal.h.

#include <cstring>

#include "dvsdata/emit.h"
#include "dvsdata/list_internal.h"

namespace dvs::data {
namespace {

/// Whoever has no buffer has one of no bytes.
Bytes AsBytes(const void *buf, std::uint32_t bufLen) {
    return {static_cast<const std::uint8_t *>(buf), buf ? bufLen : 0};
}

/// Copies the value of the entry at `at`, which matched, out of a buffer that has `room` bytes behind its
/// fixed part.
HYP_ReturnStatus CopyValue(const std::uint8_t *at, std::size_t room, const char *name, void *propVal,
                           std::uint32_t propValSize) {
    const std::uint32_t dataLen = Load32(at + kDataLenOffset);
    if (dataLen > room) return HYP_BAD_PARAM;
    if (propValSize < dataLen) {
        Emit(kError, "propVal buffer of size %u not sufficient to store value of size %u for property %s\n",
             propValSize, dataLen, name);
        return HYP_LIMIT_EXCEEDED;
    }
    std::memcpy(propVal, at + kEntryFixedSize, dataLen);
    return HYP_OK;
}

// Laxer than a list's reader: an entry's size and value length need not agree. All that is read lies in the
// buffer.
HYP_ReturnStatus FindValue(Bytes buf, const char *name, void *propVal, std::uint32_t propValSize) {
    const std::string_view wanted(name);
    for (std::size_t offset = kHeaderSize;;) {
        const std::size_t remaining = buf.size() - offset;
        if (remaining < kMarkerSize) return NoMarker();
        const std::uint8_t *const at = buf.data() + offset;
        const std::uint32_t size = Load32(at + kEntrySizeOffset);
        if (size == 0) return HYP_NOT_FOUND;
        if (size > remaining) return BlockTooLarge(size);
        if (remaining < kEntryFixedSize) return HYP_BAD_PARAM;
        const auto *const field = reinterpret_cast<const char *>(at + kNameOffset);
        if (Emits(kEntry)) [[unlikely]]
            Emit(kEntry, "deserializing %.*s: %u/%u data/serial bytes %d flag\n", static_cast<int>(kNameSize),
                 field, Load32(at + kDataLenOffset), size, Load32(at + kPropTypeOffset));
        if (NameMatches(field, wanted))
            return CopyValue(at, remaining - kEntryFixedSize, name, propVal, propValSize);
        offset += size;
    }
}

} // namespace
} // namespace dvs::data

using namespace dvs::data;

HYP_ReturnStatus DVSData_DeserializeWithPropType(DVSData **list, const void *buf, uint32_t bufLen,
                                                 DVSDataAllocFn allocFn, DVSDataFreeFn freeFn,
                                                 uint32_t typeMask) {
    return ReadList(list, AsBytes(buf, bufLen), allocFn, freeFn, typeMask);
}

HYP_ReturnStatus DVSData_Deserialize(DVSData **list, const void *buf, uint32_t bufLen, DVSDataAllocFn allocFn,
                                     DVSDataFreeFn freeFn) {
    return ReadList(list, AsBytes(buf, bufLen), allocFn, freeFn, kDeserializeTypeMask);
}

HYP_ReturnStatus DVSData_DeserializeGetPropVal(const void *buf, uint32_t bufLen, const char *name,
                                               void *propVal, uint32_t propValSize) {
    if (!buf || !name || !propVal) return HYP_BAD_PARAM;
    Bytes bytes = AsBytes(buf, bufLen);
    if (const HYP_ReturnStatus status = CheckLengths(&bytes); status != HYP_OK) return status;
    // Here the checksum is judged before the version, unlike where a list is built.
    if (const HYP_ReturnStatus status = CheckChecksum(bytes, Checksum(bytes)); status != HYP_OK)
        return status;
    const std::uint16_t version = Load16(bytes.data() + kVersionOffset);
    if (version != kFormatVersion) {
        Emit(kError, "Unsupported DVS data version %u\n", version);
        return HYP_BAD_PARAM;
    }
    return FindValue(bytes, name, propVal, propValSize);
}
