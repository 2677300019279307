/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_ROUND_TRIP_KEYS_H
#define TESTS_CONFIGSTORE_ROUND_TRIP_KEYS_H

// The model's table of mapped keys: in load order, with their place in the store, which several keys may
// share, and the switches that load them. The table is independent; a test compares its keys with the
// library's.

#include <cstdint>
#include <span>

#include "configstore/layouts/converter_type.h"

namespace round_trip {

enum class LoadsOn : uint8_t {
    kAll,
    kEtherswitch,      // class code 0
    kVswitches,        // the other two
    kVswitch,          // class code 1 alone
    kPrivateVlanOwner, // etherswitches and vswitches below the overlay versions
    kPrivateVlanOther, // the rest
    kUplinkPorts,
};

struct Key {
    const char *name;
    dvs::ConverterType type;
    const char *place;
    LoadsOn loads;
};

std::span<const Key> KeysOf(uint32_t propClass);

} // namespace round_trip

#endif
