/* SPDX-License-Identifier: Apache-2.0 */
// Blocks for serialized state (output_block.h), allocated on the process heap.

#include "dvsstate/output_block.h"

#include <cstdlib>

#include "base/huge_page.h"

namespace dvs::state {

OutputBlock::~OutputBlock() {
    if (own_) freeFn_(own_);
}

HYP_ReturnStatus OutputBlock::Reserve(uint64_t size) {
    if (size > UINT32_MAX) return HYP_OK;
    void *block = *buf_;
    if (block) {
        if (*len_ < size) return HYP_OK;
    } else {
        block = own_ = allocFn_(size);
        if (!block) return HYP_NO_MEMORY;
    }
    bytes_ = {static_cast<uint8_t *>(block), static_cast<std::size_t>(size)};
    return HYP_OK;
}

void OutputBlock::HandOver() {
    *buf_ = bytes_.data();
    *len_ = static_cast<uint32_t>(bytes_.size());
    own_ = nullptr;
}

void *StateAlloc(uint64_t size) {
    void *block = std::malloc(size);
    if (block && size >= 2 * base::kHugePage) base::AdviseHugePages(block, size);
    return block;
}

} // namespace dvs::state
