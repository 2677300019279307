/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_DEVICE_H
#define PLATFORM_DEVICE_H

#ifdef __cplusplus
extern "C" {
#endif

/*
 * The switching module's character device. Results and errno are those of open, ioctl and close: -1 with errno on
 * failure. All three are safe in any thread; a call on one descriptor is atomic against the other calls on it.
 */

/* Opens the device read-write, closed on exec. ENOENT: there is no such device. */
int HostDevice_Open(const char *path);

/*
 * Sends one request. `request` is the command's number itself, without direction or size bits; `record` is a
 * DVSHYPRequest (dvs/hyp.h), which the module reads and writes together with the buffers it points to. On failure the
 * module has written the record's status, unless it never got the request: EIO says that this is not known.
 */
int HostDevice_Ioctl(int fd, int request, void *record);

int HostDevice_Close(int fd);

#ifdef __cplusplus
}
#endif

#endif
