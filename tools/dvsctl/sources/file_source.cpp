/* SPDX-License-Identifier: Apache-2.0 */
// file: a state file, as the library writes it.

#include <cstdlib>
#include <memory>

#include <sys/stat.h>

#include "dvs/file.h"
#include "platform/status_text.h"
#include "tools/dvsctl/sources/files.h"
#include "tools/dvsctl/sources/schemes.h"

namespace dvs::ctl {

namespace {

constexpr std::size_t kBlock = 512;

struct FreeBlock {
    std::uint32_t offset;
    void operator()(void *start) const { std::free(static_cast<char *>(start) - offset); }
};

// People name the JSON form by its path now and then.
bool LooksLikeJson(const std::string &contents) {
    const std::size_t first = contents.find_first_not_of(" \t\r\n");
    return first != std::string::npos && contents[first] == '{';
}

class FileSource : public Source {
public:
    explicit FileSource(std::string_view path) : Source("file:" + std::string(path)), path_(path) {}

    bool HasOffsets() const override { return true; }

    std::optional<StateBytes> Read(Context &context, ReadMode mode) override {
        if (!FileExists(path_)) return std::nullopt;
        return mode == ReadMode::Strict ? ReadThroughLibrary(context) : ReadTolerant(context);
    }

    void Write(Context &context, Bytes state) override {
        ReplaceFile(context, path_, Name(), state, FileForm::State);
    }

    std::vector<std::uint8_t> Plan(Context &context, Bytes state) override {
        CheckReplaceable(path_, Name());
        return Source::Plan(context, state);
    }

private:
    StateBytes ReadThroughLibrary(Context &context) {
        struct stat info {};
        if (stat(path_.c_str(), &info) == 0 && !S_ISREG(info.st_mode))
            return ReadTolerant(context); // which refuses
        void *start = nullptr;
        std::uint32_t length = 0, offset = 0;
        const HYP_ReturnStatus status = DVSFile_Read(path_.c_str(), &start, &length, &offset);
        if (status != HYP_OK) Refuse(context, status);
        const std::unique_ptr<void, FreeBlock> block(start, FreeBlock{offset});
        const auto *bytes = static_cast<const std::uint8_t *>(start);
        return {{bytes, bytes + length}, {}};
    }

    StateBytes ReadTolerant(Context &context) {
        const std::string contents = ReadWholeFile(context, path_, Name(), Accept::FilesOnly);
        StateBytes state{{contents.begin(), contents.end()}, {}};
        if (contents.empty())
            state.complaint = "the file is empty";
        else if (contents.size() % kBlock != 0)
            state.complaint =
                "its size, " + std::to_string(contents.size()) + " bytes, is no multiple of 512";
        if (LooksLikeJson(contents))
            state.complaint +=
                (state.complaint.empty() ? "" : "; ") + ("it looks like JSON: write json:" + path_);
        return state;
    }

    [[noreturn]] void Refuse(Context &context, HYP_ReturnStatus status) {
        const bool malformed = status == HYP_FILE_EMPTY || status == HYP_IO_ERROR || status == HYP_BAD_PARAM;
        Error error(malformed ? ErrorKind::Malformed : ErrorKind::Failed, "cannot read the state file");
        error.source = Name();
        error.messages = context.log.Take();
        error.why = HYP_ReturnStatusToString(status);
        if (malformed) {
            error.why = ReadTolerant(context).complaint;
            error.next = "dvsctl hexdump shows what is in it; bring back a good copy";
        } else if (status == HYP_NOT_FOUND) {
            error.why = "it is there but cannot be opened";
            error.next = "state files belong to their owner alone; run as that user";
        }
        throw Error(error);
    }

    std::string path_;
};

} // namespace

std::unique_ptr<Source> OpenFileSource(std::string_view path) {
    if (path.empty())
        throw Error(ErrorKind::Usage, "file: needs a path").Try("write file:PATH, or the path alone");
    return std::make_unique<FileSource>(path);
}

} // namespace dvs::ctl
