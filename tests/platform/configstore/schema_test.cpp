/* SPDX-License-Identifier: Apache-2.0 */
// The schema describes every field, and Set enforces every limit and reports the field's path. The compiled
// check must agree with a general JSON Schema validator; STORE_ORACLE_ROUNDS sets the number of random
// documents.

#include "platform/configstore/support.h"

#include <boost/json.hpp>
#include <functional>
#include <random>

#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/oracle.h"

using namespace configstore;
using namespace store_test;

namespace {

using Random = std::mt19937_64;

uint64_t Below(Random *random, uint64_t bound) {
    return (*random)() % bound;
}

std::string Quoted(std::string_view text) {
    Buffer out;
    WriteText(text, false, &out);
    return std::string(out.View());
}

std::string RandomText(Random *random, uint64_t maxBytes) {
    static const char *const kPieces[] = {"a",  "\xc3\xa9", "\xe2\x82\xac", "\xff", "\xf4\x8f\xba\x80",
                                          "\"", "\n",       "uplink",       " "};
    const uint64_t around = maxBytes < 1000 ? maxBytes : 20;
    const uint64_t size = Below(random, 4) == 0 ? around + Below(random, 3) - 1 : Below(random, around + 4);
    std::string text;
    while (text.size() < size)
        text += kPieces[Below(random, std::size(kPieces))];
    if (Below(random, 2) == 0) text.resize(size); // may split a character
    return text;
}

std::string RandomNumber(Random *random, int64_t minimum, int64_t maximum) {
    switch (Below(random, 8)) {
    case 0:
        return std::to_string(minimum);
    case 1:
        return std::to_string(maximum);
    case 2:
        return minimum == INT64_MIN ? "-1" : std::to_string(minimum - 1);
    case 3:
        return maximum == INT64_MAX ? "18446744073709551615" : std::to_string(maximum + 1);
    default:
        return std::to_string(Below(random, 50000));
    }
}

std::string WrongValue(Random *random) {
    static const char *const kValues[] = {"null",
                                          "true",
                                          "0",
                                          "-1",
                                          "1.5",
                                          "1.0",
                                          "\"x\"",
                                          "\"YQ==\"",
                                          "[]",
                                          "{}",
                                          "[1]",
                                          "[\"a\"]",
                                          "[{}]",
                                          "{\"a\":{}}",
                                          "[null]",
                                          "{\"a\":1}",
                                          "1e300",
                                          "[1,\"a\"]",
                                          "99999999999999999999"};
    return kValues[Below(random, std::size(kValues))];
}

std::string RandomBase64(Random *random) {
    static const char *const kValues[] = {
        "", "YQ==", "YWI=", "YWJj", "YR==", "YWJ=", "YWJ", "Y===", "Y W=", "YWJj\n", "=", "YWI=YWI="};
    return Quoted(kValues[Below(random, std::size(kValues))]);
}

std::string RandomObject(Random *random, const Shape *shape, int depth);

std::string RandomValue(Random *random, const Field *field, int depth) {
    if (Below(random, 40) == 0) return WrongValue(random);
    std::string out;
    switch (field->type) {
    case FieldType::Any:
        return WrongValue(random);
    case FieldType::Bool:
        return Below(random, 2) == 0 ? "true" : "false";
    case FieldType::Integer:
        return RandomNumber(random, field->minimum, field->maximum);
    case FieldType::Text:
        return Quoted(RandomText(random, field->maxBytes));
    case FieldType::Binary:
        return RandomBase64(random);
    case FieldType::TextList:
    case FieldType::IntegerList:
        for (uint64_t i = Below(random, 4); i > 0; i--) {
            if (!out.empty()) out += ',';
            out += Below(random, 40) == 0 ? WrongValue(random)
                   : field->type == FieldType::TextList
                       ? Quoted(RandomText(random, field->maxBytes))
                       : RandomNumber(random, field->minimum, field->maximum);
        }
        return '[' + out + ']';
    case FieldType::Object:
        return RandomObject(random, field->shape, depth + 1);
    case FieldType::Instances:
        for (uint64_t i = Below(random, 3); i > 0; i--) {
            out += out.empty() ? "" : ",";
            out += "\"id" + std::to_string(i) + "\":";
            out +=
                Below(random, 40) == 0 ? WrongValue(random) : RandomObject(random, field->shape, depth + 1);
        }
        return '{' + out + '}';
    }
    return "null";
}

std::string RandomObject(Random *random, const Shape *shape, int depth) {
    std::string out;
    for (const Field *field : shape->Fields()) {
        if (Below(random, 10) > (depth < 2 ? 2U : 1U)) continue;
        out += out.empty() ? "" : ",";
        out += field->prefix + RandomValue(random, field, depth);
    }
    if (Below(random, 20) == 0)
        out += (out.empty() ? "\"new_name\":" : ",\"new_name\":") + WrongValue(random);
    return '{' + out + '}';
}

bool CompiledCheckAccepts(const std::string &document) {
    const ObjectPtr object = NewSwitch(document);
    return object && !FindViolation(reinterpret_cast<Tree *>(object.get()));
}

/// Calls `visit` for every field of the schema, with the document around a value at its place.
using Visit = std::function<void(const Field *, const std::string &path,
                                 const std::function<std::string(const std::string &)> &around)>;
void ForEachField(const Shape *shape, const std::string &path,
                  const std::function<std::string(const std::string &)> &around, const Visit &visit) {
    for (const Field *field : shape->Fields()) {
        const std::string here = path.empty() ? field->name : path + '/' + field->name;
        const auto with = [&](const std::string &value) { return around('{' + field->prefix + value + '}'); };
        visit(field, here, with);
        if (field->type == FieldType::Object) ForEachField(field->shape, here, with, visit);
        if (field->type == FieldType::Instances)
            ForEachField(
                field->shape, here + "[i]",
                [&](const std::string &value) { return with("{\"i\":" + value + '}'); }, visit);
    }
}

void ForEachField(const Visit &visit) {
    ForEachField(
        FindSchema(kKey, kGroup), "", [](const std::string &value) { return value; }, visit);
}

/// The status of Set for a document, and its failure record.
int32_t Verdict(Store *store, const std::string &document, std::string *why) {
    const ObjectPtr object = NewSwitch(document);
    const int32_t status = Set(store, object.get(), "EXTERNAL");
    *why = LastFailure(store);
    return status;
}

using StoreSchema = StoreTest;

} // namespace

TEST(StoreSchemaText, EveryFieldHasADescription) {
    const std::string_view text = SchemaText(kKey, kGroup);
    const boost::json::value schema = boost::json::parse(boost::json::string_view(text.data(), text.size()));
    int fields = 0;
    const std::function<void(const boost::json::value &)> walk = [&](const boost::json::value &node) {
        if (const auto *const properties = node.as_object().if_contains("properties")) {
            for (const auto &[name, field] : properties->as_object()) {
                fields++;
                const auto *const description = field.as_object().if_contains("description");
                EXPECT_TRUE(description && !description->as_string().empty()) << std::string(name);
                walk(field);
            }
        }
        for (const char *const part : {"additionalProperties", "items"}) {
            const auto *const below = node.as_object().if_contains(part);
            if (below && below->is_object()) walk(*below);
        }
    };
    walk(schema);
    for (const auto &[name, definition] : schema.at("definitions").as_object())
        walk(definition);
    EXPECT_GT(fields, 120);
}

TEST_F(StoreSchema, RejectsAWrongTypeAtEveryPathByItsPath) {
    const StorePtr store = Open();
    int refused = 0;
    ForEachField([&](const Field *field, const std::string &path, const auto &around) {
        if (field->type == FieldType::Any) return;
        for (const std::string value :
             {"null", "true", "7", "2.5", "\"@\"", "[]", "[{}]", "{}", "{\"a\":1}"}) {
            // Skips values of the right type and values that violate a field below this one.
            const bool container = field->type == FieldType::Object || field->type == FieldType::Instances;
            const bool fits = (value == "true" && field->type == FieldType::Bool) ||
                              (value == "7" && field->type == FieldType::Integer) ||
                              (value == "\"@\"" && field->type == FieldType::Text) ||
                              (value.front() == '{' && container) ||
                              (value == "[]" &&
                               (field->type == FieldType::TextList || field->type == FieldType::IntegerList));
            if (fits) continue;
            std::string why;
            EXPECT_EQ(Verdict(store.get(), around(value), &why), SCHEMA_VIOLATION) << path << ' ' << value;
            EXPECT_NE(why.find(": " + path + ": "), std::string::npos) << why;
            EXPECT_NE(why.find(path_), std::string::npos) << why;
            refused++;
        }
    });
    EXPECT_GT(refused, 1000);
    EXPECT_TRUE(StoredIds(store.get()).empty());
}

TEST_F(StoreSchema, NumbersAreCheckedAgainstTheirRange) {
    const StorePtr store = Open();
    std::string why;
    ForEachField([&](const Field *field, const std::string &path, const auto &around) {
        if (field->type != FieldType::Integer) return;
        EXPECT_EQ(Verdict(store.get(), around(std::to_string(field->minimum)), &why), OK) << path;
        EXPECT_EQ(Verdict(store.get(), around(std::to_string(field->maximum)), &why), OK) << path;
        if (field->maximum == INT64_MAX) return;
        EXPECT_EQ(Verdict(store.get(), around(std::to_string(field->minimum - 1)), &why), SCHEMA_VIOLATION)
            << path;
        EXPECT_EQ(Verdict(store.get(), around(std::to_string(field->maximum + 1)), &why), SCHEMA_VIOLATION)
            << path;
    });
}

TEST_F(StoreSchema, TextLimitsCountBytes) {
    const StorePtr store = Open();
    std::string why;
    int limits = 0;
    ForEachField([&](const Field *field, const std::string &path, const auto &around) {
        if (field->maxBytes > 1000) return;
        limits++;
        // Two bytes per character: limits count bytes.
        std::string most;
        while (most.size() + 2 <= field->maxBytes)
            most += "\xc3\xa9";
        most.resize(field->maxBytes, 'x');
        const bool list = field->type == FieldType::TextList;
        const auto value = [list](const std::string &text) {
            return list ? "[" + Quoted(text) + "]" : Quoted(text);
        };
        EXPECT_EQ(Verdict(store.get(), around(value(most)), &why), OK) << path << ' ' << why;
        EXPECT_EQ(Verdict(store.get(), around(value(most + "x")), &why), SCHEMA_VIOLATION) << path;
    });
    EXPECT_GE(limits, 6);
}

TEST_F(StoreSchema, LimitsMatchTheLoadersLimits) {
    const auto limit = [](std::initializer_list<const char *> path) {
        const Shape *shape = FindSchema(kKey, kGroup);
        const Field *field = nullptr;
        for (const char *name : path) {
            field = shape->Find(name);
            shape = field->shape;
        }
        return field->maxBytes;
    };
    EXPECT_EQ(limit({"uplink_port_names"}), 80U);
    EXPECT_EQ(limit({"uplink_port_keys"}), 47U);
    EXPECT_EQ(limit({"ports", "settings", "filter_policy", "network_filters", "agent_name"}), 39U);
    EXPECT_EQ(limit({"ports", "settings", "filter_policy", "network_filters", "parameters"}), 255U);
    EXPECT_EQ(
        limit({"ports", "settings", "uplink_teaming_policy", "uplink_port_order", "standby_uplink_ports"}),
        80U);
}

TEST_F(StoreSchema, SetReportsViolationsAndAcceptsCorrectedValues) {
    const StorePtr store = Open();
    const ObjectPtr object = NewSwitch();
    EXPECT_EQ(SetValueUint32(object.get(), "name", 1), OK);
    EXPECT_EQ(AppendValueString(object.get(), "uplink_port_names", std::string(81, 'x').c_str()), OK);
    EXPECT_EQ(Set(store.get(), object.get(), "EXTERNAL"), SCHEMA_VIOLATION);
    EXPECT_EQ(SetValueStr(object.get(), "name", "n"), OK);
    EXPECT_EQ(Set(store.get(), object.get(), "EXTERNAL"), SCHEMA_VIOLATION);
    EXPECT_EQ(RemoveValue(object.get(), "uplink_port_names"), OK);
    EXPECT_EQ(Set(store.get(), object.get(), "EXTERNAL"), OK);
}

TEST_F(StoreSchema, SingletonAndListOfInstancesAreNotMixedUp) {
    const StorePtr store = Open();
    const ObjectPtr one = NewSwitch();
    Sub(one.get(), "ports");
    const ObjectPtr other = NewSwitch();
    Sub(other.get(), "settings", "id");
    EXPECT_EQ(Set(store.get(), one.get(), "EXTERNAL"), SCHEMA_VIOLATION);
    EXPECT_EQ(Set(store.get(), other.get(), "EXTERNAL"), SCHEMA_VIOLATION);
}

TEST_F(StoreSchema, UnknownMembersAreKeptByteForByte) {
    const StorePtr store = Open();
    const std::string document =
        R"({"new":{"a":[1,-2,2.5,1e+300,18446744073709551615,"\u0001é",null,{"b":[]}],"c":{}},)"
        R"("name":"n","list":[true,false],"ports":{"p":{"later":[[]]}}})";
    Save(store.get(), document);
    EXPECT_EQ(Stored(store.get()), document);
}

TEST(StoreSchemaOracle, AgreesWithTheCompiledCheckOnRandomDocuments) {
    const char *const wanted = std::getenv("STORE_ORACLE_ROUNDS");
    const long rounds = wanted ? std::atol(wanted) : 1500;
    const Oracle oracle(SchemaText(kKey, kGroup), Strictness::Store);
    Random random(20261121);
    long accepted = 0;
    for (long round = 0; round < rounds; round++) {
        const std::string document = RandomObject(&random, FindSchema(kKey, kGroup), 0);
        const bool compiled = CompiledCheckAccepts(document);
        ASSERT_EQ(compiled, oracle.Accepts(document, nullptr)) << document;
        accepted += compiled;
    }
    RecordProperty("accepted", static_cast<int>(accepted));
    EXPECT_GT(accepted, rounds / 20);
    EXPECT_LT(accepted, rounds - rounds / 20);
}
