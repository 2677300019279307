/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_SOURCES_SCHEMES_H
#define DVSCTL_SOURCES_SCHEMES_H

// The openers of the sources; one per file in this folder, one row each in schemes.cpp.

#include <memory>
#include <string_view>

#include "tools/dvsctl/sources/source.h"

namespace dvs::ctl {

std::unique_ptr<Source> OpenFileSource(std::string_view path);
std::unique_ptr<Source> OpenJsonSource(std::string_view path);
std::unique_ptr<Source> OpenStoreSource(std::string_view path);
std::unique_ptr<Source> OpenStoreDesiredSource(std::string_view path);
std::unique_ptr<Source> OpenKernelSource(std::string_view rest);

} // namespace dvs::ctl

#endif
