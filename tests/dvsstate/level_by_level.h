/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_DVSSTATE_LEVEL_BY_LEVEL_H
#define TESTS_DVSSTATE_LEVEL_BY_LEVEL_H

// State serialization the plain way: every level a property list of its own, built, serialized and put into
// the next. The library writes and reads whole states in one go; this is what its bytes, results, messages
// and their order are held against.

#include <cstdint>

#include "dvs/state.h"

namespace dvs::test::plain {

HYP_ReturnStatus PortSerialize(DVSPort *port, void **buf, std::uint32_t *len);
HYP_ReturnStatus SwitchSerialize(DVSwitch *sw, void **buf, std::uint32_t *len);
HYP_ReturnStatus ConfigSerialize(void **buf, std::uint32_t *len);
HYP_ReturnStatus PortAddDeserialize(DVSwitch *sw, const char *portId, const void *buf, std::uint32_t len);
HYP_ReturnStatus SwitchDeserialize(const char *switchId, const void *buf, std::uint32_t len);
HYP_ReturnStatus ConfigDeserialize(const void *buf, std::uint32_t len);

} // namespace dvs::test::plain

#endif
