/* SPDX-License-Identifier: Apache-2.0 */
// Fails every store call of every save and load in turn. The failure must be the result, unless the call's
// result is documented as ignored. Nothing may leak either way.

#include <algorithm>
#include <set>

#include "configstore/converters/common.h"
#include "configstore/converters/converter_fixture.h"
#include "configstore/converters/table.h"
#include "configstore/layouts/registry.h"
#include "configstore/layouts/value_generator.h"
#include "configstore/round_trip/values.h"
#include "dvsdata/growing_image.h"

using namespace converter_test;

namespace {

using dvs::ConverterType;
using dvs::ConverterTypeOf;
using enum ConverterType;

constexpr int32_t kStaged = 777; // a status that no other code returns

// Calls whose failure a converter ignores or maps to -1. Columns: type, whether it is a save, function,
// result.
struct Exception {
    ConverterType type;
    bool isSave;
    const char *function;
    int32_t result;
};
constexpr Exception kExceptions[] = {
    // clang-format off
    {kLinkDiscovery,         true,  "GetSubObject",           -1}, // a missing object is the library's own failure
    {kLinkDiscovery,         true,  "CreateSubObject",        -1},
    {kMirrorSessions,        true,  "SetValueBool",            0}, // normal traffic and legacy mode
    {kMirrorSessions,        true,  "SetValueUint32",          0}, // sampling rate
    {kPoolKeys,              true,  "SetValueEmptyList",       0},
    {kEtherswitchTeaming,    true,  "GetSubObject",            0}, // the failure criteria
    {kEtherswitchTeaming,    true,  "CreateSubObject",         0},
    {kUplinkNames,           true,  "SetValueEmptyList",       0},
    {kVswitchPortVlan,       true,  "SetValueUint16",          0},
    {kEtherswitchPrivateVlans,false, "GetSubObject",           -1}, // the version reader's, like the next three
    {kEtherswitchPrivateVlans,false, "GetValueStr",            -1},
    {kVswitchPrivateVlans,   false, "GetSubObject",           -1},
    {kVswitchPrivateVlans,   false, "GetValueStr",            -1},
    {kEtherswitchPrivateVlans,false, "GetValueBool",            0}, // the overlay flag
    {kVswitchPrivateVlans,   false, "GetValueBool",            0},
    {kSwitchVersion,         false, "GetValueBool",            0},
    {kMirrorSessions,        false, "GetValueBool",            0}, // the overlay flag, the time stamps
    {kMirrorSessions,        false, "GetSubObject",            0}, // the three port objects
    {kMirrorSessions,        false, "GetSubObjectInstances",   0}, // counts of the size pass
    {kMirrorSessions,        false, "CreateFilterSpecObject",  0},
    {kMirrorSessions,        false, "GetValueStr",             0},
    {kMirrorSessions,        false, "GetValueUint32",          0},
    {kMirrorSessions,        false, "GetValueUint16",          0},
    {kMirrorSessions,        false, "GetValueStringArray",     0},
    {kIpfix,                 false, "GetValueUint32",          0},
    {kIpfix,                 false, "GetValueUint16",          0},
    {kIpfix,                 false, "GetValueBool",            0},
    {kIpfix,                 false, "GetValueStr",             0},
    {kHealthCheck,           false, "GetValueBool",            0},
    {kHealthCheck,           false, "GetValueUint32",          0},
    {kTrafficResources,      false, "GetSubObject",            0},
    {kTrafficResources,      false, "GetValueStr",             0},
    {kTrafficResources,      false, "GetValueInt",             0},
    {kTrafficResources,      false, "GetValueUint32",          0},
    {kUplinkKeys,            false, "GetValueStringArray",     0},
    {kLacpGroups,            false, "GetValueStr",             0},
    {kEtherswitchTeaming,    false, "GetSubObject",            0},
    {kEtherswitchTeaming,    false, "GetValueStr",             0},
    {kEtherswitchTeaming,    false, "GetValueBool",            0},
    {kEtherswitchTeaming,    false, "GetValueUint16",          0},
    {kEtherswitchTeaming,    false, "GetValueStringArray",     0},
    {kVswitchTeaming,        false, "GetSubObject",            0},
    {kVswitchTeaming,        false, "GetValueStr",             0},
    {kVswitchTeaming,        false, "GetValueBool",            0},
    {kVswitchTeaming,        false, "GetValueUint16",          0},
    {kVswitchTeaming,        false, "GetValueStringArray",     0},
    {kEtherswitchPortVlan,   false, "GetSubObject",            0},
    {kEtherswitchPortVlan,   false, "GetSubObjectInstances",   0},
    {kEtherswitchPortVlan,   false, "GetValueUint16",          0},
    {kVswitchPortVlan,       false, "GetSubObject",            0},
    {kVswitchPortVlan,       false, "GetSubObjectInstances",   0},
    {kVswitchPortVlan,       false, "GetValueUint16",          0},
    {kShaping,               false, "GetSubObject",            0},
    {kShaping,               false, "GetValueLong",            0},
    {kEtherswitchMacSecurity,false, "GetSubObject",            0},
    {kEtherswitchMacSecurity,false, "GetValueBool",            0},
    {kVswitchMacSecurity,    false, "GetSubObject",            0},
    {kVswitchMacSecurity,    false, "GetValueBool",            0},
    {kFilters,               false, "CreateFilterSpecObject",  0},
    {kFilters,               false, "GetSubObjectInstances",   0},
    {kFilters,               false, "GetValueStr",             0},
    {kFilters,               false, "GetValueStringArray",     0},
    {kPortLacp,              false, "GetSubObject",            0},
    // clang-format on
};

std::set<const Exception *> g_met;

bool IsStated(ConverterType type, bool isSave, const std::string &function, int32_t result) {
    const auto *found =
        std::find_if(std::begin(kExceptions), std::end(kExceptions), [&](const Exception &each) {
            return each.type == type && each.isSave == isSave && function == each.function &&
                   result == each.result;
        });
    g_met.insert(found);
    return found != std::end(kExceptions);
}

struct StoreFailures : ConverterTest {
    StoreFailures() { dvsconfigstore_debug = -1; }
    ~StoreFailures() override { dvsconfigstore_debug = 10; }

    void Renew(const DVSProp2ConfigEntry &row) {
        configstore::DestroyObject(object);
        ASSERT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", "id", "{}", &object));
        const bool isVswitch = std::string(row.key).find(".vswitch.") != std::string::npos;
        // The private VLANs of the vswitch key need more members than the class.
        BecomeSwitch(ConverterTypeOf(row) == kVswitchPrivateVlans ? "cswitch"
                     : isVswitch                                  ? "vswitch"
                                                                  : "etherswitch");
    }

    int32_t LoadRow(uint32_t propClass, const DVSProp2ConfigEntry &row) {
        configstore::Object *parent = nullptr;
        if (const int32_t status = GetSubObjectByPath(row.path, row.depth, object, &parent, false))
            return status;
        dvs::data::GrowingImage list;
        EXPECT_EQ(HYP_OK, list.BeginBuffer());
        dvs::convert::KnownFilters filters;
        const dvs::convert::Context context = {.switchClass = dvsSwitchClass, .filters = &filters};
        return dvs::convert::ConverterFor(ConverterTypeOf(row))
            ->load({context, object, parent, &list, row.path[row.depth - 1], row.key, 16, propClass});
    }

    // Fails the first call, then the second and so on, until a run has no such call.
    template <typename Run> void FailEach(const DVSProp2ConfigEntry &row, bool isSave, Run run) {
        for (int call = 1;; ++call) {
            if (isSave) Renew(row);
            const int before = fake_store::Calls();
            fake_store::FailCall(call, kStaged);
            const int32_t status = run();
            const bool failed = fake_store::Failed();
            fake_store::FailCall(0);
            if (!failed) return;
            if (status == kStaged) continue;
            const std::string function = fake_store::CallName(before + call);
            EXPECT_TRUE(IsStated(ConverterTypeOf(row), isSave, function, status))
                << row.key << (isSave ? " save" : " load") << ", call " << call << " " << function << ": "
                << status;
        }
    }
};

TEST_F(StoreFailures, AreReturnedOrDocumentedAsIgnored) {
    value_generator::Generator generator(4);
    for (const uint32_t propClass : {kGlobal, kHost, kPort}) {
        for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
            const auto *record = dvs::layout::RecordOf(propClass, row->key, false);
            if (!record) continue; // unmapped_test.cpp covers the DEFAULT rows
            for (int i = 0; i < 8; ++i) {
                auto value = generator.Sound(*record);
                if (ConverterTypeOf(*row) == kSwitchVersion) value = Bytes().U32(9);
                if (!round_trip::HasDistinctKeys(ConverterTypeOf(*row), value)) continue;
                FailEach(*row, true, [&] { return Save(propClass, row->key, value); });
                Renew(*row);
                ASSERT_EQ(0, Save(propClass, row->key, value)) << row->key;
                FailEach(*row, false, [&] { return LoadRow(propClass, *row); });
            }
        }
    }
    for (const Exception &each : kExceptions) {
        EXPECT_TRUE(g_met.contains(&each))
            << static_cast<uint32_t>(each.type) << " " << each.function << " is no longer an exception";
    }
}

} // namespace
