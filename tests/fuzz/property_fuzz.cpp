/* SPDX-License-Identifier: Apache-2.0 */
// Fuzz target of the converters: saves a property's bytes into an object, loads them again and describes
// them. The first three bytes select the property and the kind of switch; the rest is the value. Mutations
// follow the property's record, so that the fuzzer need not guess counts and offsets.
//
//     cmake --preset clang -DDVS_BUILD_FUZZERS=ON && cmake --build --preset clang --target property_fuzz
//     build/clang/bin/property_fuzz -max_total_time=300 -max_len=8192

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <vector>

#include "configstore/fake_store.h"
#include "configstore/layouts/registry.h"
#include "configstore/layouts/value_generator.h"
#include "configstore/maps/prop_frame.h"
#include "configstore/typed/typed_value.h"

extern "C" std::size_t LLVMFuzzerMutate(std::uint8_t *data, std::size_t size, std::size_t maxSize);

namespace {

constexpr std::size_t kHeadSize = 3; // class, row, switch

struct Choice {
    std::uint32_t propClass;
    const DVSProp2ConfigEntry *row;
    bool wide;
};

Choice Choose(const std::uint8_t *data) {
    Choice choice = {data[0] % 3u, nullptr, (data[2] & 4) != 0};
    const auto *rows = GetConfigMap(static_cast<int>(choice.propClass));
    std::size_t count = 0;
    while (rows[count].key)
        ++count;
    choice.row = rows + data[1] % count;
    dvsSwitchClass = data[2] % 3u;
    dvsWidePortRecords = choice.wide;
    return choice;
}

void *Allocate(std::uint64_t size) {
    return std::malloc(size);
}

// Both directions over a fresh object. A filter whose texts do not fit aborts the process on load by design.
void Convert(const Choice &choice, const std::uint8_t *value, std::size_t size) {
    configstore::Object *object = nullptr;
    if (configstore::CreateObject("switches", "network_vds", "qel", "fuzz", "{}", &object)) std::abort();
    configstore::Object *product = nullptr;
    if (configstore::CreateSubObject(object, "product", "", &product)) std::abort();
    (void)configstore::SetValueStr(product, "forwarding_class", dvsSwitchClass == 2 ? "cswitch" : "other");
    (void)configstore::SetValueStr(product, "version", choice.wide ? "OVL 1.0" : "7.0.3");
    (void)SaveProp(object, choice.row->key, value, static_cast<std::uint32_t>(size), choice.propClass, 0x20);
    if (dvs::ConverterTypeOf(*choice.row) != dvs::ConverterType::kFilters) {
        DVSData *list = nullptr;
        if (DVSData_Alloc(&list, Allocate, std::free) != HYP_OK) std::abort();
        (void)LoadProps("props", object, list, choice.propClass, 9, nullptr);
        DVSData_Free(list);
    }
    configstore::DestroyObject(object);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    if (size < kHeadSize) return 0;
    dvsconfigstore_debug = -1;
    fake_store::Reset();
    const Choice choice = Choose(data);
    const std::vector<std::uint8_t> value(data + kHeadSize, data + size);
    Convert(choice, value.data(), value.size());
    const auto view =
        dvs::typed::Describe(choice.propClass, choice.row->key, value, {choice.wide ? 100u : 9u});
    if (view.exact) {
        const auto built =
            dvs::typed::Build(choice.propClass, choice.row->key, view.tree, {choice.wide ? 100u : 9u});
        if (built.ok && built.bytes != value) std::abort();
    }
    if (fake_store::OpenHandles() != 0) std::abort();
    return 0;
}

// Half of the mutations are the fuzzer's own; the others build a new value from the record, valid or damaged.
extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t *data, std::size_t size, std::size_t maxSize,
                                               unsigned seed) {
    if (seed % 2 || size < kHeadSize || maxSize < kHeadSize) return LLVMFuzzerMutate(data, size, maxSize);
    value_generator::Generator generator(seed);
    const Choice choice = Choose(data);
    const auto *info = dvs::layout::FindType(dvs::ConverterTypeOf(*choice.row));
    const auto &record = choice.wide ? *info->wide : *info->record;
    const auto value = generator.OneIn(3) ? generator.Sound(record) : generator.Lying(record);
    const std::size_t kept = std::min(value.size(), maxSize - kHeadSize);
    std::copy_n(value.begin(), kept, data + kHeadSize);
    return kHeadSize + kept;
}
