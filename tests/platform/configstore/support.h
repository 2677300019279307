/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_PLATFORM_CONFIGSTORE_SUPPORT_H
#define TESTS_PLATFORM_CONFIGSTORE_SUPPORT_H

// Helpers of the config store's tests: owners for the client interface's handles, a store in the test's own
// directory or in memory, and the host's log.

#include <cstdint>
#include <iosfwd>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "platform/configstore.h"
#include "platform/embedded/configstore/admin.h"

namespace store_test {

inline constexpr const char *kKey = "switches";
inline constexpr const char *kGroup = "network_vds";
inline constexpr const char *kComponent = "qel";

struct ObjectFree {
    void operator()(configstore::Object *object) const { configstore::DestroyObject(object); }
};
using ObjectPtr = std::unique_ptr<configstore::Object, ObjectFree>;

struct StoreFree {
    void operator()(configstore::Store *store) const { configstore::DestroyStore(store); }
};
using StorePtr = std::unique_ptr<configstore::Store, StoreFree>;

struct SpecFree {
    void operator()(configstore::FilterSpec *spec) const { configstore::DestroyFilterSpecObject(spec); }
};
using SpecPtr = std::unique_ptr<configstore::FilterSpec, SpecFree>;

/// A switch object from a document; null, with a failed expectation, when it is rejected.
ObjectPtr NewSwitch(const std::string &json = "{}", const char *id = "sw1");
SpecPtr NewSpec(const char *key, const char *id = "");
/// The sub-object, created if absent; null, with a failed expectation, on failure.
configstore::Object *Sub(configstore::Object *parent, const char *name, const char *id = "");
/// The document that an object would be stored as.
std::string Json(const configstore::Object *object);
/// A text value, or the status in angle brackets.
std::string Text(configstore::Object *object, const char *name);
std::vector<std::string> Texts(configstore::Object *object, const char *name);
/// The ids of the objects that a filter spec finds; empty, with *status set, when it finds nothing.
std::vector<std::string> Ids(configstore::Object *object, const char *key, int32_t *status,
                             const char *id = "");
/// The current objects' ids, in the order of the listing.
std::vector<std::string> StoredIds(configstore::Store *store);

/// The lines written to the host's log since the last call.
std::string TakeHostLog();

/// The text of the store's last failure; empty if there is none.
std::string LastFailure(const configstore::Store *store);

/// A store in a file in the test's own directory, which the destructor removes.
class StoreTest : public testing::Test {
protected:
    void SetUp() override;
    void TearDown() override;
    /// Opens the store again; this must succeed.
    virtual StorePtr Open();
    /// Stores a switch in its own transaction; this must succeed.
    void Save(configstore::Store *store, const std::string &json, const char *id = "sw1",
              const char *source = "EXTERNAL");
    /// The stored document; empty when there is none.
    std::string Stored(configstore::Store *store, const char *id = "sw1");
    /// One number from the database, read over a separate connection.
    int64_t Number(const std::string &sql);
    void Run(const std::string &sql);

    std::string directory_;
    std::string path_;
};

enum class In { File, Memory };
void PrintTo(In in, std::ostream *out);

/// For tests that apply to every backend: a store in a file, or in memory.
class AnyStoreTest : public StoreTest, public testing::WithParamInterface<In> {
protected:
    StorePtr Open() override;

private:
    std::shared_ptr<configstore::MemoryDatabase> memory_ = configstore::NewMemoryDatabase();
};

std::string NameOf(const testing::TestParamInfo<In> &info);

} // namespace store_test

/// Runs the tests of a suite, which is an AnyStoreTest, over every backend.
#define RUN_OVER_EVERY_BACKEND(suite)                                                                        \
    INSTANTIATE_TEST_SUITE_P(, suite, testing::Values(store_test::In::File, store_test::In::Memory),         \
                             store_test::NameOf)

#endif
