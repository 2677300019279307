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
 * multiple of 512. The padding carries no meaning. The file layer does not parse the buffer, whose header gives its
 * length. A valid file is never empty. Every function rejects a file whose padded size is 4 GiB or more with
 * HYP_BAD_PARAM, before it touches or allocates anything.
 *
 * There are two ways to write one:
 *
 *   DVSFile_Write, DVSFile_WriteClassical   replace the file, or overwrite it in place, with one direct write, or a
 *                                           plain one if the file system does not support direct I/O. As long as the
 *                                           machine runs, readers see a replaced file whole, old or new. Nothing is
 *                                           flushed: after a power cut a save that returned HYP_OK may be lost, and on
 *                                           some file systems the old contents too. Two concurrent writers share one
 *                                           temporary name and may corrupt each other's file.
 *   DVSFile_WriteDurable                    replaces the file atomically. HYP_OK means the new contents are on disk.
 *                                           After any failure, power cut included, the path holds the old or the new
 *                                           contents, whole. Writers wait for each other.
 *
 * Paths are NUL-terminated and used only during the call. Failures that have a message write it to the host's log
 * (LogV with 2, or the sink of dvs/log.h with level -1); no debug level suppresses it. No function takes one of the
 * library's locks or uses the switch table. All are thread-safe.
 */

/*
 * Writes the state file.
 *
 * path      the file. Created with mode 0600 less the umask; an existing file keeps its mode.
 * buf, len  the bytes to write. A length of 0 leaves a file of one byte, which every read rejects. `buf` may be NULL
 *           when `len` is 0.
 * viaTemp   true: write PATH.tmp (overwriting any existing one) and rename it onto the path, so that a failure never
 *           damages the existing file. A failure after the open leaves PATH.tmp behind.
 *           false: overwrite the file itself; a failure may leave it with a length of one byte.
 *
 * HYP_OK.
 * HYP_BAD_PARAM    null buffer with a length above 0, or a file of 4 GiB or more; nothing is touched.
 * HYP_NO_MEMORY    null path, or an allocation failed; the file being written may have been truncated.
 * HYP_IO_ERROR     the file cannot be opened for writing or truncated (a directory, a FIFO, a missing folder, …).
 * HYP_WRITE_ERROR  short write, failed write or failed rename.
 */
HYP_ReturnStatus DVSFile_WriteClassical(const char *path, const void *buf, uint32_t len, bool viaTemp);

/* DVSFile_WriteClassical with `viaTemp` true. */
HYP_ReturnStatus DVSFile_Write(const char *path, const void *buf, uint32_t len);

/*
 * Reads the whole state file. Does not block on a FIFO: it counts as empty.
 *
 * path         the file.
 * buf          receives the file's contents, at an address that is a multiple of 512.
 * len          receives the file's size, padding included: at most 4 GiB - 512.
 * alignOffset  receives the distance of `*buf` from the start of its block. The caller owns the block and frees it
 *              with free((char *)*buf - *alignOffset).
 * On failure the three outputs are untouched and nothing stays allocated. None may be NULL.
 *
 * HYP_OK.
 * HYP_NOT_FOUND   the file cannot be opened, for any reason.
 * HYP_FILE_EMPTY  its size is 0 or cannot be queried.
 * HYP_BAD_PARAM   it is 4 GiB or larger, or an output pointer is NULL.
 * HYP_IO_ERROR    its size is not a multiple of 512.
 * HYP_NO_MEMORY   the allocation failed.
 * HYP_READ_ERROR  the read failed or returned fewer bytes than the file's size.
 */
HYP_ReturnStatus DVSFile_ReadClassical(const char *path, void **buf, uint32_t *len, uint32_t *alignOffset);

/* Same as DVSFile_ReadClassical. */
HYP_ReturnStatus DVSFile_Read(const char *path, void **buf, uint32_t *len, uint32_t *alignOffset);

/*
 * Writes the state file so that it survives a power cut. Takes an exclusive flock on the directory, writes a temporary
 * file with an unpredictable name beside the target, syncs it, renames it onto the path and syncs the directory.
 *
 * path      the file. A symbolic link is kept; its target is replaced or, if absent, created. Afterwards the file has
 *           mode 0600, regardless of the umask and its old mode, and belongs to the writing user. Other hard links to
 *           the old file keep the old contents. The directory must be readable and writable.
 * buf, len  the bytes to write; at least one.
 *
 * First removes temporary files left behind by a killed writer of this path; other files are left alone, whatever
 * their name or type. The temporary file never outlives the call, even on failure. Makes no allocation of its own.
 * Waits up to 10 s for another writer of the same directory.
 *
 * HYP_OK           the new contents are on disk.
 * HYP_BAD_PARAM    `len` is 0, the buffer is NULL, or the file would be 4 GiB or larger; nothing is touched.
 * HYP_NO_MEMORY    null path.
 * HYP_IO_ERROR     the directory cannot be opened or locked in time; no temporary file can be created in it; the path
 *                  is too long, ends in a slash, leads through too many links, or names a FIFO, a socket or a device.
 *                  The old file is unchanged.
 * HYP_WRITE_ERROR  a write, a sync or the rename failed (for example, the path names a directory). The old file is
 *                  unchanged, unless syncing the directory failed: then the new file is in place, whole, and a power
 *                  cut may still bring back the old one.
 */
HYP_ReturnStatus DVSFile_WriteDurable(const char *path, const void *buf, uint32_t len);

#ifdef __cplusplus
}
#endif

#endif
