/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_CONVERTERS_ROUND_TRIP_MODEL_H
#define TESTS_CONFIGSTORE_CONVERTERS_ROUND_TRIP_MODEL_H

// What a sound value is after a save and a load, said a second time: with plain offsets, without a store, and
// without anything of the converters.

#include "configstore/converters/converter_fixture.h"

namespace converter_test {

struct ModelSwitch {
    const char *className;
    const char *version;
    bool overlay;
    [[nodiscard]] bool IsEtherswitch() const;
    [[nodiscard]] bool IsWide() const; // port records of mirror sessions
};

/// The properties that a load brings after this one was saved alone. Instances with the same key count as one
/// in the store: the caller keeps them apart (see HasDistinctKeys).
Properties Predict(const ModelSwitch &sw, uint32_t propClass, const std::string &key, uint32_t type,
                   const std::vector<uint8_t> &value);

/// Whether all elements that the store keeps by a key have one, and one of their own.
bool HasDistinctKeys(uint32_t type, const std::vector<uint8_t> &value);

} // namespace converter_test

#endif
