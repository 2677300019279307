/* SPDX-License-Identifier: Apache-2.0 */
// The quick reader for documents as the store writes them, held against the general reader: white space in
// front of a document is what sends it to the latter.

#include "platform/configstore/support.h"

#include "platform/embedded/configstore/log.h"

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
    const MessageCollector quiet;
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
    "{\"name\":\"\xf4\x8f\xbb\xbf\"}", // stands for a byte
    "{\"name\":\"\xc3\"}",
    "}",
    "",
};

TEST(PlainDocument, ReadsAsTheGeneralReaderDoes) {
    for (const char *json : kDocuments)
        ExpectBothAgree(json);
}

TEST(PlainDocument, CutAnywhereIsJudgedAlike) {
    for (const std::string json : kDocuments) {
        for (std::size_t size = 0; size < json.size(); size++) {
            ExpectBothAgree(json.substr(0, size));
            ExpectBothAgree(json.substr(0, size) + '}');
        }
    }
}

TEST(PlainDocument, OneByteChangedIsJudgedAlike) {
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
