/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_PLATFORM_CONFIGSTORE_SUPPORT_H
#define TESTS_PLATFORM_CONFIGSTORE_SUPPORT_H

// What the config store's tests share: owners for the client interface's handles, a directory of one's own,
// and a store in it.

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "platform/configstore.h"

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

/// A switch object from a document; null, with a failed expectation, when it is refused.
ObjectPtr NewSwitch(const std::string &json = "{}", const char *id = "sw1");
SpecPtr NewSpec(const char *key, const char *id = "");
/// The sub-object, made if it has to be; null, with a failed expectation, when it cannot.
configstore::Object *Sub(configstore::Object *parent, const char *name, const char *id = "");
/// The document that an object would be stored as.
std::string Json(const configstore::Object *object);
/// A text value, or a note of the status in angle brackets.
std::string Text(configstore::Object *object, const char *name);
std::vector<std::string> Texts(configstore::Object *object, const char *name);
/// The ids of what a filter spec finds; empty, with *status set, when it finds nothing.
std::vector<std::string> Ids(configstore::Object *object, const char *key, int32_t *status,
                             const char *id = "");
/// The current objects' ids, in the order of the listing.
std::vector<std::string> StoredIds(configstore::Store *store);

/// A directory of the test's own, removed with what is in it, and DVS_CONFIGSTORE pointing into it.
class StoreTest : public testing::Test {
protected:
    void SetUp() override;
    void TearDown() override;
    /// Opens the store, expecting that it can be.
    StorePtr Open();
    /// Stores a switch in a transaction of its own, expecting that it can be.
    void Save(configstore::Store *store, const std::string &json, const char *id = "sw1",
              const char *source = "EXTERNAL");
    /// The stored document; empty when there is none.
    std::string Stored(configstore::Store *store, const char *id = "sw1");
    /// One number from the database, read with a connection of the test's own.
    int64_t Number(const std::string &sql);
    void Run(const std::string &sql);

    std::string directory_;
    std::string path_;
};

} // namespace store_test

#endif
