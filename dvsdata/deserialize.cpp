/* SPDX-License-Identifier: Apache-2.0 */
// The exported functions that read a buffer: into a list, or a single value without a list. Uses the readers
// of list_internal.h.

#include <cstring>

#include "dvsdata/buffer_check.h"
#include "dvsdata/emit.h"
#include "dvsdata/list_internal.h"

namespace dvs::data {
namespace {

/// A null buffer is treated as empty.
Bytes AsBytes(const void *buf, std::uint32_t bufLen) {
    return {static_cast<const std::uint8_t *>(buf), buf ? bufLen : 0};
}

/// Copies the value of the matching entry at `at` out of a buffer with `room` bytes after the entry's fixed
/// part.
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

// Less strict than a list's reader: an entry's size and value length need not agree. No byte outside the
// buffer is read.
HYP_ReturnStatus FindValue(Bytes buf, const char *name, void *propVal, std::uint32_t propValSize) {
    const std::string_view wanted(name);
    for (std::size_t offset = kHeaderSize;;) {
        std::uint32_t size = 0;
        Fault fault;
        const Step step = CheckEntrySize(buf, offset, &size, &fault);
        if (step == Step::End) return HYP_NOT_FOUND;
        if (step == Step::Fault) return Refuse(fault);
        const std::size_t remaining = buf.size() - offset;
        if (remaining < kEntryFixedSize) return HYP_BAD_PARAM;
        const std::uint8_t *const at = buf.data() + offset;
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
    if (const HYP_ReturnStatus status = CutToLength(&bytes); status != HYP_OK) return status;
    // Unlike the list readers, this function checks the checksum before the version, with its own message.
    if (const Fault fault = CheckChecksum(bytes, Checksum(bytes))) return Refuse(fault);
    if (const Fault fault = CheckVersion(bytes)) {
        Emit(kError, "Unsupported DVS data version %u\n", fault.found);
        return fault.Status();
    }
    return FindValue(bytes, name, propVal, propValSize);
}
