/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_TYPED_FIELDS_H
#define DVSCTL_TYPED_FIELDS_H

// Property values as the typed fields that the config store keeps them in, for displays. Stands on the
// library's typed view (configstore/typed/).

#include <string>
#include <vector>

#include <boost/json/fwd.hpp>

#include "tools/dvsctl/model.h"

namespace dvs::ctl {

/// One line of a field tree.
struct FieldLine {
    std::size_t depth; ///< 0 is a field of the value itself
    std::string name;  ///< escaped
    std::string value; ///< escaped, with its unit; empty where the fields follow below
};

struct TypedText {
    std::string summary;          ///< the value on one line, escaped; empty where only the bytes can be shown
    std::string damage;           ///< a known property whose bytes do not fit it: why, escaped
    std::vector<FieldLine> lines; ///< what does not fit on one line
};

/// The property of an entry of a switch, in words.
TypedText DescribeProperty(const Switch &sw, const Entry &entry, const Property &property);

/// Adds "fields" and "summary" to each known property of the document's "switches" (or "damage", where its
/// bytes do not fit it); `switches` is SwitchesToJson of the state.
void AddTypedFields(const State &state, boost::json::array &switches);

} // namespace dvs::ctl

#endif
