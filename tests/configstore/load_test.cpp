/* SPDX-License-Identifier: Apache-2.0 */
// Loading whole states: the buffer's shape, the two layers, and what ends a load.

#include "configstore/store_fixture.h"

using namespace state_builder;

namespace {

// A load's store objects, made by hand.
struct LoadTest : StoreTest {
    LoadTest() { EXPECT_EQ(0, configstore::GetStore(&store)); }
    ~LoadTest() override { configstore::DestroyStore(store); }

    configstore::Object *New(const char *id, const char *className = "etherswitch") {
        configstore::Object *object = nullptr;
        EXPECT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", id, "{}", &object));
        EXPECT_EQ(0, configstore::SetValueStr(object, "uuid", id));
        EXPECT_EQ(0, configstore::SetValueInt(object, "max_ports", 128));
        configstore::Object *product = Sub(object, "product");
        EXPECT_EQ(0, configstore::SetValueStr(product, "forwarding_class", className));
        EXPECT_EQ(0, configstore::SetValueStr(product, "version", "7.0.3"));
        return object;
    }
    void Put(configstore::Object *object, const char *source = "EXTERNAL") {
        EXPECT_EQ(0, configstore::Set(store, object, source));
        configstore::DestroyObject(object);
    }
    static configstore::Object *Sub(configstore::Object *parent, const char *name, const char *id = "") {
        configstore::Object *sub = nullptr;
        EXPECT_EQ(0, GetOrCreateSubObject(true, parent, name, id, &sub));
        return sub;
    }
    void ExpectSuccessWithoutBuffer() {
        EXPECT_TRUE(Load().empty());
        EXPECT_EQ(0, status);
        EXPECT_FALSE(gotBuffer);
        EXPECT_TRUE(Said("Failed to load buf of switch: a from configstore\n")) << messages;
    }

    configstore::Store *store = nullptr;
};

TEST_F(LoadTest, AnEmptyStoreLoadsAsAnEmptyBuffer) {
    EXPECT_TRUE(Load().empty());
    EXPECT_EQ(0, status);
    EXPECT_TRUE(gotBuffer);
}

TEST_F(LoadTest, BringsBackWhatWasSaved) {
    Switch sw;
    sw.id = "a";
    sw.version = 9;
    sw.global = {Alias("blue"), Version()};
    sw.host = {{"com.orbeno.common.host.portset", Text("ps")}};
    sw.ports = {{"p2", {{"com.orbeno.common.port.alias", Text("two")}}}, {"p1", {}}};
    Switch other = sw;
    other.id = "b";
    other.className = "vswitch";
    ASSERT_EQ(0, Save({other, sw}));
    const auto loaded = Load();
    ASSERT_EQ(2u, loaded.size());
    EXPECT_EQ("a", loaded[0].id) << "in the store's order";
    EXPECT_EQ("b", loaded[1].id);
    EXPECT_EQ("etherswitch", loaded[0].className);
    EXPECT_EQ("vswitch", loaded[1].className);
    for (const auto &got : loaded) {
        EXPECT_EQ(9u, got.version);
        EXPECT_EQ(65536u, got.maxPorts);
        EXPECT_EQ(sw.global, got.global);
        EXPECT_EQ(sw.host, got.host);
        EXPECT_EQ(sw.ports, got.ports);
    }
    EXPECT_TRUE(Said("Loading switch:a\n"));
}

TEST_F(LoadTest, GivesTheSameBytesAtEveryDebugLevel) {
    const auto bytes = [](int level) {
        dvsconfigstore_debug = level;
        void *buf = nullptr;
        uint32_t len = 0;
        EXPECT_EQ(0, DVSState_LoadFromConfigStoreAsBuf(&buf, &len, false));
        EXPECT_TRUE(buf);
        std::string copy(static_cast<const char *>(buf), len);
        std::free(buf);
        return copy;
    };
    EXPECT_EQ(bytes(1), bytes(-1)) << "nothing stored";

    Switch sw;
    sw.id = "a";
    sw.version = 9;
    sw.global = {Alias("blue"), Version()};
    sw.host = {{"com.orbeno.common.host.portset", Text("ps")}};
    sw.ports = {{"p2", {{"com.orbeno.common.port.alias", Text("two")}}},
                {"p1", {}},
                {"p3",
                 {{"com.orbeno.common.port.block", Text("true")},
                  {"com.orbeno.etherswitch.port.txUplink", Text("always")}}}};
    Switch other = sw;
    other.id = "b";
    other.className = "vswitch";
    other.ports.clear();
    ASSERT_EQ(0, Save({other, sw}));
    EXPECT_EQ(bytes(1), bytes(-1)) << "two switches";

    // Ports of one name, and of names that the switch has for entries of its own.
    for (const std::string &key :
         {std::string("p1"), std::string("className"), std::string("hostPropList"), std::string(200, 'x')}) {
        configstore::Object *object = New("c");
        const char *const ids[] = {"p1", "p2", "p3"};
        for (const char *id : ids)
            EXPECT_EQ(0, configstore::SetValueStr(Sub(object, "ports", id), "name", id));
        EXPECT_EQ(0, configstore::SetValueStr(Sub(object, "ports", "p3"), "key", key.c_str()));
        Put(object);
        EXPECT_EQ(bytes(1), bytes(-1)) << key;
    }

    // Vendors' properties of one port: some that meet in one name, alone and among many.
    for (const int others : {0, 100}) {
        configstore::Object *object = New("c");
        configstore::Object *data = Sub(Sub(object, "ports", "p"), "data");
        for (const char *value : {"same", "also", "of another length", "back"}) {
            configstore::Object *instance = Sub(data, "vendor_specific_data", value);
            EXPECT_EQ(0, configstore::SetValueStr(instance, "key", "one.name"));
            EXPECT_EQ(0, configstore::SetValueStr(instance, "value", value));
        }
        for (int i = 0; i < others; i++) {
            const std::string id = "vendor." + std::to_string(i);
            EXPECT_EQ(0,
                      configstore::SetValueStr(Sub(data, "vendor_specific_data", id.c_str()), "value", "v"));
        }
        Put(object);
        EXPECT_EQ(bytes(1), bytes(-1)) << others;
    }
}

TEST_F(LoadTest, ReportsOnce) {
    configstore::Object *object = New("a");
    configstore::Object *group = Sub(Sub(object, "settings"), "lacp_groups", "g");
    ASSERT_EQ(0, configstore::SetValueStr(group, "mode", "odd"));
    ASSERT_EQ(0, configstore::SetValueUint32(group, "uplink_num", 1));
    // Two ports of one name.
    Sub(object, "ports", "p1");
    ASSERT_EQ(0, configstore::SetValueStr(Sub(object, "ports", "p2"), "key", "p1"));
    Put(object);
    for (const int level : {0, 10}) {
        dvsconfigstore_debug = level;
        messages.clear();
        ASSERT_EQ(1u, Load().size());
        const std::size_t first = messages.find("Unknown lacp mode odd\n");
        EXPECT_NE(std::string::npos, first) << level;
        EXPECT_EQ(std::string::npos, messages.find("Unknown lacp mode odd\n", first + 1)) << level;
    }
    // And where a switch behind them ends the load.
    object = New("z");
    ASSERT_EQ(0, configstore::RemoveValue(object, "max_ports"));
    Put(object);
    for (const int level : {0, 10}) {
        dvsconfigstore_debug = level;
        messages.clear();
        EXPECT_TRUE(Load().empty());
        EXPECT_EQ(0, status);
        EXPECT_FALSE(gotBuffer);
        for (const char *text :
             {"Failed to get max_ports, rc: 6\n", "Failed to load buf of switch: z from configstore\n"}) {
            const std::size_t first = messages.find(text);
            EXPECT_NE(std::string::npos, first) << level;
            EXPECT_EQ(std::string::npos, messages.find(text, first + 1)) << level;
        }
    }
    messages.clear();
    (void)configstore::Delete(store, "switches", "network_vds", "qel", "a");
    dvsconfigstore_debug = 0;
    object = New("b");
    ASSERT_EQ(0, configstore::RemoveValue(object, "max_ports"));
    Put(object);
    (void)Load();
    EXPECT_TRUE(Said("Failed to get max_ports, rc: 6\n")) << "the next load speaks again";
    dvsconfigstore_debug = 10;
}

TEST_F(LoadTest, LaysASwitchOutInItsOrder) {
    configstore::Object *object = New("a");
    Sub(object, "ports", "p1");
    Put(object);
    void *buf = nullptr;
    uint32_t len = 0;
    ASSERT_EQ(0, DVSState_LoadFromConfigStoreAsBuf(&buf, &len, false));
    const auto *bytes = static_cast<const uint8_t *>(buf);
    const Props state = ParseList({bytes, bytes + len});
    std::free(buf);
    ASSERT_EQ(1u, state.size());
    EXPECT_EQ(0x10u, state[0].type);
    const Props fields = ParseList(state[0].value);
    ASSERT_EQ(6u, fields.size());
    const char *const names[] = {"switchVersion",  "className",    "maxPorts",
                                 "globalPropList", "hostPropList", "p1"};
    for (std::size_t i = 0; i < 6; ++i) {
        EXPECT_EQ(names[i], fields[i].key);
        EXPECT_EQ(0x10u, fields[i].type);
    }
    EXPECT_EQ(U32(9), fields[0].value);
    EXPECT_EQ(Text("etherswitch"), fields[1].value);
    EXPECT_EQ(U32(128), fields[2].value);
}

TEST_F(LoadTest, SetsClassAndPortRecordWidthForTheConverters) {
    configstore::Object *object = New("a", "cswitch");
    ASSERT_EQ(0, configstore::SetValueBool(object, "ovl_enabled", true));
    Put(object);
    dvsSwitchClass = 0;
    dvsWidePortRecords = false;
    EXPECT_EQ(1u, Load().size());
    EXPECT_EQ(2u, dvsSwitchClass);
    EXPECT_TRUE(dvsWidePortRecords);
    dvsWidePortRecords = false;
    EXPECT_EQ(1u, Load().size());
    EXPECT_TRUE(dvsWidePortRecords);
}

// --- Ports. ---

TEST_F(LoadTest, WithoutPortsAndUplinkKeysASwitchLoads) {
    Put(New("a"));
    ASSERT_EQ(1u, Load().size());
    EXPECT_EQ(0, status);
}

TEST_F(LoadTest, OnlyUplinkPortsGetTheResourceManagement) {
    configstore::Object *object = New("a");
    Sub(Sub(Sub(object, "resource_management"), "traffic_resources", "pool"), "allocation");
    ASSERT_EQ(0, configstore::AppendValueString(object, "uplink_port_keys", "up"));
    Sub(object, "ports", "plain");
    Sub(object, "ports", "up");
    Put(object);
    const auto loaded = Load();
    ASSERT_EQ(1u, loaded.size());
    ASSERT_EQ(2u, loaded[0].ports.size());
    EXPECT_FALSE(Has(loaded[0].ports[0].props, "com.orbeno.common.port.respools.cfg"));
    EXPECT_EQ(216u, Find(loaded[0].ports[1].props, "com.orbeno.common.port.respools.cfg").value.size());
}

// A port's own object does not tell the switch's version.
TEST_F(LoadTest, MirrorSessionsOfPortsHaveTheWidthOfTheirSwitchesVersion) {
    const std::pair<const char *, bool> switches[] = {{"a", false}, {"b", true}, {"c", false}};
    for (const auto &[id, isOverlay] : switches) {
        configstore::Object *object = New(id);
        ASSERT_EQ(0, configstore::SetValueBool(object, "ovl_enabled", isOverlay));
        configstore::Object *session = Sub(Sub(object, "ports", "p"), "vspans", "s");
        configstore::Object *sources = Sub(session, "source_recv_port");
        ASSERT_EQ(0, configstore::AppendValueString(sources, "port_keys", "q"));
        Put(object);
    }
    for (const int level : {10, 0}) {
        dvsconfigstore_debug = level;
        const auto loaded = Load();
        ASSERT_EQ(3u, loaded.size());
        for (std::size_t i = 0; i < 3; ++i) {
            const Props &props = loaded[i].ports.at(0).props;
            const std::size_t record = switches[i].second ? 52 : 36;
            EXPECT_EQ(20 + 232 + 3 * record,
                      Find(props, "com.orbeno.etherswitch.port.mirrorSessions").value.size());
        }
    }
}

TEST_F(LoadTest, UplinkKeysOfAnotherTypeFailASwitchWithoutPortsOnly) {
    configstore::Object *object = New("a");
    ASSERT_EQ(0, configstore::SetValueInt(object, "uplink_port_keys", 1));
    Put(object);
    ExpectSuccessWithoutBuffer();
    object = New("a");
    ASSERT_EQ(0, configstore::SetValueInt(object, "uplink_port_keys", 1));
    Sub(object, "ports", "p");
    Put(object);
    EXPECT_EQ(1u, Load().size());
}

TEST_F(LoadTest, ResourceManagementThatIsNoObjectFailsTheSwitch) {
    configstore::Object *object = New("a");
    ASSERT_EQ(0, configstore::SetValueInt(object, "resource_management", 1));
    Put(object);
    ExpectSuccessWithoutBuffer();
}

TEST_F(LoadTest, APortThatFailsEndsTheLoad) {
    configstore::Object *object = New("a");
    configstore::Object *port = Sub(object, "ports", "p");
    ASSERT_EQ(0, configstore::SetValueInt(port, "name", 1));
    Put(object);
    ExpectSuccessWithoutBuffer();
}

// Nothing of the port that ended the walk is in the buffer.
TEST_F(LoadTest, APortThatLacksSomethingEndsTheWalkOverThePortsWithoutFailingTheSwitch) {
    configstore::Object *object = New("a");
    Sub(object, "ports", "first");
    configstore::Object *second = Sub(object, "ports", "second");
    ASSERT_EQ(0, configstore::SetValueStr(second, "name", "two"));
    configstore::Object *policy = Sub(Sub(second, "settings"), "lacp_policy");
    ASSERT_EQ(0, configstore::SetValueBool(policy, "enabled", true));
    Sub(object, "ports", "third");
    Put(object);
    for (const int level : {10, 0}) {
        dvsconfigstore_debug = level;
        messages.clear();
        const auto loaded = Load();
        ASSERT_EQ(1u, loaded.size()) << level;
        ASSERT_EQ(1u, loaded[0].ports.size()) << level;
        EXPECT_EQ("first", loaded[0].ports[0].id) << level;
        constexpr std::string_view reason = "Load dvs props from configstore failed, props type:second\n";
        const auto at = messages.find(reason);
        ASSERT_NE(std::string::npos, at) << level << messages;
        EXPECT_EQ(std::string::npos, messages.find(reason, at + 1)) << level << " says it twice";
    }
}

// --- What ends a load. ---

TEST_F(LoadTest, ASwitchThatCannotBeRebuiltEndsTheLoadWithSuccessAndNoBuffer) {
    Put(New("0-first"));
    configstore::Object *object = New("a");
    ASSERT_EQ(0, configstore::SetValueStr(Sub(object, "product"), "version", "7.0.1"));
    Put(object);
    ExpectSuccessWithoutBuffer();
    EXPECT_TRUE(Said("Unknown vds version 7.0.1\n"));
    EXPECT_TRUE(Said("Load dvs: a from configstore failed, error: "));
}

TEST_F(LoadTest, ReportsTheFieldThatIsAbsent) {
    const std::pair<const char *, const char *> cases[] = {
        {"product", "Failed to get product obj, rc: 6\n"},
        {"forwarding_class", "Failed to get forwarding_class, rc: 6\n"},
        {"max_ports", "Failed to get max_ports, rc: 6\n"},
        {"version", "Failed to get version obj, rc: 6\n"}};
    for (const auto &[field, message] : cases) {
        messages.clear();
        configstore::Object *object = New("a");
        if (configstore::DeleteSubObject(object, field, "") == configstore::OK) {
        } else if (configstore::RemoveValue(object, field) != configstore::OK) {
            ASSERT_EQ(0, configstore::RemoveValue(Sub(object, "product"), field));
        }
        Put(object);
        ExpectSuccessWithoutBuffer();
        EXPECT_TRUE(Said(message)) << messages;
    }
}

TEST_F(LoadTest, WithoutUuidTheResultIsNotFound) {
    configstore::Object *object = New("a");
    ASSERT_EQ(0, configstore::RemoveValue(object, "uuid"));
    Put(object);
    EXPECT_TRUE(Load().empty());
    EXPECT_EQ(6, status);
    EXPECT_FALSE(gotBuffer);
    EXPECT_TRUE(Said("Failed to get uuid, rc: 6\n"));
    EXPECT_FALSE(Said("Failed to load buf"));
}

TEST_F(LoadTest, AFailingGlobalOrHostPropertyFailsTheSwitch) {
    configstore::Object *object = New("a");
    ASSERT_EQ(0, configstore::SetValueInt(object, "name", 1));
    Put(object);
    ExpectSuccessWithoutBuffer();
    object = New("a");
    ASSERT_EQ(0, configstore::SetValueInt(object, "portset_name", 1));
    Put(object);
    messages.clear();
    ExpectSuccessWithoutBuffer();
}

TEST_F(LoadTest, StoreAndListingFailuresAreTheResult) {
    const std::pair<const char *, const char *> cases[] = {{"GetStore", "Get store failed\n"},
                                                           {"CreateFilterSpecObject", ""},
                                                           {"GetInstances", "Failed to get dvs instances\n"}};
    for (const auto &[call, message] : cases) {
        fake_store::FailFunction(call, configstore::IO_ERROR);
        EXPECT_TRUE(Load().empty());
        EXPECT_EQ(8, status) << call;
        EXPECT_FALSE(gotBuffer);
        EXPECT_TRUE(Said(message));
    }
    fake_store::FailFunction("GetDesiredUserConfigInstances", configstore::IO_ERROR);
    EXPECT_TRUE(Load(true).empty());
    EXPECT_EQ(8, status);
    EXPECT_TRUE(Said("Failed to get dvs desired user config instances\n"));
    fake_store::FailFunction(nullptr);
    fake_store::GiveNoStore(true);
    EXPECT_TRUE(Load().empty());
    EXPECT_EQ(-1, status);
    fake_store::GiveNoStore(false);
}

TEST_F(LoadTest, EveryFailingStoreCallIsHarmlessOrGivesNoBuffer) {
    configstore::Object *object = New("a");
    Sub(Sub(object, "ports", "p"), "settings");
    Put(object);
    dvsconfigstore_debug = -1;
    const std::string before = fake_store::Dump();
    int call = 1;
    for (;; ++call) {
        fake_store::FailCall(call, configstore::IO_ERROR);
        (void)Load();
        if (!fake_store::Failed()) break;
        EXPECT_EQ(1, fake_store::OpenHandles()) << "the test's own store";
        EXPECT_EQ(before, fake_store::Dump());
        EXPECT_TRUE(status == 0 || !gotBuffer);
    }
    EXPECT_TRUE(gotBuffer);
    EXPECT_GT(call, 50);
    dvsconfigstore_debug = 10;
}

// --- The desired layer. ---

TEST_F(LoadTest, ThreeDesiredButTwoCurrentAreMinusOneAndNoBuffer) {
    for (const char *id : {"a", "b", "c"})
        Put(New(id), "USER");
    for (const char *id : {"a", "b"})
        Put(New(id));
    EXPECT_TRUE(Load(true).empty());
    EXPECT_EQ(-1, status);
    EXPECT_FALSE(gotBuffer);
}

TEST_F(LoadTest, DesiredTakesThePortsetNameOfTheCurrentAtItsPosition) {
    for (const char *id : {"a", "b"}) {
        configstore::Object *object = New(id, "vswitch");
        ASSERT_EQ(0, configstore::SetValueStr(object, "portset_name", "own"));
        Put(object, "USER");
    }
    configstore::Object *current = New("x");
    ASSERT_EQ(0, configstore::SetValueStr(current, "portset_name", "ps-x"));
    Put(current);
    Put(New("y"));
    const std::string before = fake_store::Dump();
    const auto loaded = Load(true);
    ASSERT_EQ(2u, loaded.size());
    EXPECT_EQ("a", loaded[0].id);
    EXPECT_EQ("vswitch", loaded[0].className);
    EXPECT_EQ(Text("ps-x"), Find(loaded[0].host, "com.orbeno.common.host.portset").value);
    EXPECT_EQ(Text("own"), Find(loaded[1].host, "com.orbeno.common.host.portset").value);
    EXPECT_EQ(before, fake_store::Dump()) << "a load writes nothing";
}

TEST(StringExistInArray, ComparesWithTheFirstOfAnArray) {
    const char *array[] = {"a", "b", "c"};
    EXPECT_TRUE(StringExistInArray("a", array, 3));
    EXPECT_TRUE(StringExistInArray("c", array, 3));
    EXPECT_FALSE(StringExistInArray("c", array, 2));
    EXPECT_FALSE(StringExistInArray("A", array, 3));
    EXPECT_FALSE(StringExistInArray("a", array, 0));
    EXPECT_FALSE(StringExistInArray(nullptr, array, 3));
    EXPECT_FALSE(StringExistInArray("a", nullptr, 3));
    const char *holed[] = {nullptr, "b"};
    EXPECT_TRUE(StringExistInArray("b", holed, 2)) << "an empty slot equals nothing";
    EXPECT_FALSE(StringExistInArray("", holed, 1));
}

} // namespace
