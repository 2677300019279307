/* SPDX-License-Identifier: Apache-2.0 */
// The device of a host that has the real switching module (platform/device.h): the system calls and nothing
// else. Every other service of such a host is its own library's.

#include "platform/device.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

extern "C" int HostDevice_Open(const char *path) {
    return open(path, O_RDWR | O_CLOEXEC);
}

extern "C" int HostDevice_Ioctl(int fd, int request, void *record) {
    return ioctl(fd, static_cast<unsigned long>(static_cast<unsigned int>(request)), record);
}

extern "C" int HostDevice_Close(int fd) {
    return close(fd);
}
