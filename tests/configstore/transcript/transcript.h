/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_TRANSCRIPT_TRANSCRIPT_H
#define TESTS_CONFIGSTORE_TRANSCRIPT_TRANSCRIPT_H

// Records every message of saves and loads (standard output, the log sink, syslog and the host's log) and
// compares them with files under golden/. Message texts, their order and the sizes in them are part of the
// interface; these tests fail when any of them changes.
//
// A golden file holds one line for each setting of the debug levels: the lines and a hash of each transcript.
// After a mismatch, the full transcripts are in build/PRESET/transcripts. Run the same test in a checkout
// of an older commit to get the text to compare with. DVS_RECORD_TRANSCRIPTS=1 rewrites the golden files.

#include <cstdint>
#include <functional>
#include <span>
#include <string>
#include <vector>

namespace transcript {

/// Debug levels of the message families.
struct Setting {
    std::string name;
    int32_t configstore, dvs, dvsdata;
};

/// All three families at -1; then each alone at 0, 1, 2 and 10 with the other two at -1, and all three
/// together.
const std::vector<Setting> &EverySetting();
/// All three families at each of these levels.
std::vector<Setting> Together(std::initializer_list<int32_t> levels);

/// Adds a line to the transcript being recorded.
void Note(const char *format, ...) __attribute__((format(printf, 1, 2)));
/// FNV-1a, for notes on buffers and store contents.
uint64_t HashOf(const void *data, std::size_t size);
uint64_t HashOf(const std::string &text);

/// A state buffer: switches of every class with every known property and some properties without a row in the
/// mapping tables.
std::vector<uint8_t> WholeState();

using Scenario = std::function<void()>;

/// Runs the scenario under each setting, once with standard output and once with a log sink, and compares the
/// transcripts with golden/NAME.txt. The scenario starts with a new store each time.
void ExpectSame(const std::string &name, std::span<const Setting> settings, const Scenario &scenario);
/// For short scenarios: the golden file contains the sink's text, with all levels at 10.
void ExpectSameText(const std::string &name, const Scenario &scenario);

} // namespace transcript

#endif
