/* SPDX-License-Identifier: Apache-2.0 */
// The round trip of a whole state (model.h): the fields of switches, and their lists one by one.

#include <algorithm>
#include <stdexcept>

#include <gtest/gtest.h>

#include "configstore/round_trip/model.h"

namespace round_trip {

using state_builder::Port;
using state_builder::Prop;
using state_builder::Props;
using state_builder::Switch;

namespace {

constexpr const char *kLimitlessClasses[] = {"ovlvswitch", "etherswitch", "stub-vswitch", "cswitch",
                                             "vswitch"};
constexpr const char *kVersion = "com.orbeno.common.version";
constexpr const char *kOverlay = "com.orbeno.common.portset.ovl";
constexpr const char *kPools = "com.orbeno.common.respools.cfg";
constexpr const char *kUplinkKeys = "com.orbeno.common.host.uplinkPorts";

class StateModel {
public:
    StateModel(uint32_t hostLimit, Ledger *ledger) : hostLimit_(hostLimit), ledger_(ledger) {}

    Switch After(const Switch &before) {
        Switch after = before;
        Fields(before, &after);
        ListContext context{TraitsOf(before, after), 0, {}, "unknown"};
        after.global = List(context, before.global);
        context.nameless = nullptr;
        context.propClass = 1;
        after.host = List(context, before.host);
        context.propClass = 2;
        after.ports.clear();
        for (const Port &port : Merged(before.ports)) {
            context.pools = IsUplink(after, port.id) ? ValueOf(after.global, kPools) : std::nullopt;
            after.ports.push_back({port.id, List(context, port.props)});
        }
        return after;
    }

private:
    static std::optional<Value> ValueOf(const Props &props, const char *key) {
        for (const Prop &prop : props) {
            if (prop.key == key) return prop.value;
        }
        return {};
    }
    // The properties of a list that remain when a save begins.
    static Props Read(Props props) {
        std::erase_if(props, [](const Prop &prop) { return (prop.type & kReadTypes) == 0; });
        return props;
    }
    static bool IsUplink(const Switch &sw, const std::string &port) {
        const auto keys = ValueOf(sw.host, kUplinkKeys);
        for (std::size_t at = 4; keys && at < keys->size(); at += 48) {
            if (TextAt(*keys, at, 48) == port) return true;
        }
        return false;
    }

    void Fields(const Switch &before, Switch *after) {
        const Props read = Read(before.global);
        const auto stored = ValueOf(read, kVersion);
        if (!stored) throw std::logic_error("a switch without a version does not load");
        const auto overlay = ValueOf(read, kOverlay);
        isOverlay_ = overlay && TextAt(*overlay, 0, 5) == "true" && overlay->size() > 4;
        Value version = *stored;
        Rules rules;
        (void)RunSteps(dvs::ConverterType::kSwitchVersion, {isOverlay_, false, false}, &version, &rules);
        after->version = NumberAt(version, 0);
        if (after->version != before.version) ledger_->Note(Rule::kVersionIsTheProperty);
        after->classField = state_builder::Text(before.className);
        if (after->classField != before.classField) ledger_->Note(Rule::kClassNameIsText);
        if (std::count(std::begin(kLimitlessClasses), std::end(kLimitlessClasses), before.className))
            after->maxPorts = hostLimit_;
        if (after->maxPorts != before.maxPorts) ledger_->Note(Rule::kHostLimit);
    }
    [[nodiscard]] SwitchTraits TraitsOf(const Switch &before, const Switch &after) const {
        return {before.className, before.version, after.version, isOverlay_};
    }

    // One port per id, with the properties of all ports of that id.
    std::vector<Port> Merged(const std::vector<Port> &ports) {
        std::vector<Port> merged;
        for (const Port &port : ports) {
            const auto namesake = std::find_if(merged.begin(), merged.end(),
                                               [&](const Port &each) { return each.id == port.id; });
            if (namesake == merged.end()) {
                merged.push_back(port);
            } else {
                ledger_->Note(Rule::kOnePortOfAnId);
                namesake->props.insert(namesake->props.end(), port.props.begin(), port.props.end());
            }
        }
        return merged;
    }

    Props List(const ListContext &context, const Props &before) {
        const ListFate fate = FateOf(context, before);
        for (const std::string &wrong : Unexplained(before, fate))
            ADD_FAILURE() << wrong;
        std::size_t last = 0;
        for (const auto &kept : fate.kept) {
            for (const Rule rule : kept.rules)
                ledger_->Note(rule);
            if (kept.from.empty()) continue;
            if (kept.from.front() < last) ledger_->Note(Rule::kRowOrder);
            last = kept.from.front();
        }
        for (const auto &gone : fate.gone)
            ledger_->Note(gone.rule);
        return fate.After();
    }

    uint32_t hostLimit_;
    Ledger *ledger_;
    bool isOverlay_ = false;
};

// The property, with the part of its value around its first difference to the other.
std::string Show(const Prop *prop, const Prop *other) {
    if (!prop) return "nothing";
    const Value none;
    const Value &value = prop->value;
    const Value &rest = other ? other->value : none;
    const auto [mine, theirs] = std::mismatch(value.begin(), value.end(), rest.begin(), rest.end());
    const std::size_t at = static_cast<std::size_t>(mine - value.begin()) / 16 * 16;
    std::string text = prop->key + " of type " + std::to_string(prop->type) + ", " +
                       std::to_string(value.size()) + " bytes, from " + std::to_string(at) + ":";
    for (std::size_t i = at; i < std::min(value.size(), at + 32); ++i)
        text += std::string(" ") + "0123456789abcdef"[value[i] >> 4] + "0123456789abcdef"[value[i] & 15];
    return text;
}

class Comparison {
public:
    std::vector<std::string> lines;

    template <class T> void Field(const std::string &where, const T &expected, const T &actual) {
        if (expected == actual) return;
        lines.push_back(where + ": expected " + testing::PrintToString(expected) + ", is " +
                        testing::PrintToString(actual));
    }
    void List(const std::string &where, const Props &expected, const Props &actual) {
        const std::size_t count = std::max(expected.size(), actual.size());
        for (std::size_t i = 0; i < count; ++i) {
            const Prop *one = i < expected.size() ? &expected[i] : nullptr;
            const Prop *other = i < actual.size() ? &actual[i] : nullptr;
            if (one && other && *one == *other) continue;
            lines.push_back(where + " property " + std::to_string(i) + ":\n  expected " + Show(one, other) +
                            "\n  is       " + Show(other, one));
        }
    }
    void Switches(const Switch &expected, const Switch &actual) {
        const std::string where = "switch " + expected.id;
        Field(where + " id", expected.id, actual.id);
        Field(where + " version", expected.version, actual.version);
        Field(where + " class", expected.className, actual.className);
        Field(where + " class field", expected.classField, actual.classField);
        Field(where + " limit", expected.maxPorts, actual.maxPorts);
        List(where + " global", expected.global, actual.global);
        List(where + " host", expected.host, actual.host);
        Field(where + " number of ports", expected.ports.size(), actual.ports.size());
        for (std::size_t i = 0; i < std::min(expected.ports.size(), actual.ports.size()); ++i) {
            Field(where + " port id", expected.ports[i].id, actual.ports[i].id);
            List(where + " port " + expected.ports[i].id, expected.ports[i].props, actual.ports[i].props);
        }
    }
};

} // namespace

std::vector<Switch> AfterRoundTrip(const std::vector<Switch> &before, uint32_t hostLimit, Ledger *ledger) {
    std::vector<Switch> after;
    for (const Switch &sw : before)
        after.push_back(StateModel(hostLimit, ledger).After(sw));
    const auto byId = [](const Switch &a, const Switch &b) { return a.id < b.id; };
    if (!std::is_sorted(after.begin(), after.end(), byId)) ledger->Note(Rule::kSwitchesById);
    std::stable_sort(after.begin(), after.end(), byId);
    return after;
}

std::vector<std::string> Differences(const std::vector<Switch> &expected, const std::vector<Switch> &actual) {
    Comparison comparison;
    comparison.Field("number of switches", expected.size(), actual.size());
    for (std::size_t i = 0; i < std::min(expected.size(), actual.size()); ++i)
        comparison.Switches(expected[i], actual[i]);
    return comparison.lines;
}

} // namespace round_trip
