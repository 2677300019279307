/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_CONVERTERS_MIRROR_PORTS_H
#define CONFIGSTORE_CONVERTERS_MIRROR_PORTS_H

// The ports of mirror sessions: records at the end of the session table <-> three objects of each session.
// For mirror.cpp, which has the sessions themselves.

#include <cstddef>
#include <cstdint>
#include <span>

#include "platform/configstore.h"

namespace dvs::convert {

/// Bytes of one port record.
[[nodiscard]] std::size_t PortRecordSize(bool wide);

/// Number of port records that a session's record announces.
[[nodiscard]] uint64_t AnnouncedPorts(std::span<const uint8_t> session);

/// A session's three port objects.
struct SessionPorts {
    configstore::Object *destination, *receive, *transmit;
    /// Those of a stored session; null where it lacks one.
    static SessionPorts Of(configstore::Object *vspan);
};

/// The port records that a save has not come to yet. They run to the value's end: a text that lacks its NUL
/// ends there.
struct PortRecords {
    std::span<const uint8_t> bytes;
    std::size_t recordSize;
};

/// Writes the ports that the session announces, and moves `records` behind them. All of them must be there.
[[nodiscard]] int32_t SaveSessionPorts(const SessionPorts &ports, std::span<const uint8_t> session,
                                       PortRecords *records);

/// What a stored session adds to the table's total, which is more than it has ports: each of the three
/// objects counts the port keys of the whole session. It stands in the head and decides about the value's
/// length.
[[nodiscard]] uint64_t CountedPorts(configstore::Object *vspan);

/// Number of records that a load has to write for a stored session.
[[nodiscard]] uint64_t PortsToLoad(configstore::Object *vspan);

/// The port area of the value that is being loaded, and the index of the next record in it.
struct PortArea {
    std::span<uint8_t> bytes;
    std::size_t recordSize;
    std::size_t next = 0;
};

/// Writes a session's port records into the area, and their counts and first index into the session's record.
void LoadSessionPorts(const SessionPorts &ports, std::span<uint8_t> session, PortArea *area);

} // namespace dvs::convert

#endif
