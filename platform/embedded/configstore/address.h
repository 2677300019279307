/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_ADDRESS_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_ADDRESS_H

// Where an object stands in a store.

#include <compare>
#include <cstdint>
#include <string>

namespace configstore {

enum class Layer : uint8_t { Current, Desired };

/// "current" and "desired".
[[nodiscard]] constexpr const char *LayerName(Layer layer) {
    return layer == Layer::Current ? "current" : "desired";
}

struct Address {
    Layer layer = Layer::Current;
    std::string key, group, component, instance;
    auto operator<=>(const Address &) const = default;
};

/// "key/group/component[instance]".
[[nodiscard]] inline std::string AddressText(const Address &address) {
    return address.key + '/' + address.group + '/' + address.component + '[' + address.instance + ']';
}

} // namespace configstore

#endif
