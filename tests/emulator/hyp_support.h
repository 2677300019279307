/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_EMULATOR_HYP_SUPPORT_H
#define TESTS_EMULATOR_HYP_SUPPORT_H

// Short wrappers of the kernel interface for tests: fetched buffers as strings, port data from pairs.

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <utility>
#include <vector>

#include "dvs/dvs.h"
#include "platform/device_commands.h"

namespace dvs::test {

using device::Command;

struct Bytes {
    HYP_ReturnStatus status;
    std::string text;
    uint32_t Size() const { return static_cast<uint32_t>(text.size()); }
};

/// Calls a fetching function with its arguments except the outputs.
template <class Function, class... Arguments> Bytes Fetch(Function function, Arguments... arguments) {
    void *out = nullptr;
    uint32_t outLen = 0;
    Bytes bytes{function(arguments..., &out, &outLen), {}};
    if (out) bytes.text.assign(static_cast<const char *>(out), outLen);
    DVSHYP_DataFree(out);
    return bytes;
}

template <class Function> uint32_t FetchWord(Function function, const char *sw, const char *name) {
    const Bytes bytes = Fetch(function, sw, name);
    uint32_t word = 0;
    if (bytes.text.size() == sizeof word) std::memcpy(&word, bytes.text.data(), sizeof word);
    return word;
}

inline Bytes FetchUplink(const char *sw, const char *port, int uplink) {
    return Fetch(DVSHYP_UplinkDataGet, sw, port, uplink);
}

inline Bytes Exec(const std::string &command, const char *sw = "") {
    return Fetch(DVSHYP_CmdExec, sw, command.c_str(), nullptr, 0U);
}

/// An emulator fault that hits one command.
inline std::string FaultOf(Command command, const std::string &fields) {
    return "command=" + std::to_string(NumberOf(command)) + "," + fields;
}

inline void *HeapAlloc(uint64_t size) {
    return std::malloc(size);
}

using Pairs = std::vector<std::pair<std::string, std::string>>;

/// A serialized property list. It contains the kind unless the kind is active.
inline std::string PortData(const Pairs &pairs, uint32_t kind = 1) {
    DVSData *list = nullptr;
    if (DVSData_Alloc(&list, HeapAlloc, std::free) != HYP_OK) return {};
    for (const auto &[name, value] : pairs)
        (void)DVSData_Append(list, name.c_str(), value.data(), static_cast<uint32_t>(value.size()), 16);
    if (kind != 1) (void)DVSData_Append(list, "com.orbeno.common.port.volatile.type", &kind, sizeof kind, 16);
    void *out = nullptr;
    uint32_t size = 0;
    std::string data;
    if (DVSData_Serialize(list, &out, &size, 9) == HYP_OK) data.assign(static_cast<const char *>(out), size);
    std::free(out);
    DVSData_Free(list);
    return data;
}

inline HYP_ReturnStatus AddPort(const char *sw, const std::string &port, const Pairs &pairs = {},
                                uint32_t kind = 1) {
    const std::string data = PortData(pairs, kind);
    return DVSHYP_PortAdd(sw, port.c_str(), data.data(), static_cast<uint32_t>(data.size()));
}

} // namespace dvs::test

#endif
