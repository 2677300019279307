/* SPDX-License-Identifier: Apache-2.0 */
// The table of sources. The first row is what a name without a scheme means.

#include "tools/dvsctl/sources/schemes.h"

namespace dvs::ctl {

namespace {

constexpr Scheme kSchemes[] = {
    // name, form, summary, opener
    {"file", "file:PATH", "a state file; a plain PATH means the same", OpenFileSource},
    {"json", "json:PATH",
     "a state as a JSON document, for people and programs; json:- is standard input or output",
     OpenJsonSource},
    {"store", "store:[PATH]",
     "the host's config store, current configuration (default: DVS_CONFIGSTORE or the host's own)",
     OpenStoreSource},
    {"store-desired", "store-desired:[PATH]", "the same, desired user configuration; can only be read",
     OpenStoreDesiredSource},
    {"kernel", "kernel:", "the live state of the switching module (or of the emulator at DVS_EMULATOR)",
     OpenKernelSource},
};

} // namespace

std::span<const Scheme> Schemes() {
    return kSchemes;
}

} // namespace dvs::ctl
