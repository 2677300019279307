/* SPDX-License-Identifier: Apache-2.0 */
// The strict parser. The JSON library's own document builder keeps the last of several equal keys, silently;
// here its event parser drives the same builder through a handler that knows the path and refuses the second
// key.

#include "form/json/parse.h"

#include <algorithm>
#include <cctype>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include <boost/json/basic_parser_impl.hpp>
#include <boost/json/monotonic_resource.hpp>
#include <boost/json/value_stack.hpp>
#include <fmt/format.h>

#include "form/error.h"
#include "form/text.h"

namespace dvs::form {

namespace {

namespace json = boost::json;
using Code = json::error_code;
using View = json::string_view;

constexpr std::size_t kMostDepth = 32;

// An object's keys are looked through one by one until there are more than this.
constexpr std::size_t kFewKeys = 16;

// Hashes in one flat table: an object may have a key for each few bytes of its text.
class HashSet {
public:
    bool IsEmpty() const { return count_ == 0; }
    /// False when it is in already.
    bool Insert(std::size_t hash) {
        if (4 * (count_ + 1) > 3 * slots_.size()) Grow();
        std::size_t &slot = Find(hash | 1); // 0 is an empty slot
        if (slot) return false;
        slot = hash | 1;
        ++count_;
        return true;
    }

private:
    std::size_t &Find(std::size_t value) {
        const std::size_t mask = slots_.size() - 1;
        std::size_t at = (value >> 1) & mask;
        while (slots_[at] && slots_[at] != value)
            at = (at + 1) & mask;
        return slots_[at];
    }
    void Grow() {
        std::vector<std::size_t> old(slots_.empty() ? 64 : 2 * slots_.size());
        old.swap(slots_);
        for (const std::size_t value : old)
            if (value) Find(value) = value;
    }

    std::vector<std::size_t> slots_; // a power of two of them
    std::size_t count_ = 0;
};

class Handler {
public:
    // Limits the event parser asks for; depth is its own option.
    static constexpr std::size_t max_object_size = SIZE_MAX;
    static constexpr std::size_t max_array_size = SIZE_MAX;
    static constexpr std::size_t max_key_size = SIZE_MAX;
    static constexpr std::size_t max_string_size = SIZE_MAX;

    /// Without `keeps`, there is no document in the end.
    explicit Handler(bool keeps) : keeps_(keeps) {}

    bool on_document_begin(Code &) {
        if (keeps_) stack_.reset(json::make_shared_resource<json::monotonic_resource>());
        return true;
    }
    bool on_document_end(Code &) { return true; }

    bool on_object_begin(Code &) {
        isObject_ = isObject_ || levels_.empty();
        levels_.emplace_back();
        levels_.back().isObject = true;
        return true;
    }
    bool on_object_end(std::size_t count, Code &) {
        if (keeps_) stack_.push_object(count);
        return Leave();
    }
    bool on_array_begin(Code &) {
        levels_.emplace_back();
        return true;
    }
    bool on_array_end(std::size_t count, Code &) {
        if (keeps_) stack_.push_array(count);
        return Leave();
    }

    bool on_key_part(View part, std::size_t, Code &) {
        key_.append(part.data(), part.size());
        if (keeps_) stack_.push_chars(part);
        return true;
    }
    bool on_key(View part, std::size_t, Code &code) {
        key_.append(part.data(), part.size());
        if (keeps_) stack_.push_key(part);
        const bool isNew = levels_.back().AddKey(std::move(key_));
        key_.clear();
        if (!isNew) {
            why_ = "the key stands there twice";
            code = json::make_error_code(json::error::syntax);
        }
        return isNew;
    }

    bool on_string_part(View part, std::size_t, Code &) {
        if (keeps_) stack_.push_chars(part);
        return true;
    }
    bool on_string(View part, std::size_t, Code &) {
        if (keeps_) stack_.push_string(part);
        return Done();
    }
    bool on_number_part(View, Code &) { return true; }
    bool on_int64(std::int64_t value, View, Code &) {
        if (keeps_) stack_.push_int64(value);
        return Done();
    }
    bool on_uint64(std::uint64_t value, View, Code &) {
        if (keeps_) stack_.push_uint64(value);
        return Done();
    }
    bool on_double(double value, View, Code &) {
        if (keeps_) stack_.push_double(value);
        return Done();
    }
    bool on_bool(bool value, Code &) {
        if (keeps_) stack_.push_bool(value);
        return Done();
    }
    bool on_null(Code &) {
        if (keeps_) stack_.push_null();
        return Done();
    }
    bool on_comment_part(View, Code &) { return true; }
    bool on_comment(View, Code &) { return true; }

    json::value Take() { return stack_.release(); }
    bool IsObject() const { return isObject_; }

    /// The reason of a refusal of this handler's own; empty when it was the parser's.
    const std::string &Why() const { return why_; }

    /// Where the parser is.
    std::string Path() const {
        std::string path = "$";
        for (const Level &level : levels_)
            path += !level.isObject ? fmt::format("[{}]", level.count) : level.key ? "." + *level.key : "";
        return path;
    }

private:
    struct Level {
        bool isObject = false;
        std::size_t count = 0;          // elements that are complete
        std::optional<std::string> key; // of the current member
        std::vector<std::size_t> few;   // hashes of all keys, or, once there are many,
        HashSet many;

        // A hash is enough to tell keys apart by: that two have the same takes someone who means it to.
        bool AddKey(std::string &&name) {
            const std::size_t hash = std::hash<std::string>()(name);
            key = std::move(name);
            if (few.size() == kFewKeys) {
                if (many.IsEmpty())
                    for (const std::size_t earlier : few)
                        (void)many.Insert(earlier);
                return many.Insert(hash);
            }
            if (std::find(few.begin(), few.end(), hash) != few.end()) return false;
            few.push_back(hash);
            return true;
        }
    };

    bool Done() {
        if (!levels_.empty()) ++levels_.back().count;
        return true;
    }
    bool Leave() {
        levels_.pop_back();
        return Done();
    }

    const bool keeps_;
    bool isObject_ = false;
    json::value_stack stack_;
    std::vector<Level> levels_;
    std::string key_;
    std::string why_;
};

std::string LineAndColumn(std::string_view text, std::size_t offset) {
    const std::string_view before = text.substr(0, offset);
    const auto line = std::count(before.begin(), before.end(), '\n') + 1;
    const std::size_t lineStart = before.rfind('\n') + 1; // 0 when there is none
    return fmt::format("line {}, column {}", line, offset - lineStart + 1);
}

[[noreturn]] void Refuse(std::string_view text, std::size_t offset, const std::string &path,
                         std::string why) {
    throw Error(ErrorKind::Malformed, "the JSON document is malformed")
        .At(fmt::format("{}, {}", path, LineAndColumn(text, offset)))
        .Offset(offset)
        .Because(std::move(why))
        .Try("correct the document there; nothing was changed");
}

// Whether the bytes there begin a character: the library calls it a syntax error when they do not.
bool IsCharacterAt(std::string_view text, std::size_t offset) {
    return offset >= text.size() || DecodeUtf8(text, &offset).has_value();
}

using Parser = json::basic_parser<Handler>;

json::parse_options Strict() {
    json::parse_options options;
    options.max_depth = kMostDepth;
    return options;
}

void Run(Parser &parser, std::string_view text) {
    Code code;
    const std::size_t used = parser.write_some(false, text.data(), text.size(), code);
    if (code) {
        const Handler &handler = parser.handler();
        const std::string why = !handler.Why().empty() ? handler.Why()
                                : code == json::error::too_deep
                                    ? fmt::format("more than {} levels deep", kMostDepth)
                                : text.find_first_not_of(" \t\r\n") == std::string_view::npos ? "it is empty"
                                : !IsCharacterAt(text, used) ? "it is not UTF-8"
                                                             : code.message();
        Refuse(text, used, handler.Path(), why);
    }
    const std::size_t rest = text.find_first_not_of(" \t\r\n", used);
    if (rest != std::string_view::npos) Refuse(text, rest, "$", "there is more behind the document");
}

} // namespace

json::value ParseJson(std::string_view text) {
    Parser parser(Strict(), true);
    Run(parser, text);
    return parser.handler().Take();
}

bool IsJsonObject(std::string_view text) {
    Parser parser(Strict(), false);
    Run(parser, text);
    return parser.handler().IsObject();
}

} // namespace dvs::form
