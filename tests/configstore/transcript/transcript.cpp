/* SPDX-License-Identifier: Apache-2.0 */
// Recording and comparing transcripts (transcript.h). Linked with --wrap for the functions that write to
// syslog and to the host's log.

#include "configstore/transcript/transcript.h"

#include <algorithm>
#include <cctype>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <sstream>

#include <unistd.h>

#include <gtest/gtest.h>

#include "dvs/configstore.h"
#include "dvs/data.h"
#include "dvs/log.h"
#include "dvs/state.h"

namespace transcript {
namespace {

struct Transcript {
    std::string messages; // from standard output or the sink
    std::string system;   // from syslog and the host's log
};

Transcript *g_recorded = nullptr;
bool g_hasSink = false;

std::string Formatted(const char *format, va_list args) {
    va_list again;
    va_copy(again, args);
    const int length = std::vsnprintf(nullptr, 0, format, again);
    va_end(again);
    std::string text(static_cast<std::size_t>(length) + 1, '\0');
    std::vsnprintf(text.data(), text.size(), format, args);
    text.pop_back();
    return text;
}

// Replaces durations, which differ from run to run.
std::string WithoutTimes(std::string text) {
    for (std::size_t at = text.find("ime: "); at != std::string::npos; at = text.find("ime: ", at)) {
        at += 5;
        std::size_t end = at;
        while (end < text.size() && std::isdigit(static_cast<unsigned char>(text[end])))
            ++end;
        if (text.compare(end, 2, "ms") == 0) text.replace(at, end - at, "N");
    }
    return text;
}

void NoteSystem(const char *name, unsigned level, const char *format, va_list args) {
    const std::string text = Formatted(format, args);
    if (g_recorded) g_recorded->system += std::string(name) + std::to_string(level) + " " + text + "\n";
}

void Sink(int level, const char *text, void *) {
    g_recorded->messages += std::to_string(level) + "|" + text;
    if (g_recorded->messages.back() != '\n') g_recorded->messages += "$\n";
}

// Redirects standard output to a file until the end of the scope.
class Redirected {
public:
    explicit Redirected(std::string *text) : text_(text), file_(std::tmpfile()) {
        std::fflush(stdout);
        saved_ = dup(STDOUT_FILENO);
        EXPECT_TRUE(file_ && saved_ >= 0 && dup2(fileno(file_), STDOUT_FILENO) >= 0);
    }
    ~Redirected() {
        std::fflush(stdout);
        dup2(saved_, STDOUT_FILENO);
        close(saved_);
        std::rewind(file_);
        char piece[4096];
        while (const std::size_t size = std::fread(piece, 1, sizeof piece, file_))
            text_->append(piece, size);
        std::fclose(file_);
    }
    Redirected(const Redirected &) = delete;
    Redirected &operator=(const Redirected &) = delete;

private:
    std::string *text_;
    std::FILE *file_;
    int saved_;
};

void SetLevels(const Setting &setting) {
    dvsconfigstore_debug = setting.configstore;
    dvs_debug = setting.dvs;
    dvsdata_debug = setting.dvsdata;
}

Transcript Record(const Setting &setting, bool withSink, const Scenario &scenario) {
    Transcript recorded;
    g_recorded = &recorded;
    g_hasSink = withSink;
    SetLevels(setting);
    if (withSink) {
        DVSLog_SetSink(Sink, nullptr);
        scenario();
        DVSLog_SetSink(nullptr, nullptr);
    } else {
        const Redirected redirected(&recorded.messages);
        scenario();
    }
    g_recorded = nullptr;
    SetLevels({"", -1, -1, -1});
    recorded.messages = WithoutTimes(std::move(recorded.messages));
    recorded.system = WithoutTimes(std::move(recorded.system));
    return recorded;
}

std::string Summary(const std::string &text) {
    char summary[64];
    std::snprintf(summary, sizeof summary, "%ld:%016lx", std::count(text.begin(), text.end(), '\n'),
                  static_cast<unsigned long>(HashOf(text)));
    return summary;
}

std::string ReadFile(const std::string &path) {
    std::ifstream file(path, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(file), {});
}

void WriteFile(const std::string &path, const std::string &text) {
    std::filesystem::create_directories(std::filesystem::path(path).parent_path());
    std::ofstream(path, std::ios::binary) << text;
}

std::string GoldenPath(const std::string &name) {
    return DVS_SOURCE_DIR "/tests/configstore/transcript/golden/" + name + ".txt";
}

// Returns true when this run rewrites the golden files.
bool Rewritten(const std::string &name, const std::string &text) {
    if (!std::getenv("DVS_RECORD_TRANSCRIPTS")) return false;
    WriteFile(GoldenPath(name), text);
    return true;
}

} // namespace

const std::vector<Setting> &EverySetting() {
    static const std::vector<Setting> settings = [] {
        std::vector<Setting> all = Together({-1});
        for (const int32_t level : {0, 1, 2, 10}) {
            const std::string text = std::to_string(level);
            all.push_back({"configstore=" + text, level, -1, -1});
            all.push_back({"dvs=" + text, -1, level, -1});
            all.push_back({"dvsdata=" + text, -1, -1, level});
            all.push_back({"all=" + text, level, level, level});
        }
        return all;
    }();
    return settings;
}

std::vector<Setting> Together(std::initializer_list<int32_t> levels) {
    std::vector<Setting> settings;
    for (const int32_t level : levels)
        settings.push_back({"all=" + std::to_string(level), level, level, level});
    return settings;
}

void Note(const char *format, ...) {
    va_list args;
    va_start(args, format);
    const std::string text = "== " + Formatted(format, args) + "\n";
    va_end(args);
    if (g_hasSink)
        g_recorded->messages += text;
    else
        std::fwrite(text.data(), 1, text.size(), stdout);
}

uint64_t HashOf(const void *data, std::size_t size) {
    uint64_t hash = 0xcbf29ce484222325U;
    for (std::size_t i = 0; i < size; ++i)
        hash = (hash ^ static_cast<const uint8_t *>(data)[i]) * 0x100000001b3U;
    return hash;
}

uint64_t HashOf(const std::string &text) {
    return HashOf(text.data(), text.size());
}

std::vector<uint8_t> WholeState() {
    const std::string state = ReadFile(DVS_SOURCE_DIR "/tests/configstore/transcript/state.bin");
    return {state.begin(), state.end()};
}

void ExpectSame(const std::string &name, std::span<const Setting> settings, const Scenario &scenario) {
    std::map<std::string, Transcript> transcripts; // by setting and kind
    std::string actual;
    for (const Setting &setting : settings) {
        Transcript &out = transcripts[setting.name + ".stdout"] = Record(setting, false, scenario);
        Transcript &sink = transcripts[setting.name + ".sink"] = Record(setting, true, scenario);
        EXPECT_EQ(out.system, sink.system) << "syslog does not depend on the sink";
        actual += setting.name + " stdout " + Summary(out.messages) + " sink " + Summary(sink.messages) +
                  " syslog " + Summary(out.system) + "\n";
    }
    if (Rewritten(name, actual)) return;
    const std::string golden = ReadFile(GoldenPath(name));
    EXPECT_EQ(golden, actual) << "transcripts are in " DVS_BINARY_DIR "/transcripts/" << name << ".*";
    if (golden == actual) return;
    for (const auto &[kind, recorded] : transcripts)
        WriteFile(DVS_BINARY_DIR "/transcripts/" + name + "." + kind,
                  recorded.messages + "-- syslog --\n" + recorded.system);
}

void ExpectSameText(const std::string &name, const Scenario &scenario) {
    const Transcript recorded = Record(Together({10}).front(), true, scenario);
    const std::string actual = recorded.messages + "-- syslog --\n" + recorded.system;
    if (Rewritten(name, actual)) return;
    EXPECT_EQ(ReadFile(GoldenPath(name)), actual);
}

} // namespace transcript

extern "C" {

void __wrap_vsyslog(int priority, const char *format, va_list args) {
    transcript::NoteSystem("syslog ", static_cast<unsigned>(priority), format, args);
}
void __wrap___vsyslog_chk(int priority, int, const char *format, va_list args) {
    transcript::NoteSystem("syslog ", static_cast<unsigned>(priority), format, args);
}
void __wrap_LogV(uint32_t level, const char *format, va_list args) {
    transcript::NoteSystem("host ", level, format, args);
}
}
