/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSDATA_OPEN_BUFFER_H
#define DVSDATA_OPEN_BUFFER_H

// A serialized buffer that is written in place, and how it is finished. Each byte is summed once although it
// counts in the checksum of every enclosing buffer. Used by the writers of nested buffers (image_writer.cpp,
// growing_image.cpp).

#include <cstddef>
#include <cstdint>

#include "dvsdata/format.h"

namespace dvs::data {

struct OpenBuffer {
    std::size_t start;    // in the block
    std::size_t summedTo; // bytes from start + 32 to here are in `sum`
    std::uint32_t sum;
};

/// A buffer that starts at `at`, with nothing summed.
inline OpenBuffer OpenBufferAt(std::size_t at) {
    return {at, at + kUnsummedSize, 0};
}

/// Fills in the header of the buffer that ends at `end` of the block, marker included. `outer` is the
/// enclosing buffer; null for the outermost one.
void FinishBuffer(std::uint8_t *block, std::size_t end, const OpenBuffer &buffer, OpenBuffer *outer);

} // namespace dvs::data

#endif
