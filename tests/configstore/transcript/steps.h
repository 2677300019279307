/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_TRANSCRIPT_STEPS_H
#define TESTS_CONFIGSTORE_TRANSCRIPT_STEPS_H

// The steps of scenarios. Each records its result.

#include <cstdlib>

#include "configstore/state_builder.h"
#include "configstore/transcript/transcript.h"
#include "dvs/configstore.h"

namespace transcript {

inline void Save(const state_builder::Bytes &state, const char *id = nullptr) {
    const auto len = static_cast<uint32_t>(state.size());
    Note("save: %d", DVSState_SaveBufToConfigStore_ByInstance(state.data(), len, id));
}

inline void Load(bool desired = false) {
    void *buf = nullptr;
    uint32_t len = 0;
    const int32_t status = DVSState_LoadFromConfigStoreAsBuf(&buf, &len, desired);
    Note("load: %d, %u bytes %016lx", status, len, static_cast<unsigned long>(HashOf(buf, len)));
    std::free(buf);
}

} // namespace transcript

#endif
