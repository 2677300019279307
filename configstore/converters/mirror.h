/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_MIRROR_H
#define CONFIGSTORE_CONVERTERS_MIRROR_H

// Port mirroring sessions of a switch and of a port.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 9: one table of sessions <-> the instances of "vspans". A load reads the switch's version for the
/// size of the port records, except for ports; all others take it from the context.
int32_t SaveMirrorSessions(const SaveArgs &args);
int32_t LoadMirrorSessions(const LoadArgs &args);

} // namespace dvs::convert

#endif
