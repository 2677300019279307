/* SPDX-License-Identifier: Apache-2.0 */
// Transmit-uplink mode of a port: one of two texts <-> the bool "tx_uplink". Called through the converter
// table.

#include "configstore/converters/tx_uplink.h"

#include "configstore/converters/common.h"
#include "configstore/layouts/tx_uplink.h"

namespace dvs::convert {

int32_t SaveTxUplink(const SaveArgs &args) {
    return configstore::SetValueBool(args.parent, args.leaf, BeginsWithText(args.value, "always"));
}

int32_t LoadTxUplink(const LoadArgs &args) {
    const bool wanted = args.context.switchClass == 0 ? args.key == "com.orbeno.etherswitch.port.txUplink"
                                            : args.key == "com.orbeno.vswitch.port.txUplink";
    if (!wanted) return 0;
    bool always = false;
    const int32_t status = configstore::GetValueBool(args.parent, args.leaf, &always);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    const char *mode = always ? "always" : "normal";
    return Store(args, {reinterpret_cast<const uint8_t *>(mode), layout::kTxUplink.size});
}

} // namespace dvs::convert
