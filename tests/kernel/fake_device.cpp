/* SPDX-License-Identifier: Apache-2.0 */
// The scripted module; see the header.

#include "kernel/fake_device.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <mutex>

#include "dvs/log.h"
#include "platform/device.h"

namespace dvs::test {

namespace {

std::recursive_mutex g_mutex;

bool Executes(int request) {
    return device::TransferOf(request) == device::Transfer::Execute;
}

void Sink(int level, const char *text, void *arg) {
    static_cast<std::vector<std::string> *>(arg)->push_back(std::to_string(level) + ":" + text);
}

} // namespace

FakeDevice &FakeDevice::Get() {
    static FakeDevice device;
    return device;
}

void FakeDevice::Reset() {
    const std::lock_guard guard(g_mutex);
    present = true;
    openError = ENOENT;
    script.clear();
    replies.clear();
    always.clear();
    calls.clear();
    opened = closed = 0;
    openedPaths.clear();
    // Descriptors stay open: the library caches the one of its plain calls.
}

int FakeDevice::Open(const char *path) {
    const std::lock_guard guard(g_mutex);
    openedPaths.emplace_back(path);
    if (!present) {
        errno = openError;
        return -1;
    }
    opened++;
    open.insert(nextFd_);
    return nextFd_++;
}

int FakeDevice::Close(int fd) {
    const std::lock_guard guard(g_mutex);
    closed++;
    return open.erase(fd) ? 0 : -1;
}

int FakeDevice::Ioctl(int fd, int request, DVSHYPRequest *record) {
    const std::lock_guard guard(g_mutex);
    DeviceCall call{fd, request, std::string(reinterpret_cast<const char *>(record), sizeof *record), {}};
    if (device::TransferOf(request) == device::Transfer::ValueIn && record->data)
        call.value.assign(reinterpret_cast<const char *>(record->data), record->dataLen);
    calls.push_back(std::move(call));
    if (!script.empty()) {
        const Step step = script.front();
        script.pop_front();
        return Answer(request, record, step);
    }
    if (const auto reply = replies.find(Command{request}); reply != replies.end()) {
        const auto size = static_cast<int64_t>(reply->second.size());
        const uint32_t capacity = Executes(request) ? record->cmdOutLen : record->dataLen;
        if (size > capacity) return Answer(request, record, {ENOSPC, HYP_LIMIT_EXCEEDED, size, {}});
        return Answer(request, record, {0, -1, size, reply->second});
    }
    if (const auto step = always.find(Command{request}); step != always.end())
        return Answer(request, record, step->second);
    return 0;
}

int FakeDevice::Answer(int request, DVSHYPRequest *record, const Step &step) {
    const bool executes = Executes(request);
    const uint32_t capacity = executes ? record->cmdOutLen : record->dataLen;
    const uint64_t buffer = executes ? record->cmdOut : record->data;
    std::memcpy(reinterpret_cast<void *>(buffer), step.reply.data(),
                std::min<std::size_t>(step.reply.size(), capacity));
    if (step.status != -1) record->status = static_cast<uint32_t>(step.status);
    if (step.length != -1) {
        if (executes)
            record->cmdOutLen = static_cast<uint32_t>(step.length);
        else
            record->dataLen = static_cast<uint32_t>(step.length);
    }
    if (step.error == 0) return 0;
    errno = step.error;
    return -1;
}

RecordBytes::RecordBytes() : bytes_(424, '\0') {
    Word(256, 0x0bad0001); // every sender presets this
}

RecordBytes &RecordBytes::Text(std::size_t offset, const std::string &text) {
    bytes_.replace(offset, text.size(), text);
    return *this;
}

RecordBytes &RecordBytes::Word(std::size_t offset, uint32_t value) {
    std::memcpy(bytes_.data() + offset, &value, sizeof value);
    return *this;
}

RecordBytes &RecordBytes::Address(std::size_t offset, const void *address) {
    const auto value = reinterpret_cast<uint64_t>(address);
    std::memcpy(bytes_.data() + offset, &value, sizeof value);
    return *this;
}

MessageLog::MessageLog() {
    DVSLog_SetSink(Sink, &lines);
}

MessageLog::~MessageLog() {
    DVSLog_SetSink(nullptr, nullptr);
}

} // namespace dvs::test

extern "C" int HostDevice_Open(const char *path) {
    return dvs::test::FakeDevice::Get().Open(path);
}

extern "C" int HostDevice_Ioctl(int fd, int request, void *record) {
    return dvs::test::FakeDevice::Get().Ioctl(fd, request, static_cast<DVSHYPRequest *>(record));
}

extern "C" int HostDevice_Close(int fd) {
    return dvs::test::FakeDevice::Get().Close(fd);
}
