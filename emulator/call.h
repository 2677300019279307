/* SPDX-License-Identifier: Apache-2.0 */
#ifndef EMULATOR_CALL_H
#define EMULATOR_CALL_H

// One command and its reply, as passed between the server and the module.

#include <cstdint>
#include <cstdlib>
#include <memory>
#include <span>
#include <string_view>

#include "dvs/hyp.h"
#include "platform/embedded/emulator_wire.h"

namespace dvs::emulator {

/// A request. The spans are valid during the call.
struct Call {
    int32_t request;
    uint32_t flags; // wire::Flags
    DVSHYPRequest record;
    std::span<const char> value;
    std::span<const char> cmdIn;

    bool Has(wire::Flags flag) const { return (flags & flag) != 0; }
};

struct FreeBlock {
    void operator()(void *block) const { std::free(block); }
};
using Block = std::unique_ptr<void, FreeBlock>;

/// The bytes of a reply: owned, or borrowed from the module until its next command.
struct Payload {
    const char *data = nullptr;
    uint32_t size = 0;
    Block owned;

    bool IsBorrowed() const { return size > 0 && !owned; }
};

struct Answer {
    HYP_ReturnStatus status = HYP_OK;
    int error = 0; // errno of the call, 0 on success
    uint32_t dataLen = 0;
    uint32_t cmdOutLen = 0;
    Payload payload;
};

/// The errno that matches a failure status.
[[nodiscard]] int ErrnoOf(HYP_ReturnStatus status);

} // namespace dvs::emulator

#endif
