/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_DVSFILE_STATE_DIR_H
#define TESTS_DVSFILE_STATE_DIR_H

// A separate directory for each test of the state file, with the messages the test causes.

#include "dvs/file.h"
#include "dvs/log.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <set>
#include <string>
#include <vector>

#include <sys/stat.h>

class StateDir : public testing::Test {
protected:
    StateDir() {
        const char *base = std::getenv("TMPDIR");
        std::string name = std::string(base ? base : "/tmp") + "/dvs-file-XXXXXX";
        dir_ = mkdtemp(name.data());
        path_ = dir_ + "/state";
        DVSLog_SetSink(Collect, &messages_);
    }
    ~StateDir() override {
        DVSLog_SetSink(nullptr, nullptr);
        std::error_code ignored;
        std::filesystem::remove_all(dir_, ignored);
    }

    static std::string Contents(const std::string &path) {
        std::ifstream in(path, std::ios::binary);
        return {std::istreambuf_iterator<char>(in), {}};
    }
    static void Put(const std::string &path, const std::string &bytes) {
        std::ofstream(path, std::ios::binary) << bytes;
    }
    static mode_t Mode(const std::string &path) {
        struct stat info {};
        return lstat(path.c_str(), &info) == 0 ? info.st_mode : 0;
    }
    /// `bytes` as stored in a state file.
    static std::string Padded(std::string bytes) {
        bytes.resize((bytes.size() + 511) / 512 * 512);
        return bytes;
    }
    /// The names in a directory.
    static std::set<std::string> Names(const std::string &dir) {
        std::set<std::string> names;
        for (const auto &entry : std::filesystem::directory_iterator(dir))
            names.insert(entry.path().filename());
        return names;
    }
    /// The messages as one text; checks that each has level -1.
    std::string Messages() const {
        std::string all;
        for (const auto &message : messages_)
            all += message;
        return all;
    }

    std::string dir_, path_;
    std::vector<std::string> messages_;

private:
    static void Collect(int level, const char *text, void *arg) {
        EXPECT_EQ(level, -1);
        static_cast<std::vector<std::string> *>(arg)->emplace_back(text);
    }
};

/// The result of a read, released in the destructor.
class ReadBack {
public:
    explicit ReadBack(const std::string &path)
        : status(DVSFile_Read(path.c_str(), &buf, &len, &alignOffset)) {}
    ~ReadBack() {
        if (status == HYP_OK) std::free(static_cast<char *>(buf) - alignOffset);
    }
    ReadBack(const ReadBack &) = delete;
    ReadBack &operator=(const ReadBack &) = delete;
    std::string Bytes() const { return {static_cast<const char *>(buf), len}; }

    void *buf = nullptr;
    uint32_t len = 0;
    uint32_t alignOffset = 0;
    HYP_ReturnStatus status;
};

#endif
