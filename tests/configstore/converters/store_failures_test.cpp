/* SPDX-License-Identifier: Apache-2.0 */
// Every store call of every save and load failed in turn: the failure is the result, or the call is one whose
// result is stated not to matter. Nothing is leaked either way.

#include <algorithm>
#include <set>

#include "configstore/converters/common.h"
#include "configstore/converters/converter_fixture.h"
#include "configstore/converters/table.h"
#include "configstore/layouts/registry.h"
#include "configstore/layouts/value_generator.h"
#include "configstore/round_trip/values.h"

using namespace converter_test;

namespace {

constexpr int32_t kStaged = 777; // a status of nobody else

// Calls whose failure a converter swallows, or turns into -1. Columns: type, whether it is a save, function,
// result.
struct Exception {
    uint32_t type;
    bool isSave;
    const char *function;
    int32_t result;
};
constexpr Exception kExceptions[] = {
    // clang-format off
    {8,  true,  "GetSubObject",           -1}, // an object that cannot be had is the library's own failure
    {8,  true,  "CreateSubObject",        -1},
    {9,  true,  "SetValueBool",            0}, // normal traffic and legacy mode
    {9,  true,  "SetValueUint32",          0}, // sampling rate
    {13, true,  "SetValueEmptyList",       0},
    {17, true,  "GetSubObject",            0}, // the failure criteria
    {17, true,  "CreateSubObject",         0},
    {20, true,  "SetValueEmptyList",       0},
    {25, true,  "SetValueUint16",          0},
    {6,  false, "GetSubObject",           -1}, // of the version reader, as the next three
    {6,  false, "GetValueStr",            -1},
    {7,  false, "GetSubObject",           -1},
    {7,  false, "GetValueStr",            -1},
    {6,  false, "GetValueBool",            0}, // the overlay flag
    {7,  false, "GetValueBool",            0},
    {15, false, "GetValueBool",            0},
    {9,  false, "GetValueBool",            0}, // the overlay flag, the time stamps
    {9,  false, "GetSubObject",            0}, // the three port objects
    {9,  false, "GetSubObjectInstances",   0}, // counts of the size pass
    {9,  false, "CreateFilterSpecObject",  0},
    {9,  false, "GetValueStr",             0},
    {9,  false, "GetValueUint32",          0},
    {9,  false, "GetValueUint16",          0},
    {9,  false, "GetValueStringArray",     0},
    {10, false, "GetValueUint32",          0},
    {10, false, "GetValueUint16",          0},
    {10, false, "GetValueBool",            0},
    {10, false, "GetValueStr",             0},
    {11, false, "GetValueBool",            0},
    {11, false, "GetValueUint32",          0},
    {12, false, "GetSubObject",            0},
    {12, false, "GetValueStr",             0},
    {12, false, "GetValueInt",             0},
    {12, false, "GetValueUint32",          0},
    {14, false, "GetValueStringArray",     0},
    {16, false, "GetValueStr",             0},
    {17, false, "GetSubObject",            0},
    {17, false, "GetValueStr",             0},
    {17, false, "GetValueBool",            0},
    {17, false, "GetValueUint16",          0},
    {17, false, "GetValueStringArray",     0},
    {18, false, "GetSubObject",            0},
    {18, false, "GetValueStr",             0},
    {18, false, "GetValueBool",            0},
    {18, false, "GetValueUint16",          0},
    {18, false, "GetValueStringArray",     0},
    {24, false, "GetSubObject",            0},
    {24, false, "GetSubObjectInstances",   0},
    {24, false, "GetValueUint16",          0},
    {25, false, "GetSubObject",            0},
    {25, false, "GetSubObjectInstances",   0},
    {25, false, "GetValueUint16",          0},
    {26, false, "GetSubObject",            0},
    {26, false, "GetValueLong",            0},
    {27, false, "GetSubObject",            0},
    {27, false, "GetValueBool",            0},
    {28, false, "GetSubObject",            0},
    {28, false, "GetValueBool",            0},
    {29, false, "CreateFilterSpecObject",  0},
    {29, false, "GetSubObjectInstances",   0},
    {29, false, "GetValueStr",             0},
    {29, false, "GetValueStringArray",     0},
    {35, false, "GetSubObject",            0},
    // clang-format on
};

std::set<const Exception *> g_met;

bool IsStated(uint32_t type, bool isSave, const std::string &function, int32_t result) {
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
        // The private VLANs of the vswitch key need more than the class.
        BecomeSwitch(row.converterType == 7 ? "cswitch" : isVswitch ? "vswitch" : "etherswitch");
    }

    int32_t LoadRow(uint32_t propClass, const DVSProp2ConfigEntry &row) {
        configstore::Object *parent = nullptr;
        if (const int32_t status = GetSubObjectByPath(row.path, row.depth, object, &parent, false))
            return status;
        DVSData *list = nullptr;
        EXPECT_EQ(HYP_OK, DVSData_Alloc(
                              &list, [](uint64_t size) { return std::malloc(size); }, std::free));
        dvs::convert::KnownFilters filters;
        const int32_t status =
            dvs::convert::ConverterFor(row.converterType)
                ->load({object, parent, list, row.path[row.depth - 1], row.key, 16, propClass, &filters});
        DVSData_Free(list);
        return status;
    }

    // Runs with the first call failing, then the second and so on, until a run has no such call.
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
            EXPECT_TRUE(IsStated(row.converterType, isSave, function, status))
                << row.key << (isSave ? " save" : " load") << ", call " << call << " " << function << ": "
                << status;
        }
    }
};

TEST_F(StoreFailures, AreTheResultOrStatedNotToMatter) {
    value_generator::Generator generator(4);
    for (const uint32_t propClass : {kGlobal, kHost, kPort}) {
        for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row) {
            const auto *record = dvs::layout::RecordOf(propClass, row->key, false);
            if (!record) continue; // the DEFAULT rows have tests of their own
            for (int i = 0; i < 8; ++i) {
                auto value = generator.Sound(*record);
                if (row->converterType == 15) value = Bytes().U32(9);
                if (!round_trip::HasDistinctKeys(row->converterType, value)) continue;
                FailEach(*row, true, [&] { return Save(propClass, row->key, value); });
                Renew(*row);
                ASSERT_EQ(0, Save(propClass, row->key, value)) << row->key;
                FailEach(*row, false, [&] { return LoadRow(propClass, *row); });
            }
        }
    }
    for (const Exception &each : kExceptions) {
        EXPECT_TRUE(g_met.contains(&each))
            << each.type << " " << each.function << " is no exception any more";
    }
}

} // namespace
