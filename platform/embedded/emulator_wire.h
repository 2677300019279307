/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_EMULATOR_WIRE_H
#define PLATFORM_EMBEDDED_EMULATOR_WIRE_H

// The wire form of the emulator's socket: a stream of requests, each answered before the next is sent. Both
// ends run on one host, so numbers travel in its byte order. The request record and the buffers it points to
// travel by value; its addresses stay at home and only say, as flags, whether there is a buffer.
//
//   request:  RequestHeader | record, 424 bytes | value at `data`, dataSize bytes | command input,
//             cmdInSize bytes
//   reply:    ReplyHeader   | payload, payloadSize bytes
//
// Without a record (kind Limits) a request is its header alone, and the reply's payload is the port limit, a
// u32.

#include <cstddef>
#include <cstdint>

namespace dvs::wire {

inline constexpr uint32_t kMagic = 0x45535644; // "DVSE"
inline constexpr uint16_t kVersion = 1;

inline constexpr std::size_t kRecordSize = 424;

/// The largest state, and hence the largest value in a request or payload of a reply.
inline constexpr uint32_t kMaxTransfer = 256U << 20;

enum class Kind : uint16_t {
    Ioctl = 1,  // the record follows
    Limits = 2, // nothing follows
};

/// What a request has behind its null tests.
enum Flags : uint32_t {
    HasData = 1,   // the record's `data` is an address
    HasCmdIn = 2,  // its `cmdIn` is
    HasCmdOut = 4, // its `cmdOut` is
};

struct RequestHeader {
    uint32_t magic;     //  0 kMagic
    uint16_t version;   //  4 kVersion
    uint16_t kind;      //  6 Kind
    int32_t request;    //  8 command number
    uint32_t flags;     // 12 Flags
    uint32_t dataSize;  // 16 bytes of the value that follow
    uint32_t cmdInSize; // 20 bytes of the command input that follow
};
static_assert(sizeof(RequestHeader) == 24 && offsetof(RequestHeader, cmdInSize) == 20);

struct ReplyHeader {
    uint32_t magic;       //  0 kMagic
    uint16_t version;     //  4 kVersion
    uint16_t reserved;    //  6 0
    int32_t error;        //  8 errno of the call, 0 when it succeeded
    uint32_t status;      // 12 the record's fields as the module leaves them
    uint32_t dataLen;     // 16
    uint32_t cmdOutLen;   // 20
    uint32_t payloadSize; // 24 bytes that follow: the value fetched or the command's output; 0 on failure
    uint32_t reserved2;   // 28 0
};
static_assert(sizeof(ReplyHeader) == 32 && offsetof(ReplyHeader, payloadSize) == 24);

} // namespace dvs::wire

#endif
