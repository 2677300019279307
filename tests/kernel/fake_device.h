/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_KERNEL_FAKE_DEVICE_H
#define TESTS_KERNEL_FAKE_DEVICE_H

// A scripted switching module that implements platform/device.h. It records every call with all bytes of its
// record and replies as the test specifies. Test programs that link it omit the embedded device.

#include <cerrno>
#include <cstdint>
#include <deque>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "dvs/hyp.h"
#include "platform/device_commands.h"

namespace dvs::test {

using device::Command;

/// One ioctl as the module received it.
struct DeviceCall {
    int fd;
    int request;
    std::string record; // 424 bytes
    std::string value;  // the contents of `data` when it is a value
};

/// One reply: the changes to the record, the errno, the bytes written.
struct Step {
    int error = 0;       // 0: the call succeeds
    int64_t status = -1; // -1: keeps the preset
    int64_t length = -1; // dataLen or cmdOutLen; -1: unchanged
    std::string reply;   // copied into the receive buffer, up to its capacity
};

class FakeDevice {
public:
    /// The instance behind HostDevice_*; reset between tests.
    static FakeDevice &Get();
    void Reset();

    bool present = true;
    int openError = ENOENT;  // while not present
    std::deque<Step> script; // consumed first
    std::map<Command, std::string>
        replies;                    // then: this command's value, with size negotiation as in a module
    std::map<Command, Step> always; // then: the reply to each call of this command

    std::vector<DeviceCall> calls;
    std::set<int> open;
    unsigned opened = 0;
    unsigned closed = 0;
    std::vector<std::string> openedPaths;

    int Open(const char *path);
    int Ioctl(int fd, int request, DVSHYPRequest *record);
    int Close(int fd);

private:
    int Answer(int request, DVSHYPRequest *record, const Step &step);
    int nextFd_ = 1000;
};

/// Writes fields at their offsets into a zeroed record. Does not use the library's record type.
class RecordBytes {
public:
    RecordBytes();
    RecordBytes &Text(std::size_t offset, const std::string &text);
    RecordBytes &Word(std::size_t offset, uint32_t value);
    RecordBytes &Address(std::size_t offset, const void *address);
    const std::string &Bytes() const { return bytes_; }

private:
    std::string bytes_;
};

/// Collects the library's messages while it lives, as "level:text".
class MessageLog {
public:
    MessageLog();
    ~MessageLog();
    std::vector<std::string> lines;
};

/// Starts every test with a fresh device, an empty table and a log of the messages.
struct FakeDeviceTest {
    FakeDeviceTest() { FakeDevice::Get().Reset(); }
    FakeDevice &device = FakeDevice::Get();
    MessageLog log;
};

} // namespace dvs::test

#endif
