/* SPDX-License-Identifier: Apache-2.0 */
// The read-only cursor of buffer_view.h: the checks of buffer_check.h, with offsets from the outermost bytes.

#include "dvsdata/buffer_view.h"

#include <algorithm>
#include <cstring>

#include "dvsdata/buffer_check.h"

namespace dvs::data {
std::string_view EntryView::Name() const {
    if (nameField.empty()) return {};
    const auto *const text = reinterpret_cast<const char *>(nameField.data());
    return {text, ::strnlen(text, kMaxNameLen)};
}

BufferView::BufferView(Bytes bytes, std::size_t baseOffset) : bytes_(bytes), base_(baseOffset) {
    std::uint8_t fields[kHeaderSize] = {};
    if (!bytes.empty()) std::memcpy(fields, bytes.data(), std::min<std::size_t>(bytes.size(), kHeaderSize));
    header_ = {Load32(fields + kTotalLengthOffset), Load32(fields + kChecksumOffset),
               Load16(fields + kVersionOffset), Load16(fields + kReservedOffset)};
    headerFault_ = CheckLengths(bytes);
    if (!headerFault_) {
        bytes_ = bytes.first(header_.totalLength);
        computedChecksum_ = Checksum(bytes_);
        headerFault_ = CheckVersion(bytes_);
        if (!headerFault_) headerFault_ = CheckChecksum(bytes_, computedChecksum_);
    }
    if (headerFault_) headerFault_.offset += base_;
    walking_ = !headerFault_;
    fault_ = headerFault_;
}

bool BufferView::WalkAnyway() {
    walking_ =
        !headerFault_ || headerFault_.kind == FaultKind::Version || headerFault_.kind == FaultKind::Checksum;
    return walking_;
}

void BufferView::Rewind() {
    offset_ = kHeaderSize;
    atEnd_ = false;
    fault_ = headerFault_;
    if (!headerFault_) walking_ = true;
}

bool BufferView::Next(EntryView *entry) {
    if (!walking_) return false;
    CheckedEntry checked;
    Fault fault;
    const Step step = CheckEntry(bytes_, offset_, &checked, &fault);
    if (step != Step::Entry) {
        walking_ = false;
        atEnd_ = step == Step::End;
        fault.offset += base_;
        if (step == Step::Fault && !fault_) fault_ = fault;
        return false;
    }
    const Bytes rest = bytes_.subspan(offset_);
    entry->offset = base_ + offset_;
    entry->size = checked.size;
    entry->propType = Load32(checked.at + kPropTypeOffset);
    entry->nameField = rest.subspan(kNameOffset, kNameSize);
    entry->value = rest.subspan(kEntryFixedSize, checked.dataLen);
    entry->padding =
        rest.subspan(kEntryFixedSize + checked.dataLen, checked.size - kEntryFixedSize - checked.dataLen);
    offset_ += checked.size;
    return true;
}

Fault VerifyBuffer(Bytes bytes, std::size_t baseOffset) {
    BufferView view(bytes, baseOffset);
    EntryView entry;
    while (view.Next(&entry)) {
    }
    return view.FirstFault();
}

} // namespace dvs::data
