/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSFILE_TEMP_NAME_H
#define DVSFILE_TEMP_NAME_H

// Names of the temporary files of durable writes: ".BASE.dvs-" and 32 random hexadecimal digits, BASE being
// the first kMaxBaseLen characters of the state file's own name, so that every name the file system allows
// has room for it.

#include <array>
#include <string_view>

namespace dvs::file {

inline constexpr std::size_t kMaxBaseLen = 200;
inline constexpr std::size_t kRandomBytes = 16;
inline constexpr std::string_view kTempMark = ".dvs-";
inline constexpr std::size_t kTempNameSize = 1 + kMaxBaseLen + kTempMark.size() + 2 * kRandomBytes + 1;

using TempName = std::array<char, kTempNameSize>;

/// Makes a name that cannot be foreseen for the file called `base`. False, with errno set, when the system
/// gives no random bytes.
[[nodiscard]] bool MakeTempName(std::string_view base, TempName *name);

/// Whether `name` is one that MakeTempName gives for `base`.
[[nodiscard]] bool IsTempName(std::string_view base, std::string_view name);

} // namespace dvs::file

#endif
