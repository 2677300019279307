/* SPDX-License-Identifier: Apache-2.0 */
#ifndef BENCH_FLOOR_H
#define BENCH_FLOOR_H

// The least work the format allows: one block per entry, copied one by one, plus a checksum in four SSE2
// accumulators (plain words elsewhere). No checks, no index, no messages. The baseline of the benchmarks;
// shares no code with the library.

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace bench {

struct Prop {
    std::string name, value;
};

/// `count` properties of about 282 bytes serialized, named like the switch's own.
inline std::vector<Prop> MakeProps(std::uint32_t count) {
    std::vector<Prop> props;
    for (std::uint32_t i = 0; i < count; ++i)
        props.push_back(
            {"com.orbeno.common.port.setting." + std::to_string(i * 7919), std::string(8 + i % 32 * 8, 'v')});
    return props;
}

namespace floor {

struct Entry {
    Entry *next;
    std::uint32_t size; // the image starts here
};

inline std::uint32_t Checksum(const std::uint8_t *at, std::size_t size) {
    const std::uint8_t *const end = at + size;
    at += 32;
    std::uint32_t sum = 0;
#if defined(__SSE2__)
    __m128i a = _mm_setzero_si128(), b = a, c = a, d = a;
    for (; end - at >= 64; at += 64) {
        a = _mm_add_epi32(a, _mm_loadu_si128(reinterpret_cast<const __m128i *>(at)));
        b = _mm_add_epi32(b, _mm_loadu_si128(reinterpret_cast<const __m128i *>(at + 16)));
        c = _mm_add_epi32(c, _mm_loadu_si128(reinterpret_cast<const __m128i *>(at + 32)));
        d = _mm_add_epi32(d, _mm_loadu_si128(reinterpret_cast<const __m128i *>(at + 48)));
    }
    alignas(16) std::uint32_t lanes[4];
    _mm_store_si128(reinterpret_cast<__m128i *>(lanes),
                    _mm_add_epi32(_mm_add_epi32(a, b), _mm_add_epi32(c, d)));
    sum = lanes[0] + lanes[1] + lanes[2] + lanes[3];
#endif
    for (; end - at >= 4; at += 4) {
        std::uint32_t word;
        std::memcpy(&word, at, 4);
        sum += word;
    }
    return sum;
}

inline Entry *MakeEntry(const char *name, const void *value, std::uint32_t len) {
    const std::uint32_t size = (len + 146) & ~3u;
    auto *const entry = static_cast<Entry *>(std::malloc(size + 8));
    auto *const image = reinterpret_cast<std::uint8_t *>(entry) + 8;
    entry->next = nullptr;
    entry->size = size;
    const std::size_t nameLen = ::strnlen(name, 127);
    std::memcpy(image + 4, name, nameLen);
    image[4 + nameLen] = 0;
    const std::uint32_t type = 0x20;
    std::memcpy(image + 132, &type, 4);
    std::memcpy(image + 136, &len, 4);
    std::memcpy(image + 140, value, len);
    return entry;
}

struct List {
    Entry *head = nullptr, *tail = nullptr;
    std::uint32_t size = 16;
    List() = default;
    List(const List &) = delete;
    List &operator=(const List &) = delete;
    ~List() {
        while (head) {
            Entry *const entry = head;
            head = entry->next;
            std::free(entry);
        }
    }
    void Add(Entry *entry) {
        (tail ? tail->next : head) = entry;
        tail = entry;
        size += entry->size;
    }
};

inline std::uint8_t *Serialize(const List &list) {
    auto *const buf = static_cast<std::uint8_t *>(std::malloc(list.size));
    std::uint8_t *out = buf + 12;
    for (const Entry *entry = list.head; entry; entry = entry->next) {
        std::memcpy(out, &entry->size, entry->size);
        out += entry->size;
    }
    std::memset(out, 0, 4);
    const std::uint32_t header[3] = {list.size, Checksum(buf, list.size), 1};
    std::memcpy(buf, header, 12);
    return buf;
}

inline std::uint32_t SizeAt(const std::uint8_t *at) {
    std::uint32_t size;
    std::memcpy(&size, at, 4);
    return size;
}

inline bool Deserialize(const std::uint8_t *buf, std::uint32_t len, List *list) {
    if (Checksum(buf, len) != SizeAt(buf + 4)) return false;
    for (const std::uint8_t *at = buf + 12; const std::uint32_t size = SizeAt(at); at += size) {
        auto *const entry = static_cast<Entry *>(std::malloc(size + 8));
        entry->next = nullptr;
        std::memcpy(&entry->size, at, size);
        list->Add(entry);
    }
    return true;
}

inline const std::uint8_t *Find(const std::uint8_t *buf, std::uint32_t len, const char *name) {
    if (Checksum(buf, len) != SizeAt(buf + 4)) return nullptr;
    const std::size_t nameSize = std::strlen(name) + 1;
    for (const std::uint8_t *at = buf + 12; const std::uint32_t size = SizeAt(at); at += size)
        if (std::memcmp(at + 4, name, nameSize) == 0) return at + 140;
    return nullptr;
}

} // namespace floor
} // namespace bench

#endif
