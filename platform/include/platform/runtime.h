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
 * The host runtime: recursive locks, bit vectors, bounded text, error texts and the host's log. The library calls
 * these and defines none of them. Every function may be called from several threads at once; what is said about one
 * object (a bit vector, say) still holds for that object.
 *
 * The embedded implementation (platform/embedded/) is what the notes headed "Embedded" describe; a host's own may
 * differ there and nowhere else.
 */

typedef struct MXUserRecLock MXUserRecLock;
typedef struct BitVector BitVector;

/*
 * Gives the process's one lock that is kept in `*storage`, making it on the first call.
 *
 * storage   a variable of static lifetime, NULL before the first call; written once. Calls with the same storage may
 *           race: all of them get the same lock.
 * name      text for diagnostics, copied (31 characters are kept). Name and rank of the first call stay.
 * rank      place in the lock order: a thread may wait for a lock only while every lock it holds has a smaller rank.
 *
 * The lock lives as long as the process. Never NULL.
 * Embedded: locks come from a pool of 32 in static storage, so that making one cannot fail for want of memory; a
 * program that asks for more is stopped with a message.
 */
MXUserRecLock *MXUser_CreateSingletonRecLockInt(MXUserRecLock **storage, const char *name, uint32_t rank);

/*
 * Takes the lock, waiting for it if another thread has it. The thread that holds it may take it again, and gives it
 * up with as many releases. `lock` is not NULL.
 * Embedded: builds without NDEBUG stop the program, with both locks' names on standard error, when a lock is waited
 * for that does not have a larger rank than all those the thread holds. Taking a held lock again is always in order.
 */
void MXUser_AcquireRecLock(MXUserRecLock *lock);

/*
 * Gives the lock up once. `lock` is not NULL and held by the calling thread.
 * Embedded: builds without NDEBUG stop the program when the calling thread does not hold the lock; others ignore it.
 */
void MXUser_ReleaseRecLock(MXUserRecLock *lock);

/*
 * A vector of `bits` bits, all clear; 0 bits are allowed. NULL when there is no memory. Released with BitVector_Free.
 * A vector has no lock: who changes it while others look at it brings one.
 */
BitVector *BitVector_Alloc(uint32_t bits);

/* Releases a vector; NULL is allowed. */
void BitVector_Free(BitVector *vector);

/* Sets or clears the bit at `bit`, counted from 0. A bit beyond the vector's end is left alone. */
void BitVector_SetBit(BitVector *vector, uint32_t bit);
void BitVector_ClearBit(BitVector *vector, uint32_t bit);

/* Whether the bit at `bit` is set. False for a bit beyond the vector's end. */
bool BitVector_IsSet(const BitVector *vector, uint32_t bit);

/*
 * Finds the first bit at or after `start` whose value is `value` and puts its position into `*pos`. False, with
 * `*pos` untouched, when there is none up to the vector's end.
 */
bool BitVector_NextBit(const BitVector *vector, uint32_t start, bool value, uint32_t *pos);

/*
 * Formats as printf does into a block of its own, released with free(). `*length`, if not NULL, gets the number of
 * characters without the terminator. NULL, with `*length` untouched, when there is no memory or the format cannot be
 * carried out.
 */
char *Str_SafeAsprintf(size_t *length, const char *format, ...) __attribute__((format(printf, 2, 3)));

/*
 * Copies the text `src`, terminator included, into `dst`, which has `size` bytes, and returns `dst`. A text that does
 * not fit is a broken promise of the caller's: the program is stopped, with nothing written to `dst`.
 * Embedded: a message on standard error, then abort().
 */
char *Str_Strcpy(char *dst, const char *src, size_t size);

/*
 * The system's text for an error number, never NULL. It is constant, or, for a number that the system does not know,
 * lent until the calling thread's next call.
 */
const char *Err_Errno2String(int error);

/*
 * Puts one message into the host's log. `level` is the host's own measure and not one of the library's debug levels;
 * `format` and `args` are vprintf's. `args` is consumed; errno is kept. A message that cannot be logged is dropped.
 * Embedded: one line to standard error, written in one piece, with the time (UTC), the process id and the level in
 * front of it; a line end is added if the message has none. Standard error is where a service manager, a container
 * and a terminal all look; a program that wants the messages elsewhere sets a sink (dvs/log.h).
 */
void LogV(uint32_t level, const char *format, va_list args) __attribute__((format(printf, 2, 0)));

#ifdef __cplusplus
}
#endif

#endif
