/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_OUTPUT_BLOCK_H
#define DVSSTATE_OUTPUT_BLOCK_H

// The output of a serialization of the switch state, by the buffer convention of dvs/data.h: the caller's
// buffer, or a new block that is handed over on success and freed otherwise.

#include <cstdint>
#include <span>

#include "dvs/data.h"

namespace dvs::state {

class OutputBlock {
public:
    OutputBlock(void **buf, uint32_t *len, DVSDataAllocFn allocFn, DVSDataFreeFn freeFn)
        : buf_(buf), len_(len), allocFn_(allocFn), freeFn_(freeFn) {}
    ~OutputBlock();
    OutputBlock(const OutputBlock &) = delete;
    OutputBlock &operator=(const OutputBlock &) = delete;

    /// Reserves `size` bytes. HYP_NO_MEMORY if the allocation fails. If the caller's buffer is too small, or
    /// no buffer can have this size, Bytes stays empty and writes to it are no-ops. The caller reports that
    /// last, after all other failures and messages.
    [[nodiscard]] HYP_ReturnStatus Reserve(uint64_t size);
    [[nodiscard]] bool HasRoom() const { return !bytes_.empty(); }
    [[nodiscard]] std::span<uint8_t> Bytes() const { return bytes_; }
    /// Sets the outputs; requires room.
    void HandOver();

private:
    void **buf_;
    uint32_t *len_;
    DVSDataAllocFn allocFn_;
    DVSDataFreeFn freeFn_;
    void *own_ = nullptr;
    std::span<uint8_t> bytes_;
};

/// malloc for blocks that may hold whole states. Large blocks request huge pages; otherwise the page faults
/// of a fresh block cost more than filling it. Released with free.
[[nodiscard]] void *StateAlloc(uint64_t size);

} // namespace dvs::state

#endif
