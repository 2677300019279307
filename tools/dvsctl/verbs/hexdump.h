/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_VERBS_HEXDUMP_H
#define DVSCTL_VERBS_HEXDUMP_H

// The bytes of a state in order, each range with what it is. dump.cpp walks, hexdump.cpp writes.

#include <cstddef>
#include <optional>
#include <string>

#include "form/text.h"
#include "tools/dvsctl/form.h"

namespace dvs::ctl {

struct ByteRange {
    std::size_t offset; ///< from the start of the state
    Bytes bytes;
    std::size_t depth; ///< of nesting: 0 for the state's own header
    std::string what;  ///< escaped
    bool isWrong;      ///< the bytes are not what they should be
};

class RangeWriter {
public:
    virtual ~RangeWriter() = default;
    virtual void Range(const ByteRange &range) = 0;
    /// What is wrong with the buffer or entry whose ranges came last.
    virtual void Fault(std::size_t depth, const std::string &text) = 0;
};

struct DumpFilter {
    std::optional<std::string> switchId, portId;
};

/// Gives every byte once, in order; with a filter, only the bytes of the switches and ports named. False when
/// the filter named something that is not there.
bool DumpState(Bytes bytes, const DumpFilter &filter, RangeWriter &writer);

} // namespace dvs::ctl

#endif
