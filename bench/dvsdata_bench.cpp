/* SPDX-License-Identifier: Apache-2.0 */
// Property lists against the floor of floor.h and, for lookups, a std::unordered_map. Nanoseconds of
// processor time for one operation on the whole list (lookups: on one name). Names have about 36 characters,
// values 8 to 256 bytes: 32 properties are 9 KB.

#include <benchmark/benchmark.h>

#include <cstdlib>
#include <random>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "bench/floor.h"
#include "bench/ratio.h"
#include "dvs/data.h"

namespace {

using bench::Prop;

const ratio::Goal kGoals[] = {
    {"append/1000", 1.1},     {"serialize/32", 1.15}, {"build+serialize/32", 1.1},
    {"deserialize/32", 1.15}, {"find/32", 0.75},      {"find/1000", 0.9},
    {"lookup/32", 1.0},       {"lookup/1000", 1.5},   {"lookup/10000", 1.5},
};

void *Allocate(std::uint64_t size) {
    return std::malloc(size);
}

DVSData *MakeList(const std::vector<Prop> &props) {
    DVSData *list = nullptr;
    DVSData_Alloc(&list, Allocate, std::free);
    for (const Prop &prop : props)
        DVSData_Append(list, prop.name.c_str(), prop.value.data(),
                       static_cast<std::uint32_t>(prop.value.size()), 0x20);
    return list;
}

void MakeFloorList(const std::vector<Prop> &props, bench::floor::List *list) {
    for (const Prop &prop : props)
        list->Add(bench::floor::MakeEntry(prop.name.c_str(), prop.value.data(),
                                          static_cast<std::uint32_t>(prop.value.size())));
}

std::vector<std::uint8_t> MakeBuffer(const std::vector<Prop> &props) {
    bench::floor::List list;
    MakeFloorList(props, &list);
    std::uint8_t *const buf = bench::floor::Serialize(list);
    std::vector<std::uint8_t> bytes(buf, buf + list.size);
    std::free(buf);
    return bytes;
}

/// The names of all properties in random order, like the lookups of operators' tools.
std::vector<const char *> Shuffled(const std::vector<Prop> &props) {
    std::vector<const char *> names;
    for (const Prop &prop : props)
        names.push_back(prop.name.c_str());
    std::shuffle(names.begin(), names.end(), std::mt19937(1));
    return names;
}

void SerializeOnce(DVSData *list) {
    void *buf = nullptr;
    std::uint32_t len = 0;
    DVSData_Serialize(list, &buf, &len, 9);
    benchmark::DoNotOptimize(buf);
    DVSData_FreeAssocData(list, buf);
}

void SerializeOnce(const bench::floor::List &list) {
    std::uint8_t *buf = bench::floor::Serialize(list);
    benchmark::DoNotOptimize(buf);
    std::free(buf);
}

void Append(benchmark::State &state, std::uint32_t count) {
    const auto props = bench::MakeProps(count);
    for (auto _ : state)
        DVSData_Free(MakeList(props));
}

void AppendFloor(benchmark::State &state, std::uint32_t count) {
    const auto props = bench::MakeProps(count);
    for (auto _ : state) {
        bench::floor::List list;
        MakeFloorList(props, &list);
        benchmark::DoNotOptimize(list.head);
    }
}

void Serialize(benchmark::State &state, std::uint32_t count) {
    DVSData *const list = MakeList(bench::MakeProps(count));
    for (auto _ : state)
        SerializeOnce(list);
    DVSData_Free(list);
}

void SerializeFloor(benchmark::State &state, std::uint32_t count) {
    bench::floor::List list;
    MakeFloorList(bench::MakeProps(count), &list);
    for (auto _ : state)
        SerializeOnce(list);
}

void Build(benchmark::State &state, std::uint32_t count) {
    const auto props = bench::MakeProps(count);
    for (auto _ : state) {
        DVSData *const list = MakeList(props);
        SerializeOnce(list);
        DVSData_Free(list);
    }
}

void BuildFloor(benchmark::State &state, std::uint32_t count) {
    const auto props = bench::MakeProps(count);
    for (auto _ : state) {
        bench::floor::List list;
        MakeFloorList(props, &list);
        SerializeOnce(list);
    }
}

void Deserialize(benchmark::State &state, std::uint32_t count) {
    const auto buffer = MakeBuffer(bench::MakeProps(count));
    for (auto _ : state) {
        DVSData *list = nullptr;
        DVSData_Deserialize(&list, buffer.data(), static_cast<std::uint32_t>(buffer.size()), Allocate,
                            std::free);
        benchmark::DoNotOptimize(list);
        DVSData_Free(list);
    }
}

void DeserializeFloor(benchmark::State &state, std::uint32_t count) {
    const auto buffer = MakeBuffer(bench::MakeProps(count));
    for (auto _ : state) {
        bench::floor::List list;
        benchmark::DoNotOptimize(
            bench::floor::Deserialize(buffer.data(), static_cast<std::uint32_t>(buffer.size()), &list));
    }
}

/// Finds the last property, so it walks the whole buffer.
void Find(benchmark::State &state, std::uint32_t count) {
    const auto props = bench::MakeProps(count);
    const auto buffer = MakeBuffer(props);
    char value[512];
    for (auto _ : state) {
        benchmark::DoNotOptimize(
            DVSData_DeserializeGetPropVal(buffer.data(), static_cast<std::uint32_t>(buffer.size()),
                                          props.back().name.c_str(), value, sizeof value));
        benchmark::ClobberMemory();
    }
}

void FindFloor(benchmark::State &state, std::uint32_t count) {
    const auto props = bench::MakeProps(count);
    const auto buffer = MakeBuffer(props);
    char value[512];
    for (auto _ : state) {
        const std::uint8_t *const found = bench::floor::Find(
            buffer.data(), static_cast<std::uint32_t>(buffer.size()), props.back().name.c_str());
        std::memcpy(value, found, props.back().value.size());
        benchmark::ClobberMemory();
    }
}

void Lookup(benchmark::State &state, std::uint32_t count) {
    const auto props = bench::MakeProps(count);
    const auto names = Shuffled(props);
    DVSData *const list = MakeList(props);
    std::size_t i = 0;
    for (auto _ : state) {
        DVSDataEntry *entry = nullptr;
        DVSData_Lookup(list, names[i], &entry);
        benchmark::DoNotOptimize(entry->dataLen);
        if (++i == names.size()) i = 0;
    }
    DVSData_Free(list);
}

void LookupFloor(benchmark::State &state, std::uint32_t count) {
    const auto props = bench::MakeProps(count);
    const auto names = Shuffled(props);
    DVSData *const list = MakeList(props);
    std::unordered_map<std::string_view, DVSDataEntry *> map;
    for (DVSDataEntry *entry = list->head; entry; entry = entry->next)
        map.emplace(entry->name, entry);
    std::size_t i = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(map.find(names[i])->second->dataLen);
        if (++i == names.size()) i = 0;
    }
    DVSData_Free(list);
}

void Pair(const std::string &work, std::uint32_t count, void (*dvs)(benchmark::State &, std::uint32_t),
          void (*floor)(benchmark::State &, std::uint32_t)) {
    const std::string name = work + '/' + std::to_string(count);
    benchmark::RegisterBenchmark((name + "/dvs").c_str(), dvs, count);
    benchmark::RegisterBenchmark((name + "/floor").c_str(), floor, count);
}

} // namespace

int main(int argc, char **argv) {
    Pair("append", 1000, Append, AppendFloor);
    Pair("serialize", 32, Serialize, SerializeFloor);
    Pair("build+serialize", 32, Build, BuildFloor);
    Pair("deserialize", 32, Deserialize, DeserializeFloor);
    for (const std::uint32_t count : {32u, 1000u})
        Pair("find", count, Find, FindFloor);
    for (const std::uint32_t count : {32u, 1000u, 10000u})
        Pair("lookup", count, Lookup, LookupFloor);
    return ratio::Main(argc, argv, kGoals);
}
