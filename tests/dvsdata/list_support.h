/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_DVSDATA_LIST_SUPPORT_H
#define TESTS_DVSDATA_LIST_SUPPORT_H

// Helpers of the property list tests: an allocator that counts and fails on demand, owners, captured
// messages, and buffers in blocks of exactly their size, so that AddressSanitizer reports any overread.

#include <cstdint>
#include <cstring>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "dvs/data.h"

namespace dvs::test {

// ---- Allocation ----

struct HeapCounts {
    std::uint64_t allocs = 0; // successful ones
    std::uint64_t frees = 0;
    std::vector<std::uint64_t> sizes; // of every successful request, in order
    std::uint64_t Live() const { return allocs - frees; }
};

/// Zeroes the counts.
void ResetHeap();

/// Zeroes the counts. While it lives, the `failAt`-th request (from 1) fails: alone (`Only`), or with all
/// later ones (`From`).
class FailingHeap {
public:
    enum Mode { From, Only };
    explicit FailingHeap(std::uint64_t failAt, Mode mode = From);
    ~FailingHeap();
    FailingHeap(const FailingHeap &) = delete;
    FailingHeap &operator=(const FailingHeap &) = delete;
};

const HeapCounts &Heap();
void *CountingAlloc(std::uint64_t size);
void CountingFree(void *block);

struct FreeList {
    void operator()(DVSData *list) const { DVSData_Free(list); }
};
using ListPtr = std::unique_ptr<DVSData, FreeList>;

/// An empty list on the counting allocator.
ListPtr NewList();

// ---- Content ----

struct Prop {
    std::string name;
    std::string value;
    std::uint32_t type = 0x20;
    bool operator==(const Prop &) const = default;
};
using Props = std::vector<Prop>;

void Append(DVSData *list, const Prop &prop);
ListPtr ListOf(const Props &props);
Props ContentOf(DVSData *list);
Props ContentOf(const ListPtr &list);
void PrintTo(const Prop &prop, std::ostream *out);

/// Checks the handle's invariants: the chain ends at the tail, and the sizes add up.
void ExpectSound(DVSData *list);

// ---- Buffers ----

using Buffer = std::vector<std::uint8_t>;

/// A heap copy of exactly that size.
class ExactBlock {
public:
    explicit ExactBlock(std::span<const std::uint8_t> bytes)
        : data_(new std::uint8_t[bytes.size()]), size_(static_cast<std::uint32_t>(bytes.size())) {
        if (!bytes.empty()) std::memcpy(data_.get(), bytes.data(), bytes.size());
    }
    const std::uint8_t *data() const { return data_.get(); }
    std::uint32_t size() const { return size_; }
    std::span<const std::uint8_t> bytes() const { return {data_.get(), size_}; }

private:
    std::unique_ptr<std::uint8_t[]> data_;
    std::uint32_t size_;
};

Buffer Serialized(DVSData *list);
Buffer SerializedOf(const Props &props);
std::uint32_t U32At(std::span<const std::uint8_t> buffer, std::size_t offset);
void SetU32(Buffer *buffer, std::size_t offset, std::uint32_t value);
/// The checksum computed by its definition, byte by byte, independently of the library.
std::uint32_t PlainChecksum(std::span<const std::uint8_t> buffer);
/// Recomputes the checksum for the length in the header, capped at the buffer's size.
void Mend(Buffer *buffer);
/// Deserializes from a block of the exact size. Returns a null list on failure.
std::pair<HYP_ReturnStatus, ListPtr> Read(std::span<const std::uint8_t> bytes,
                                          std::uint32_t typeMask = 0x800000fc);
/// The same, with the entries in one block with the handle.
std::pair<HYP_ReturnStatus, ListPtr> ReadShared(std::span<const std::uint8_t> bytes,
                                                std::uint32_t typeMask = 0x800000fc);
std::string U32Value(std::uint32_t value);

// ---- Messages ----

/// Collects messages at a debug level while it lives.
class Messages {
public:
    explicit Messages(std::int32_t level);
    ~Messages();
    Messages(const Messages &) = delete;
    Messages &operator=(const Messages &) = delete;

    const std::vector<std::string> &All() const { return texts_; }
    std::vector<std::string> Take() { return std::exchange(texts_, {}); }
    const std::vector<int> &Levels() const { return levels_; }
    bool Has(std::string_view text) const;

private:
    static void Sink(int level, const char *text, void *arg);
    std::vector<std::string> texts_;
    std::vector<int> levels_;
    std::int32_t before_;
};

} // namespace dvs::test

#endif
