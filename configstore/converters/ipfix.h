/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_IPFIX_H
#define CONFIGSTORE_CONVERTERS_IPFIX_H

// Where and how a switch reports its flows.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 10: a packed record <-> the object "ipfix".
int32_t SaveIpfix(const SaveArgs &args);
int32_t LoadIpfix(const LoadArgs &args);

} // namespace dvs::convert

#endif
