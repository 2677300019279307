/* SPDX-License-Identifier: Apache-2.0 */
// The helpers of list_support.h.

#include "dvsdata/list_support.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <ostream>

#include "dvs/log.h"
#include "dvsdata/list_internal.h"

namespace dvs::test {
namespace {

HeapCounts g_heap;
std::uint64_t g_requests = 0;
std::uint64_t g_failAt = 0;
bool g_failOnce = false;

} // namespace

void ResetHeap() {
    g_heap = {};
    g_requests = 0;
}

FailingHeap::FailingHeap(std::uint64_t failAt, Mode mode) {
    ResetHeap();
    g_failAt = failAt;
    g_failOnce = mode == Only;
}

FailingHeap::~FailingHeap() {
    g_failAt = 0;
}

const HeapCounts &Heap() {
    return g_heap;
}

void *CountingAlloc(std::uint64_t size) {
    ++g_requests;
    if (g_failAt && (g_failOnce ? g_requests == g_failAt : g_requests >= g_failAt)) return nullptr;
    ++g_heap.allocs;
    g_heap.sizes.push_back(size);
    void *const block = std::malloc(size);
    if (block) std::memset(block, 0xa5, size); // Makes unset bytes visible.
    return block;
}

void CountingFree(void *block) {
    if (block) ++g_heap.frees;
    std::free(block);
}

ListPtr NewList() {
    DVSData *list = nullptr;
    EXPECT_EQ(DVSData_Alloc(&list, CountingAlloc, CountingFree), HYP_OK);
    return ListPtr(list);
}

void Append(DVSData *list, const Prop &prop) {
    ASSERT_EQ(DVSData_Append(list, prop.name.c_str(), prop.value.data(),
                             static_cast<std::uint32_t>(prop.value.size()), prop.type),
              HYP_OK);
}

ListPtr ListOf(const Props &props) {
    ListPtr list = NewList();
    for (const Prop &prop : props)
        Append(list.get(), prop);
    return list;
}

Props ContentOf(DVSData *list) {
    Props props;
    DVSDataEntry *entry = nullptr;
    while (DVSData_Next(list, entry, &entry) == HYP_OK) {
        void *data = nullptr;
        const std::uint32_t len = DVSData_Data(entry, &data);
        props.push_back(
            {DVSData_Name(entry), {static_cast<const char *>(data), len}, DVSData_PropType(entry)});
    }
    return props;
}

Props ContentOf(const ListPtr &list) {
    return ContentOf(list.get());
}

void PrintTo(const Prop &prop, std::ostream *out) {
    *out << '{' << prop.name << " = " << testing::PrintToString(prop.value) << ", type " << prop.type << '}';
}

void ExpectSound(DVSData *list) {
    std::uint32_t size = 16;
    DVSDataEntry *last = nullptr;
    for (DVSDataEntry *entry = list->head; entry; entry = entry->next) {
        size += entry->serialSize;
        last = entry;
    }
    EXPECT_EQ(list->serialSize, size);
    EXPECT_EQ(list->tail, last);
}

Buffer Serialized(DVSData *list) {
    void *buf = nullptr;
    std::uint32_t len = 0;
    EXPECT_EQ(DVSData_Serialize(list, &buf, &len, 9), HYP_OK);
    if (!buf) return {};
    const auto *const bytes = static_cast<const std::uint8_t *>(buf);
    Buffer copy(bytes, bytes + len);
    DVSData_FreeAssocData(list, buf);
    return copy;
}

Buffer SerializedOf(const Props &props) {
    return Serialized(ListOf(props).get());
}

std::uint32_t U32At(std::span<const std::uint8_t> buffer, std::size_t offset) {
    return static_cast<std::uint32_t>(buffer[offset]) | static_cast<std::uint32_t>(buffer[offset + 1]) << 8 |
           static_cast<std::uint32_t>(buffer[offset + 2]) << 16 |
           static_cast<std::uint32_t>(buffer[offset + 3]) << 24;
}

void SetU32(Buffer *buffer, std::size_t offset, std::uint32_t value) {
    for (unsigned i = 0; i < 4; ++i)
        (*buffer)[offset + i] = static_cast<std::uint8_t>(value >> (8 * i));
}

std::uint32_t PlainChecksum(std::span<const std::uint8_t> buffer) {
    std::uint32_t sum = 0;
    std::size_t offset = 32;
    for (; offset + 4 <= buffer.size(); offset += 4)
        sum += U32At(buffer, offset);
    for (; offset < buffer.size(); ++offset)
        sum += buffer[offset];
    return sum;
}

void Mend(Buffer *buffer) {
    const std::size_t length = std::min<std::size_t>(U32At(*buffer, 0), buffer->size());
    SetU32(buffer, 4, PlainChecksum(std::span(*buffer).first(length)));
}

std::pair<HYP_ReturnStatus, ListPtr> Read(std::span<const std::uint8_t> bytes, std::uint32_t typeMask) {
    const ExactBlock block(bytes);
    DVSData *list = nullptr;
    const HYP_ReturnStatus status = DVSData_DeserializeWithPropType(&list, block.data(), block.size(),
                                                                    CountingAlloc, CountingFree, typeMask);
    return {status, ListPtr(list)};
}

std::pair<HYP_ReturnStatus, ListPtr> ReadShared(std::span<const std::uint8_t> bytes, std::uint32_t typeMask) {
    const ExactBlock block(bytes);
    DVSData *list = nullptr;
    const HYP_ReturnStatus status = data::ReadList(&list, block.bytes(), CountingAlloc, CountingFree,
                                                   typeMask, {}, data::EntryBlocks::Shared);
    return {status, ListPtr(list)};
}

std::string U32Value(std::uint32_t value) {
    std::string bytes(4, '\0');
    std::memcpy(bytes.data(), &value, sizeof value);
    return bytes;
}

Messages::Messages(std::int32_t level) : before_(dvsdata_debug) {
    dvsdata_debug = level;
    DVSLog_SetSink(Sink, this);
}

Messages::~Messages() {
    DVSLog_SetSink(nullptr, nullptr);
    dvsdata_debug = before_;
}

bool Messages::Has(std::string_view text) const {
    for (const std::string &each : texts_)
        if (each == text) return true;
    return false;
}

void Messages::Sink(int level, const char *text, void *arg) {
    auto *const self = static_cast<Messages *>(arg);
    self->texts_.emplace_back(text);
    self->levels_.push_back(level);
}

} // namespace dvs::test
