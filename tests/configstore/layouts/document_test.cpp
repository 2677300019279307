/* SPDX-License-Identifier: Apache-2.0 */
// docs/properties.md says what the tables say.

#include "configstore/layouts/document.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <regex>
#include <sstream>

#include "configstore/layouts/registry.h"

using namespace dvs;
using namespace dvs::layout;

namespace {

std::string Read(const std::filesystem::path &path) {
    std::ifstream file(path);
    std::stringstream text;
    text << file.rdbuf();
    return text.str();
}

TEST(PropertiesDocument, IsUpToDate) {
    EXPECT_TRUE(Read(DVS_SOURCE_DIR "/docs/properties.md") == PropertiesDocument())
        << "run docs/generate-properties.sh";
}

TEST(PropertiesDocument, ExplainsEveryKey) {
    const std::string document = PropertiesDocument();
    for (uint32_t propClass = 0; propClass <= 2; ++propClass) {
        for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
            EXPECT_NE(nullptr, FindType(ConverterTypeOf(*row))) << row->key;
            if (std::string(row->key) == "DEFAULT") continue;
            EXPECT_NE(nullptr, MeaningOf(propClass, row->key)) << row->key;
            EXPECT_NE(nullptr, FindProperty(propClass, row->key)) << row->key;
            EXPECT_NE(std::string::npos, document.find(std::string("| `") + row->key + "` |")) << row->key;
        }
    }
    EXPECT_EQ(nullptr, FindType(ConverterType::kUnassigned));
    EXPECT_EQ(nullptr, MeaningOf(0, "com.acme.other"));
    EXPECT_EQ(nullptr, RecordOf(0, "com.acme.other", false));
}

// The document's part about one type.
std::string SectionOf(ConverterType type) {
    const std::string document = PropertiesDocument() + "\n###";
    const auto at = document.find("### Type " + std::to_string(static_cast<uint32_t>(type)) + "\n");
    if (at == std::string::npos) return "";
    return document.substr(at, document.find("\n###", at) - at);
}

TEST(PropertiesDocument, DescribesEachRecordOnceAndRefersToItElsewhere) {
    const std::string number = SectionOf(ConverterType::kNumber);
    EXPECT_NE(std::string::npos, number.find("*number*, 4 bytes"));
    EXPECT_EQ(std::string::npos, number.find("as above")) << number;
    const std::string mtu = SectionOf(ConverterType::kMtu);
    EXPECT_EQ(std::string::npos, mtu.find("*number*, 4 bytes"));
    const auto reference = mtu.find("The value is a *number* as above.");
    ASSERT_NE(std::string::npos, reference);
    EXPECT_EQ(std::string::npos, mtu.find("as above", reference + 30)) << mtu;
    EXPECT_NE(std::string::npos, SectionOf(ConverterType::kMirrorSessions).find("wide port record"));
}

TEST(PropertiesDocument, NamesEveryPlaceOfAType) {
    for (uint32_t propClass = 0; propClass <= 2; ++propClass) {
        for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
            const std::string leaf = std::string("`") + row->path[row->depth - 1] + "`";
            EXPECT_NE(std::string::npos, SectionOf(ConverterTypeOf(*row)).find(leaf))
                << row->key << " is not under " << leaf;
        }
    }
}

// `dvsctl props` shows them one at a time, by the property's name.
TEST(Oddities, StandForThemselves) {
    for (ConverterType type{}; type < ConverterType::kEnd; type = Next(type)) {
        const TypeInfo *info = FindType(type);
        if (!info) continue;
        EXPECT_FALSE(std::regex_search(info->quirks, std::regex("type [0-9]"))) << info->quirks;
    }
}

TEST(Oddities, SayWhichSwitchesATypeOfOneFamilyIsFor) {
    using enum ConverterType;
    for (const ConverterType type : {kEtherswitchTeaming, kVswitchTeaming, kEtherswitchPortVlan,
                                     kVswitchPortVlan, kEtherswitchMacSecurity, kVswitchMacSecurity}) {
        const TypeInfo &info = *FindType(type);
        EXPECT_NE(std::string::npos, std::string(info.quirks).find("cswitch")) << info.name;
    }
    for (const ConverterType type : {kText, kMirrorSessions, kMtu, kTxUplink}) {
        const TypeInfo &info = *FindType(type);
        EXPECT_NE(std::string::npos, std::string(info.quirks).find("family")) << info.name;
    }
}

// Every test that docs/config-store.md names for an oddity.
TEST(DeliberateOddities, NameTestsThatThereAre) {
    std::string sources;
    for (const auto &entry : std::filesystem::recursive_directory_iterator(DVS_SOURCE_DIR "/tests")) {
        if (entry.path().extension() == ".cpp") sources += Read(entry.path());
    }
    const std::string document = Read(DVS_SOURCE_DIR "/docs/config-store.md");
    const std::regex name("`(\\w+)\\.(\\w+)` \\|");
    int rows = 0;
    for (std::sregex_iterator each(document.begin(), document.end(), name), end; each != end;
         ++each, ++rows) {
        const std::string test = "(" + (*each)[1].str() + ", " + (*each)[2].str() + ")";
        EXPECT_NE(std::string::npos, sources.find(test)) << test;
    }
    EXPECT_GT(rows, 30);
}

} // namespace
