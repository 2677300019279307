/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_LAYOUTS_VALUE_GENERATOR_H
#define TESTS_CONFIGSTORE_LAYOUTS_VALUE_GENERATOR_H

// Random values by their records: sound ones, and ones with a lie at a place that matters. The records are
// the grammar, so a new field is in the values as soon as it has its row.

#include <cstdint>
#include <random>
#include <span>
#include <string>
#include <vector>

#include "configstore/layouts/layout.h"

namespace value_generator {

class Generator {
public:
    explicit Generator(uint64_t seed) : random_(seed) {}

    /// A value that fits the record in every field: enumerations and flags with names, texts with their NUL.
    std::vector<uint8_t> Sound(const dvs::layout::Record &record);

    /// A sound value with one to three lies: absurd counts and indexes, texts without NUL, bytes cut off or
    /// added.
    std::vector<uint8_t> Lying(const dvs::layout::Record &record);

    /// Bytes without any sense.
    std::vector<uint8_t> Noise(std::size_t size);

    uint64_t Below(uint64_t bound) { return std::uniform_int_distribution<uint64_t>(0, bound - 1)(random_); }
    bool OneIn(uint64_t count) { return Below(count) == 0; }
    std::string Text(std::size_t most);

private:
    void Fields(const dvs::layout::Record &record, std::vector<uint8_t> *out);
    // A field that says how many elements of a later part belong to its record, which starts at `start`.
    struct Share {
        uint64_t count;
        const dvs::layout::Field *field;
        const dvs::layout::Record *record;
        std::size_t start;
    };
    void Record(const dvs::layout::Record &record, std::vector<uint8_t> *out, std::vector<Share> *shares);
    void Shared(const dvs::layout::Part &part, const std::vector<Share> &shares, std::vector<uint8_t> *out);
    uint64_t Number(const dvs::layout::Field &field);
    void Lie(const dvs::layout::Record &record, std::vector<uint8_t> *value);

    std::mt19937_64 random_;
};

/// The sizes at which a value of this record begins or ends to have another field or element.
std::vector<std::size_t> SizesOf(const dvs::layout::Record &record);

} // namespace value_generator

#endif
