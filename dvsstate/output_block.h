/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSSTATE_OUTPUT_BLOCK_H
#define DVSSTATE_OUTPUT_BLOCK_H

// Where a serialization of the switch state goes, by the buffer convention of dvs/data.h: the caller's
// buffer, or a block that is handed over on success and freed otherwise.

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

    /// Room for `size` bytes. HYP_NO_MEMORY when it cannot be had. A caller's buffer that is too small, and a
    /// size that no buffer can have, leave Bytes empty, and writing to it comes to nothing: what else may
    /// fail, and what is said meanwhile, comes before that is told.
    [[nodiscard]] HYP_ReturnStatus Reserve(uint64_t size);
    [[nodiscard]] bool HasRoom() const { return !bytes_.empty(); }
    [[nodiscard]] std::span<uint8_t> Bytes() const { return bytes_; }
    /// Gives the outputs their values; there must be room.
    void HandOver();

private:
    void **buf_;
    uint32_t *len_;
    DVSDataAllocFn allocFn_;
    DVSDataFreeFn freeFn_;
    void *own_ = nullptr;
    std::span<uint8_t> bytes_;
};

/// malloc for blocks that may be whole states: those ask for huge pages, without which the page faults of a
/// fresh block cost more than filling it. Released with free.
[[nodiscard]] void *StateAlloc(uint64_t size);

} // namespace dvs::state

#endif
