/* SPDX-License-Identifier: Apache-2.0 */
// Compares the fast reader, which handles documents in the store's own format, with the general reader.
// Leading white space forces the general reader.

#include <optional>

#include "platform/configstore/support.h"

#include "platform/embedded/configstore/document.h"

using namespace configstore;
using namespace store_test;

namespace {

struct Outcome {
    int32_t status = OK;
    std::string document;
    bool operator==(const Outcome &) const = default;
};

void PrintTo(const Outcome &outcome, std::ostream *out) {
    *out << outcome.status << ' ' << outcome.document;
}

Outcome Read(const std::string &json) {
    Outcome outcome;
    Object *object = nullptr;
    outcome.status = CreateObject(kKey, kGroup, kComponent, "sw1", json.c_str(), &object);
    const ObjectPtr owner(object);
    if (outcome.status == OK) outcome.document = Json(object);
    return outcome;
}

void ExpectBothAgree(const std::string &json) {
    EXPECT_EQ(Read(json), Read(' ' + json)) << json;
}

constexpr const char *kDocuments[] = {
    R"({})",
    R"({"name":"a","uuid":"b","max_ports":12,"is_opaque":true,"ovl_enabled":false,"uplink_port_names":["u","v"]})",
    R"({"ports":{"1":{"name":"q\"\\\/\n\r\t\b\f","settings":{"blocked":false,"vlan":{"trunk_vlan_ids":[],"vlan_id":5}}},"2":{}}})",
    R"({"data":{"other_data":{"k":{"opaque_data":"QUJD","prop_type":0},"l":{"opaque_data":"?"},"m":{}}},"health_checks":{}})",
    R"({"uplink_port_names":[],"ports":[],"max_ports":-7,"name":"grün 中 \u00e9"})",
    R"({"max_ports":123456789012345678,"name":null,"switch_address":"","unheard_of":{"a":[1,{}]}})",
    R"({"settings":{"vspans":{"s":{"destination_port":{"vlans":[1,2,30]},"name":"twelve bytes"}}}})",
    R"({"name":"a","name":"b"})",
    R"({"ports":{"1":{},"1":{}}})",
    R"({"ports":{"1":{},"2":7}})",
    R"({"max_ports":01})",
    R"({"max_ports":-0})",
    R"({"max_ports":1.0})",
    R"({"max_ports":"many","name":5})",
    R"({"uplink_port_names":["u",1]})",
    R"({"uplink_port_names":["u",]})",
    R"({"name":"a",})",
    R"({"ports":{"1":{}})",
    R"({"ports":{"1":{}}}})",
    "{\"name\":\"\xf4\x8f\xbb\xbf\"}", // replaced by a byte
    "{\"name\":\"\xc3\"}",
    "}",
    "",
};

std::shared_ptr<const Buffer> Kept(const std::string &text) {
    const auto kept = std::make_shared<Buffer>();
    kept->Put(text);
    return kept;
}

/// The result of scanning a document for a rewrite: nothing, or the document with its deferred lists read.
std::optional<std::string> ReadOutlined(const std::string &json) {
    Tree tree({Layer::Current, kKey, kGroup, kComponent, "sw1"});
    Outline outline;
    if (!ReadOutline(Kept(json), &tree, &outline)) return std::nullopt;
    for (Object *member = tree.root.members.first; member; member = member->next) {
        if (member->kind == Kind::Later && !Expand(&tree, member)) return "a list that is none";
    }
    return FindViolation(&tree) ? "a violation" : Json(&tree.root);
}

/// The scan may leave a document to the reader but must never miss an error.
void ExpectOverlooksNothing(const std::string &json) {
    const std::optional<std::string> outlined = ReadOutlined(json);
    if (outlined) {
        EXPECT_EQ((Outcome{OK, *outlined}), Read(json)) << json;
    }
}

// Typical contents of ports, which the scan skips: escapes, characters beyond ASCII, lists.
constexpr const char *kPorts =
    R"({"name":"a","ports":{"1":{"name":"q\"\\\/\n\r\t\b\f grün 中","connection_cookie":4294967295,"settings":)"
    R"({"blocked":false,"vlan":{"trunk_vlan_ids":{},"vlan_id":5},"in_shaping_policy":{"enabled":true,"peak_bandwidth":-8}}},)"
    R"("2":{},"3":{"settings":{"vlan":{"trunk_vlan_ids":{"0":{"start":1,"end":5}}},"filter_policy":{"network_filters":{"0":{"parameters":["u","v"]}}}},"vspans":{"s":{"source_recv_port":{"vlans":[1,-2],"addresses":[]}}},"data":{"opaque_data":{"k":{"opaque_data":"QUJD"}}}}},)"
    R"("uuid":"u","health_checks":{"h":{"interval":7}}})";

TEST(PlainDocument, ReadsAsTheGeneralReaderDoes) {
    for (const char *json : kDocuments)
        ExpectBothAgree(json);
}

TEST(PlainDocument, OutlineOfAValidDocumentKeepsItsLongestListAsText) {
    const std::string json = kPorts;
    ASSERT_EQ(Read(json).status, OK);
    EXPECT_EQ(ReadOutlined(json), Read(json).document);
    Tree tree({Layer::Current, kKey, kGroup, kComponent, "sw1"});
    Outline outline;
    ASSERT_TRUE(ReadOutline(Kept(json), &tree, &outline));
    EXPECT_EQ(json.substr(outline.begin, outline.end - outline.begin).substr(0, 8), R"({"1":{"n)");
    EXPECT_EQ(json.substr(outline.end, 7), R"(,"uuid")");
    EXPECT_EQ(FindMember(&tree.root, "ports")->kind, Kind::Later);
    EXPECT_EQ(FindMember(&tree.root, "health_checks")->kind, Kind::Later);
}

TEST(PlainDocument, OutlineRejectsDocumentsWithErrorsToReport) {
    const auto parameter = [](const std::string &text) {
        return R"({"1":{"settings":{"filter_policy":{"network_filters":{"0":{"parameters":[")" + text +
               R"("]}}}}}})";
    };
    EXPECT_NE(ReadOutlined(R"({"ports":)" + parameter(std::string(254, 'x') + "\\n") + '}'), std::nullopt);
    for (const std::string &ports :
         {std::string(R"({"1":{},"1":{}})"), std::string(R"({"1":{"name":"a","name":"b"}})"),
          std::string(R"({"1":{"name":5}})"), std::string(R"({"1":{"connection_cookie":4294967296}})"),
          std::string(R"({"1":{"settings":{"blocked":"true"}}})"), std::string(R"({"1":{"unheard_of":1}})"),
          std::string(R"({"1":{"name":null}})"),
          std::string(R"({"1":{"data":{"opaque_data":{"k":{"opaque_data":"?"}}}}})"),
          parameter(std::string(256, 'x')), std::string(R"({"1":7})"),
          std::string("{\"1\":{\"name\":\"\xc3\"}}"), std::string("{\"1\":{\"name\":\"\xf4\x8f\xbb\xbf\"}}")})
        EXPECT_EQ(ReadOutlined(R"({"ports":)" + ports + R"(,"name":"a"})"), std::nullopt) << ports;
    EXPECT_EQ(ReadOutlined(R"({"max_ports":"many","ports":{"1":{}}})"), std::nullopt);
}

TEST(PlainDocument, OutlineMissesNoError) {
    std::vector<std::string> documents(std::begin(kDocuments), std::end(kDocuments));
    documents.emplace_back(kPorts);
    for (const std::string &json : documents) {
        ExpectOverlooksNothing(json);
        for (std::size_t at = 0; at < json.size(); at++) {
            ExpectOverlooksNothing(json.substr(0, at));
            ExpectOverlooksNothing(json.substr(0, at) + '}');
            for (const char byte :
                 {'"', '\\', '{', '}', '[', ']', ',', ':', '0', '-', 'n', ' ', '\x01', '\xe4', '\0'}) {
                std::string changed = json;
                changed[at] = byte;
                ExpectOverlooksNothing(changed);
            }
        }
    }
}

TEST(PlainDocument, BothReadersAgreeOnEveryTruncation) {
    for (const std::string json : kDocuments) {
        for (std::size_t size = 0; size < json.size(); size++) {
            ExpectBothAgree(json.substr(0, size));
            ExpectBothAgree(json.substr(0, size) + '}');
        }
    }
}

TEST(PlainDocument, BothReadersAgreeOnEachChangedByte) {
    for (const std::string json : kDocuments) {
        for (std::size_t at = 0; at < json.size(); at++) {
            for (const char byte : {'"', '\\', '{', '}', '[', ',', '0', 'n', ' ', '\x01', '\xe4'}) {
                std::string changed = json;
                changed[at] = byte;
                ExpectBothAgree(changed);
            }
        }
    }
}

} // namespace
