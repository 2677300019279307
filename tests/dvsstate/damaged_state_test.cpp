/* SPDX-License-Identifier: Apache-2.0 */
// Damaged states in blocks of exactly their size: truncated at every length, every byte changed, and wrong
// sizes and lengths with recomputed checksums at every level. The library, the level-by-level reference and
// the read-only view must agree on each.

#include <algorithm>
#include <cstdlib>
#include <random>

#include "dvsstate/level_by_level.h"
#include "dvsstate/state_support.h"
#include "dvsstate/state_view.h"

using namespace dvs::test;

namespace {

class DamagedState : public StateTest {
protected:
    DamagedState() {
        SetHostPorts(512);
        DVSwitch *sw = AddSwitch("dvs");
        Append(sw->globalPropList, {"com.orbeno.common.alias", std::string("a\0", 2)});
        AddPort(sw, "p1", DVS_PORT_ACTIVE, {{"x", "1"}});
        AddPort(sw, "p2", DVS_PORT_SHADOW);
        AddPort(sw, "p2", DVS_PORT_ZOMBIE);
        AddLimitedSwitch("other", 1);
        state_ = StateBytes();
        EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
    }
    Buffer state_;
};

using Load = HYP_ReturnStatus (*)(const void *, std::uint32_t);

struct Result {
    HYP_ReturnStatus status;
    std::vector<std::string> messages;
    Buffer table;
};

Result Loaded(Load load, const ExactBlock &block) {
    Result result;
    {
        StateMessages messages(9, 9);
        result.status = load(block.data(), block.size());
        result.messages = messages.Take();
    }
    result.table = StateBytes();
    EXPECT_EQ(DVSState_ConfigReset(), HYP_OK);
    return result;
}

/// Loads the bytes with the library and with the reference into an empty table and walks them with the view;
/// all must agree.
HYP_ReturnStatus JudgedAlike(std::span<const std::uint8_t> bytes) {
    const ExactBlock block(bytes);
    const Result fast = Loaded(DVSState_ConfigDeserialize, block);
    const Result plain = Loaded(plain::ConfigDeserialize, block);
    EXPECT_EQ(fast.status, plain.status);
    EXPECT_EQ(fast.messages, plain.messages);
    EXPECT_TRUE(fast.table == plain.table);
    const auto verdict = dvs::state::VerifyState(block.bytes(), 512);
    EXPECT_EQ(verdict.first.Status(), fast.status) << verdict.first.Text();
    EXPECT_EQ(verdict.located.Status() == HYP_OK, fast.status == HYP_OK);
    EXPECT_LE(verdict.first.offset, bytes.size());
    if (fast.status == HYP_OK) {
        EXPECT_EQ(verdict.sound.switches, verdict.all.switches);
        EXPECT_EQ(verdict.sound.properties, verdict.all.properties);
    }
    return fast.status;
}

/// Recomputes the checksums at every level, as far as the sizes lead from one entry to the next.
void MendAll(Buffer *state, std::size_t offset, std::size_t size, int levels) {
    if (size < 16) return;
    if (levels > 1) {
        for (std::size_t at = offset + 12; at + 140 <= offset + size;) {
            const std::uint32_t entrySize = U32At(*state, at);
            const std::uint32_t dataLen = U32At(*state, at + 136);
            if (entrySize < 143 || entrySize > offset + size - at || dataLen > entrySize - 140) break;
            MendAll(state, at + 140, dataLen, levels - 1);
            at += entrySize;
        }
    }
    const std::size_t length = std::min<std::size_t>(U32At(*state, offset), size);
    const auto bytes = std::span(*state).subspan(offset, length);
    SetU32(state, offset + 4, PlainChecksum(bytes));
}

void MendState(Buffer *state) {
    MendAll(state, 0, state->size(), 3);
}

TEST_F(DamagedState, IsRejectedWhenTruncatedAtAnyLength) {
    for (std::size_t size = 0; size < state_.size(); size++)
        EXPECT_NE(JudgedAlike(std::span(state_).first(size)), HYP_OK) << size;
    EXPECT_EQ(JudgedAlike(state_), HYP_OK);
}

TEST_F(DamagedState, AllReadersAgreeOnEachChangedByte) {
    for (std::size_t at = 0; at < state_.size(); at++) {
        Buffer damaged = state_;
        damaged[at] ^= 0x41;
        const HYP_ReturnStatus status = JudgedAlike(damaged);
        EXPECT_TRUE(at < 32 || status == HYP_BAD_CHECKSUM) << at;
        if (HasFailure()) FAIL() << "byte " << at;
    }
}

TEST_F(DamagedState, AllReadersAgreeOnEachChangedByteWithValidChecksums) {
    for (std::size_t at = 0; at < state_.size(); at++) {
        for (const int change : {0x01, 0x80}) {
            Buffer damaged = state_;
            damaged[at] ^= static_cast<std::uint8_t>(change);
            MendState(&damaged);
            JudgedAlike(damaged);
            if (HasFailure()) FAIL() << "byte " << at;
        }
    }
}

/// The offsets of every buffer and every entry of the state.
struct Places {
    std::vector<std::size_t> buffers, entries;
};

Places PlacesOf(const Buffer &state) {
    Places places;
    dvs::state::StateView view(state);
    for (dvs::state::StateItem item; view.Next(&item);) {
        if (item.kind == dvs::state::StateItemKind::End) continue;
        if (item.buffer) places.buffers.push_back(item.buffer->BaseOffset());
        if (item.depth > 0) places.entries.push_back(item.entry.offset);
    }
    return places;
}

constexpr std::uint32_t kLies[] = {0,   1,   3,          4,          12,         15,         16,
                                   17,  139, 140,        143,        144,        145,        147,
                                   148, 256, 0x7fffffff, 0x80000000, 0xfffffff0, 0xfffffffd, 0xffffffff};

TEST_F(DamagedState, AllReadersAgreeOnWrongSizes) {
    const Places places = PlacesOf(state_);
    for (const std::size_t buffer : places.buffers) {
        for (const std::uint32_t lie : kLies) {
            Buffer damaged = state_;
            SetU32(&damaged, buffer, lie);
            MendState(&damaged);
            JudgedAlike(damaged);
        }
    }
    for (const std::size_t entry : places.entries) {
        for (const std::size_t field : {0u, 136u}) {
            for (const std::uint32_t lie : kLies) {
                Buffer damaged = state_;
                SetU32(&damaged, entry + field, lie);
                MendState(&damaged);
                JudgedAlike(damaged);
                SetU32(&damaged, entry + field, U32At(state_, entry + field) + lie);
                MendState(&damaged);
                JudgedAlike(damaged);
                if (HasFailure()) FAIL() << "entry " << entry << " field " << field << " lie " << lie;
            }
        }
    }
}

TEST_F(DamagedState, AllReadersAgreeOnRandomChanges) {
    const char *count = std::getenv("DVS_TEST_MUTATIONS");
    std::mt19937 random(20261121);
    const Places places = PlacesOf(state_);
    for (long round = count ? std::atol(count) : 2000; round > 0; round--) {
        Buffer damaged = state_;
        for (auto changes = 1 + random() % 3; changes > 0; changes--) {
            switch (random() % 4) {
            case 0:
                damaged[random() % damaged.size()] = static_cast<std::uint8_t>(random());
                break;
            case 1: // copies a name or type over another entry's
                std::copy_n(&state_[places.entries[random() % places.entries.size()] + 4], 132,
                            &damaged[places.entries[random() % places.entries.size()] + 4]);
                break;
            case 2:
                SetU32(&damaged, places.entries[random() % places.entries.size()] + 132,
                       static_cast<std::uint32_t>(random() % 0x50));
                break;
            default:
                damaged[places.entries[random() % places.entries.size()] + 4] = '\0';
                break;
            }
        }
        if (random() % 8 != 0) MendState(&damaged);
        JudgedAlike(damaged);
        if (HasFailure()) FAIL() << "round " << round;
    }
}

} // namespace
