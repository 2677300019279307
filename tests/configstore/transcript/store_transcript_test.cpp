/* SPDX-License-Identifier: Apache-2.0 */
// Transcripts of saves and loads on the store double, which accepts what the embedded store rejects: damaged
// fields, names of any length, and failing calls.

#include <algorithm>
#include <set>

#include <gtest/gtest.h>

#include "configstore/fake_store.h"
#include "configstore/fake_tree.h"
#include "configstore/maps/prop_frame.h"
#include "configstore/transcript/steps.h"
#include "dvs/state.h"

using namespace state_builder;
using namespace transcript;
using configstore::Object;

namespace {

void NoteStore() {
    Note("store: %016lx", static_cast<unsigned long>(HashOf(fake_store::Dump())));
}

class OpenStore {
public:
    OpenStore() { EXPECT_EQ(0, configstore::GetStore(&store_)); }
    ~OpenStore() { configstore::DestroyStore(store_); }
    OpenStore(const OpenStore &) = delete;
    OpenStore &operator=(const OpenStore &) = delete;
    [[nodiscard]] std::unique_ptr<Object> Copy(const char *id) const {
        Object *object = nullptr;
        EXPECT_EQ(0, configstore::Get(store_, "switches", "network_vds", "qel", id, &object));
        auto copy = object->Copy();
        configstore::DestroyObject(object);
        return copy;
    }
    void Put(Object *object, const char *source = "EXTERNAL") const {
        EXPECT_EQ(0, configstore::Set(store_, object, source));
    }
    void Delete(const char *id) const {
        EXPECT_EQ(0, configstore::Delete(store_, "switches", "network_vds", "qel", id));
    }

private:
    configstore::Store *store_ = nullptr;
};

// Process-wide values that a scenario would otherwise inherit from the one before.
void Start() {
    fake_store::Reset();
    dvsSwitchClass = 0;
    dvsWidePortRecords = false;
}

Switch Small(const std::string &id) {
    Switch sw;
    sw.id = id;
    sw.version = 9;
    sw.global = {Alias("blue"),
                 Version(),
                 {"com.orbeno.etherswitch.mtu", U32(1500)},
                 {"com.orbeno.extraconfig.note", Text("by hand")},
                 {"com.acme.opaque", Bytes{1, 2, 3}, 0x18}};
    sw.host = {{"com.orbeno.common.host.portset", Text("ps")},
               {"com.orbeno.common.host.uplinkPorts", U32(1) + Slot("p2", 48)}};
    sw.ports = {{"p1",
                 {{"com.orbeno.common.port.alias", Text("one")},
                  {"com.orbeno.common.port.block", Text("true")},
                  {"com.acme.port", Text("vendor's")}}},
                {"p2", {{"com.orbeno.common.port.connectid", U32(7)}}},
                {"p3", {}}};
    return sw;
}

// A switch's object after a save; the scenario changes it.
std::unique_ptr<Object> Saved(const Switch &sw) {
    const int32_t levels[] = {dvsconfigstore_debug, dvs_debug, dvsdata_debug};
    dvsconfigstore_debug = dvs_debug = dvsdata_debug = -1;
    const Bytes state = State({sw});
    EXPECT_EQ(0, DVSState_SaveBufToConfigStore(state.data(), static_cast<uint32_t>(state.size())));
    dvsconfigstore_debug = levels[0];
    dvs_debug = levels[1];
    dvsdata_debug = levels[2];
    return OpenStore().Copy(sw.id.c_str());
}

Object *Sub(Object *parent, const char *name, const char *id = "") {
    Object *sub = nullptr;
    if (configstore::GetSubObject(parent, name, id, &sub) == 0) return sub;
    EXPECT_EQ(0, configstore::CreateSubObject(parent, name, id, &sub));
    return sub;
}
void SetText(Object *object, const char *name, const std::string &text) {
    EXPECT_EQ(0, configstore::SetValueStr(object, name, text.c_str()));
}

// Loads the small switch's object after a scenario's change to it.
void LoadChanged(const char *what, const std::function<void(Object *)> &change) {
    Note("%s", what);
    Start();
    const auto object = Saved(Small("a"));
    change(object.get());
    const OpenStore store;
    store.Put(object.get());
    Load();
}

// --- Whole states. ---

void SaveAndLoadEverything() {
    Start();
    const Bytes state = WholeState();
    Save(state);
    NoteStore();
    Save(state);
    NoteStore();
    const auto switches = Parse(state);
    Save(state, switches[7].id.c_str());
    Save(state, "no such switch");
    NoteStore();
    Load();
    {
        const OpenStore store;
        for (const Switch &sw : switches) {
            const auto object = store.Copy(sw.id.c_str());
            (void)configstore::RemoveValue(object.get(), "portset_name");
            store.Put(object.get(), "USER");
        }
    }
    Load(true);
    OpenStore().Delete(switches[0].id.c_str());
    Load(true);
    Save(State({Small("a")}));
    NoteStore();
    Load();
}

TEST(Transcript, OfAWholeState) {
    ExpectSame("whole", EverySetting(), SaveAndLoadEverything);
}

TEST(Transcript, OfASmallState) {
    ExpectSameText("small", [] {
        Start();
        Save(State({Small("a")}));
        Save(State({Small("a")}), "a");
        Load();
    });
}

TEST(Transcript, OfBuffersThatDoNotLoad) {
    ExpectSame("unloadable", EverySetting(), [] {
        Start();
        const Bytes state = State({Small("a"), Small("b")});
        Save(state);
        for (const std::size_t at : {std::size_t{0}, std::size_t{4}, std::size_t{9}, state.size() / 2}) {
            Bytes damaged = state;
            damaged[at] ^= 0x40;
            const auto len = static_cast<uint32_t>(damaged.size());
            Note("checked: %d", DVSState_SaveBufToConfigStoreChecked(damaged.data(), len, nullptr));
            Save(damaged, "a");
            NoteStore();
        }
        Save({});
        NoteStore();
        Load();
    });
}

// --- Values that converters reject. ---

TEST(Transcript, OfShortValues) {
    const auto switches = Parse(WholeState());
    ExpectSame("short_values", Together({0, 1, 10}), [&] {
        Start();
        for (const char *className : {"etherswitch", "vswitch"}) {
            std::set<std::string> seen;
            const auto each = [&](const Prop &prop, Props Switch::*list) {
                if (!seen.insert(prop.key).second) return;
                const std::size_t size = prop.value.size();
                for (const std::size_t length : {std::size_t{0}, std::size_t{3}, size / 2, size - (size > 0)}) {
                    Switch sw = {.id = "a", .className = className, .global = {Version()}, .host = {}, .ports = {}};
                    Prop cut = prop;
                    cut.value.resize(std::min(length, size));
                    (list ? sw.*list : sw.ports.emplace_back(Port{"p", {}}).props).push_back(cut);
                    Save(State({sw}));
                }
            };
            for (const Switch &sw : switches) {
                for (const Prop &prop : sw.global)
                    each(prop, &Switch::global);
                for (const Prop &prop : sw.host)
                    each(prop, &Switch::host);
                for (const Port &port : sw.ports) {
                    for (const Prop &prop : port.props)
                        each(prop, nullptr);
                }
            }
        }
    });
}

TEST(Transcript, OfUnknownVersions) {
    ExpectSameText("unknown_version", [] {
        Start();
        Switch sw = Small("a");
        sw.global[1] = Version(13);
        Save(State({Small("0"), sw, Small("z")}));
        NoteStore();
    });
}

// --- Objects that loaders reject. ---

// Calls `visit` with each member of the tree in turn.
using Item = std::pair<std::string, std::unique_ptr<Object>>;
void Walk(Object *node, const std::function<void(Object *, std::size_t)> &visit) {
    for (std::size_t i = 0; i < node->items.size(); ++i) {
        visit(node, i);
        Walk(node->items[i].second.get(), visit);
    }
}

void LoadWithEachFieldDamaged(const Switch &sw) {
    Start();
    const auto object = Saved(sw);
    const OpenStore store;
    const auto load = [&](const char *what, const std::string &name) {
        Note("%s %s", what, name.c_str());
        store.Put(object.get());
        Load();
    };
    // List elements are not visited; the list is replaced by one of another kind.
    Walk(object.get(), [&](Object *parent, std::size_t i) {
        if (parent->kind == fake_store::Kind::Texts || parent->kind == fake_store::Kind::Numbers) return;
        const std::string name = parent->items[i].first;
        auto good = std::move(parent->items[i].second);
        auto &place = parent->items[i].second;
        place = std::make_unique<Object>();
        place->kind = fake_store::Kind::Bool;
        if (good->kind == fake_store::Kind::Bool) {
            place->kind = fake_store::Kind::Text;
            place->text = "odd";
        }
        load("another type:", name);
        if (good->kind == fake_store::Kind::Text) {
            place = good->Copy();
            place->text = "odd";
            load("another text:", name);
        }
        place = std::move(good);
        Item taken = std::move(parent->items[i]);
        const auto at = parent->items.begin() + static_cast<std::ptrdiff_t>(i);
        parent->items.erase(at);
        load("without:", name);
        parent->items.insert(parent->items.begin() + static_cast<std::ptrdiff_t>(i), std::move(taken));
    });
}

class TranscriptOfDamage : public testing::TestWithParam<const char *> {};
INSTANTIATE_TEST_SUITE_P(EachClass, TranscriptOfDamage,
                         testing::Values("etherswitch", "vswitch", "cswitch"));

TEST_P(TranscriptOfDamage, OfEachField) {
    const std::string className = GetParam();
    std::vector<Switch> ofClass = Parse(WholeState());
    std::erase_if(ofClass, [&](const Switch &sw) { return sw.className != className; });
    ASSERT_GE(ofClass.size(), 2u);
    ExpectSame("damaged_" + className, Together({0, 1, 10}), [&] {
        // The generated switch has usual values, the random one has unusual ones.
        for (Switch sw : {ofClass.front(), ofClass.back()}) {
            sw.ports.resize(1);
            LoadWithEachFieldDamaged(sw);
        }
    });
}

void LoadOddPorts() {
    LoadChanged("two ports of one key and length", [](Object *object) {
        SetText(Sub(object, "ports", "p1"), "name", "uno");
        Sub(object, "ports", "p4");
        SetText(Sub(object, "ports", "p5"), "key", "p4");
    });
    LoadChanged("three ports of one key", [](Object *object) {
        SetText(Sub(object, "ports", "p2"), "key", "p1");
        SetText(Sub(object, "ports", "p3"), "key", "p1");
    });
    for (const char *name : {"switchVersion", "className", "maxPorts", "globalPropList", "hostPropList"}) {
        LoadChanged("a port with the key of another entry", [&](Object *object) {
            SetText(Sub(object, "ports", "p2"), "key", name);
            SetText(Sub(object, "ports", "p3"), "key", name);
        });
    }
    for (const std::size_t length : {126U, 127U, 128U, 200U}) {
        LoadChanged("two ports with long keys", [&](Object *object) {
            SetText(Sub(object, "ports", "p1"), "key", std::string(length, 'x'));
            SetText(Sub(object, "ports", "p3"), "key", std::string(length, 'x'));
        });
    }
    LoadChanged("long keys that are cut to one, then that one", [](Object *object) {
        SetText(Sub(object, "ports", "p1"), "key", std::string(127, 'x') + "1");
        SetText(Sub(object, "ports", "p2"), "key", std::string(127, 'x') + "2");
        SetText(Sub(object, "ports", "p3"), "key", std::string(127, 'x'));
        SetText(Sub(object, "ports", "p4"), "key", std::string(127, 'x'));
    });
    LoadChanged("an empty key", [](Object *object) {
        SetText(Sub(object, "ports", "p1"), "key", "");
        SetText(Sub(object, "ports", "p3"), "key", "");
    });
    LoadChanged("a key that is no text", [](Object *object) {
        EXPECT_EQ(0, configstore::SetValueInt(Sub(object, "ports", "p2"), "key", 1));
    });
    LoadChanged("a port that lacks something", [](Object *object) {
        Object *policy = Sub(Sub(Sub(object, "ports", "p2"), "settings"), "lacp_policy");
        EXPECT_EQ(0, configstore::SetValueBool(policy, "enabled", true));
    });
}

TEST(Transcript, OfOddPorts) {
    ExpectSame("odd_ports", EverySetting(), LoadOddPorts);
}

TEST(Transcript, OfPortsOfOneKey) {
    ExpectSameText("ports_of_one_key", [] {
        LoadChanged("ports p1, p2 and p3 have the key p1", [](Object *object) {
            SetText(Sub(object, "ports", "p2"), "key", "p1");
            SetText(Sub(object, "ports", "p3"), "key", "p1");
        });
    });
}

// Vendor properties of one port.
void LoadManyProperties(int others) {
    LoadChanged("properties that meet in one name", [&](Object *object) {
        Object *data = Sub(Sub(object, "ports", "p2"), "data");
        int number = 0;
        const auto add = [&](const std::string &key, const std::string &value) {
            Object *instance = Sub(data, "vendor_specific_data", std::to_string(number++).c_str());
            SetText(instance, "key", key);
            SetText(instance, "value", value);
        };
        add("one.name", "same");
        add("one.name", "also");
        for (int i = 0; i < others; ++i)
            add("vendor." + std::to_string(i), "value");
        add("one.name", "of another length");
        add("vendor.3", "longer than before");
        add("vendor.5", "other");
        add("one.name", "back");
        add("", "without a name");
        add(std::string(140, 'x'), "long");
        add(std::string(140, 'x'), "long");
        add(std::string(127, 'x'), "cut");
        add("com.orbeno.common.port.connectid", "four");
        add("com.orbeno.common.port.connectid", "con");
    });
}

TEST(Transcript, OfManyProperties) {
    ExpectSame("many_properties", EverySetting(), [] {
        for (const int others : {0, 20, 40, 70, 200})
            LoadManyProperties(others);
    });
}

TEST(Transcript, OfIncompleteSwitches) {
    ExpectSame("incomplete", EverySetting(), [] {
        for (const char *name : {"uuid", "max_ports", "portset_name", "name"})
            LoadChanged(name, [&](Object *object) { EXPECT_EQ(0, configstore::RemoveValue(object, name)); });
        for (const char *name : {"version", "forwarding_class"})
            LoadChanged(name, [&](Object *object) {
                EXPECT_EQ(0, configstore::RemoveValue(Sub(object, "product"), name));
            });
        LoadChanged("product",
                    [](Object *object) { EXPECT_EQ(0, configstore::DeleteSubObject(object, "product", "")); });
        LoadChanged("an unknown version",
                    [](Object *object) { SetText(Sub(object, "product"), "version", "7.0.1"); });
        LoadChanged("a uuid that is no text",
                    [](Object *object) { EXPECT_EQ(0, configstore::SetValueInt(object, "uuid", 1)); });
        Note("behind a sound switch");
        Start();
        auto object = Saved(Small("b"));
        EXPECT_EQ(0, configstore::RemoveValue(object.get(), "max_ports"));
        (void)Saved(Small("a"));
        OpenStore().Put(object.get());
        Load();
        Load(true);
    });
}

// --- Failing store calls. ---

constexpr const char *kCalls[] = {"GetStore",
                                  "BeginTransaction",
                                  "CommitTransaction",
                                  "CancelTransaction",
                                  "CreateFilterSpecObject",
                                  "GetInstances",
                                  "GetDesiredUserConfigInstances",
                                  "Get",
                                  "Set",
                                  "Delete",
                                  "CreateObject",
                                  "GetSubObject",
                                  "CreateSubObject",
                                  "DeleteSubObject",
                                  "GetSubObjectInstances",
                                  "DeleteSubObjectInstances",
                                  "GenerateInstanceId",
                                  "SetValueBool",
                                  "SetValueUint16",
                                  "SetValueUint32",
                                  "SetValueInt",
                                  "SetValueLong",
                                  "SetValueStr",
                                  "SetValueBinary",
                                  "SetValueEmptyList",
                                  "AppendValueString",
                                  "AppendValueInt",
                                  "GetValueBool",
                                  "GetValueUint16",
                                  "GetValueUint32",
                                  "GetValueInt",
                                  "GetValueLong",
                                  "GetValueStr",
                                  "GetValueBinary",
                                  "GetValueStringArray",
                                  "GetValueIntArray",
                                  "RemoveValue"};

TEST(Transcript, OfFailingStoreCalls) {
    std::vector<Switch> switches = {Small("a"), Small("b"), Parse(WholeState())[2]};
    switches[2].ports.resize(1);
    const Bytes state = State(switches);
    std::swap(switches[1].id, switches[2].id);
    const Bytes other = State({switches[0], switches[2]});
    ExpectSame("failing_calls", Together({0, 1, 10}), [&] {
        Start();
        Save(state);
        for (const char *call : kCalls) {
            for (const int32_t failure : {configstore::IO_ERROR, configstore::NOT_FOUND}) {
                Note("%s fails with %d", call, failure);
                fake_store::FailFunction(call, failure);
                Save(other);
                if (std::string_view(call) == "GetStore" || std::string_view(call) == "BeginTransaction") {
                    // These two keep the lock and the loaded table.
                    (void)DVSState_ConfigReset();
                    MXUserRecLock *lock = DVSwitchHandleLock();
                    DVSwitchHandleUnlock(lock);
                    DVSwitchHandleUnlock(lock);
                    fake_store::DestroyKeptStore();
                }
                Load();
                Load(true);
                fake_store::FailFunction(nullptr);
                Save(state);
            }
        }
    });
}

} // namespace
