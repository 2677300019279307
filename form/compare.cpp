/* SPDX-License-Identifier: Apache-2.0 */
// The comparison: every level is the same work, pairing the items of two sequences by a key.

#include "form/compare.h"

#include <algorithm>
#include <map>
#include <tuple>
#include <utility>

#include "dvsdata/format.h"

namespace dvs::form {

namespace {

template <typename Item> struct Pair { const Item *before = nullptr, *after = nullptr; };

// Pairs what has the same key; the n-th namesake with the n-th. `keyOf` gives something ordered.
template <typename Item, typename KeyOf>
std::vector<Pair<Item>> PairUp(const std::vector<const Item *> &before,
                               const std::vector<const Item *> &after, KeyOf keyOf) {
    using Key = decltype(keyOf(*before.front()));
    std::map<Key, std::vector<std::size_t>> open; // places of `after` without a partner, last first
    for (std::size_t i = after.size(); i-- > 0;)
        open[keyOf(*after[i])].push_back(i);
    std::vector<Pair<Item>> pairs;
    std::vector<bool> taken(after.size(), false);
    for (const Item *item : before) {
        auto &places = open[keyOf(*item)];
        if (places.empty()) {
            pairs.push_back({item, nullptr});
        } else {
            pairs.push_back({item, after[places.back()]});
            taken[places.back()] = true;
            places.pop_back();
        }
    }
    for (std::size_t i = 0; i < after.size(); ++i)
        if (!taken[i]) pairs.push_back({nullptr, after[i]});
    return pairs;
}

// True when the paired items of `before` are in another order in `after`.
template <typename Item> bool IsReordered(const std::vector<Pair<Item>> &pairs) {
    const Item *last = nullptr;
    for (const Pair<Item> &pair : pairs) {
        if (!pair.before || !pair.after) continue;
        if (last && pair.after < last) return true;
        last = pair.after;
    }
    return false;
}

template <typename Item> std::vector<const Item *> Pointers(const std::vector<Item> &items) {
    std::vector<const Item *> pointers;
    for (const Item &item : items)
        pointers.push_back(&item);
    return pointers;
}

std::vector<const Entry *> EntriesOf(const Switch &sw, Role role) {
    std::vector<const Entry *> entries;
    for (const Entry &entry : sw.entries)
        if (entry.role == role) entries.push_back(&entry);
    return entries;
}

// The properties of a list. The one that carries a port's kind is left out: it is reported as the kind.
std::vector<const Property *> SettingsOf(const Entry *entry) {
    if (!entry) return {};
    std::vector<const Property *> settings = Pointers(entry->list);
    if (entry->role != Role::Port) return settings;
    const auto kind = std::find_if(settings.begin(), settings.end(), [](const Property *p) {
        return p->name == kKindProperty && (p->type & data::kDeserializeTypeMask) != 0;
    });
    if (kind != settings.end()) settings.erase(kind);
    return settings;
}

bool SameBytes(Bytes a, Bytes b) {
    return AsText(a) == AsText(b);
}

// Bytes behind the NUL of a class name mean nothing.
bool SameText(Bytes a, Bytes b) {
    const std::string_view left = AsText(a), right = AsText(b);
    return left.substr(0, left.find('\0')) == right.substr(0, right.find('\0'));
}

class Comparer {
public:
    explicit Comparer(const CompareOptions &options) : options_(options) {}

    std::vector<Change> Run(const State &before, const State &after) {
        const auto byId = [](const Switch &sw) { return std::pair(sw.isOther, sw.name); };
        const auto pairs = PairUp(Pointers(before.switches), Pointers(after.switches), byId);
        for (const Pair<Switch> &pair : pairs) {
            now_ = pair.before ? pair.after : nullptr;
            if (!pair.before || !pair.after)
                Report(Subject::Switch, pair.before ? *pair.before : *pair.after, nullptr, "", pair.before,
                       pair.after);
            else if (pair.before->isOther)
                CompareProperty(Subject::Entry, *pair.before, nullptr, "", *pair.before, *pair.after);
            else
                CompareSwitch(*pair.before, *pair.after);
        }
        if (options_.order && IsReordered(pairs))
            changes_.push_back({ChangeKind::Reordered, Subject::Switch});
        return std::move(changes_);
    }

private:
    void Report(Subject subject, const Switch &sw, const Entry *port, const char *list,
                const Property *before, const Property *after) {
        const ChangeKind kind = !before  ? ChangeKind::Added
                                : !after ? ChangeKind::Removed
                                         : ChangeKind::Changed;
        changes_.push_back({kind, subject, &sw, port, list, before, after, now_});
    }

    bool SameType(const Property &a, const Property &b) const {
        return options_.ignoreTypes || a.type == b.type;
    }

    void CompareProperty(Subject subject, const Switch &sw, const Entry *port, const char *list,
                         const Property &before, const Property &after) {
        if (!SameType(before, after) || !SameBytes(before.value, after.value))
            Report(subject, sw, port, list, &before, &after);
    }

    void CompareSwitch(const Switch &before, const Switch &after) {
        if (!SameType(before, after)) Report(Subject::Switch, before, nullptr, "", &before, &after);
        for (const Role role : {Role::Version, Role::ClassName, Role::MaxPorts})
            CompareField(before, after, role);
        CompareList(before, after, Role::GlobalList, "global");
        CompareList(before, after, Role::HostList, "host");
        ComparePorts(before, after);
        const auto byName = [](const Entry &entry) { return entry.name; };
        for (const Pair<Entry> &pair :
             PairUp(EntriesOf(before, Role::Other), EntriesOf(after, Role::Other), byName)) {
            if (pair.before && pair.after)
                CompareProperty(Subject::Entry, before, nullptr, "", *pair.before, *pair.after);
            else
                Report(Subject::Entry, before, nullptr, "", pair.before, pair.after);
        }
        CompareEntryOrder(before, after);
    }

    void CompareField(const Switch &before, const Switch &after, Role role) {
        const Entry *left = before.Find(role), *right = after.Find(role);
        if (!left && !right) return;
        const bool same = left && right && SameType(*left, *right) &&
                          (role == Role::ClassName ? SameText(left->value, right->value)
                                                   : SameBytes(left->value, right->value));
        if (!same) Report(Subject::Field, before, nullptr, "", left, right);
    }

    void CompareList(const Switch &before, const Switch &after, Role role, const char *name) {
        const Entry *left = before.Find(role), *right = after.Find(role);
        if (!left && !right) return;
        if (!left || !right || !SameType(*left, *right))
            Report(Subject::List, before, nullptr, name, left, right);
        CompareProperties(before, nullptr, name, SettingsOf(left), SettingsOf(right));
    }

    void CompareProperties(const Switch &sw, const Entry *port, const char *name,
                           const std::vector<const Property *> &before,
                           const std::vector<const Property *> &after) {
        const auto byName = [](const Property &property) { return property.name; };
        const auto pairs = PairUp(before, after, byName);
        for (const Pair<Property> &pair : pairs) {
            if (pair.before && pair.after)
                CompareProperty(Subject::Property, sw, port, name, *pair.before, *pair.after);
            else
                Report(Subject::Property, sw, port, name, pair.before, pair.after);
        }
        if (options_.order && IsReordered(pairs))
            changes_.push_back({ChangeKind::Reordered, Subject::Property, &sw, port, name});
    }

    void ComparePorts(const Switch &before, const Switch &after) {
        const auto byIdAndKind = [](const Entry &port) { return std::pair(port.name, port.kind); };
        const auto byId = [](const Entry &port) { return port.name; };
        auto pairs = PairUp(EntriesOf(before, Role::Port), EntriesOf(after, Role::Port), byIdAndKind);
        // What found no partner of its kind may have changed its kind.
        std::vector<const Entry *> gone, come;
        for (const Pair<Entry> &pair : pairs) {
            if (!pair.after) gone.push_back(pair.before);
            if (!pair.before) come.push_back(pair.after);
        }
        std::erase_if(pairs, [](const Pair<Entry> &pair) { return !pair.before || !pair.after; });
        const auto rest = PairUp(gone, come, byId);
        pairs.insert(pairs.end(), rest.begin(), rest.end());
        std::stable_sort(pairs.begin(), pairs.end(), [](const Pair<Entry> &a, const Pair<Entry> &b) {
            return std::tuple(!a.before, a.before, a.after) < std::tuple(!b.before, b.before, b.after);
        });
        for (const Pair<Entry> &pair : pairs)
            ComparePort(before, pair);
    }

    void ComparePort(const Switch &sw, const Pair<Entry> &pair) {
        if (!pair.before || !pair.after) {
            Report(Subject::Port, sw, pair.before ? pair.before : pair.after, "", pair.before, pair.after);
            return;
        }
        if (!SameType(*pair.before, *pair.after) || pair.before->kind != pair.after->kind)
            Report(Subject::Port, sw, pair.before, "", pair.before, pair.after);
        CompareProperties(sw, pair.before, "port", SettingsOf(pair.before), SettingsOf(pair.after));
    }

    void CompareEntryOrder(const Switch &before, const Switch &after) {
        if (!options_.order) return;
        const auto key = [](const Entry &entry) { return std::tuple(entry.name, entry.role, entry.kind); };
        if (IsReordered(PairUp(Pointers(before.entries), Pointers(after.entries), key)))
            changes_.push_back({ChangeKind::Reordered, Subject::Entry, &before});
    }

    const CompareOptions &options_;
    const Switch *now_ = nullptr;
    std::vector<Change> changes_;
};

} // namespace

std::vector<Change> Compare(const State &before, const State &after, const CompareOptions &options) {
    return Comparer(options).Run(before, after);
}

} // namespace dvs::form
