/* SPDX-License-Identifier: Apache-2.0 */
// Hostile documents: each is rejected with the reason and the place, nothing is stored, and memory stays
// proportional to the input. STORE_HOSTILE_MB sets the size of the large ones.

#include "platform/configstore/support.h"

#include <functional>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

using namespace configstore;
using namespace store_test;

namespace {

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr bool kMemoryCounts = false; // a sanitizer's own bookkeeping dominates
#else
constexpr bool kMemoryCounts = true;
#endif

std::string Repeat(const std::string &text, std::size_t times) {
    std::string all;
    all.reserve(text.size() * times);
    while (times-- > 0)
        all += text;
    return all;
}

class StoreHostileDocument : public StoreTest {
protected:
    /// Both ways into the store reject the document and report why.
    void ExpectRefused(const std::string &json, const std::string &why) {
        SCOPED_TRACE(json.substr(0, 80));
        const StorePtr store = Open();
        Object *object = nullptr;
        (void)TakeHostLog();
        EXPECT_EQ(CreateObject(kKey, kGroup, kComponent, "sw1", json.c_str(), &object), BAD_PARAMETER);
        const std::string logged = TakeHostLog();
        EXPECT_NE(logged.find("switches/network_vds/qel[sw1]: "), std::string::npos) << logged;
        EXPECT_NE(logged.find(why), std::string::npos) << logged;
        EXPECT_EQ(object, nullptr);
        std::vector<admin::Problem> problems;
        const admin::Address address{admin::Layer::Current, kKey, kGroup, kComponent, "sw1"};
        EXPECT_EQ(admin::Import(store.get(), address, json, &problems), BAD_PARAMETER);
        EXPECT_NE(LastFailure(store.get()).find(path_), std::string::npos) << LastFailure(store.get());
        EXPECT_TRUE(StoredIds(store.get()).empty());
    }
};

TEST_F(StoreHostileDocument, MillionNestedBrackets) {
    ExpectRefused(R"({"x":)" + Repeat("[", 1000000), "too deep");
    ExpectRefused(Repeat(R"({"x":)", 1000000), "too deep");
    ExpectRefused(R"({"ports":)" + Repeat("[", 1000000), "too deep");
}

TEST_F(StoreHostileDocument, DuplicateNamesAtEveryKindOfPlace) {
    ExpectRefused(R"({"name":"a","max_ports":1,"name":"b"})", "the name \"name\" occurs twice");
    ExpectRefused(R"({"settings":{"max_mtu":1,"max_mtu":1}})", "settings: the name \"max_mtu\" occurs twice");
    ExpectRefused(R"({"ports":{"p":{},"q":{},"p":{}}})", "occurs twice");
    ExpectRefused(R"({"vtep_ports":{"a":1,"a":2}})", "occurs twice");
    ExpectRefused(R"({"vtep_ports":{"x":{"a":1,"a":2}}})", "occurs twice");
    ExpectRefused(R"({"new":{"b":[{"a":1,"a":2}]}})", "");
}

TEST_F(StoreHostileDocument, InvalidUtf8) {
    ExpectRefused("{\"name\":\"\xff\"}", "at byte ");
    ExpectRefused("{\"name\":\"\xc3\"}", "at byte ");
    ExpectRefused("{\"name\":\"\xed\xa0\x80\"}", "at byte ");
    ExpectRefused("{\"\xff\":1}", "at byte ");
    ExpectRefused(R"({"name":"\ud800"})", "");
}

TEST_F(StoreHostileDocument, NulInNamesAndTexts) {
    ExpectRefused(R"({"a\u0000b":1})", "NUL");
    ExpectRefused(R"({"name":"a\u0000b"})", "NUL");
    ExpectRefused(R"({"ports":{"p\u0000":{}}})", "NUL");
    ExpectRefused(R"({"uplink_port_names":["\u0000"]})", "NUL");
    ExpectRefused(R"({"vtep_ports":{"\u0000":1}})", "NUL");
}

TEST_F(StoreHostileDocument, EveryTruncationOfADocument) {
    const std::string whole =
        R"({"name":"a\u00e9\n","max_ports":-12,"ports":{"p":{"settings":{"blocked":true}}},)"
        R"("uplink_port_names":["x","y"],"new":[1.5e3,null,{"z":false}]})";
    for (std::size_t size = 0; size < whole.size(); size++)
        ExpectRefused(whole.substr(0, size), "at byte ");
    EXPECT_EQ(Json(NewSwitch(whole).get()).substr(0, 9), R"({"name":")");
}

TEST_F(StoreHostileDocument, ValuesOtherThanObjects) {
    for (const char *json :
         {"", " ", "null", "1", "\"x\"", "[]", "[{}]", "{} {}", "{}x", "nul", "{'a':1}", "{\"a\":01}",
          "{\"a\":NaN}", "{\"a\":1,}", "{\"a\" 1}", "/**/{}", "\xef\xbb\xbf{}"})
        ExpectRefused(json, "at byte ");
}

TEST_F(StoreHostileDocument, TextsEndAtTheFirstNulByte) {
    // A C string ends at its first NUL; the bytes after it are ignored.
    Object *object = nullptr;
    ASSERT_EQ(CreateObject(kKey, kGroup, kComponent, "sw1", "{}\0{{{{", &object), OK);
    DestroyObject(object);
}

/// The growth of a child's peak memory while it does `work`, in bytes.
long PeakOf(const std::function<void()> &work) {
    int ends[2];
    EXPECT_EQ(pipe(ends), 0);
    const pid_t child = fork();
    if (child == 0) {
        const auto peak = [] {
            rusage usage{};
            getrusage(RUSAGE_SELF, &usage);
            return usage.ru_maxrss * 1024;
        };
        const long before = peak();
        work();
        const long used = peak() - before;
        (void)!write(ends[1], &used, sizeof used);
        _exit(0);
    }
    close(ends[1]);
    long used = -1;
    (void)!read(ends[0], &used, sizeof used);
    close(ends[0]);
    int status = 0;
    waitpid(child, &status, 0);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    return used;
}

TEST_F(StoreHostileDocument, MemoryStaysWithinTenTimesTheInput) {
    const char *const wanted = std::getenv("STORE_HOSTILE_MB");
    const std::size_t size = (wanted ? std::strtoull(wanted, nullptr, 10) : 2) << 20;
    const auto filled = [size](const std::string &head, const std::string &piece, const std::string &tail) {
        return head + Repeat(piece, size / piece.size()) + tail;
    };
    std::string ids = "{\"ports\":{\"p\":{}";
    while (ids.size() < size)
        ids += ",\"" + std::to_string(ids.size()) + "\":{}";
    struct {
        const char *what;
        std::string json;
    } const cases[] = {
        {"one text", filled("{\"name\":\"", "x", "\"}")},
        {"one escaped text", filled("{\"name\":\"", "\\u00e9", "\"}")},
        {"one text of an unknown member", filled("{\"new\":[\"", "x", "\"]}")},
        {"one name", filled("{\"", "x", "\":1}")},
        {"one number", filled("{\"max_ports\":", "1", "}")},
        {"empty texts", filled("{\"uplink_port_names\":[\"\"", ",\"\"", "]}")},
        {"small numbers", filled("{\"new\":[0", ",0", "]}")},
        {"mixed list", filled("{\"uplink_port_names\":[0", ",0", "]}")},
        {"empty objects", filled("{\"new\":[{}", ",{}", "]}")},
        {"instances", ids + "}}"},
        {"base64", filled("{\"data\":{\"other_data\":{\"k\":{\"opaque_data\":\"", "QUFB", "\"}}}}")},
        {"unclosed", filled("{\"name\":\"", "x", "")},
    };
    for (const auto &one : cases) {
        const long used = PeakOf([&] {
            Object *object = nullptr;
            if (CreateObject(kKey, kGroup, kComponent, "sw1", one.json.c_str(), &object) == OK)
                DestroyObject(object);
            std::vector<admin::Problem> problems;
            (void)admin::CheckDocument(kKey, kGroup, one.json, &problems);
        });
        EXPECT_GE(used, 0) << one.what;
        if (kMemoryCounts) {
            EXPECT_LE(used, static_cast<long>(one.json.size() * 10)) << one.what;
        }
    }
}

} // namespace
