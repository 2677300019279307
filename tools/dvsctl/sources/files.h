/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_SOURCES_FILES_H
#define DVSCTL_SOURCES_FILES_H

// Reading and writing of whole files, for the sources that are files. Nothing is ever half written: a write
// replaces the file durably or leaves it as it was.

#include <optional>
#include <string>
#include <string_view>

#include "form/text.h"
#include "tools/dvsctl/cli/context.h"

namespace dvs::ctl {

/// True when a path leads somewhere; false only when it certainly leads nowhere.
bool FileExists(const std::string &path);

enum class Accept { FilesOnly, Pipes };

/// The file's bytes. A pipe (where accepted) is read until its end or the deadline. Throws Error with
/// `source` as the place.
std::string ReadWholeFile(Context &context, const std::string &path, const std::string &source,
                          Accept accept);

/// Standard input until its end. Throws Error(Timeout) at the deadline.
std::string ReadStandardInput(Context &context, const std::string &source);

enum class FileForm { State, Document }; ///< padded to what state files need, or as it is

/// Throws what ReplaceFile would throw because of the place: no file, or a directory that cannot be written
/// to. Changes nothing.
void CheckReplaceable(const std::string &path, const std::string &source);

/// Replaces the file durably (see dvs/file.h, DVSFile_WriteDurable). Throws Error; Busy when another writer
/// held the directory for too long.
void ReplaceFile(Context &context, const std::string &path, const std::string &source, Bytes contents,
                 FileForm form);

} // namespace dvs::ctl

#endif
