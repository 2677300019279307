/* SPDX-License-Identifier: Apache-2.0 */
// States for the tests of the command line.

#include "form/states.h"

#include <utility>

#include "dvsdata/buffer_view.h"

namespace dvs::form::test {

Buffer Number(std::uint32_t value) {
    Buffer bytes(4);
    data::Store32(bytes.data(), value);
    return bytes;
}

Buffer Text(std::string_view text) {
    Buffer bytes(text.begin(), text.end());
    bytes.push_back(0);
    return bytes;
}

Buffer Raw(std::string_view bytes) {
    return {bytes.begin(), bytes.end()};
}

NewEntry MakeProperty(std::string name, Buffer value, std::uint32_t type) {
    return {std::move(name), type, std::move(value)};
}

NewEntry MakeList(std::string name, const std::vector<NewEntry> &entries, std::uint32_t type) {
    return {std::move(name), type, EncodeList(entries)};
}

NewEntry MakeSwitch(std::string id, std::vector<NewEntry> global, std::vector<NewEntry> host,
                    std::vector<NewEntry> ports, std::uint32_t version, std::string_view className) {
    Buffer classField(128, 0);
    std::copy(className.begin(), className.end(), classField.begin());
    std::vector<NewEntry> entries = {
        {"switchVersion", 0x10, Number(version)}, {"className", 0x10, classField},
        {"maxPorts", 0x10, Number(512)},          MakeList("globalPropList", global),
        MakeList("hostPropList", host),
    };
    for (NewEntry &port : ports)
        entries.push_back(std::move(port));
    return MakeList(std::move(id), entries);
}

Buffer SmallState() {
    const NewEntry kind = MakeProperty("com.orbeno.common.port.volatile.type", Number(2), 0x10);
    return EncodeList(std::vector<NewEntry>{
        MakeSwitch("alpha",
                   {MakeProperty("com.orbeno.common.alias", Text("production"), 0x10),
                    MakeProperty("x.mtu", Number(9000))},
                   {MakeProperty("x.host", Text("h"))},
                   {MakeList("1", {MakeProperty("com.orbeno.common.port.alias", Text("web-1")),
                                   MakeProperty("x.blob", Raw({"\1\2\0", 3}))}),
                    MakeList("2", {}), MakeList("1", {MakeProperty("x.note", Text("shadow of 1")), kind})}),
        MakeSwitch("beta", {}, {}, {MakeList("9", {MakeProperty("x.mtu", Number(1500))})}, 10, "vswitch"),
    });
}

namespace {

void MendAt(Buffer &state, std::size_t offset, std::size_t size, int depth) {
    data::BufferView view(data::Bytes(state).subspan(offset, size), offset);
    if (view.WalkAnyway() && depth > 0)
        for (data::EntryView entry; view.Next(&entry);)
            MendAt(state, entry.ValueOffset(), entry.value.size(), depth - 1);
    const std::uint32_t total = size >= 16 ? data::Load32(state.data() + offset) : 0;
    if (total < 16 || total > size) return;
    data::Store32(state.data() + offset + data::kChecksumOffset,
                  data::Checksum(data::Bytes(state).subspan(offset, total)));
}

} // namespace

void Mend(Buffer &state) {
    MendAt(state, 0, state.size(), 2);
}

} // namespace dvs::form::test
