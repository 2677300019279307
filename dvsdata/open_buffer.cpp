/* SPDX-License-Identifier: Apache-2.0 */
// Finishes a buffer that was written in place (open_buffer.h).

#include "dvsdata/open_buffer.h"

#include <algorithm>

namespace dvs::data {

void FinishBuffer(std::uint8_t *block, std::size_t end, const OpenBuffer &buffer, OpenBuffer *outer) {
    const Bytes written(block, end);
    const std::size_t size = end - buffer.start;
    std::uint32_t checksum = buffer.sum;
    if (end > buffer.summedTo) checksum += Sum(written.subspan(buffer.summedTo));
    std::uint8_t *const header = block + buffer.start;
    Store32(header + kTotalLengthOffset, static_cast<std::uint32_t>(size));
    Store32(header + kChecksumOffset, checksum);
    Store16(header + kVersionOffset, kFormatVersion);
    if (!outer) return;
    // The enclosing buffer also sums this one's first bytes, and the bytes since its last nested buffer.
    outer->sum += checksum + Sum(written.subspan(buffer.start, std::min<std::size_t>(size, kUnsummedSize))) +
                  Sum(written.subspan(outer->summedTo, buffer.start - outer->summedTo));
    outer->summedTo = end;
}

} // namespace dvs::data
