/* SPDX-License-Identifier: Apache-2.0 */
// The walk of state_view.h. It checks each buffer once on entry, in the order in which a load checks it;
// after that it only returns items.

#include "dvsstate/state_view.h"

#include <algorithm>
#include <cstring>

#include "dvsstate/names.h"

namespace dvs::state {

namespace {

using data::BufferView;
using data::Bytes;
using data::EntryView;

// In the order of kFixedEntries; the index into Level::fieldOffsets.
enum FixedEntry : std::size_t { kVersionEntry, kClassEntry, kMaxPortsEntry, kGlobalEntry, kHostEntry };
constexpr std::size_t kNoEntry = 0; // no entry starts in a header

bool IsDropped(const EntryView &entry) {
    return (entry.propType & data::kDeserializeTypeMask) == 0;
}

std::optional<uint32_t> U32Of(const EntryView &entry) {
    if (entry.value.size() < sizeof(uint32_t)) return std::nullopt;
    return data::Load32(entry.value.data());
}

std::string_view TextOf(const EntryView &entry) {
    const auto *text = reinterpret_cast<const char *>(entry.value.data());
    return {text, entry.value.empty() ? 0 : strnlen(text, entry.value.size())};
}

/// The fault of one buffer, including all of its entries.
data::Fault CheckBuffer(BufferView view) {
    view.Rewind();
    for (EntryView entry; view.Next(&entry);) {
    }
    return view.FirstFault();
}

StateFault BufferFault(const data::Fault &fault, const StatePath &path) {
    if (fault.kind == data::FaultKind::None) return {};
    return {StateFaultKind::Buffer, fault.offset, path, fault};
}

/// The first entry of each fixed name, as a load would keep it.
std::array<EntryView, std::size(kFixedEntries)> FindFixedEntries(BufferView view) {
    std::array<EntryView, std::size(kFixedEntries)> found;
    std::array<bool, std::size(kFixedEntries)> have{};
    (void)view.WalkAnyway(); // a buffer that cannot be walked has no entries
    for (EntryView entry; view.Next(&entry);) {
        if (IsDropped(entry)) continue;
        const auto name = std::ranges::find(kFixedEntries, entry.Name());
        const auto index = static_cast<std::size_t>(name - std::begin(kFixedEntries));
        if (name == std::end(kFixedEntries) || have[index]) continue;
        found[index] = entry;
        have[index] = true;
    }
    return found;
}

struct FieldCheck {
    FixedEntry entry;
    StateFaultKind missing, tooShort;
};

constexpr FieldCheck kFieldChecks[] = {
    // entry         missing                           shorter than four bytes
    {kVersionEntry, StateFaultKind::VersionMissing, StateFaultKind::VersionShort},
    {kClassEntry, StateFaultKind::ClassMissing, StateFaultKind::None},
    {kMaxPortsEntry, StateFaultKind::MaxPortsMissing, StateFaultKind::MaxPortsShort},
};

StatePath ChildPath(StatePath path, std::string_view name) {
    path.names[path.depth++] = name;
    return path;
}

} // namespace

StatePath StateView::PathTo(std::size_t depth, std::string_view name) const {
    StatePath path;
    path.depth = depth;
    for (std::size_t i = 1; i < depth; i++)
        path.names[i - 1] = levels_[i].entry.Name();
    if (depth > 0) path.names[depth - 1] = name;
    return path;
}

void StateView::Descend(StateItem *item, Bytes bytes, std::size_t offset) {
    Level &level = levels_[depth_++];
    level = {BufferView(bytes, offset), item->entry, {}, false};
    item->buffer = &level.view;
    item->fault = BufferFault(CheckBuffer(level.view), item->path);
    (void)level.view.WalkAnyway(); // if it returns false, the level has no entries
}

void StateView::FillSwitch(StateItem *item) {
    item->kind = StateItemKind::Switch;
    Descend(item, item->entry.value, item->entry.ValueOffset());
    Level &level = levels_[depth_ - 1];
    const auto fixed = FindFixedEntries(level.view);
    for (std::size_t i = 0; i < fixed.size(); i++)
        level.fieldOffsets[i] = fixed[i].offset;
    if (fixed[kVersionEntry].offset != kNoEntry) item->sw.version = U32Of(fixed[kVersionEntry]);
    if (fixed[kMaxPortsEntry].offset != kNoEntry) item->sw.maxPorts = U32Of(fixed[kMaxPortsEntry]);
    if (fixed[kClassEntry].offset != kNoEntry) item->sw.className = TextOf(fixed[kClassEntry]);

    for (const FixedEntry list : {kHostEntry, kGlobalEntry}) {
        if (item->fault || fixed[list].offset == kNoEntry) continue;
        item->fault = BufferFault(data::VerifyBuffer(fixed[list].value, fixed[list].ValueOffset()),
                                  ChildPath(item->path, kFixedEntries[list]));
    }
    for (const FieldCheck &check : kFieldChecks) {
        if (item->fault) return;
        const EntryView &entry = fixed[check.entry];
        if (entry.offset == kNoEntry) {
            item->fault = {check.missing, item->entry.offset, item->path, {}};
        } else if (check.tooShort != StateFaultKind::None && !U32Of(entry)) {
            item->fault = {
                check.tooShort, entry.offset, ChildPath(item->path, kFixedEntries[check.entry]), {}};
        }
    }
}

void StateView::FillMember(StateItem *item) {
    const auto &offsets = levels_[1].fieldOffsets;
    const auto found = std::ranges::find(offsets, item->entry.offset);
    const auto index = static_cast<std::size_t>(found - offsets.begin());
    if (index <= kMaxPortsEntry) {
        item->kind = StateItemKind::Field;
        return;
    }
    item->kind = found == offsets.end() ? StateItemKind::Port : StateItemKind::List;
    Descend(item, item->entry.value, item->entry.ValueOffset());
    if (item->kind == StateItemKind::List) return;

    BufferView view = levels_[depth_ - 1].view;
    for (EntryView entry; view.Next(&entry);) {
        if (IsDropped(entry) || entry.Name() != kPortKind) continue;
        const std::optional<uint32_t> kind = U32Of(entry);
        if (kind) {
            item->portKind = *kind;
        } else if (!item->fault) {
            item->fault = {StateFaultKind::PortKindShort, entry.offset, ChildPath(item->path, kPortKind), {}};
        }
        return;
    }
}

bool StateView::Next(StateItem *item) {
    *item = {};
    if (!started_) {
        started_ = true;
        Descend(item, bytes_, 0);
        return true;
    }
    if (depth_ == 0) return false;
    Level &level = levels_[depth_ - 1];
    if (level.skipped || !level.view.Next(&item->entry)) {
        depth_--;
        item->kind = StateItemKind::End;
        item->depth = depth_;
        item->entry = level.entry;
        item->path = PathTo(depth_, level.entry.Name());
        item->buffer = &level.view;
        return true;
    }
    item->depth = depth_;
    item->path = PathTo(depth_, item->entry.Name());
    item->dropped = IsDropped(item->entry);
    if (depth_ == StatePath::kMaxDepth)
        item->kind = StateItemKind::Property;
    else if (item->dropped)
        item->kind = StateItemKind::Other;
    else if (depth_ == 1)
        FillSwitch(item);
    else
        FillMember(item);
    return true;
}

void StateView::Skip() {
    if (depth_ > 0) levels_[depth_ - 1].skipped = true;
}

bool StatePath::Format(std::span<char> out) const {
    std::size_t used = 0;
    bool whole = !out.empty();
    const auto put = [&](std::string_view text) {
        const std::size_t room = out.empty() ? 0 : out.size() - 1 - used;
        const std::size_t size = std::min(text.size(), room);
        if (size > 0) std::memcpy(out.data() + used, text.data(), size);
        used += size;
        whole = whole && size == text.size();
    };
    for (std::size_t i = 0; i < depth; i++) {
        if (i > 0) put("/");
        put(names[i]);
    }
    if (!out.empty()) out[used] = '\0';
    return whole;
}

} // namespace dvs::state
