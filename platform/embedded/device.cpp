/* SPDX-License-Identifier: Apache-2.0 */
// The embedded host's device (platform/device.h): the real one where it exists, else the emulator's socket.

#include "platform/device.h"

#include <cerrno>
#include <cstdint>
#include <new>

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include "platform/embedded/emulator_channel.h"
#include "platform/embedded/emulator_client.h"

extern "C" int HostDevice_Open(const char *path) {
    const int fd = open(path, O_RDWR | O_CLOEXEC);
    if (fd != -1 || errno != ENOENT) return fd;
    const char *emulator = dvs::embedded::EmulatorPath();
    const int channel = emulator ? dvs::embedded::OpenChannel(emulator) : -1;
    // An emulator that is not there is a device that is not there.
    if (channel == -1) errno = ENOENT;
    return channel;
}

extern "C" int HostDevice_Ioctl(int fd, int request, void *record) {
    if (const auto channel = dvs::embedded::FindChannel(fd)) {
        try {
            return channel->Call(request, static_cast<DVSHYPRequest *>(record));
        } catch (const std::bad_alloc &) {
            errno = ENOMEM;
            return -1;
        }
    }
    return ioctl(fd, static_cast<unsigned long>(static_cast<unsigned int>(request)), record);
}

extern "C" int HostDevice_Close(int fd) {
    dvs::embedded::ForgetChannel(fd);
    return close(fd);
}
