/* SPDX-License-Identifier: Apache-2.0 */
// Allocates and frees switch and port records (switch_record.h).

#include "dvsstate/switch_record.h"

#include <bit>
#include <cstdlib>
#include <cstring>
#include <new>

#include "platform/runtime.h"

namespace dvs::state {

// Fronts keep the records after them aligned; the bucket array does the same for the front.
static_assert(sizeof(SwitchFront) % alignof(DVSwitch) == 0);
static_assert(sizeof(PortFront) % alignof(DVSPort) == 0);
static_assert(alignof(DVSPort *) == alignof(DVSwitch));

DVSPort **BucketsOf(DVSwitch *sw) {
    SwitchFront &front = FrontOf(sw);
    return reinterpret_cast<DVSPort **>(&front) - front.bucketCapacity;
}

namespace {

/// The number of slots rounded up to a power of two; 0 if the slots are walked anyway.
std::size_t BucketCapacity(uint32_t slotNum) {
    return slotNum > kWalkedSlots ? std::bit_ceil(std::size_t{slotNum}) : 0;
}

/// The buckets are not written until the index is built, so a switch with few ports never touches their
/// pages.
DVSwitch *NewRecord(uint32_t slotNum) {
    const std::size_t capacity = BucketCapacity(slotNum);
    if (capacity > UINT32_MAX) return nullptr;
    const std::size_t bucketSize = capacity * sizeof(DVSPort *);
    const std::size_t recordSize = sizeof(DVSwitch) + std::size_t{slotNum} * sizeof(DVSPort *);
    auto *block = static_cast<unsigned char *>(std::malloc(bucketSize + sizeof(SwitchFront) + recordSize));
    if (!block) return nullptr;
    auto *front = new (block + bucketSize) SwitchFront{};
    front->slotNum = slotNum;
    front->bucketCapacity = static_cast<uint32_t>(capacity);
    return static_cast<DVSwitch *>(std::memset(static_cast<void *>(front + 1), 0, recordSize));
}

} // namespace

HYP_ReturnStatus NewSwitch(uint32_t slotNum, DVSwitch **out) {
    DVSwitch *sw = NewRecord(slotNum);
    if (!sw) return HYP_NO_MEMORY;
    HYP_ReturnStatus status = HYP_NO_MEMORY;
    sw->portBitmap = BitVector_Alloc(slotNum);
    if (sw->portBitmap) status = DVSData_Alloc(&sw->globalPropList, std::malloc, std::free);
    if (status == HYP_OK) status = DVSData_Alloc(&sw->hostPropList, std::malloc, std::free);
    if (status != HYP_OK) {
        FreeSwitch(sw);
        return status;
    }
    *out = sw;
    return HYP_OK;
}

void FreeSwitch(DVSwitch *sw) {
    if (!sw) return;
    DVSData_Free(sw->globalPropList);
    DVSData_Free(sw->hostPropList);
    if (sw->portBitmap) BitVector_Free(sw->portBitmap);
    std::free(BucketsOf(sw));
}

DVSPort *NewPort() {
    void *block = std::malloc(sizeof(PortFront) + sizeof(DVSPort));
    if (!block) return nullptr;
    auto *front = new (block) PortFront{};
    return new (front + 1) DVSPort{};
}

void FreePort(DVSPort *port) {
    if (!port) return;
    DVSData_Free(port->portData);
    std::free(&FrontOf(port));
}

} // namespace dvs::state
