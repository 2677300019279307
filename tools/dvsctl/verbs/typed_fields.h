/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_VERBS_TYPED_FIELDS_H
#define DVSCTL_VERBS_TYPED_FIELDS_H

// Property values as the typed fields that the config store keeps them in, for displays. Stands on the
// library's typed view (configstore/typed/).

#include <string>
#include <vector>

#include "form/json/typed.h"
#include "tools/dvsctl/form.h"

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

/// The property in words. A plain text has no summary: it is shown as any value that is text.
TypedText DescribeProperty(TypedViews &views, const Owner &owner, const Property &property);

} // namespace dvs::ctl

#endif
