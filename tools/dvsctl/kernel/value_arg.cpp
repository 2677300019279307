/* SPDX-License-Identifier: Apache-2.0 */
// From words to bytes. Without --as a value is read as the property itself wants it, where the property is
// known; anything that could mean two things is refused.

#include "tools/dvsctl/kernel/value_arg.h"

#include <algorithm>
#include <charconv>
#include <optional>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/serialize.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "configstore/typed/typed_value.h"
#include "dvsdata/buffer_view.h"
#include "form/json/codec.h"
#include "form/json/parse.h"
#include "form/json/typed.h"
#include "form/model.h"
#include "form/value.h"
#include "tools/dvsctl/sources/files.h"

namespace dvs::ctl {

namespace {

namespace json = boost::json;
using Buffer = std::vector<std::uint8_t>;

constexpr const char *kForms = "text, number, hex, json";

std::optional<std::uint32_t> ParseNumber(std::string_view text) {
    const bool isHex = text.starts_with("0x") || text.starts_with("0X");
    if (isHex) text.remove_prefix(2);
    std::uint32_t number = 0;
    const char *end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number, isHex ? 16 : 10);
    if (error != std::errc() || stop != end) return std::nullopt;
    return number;
}

Buffer TextBytes(std::string_view text) {
    Buffer bytes(text.begin(), text.end());
    bytes.push_back(0);
    return bytes;
}

Buffer NumberBytes(std::uint32_t number) {
    Buffer bytes(sizeof number);
    data::Store32(bytes.data(), number);
    return bytes;
}

Buffer FileBytes(Context &context, const std::string &path) {
    const std::string contents = path == "-" ? ReadStandardInput(context, "standard input")
                                             : ReadWholeFile(context, path, path, Accept::Pipes);
    return {contents.begin(), contents.end()};
}

bool IsKnown(const Target &target) {
    if (target.property.empty()) return false;
    return typed::Describe(static_cast<std::uint32_t>(target.list), target.property, {}).state !=
           typed::State::kUnmapped;
}

/// A value of the states' JSON form ({"hex": "01ff"}), for properties without a form of their own.
Buffer FromStateForm(const json::value &value) {
    json::object document{
        {"switches",
         json::array{json::object{{"id", "x"},
                                  {"global", json::array{json::object{{"name", "x"}, {"value", value}}}}}}}};
    const Buffer state = StateFromJsonText(json::serialize(document));
    const Bytes bytes = ParseState(state).switches.at(0).entries.at(0).list.at(0).value;
    return {bytes.begin(), bytes.end()};
}

class Reader {
public:
    Reader(const Target &target, const std::function<std::uint32_t()> &switchVersion)
        : target_(target), switchVersion_(switchVersion), isKnown_(IsKnown(target)) {}

    bool IsTyped() const { return isKnown_; }

    Buffer As(const std::string &form, const std::string &text) {
        if (form == "text") return TextBytes(text);
        if (form == "number") return NumberBytes(NumberOf(text, "value"));
        if (form == "json") return isKnown_ ? Build(ToNode(ParseJson(text))) : FromStateForm(ParseJson(text));
        if (form != "hex")
            throw Error(ErrorKind::Usage, fmt::format("there is no form \"{}\"", form))
                .Because(fmt::format("the forms are {}", kForms));
        const auto bytes = FromHexDigits(text.starts_with("0x") ? text.substr(2) : text);
        if (!bytes)
            throw Error(ErrorKind::Usage, "the value is not hexadecimal digits")
                .Because("bytes are pairs of digits, with or without a blank between the pairs");
        return *bytes;
    }

    Buffer Guess(const std::string &text) {
        const bool isTree = text.starts_with("{") || text.starts_with("[");
        if (isTree) return As("json", text);
        if (isKnown_) return Scalar(text);
        if (!ParseNumber(text) && !text.empty()) return TextBytes(text);
        throw Error(ErrorKind::Usage, fmt::format("is {} a number or a text?", Quote(text)))
            .Because("dvsctl does not know this property, so it cannot tell")
            .Try("say --as number (four bytes) or --as text");
    }

private:
    // "9000" is a number or a text, whichever the property takes.
    Buffer Scalar(const std::string &text) {
        typed::Node node;
        if (text == "true" || text == "false") {
            node.kind = typed::Node::Kind::kBool;
            node.flag = text == "true";
        } else if (const auto number = ParseNumber(text)) {
            node.kind = typed::Node::Kind::kNumber;
            node.number = *number;
        } else {
            return Build(TextNode(text));
        }
        const typed::Built built = TryBuild(node);
        if (built.ok) return built.bytes;
        const typed::Built asText = TryBuild(TextNode(text));
        if (asText.ok) return asText.bytes;
        Refuse(built);
    }

    static typed::Node TextNode(const std::string &text) {
        typed::Node node;
        node.kind = typed::Node::Kind::kText;
        node.text = text;
        return node;
    }

    typed::Built TryBuild(const typed::Node &node) {
        const bool isTree = node.kind == typed::Node::Kind::kList || node.kind == typed::Node::Kind::kObject;
        return typed::Build(static_cast<std::uint32_t>(target_.list), target_.property, node,
                            {isTree ? switchVersion_() : 0});
    }

    typed::Node ToNode(const json::value &value) {
        NodeFlaw flaw;
        auto node = NodeFromJson(value, flaw);
        if (node) return std::move(*node);
        typed::Built built;
        built.field = flaw.field;
        built.reason = flaw.reason;
        Refuse(built);
    }

    Buffer Build(const typed::Node &node) {
        typed::Built built = TryBuild(node);
        if (!built.ok) Refuse(built);
        if (!built.differences.empty()) {
            // Set in silence, it would be another value than the one that was asked for.
            Error error(ErrorKind::Malformed, "the property cannot hold this value as it is given");
            error.path = target_.property;
            error.why = built.differences.front();
            error.next = "write what it reads back as, or give the bytes: --as hex, --file";
            throw Error(error);
        }
        return std::move(built.bytes);
    }

    [[noreturn]] void Refuse(const typed::Built &built) {
        Error error(ErrorKind::Malformed, "the value does not fit the property");
        error.path = target_.property;
        error.field = built.field;
        error.why = built.reason;
        error.next = "docs/properties.md describes it; --as text, number or hex and --file set any bytes";
        throw Error(error);
    }

    const Target &target_;
    const std::function<std::uint32_t()> &switchVersion_;
    bool isKnown_;
};

bool StartsLikeJson(const Buffer &contents) {
    const std::string_view text = AsText(contents);
    const std::size_t first = text.find_first_not_of(" \t\r\n");
    return first != std::string_view::npos && text[first] == '{';
}

Buffer PortFromJson(json::object port) {
    port["id"] = "x"; // whose port it is and what it is called, the command line says
    json::object document{
        {"switches", json::array{json::object{{"id", "x"}, {"ports", json::array{std::move(port)}}}}}};
    const Buffer state = StateFromJsonText(json::serialize(document));
    const Bytes bytes = ParseState(state).switches.at(0).entries.at(0).value;
    return {bytes.begin(), bytes.end()};
}

Buffer SerializedList(const std::string &path, Buffer bytes) {
    const data::Fault fault = data::VerifyBuffer(bytes);
    if (fault.kind == data::FaultKind::None) return bytes;
    Error error(ErrorKind::Malformed, "this is no port's data");
    error.source = path;
    error.offset = fault.offset;
    error.why = fault.Text();
    error.next = "give a serialized property list (dvsctl kernel port state --raw), or a port as the JSON "
                 "form of states has it";
    throw error;
}

} // namespace

std::uint32_t NumberOf(const std::string &text, const char *what) {
    if (const auto number = ParseNumber(text)) return *number;
    throw Error(ErrorKind::Usage, fmt::format("the {} is no number", what))
        .At(text)
        .Because("it is decimal or 0x and hexadecimal digits, at most 4294967295");
}

std::uint32_t TypeOf(const Options &options, std::uint32_t otherwise) {
    return options.type ? NumberOf(*options.type, "type") : otherwise;
}

NewValue ValueOf(Context &context, const Target &target,
                 const std::function<std::uint32_t()> &switchVersion) {
    const Options &options = context.options;
    if (options.value.has_value() == options.file.has_value())
        throw Error(ErrorKind::Usage,
                    options.value ? "VALUE and --file exclude each other" : "there is no value")
            .Try("give VALUE, @PATH or --file PATH");
    Reader reader(target, switchVersion);
    NewValue value;
    value.type = TypeOf(options, reader.IsTyped() ? kStateType : kDefaultType);
    const bool isFile = options.file || (!options.as && options.value->starts_with("@"));
    const bool isJsonFile = isFile && options.as == "json";
    if (isFile && options.as && !isJsonFile)
        throw Error(ErrorKind::Usage, "a file's bytes are taken as they are")
            .Try("leave --as out, or --as json");
    if (isFile) value.bytes = FileBytes(context, options.file ? *options.file : options.value->substr(1));
    if (isJsonFile)
        value.bytes = reader.As("json", std::string(AsText(value.bytes)));
    else if (!isFile)
        value.bytes = options.as ? reader.As(*options.as, *options.value) : reader.Guess(*options.value);
    if (value.bytes.empty())
        throw Error(ErrorKind::Usage, "the value is empty")
            .Try("the module keeps no empty values: use clear");
    return value;
}

std::vector<std::uint8_t> PortDataOf(Context &context) {
    const Options &options = context.options;
    json::object port;
    if (options.file) {
        Buffer contents = FileBytes(context, *options.file);
        if (!StartsLikeJson(contents)) {
            if (options.kind)
                throw Error(ErrorKind::Usage, "--kind does not go with serialized data")
                    .Try("the data carries it");
            return SerializedList(*options.file, std::move(contents));
        }
        port = ParseJson(AsText(contents)).as_object();
    }
    if (options.kind) port["kind"] = *options.kind;
    return PortFromJson(std::move(port));
}

} // namespace dvs::ctl
