/* SPDX-License-Identifier: Apache-2.0 */
// Serialization of lists: the exported functions and their buffer convention, on top of the image writer.

#include <cstring>

#include "dvsdata/emit.h"
#include "dvsdata/list_internal.h"

using namespace dvs::data;

namespace {

/// A buffer of `size` bytes by the convention of dvs/data.h: the caller's, or one from the list's allocator,
/// which is freed unless it is kept.
class OutputBuffer {
public:
    OutputBuffer(DVSData *list, void **buf, std::uint32_t *bufLen)
        : list_(list), buf_(buf), bufLen_(bufLen) {}
    OutputBuffer(const OutputBuffer &) = delete;
    OutputBuffer &operator=(const OutputBuffer &) = delete;
    ~OutputBuffer() {
        if (!own_ || kept_) return;
        list_->freeFn(*buf_);
        *buf_ = nullptr;
    }

    HYP_ReturnStatus Reserve(std::uint32_t size) {
        size_ = size;
        if (*buf_) return size > *bufLen_ ? HYP_LIMIT_EXCEEDED : HYP_OK;
        *buf_ = list_->allocFn(size);
        own_ = *buf_ != nullptr;
        return own_ ? HYP_OK : HYP_NO_MEMORY;
    }
    std::span<std::uint8_t> Block() { return {static_cast<std::uint8_t *>(*buf_), size_}; }
    void Keep() {
        *bufLen_ = size_;
        kept_ = true;
    }

private:
    DVSData *list_;
    void **buf_;
    std::uint32_t *bufLen_;
    std::uint32_t size_ = 0;
    bool own_ = false, kept_ = false;
};

HYP_ReturnStatus Serialize(DVSData *list, void **buf, std::uint32_t *bufLen, const Filter &filter) {
    const std::uint32_t size = SerializedSize(list, filter);
    EmitBufferSize(size);
    OutputBuffer output(list, buf, bufLen);
    if (const HYP_ReturnStatus status = output.Reserve(size); status != HYP_OK) return status;
    ImageWriter writer(output.Block());
    if (const HYP_ReturnStatus status = writer.List(list, filter, size); status != HYP_OK) return status;
    output.Keep();
    return HYP_OK;
}

const DVSDataEntry *FindWholeName(const DVSData *list, const char *name) {
    const DVSDataEntry *entry = list->head;
    while (entry && std::strcmp(entry->name, name) != 0)
        entry = entry->next;
    return entry;
}

} // namespace

uint32_t DVSData_SerializedSize(DVSData *list, uint32_t) {
    return list->serialSize;
}

uint32_t DVSData_SerializedSizeExNamedProp(DVSData *list, uint32_t, const char *exName) {
    return SerializedSize(list, Filter::WithoutName(exName));
}

HYP_ReturnStatus DVSData_Serialize(DVSData *list, void **buf, uint32_t *bufLen, uint32_t version) {
    return DVSData_SerializeExNamedProp(list, buf, bufLen, version, nullptr);
}

HYP_ReturnStatus DVSData_SerializeExNamedProp(DVSData *list, void **buf, uint32_t *bufLen, uint32_t version,
                                              const char *exName) {
    EmitOldVersion(version);
    return Serialize(list, buf, bufLen, Filter::WithoutName(exName));
}

HYP_ReturnStatus DVSData_SerializeExTypeProp(DVSData *list, void **buf, uint32_t *bufLen, uint32_t typeMask) {
    return Serialize(list, buf, bufLen, Filter::WithoutTypes(typeMask));
}

HYP_ReturnStatus DVSData_SerializeEntry(DVSData *list, const char *name, void **buf, uint32_t *bufLen) {
    // Clearing the length first rejects every caller's buffer. Callers rely on it.
    *bufLen = 0;
    const DVSDataEntry *const entry = FindWholeName(list, name);
    if (!entry) return HYP_NOT_FOUND;
    OutputBuffer output(list, buf, bufLen);
    if (const HYP_ReturnStatus status = output.Reserve(entry->serialSize + kMinBufferSize); status != HYP_OK)
        return status;
    EmitWriting(entry->name, entry->dataLen, entry->serialSize);
    ImageWriter writer(output.Block());
    writer.BeginBuffer();
    writer.Image(entry);
    writer.EndBuffer();
    output.Keep();
    return HYP_OK;
}
