/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_ORACLE_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_ORACLE_H

// A general JSON Schema validator over the schema file: the judge of imports, and the oracle that the
// compiled check (judge.cpp) is tested against.

#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace configstore {

enum class Strictness {
    Store,  // what Set enforces: types, ranges, byte limits
    Import, // and enumerations, patterns, counts and unknown members
};

struct Finding {
    std::string path;
    std::string what;
};

class Oracle {
public:
    Oracle(std::string_view schema, Strictness strictness);
    ~Oracle();
    Oracle(const Oracle &) = delete;
    Oracle &operator=(const Oracle &) = delete;
    /// False when the document breaks the schema, or is not JSON; `findings` may be null.
    [[nodiscard]] bool Accepts(std::string_view document, std::vector<Finding> *findings) const;

private:
    struct Impl;
    std::unique_ptr<Impl> impl_;
};

} // namespace configstore

#endif
