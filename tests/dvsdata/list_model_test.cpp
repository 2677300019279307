/* SPDX-License-Identifier: Apache-2.0 */
// Compares lists with the simplest model, a vector of properties: random sequences of operations must leave
// both equal, with the index in each of its forms and with failing allocations.

#include <gtest/gtest.h>
#include <rapidcheck.h>

#include <algorithm>
#include <string>

#include "dvsdata/list_support.h"

namespace dvs::test {
namespace {

struct Model {
    Props props;

    auto Find(const std::string &name) {
        return std::find_if(props.begin(), props.end(), [&](const Prop &prop) { return prop.name == name; });
    }
    void Update(const Prop &prop) {
        const auto found = Find(prop.name);
        const std::uint32_t effective = prop.type ? prop.type : 0x20;
        if (found == props.end()) {
            props.push_back({prop.name, prop.value, effective});
        } else if (found->value.size() == prop.value.size()) {
            *found = {prop.name, prop.value, effective};
        } else {
            const std::uint32_t type = prop.type ? prop.type : found->type;
            props.erase(found);
            props.push_back({prop.name, prop.value, type});
        }
    }
};

/// Picks from few names, so that they repeat; an occasional one is long or empty.
std::string AnyName(std::uint32_t range) {
    const auto number = *rc::gen::inRange<std::uint32_t>(0, range);
    if (number == 0) return "";
    if (number == 1) return std::string(127, 'n');
    return "com.orbeno.common." + std::to_string(number);
}

Prop AnyProp(std::uint32_t range) {
    const auto size = *rc::gen::inRange<std::size_t>(0, 12);
    const auto fill = *rc::gen::arbitrary<char>();
    const auto type = *rc::gen::element<std::uint32_t>(0, 0x10, 0x20, 0x48, 0x80000000);
    return {AnyName(range), std::string(size, fill), type};
}

std::uint32_t Size(const std::string &value) {
    return static_cast<std::uint32_t>(value.size());
}

void Step(DVSData *list, Model *model, std::uint32_t range) {
    const auto kind = *rc::gen::weightedElement<int>({{5, 0}, {3, 1}, {3, 2}, {1, 3}});
    if (kind == 0) {
        const Prop prop = AnyProp(range);
        RC_ASSERT(DVSData_Append(list, prop.name.c_str(), prop.value.data(), Size(prop.value), prop.type) ==
                  HYP_OK);
        model->props.push_back(prop);
    } else if (kind == 1) {
        const Prop prop = AnyProp(range);
        RC_ASSERT(DVSData_Update(list, prop.name.c_str(), prop.value.data(), Size(prop.value), prop.type) ==
                  HYP_OK);
        model->Update(prop);
    } else if (kind == 2) {
        const std::string name = AnyName(range);
        std::uint32_t type = 0;
        const HYP_ReturnStatus status = DVSDataRemove(list, name.c_str(), &type);
        const auto found = model->Find(name);
        RC_ASSERT((status == HYP_OK) == (found != model->props.end()));
        RC_ASSERT(type == (found == model->props.end() ? 0x20u : found->type));
        if (found != model->props.end()) model->props.erase(found);
    } else {
        const std::string name = AnyName(range);
        DVSDataEntry *entry = nullptr;
        const HYP_ReturnStatus status = DVSData_Lookup(list, name.c_str(), &entry);
        const auto found = model->Find(name);
        RC_ASSERT((status == HYP_OK) == (found != model->props.end()));
        if (entry)
            RC_ASSERT(std::string(reinterpret_cast<const char *>(entry->data), entry->dataLen) ==
                      found->value);
    }
}

void ExpectAlike(DVSData *list, const Model &model) {
    RC_ASSERT(ContentOf(list) == model.props);
    std::uint32_t size = 16;
    for (const Prop &prop : model.props)
        size += (Size(prop.value) + 146) & ~3u;
    RC_ASSERT(list->serialSize == size);
    Props kept = model.props;
    std::erase_if(kept, [](const Prop &prop) { return (prop.type & 0x800000fc) == 0; });
    RC_ASSERT(ContentOf(Read(Serialized(list)).second) == kept);
}

enum class Start { Appended, ReadShared };

void Check(const char *what, int steps, std::uint32_t names, std::uint32_t preload,
           Start start = Start::Appended) {
    const bool ok = rc::check(what, [=] {
        ResetHeap();
        {
            ListPtr list = NewList();
            Model model;
            for (std::uint32_t i = 0; i < preload; ++i) {
                model.props.push_back({"com.orbeno.common." + std::to_string(i % names), "v", 0x20});
                Append(list.get(), model.props.back());
            }
            if (start == Start::ReadShared) list = ReadShared(Serialized(list.get())).second;
            for (int i = 0; i < steps; ++i)
                Step(list.get(), &model, names);
            ExpectAlike(list.get(), model);
        }
        RC_ASSERT(Heap().Live() == 0u);
    });
    EXPECT_TRUE(ok);
}

TEST(ListModel, ShortLists) {
    Check("a short list acts like a vector", 40, 8, 0);
}
TEST(ListModel, ListsThatGrowAndShrinkAcrossTheIndex) {
    Check("a list around the index' sizes", 60, 60, 25);
}
TEST(ListModel, LongLists) {
    Check("a long list acts like a vector", 60, 200, 300);
}
TEST(ListModel, ListsReadIntoOneBlock) {
    Check("a list that shares one block acts like a vector", 40, 12, 12, Start::ReadShared);
    Check("a long list that shares one block acts like a vector", 60, 60, 45, Start::ReadShared);
}

// ---- Allocation failures ----

/// Runs `work` with each allocation failing in turn, until it succeeds. No failure may change the list.
template <typename Work> std::uint64_t FailEach(const Props &props, Work work) {
    std::uint64_t failures = 0;
    for (std::uint64_t n = 1;; ++n) {
        const ListPtr list = ListOf(props);
        HYP_ReturnStatus status = HYP_OK;
        {
            const FailingHeap failing(n);
            status = work(list.get());
            if (status != HYP_OK) {
                EXPECT_EQ(Heap().Live(), 0u);
            }
        }
        if (status == HYP_OK) return failures;
        EXPECT_EQ(status, HYP_NO_MEMORY);
        EXPECT_EQ(ContentOf(list), props);
        ExpectSound(list.get());
        ++failures;
    }
}

HYP_ReturnStatus FreeAfter(DVSData *list, HYP_ReturnStatus status, void *buf) {
    EXPECT_EQ(buf != nullptr, status == HYP_OK);
    if (buf) DVSData_FreeAssocData(list, buf);
    return status;
}

TEST(ListMemory, EveryOperationReportsEachFailureAndChangesNothing) {
    Props props;
    for (int i = 0; i < 32; ++i)
        props.push_back({"n" + std::to_string(i), "v"});
    void *buf = nullptr;
    std::uint32_t len = 0;
    EXPECT_EQ(FailEach(props, [](DVSData *l) { return DVSData_Append(l, "new", "v", 1, 0x20); }), 1u);
    EXPECT_EQ(FailEach(props, [](DVSData *l) { return DVSData_Update(l, "new", "v", 1, 0x20); }), 1u);
    EXPECT_EQ(FailEach(props, [](DVSData *l) { return DVSData_UpdateProp(l, "new", "v", 1); }), 1u);
    EXPECT_EQ(FailEach(props, [](DVSData *l) { return DVSData_UpdateProp(l, "n3", "w", 1); }), 0u);
    EXPECT_EQ(FailEach(props, [](DVSData *l) { return DVSData_Remove(l, "n3"); }), 0u);
    EXPECT_EQ(FailEach(props,
                       [](DVSData *l) {
                           DVSDataEntry *entry = nullptr;
                           return DVSData_Lookup(l, "n3", &entry);
                       }),
              0u);
    const auto serialize = [&](auto call) {
        return FailEach(props, [&](DVSData *l) {
            buf = nullptr;
            const HYP_ReturnStatus status = call(l);
            return FreeAfter(l, status, buf);
        });
    };
    EXPECT_EQ(serialize([&](DVSData *l) { return DVSData_Serialize(l, &buf, &len, 9); }), 1u);
    EXPECT_EQ(serialize([&](DVSData *l) { return DVSData_SerializeExNamedProp(l, &buf, &len, 9, "n1"); }),
              1u);
    EXPECT_EQ(serialize([&](DVSData *l) { return DVSData_SerializeExTypeProp(l, &buf, &len, 1); }), 1u);
    EXPECT_EQ(serialize([&](DVSData *l) { return DVSData_SerializeEntry(l, "n3", &buf, &len); }), 1u);
}

} // namespace
} // namespace dvs::test
