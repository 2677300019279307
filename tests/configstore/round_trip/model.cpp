/* SPDX-License-Identifier: Apache-2.0 */
// The round trip of a list of properties (model.h): by place for keys that have one, by kind for the others.
// The model throws for cases it does not cover: two properties of one name in a switch's list, and two
// properties that share a place where they would mix.

#include "configstore/round_trip/model.h"

#include <algorithm>
#include <map>
#include <stdexcept>

#include "configstore/round_trip/keys.h"

namespace round_trip {

using dvs::ConverterType;
using state_builder::Prop;
using state_builder::Props;

namespace {

constexpr uint32_t kType = 0x10;
constexpr uint32_t kOpaqueType = 0x18;
constexpr const char *kPortKind = "com.orbeno.common.port.volatile.type";
constexpr const char *kPortPools = "com.orbeno.common.port.respools.cfg";

constexpr uint32_t kLastVersionOfEtherswitchPrivateVlans = 106;

bool Loads(const SwitchTraits &sw, LoadsOn loads) {
    const bool isOther =
        sw.className == "cswitch" || sw.loadedVersion > kLastVersionOfEtherswitchPrivateVlans;
    switch (loads) {
    case LoadsOn::kAll:
        return true;
    case LoadsOn::kEtherswitch:
        return sw.IsEtherswitch();
    case LoadsOn::kVswitches:
        return !sw.IsEtherswitch();
    case LoadsOn::kVswitch:
        return sw.className == "vswitch";
    case LoadsOn::kPrivateVlanOwner:
        return !isOther;
    case LoadsOn::kPrivateVlanOther:
        return isOther;
    case LoadsOn::kUplinkPorts:
        return false; // after all others
    }
    return false;
}

// The rule that moves a value to another key.
Rule RuleOfPlace(std::string_view place) {
    if (place == "mtu") return Rule::kMtuUnderEveryKey;
    return place == "pvlans" ? Rule::kPrivateVlanKey : Rule::kKeyOfTheFamily;
}
bool Mixes(std::string_view place) {
    return place == "vlan" || place == "teaming" || place == "sessions";
}

// A list that keeps properties whose key is not in the table.
struct Unmapped {
    bool (*takes)(const Prop &prop);
    std::size_t position; // among the lists of a load
    bool isText;
    std::optional<uint32_t> type; // the type after a load; if empty, unchanged
    bool comesBack = true;
};
bool IsOpaque(const Prop &prop) {
    return prop.type & 0x08;
}
bool IsPlain(const Prop &prop) {
    return prop.type & 0x10;
}
bool IsAny(const Prop &) {
    return true;
}
bool IsExtra(const Prop &prop) {
    return prop.key.find("com.orbeno.extraconfig") != std::string::npos;
}
bool IsPortExtra(const Prop &prop) {
    return prop.key.starts_with("com.orbeno.port.extraConfig");
}
bool IsRuleset(const Prop &prop) {
    return prop.key.ends_with(".ruleset");
}
bool IsPlainOpaque(const Prop &prop) {
    return IsOpaque(prop) && IsPlain(prop);
}
// In the order that a save tries them.
const std::vector<Unmapped> kUnmapped[] = {
    {{IsOpaque, 1, false, kOpaqueType},
     {IsExtra, 2, true, kType},
     {IsPlain, 0, true, kType},
     {IsAny, 3, false, {}}},
    {{IsOpaque, 1, false, kOpaqueType}, {IsPlain, 0, true, kType}, {IsAny, 2, false, {}}},
    {{IsRuleset, 0, false, kType},
     {IsPlainOpaque, 1, false, kOpaqueType},
     {IsPlain, 3, true, kType},
     {IsPortExtra, 2, true, kType},
     {IsAny, 4, false, {}, false}},
};

class ListModel {
public:
    ListModel(const ListContext &context, const Props &before) : context_(context), before_(before) {}

    ListFate Run() {
        for (std::size_t i = 0; i < before_.size(); ++i)
            Save(i);
        for (const Key &key : KeysOf(context_.propClass))
            Load(key);
        for (const auto &[position, list] : unmapped_) {
            for (const auto &kept : list)
                fate_.kept.push_back(kept);
        }
        LoadPools();
        return std::move(fate_);
    }

private:
    void Gone(std::size_t i, Rule rule) { fate_.gone.push_back({i, rule}); }

    void Save(std::size_t i) {
        const Prop &prop = before_[i];
        if ((prop.type & kReadTypes) == 0) return Gone(i, Rule::kUntypedIsDropped);
        if (context_.propClass == 2 && prop.key == kPortKind) return Gone(i, Rule::kPortsAreActive);
        for (const Key &key : KeysOf(context_.propClass)) {
            if (prop.key == key.name) return SaveMapped(i, key);
        }
        SaveUnmapped(i);
    }

    void SaveMapped(std::size_t i, const Key &key) {
        if (key.type == ConverterType::kPortPools) return Occupy(&poolsOf_, i);
        const bool isVswitchPolicy =
            key.type == ConverterType::kVswitchTeaming || key.type == ConverterType::kVswitchPortVlan;
        if (isVswitchPolicy && context_.sw.IsEtherswitch()) return Gone(i, Rule::kNoVswitchPolicy);
        if (!HasDistinctKeys(key.type, before_[i].value))
            throw std::logic_error(before_[i].key + " has two elements of one key");
        auto &writer = places_[key.place];
        if (writer && Mixes(key.place)) throw std::logic_error("two share the place of " + before_[i].key);
        Occupy(&writer, i);
    }
    void Occupy(std::optional<std::size_t> *writer, std::size_t i) {
        if (*writer) Gone(**writer, Rule::kLastOneSaved);
        *writer = i;
    }

    void SaveUnmapped(std::size_t i) {
        const Prop &prop = before_[i];
        const auto &lists = kUnmapped[context_.propClass];
        const auto list =
            std::find_if(lists.begin(), lists.end(), [&](const Unmapped &each) { return each.takes(prop); });
        if (!list->comesBack) return Gone(i, Rule::kPortOtherData);
        ListFate::Kept kept{{prop.key, prop.value, list->type.value_or(prop.type)}, {i}, {}};
        if (kept.after.type != prop.type) kept.rules.insert(Rule::kTypeWord);
        if (list->isText) (void)RunSteps(ConverterType::kText, {}, &kept.after.value, &kept.rules);
        auto &stored = unmapped_[list->position];
        const auto namesake = std::find_if(stored.begin(), stored.end(),
                                           [&](const auto &each) { return each.after.key == prop.key; });
        if (namesake == stored.end()) {
            stored.push_back(kept);
        } else {
            if (context_.propClass != 2) throw std::logic_error("two properties " + prop.key);
            Gone(namesake->from.front(), Rule::kLastOneSaved);
            *namesake = kept;
        }
    }

    [[nodiscard]] Surroundings Around() const {
        const SwitchTraits &sw = context_.sw;
        return {sw.isOverlay, sw.savedVersion > 99, sw.loadedVersion > 99};
    }

    void Load(const Key &key) {
        if (!Loads(context_.sw, key.loads)) return;
        const auto writer = places_[key.place];
        if (!writer) return LoadOfNothing(key);
        const Prop &prop = before_[*writer];
        ListFate::Kept kept{{key.name, prop.value, kType}, {*writer}, {}};
        if (!RunSteps(key.type, Around(), &kept.after.value, &kept.rules))
            return Gone(*writer, *kept.rules.rbegin());
        if (prop.type != kType) kept.rules.insert(Rule::kTypeWord);
        if (prop.key != key.name) kept.rules.insert(RuleOfPlace(key.place));
        fate_.kept.push_back(kept);
    }
    // The result of a place without a saved property.
    void LoadOfNothing(const Key &key) {
        const std::string_view place = key.place;
        if (place == "vlan" && places_["priority"])
            fate_.kept.push_back({{key.name, Value(8), kType}, {}, {Rule::kPriorityVlan}});
        if (place == "name" && context_.nameless)
            fate_.kept.push_back(
                {{key.name, state_builder::Text(context_.nameless), kType}, {}, {Rule::kUnnamedIsUnknown}});
    }
    void LoadPools() {
        if (context_.pools) {
            ListFate::Kept kept{{kPortPools, *context_.pools, kType}, {}, {Rule::kPoolsOfTheSwitch}};
            if (poolsOf_) kept.from.push_back(*poolsOf_);
            if (poolsOf_ && before_[*poolsOf_] == kept.after) kept.rules.clear();
            fate_.kept.push_back(kept);
        } else if (poolsOf_) {
            Gone(*poolsOf_, Rule::kPoolsOfTheSwitch);
        }
    }

    const ListContext &context_;
    const Props &before_;
    ListFate fate_;
    std::map<std::string_view, std::optional<std::size_t>> places_;
    std::optional<std::size_t> poolsOf_;
    std::map<std::size_t, std::vector<ListFate::Kept>> unmapped_; // by position
};

} // namespace

Props ListFate::After() const {
    Props after;
    for (const Kept &each : kept)
        after.push_back(each.after);
    return after;
}

ListFate FateOf(const ListContext &context, const Props &before) {
    return ListModel(context, before).Run();
}

std::vector<std::string> Unexplained(const Props &before, const ListFate &fate) {
    std::vector<std::string> wrong;
    std::vector<int> uses(before.size());
    std::vector<int> ends(before.size());
    for (const auto &kept : fate.kept) {
        for (const std::size_t i : kept.from)
            ++uses[i];
        const bool isSame = kept.from.size() == 1 && before[kept.from.front()] == kept.after;
        if (!isSame && kept.rules.empty()) wrong.push_back(kept.after.key + " changes without a rule");
        if (isSame && !kept.rules.empty())
            wrong.push_back(kept.after.key + " has a rule and does not change");
    }
    for (const auto &gone : fate.gone)
        ++ends[gone.from];
    for (std::size_t i = 0; i < before.size(); ++i) {
        if (uses[i] + ends[i] == 0) wrong.push_back(before[i].key + " is passed over");
        if (ends[i] > 1 || (ends[i] && uses[i])) wrong.push_back(before[i].key + " is gone and is not");
    }
    return wrong;
}

} // namespace round_trip
