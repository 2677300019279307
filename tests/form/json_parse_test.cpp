/* SPDX-License-Identifier: Apache-2.0 */
// The strict parser: what it rejects, and the place that it reports.

#include "form/json/parse.h"

#include <gtest/gtest.h>

#include <string>

#include <boost/json/serialize.hpp>

#include "form/error.h"

namespace {

using namespace dvs::form;

TEST(JsonParse, KeepsOrderAndValues) {
    const char *text = R"({"b": [1, -2, 1.5e3, true, null], "a": {"x": "\u00e4\n"}})";
    EXPECT_EQ(boost::json::serialize(ParseJson(text)),
              "{\"b\":[1,-2,1.5E3,true,null],\"a\":{\"x\":\"ä\\n\"}}");
}

struct BadCase {
    std::string text, path, why;
};

TEST(JsonParse, ReportsPlaceAndReason) {
    const BadCase cases[] = {
        {"", "$, line 1, column 1", "it is empty"},
        {" \n ", "$, line 2, column 2", "it is empty"},
        {R"({"a": 1, "b": 2, "a": 3})", "$.a, line 1, column 20", "the key stands there twice"},
        {"{\"a\": [{}, {\n \"k\": 1,\n \"k\": 1}]}", "$.a[1].k, line 3, column 4",
         "the key stands there twice"},
        {R"({"k": 1, "\u006b": 2})", "$.k, line 1, column 17", "the key stands there twice"},
        {"{\"a\": 1} x", "$, line 1, column 10", "there is more behind the document"},
        {"[1] [2]", "$, line 1, column 5", "there is more behind the document"},
        {"[1,]", "$[1], line 1, column 4", ""},
        {"[1", "$", "incomplete"},
        {"{\"a\": tru}", "$.a", ""},
        {"// no comments\n{}", "$, line 1, column 1", ""},
        {"[\"\xff\"]", "$[0]", "it is not UTF-8"},
        {"[\"\\ud800\"]", "$[0]", ""},
        {"[\"a\nb\"]", "$[0]", ""},
        {"[01]", "$[1]", ""},
        {"[NaN]", "$[0]", ""},
    };
    for (const BadCase &c : cases) {
        EXPECT_THROW((void)IsJsonObject(c.text), Error) << c.text;
        try {
            (void)ParseJson(c.text);
            ADD_FAILURE() << c.text;
        } catch (const Error &error) {
            EXPECT_EQ(error.kind, ErrorKind::Malformed);
            EXPECT_EQ(error.path.substr(0, c.path.size()), c.path) << c.text;
            EXPECT_NE(error.why.find(c.why), std::string::npos) << c.text << ": " << error.why;
            EXPECT_FALSE(error.why.empty());
        }
    }
}

TEST(JsonParse, DistinguishesObjectsFromOtherValues) {
    EXPECT_TRUE(IsJsonObject(R"({"a": [{"a": "b"}, {"a": null}]})"));
    for (const char *other : {"[{}]", "null", "\"{}\"", "1"})
        EXPECT_FALSE(IsJsonObject(other)) << other;
}

TEST(JsonParse, RejectsExcessiveDepth) {
    for (const char *open : {"[", "{\"a\":"}) {
        std::string text;
        for (int i = 0; i < 1'000'000; ++i)
            text += open;
        try {
            (void)ParseJson(text);
            ADD_FAILURE();
        } catch (const Error &error) {
            EXPECT_EQ(error.why, "more than 32 levels deep");
        }
    }
}

TEST(JsonParse, DetectsDuplicatesAmongManyKeys) {
    std::string text = "{";
    for (int i = 0; i < 50'000; ++i)
        text += "\"key" + std::to_string(i) + "\": 0, ";
    EXPECT_EQ(ParseJson(text + "\"last\": 0}").as_object().size(), 50'001u);
    EXPECT_THROW((void)ParseJson(text + "\"key49999\": 0}"), Error);
    EXPECT_THROW((void)ParseJson(text + "\"key3\": 0}"), Error);
}

} // namespace
