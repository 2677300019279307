/* SPDX-License-Identifier: Apache-2.0 */
// Fuzz target of all readers of serialized lists: both deserializers, the in-place reader and the view, which
// must agree. The first byte says whether to recompute the header first, so that the fuzzer need not guess
// checksums.
//
//     cmake --preset clang -DDVS_BUILD_FUZZERS=ON && cmake --build --preset clang --target data_fuzz
//     build/clang/bin/data_fuzz -max_total_time=300 -max_len=4096 tests/golden

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <vector>

#include "dvs/data.h"
#include "dvsdata/buffer_view.h"
#include "dvsdata/list_internal.h"

namespace {

void *Allocate(std::uint64_t size) {
    return std::malloc(size);
}

void Demand(bool condition) {
    if (!condition) std::abort();
}

void Mend(std::vector<std::uint8_t> *bytes) {
    if (bytes->size() < dvs::data::kMinBufferSize) return;
    dvs::data::Store32(bytes->data() + dvs::data::kTotalLengthOffset,
                       static_cast<std::uint32_t>(bytes->size()));
    dvs::data::Store32(bytes->data() + 8, dvs::data::kFormatVersion);
    dvs::data::Store32(bytes->data() + dvs::data::kChecksumOffset, dvs::data::Checksum(*bytes));
}

void WalkNested(dvs::data::Bytes bytes, std::size_t offset, int depth) {
    dvs::data::BufferView view(bytes, offset);
    dvs::data::EntryView entry;
    (void)view.WalkAnyway();
    while (view.Next(&entry))
        if (depth > 0) WalkNested(entry.value, entry.ValueOffset(), depth - 1);
}

/// A list that the library writes must read back as the same list.
void RoundTrip(DVSData *list) {
    void *buf = nullptr;
    std::uint32_t len = 0;
    Demand(DVSData_Serialize(list, &buf, &len, 9) == HYP_OK);
    DVSData *again = nullptr;
    Demand(DVSData_DeserializeWithPropType(&again, buf, len, Allocate, std::free, UINT32_MAX) == HYP_OK);
    Demand(again->serialSize == list->serialSize);
    DVSData_Free(again);
    std::free(buf);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    if (size == 0) return 0;
    std::vector<std::uint8_t> bytes(data + 1, data + size);
    bytes.shrink_to_fit();
    if (data[0] & 1) Mend(&bytes);
    const auto length = static_cast<std::uint32_t>(bytes.size());

    DVSData *list = nullptr;
    const HYP_ReturnStatus status =
        DVSData_DeserializeWithPropType(&list, bytes.data(), length, Allocate, std::free, UINT32_MAX);
    Demand((list != nullptr) == (status == HYP_OK));
    Demand(dvs::data::VerifyBuffer(bytes).Status() == status);
    DVSData *shared = nullptr;
    Demand(dvs::data::ReadList(&shared, bytes, Allocate, std::free, UINT32_MAX, {},
                               dvs::data::EntryBlocks::Shared) == status);
    if (shared) RoundTrip(shared);
    DVSData_Free(shared);
    dvs::data::InPlaceList inPlace;
    Demand(inPlace.Open(bytes, UINT32_MAX, {}, dvs::data::PartSums::Yes) == status);
    WalkNested(bytes, 0, 3);
    char value[256];
    (void)DVSData_DeserializeGetPropVal(bytes.data(), length, "a", value, sizeof value);
    if (list) RoundTrip(list);
    DVSData_Free(list);
    return 0;
}
