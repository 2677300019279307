/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_DEVICE_H
#define PLATFORM_DEVICE_H


#ifdef __cplusplus
extern "C" {
#endif

/* The switching module's character device: results and errno as those of open, ioctl and close. */

int HostDevice_Open(const char *path);
int HostDevice_Ioctl(int fd, int request, void *record);
int HostDevice_Close(int fd);

#ifdef __cplusplus
}
#endif

#endif
