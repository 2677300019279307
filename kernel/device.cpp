/* SPDX-License-Identifier: Apache-2.0 */
// The device channel: plain calls use the cached descriptor; fetches and command executions open their own.
// Every command of the kernel interface goes through it.

#include <atomic>
#include <cerrno>
#include <cstdlib>
#include <memory>
#include <utility>

#include "kernel/failure.h"
#include "kernel/log.h"
#include "kernel/request.h"
#include "platform/device.h"
#include "platform/runtime.h"

namespace {

using dvs::hyp::Address;
using dvs::hyp::Command;
using dvs::hyp::Failure;
using dvs::hyp::Observe;
using dvs::hyp::Step;

constexpr const char *kDevicePath = "/pelo/devices/char/hypdriver/dvsdev";
constexpr int kNoDescriptor = -1;

/// The descriptor of plain calls. Opened by the first call, never closed; a failed open leaves it unset.
constinit std::atomic<int> g_cachedFd{kNoDescriptor};

int OpenDevice() {
    const int fd = HostDevice_Open(kDevicePath);
    if (fd == kNoDescriptor) {
        Observe({Step::Open, errno});
        dvs::hyp::Print("failed to open dvsdev device %s\n", kDevicePath);
    }
    return fd;
}

int CachedDescriptor() {
    int cached = g_cachedFd.load(std::memory_order_acquire);
    if (cached != kNoDescriptor) return cached;
    const int opened = OpenDevice();
    if (opened == kNoDescriptor) return kNoDescriptor;
    if (g_cachedFd.compare_exchange_strong(cached, opened, std::memory_order_acq_rel)) return opened;
    // Another thread's first call finished earlier; keep its descriptor.
    (void)HostDevice_Close(opened);
    return cached;
}

/// Presets the record's status and sends the record. If the call fails, returns false and sets errno.
bool SendRequest(int fd, int command, DVSHYPRequest *req) {
    req->status = HYP_FAILURE;
    const bool sent = HostDevice_Ioctl(fd, command, req) != -1;
    Observe(sent ? Failure{} : Failure{Step::Send, errno});
    return sent;
}

/// A descriptor for one call.
class Device {
public:
    Device() : fd_(OpenDevice()) {}
    ~Device() {
        if (IsOpen()) (void)HostDevice_Close(fd_);
    }
    Device(const Device &) = delete;
    Device &operator=(const Device &) = delete;

    bool IsOpen() const { return fd_ != kNoDescriptor; }

    /// False if the call failed.
    bool Send(Command command, DVSHYPRequest *req) const { return SendRequest(fd_, NumberOf(command), req); }

private:
    int fd_;
};

struct FreeBlock {
    void operator()(void *block) const { std::free(block); }
};
using Block = std::unique_ptr<void, FreeBlock>;

/// Allocates at least one byte: a module may return size 0, for which malloc may return null.
Block AllocateBuffer(uint32_t size) {
    Block block(std::malloc(size ? size : 1));
    if (!block) Observe({Step::Allocate, 0});
    return block;
}

/// Returns the buffer to the caller, unless the module claims more bytes than it holds.
HYP_ReturnStatus ReturnBuffer(Block buffer, uint32_t capacity, uint32_t claimed, void **out, uint32_t *outLen) {
    if (claimed > capacity) {
        Observe({Step::Reply, 0});
        *outLen = 0;
        return HYP_FAILURE;
    }
    *outLen = claimed;
    *out = buffer.release();
    return HYP_OK;
}

/// The result of a failed receiving call. If the call failed but its status is success, there is no reply:
/// treat it as a claim of more bytes than the buffer holds.
HYP_ReturnStatus FailedReply(HYP_ReturnStatus status, uint32_t named, uint32_t *outLen) {
    *outLen = status == HYP_OK ? 0 : named;
    return status == HYP_OK ? static_cast<HYP_ReturnStatus>(HYP_FAILURE) : status;
}

void FillExecution(DVSHYPRequest *req, const char *switchName, const char *cmd, const void *in,
                   uint32_t inLen) {
    dvs::hyp::SetText(req->switchName, switchName);
    dvs::hyp::SetText(req->cmd, cmd);
    req->cmdInLen = inLen;
    req->cmdIn = Address(in);
    req->cmdOutLen = dvs::hyp::kFirstBufferSize;
}

} // namespace

extern "C" HYP_ReturnStatus DVSHYP_Ioctl(int request, DVSHYPRequest *req) {
    const int fd = CachedDescriptor();
    if (fd == kNoDescriptor) return HYP_FAILURE;
    if (SendRequest(fd, request, req)) return HYP_OK;
    const int error = errno;
    // Lookups return ENOENT for missing objects; that is not an error.
    if (error != ENOENT) dvs::hyp::Print("ioctl failed: %s\n", Err_Errno2String(error));
    return req->status;
}

extern "C" HYP_ReturnStatus DVSHYP_CmdExec(const char *switchName, const char *cmd, const void *in,
                                           uint32_t inLen, void **out, uint32_t *outLen) {
    *out = nullptr;
    DVSHYPRequest req{};
    FillExecution(&req, switchName, cmd, in, inLen);
    const Device device;
    if (!device.IsOpen()) return HYP_FAILURE;
    for (;;) {
        const uint32_t capacity = req.cmdOutLen;
        Block buffer = AllocateBuffer(capacity);
        if (!buffer) {
            dvs::hyp::Print("failed to alloc buffer memory");
            *outLen = capacity;
            return HYP_NO_MEMORY;
        }
        req.cmdOut = Address(buffer.get());
        if (device.Send(Command::CmdExec, &req))
            return ReturnBuffer(std::move(buffer), capacity, req.cmdOutLen, out, outLen);
        // Retry whenever the module rejects the buffer, even if it does not ask for a larger one.
        if (req.status != HYP_LIMIT_EXCEEDED) return FailedReply(req.status, req.cmdOutLen, outLen);
    }
}

extern "C" void DVSHYP_DataFree(void *buf) {
    std::free(buf);
}

namespace dvs::hyp {

HYP_ReturnStatus Fetch(Command command, DVSHYPRequest *req, void **out, uint32_t *outLen) {
    *out = nullptr;
    const Device device;
    if (!device.IsOpen()) return HYP_FAILURE;
    req->dataLen = kFirstBufferSize;
    for (;;) {
        const uint32_t capacity = req->dataLen;
        Block buffer = AllocateBuffer(capacity);
        if (!buffer) {
            *outLen = capacity;
            return HYP_NO_MEMORY;
        }
        req->data = Address(buffer.get());
        if (device.Send(command, req)) return ReturnBuffer(std::move(buffer), capacity, req->dataLen, out, outLen);
        // Do not retry if the module rejects the buffer without asking for a larger one: that would never
        // end.
        const bool again = req->status == HYP_LIMIT_EXCEEDED && req->dataLen > capacity;
        if (!again) return FailedReply(req->status, req->dataLen, outLen);
    }
}

} // namespace dvs::hyp
