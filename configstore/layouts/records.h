/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_RECORDS_H
#define CONFIGSTORE_LAYOUTS_RECORDS_H

// All binary records, one header a family. layouts/registry.h says which property has which.

#include "configstore/layouts/filters.h"
#include "configstore/layouts/health_check.h"
#include "configstore/layouts/ipfix.h"
#include "configstore/layouts/lacp.h"
#include "configstore/layouts/link_discovery.h"
#include "configstore/layouts/mac_security.h"
#include "configstore/layouts/mirror.h"
#include "configstore/layouts/pools.h"
#include "configstore/layouts/port_vlan.h"
#include "configstore/layouts/private_vlan.h"
#include "configstore/layouts/scalars.h"
#include "configstore/layouts/shaping.h"
#include "configstore/layouts/switch_version.h"
#include "configstore/layouts/teaming.h"
#include "configstore/layouts/tx_uplink.h"

#endif
