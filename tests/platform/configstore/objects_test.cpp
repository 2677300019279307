/* SPDX-License-Identifier: Apache-2.0 */
// Sub-objects, instances and filter specs on an object.

#include "platform/configstore/support.h"

#include <cstring>

using namespace configstore;
using namespace store_test;

TEST(StoreObjects, NullOrEmptyIdMeansASingleton) {
    const ObjectPtr object = NewSwitch();
    Object *made = nullptr;
    Object *found = nullptr;
    ASSERT_EQ(CreateSubObject(object.get(), "settings", nullptr, &made), OK);
    ASSERT_EQ(GetSubObject(object.get(), "settings", "", &found), OK);
    EXPECT_EQ(made, found);
}

TEST(StoreObjects, AbsentSubObjectIsNotFoundAndKeepsTheOutput) {
    const ObjectPtr object = NewSwitch();
    Object *out = object.get();
    EXPECT_EQ(GetSubObject(object.get(), "settings", "", &out), NOT_FOUND);
    EXPECT_EQ(GetSubObject(object.get(), "ports", "p1", &out), NOT_FOUND);
    EXPECT_EQ(DeleteSubObject(object.get(), "settings", ""), NOT_FOUND);
    EXPECT_EQ(DeleteSubObject(object.get(), "ports", "p1"), NOT_FOUND);
    EXPECT_EQ(out, object.get());
}

TEST(StoreObjects, PlainValueIsNotASubObject) {
    const ObjectPtr object = NewSwitch(R"({"name":"x"})");
    Object *out = nullptr;
    EXPECT_EQ(GetSubObject(object.get(), "name", "", &out), SCHEMA_VIOLATION);
    EXPECT_EQ(GetSubObject(object.get(), "name", "id", &out), SCHEMA_VIOLATION);
    EXPECT_EQ(CreateSubObject(object.get(), "name", "", &out), SCHEMA_VIOLATION);
    EXPECT_EQ(CreateSubObject(object.get(), "name", "id", &out), SCHEMA_VIOLATION);
    EXPECT_EQ(Text(object.get(), "name"), "x");
}

TEST(StoreObjects, EmptyListBecomesAListOfInstances) {
    const ObjectPtr object = NewSwitch();
    for (const char *name : {"ports", "unheard_of"}) {
        ASSERT_EQ(SetValueEmptyList(object.get(), name), OK);
        Object *out = nullptr;
        EXPECT_EQ(GetSubObject(object.get(), name, "p1", &out), NOT_FOUND);
        EXPECT_EQ(CreateSubObject(object.get(), name, "p1", &out), OK);
        EXPECT_EQ(GetSubObject(object.get(), name, "p1", &out), OK);
    }
}

TEST(StoreObjects, SetValueEmptyListEmptiesInstances) {
    const ObjectPtr object = NewSwitch();
    Sub(object.get(), "ports", "p1");
    ASSERT_EQ(SetValueEmptyList(object.get(), "ports"), OK);
    Object *out = nullptr;
    EXPECT_EQ(GetSubObject(object.get(), "ports", "p1", &out), NOT_FOUND);
    EXPECT_EQ(Json(object.get()), R"({"ports":{}})");
}

TEST(StoreObjects, CreateOfAnExistingInstanceEmptiesIt) {
    const ObjectPtr object = NewSwitch();
    Object *const port = Sub(object.get(), "ports", "p1");
    ASSERT_EQ(SetValueStr(port, "name", "x"), OK);
    Object *again = nullptr;
    ASSERT_EQ(CreateSubObject(object.get(), "ports", "p1", &again), OK);
    EXPECT_EQ(again, port);
    EXPECT_EQ(Text(again, "name"), "<6>");
    EXPECT_EQ(Json(object.get()), R"({"ports":{"p1":{}}})");
}

TEST(StoreObjects, InstanceIdReadsBackAsKeyUnlessItHasAKey) {
    const ObjectPtr object = NewSwitch();
    Object *const port = Sub(object.get(), "ports", "p1");
    EXPECT_EQ(Text(port, "key"), "p1");
    EXPECT_EQ(RemoveValue(port, "key"), NOT_FOUND);
    ASSERT_EQ(SetValueStr(port, "key", "own"), OK);
    EXPECT_EQ(Text(port, "key"), "own");
    EXPECT_EQ(Text(Sub(object.get(), "settings"), "key"), "<6>");
}

TEST(StoreObjects, HandlesStayValidWhileSiblingsChange) {
    const ObjectPtr object = NewSwitch();
    Object *const kept = Sub(object.get(), "ports", "kept");
    for (int round = 0; round < 3; round++) {
        for (int i = 0; i < 500; i++)
            ASSERT_EQ(
                SetValueUint32(Sub(object.get(), "ports", std::to_string(i).c_str()), "connection_cookie", 1),
                OK);
        for (int i = 0; i < 500; i++)
            ASSERT_EQ(DeleteSubObject(object.get(), "ports", std::to_string(i).c_str()), OK);
    }
    ASSERT_EQ(SetValueStr(kept, "name", "still"), OK);
    EXPECT_EQ(Json(object.get()), R"({"ports":{"kept":{"name":"still"}}})");
}

TEST(StoreObjects, RejectsADeletedHandle) {
    const ObjectPtr object = NewSwitch();
    Object *const settings = Sub(object.get(), "settings");
    Object *const beacon = Sub(settings, "ipfix");
    ASSERT_EQ(DeleteSubObject(object.get(), "settings", ""), OK);
    EXPECT_EQ(SetValueBool(settings, "x", true), BAD_PARAMETER);
    EXPECT_EQ(SetValueBool(beacon, "x", true), BAD_PARAMETER);
}

TEST(StoreObjects, RejectsHandlesBelowADeletedObject) {
    const ObjectPtr object = NewSwitch();
    Object *const vlan = Sub(Sub(Sub(object.get(), "ports", "1"), "settings"), "vlan");
    Object *const shares = Sub(Sub(Sub(object.get(), "settings"), "unheard_of"), "of");
    ASSERT_EQ(SetValueBool(shares, "flag", true), OK);
    ASSERT_EQ(DeleteSubObject(object.get(), "ports", "1"), OK);
    Object *out = nullptr;
    ASSERT_EQ(CreateSubObject(object.get(), "settings", "", &out), OK) << "create empties the sub-object";
    bool flag = false;
    EXPECT_EQ(GetValueBool(shares, "flag", &flag), BAD_PARAMETER);
    uint32_t number = 0;
    EXPECT_EQ(GetValueUint32(vlan, "vlan_id", &number), BAD_PARAMETER);
    EXPECT_EQ(GetSubObject(vlan, "trunk_vlan_ids", "1", &out), BAD_PARAMETER);
}

TEST(StoreObjects, NamesCompareByTextNotByAddress) {
    const ObjectPtr object = NewSwitch(R"({"name":"n","uuid":"u","new":"w"})");
    char name[8] = "name";
    EXPECT_EQ(Text(object.get(), name), "n");
    std::strcpy(name, "uuid");
    EXPECT_EQ(Text(object.get(), name), "u");
    std::strcpy(name, "new");
    EXPECT_EQ(Text(object.get(), name), "w");
    std::strcpy(name, "newer");
    EXPECT_EQ(Text(object.get(), name), "<6>");
}

TEST(StoreObjects, InstancesComeInInsertionOrder) {
    const ObjectPtr object = NewSwitch();
    for (const char *id : {"c", "a", "b"})
        Sub(object.get(), "ports", id);
    int32_t status = 0;
    EXPECT_EQ(Ids(object.get(), "ports", &status), (std::vector<std::string>{"c", "a", "b"}));
    ASSERT_EQ(DeleteSubObject(object.get(), "ports", "a"), OK);
    Sub(object.get(), "ports", "a");
    EXPECT_EQ(Ids(object.get(), "ports", &status), (std::vector<std::string>{"c", "b", "a"}));
}

TEST(StoreFilter, SelectsTheInstancesOfItsKey) {
    const ObjectPtr object = NewSwitch(R"({"ports":{"a":{},"b":{}},"health_checks":{"VLAN_MTU":{}}})");
    int32_t status = 0;
    EXPECT_EQ(Ids(object.get(), "ports", &status), (std::vector<std::string>{"a", "b"}));
    EXPECT_EQ(status, OK);
}

TEST(StoreFilter, SelectsOneInstanceByItsId) {
    const ObjectPtr object = NewSwitch(R"({"ports":{"a":{},"b":{}}})");
    int32_t status = 0;
    EXPECT_EQ(Ids(object.get(), "ports", &status, "b"), std::vector<std::string>{"b"});
    EXPECT_EQ(Ids(object.get(), "ports", &status, "c"), std::vector<std::string>{});
    EXPECT_EQ(status, NOT_FOUND);
}

TEST(StoreFilter, ReturnsOneHandlePerElementOfATextList) {
    const ObjectPtr object = NewSwitch(R"({"uplink_port_names":["a","b","c"]})");
    int32_t status = 0;
    EXPECT_EQ(Ids(object.get(), "uplink_port_names", &status).size(), 3U);
    EXPECT_EQ(status, OK);
}

TEST(StoreFilter, DescendsIntoSingletonsWhereTheMemberIsAbsentDepthFirst) {
    const ObjectPtr object = NewSwitch();
    Object *const settings = Sub(object.get(), "settings");
    Sub(Sub(settings, "ipfix"), "things", "deep");
    Sub(settings, "more");
    Sub(Sub(settings, "more"), "things", "later");
    Sub(Sub(object.get(), "product"), "things", "last");
    int32_t status = 0;
    EXPECT_EQ(Ids(object.get(), "things", &status), (std::vector<std::string>{"deep", "later", "last"}));
}

// Objects built by calls can be stored as text that the schema does not describe.
TEST(StoreFilter, DescendsIntoUnknownSingletonsOfADocumentToo) {
    const std::string document =
        R"({"own":{"things":{"a":{}},"number":1},"other":{"below":{"things":{"b":{},"c":{"x":1}}}},)"
        R"("not":{"thing":{"d":{}}},"text":"things","list":["things"],"one":{"b\"y\u0001":{"e":{}}}})";
    const ObjectPtr object = NewSwitch(document);
    int32_t status = 0;
    EXPECT_EQ(Ids(object.get(), "things", &status), (std::vector<std::string>{"a", "b", "c"}));
    EXPECT_EQ(Ids(object.get(), "b\"y\x01", &status), std::vector<std::string>{"e"});
    EXPECT_EQ(Json(object.get()), document) << "a search changes nothing";

    const ObjectPtr again = NewSwitch(document);
    const SpecPtr spec = NewSpec("things");
    EXPECT_EQ(DeleteSubObjectInstances(again.get(), spec.get()), OK);
    EXPECT_EQ(Json(again.get()), R"({"own":{"number":1},"other":{"below":{}},"not":{"thing":{"d":{}}},)"
                                 R"("text":"things","list":["things"],"one":{"b\"y\u0001":{"e":{}}}})");
}

// A search caches which kinds of objects cannot lead to its key. An unknown singleton always can.
TEST(StoreFilter, DescendsIntoUnknownSingletonsAddedAfterASearch) {
    const ObjectPtr object = NewSwitch(R"({"ports":{"p":{"settings":{"blocked":true}}}})");
    Object *const port = Sub(object.get(), "ports", "p");
    Object *const settings = Sub(port, "settings");
    const SpecPtr spec = NewSpec("vspans");
    Object **found = nullptr;
    int32_t count = 0;
    EXPECT_EQ(GetSubObjectInstances(port, spec.get(), &found, &count), NOT_FOUND);
    Object *const wanted = Sub(Sub(settings, "unheard_of"), "vspans", "s");
    ASSERT_EQ(GetSubObjectInstances(port, spec.get(), &found, &count), OK);
    ASSERT_EQ(count, 1);
    EXPECT_EQ(found[0], wanted);
    FreeSubObjectArray(found);
}

// The switch's settings have sessions, a port's settings have none. One search may visit both.
TEST(StoreFilter, CachesDeadEndsByKindOfObject) {
    const ObjectPtr object = NewSwitch(R"({"settings":{"vspans":{"s":{}}},"ports":{"p":{"settings":{}}}})");
    Object *const port = Sub(object.get(), "ports", "p");
    const SpecPtr spec = NewSpec("vspans");
    for (int round = 0; round < 2; round++) {
        Object **found = nullptr;
        int32_t count = 0;
        EXPECT_EQ(GetSubObjectInstances(port, spec.get(), &found, &count), NOT_FOUND);
        ASSERT_EQ(GetSubObjectInstances(object.get(), spec.get(), &found, &count), OK);
        EXPECT_EQ(count, 1);
        FreeSubObjectArray(found);
    }
}

TEST(StoreFilter, CountsTheTextsOfAllSingletons) {
    const ObjectPtr object = NewSwitch(
        R"({"settings":{"vspans":{"s":{"source_recv_port":{"port_keys":["a"]},"destination_port":{"port_keys":["b","c"]}}}}})");
    int32_t status = 0;
    EXPECT_EQ(Ids(Sub(Sub(object.get(), "settings"), "vspans", "s"), "port_keys", &status).size(), 3U);
}

TEST(StoreFilter, DoesNotDescendWhereTheMemberExistsButIsEmpty) {
    const ObjectPtr object = NewSwitch();
    Sub(Sub(object.get(), "settings"), "things", "hidden");
    ASSERT_EQ(SetValueEmptyList(object.get(), "things"), OK);
    int32_t status = 0;
    EXPECT_TRUE(Ids(object.get(), "things", &status).empty());
    EXPECT_EQ(status, NOT_FOUND);
}

TEST(StoreFilter, DoesNotDescendIntoInstances) {
    const ObjectPtr object = NewSwitch();
    Sub(Sub(object.get(), "ports", "p"), "things", "x");
    int32_t status = 0;
    EXPECT_TRUE(Ids(object.get(), "things", &status).empty());
    EXPECT_EQ(status, NOT_FOUND);
}

TEST(StoreFilter, NoMatchIsNotFoundAndKeepsTheOutputs) {
    const ObjectPtr object = NewSwitch();
    const SpecPtr spec = NewSpec("ports");
    Object *some = object.get();
    Object **found = &some;
    int32_t count = 7;
    EXPECT_EQ(GetSubObjectInstances(object.get(), spec.get(), &found, &count), NOT_FOUND);
    EXPECT_EQ(found, &some);
    EXPECT_EQ(count, 7);
    EXPECT_EQ(DeleteSubObjectInstances(object.get(), spec.get()), NOT_FOUND);
}

TEST(StoreFilter, DeletesWhatItSelects) {
    const ObjectPtr object =
        NewSwitch(R"({"ports":{"a":{},"b":{}},"vtep_ports":{"x":{"a":1},"y":{}},"name":"n"})");
    EXPECT_EQ(DeleteSubObjectInstances(object.get(), NewSpec("ports", "a").get()), OK);
    EXPECT_EQ(Json(object.get()), R"({"ports":{"b":{}},"vtep_ports":{"x":{"a":1},"y":{}},"name":"n"})");
    EXPECT_EQ(DeleteSubObjectInstances(object.get(), NewSpec("ports").get()), OK);
    EXPECT_EQ(DeleteSubObjectInstances(object.get(), NewSpec("vtep_ports").get()), OK);
    EXPECT_EQ(Json(object.get()), R"({"name":"n"})");
}

TEST(StoreFilter, RejectsNulls) {
    FilterSpec *spec = nullptr;
    EXPECT_EQ(CreateFilterSpecObject(nullptr, "", "", "", &spec), BAD_PARAMETER);
    EXPECT_EQ(CreateFilterSpecObject("k", nullptr, "", "", &spec), BAD_PARAMETER);
    EXPECT_EQ(CreateFilterSpecObject("k", "", nullptr, "", &spec), BAD_PARAMETER);
    EXPECT_EQ(CreateFilterSpecObject("k", "", "", "", nullptr), BAD_PARAMETER);
    EXPECT_EQ(spec, nullptr);
    ASSERT_EQ(CreateFilterSpecObject("k", "", "", nullptr, &spec), OK);
    DestroyFilterSpecObject(spec);
    DestroyFilterSpecObject(nullptr);
}

TEST(StoreObjects, GeneratedIdsAreDistinctUuids) {
    char *one = nullptr;
    char *two = nullptr;
    ASSERT_EQ(GenerateInstanceId(&one), OK);
    ASSERT_EQ(GenerateInstanceId(&two), OK);
    EXPECT_STRNE(one, two);
    EXPECT_EQ(std::string(one).size(), 36U);
    EXPECT_EQ(one[14], '4');
    FreeString(one);
    FreeString(two);
    EXPECT_EQ(GenerateInstanceId(nullptr), BAD_PARAMETER);
}
