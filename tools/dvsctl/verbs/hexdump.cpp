/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl hexdump`: every byte of a state with what it is, nested buffers inside their entries. Goes on
// behind a fault as far as the bytes can be told apart, and says where the faults are.

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "form/json/codec.h"
#include "form/value.h"
#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/sources/source.h"
#include "tools/dvsctl/verbs/filter.h"
#include "tools/dvsctl/verbs/hexdump.h"

namespace dvs::ctl {

namespace {

constexpr std::size_t kLineBytes = 16;
constexpr std::size_t kHexWidth = kLineBytes * 3 - 1;

class TextWriter : public RangeWriter {
public:
    explicit TextWriter(Output &out) : out_(out) {}

    void Range(const ByteRange &range) override {
        const std::string indent(range.depth * 2, ' ');
        for (std::size_t at = 0; at < range.bytes.size() || at == 0;) {
            const Bytes rest = range.bytes.subspan(at);
            const std::size_t zeros = ZeroLines(rest);
            const Bytes line = rest.first(std::min(kLineBytes, rest.size()));
            const std::string what = at == 0 ? indent + range.what : "";
            if (at > 0 && zeros > kLineBytes) {
                out_.Write(fmt::format("*         {} zero bytes\n", zeros));
                at += zeros;
                continue;
            }
            const std::string bytes =
                fmt::format("{:<{}}  |{:<{}}|", Hex(line), kHexWidth, Characters(line), kLineBytes);
            std::string text =
                out_.Paint(Style::Dim, fmt::format("{:08x}", range.offset + at)) + "  " + bytes;
            if (!what.empty()) text += "  " + out_.Paint(range.isWrong ? Style::Bad : Style::Plain, what);
            out_.Write(text + "\n");
            at += std::max<std::size_t>(line.size(), 1);
        }
    }

    void Fault(std::size_t depth, const std::string &text) override {
        out_.Write(std::string(10 + kHexWidth + 4 + kLineBytes + 2 + depth * 2, ' ') +
                   out_.Paint(Style::Bad, "!! " + text) + "\n");
    }

private:
    // Bytes of the whole lines of zeros that follow.
    static std::size_t ZeroLines(Bytes bytes) {
        std::size_t zeros = 0;
        while (zeros < bytes.size() && bytes[zeros] == 0)
            ++zeros;
        return zeros == bytes.size() ? zeros : zeros / kLineBytes * kLineBytes;
    }

    static std::string Characters(Bytes bytes) {
        std::string text;
        for (const std::uint8_t byte : bytes)
            text += byte >= 0x20 && byte < 0x7f ? static_cast<char>(byte) : '.';
        return text;
    }

    Output &out_;
};

class JsonWriter : public RangeWriter {
public:
    void Range(const ByteRange &range) override {
        boost::json::object object;
        object["offset"] = range.offset;
        object["size"] = range.bytes.size();
        object["depth"] = range.depth;
        object["what"] = range.what;
        object["bytes"] = ToHexDigits(range.bytes);
        if (range.isWrong) object["is_wrong"] = true;
        ranges.emplace_back(std::move(object));
    }
    void Fault(std::size_t, const std::string &) override {}

    boost::json::array ranges;
};

// The walk knows ids only; an alias is what nothing has as its id.
DumpFilter ResolveAliases(const Options &options, Bytes bytes) {
    DumpFilter filter{options.switchId, options.portId};
    Options lenient;
    lenient.switchId = options.switchId;
    lenient.portId = options.portId;
    lenient.ifExists = true;
    State state = ParseState(bytes);
    ApplyFilter(lenient, "", state);
    if (state.switches.empty()) return filter;
    const Switch &sw = state.switches.front();
    if (filter.switchId) filter.switchId = sw.name;
    if (filter.portId && !sw.entries.empty()) filter.portId = sw.entries.front().name;
    return filter;
}

} // namespace

Exit RunHexdump(Context &context) {
    const Options &options = context.options;
    const auto source = OpenSource(options.source);
    const StateBytes read = ReadState(context, *source, ReadMode::Tolerant);
    const state::StateVerdict verdict = state::VerifyState(read.bytes);
    const bool damaged = verdict.first || !read.complaint.empty();
    const DumpFilter filter = ResolveAliases(options, read.bytes);
    bool found;
    if (options.json) {
        JsonWriter writer;
        found = DumpState(read.bytes, filter, writer);
        boost::json::object document = Envelope("hexdump");
        document["source"] = ValidUtf8(source->Name());
        document["ranges"] = std::move(writer.ranges);
        if (verdict.first)
            document["error"] = ErrorJson(DamageError(*source, verdict), Exit::Malformed);
        else if (damaged)
            document["error"] = ErrorJson(Error(ErrorKind::Malformed, read.complaint), Exit::Malformed);
        if (found) context.out.Json(std::move(document));
    } else {
        TextWriter writer(context.out);
        found = DumpState(read.bytes, filter, writer);
        if (damaged) {
            context.out.Write(fmt::format(
                "damaged: {}\n", Escape(verdict.first ? ShowFault(verdict.located) : read.complaint)));
            if (verdict.first)
                context.out.Write(fmt::format(
                    "  at:    {}byte offset {} (0x{:x})\n",
                    verdict.located.path.depth > 0 ? Escape(ShowPath(verdict.located.path)) + ", " : "",
                    verdict.located.offset, verdict.located.offset));
        }
    }
    if (!found && !options.ifExists)
        throw Error(ErrorKind::NotThere, "there is no such switch or port to dump")
            .In(source->Name())
            .Try("dvsctl show " + source->Name() + " lists what there is");
    return damaged ? Exit::Malformed : Exit::Done;
}

} // namespace dvs::ctl
