/* SPDX-License-Identifier: Apache-2.0 */
// The writer behind JSON input. Sizes are known first; every byte is then written once.

#include "form/encode.h"

#include <algorithm>

#include "dvsdata/format.h"
#include "form/error.h"

namespace dvs::form {

namespace {

// What a list itself would refuse: the entry's block would not fit 32 bits.
constexpr std::uint64_t kLargestValue = 0xffffffff - data::kMinEntryRoom - 16;

std::uint32_t TotalSize(std::span<const NewEntry> entries) {
    std::uint64_t total = data::kMinBufferSize;
    for (const NewEntry &entry : entries) {
        if (entry.value.size() > kLargestValue)
            total = UINT64_MAX / 2;
        else
            total += data::EntrySize(static_cast<std::uint32_t>(entry.value.size()));
        if (total > UINT32_MAX)
            throw Error(ErrorKind::Malformed, "the state is too large")
                .Because("a serialized list holds less than 4 GiB")
                .Try("divide it over several switches or hosts");
    }
    return static_cast<std::uint32_t>(total);
}

} // namespace

std::vector<std::uint8_t> EncodeList(std::span<const NewEntry> entries) {
    const std::uint32_t total = TotalSize(entries);
    std::vector<std::uint8_t> out(total, 0);
    data::Store32(out.data() + data::kTotalLengthOffset, total);
    data::Store16(out.data() + data::kVersionOffset, data::kFormatVersion);
    std::uint8_t *at = out.data() + data::kHeaderSize;
    for (const NewEntry &entry : entries) {
        const auto dataLen = static_cast<std::uint32_t>(entry.value.size());
        data::Store32(at + data::kEntrySizeOffset, data::EntrySize(dataLen));
        std::copy_n(entry.name.begin(), std::min<std::size_t>(entry.name.size(), data::kMaxNameLen),
                    at + data::kNameOffset);
        data::Store32(at + data::kPropTypeOffset, entry.type);
        data::Store32(at + data::kDataLenOffset, dataLen);
        std::copy(entry.value.begin(), entry.value.end(), at + data::kEntryFixedSize);
        at += data::EntrySize(dataLen);
    }
    data::Store32(out.data() + data::kChecksumOffset, data::Checksum(out));
    return out;
}

} // namespace dvs::form
