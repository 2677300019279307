/* SPDX-License-Identifier: Apache-2.0 */
// Hostile values for every row of the tables: any length, any bytes, wrong counts and indexes, unterminated
// texts. Each lies in a block of exactly its size, so that sanitizers report any overread. Also hostile
// documents, in a store without limits. DVS_HOSTILE_VALUES sets the number of each.

#include <cstdlib>

#include "configstore/converters/converter_fixture.h"
#include "configstore/converters/table.h"
#include "configstore/layouts/registry.h"
#include "configstore/layouts/value_generator.h"
#include "configstore/typed/typed_value.h"

using namespace converter_test;
using dvs::ConverterType;
using dvs::layout::Form;
using dvs::layout::StoreField;

namespace {

constexpr const char *kSwitches[] = {"etherswitch", "vswitch", "cswitch"};

long Count(long otherwise) {
    const char *text = std::getenv("DVS_HOSTILE_VALUES");
    return text ? std::atol(text) : otherwise;
}

struct Row {
    uint32_t propClass;
    const DVSProp2ConfigEntry *entry;
};

std::vector<Row> Rows() {
    std::vector<Row> rows;
    for (const uint32_t propClass : {kGlobal, kHost, kPort}) {
        for (const auto *row = GetConfigMap(static_cast<int>(propClass)); row->key; ++row)
            rows.push_back({propClass, row});
    }
    return rows;
}

struct Hostile : ConverterTest {
    Hostile() { dvsconfigstore_debug = -1; }
    ~Hostile() override { dvsconfigstore_debug = 10; }

    void Renew(const char *className, bool wide) {
        fake_store::Reset(); // the double records all its calls
        configstore::DestroyObject(object);
        ASSERT_EQ(0, configstore::CreateObject("switches", "network_vds", "qel", "id", "{}", &object));
        BecomeSwitch(className, "7.0.3", wide);
    }

    // Saves, and describes, and loads what got into the store.
    void Try(const Row &row, const std::vector<uint8_t> &value) {
        const int32_t status = Save(row.propClass, row.entry->key, value);
        // The store rejects invalid texts, and an instance with an empty id among others.
        ASSERT_TRUE(status == 0 || status == -1 || status == configstore::BAD_PARAMETER ||
                    status == configstore::SCHEMA_VIOLATION)
            << row.entry->key << status;
        (void)dvs::typed::Describe(row.propClass, row.entry->key, value, {dvsWidePortRecords ? 100u : 9u});
        // Filters with texts too long for their fields end the process when they are loaded: the one stated
        // exception.
        if (dvs::ConverterTypeOf(*row.entry) == ConverterType::kFilters) {
            (void)configstore::DeleteSubObject(Sub("settings"), "filter_policy", "");
            return;
        }
        (void)Load(row.propClass);
    }

    value_generator::Generator generator{7041776};
};

TEST_F(Hostile, ValuesOfAnyLengthAndBytesStayInBounds) {
    for (const Row &row : Rows()) {
        const auto *record = dvs::layout::FindType(dvs::ConverterTypeOf(*row.entry))->record;
        std::vector<std::size_t> sizes;
        for (std::size_t size = 0; size <= 300; ++size)
            sizes.push_back(size);
        for (const std::size_t size : value_generator::SizesOf(*record)) {
            for (std::size_t near = size < 4 ? 0 : size - 4; near <= size + 4; ++near) {
                if (near > 300) sizes.push_back(near);
            }
        }
        for (const std::size_t size : sizes) {
            Renew(kSwitches[size % 3], size % 2 != 0);
            if (generator.OneIn(8)) Try(row, std::vector<uint8_t>(size, generator.OneIn(2) ? 0 : 0xff));
            Try(row, generator.Noise(size));
            if (HasFatalFailure()) return;
        }
    }
}

TEST_F(Hostile, ValuesWithWrongCountsStayInBounds) {
    const auto rows = Rows();
    for (long i = Count(6000); i > 0; --i) {
        const Row &row = rows[generator.Below(rows.size())];
        const bool wide = generator.OneIn(2);
        if (generator.OneIn(4)) Renew(kSwitches[generator.Below(3)], wide);
        const auto *info = dvs::layout::FindType(dvs::ConverterTypeOf(*row.entry));
        Try(row, generator.Lying(dvsWidePortRecords ? *info->wide : *info->record));
        if (HasFatalFailure()) return;
    }
}

// --- Documents ---

struct HostileDocument : Hostile {
    // The longest texts by type; for filters, the longest that does not abort the process.
    std::string Text(const StoreField &form, ConverterType type) {
        if (form.domain && !generator.OneIn(4)) {
            const char *text = form.domain->texts[generator.Below(form.domain->textCount)];
            if (text) return text;
        }
        const bool isFatal = type == ConverterType::kFilters && form.maxText != 0;
        return generator.Text(isFatal ? form.maxText : generator.OneIn(8) ? 5000 : 300);
    }

    void Member(configstore::Object *parent, const StoreField &form, const char *name, ConverterType type) {
        if (generator.OneIn(8)) return;
        if (generator.OneIn(20)) { // not what a reader expects
            (void)configstore::SetValueInt(parent, name, -1);
            return;
        }
        const auto number = generator.OneIn(2) ? generator.Below(UINT64_MAX) : generator.Below(300);
        switch (form.form) {
        case Form::kBool:
            (void)configstore::SetValueBool(parent, name, generator.OneIn(2));
            break;
        case Form::kText:
            (void)configstore::SetValueStr(parent, name, Text(form, type).c_str());
            break;
        case Form::kTexts:
            (void)configstore::SetValueEmptyList(parent, name);
            for (uint64_t n = generator.Below(generator.OneIn(8) ? 60 : 4); n; --n) {
                (void)configstore::AppendValueString(parent, name, Text(form, type).c_str());
            }
            break;
        case Form::kObject: {
            configstore::Object *sub = nullptr;
            if (GetOrCreateSubObject(true, parent, name, nullptr, &sub)) break;
            for (const StoreField &member : form.members)
                Member(sub, member, member.name, type);
            break;
        }
        case Form::kInstances:
            for (uint64_t n = generator.Below(4); n; --n) {
                configstore::Object *sub = nullptr;
                if (GetOrCreateSubObject(true, parent, name, std::to_string(n).c_str(), &sub)) break;
                for (const StoreField &member : form.members)
                    Member(sub, member, member.name, type);
            }
            break;
        case Form::kInts:
        case Form::kNone:
            break;
        default:
            (void)configstore::SetValueLong(parent, name, static_cast<int64_t>(number));
        }
    }
};

TEST_F(HostileDocument, LoadersStayInBounds) {
    const auto rows = Rows();
    long loaded = 0;
    for (long i = Count(6000); i > 0; --i) {
        const Row &row = rows[generator.Below(rows.size())];
        Renew(kSwitches[generator.Below(3)], generator.OneIn(2));
        configstore::Object *parent = nullptr;
        ASSERT_EQ(0, GetSubObjectByPath(row.entry->path, row.entry->depth, object, &parent, true));
        const ConverterType type = dvs::ConverterTypeOf(*row.entry);
        const auto *form =
            dvs::layout::FindType(type == ConverterType::kPortPools ? ConverterType::kTrafficResources : type)
                ->form;
        Member(parent, *form, row.entry->path[row.entry->depth - 1], type);
        const Properties properties =
            Load(row.propClass, row.propClass == kPort ? Sub("resource_management") : nullptr);
        loaded += properties.contains(row.entry->key);
    }
    EXPECT_GT(loaded, 0);
}

} // namespace
