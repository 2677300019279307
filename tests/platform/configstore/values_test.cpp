/* SPDX-License-Identifier: Apache-2.0 */
// Typed values: a set value reads back, a value of another type or range is rejected, and an absent value
// gives status 6.

#include "platform/configstore/support.h"

using namespace configstore;
using namespace store_test;

TEST(StoreValues, BoolReadsBack) {
    const ObjectPtr object = NewSwitch();
    ASSERT_EQ(SetValueBool(object.get(), "ovl_enabled", true), OK);
    bool value = false;
    EXPECT_EQ(GetValueBool(object.get(), "ovl_enabled", &value), OK);
    EXPECT_TRUE(value);
}

TEST(StoreValues, NumbersOfEveryWidthReadBackAtTheirLimits) {
    const ObjectPtr object = NewSwitch();
    Object *const o = object.get();
    uint16_t small = 0;
    uint32_t word = 0;
    int32_t number = 0;
    int64_t wide = 0;
    EXPECT_EQ(SetValueUint16(o, "a", UINT16_MAX), OK);
    EXPECT_EQ(GetValueUint16(o, "a", &small), OK);
    EXPECT_EQ(small, UINT16_MAX);
    EXPECT_EQ(SetValueUint32(o, "b", UINT32_MAX), OK);
    EXPECT_EQ(GetValueUint32(o, "b", &word), OK);
    EXPECT_EQ(word, UINT32_MAX);
    EXPECT_EQ(SetValueInt(o, "c", INT32_MIN), OK);
    EXPECT_EQ(GetValueInt(o, "c", &number), OK);
    EXPECT_EQ(number, INT32_MIN);
    EXPECT_EQ(SetValueLong(o, "d", INT64_MIN), OK);
    EXPECT_EQ(GetValueLong(o, "d", &wide), OK);
    EXPECT_EQ(wide, INT64_MIN);
}

TEST(StoreValues, RejectsANumberOutOfTheGettersRangeAndKeepsTheOutput) {
    const ObjectPtr object = NewSwitch();
    Object *const o = object.get();
    ASSERT_EQ(SetValueLong(o, "n", -1), OK);
    uint16_t small = 7;
    uint32_t word = 7;
    EXPECT_EQ(GetValueUint16(o, "n", &small), SCHEMA_VIOLATION);
    EXPECT_EQ(GetValueUint32(o, "n", &word), SCHEMA_VIOLATION);
    EXPECT_EQ(small, 7);
    EXPECT_EQ(word, 7U);
    ASSERT_EQ(SetValueLong(o, "n", int64_t{INT32_MAX} + 1), OK);
    int32_t number = 7;
    EXPECT_EQ(GetValueInt(o, "n", &number), SCHEMA_VIOLATION);
    EXPECT_EQ(GetValueUint32(o, "n", &word), OK);
}

TEST(StoreValues, TextReadsBackWithAnyBytes) {
    const ObjectPtr object = NewSwitch();
    for (const std::string &text :
         {std::string(), std::string("plain"), std::string("\"\\\n\t\x01/"), std::string("\xff\xfe"),
          std::string("gr\xc3\xbc\xc3\x9f"), std::string("\xf4\x8f\xba\x80")}) {
        ASSERT_EQ(SetValueStr(object.get(), "name", text.c_str()), OK);
        EXPECT_EQ(Text(object.get(), "name"), text);
    }
}

TEST(StoreValues, BinaryReadsBackWithItsLength) {
    const ObjectPtr object = NewSwitch();
    const std::string bytes("a\0b\xff", 4);
    ASSERT_EQ(SetValueBinary(object.get(), "blob", bytes.data(), 4), OK);
    void *data = nullptr;
    uint32_t len = 0;
    ASSERT_EQ(GetValueBinary(object.get(), "blob", &data, &len), OK);
    EXPECT_EQ(std::string(static_cast<char *>(data), len), bytes);
    FreeBinary(data);
}

TEST(StoreValues, EmptyBinaryIsAValue) {
    const ObjectPtr object = NewSwitch();
    ASSERT_EQ(SetValueBinary(object.get(), "blob", nullptr, 0), OK);
    void *data = nullptr;
    uint32_t len = 9;
    ASSERT_EQ(GetValueBinary(object.get(), "blob", &data, &len), OK);
    EXPECT_EQ(len, 0U);
    FreeBinary(data);
}

TEST(StoreValues, TextListKeepsItsOrder) {
    const ObjectPtr object = NewSwitch();
    ASSERT_EQ(SetValueEmptyList(object.get(), "uplink_port_names"), OK);
    for (const char *name : {"b", "", "a", "b"})
        ASSERT_EQ(AppendValueString(object.get(), "uplink_port_names", name), OK);
    EXPECT_EQ(Texts(object.get(), "uplink_port_names"), (std::vector<std::string>{"b", "", "a", "b"}));
}

TEST(StoreValues, AppendCreatesAMissingList) {
    const ObjectPtr object = NewSwitch();
    ASSERT_EQ(AppendValueString(object.get(), "names", "x"), OK);
    EXPECT_EQ(Texts(object.get(), "names"), std::vector<std::string>{"x"});
}

TEST(StoreValues, IntListReadsBack) {
    const ObjectPtr object = NewSwitch();
    for (const int32_t n : {3, INT32_MIN, 0, INT32_MAX})
        ASSERT_EQ(AppendValueInt(object.get(), "vlans", n), OK);
    int32_t *values = nullptr;
    int32_t count = 0;
    ASSERT_EQ(GetValueIntArray(object.get(), "vlans", &values, &count), OK);
    EXPECT_EQ(std::vector<int32_t>(values, values + count),
              (std::vector<int32_t>{3, INT32_MIN, 0, INT32_MAX}));
    FreeIntArray(values);
}

TEST(StoreValues, EmptyListReadsAsEitherKindWithoutElements) {
    const ObjectPtr object = NewSwitch();
    ASSERT_EQ(AppendValueString(object.get(), "list", "x"), OK);
    ASSERT_EQ(SetValueEmptyList(object.get(), "list"), OK);
    char **texts = nullptr;
    int32_t *numbers = nullptr;
    int32_t count = 7;
    EXPECT_EQ(GetValueStringArray(object.get(), "list", &texts, &count), OK);
    EXPECT_EQ(count, 0);
    FreeStringArray(texts, count);
    count = 7;
    EXPECT_EQ(GetValueIntArray(object.get(), "list", &numbers, &count), OK);
    EXPECT_EQ(count, 0);
    FreeIntArray(numbers);
}

TEST(StoreValues, RejectsAppendOfTheOtherKindOrToAPlainValue) {
    const ObjectPtr object = NewSwitch();
    ASSERT_EQ(AppendValueString(object.get(), "list", "x"), OK);
    EXPECT_EQ(AppendValueInt(object.get(), "list", 1), SCHEMA_VIOLATION);
    EXPECT_EQ(Texts(object.get(), "list"), std::vector<std::string>{"x"});
    ASSERT_EQ(SetValueBool(object.get(), "flag", true), OK);
    EXPECT_EQ(AppendValueString(object.get(), "flag", "x"), SCHEMA_VIOLATION);
}

TEST(StoreValues, ValueOfAnotherTypeIsASchemaViolationForEveryGetter) {
    const ObjectPtr object = NewSwitch();
    Object *const o = object.get();
    ASSERT_EQ(SetValueStr(o, "text", "1"), OK);
    ASSERT_EQ(SetValueBool(o, "flag", true), OK);
    bool flag = false;
    uint16_t small = 0;
    uint32_t word = 0;
    int32_t number = 0;
    int64_t wide = 0;
    void *data = nullptr;
    uint32_t len = 0;
    char **texts = nullptr;
    int32_t *numbers = nullptr;
    EXPECT_EQ(GetValueBool(o, "text", &flag), SCHEMA_VIOLATION);
    EXPECT_EQ(GetValueUint16(o, "text", &small), SCHEMA_VIOLATION);
    EXPECT_EQ(GetValueUint32(o, "text", &word), SCHEMA_VIOLATION);
    EXPECT_EQ(GetValueInt(o, "text", &number), SCHEMA_VIOLATION);
    EXPECT_EQ(GetValueLong(o, "flag", &wide), SCHEMA_VIOLATION);
    EXPECT_EQ(Text(o, "flag"), "<4>");
    EXPECT_EQ(GetValueBinary(o, "flag", &data, &len), SCHEMA_VIOLATION);
    EXPECT_EQ(GetValueStringArray(o, "text", &texts, &number), SCHEMA_VIOLATION);
    EXPECT_EQ(GetValueIntArray(o, "text", &numbers, &number), SCHEMA_VIOLATION);
}

TEST(StoreValues, TextThatLooksLikeBase64IsNotABinaryValue) {
    const ObjectPtr object = NewSwitch(R"({"read":"text"})");
    Object *const o = object.get();
    void *data = nullptr;
    uint32_t len = 7;
    ASSERT_EQ(SetValueStr(o, "set", "text"), OK);
    EXPECT_EQ(GetValueBinary(o, "set", &data, &len), SCHEMA_VIOLATION);
    EXPECT_EQ(data, nullptr);
    EXPECT_EQ(len, 7U);
    // Where the schema has no entry, a document does not distinguish the two.
    EXPECT_EQ(Text(o, "read"), "text");
    ASSERT_EQ(GetValueBinary(o, "read", &data, &len), OK);
    EXPECT_EQ(len, 3U);
    FreeBinary(data);
    data = nullptr;
    ASSERT_EQ(SetValueStr(o, "read", "text"), OK);
    EXPECT_EQ(GetValueBinary(o, "read", &data, &len), SCHEMA_VIOLATION);
}

TEST(StoreValues, AbsentValueIsNotFoundForEveryGetter) {
    const ObjectPtr object = NewSwitch();
    Object *const o = object.get();
    bool flag = true;
    uint16_t small = 7;
    uint32_t word = 7;
    int32_t number = 7;
    int64_t wide = 7;
    void *data = nullptr;
    char **texts = nullptr;
    int32_t *numbers = nullptr;
    EXPECT_EQ(GetValueBool(o, "x", &flag), NOT_FOUND);
    EXPECT_EQ(GetValueUint16(o, "x", &small), NOT_FOUND);
    EXPECT_EQ(GetValueUint32(o, "x", &word), NOT_FOUND);
    EXPECT_EQ(GetValueInt(o, "x", &number), NOT_FOUND);
    EXPECT_EQ(GetValueLong(o, "x", &wide), NOT_FOUND);
    EXPECT_EQ(Text(o, "x"), "<6>");
    EXPECT_EQ(GetValueBinary(o, "x", &data, &word), NOT_FOUND);
    EXPECT_EQ(GetValueStringArray(o, "x", &texts, &number), NOT_FOUND);
    EXPECT_EQ(GetValueIntArray(o, "x", &numbers, &number), NOT_FOUND);
    EXPECT_EQ(RemoveValue(o, "x"), NOT_FOUND);
    EXPECT_EQ(number, 7);
}

TEST(StoreValues, NullsAreBadParameters) {
    const ObjectPtr object = NewSwitch();
    Object *const o = object.get();
    EXPECT_EQ(SetValueStr(o, "name", nullptr), BAD_PARAMETER);
    EXPECT_EQ(SetValueStr(o, nullptr, "x"), BAD_PARAMETER);
    EXPECT_EQ(SetValueStr(nullptr, "name", "x"), BAD_PARAMETER);
    EXPECT_EQ(SetValueBinary(o, "name", nullptr, 1), BAD_PARAMETER);
    EXPECT_EQ(AppendValueString(o, "list", nullptr), BAD_PARAMETER);
    EXPECT_EQ(SetValueEmptyList(nullptr, "list"), BAD_PARAMETER);
    EXPECT_EQ(SetValueBool(o, "", true), BAD_PARAMETER);
    EXPECT_EQ(GetValueBool(o, "name", nullptr), BAD_PARAMETER);
    EXPECT_EQ(GetValueStr(o, "name", nullptr), BAD_PARAMETER);
    EXPECT_EQ(RemoveValue(nullptr, "name"), BAD_PARAMETER);
    EXPECT_EQ(Json(o), "{}");
}

TEST(StoreValues, SubObjectIsNotOverwrittenByAValue) {
    const ObjectPtr object = NewSwitch();
    Object *const settings = Sub(object.get(), "settings");
    EXPECT_EQ(SetValueStr(object.get(), "settings", "x"), SCHEMA_VIOLATION);
    EXPECT_EQ(SetValueEmptyList(object.get(), "settings"), SCHEMA_VIOLATION);
    EXPECT_EQ(RemoveValue(object.get(), "settings"), SCHEMA_VIOLATION);
    EXPECT_EQ(SetValueUint32(settings, "max_mtu", 1), OK);
}

TEST(StoreValues, RemovedValueIsGone) {
    const ObjectPtr object = NewSwitch(R"({"name":"a","uplink_port_names":["x"],"max_ports":1})");
    EXPECT_EQ(RemoveValue(object.get(), "name"), OK);
    EXPECT_EQ(RemoveValue(object.get(), "uplink_port_names"), OK);
    EXPECT_EQ(Json(object.get()), R"({"max_ports":1})");
    EXPECT_EQ(RemoveValue(object.get(), "name"), NOT_FOUND);
}
