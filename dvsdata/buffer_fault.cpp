/* SPDX-License-Identifier: Apache-2.0 */
// Texts and statuses of the faults of buffer_fault.h.

#include "dvsdata/buffer_fault.h"

#include <array>
#include <cstdio>

namespace dvs::data {
namespace {

struct FaultRow {
    const char *text;
    HYP_ReturnStatus status;
    const char *numbers; // format of found and expected
};

// In the order of FaultKind.
constexpr std::array<FaultRow, 9> kFaults{{
    {"no fault", HYP_OK, ""},
    {"fewer bytes than a header and an end marker", HYP_BAD_PARAM, " (%u bytes, at least %u needed)"},
    {"total length in the header is too small", HYP_BAD_PARAM, " (%u, at least %u needed)"},
    {"total length in the header exceeds the buffer", HYP_BAD_PARAM, " (%u, the buffer has %u bytes)"},
    {"unknown format version", HYP_BAD_PARAM, " (%u instead of %u)"},
    {"checksum does not match", HYP_BAD_CHECKSUM, " (0x%x stored, 0x%x computed)"},
    {"entry runs past the end of its buffer", HYP_BAD_PARAM, " (size %u, %u bytes left)"},
    {"entry size and value length do not fit each other", HYP_BAD_PARAM, " (value length %u, entry size %u)"},
    {"end marker is missing", HYP_BAD_PARAM, " (%u bytes left, %u needed)"},
}};

const FaultRow &Row(FaultKind kind) {
    return kFaults[static_cast<std::size_t>(kind)];
}

} // namespace

const char *Fault::Text() const {
    return Row(kind).text;
}

HYP_ReturnStatus Fault::Status() const {
    return Row(kind).status;
}

bool Fault::Describe(std::span<char> out) const {
    if (out.empty()) return false;
    int length = std::snprintf(out.data(), out.size(), "%s", Text());
    const auto used = static_cast<std::size_t>(length);
    if (used < out.size()) {
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral" // One of the rows above.
        length += std::snprintf(out.data() + used, out.size() - used, Row(kind).numbers, found, expected);
#pragma GCC diagnostic pop
    }
    return static_cast<std::size_t>(length) < out.size();
}

} // namespace dvs::data
