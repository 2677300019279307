/* SPDX-License-Identifier: Apache-2.0 */
// The walk behind `dvsctl hexdump`. Ranges are cut so that they meet without gap or overlap: a test adds them
// up.

#include <algorithm>
#include <array>

#include <fmt/format.h>

#include "dvsdata/format.h"
#include "dvsstate/state_view.h"
#include "form/model.h"
#include "form/value.h"
#include "tools/dvsctl/verbs/hexdump.h"
#include "tools/dvsctl/verbs/show.h"

namespace dvs::ctl {

namespace {

using Kind = state::StateItemKind;

class Dumper {
public:
    Dumper(Bytes bytes, const DumpFilter &filter, RangeWriter &writer)
        : bytes_(bytes), filter_(filter), writer_(writer) {}

    bool Run() {
        state::StateView view(bytes_);
        for (state::StateItem item; view.Next(&item);) {
            if (!IsWanted(item)) {
                if (item.buffer && item.kind != Kind::End) view.Skip();
                continue;
            }
            Give(item);
        }
        return found_;
    }

private:
    // Names may repeat; every namesake is given. The state's own bytes are given only without a filter.
    bool IsWanted(const state::StateItem &item) {
        const bool filtered = filter_.switchId || filter_.portId;
        if (!filtered) {
            found_ = true;
            return true;
        }
        // What is only passed through on the way to a port is walked, not given.
        if (item.path.depth == 0) return Passing();
        if (filter_.switchId && item.path.names[0] != *filter_.switchId) return false;
        if (!filter_.portId) return Found();
        if (item.path.depth == 1) return Passing();
        if (item.path.names[1] != *filter_.portId) return false;
        return Found();
    }
    bool Found() {
        silent_ = false;
        return found_ = true;
    }
    bool Passing() {
        silent_ = true;
        return true;
    }

    void Give(const state::StateItem &item) {
        if (silent_) return;
        const std::size_t depth = item.depth;
        if (item.kind == Kind::End) {
            GiveEnd(item);
            return;
        }
        if (item.kind != Kind::State) GiveEntryHead(item);
        if (item.buffer) {
            GiveHeader(*item.buffer, item.kind == Kind::State ? Bytes(bytes_) : item.entry.value,
                       depth == 0 ? 0 : depth + 1);
        } else {
            Range(item.entry.ValueOffset(), item.entry.value, depth + 1,
                  "value " + ShowValue(item.entry.value, false));
            Range(item.entry.ValueOffset() + item.entry.value.size(), item.entry.padding, depth + 1,
                  "padding");
        }
        if (item.fault && item.fault.kind != state::StateFaultKind::Buffer)
            writer_.Fault(depth + 1, ShowFault(item.fault));
    }

    void GiveEntryHead(const state::StateItem &item) {
        const data::EntryView &entry = item.entry;
        const std::size_t depth = item.depth;
        Range(entry.offset, At(entry.offset, data::kNameOffset), depth,
              fmt::format("{} {}: entry of {} bytes", KindWord(item), ShowName(entry.Name()), entry.size));
        Range(entry.offset + data::kNameOffset, entry.nameField, depth, "name");
        Range(entry.offset + data::kPropTypeOffset, At(entry.offset + data::kPropTypeOffset, 4), depth,
              fmt::format("type 0x{:02x}{}", entry.propType, item.dropped ? " (a load passes over it)" : ""));
        Range(entry.offset + data::kDataLenOffset, At(entry.offset + data::kDataLenOffset, 4), depth,
              fmt::format("value length {}", entry.DataLen()));
    }

    static std::string KindWord(const state::StateItem &item) {
        switch (item.kind) {
        case Kind::Switch:
            return "switch";
        case Kind::Field:
            return "field";
        case Kind::List:
            return "list";
        case Kind::Port:
            return ShowKind(item.portKind) + " port";
        case Kind::Property:
            return "property";
        case Kind::State:
        case Kind::Other:
        case Kind::End:
            break;
        }
        return "entry";
    }

    // The header of the buffer that fills `whole`; of a short one, what there is of it.
    void GiveHeader(const data::BufferView &view, Bytes whole, std::size_t depth) {
        struct Field {
            std::uint32_t offset, size;
            std::string what;
            bool isWrong;
        };
        const data::HeaderView &header = view.Header();
        const data::FaultKind fault = view.FirstFault().kind;
        const bool wrongSum =
            header.checksum != view.ComputedChecksum() && fault != data::FaultKind::TooShort &&
            fault != data::FaultKind::LengthTooSmall && fault != data::FaultKind::LengthTooLarge;
        const Field fields[] = {
            {data::kTotalLengthOffset, 4, fmt::format("buffer: total length {}", header.totalLength),
             fault == data::FaultKind::LengthTooSmall || fault == data::FaultKind::LengthTooLarge},
            {data::kChecksumOffset, 4,
             wrongSum ? fmt::format("checksum 0x{:08x}, the bytes have 0x{:08x}", header.checksum,
                                    view.ComputedChecksum())
                      : fmt::format("checksum 0x{:08x}", header.checksum),
             wrongSum},
            {data::kVersionOffset, 2, fmt::format("version {}", header.version),
             fault == data::FaultKind::Version},
            {data::kReservedOffset, 2, "reserved", false},
        };
        for (const Field &field : fields) {
            const std::size_t start = std::min<std::size_t>(field.offset, whole.size());
            const std::size_t size = std::min<std::size_t>(field.size, whole.size() - start);
            if (size > 0)
                Range(view.BaseOffset() + start, whole.subspan(start, size), depth, field.what,
                      field.isWrong);
        }
    }

    // Behind the last entry: the marker, or what could not be told apart; then what lies behind the buffer in
    // its value.
    void GiveEnd(const state::StateItem &item) {
        const data::BufferView &view = *item.buffer;
        const bool isState = item.depth == 0;
        const Bytes whole = isState ? Bytes(bytes_) : item.entry.value;
        const std::size_t depth = isState ? 0 : item.depth + 1;
        std::size_t at = std::min<std::size_t>(view.UsedSize() - data::kMarkerSize, whole.size());
        const auto take = [&](std::size_t size, const std::string &what, bool isWrong) {
            size = std::min(size, whole.size() - at);
            if (size > 0) Range(view.BaseOffset() + at, whole.subspan(at, size), depth, what, isWrong);
            at += size;
        };
        if (view.AtEnd()) {
            take(data::kMarkerSize, "end marker", false);
            const std::size_t total = std::min<std::size_t>(view.Header().totalLength, whole.size());
            if (at < total) take(total - at, "behind the end marker, never read", false);
        } else {
            if (const data::Fault &fault = view.FirstFault(); fault.kind != data::FaultKind::None) {
                std::array<char, 256> text{};
                (void)fault.Describe(text);
                writer_.Fault(depth, fmt::format("{}, at byte offset {} (0x{:x})", text.data(), fault.offset,
                                                 fault.offset));
            }
            take(whole.size(), "cannot be told apart", true);
        }
        take(whole.size(), isState ? "behind the state: padding of the file" : "behind the buffer", false);
        if (!isState) Range(item.entry.ValueOffset() + whole.size(), item.entry.padding, depth, "padding");
    }

    Bytes At(std::size_t offset, std::size_t size) const { return bytes_.subspan(offset, size); }

    void Range(std::size_t offset, Bytes bytes, std::size_t depth, std::string what, bool isWrong = false) {
        if (!bytes.empty()) writer_.Range({offset, bytes, depth, std::move(what), isWrong});
    }

    Bytes bytes_;
    const DumpFilter &filter_;
    RangeWriter &writer_;
    bool found_ = false;
    bool silent_ = false;
};

} // namespace

bool DumpState(Bytes bytes, const DumpFilter &filter, RangeWriter &writer) {
    return Dumper(bytes, filter, writer).Run();
}

} // namespace dvs::ctl
