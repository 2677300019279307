/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_FILE_H
#define DVS_FILE_H

#include <stdbool.h>
#include <stdint.h>

#include "dvs/status.h"

#ifdef __cplusplus
extern "C" {
#endif

/*
 * The state file: one serialized state (dvs/state.h) on disk, from offset 0, followed by zero bytes up to the next
 * multiple of 512. The padding carries no meaning and the file layer does not look inside the buffer; its header says
 * how long it is. A valid file is never empty. A file whose padded size is 4 GiB or more is refused everywhere with
 * HYP_BAD_PARAM, before anything is touched or allocated.
 *
 * There are two ways to write one:
 *
 *   DVSFile_Write, DVSFile_WriteClassical   replace the file, or overwrite it in place, with one direct write where
 *                                           the file system takes direct I/O and a plain one where it does not. A
 *                                           replaced file is whole for every reader, old or new, as long as the
 *                                           machine runs. Nothing is flushed: after a power cut a save that returned
 *                                           HYP_OK may be gone, and on some file systems so may the old contents.
 *                                           Two writers at once share one temporary name and may spoil each other's
 *                                           file.
 *   DVSFile_WriteDurable                    replaces the file so that HYP_OK means it is on disk, and that whatever
 *                                           happens, power cut included, the path holds the old or the new contents,
 *                                           whole. Writers wait for each other.
 *
 * Paths are NUL-terminated and lent for the call. Failures with a message put it into the host's log (LogV with 2, or
 * the sink of dvs/log.h with level -1); no debug level guards it. No function takes one of the library's locks or uses
 * the switch table; all may be called from several threads.
 */

/*
 * Writes the state file.
 *
 * path      the file. Created with mode 0600 less the umask; what exists keeps its mode.
 * buf, len  the bytes to write. A length of 0 leaves a file of one byte, which no read accepts. `buf` may be NULL
 *           when `len` is 0.
 * viaTemp   true: write PATH.tmp (whatever stands under that name is overwritten) and rename it onto the path, so
 *           that a failure never damages the existing file. A failure after the open leaves PATH.tmp behind.
 *           false: overwrite the file itself; a failure may leave it with a length of one byte.
 *
 * HYP_OK.
 * HYP_BAD_PARAM    no buffer for a length above 0, or a file of 4 GiB or more; nothing is touched.
 * HYP_NO_MEMORY    no path, or an allocation failed; the file being written may have been truncated.
 * HYP_IO_ERROR     it cannot be opened for writing or truncated (a directory, a FIFO, a missing folder, …).
 * HYP_WRITE_ERROR  the write took fewer bytes than it was given, or it or the rename failed.
 */
HYP_ReturnStatus DVSFile_WriteClassical(const char *path, const void *buf, uint32_t len, bool viaTemp);

/* DVSFile_WriteClassical with `viaTemp`. */
HYP_ReturnStatus DVSFile_Write(const char *path, const void *buf, uint32_t len);

/*
 * Reads the state file whole. A FIFO is no reason to wait: it counts as empty.
 *
 * path         the file.
 * buf          gets the file's contents, at an address that is a multiple of 512.
 * len          gets the file's size, padding included: at most 4 GiB - 512.
 * alignOffset  gets the distance of `*buf` from the start of its block. The caller owns the block and releases it
 *              with free((char *)*buf - *alignOffset).
 * On failure the three are untouched and nothing is left allocated. None may be NULL.
 *
 * HYP_OK.
 * HYP_NOT_FOUND   the file cannot be opened, for whatever reason.
 * HYP_FILE_EMPTY  its size is 0 or cannot be queried.
 * HYP_BAD_PARAM   it is 4 GiB or larger, or an output is missing.
 * HYP_IO_ERROR    its size is not a multiple of 512.
 * HYP_NO_MEMORY   the allocation failed.
 * HYP_READ_ERROR  the read gave another number of bytes than the file's size, or failed.
 */
HYP_ReturnStatus DVSFile_ReadClassical(const char *path, void **buf, uint32_t *len, uint32_t *alignOffset);

/* The same as DVSFile_ReadClassical. */
HYP_ReturnStatus DVSFile_Read(const char *path, void **buf, uint32_t *len, uint32_t *alignOffset);

/*
 * Writes the state file so that it survives a power cut: under an exclusive flock of its directory, into a temporary
 * file beside it that nobody else can have named, flushed, renamed onto the path, the directory flushed.
 *
 * path      the file. A symbolic link stays, and what it points to is replaced or, if absent, created. The file has
 *           mode 0600 afterwards, whatever the umask and whatever it had before, and belongs to the writing user;
 *           further hard links to the old file keep the old contents. Its directory must be readable and writable.
 * buf, len  the bytes to write; at least one.
 *
 * Temporary files that a writer of this path left behind (it was killed) are removed first; anything else, whatever
 * its name or kind, is left alone. The temporary file is gone when the call returns, on success and on failure.
 * Allocates nothing itself. Waits up to 10 s for another writer of the same directory.
 *
 * HYP_OK           the new contents are on disk.
 * HYP_BAD_PARAM    `len` is 0, there is no buffer, or the file would have 4 GiB or more; nothing is touched.
 * HYP_NO_MEMORY    no path.
 * HYP_IO_ERROR     the directory cannot be opened or locked in time, no temporary file can be created in it, the path
 *                  is too long, ends in a slash or leads through too many links, or names a FIFO, a socket or a
 *                  device. The old file is as it was.
 * HYP_WRITE_ERROR  a write, a flush or the rename failed (a directory under the path's name, say). The old file is as
 *                  it was, unless it was the directory's flush: then the new one is there, whole, and a power cut may
 *                  still bring back the old one.
 */
HYP_ReturnStatus DVSFile_WriteDurable(const char *path, const void *buf, uint32_t len);

#ifdef __cplusplus
}
#endif

#endif
