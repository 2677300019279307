/* SPDX-License-Identifier: Apache-2.0 */
// Compares the port table with a simple model under random adds, removes, finds and changes of kind and
// limit. The table is large enough to use its index. Ids are few, so that kinds and zombies share ids.

#include <algorithm>
#include <optional>

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include "dvsstate/port_table.h"
#include "dvsstate/state_support.h"

using namespace dvs::test;
using dvs::state::DVSStatePortAdd;
using dvs::state::DVSStatePortRemove;

namespace {

constexpr std::uint32_t kSlots = 300;

struct ModelPort {
    std::string id;
    std::uint32_t kind;
};
using Model = std::vector<std::optional<ModelPort>>;

std::optional<std::size_t> FindIn(const Model &model, const std::string &id, std::uint32_t kind,
                                  std::size_t end = kSlots) {
    for (std::size_t slot = 0; slot < end; slot++)
        if (model[slot] && model[slot]->id == id && model[slot]->kind == kind) return slot;
    return std::nullopt;
}

HYP_ReturnStatus AddTo(Model *model, const std::string &id, std::uint32_t kind, std::uint32_t maxPorts) {
    std::size_t ports = 0, firstFree = kSlots;
    for (std::size_t slot = kSlots; slot-- > 0;)
        model->at(slot) ? ports++ : firstFree = slot;
    if (ports == kSlots) return HYP_LIMIT_EXCEEDED;
    if (kind != DVS_PORT_ZOMBIE && FindIn(*model, id, kind, std::min(maxPorts, kSlots))) return HYP_EXISTS;
    if (firstFree >= maxPorts) return HYP_LIMIT_EXCEEDED;
    model->at(firstFree) = ModelPort{id, kind};
    return HYP_OK;
}

void ExpectSame(DVSwitch *sw, const Model &model) {
    std::vector<std::string> expected;
    for (const auto &port : model)
        if (port) expected.push_back(port->id + "/" + std::to_string(port->kind));
    RC_ASSERT(PortsOf(sw) == expected);
    RC_ASSERT(sw->numPorts == expected.size());
    RC_ASSERT(HostPortCount() == expected.size());
}

void Step(DVSwitch *sw, Model *model, std::uint32_t ids) {
    const std::string id = "port-" + std::to_string(*rc::gen::inRange(0u, ids));
    const std::uint32_t kind = *rc::gen::inRange(1u, 5u);
    switch (*rc::gen::weightedElement<int>({{8, 0}, {3, 1}, {4, 2}, {1, 3}, {1, 4}})) {
    case 0:
        RC_ASSERT(TryAddPort(sw, id, kind) == AddTo(model, id, kind, sw->maxPorts));
        break;
    case 1: {
        const auto slot = FindIn(*model, id, kind);
        RC_ASSERT(DVSStatePortRemove(sw, id.c_str(), kind) == (slot ? HYP_OK : HYP_NOT_FOUND));
        if (slot) model->at(*slot).reset();
        break;
    }
    case 2: {
        const auto slot = FindIn(*model, id, kind);
        DVSPort *port = DVSState_FindPortByIDAndType(sw, id.c_str(), kind);
        RC_ASSERT(port == (slot ? sw->ports[*slot] : nullptr));
        break;
    }
    case 3: { // callers may change a port's kind on the record
        const auto slot = *rc::gen::inRange<std::size_t>(0, kSlots);
        if (!model->at(slot)) break;
        model->at(slot)->kind = sw->ports[slot]->portType = kind;
        break;
    }
    default:
        sw->maxPorts = *rc::gen::inRange(1u, 2 * kSlots);
        break;
    }
}

RC_GTEST_FIXTURE_PROP(StateTest, PortTableIsItsModel, ()) {
    SetHostPorts(kSlots);
    RC_ASSERT(DVSState_ConfigReset() == HYP_OK);
    DVSwitch *sw = AddSwitch("dvs");
    Model model(kSlots);
    const auto ids = *rc::gen::element(5u, 100u, 2000u);
    const auto start = *rc::gen::inRange(0u, 290u);
    for (std::uint32_t i = 0; i < start; i++) {
        const std::string id = "port-" + std::to_string(i);
        RC_ASSERT(TryAddPort(sw, id, 1 + i % 4) == AddTo(&model, id, 1 + i % 4, sw->maxPorts));
    }
    for (auto steps = *rc::gen::inRange(1, 200); steps > 0; steps--)
        Step(sw, &model, ids);
    ExpectSame(sw, model);
    RC_ASSERT(DVSState_ConfigReset() == HYP_OK);
}

} // namespace
