/* SPDX-License-Identifier: Apache-2.0 */
#ifndef FORM_JSON_TYPED_H
#define FORM_JSON_TYPED_H

// The library's typed values (configstore/typed/) as JSON and back: what "typed" holds in documents.

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>

#include <boost/json/value.hpp>

#include "configstore/typed/typed_value.h"
#include "form/model.h"

namespace dvs::form {

/// Whose a property is, as far as its meaning depends on it.
struct Owner {
    std::uint32_t propClass = 0; ///< DVS_PROP_CLASS_*
    std::uint32_t version = 0;   ///< of the switch
};

/// Of the properties of an entry of the switch.
Owner OwnerOf(const Switch &sw, const Entry &entry);

boost::json::value NodeToJson(const typed::Node &node);

/// "typed" and "summary" of a value, or "damage", as they stand beside its bytes.
void AddMeaning(const typed::View &view, boost::json::object &object);

/// What makes a JSON value no tree: a number that is not whole, or too large.
struct NodeFlaw {
    std::string field, reason;
};
/// Empty, with the flaw told, where the value is no tree.
std::optional<typed::Node> NodeFromJson(const boost::json::value &value, NodeFlaw &flaw);

/// Descriptions of properties. Ports are much alike, so each value is looked into only once, as long as it is
/// among the last some ten thousand.
class TypedViews {
public:
    /// Valid until the next call.
    const typed::View &Of(const Owner &owner, const Property &property) { return Find(owner, property).view; }

    /// Whether its tree, read as JSON again, builds these very bytes.
    bool IsExact(const Owner &owner, const Property &property);

private:
    struct Found {
        typed::View view;
        std::optional<bool> isExact; // once asked for
    };
    using Generation = std::unordered_map<std::string, Found>;

    Found &Find(const Owner &owner, const Property &property);

    // When the younger is full it becomes the older, whose values are forgotten unless they are met again.
    Generation younger_, older_;
    std::string key_;
};

} // namespace dvs::form

#endif
