/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSFILE_TEMP_NAME_H
#define DVSFILE_TEMP_NAME_H

// Names of the temporary files of durable writes: ".BASE.dvs-" and 32 random hexadecimal digits. BASE is the
// first kMaxBaseLen characters of the state file's name, so the result fits the file system's limit for
// names.

#include <array>
#include <string_view>

namespace dvs::file {

inline constexpr std::size_t kMaxBaseLen = 200;
inline constexpr std::size_t kRandomBytes = 16;
inline constexpr std::string_view kTempMark = ".dvs-";
inline constexpr std::size_t kTempNameSize = 1 + kMaxBaseLen + kTempMark.size() + 2 * kRandomBytes + 1;

using TempName = std::array<char, kTempNameSize>;

/// Creates an unpredictable name for the file called `base`. Returns false and sets errno if the system has
/// no random bytes.
[[nodiscard]] bool MakeTempName(std::string_view base, TempName *name);

/// True if MakeTempName could have created `name` for `base`.
[[nodiscard]] bool IsTempName(std::string_view base, std::string_view name);

} // namespace dvs::file

#endif
