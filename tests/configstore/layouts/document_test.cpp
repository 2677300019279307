/* SPDX-License-Identifier: Apache-2.0 */
// docs/properties.md says what the tables say.

#include "configstore/layouts/document.h"

#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

#include "configstore/layouts/registry.h"

using namespace dvs::layout;

namespace {

TEST(PropertiesDocument, IsUpToDate) {
    std::ifstream file(DVS_SOURCE_DIR "/docs/properties.md");
    std::stringstream text;
    text << file.rdbuf();
    EXPECT_TRUE(text.str() == PropertiesDocument()) << "run docs/generate-properties.sh";
}

TEST(PropertiesDocument, ExplainsEveryKey) {
    const std::string document = PropertiesDocument();
    for (uint32_t propClass = 0; propClass <= 2; ++propClass) {
        for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
            EXPECT_NE(nullptr, FindType(row->converterType)) << row->key;
            if (std::string(row->key) == "DEFAULT") continue;
            EXPECT_NE(nullptr, MeaningOf(propClass, row->key)) << row->key;
            EXPECT_NE(nullptr, FindProperty(propClass, row->key)) << row->key;
            EXPECT_NE(std::string::npos, document.find(std::string("| `") + row->key + "` |")) << row->key;
        }
    }
    EXPECT_EQ(nullptr, FindType(30));
    EXPECT_EQ(nullptr, MeaningOf(0, "com.acme.other"));
    EXPECT_EQ(nullptr, RecordOf(0, "com.acme.other", false));
}

} // namespace
