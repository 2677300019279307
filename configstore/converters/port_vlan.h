/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_PORT_VLAN_H
#define CONFIGSTORE_CONVERTERS_PORT_VLAN_H

// The VLAN, VLAN trunk or private VLAN of a port.

#include "configstore/converters/converter.h"

namespace dvs::convert {

/// Type 24: the etherswitch family's key. Saves for every switch, loads for that family only.
int32_t SaveEtherswitchPortVlan(const SaveArgs &args);
int32_t LoadEtherswitchPortVlan(const LoadArgs &args);

/// Type 25: the vswitch family's key. Neither saves nor loads for an etherswitch.
int32_t SaveVswitchPortVlan(const SaveArgs &args);
int32_t LoadVswitchPortVlan(const LoadArgs &args);

} // namespace dvs::convert

#endif
