/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_FORM_H
#define DVSCTL_FORM_H

// The program shows states in the form library's terms, so its files use those names without a namespace.

namespace dvs::form {}

namespace dvs::ctl {
using namespace form;
}

#endif
