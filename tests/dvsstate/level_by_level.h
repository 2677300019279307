/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_DVSSTATE_LEVEL_BY_LEVEL_H
#define TESTS_DVSSTATE_LEVEL_BY_LEVEL_H

// A reference implementation of state serialization: each level is a separate property list, built,
// serialized and appended to the next. The library writes and reads whole states in one pass; tests compare
// its bytes, results, messages and their order with this one.

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
