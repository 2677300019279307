/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_STATUS_H
#define DVS_STATUS_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Statuses: 32-bit words of the hypervisor kernel's status space, 0 on success. Every operation that returns
 * HYP_ReturnStatus says in its own comment which of these it gives and what each means there.
 * HYP_ReturnStatusToString (the host's service) gives each a short text.
 */
typedef uint32_t HYP_ReturnStatus;

enum {
    HYP_OK = 0,
    HYP_FAILURE = 0x0bad0001,        /* generic failure; the device cannot be opened; a value is missing */
    HYP_NOT_FOUND = 0x0bad0003,      /* no such switch, port, property or file; the normal end of an iteration */
    HYP_EXISTS = 0x0bad0005,         /* duplicate switch or port; a failure inside state serialization or reset */
    HYP_LIMIT_EXCEEDED = 0x0bad0006, /* table or port limit; a receive buffer too small */
    HYP_BAD_PARAM = 0x0bad0007,      /* malformed buffer, id too long, size overflow, missing data */
    HYP_FILE_EMPTY = 0x0bad0008,     /* the state file is empty or its size cannot be read */
    HYP_IO_ERROR = 0x0bad000a,       /* the state file cannot be opened for writing, truncated, or is of odd size */
    HYP_READ_ERROR = 0x0bad000b,     /* the state file gave fewer bytes than its size */
    HYP_WRITE_ERROR = 0x0bad000c,    /* writing or renaming the state file failed */
    HYP_NO_MEMORY = 0x0bad0014,      /* an allocation failed */
    HYP_NOT_SUPPORTED = 0x0bad0020,  /* switch version that this library does not know */
    HYP_BAD_CHECKSUM = 0x0bad003a    /* checksum mismatch in a serialized buffer */
};

#ifdef __cplusplus
}
#endif

#endif
