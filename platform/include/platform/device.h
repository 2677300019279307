/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_DEVICE_H
#define PLATFORM_DEVICE_H

#ifdef __cplusplus
extern "C" {
#endif

/*
 * The switching module's character device. Results and errno are those of open, ioctl and close: -1 with
 * errno on failure. All three are thread-safe; calls on one descriptor are atomic with respect to each other.
 */

/* Opens the device read-write, close-on-exec. ENOENT: no such device. */
int HostDevice_Open(const char *path);

/*
 * Sends one request. `request` is the command's number without direction or size bits; `record` is a
 * DVSHYPRequest (dvs/hyp.h). The module reads and writes it and the buffers it points to. On failure the
 * module has written the record's status, unless it did not receive the request; EIO means that this is
 * unknown.
 */
int HostDevice_Ioctl(int fd, int request, void *record);

int HostDevice_Close(int fd);

#ifdef __cplusplus
}
#endif

#endif
