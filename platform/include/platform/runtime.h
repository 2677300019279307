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

/* The host runtime: recursive locks, bit vectors, bounded text, the host's log. */

typedef struct MXUserRecLock MXUserRecLock;
typedef struct BitVector BitVector;

MXUserRecLock *MXUser_CreateSingletonRecLockInt(MXUserRecLock **storage, const char *name, uint32_t rank);
void MXUser_AcquireRecLock(MXUserRecLock *lock);
void MXUser_ReleaseRecLock(MXUserRecLock *lock);

BitVector *BitVector_Alloc(uint32_t bits);
void BitVector_Free(BitVector *vector);
void BitVector_SetBit(BitVector *vector, uint32_t bit);
void BitVector_ClearBit(BitVector *vector, uint32_t bit);
bool BitVector_IsSet(const BitVector *vector, uint32_t bit);
bool BitVector_NextBit(const BitVector *vector, uint32_t start, bool value, uint32_t *pos);

char *Str_SafeAsprintf(size_t *length, const char *format, ...) __attribute__((format(printf, 2, 3)));
char *Str_Strcpy(char *dst, const char *src, size_t size);
const char *Err_Errno2String(int error);
void LogV(uint32_t level, const char *format, va_list args);

#ifdef __cplusplus
}
#endif

#endif
