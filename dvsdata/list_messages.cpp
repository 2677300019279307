/* SPDX-License-Identifier: Apache-2.0 */
// The messages that lists print while they are built and written (list_internal.h). In one place, because the
// switch state prints the same messages when it does the same work without a list.

#include "dvsdata/emit.h"
#include "dvsdata/list_internal.h"

namespace dvs::data {

namespace {

/// Switches below this version predate the format.
constexpr std::uint32_t kMinSwitchVersion = 4;

/// A name as a precision and a text.
int PrintLen(std::string_view name) {
    return static_cast<int>(name.size());
}

} // namespace

void EmitAllocating() {
    Emit(kTrace, "Allocing new handle\n");
}

void EmitAllocated(std::uint32_t serialSize) {
    Emit(kTrace, "DVSData handle allocated, serialSize = %d\n", serialSize);
}

void EmitAdding(std::string_view name, std::uint32_t dataLen, std::uint32_t startSize) {
    if (Emits(kDetail)) [[unlikely]]
        Emit(kDetail, "added data %.*s, len %d, start serialSize = %d\n", PrintLen(name), name.data(),
             dataLen, startSize);
}

void EmitAdded(std::string_view name, std::uint32_t serialSize) {
    if (Emits(kDetail)) [[unlikely]]
        Emit(kDetail, "added data %.*s, serialSize = %d\n", PrintLen(name), name.data(), serialSize);
}

void EmitUpdated(std::string_view name, std::uint32_t dataLen, std::uint32_t serialSize) {
    Emit(kDetail, "updated data %.*s, datalen = %d, serialSize = %d\n", PrintLen(name), name.data(), dataLen,
         serialSize);
}

void EmitRemoved(std::string_view name, std::uint32_t dataLen, std::uint32_t propType,
                 std::uint32_t serialSize) {
    Emit(kDetail, "Remove entry %.*s, datalen = %u, flag = 0x%x serialSize = %u\n", PrintLen(name),
         name.data(), dataLen, propType, serialSize);
}

void EmitOldVersion(std::uint32_t version) {
    if (version < kMinSwitchVersion) Emit(kError, "DVS version %d is smaller than 6.0.\n", version);
}

void EmitBufferSize(std::uint32_t bufSize) {
    Emit(kDetail, "allocating buffer size %d\n", bufSize);
}

void EmitWriting(std::string_view name, std::uint32_t dataLen, std::uint32_t entrySize) {
    if (Emits(kDetail)) [[unlikely]]
        Emit(kDetail, "serializing %.*s: %u/%u data/serial bytes\n", PrintLen(name), name.data(), dataLen,
             entrySize);
}

} // namespace dvs::data
