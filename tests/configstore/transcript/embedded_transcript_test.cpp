/* SPDX-License-Identifier: Apache-2.0 */
// Transcripts of saves and loads on the embedded store.

#include <filesystem>

#include <gtest/gtest.h>

#include "configstore/transcript/steps.h"

using namespace state_builder;
using namespace transcript;

namespace {

TEST(EmbeddedTranscript, OfAWholeState) {
    char directory[] = "/tmp/dvs-transcript-XXXXXX";
    ASSERT_NE(nullptr, mkdtemp(directory));
    const Bytes state = WholeState();
    const auto switches = Parse(state);
    int run = 0;
    ExpectSame("embedded", EverySetting(), [&] {
        const std::string path = std::string(directory) + "/" + std::to_string(run++) + ".db";
        setenv("DVS_CONFIGSTORE", path.c_str(), 1);
        Load();
        Save(state);
        Save(state);
        Save(state, switches[7].id.c_str());
        Save(state, "no such switch");
        Load();
        Load(true);
        Save(State({switches[3]}));
        Load();
        // The schema rejects it: the store limits the length of a port's "name".
        Switch sw = switches[3];
        sw.ports.push_back({std::string(60, 'k'), {{"com.orbeno.common.port.alias", Text("long key")}}});
        Save(State({sw}));
        Load();
    });
    std::filesystem::remove_all(directory);
}

} // namespace
