/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_RUNTIME_H
#define PLATFORM_RUNTIME_H

#include <stdarg.h>
#include <stdbool.h>
#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * The host runtime: recursive locks, bit vectors, bounded text, error texts and the host's log. The library
 * calls these functions and defines none of them. All are thread-safe; per-object rules (for example, for a
 * bit vector) still apply.
 *
 * Notes marked "Embedded" describe the embedded implementation (platform/embedded/). A host's own
 * implementation may differ only there.
 */

typedef struct MXUserRecLock MXUserRecLock;
typedef struct BitVector BitVector;

/*
 * Returns the process-wide lock stored in `*storage`; creates it on the first call.
 *
 * storage   a variable of static lifetime, NULL before the first call; written once. Concurrent calls with the
 *           same storage are safe: all get the same lock.
 * name      text for diagnostics, copied (truncated to 31 characters). The first call sets name and rank.
 * rank      place in the lock order: a thread may wait for a lock only if all its held locks rank lower.
 *
 * The lock lives as long as the process. Never NULL.
 * Embedded: locks come from a static pool of 32, so creation cannot fail for lack of memory. A program that
 * needs more is aborted with a message.
 */
MXUserRecLock *MXUser_CreateSingletonRecLockInt(MXUserRecLock **storage, const char *name, uint32_t rank);

/*
 * Takes the lock; waits if another thread holds it. The owner may take it again and must release it as often.
 * `lock` is not NULL. Embedded: builds without NDEBUG abort, with both locks' names on standard error, if a
 * thread waits for a lock whose rank is not larger than those of all locks it holds. Taking a held lock again
 * is always allowed.
 */
void MXUser_AcquireRecLock(MXUserRecLock *lock);

/*
 * Releases the lock once. `lock` is not NULL and held by the calling thread.
 * Embedded: builds without NDEBUG abort if the calling thread does not hold the lock; others ignore it.
 */
void MXUser_ReleaseRecLock(MXUserRecLock *lock);

/*
 * Creates a vector of `bits` bits, all clear; 0 is allowed. NULL: out of memory. Released with
 * BitVector_Free. A vector has no lock: callers synchronize changes with concurrent access.
 */
BitVector *BitVector_Alloc(uint32_t bits);

/* Frees a vector; NULL is a no-op. */
void BitVector_Free(BitVector *vector);

/* Sets or clears the bit at `bit`, counted from 0. No-op beyond the vector's end. */
void BitVector_SetBit(BitVector *vector, uint32_t bit);
void BitVector_ClearBit(BitVector *vector, uint32_t bit);

/* True if the bit at `bit` is set. False beyond the vector's end. */
bool BitVector_IsSet(const BitVector *vector, uint32_t bit);

/*
 * Finds the first bit at or after `start` with value `value` and stores its position in `*pos`. False, with
 * `*pos` untouched, if there is none.
 */
bool BitVector_NextBit(const BitVector *vector, uint32_t start, bool value, uint32_t *pos);

/*
 * Formats like printf into a new block, released with free(). `*length`, if not NULL, receives the number of
 * characters without the terminator. NULL, with `*length` untouched: out of memory, or the format failed.
 */
char *Str_SafeAsprintf(size_t *length, const char *format, ...) __attribute__((format(printf, 2, 3)));

/*
 * Copies the text `src`, terminator included, into `dst` of `size` bytes and returns `dst`. A text that does
 * not fit is a caller error: the program is aborted and `dst` is not written. Embedded: a message on standard
 * error, then abort().
 */
char *Str_Strcpy(char *dst, const char *src, size_t size);

/*
 * The system's text for an error number, never NULL. It is constant, except for an unknown number: then it is
 * valid until the calling thread's next call.
 */
const char *Err_Errno2String(int error);

/*
 * Writes one message to the host's log. `level` is the host's own scale, not one of the library's debug
 * levels; `format` and `args` are vprintf's. `args` is consumed; errno is preserved. A message that cannot be
 * logged is dropped. Embedded: one line to standard error in a single write, prefixed with the time (UTC),
 * the process id and the level; adds a newline if the message has none. Service managers, containers and
 * terminals all read standard error; to send messages elsewhere, set a sink (dvs/log.h).
 */
void LogV(uint32_t level, const char *format, va_list args) __attribute__((format(printf, 2, 0)));

#ifdef __cplusplus
}
#endif

#endif
