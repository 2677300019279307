/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_TX_UPLINK_H
#define CONFIGSTORE_CONVERTERS_TX_UPLINK_H

// Whether a port transmits over every uplink.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 23: "always" or "normal" <-> bool field. Loads under the key of the switch's family only.
int32_t SaveTxUplink(const SaveArgs &args);
int32_t LoadTxUplink(const LoadArgs &args);

} // namespace dvs::convert

#endif
