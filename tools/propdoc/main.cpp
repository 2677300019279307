/* SPDX-License-Identifier: Apache-2.0 */
// Prints docs/properties.md. Run by docs/generate-properties.sh.

#include <cstdio>

#include "configstore/layouts/document.h"

int main() {
    const std::string document = dvs::layout::PropertiesDocument();
    const bool written = std::fwrite(document.data(), 1, document.size(), stdout) == document.size();
    return written && std::fflush(stdout) == 0 ? 0 : 1;
}
