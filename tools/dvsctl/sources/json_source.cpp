/* SPDX-License-Identifier: Apache-2.0 */
// json: a state as a JSON document (docs/json-form.md), in a file or on standard input and output.

#include "form/json/codec.h"
#include "form/model.h"
#include "tools/dvsctl/sources/files.h"
#include "tools/dvsctl/sources/schemes.h"

namespace dvs::ctl {

namespace {

class JsonSource : public Source {
public:
    explicit JsonSource(std::string_view path) : Source("json:" + std::string(path)), path_(path) {}

    bool IsStandardOutput() const override { return path_ == "-"; }

    std::optional<StateBytes> Read(Context &context, ReadMode) override {
        if (path_ == "-") return Decode(ReadStandardInput(context, Name()));
        if (!FileExists(path_)) return std::nullopt;
        return Decode(ReadWholeFile(context, path_, Name(), Accept::Pipes));
    }

    void Write(Context &context, Bytes state) override {
        const auto form = context.options.raw ? TypedForm::None : TypedForm::Instead;
        const std::string text = StateToJsonText(ParseState(state), form);
        if (path_ == "-")
            context.out.Write(text);
        else
            ReplaceFile(context, path_, Name(), AsBytes(text), FileForm::Document);
    }

    std::vector<std::uint8_t> Plan(Context &context, Bytes state) override {
        if (path_ != "-") CheckReplaceable(path_, Name());
        return Source::Plan(context, state);
    }

private:
    StateBytes Decode(const std::string &text) {
        try {
            return {StateFromJsonText(text), {}};
        } catch (Error &error) {
            error.source = Name();
            throw;
        }
    }

    std::string path_;
};

} // namespace

std::unique_ptr<Source> OpenJsonSource(std::string_view path) {
    if (path.empty())
        throw Error(ErrorKind::Usage, "json: needs a path")
            .Try("write json:PATH, or json:- for standard input or output");
    return std::make_unique<JsonSource>(path);
}

} // namespace dvs::ctl
