/* SPDX-License-Identifier: Apache-2.0 */
// Ports against a std::unordered_map, and whole states against the least work their format allows.
// Nanoseconds of processor time for one operation on all ports (find: on one). A state of 32 switches with
// 512 ports of 12 properties is 48 MB; the other shape is one switch with 16,384 ports.

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdlib>
#include <memory>
#include <random>
#include <string>
#include <unordered_map>
#include <vector>

#include "bench/floor.h"
#include "bench/ratio.h"
#include "dvs/state.h"

namespace {

const ratio::Goal kGoals[] = {
    {"port-add+remove/512", 2.0},   {"port-add+remove/2048", 2.0}, {"port-add+remove/16384", 2.0},
    {"port-add+remove/65536", 2.0}, {"port-find/512", 1.5},        {"port-find/16384", 1.5},
    {"port-find/65536", 1.5},       {"16384-adds-of-2048", 10.0},  {"encode-warm/32x512", 1.15},
    {"encode-warm/1x16384", 1.15},  {"encode-cold/32x512", 0.5},   {"encode-cold/1x16384", 0.5},
    {"decode/32x512", 1.1},         {"decode/1x16384", 1.1},
};

constexpr std::uint32_t kVersion = 9;
constexpr std::uint32_t kPropNum = 12;
constexpr char kSwitch[] = "50 1e 3c 2d 44 7a 10 9b-c8 5d 21 66 90 0f ab 77";

std::vector<std::string> PortIds(std::uint32_t count) {
    std::vector<std::string> ids;
    for (std::uint32_t i = 0; i < count; i++)
        ids.push_back(std::to_string(100 + i));
    return ids;
}

std::vector<std::string> Shuffled(std::vector<std::string> ids) {
    std::shuffle(ids.begin(), ids.end(), std::mt19937(1));
    return ids;
}

// ---- Ports ----

void AddPorts(const std::vector<std::string> &ids) {
    for (const std::string &id : ids) {
        DVSData *list = nullptr;
        DVSData_Alloc(&list, std::malloc, std::free);
        DVSState_PortAdd(kSwitch, id.c_str(), list);
    }
}

void AddRemove(benchmark::State &state, std::uint32_t count) {
    DVSState_SwitchAdd(kSwitch, "vswitch", 0, kVersion);
    const auto ids = PortIds(count), order = Shuffled(ids);
    for (auto _ : state) {
        AddPorts(ids);
        for (const std::string &id : order)
            DVSState_PortRemove(kSwitch, id.c_str());
    }
    DVSState_ConfigReset();
}

/// Blocks with the sizes of a list handle and a port record.
struct FloorPort {
    std::unique_ptr<char[]> list = std::make_unique<char[]>(48);
    char record[24] = {};
};
using FloorTable = std::unordered_map<std::string, std::unique_ptr<FloorPort>>;

void AddPorts(FloorTable *table, const std::vector<std::string> &ids) {
    for (const std::string &id : ids)
        table->emplace(id, std::make_unique<FloorPort>());
}

void AddRemoveFloor(benchmark::State &state, std::uint32_t count) {
    const auto ids = PortIds(count), order = Shuffled(ids);
    for (auto _ : state) {
        FloorTable table;
        AddPorts(&table, ids);
        for (const std::string &id : order)
            table.erase(id);
    }
}

void Find(benchmark::State &state, std::uint32_t count) {
    DVSState_SwitchAdd(kSwitch, "vswitch", 0, kVersion);
    const auto ids = PortIds(count), order = Shuffled(ids);
    AddPorts(ids);
    DVSwitch *sw = DVSState_SwitchFind(kSwitch);
    std::size_t i = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(
            DVSState_FindPortByIDAndType(sw, order[i].c_str(), DVS_PORT_ACTIVE)->portType);
        if (++i == order.size()) i = 0;
    }
    DVSState_ConfigReset();
}

void FindFloor(benchmark::State &state, std::uint32_t count) {
    const auto ids = PortIds(count), order = Shuffled(ids);
    FloorTable table;
    AddPorts(&table, ids);
    std::size_t i = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(table.find(order[i])->second->record[0]);
        if (++i == order.size()) i = 0;
    }
}

/// Measures adding only, without the removal.
void AddOnly(benchmark::State &state, std::uint32_t count) {
    const auto ids = PortIds(count);
    for (auto _ : state) {
        state.PauseTiming();
        DVSState_ConfigReset();
        DVSState_SwitchAdd(kSwitch, "vswitch", 0, kVersion);
        state.ResumeTiming();
        AddPorts(ids);
    }
    DVSState_ConfigReset();
}

// ---- Whole states ----

struct Shape {
    std::uint32_t switches, ports;
};

std::string SwitchId(std::uint32_t index) {
    return "switch-" + std::to_string(index);
}

void BuildTable(const Shape &shape) {
    const auto props = bench::MakeProps(kPropNum);
    for (std::uint32_t sw = 0; sw < shape.switches; sw++) {
        const std::string id = SwitchId(sw);
        DVSState_SwitchAdd(id.c_str(), "vswitch", 0, kVersion);
        for (const std::string &portId : PortIds(shape.ports)) {
            DVSData *list = nullptr;
            DVSData_Alloc(&list, std::malloc, std::free);
            for (const bench::Prop &prop : props)
                DVSData_Append(list, prop.name.c_str(), prop.value.data(),
                               static_cast<std::uint32_t>(prop.value.size()), 0x20);
            DVSState_PortAdd(id.c_str(), portId.c_str(), list);
        }
    }
}

std::vector<std::uint8_t> StateOf(const Shape &shape) {
    BuildTable(shape);
    void *buf = nullptr;
    std::uint32_t len = 0;
    DVSState_ConfigSerialize(&buf, &len);
    const auto *bytes = static_cast<std::uint8_t *>(buf);
    std::vector<std::uint8_t> state(bytes, bytes + len);
    std::free(buf);
    DVSState_ConfigReset();
    return state;
}

/// Encodes into a new block each time.
void EncodeCold(benchmark::State &state, Shape shape) {
    BuildTable(shape);
    for (auto _ : state) {
        void *buf = nullptr;
        std::uint32_t len = 0;
        DVSState_ConfigSerialize(&buf, &len);
        benchmark::DoNotOptimize(buf);
        std::free(buf);
    }
    DVSState_ConfigReset();
}

/// Encodes into one block whose pages are already mapped.
void EncodeWarm(benchmark::State &state, Shape shape) {
    BuildTable(shape);
    void *buf = nullptr;
    std::uint32_t len = 0;
    for (auto _ : state) {
        DVSState_ConfigSerialize(&buf, &len);
        benchmark::ClobberMemory();
    }
    std::free(buf);
    DVSState_ConfigReset();
}

void Decode(benchmark::State &state, Shape shape) {
    const auto bytes = StateOf(shape);
    for (auto _ : state) {
        DVSState_ConfigDeserialize(bytes.data(), static_cast<std::uint32_t>(bytes.size()));
        DVSState_ConfigReset();
    }
}

/// The floor's state: property entries in port lists, one list after each port entry's fixed part. Omits
/// switches, because there are few.
using FloorState = std::vector<std::unique_ptr<bench::floor::List>>;

FloorState BuildFloor(const Shape &shape) {
    const auto props = bench::MakeProps(kPropNum);
    FloorState ports(std::size_t{shape.switches} * shape.ports);
    for (auto &port : ports) {
        port = std::make_unique<bench::floor::List>();
        for (const bench::Prop &prop : props)
            port->Add(bench::floor::MakeEntry(prop.name.c_str(), prop.value.data(),
                                              static_cast<std::uint32_t>(prop.value.size())));
    }
    return ports;
}

constexpr std::uint32_t kFixedSize = 140;

std::size_t SizeOf(const FloorState &ports) {
    std::size_t size = 16;
    for (const auto &port : ports)
        size += kFixedSize + 4 + port->size;
    return size;
}

void EncodeFloor(const FloorState &ports, std::uint8_t *buf, std::size_t size) {
    std::uint8_t *out = buf + 12;
    for (const auto &port : ports) {
        const std::uint32_t fixed[2] = {kFixedSize + 4 + port->size, port->size};
        std::memset(out, 0, kFixedSize + 12);
        std::memcpy(out, &fixed[0], 4);
        std::memcpy(out + 136, &fixed[1], 4);
        out += kFixedSize;
        std::memcpy(out, &port->size, 4);
        out += 12;
        for (const bench::floor::Entry *entry = port->head; entry; entry = entry->next) {
            std::memcpy(out, &entry->size, entry->size);
            out += entry->size;
        }
        std::memset(out, 0, 8);
        out += 8;
    }
    std::memset(out, 0, 4);
    const std::uint32_t header[3] = {static_cast<std::uint32_t>(size), bench::floor::Checksum(buf, size), 1};
    std::memcpy(buf, header, 12);
}

void EncodeColdFloor(benchmark::State &state, Shape shape) {
    const FloorState ports = BuildFloor(shape);
    for (auto _ : state) {
        const std::size_t size = SizeOf(ports);
        auto *const buf = static_cast<std::uint8_t *>(std::malloc(size));
        EncodeFloor(ports, buf, size);
        benchmark::DoNotOptimize(buf);
        std::free(buf);
    }
}

void EncodeWarmFloor(benchmark::State &state, Shape shape) {
    const FloorState ports = BuildFloor(shape);
    std::vector<std::uint8_t> buf(SizeOf(ports));
    for (auto _ : state) {
        EncodeFloor(ports, buf.data(), SizeOf(ports));
        benchmark::ClobberMemory();
    }
}

void DecodeFloor(benchmark::State &state, Shape shape) {
    std::vector<std::uint8_t> buf;
    {
        const FloorState ports = BuildFloor(shape);
        buf.resize(SizeOf(ports));
        EncodeFloor(ports, buf.data(), buf.size());
    }
    for (auto _ : state) {
        if (bench::floor::Checksum(buf.data(), buf.size()) != bench::floor::SizeAt(&buf[4])) std::abort();
        FloorState ports;
        for (const std::uint8_t *at = &buf[12]; const std::uint32_t size = bench::floor::SizeAt(at);
             at += size) {
            auto port = std::make_unique<bench::floor::List>();
            const std::uint8_t *prop = at + kFixedSize + 12;
            for (; const std::uint32_t propSize = bench::floor::SizeAt(prop); prop += propSize) {
                auto *const entry = static_cast<bench::floor::Entry *>(std::malloc(propSize + 8));
                entry->next = nullptr;
                std::memcpy(&entry->size, prop, propSize);
                port->Add(entry);
            }
            ports.push_back(std::move(port));
        }
        benchmark::DoNotOptimize(ports.data());
    }
}

template <typename Argument, typename Dvs, typename Floor>
void Pair(const std::string &work, Argument argument, Dvs dvs, Floor floor) {
    benchmark::RegisterBenchmark((work + "/dvs").c_str(), dvs, argument);
    benchmark::RegisterBenchmark((work + "/floor").c_str(), floor, argument);
}

} // namespace

int main(int argc, char **argv) {
    for (const std::uint32_t count : {512u, 2048u, 16384u, 65536u}) {
        Pair("port-add+remove/" + std::to_string(count), count, AddRemove, AddRemoveFloor);
        Pair("port-find/" + std::to_string(count), count, Find, FindFloor);
    }
    benchmark::RegisterBenchmark("16384-adds-of-2048/dvs", AddOnly, 16384);
    benchmark::RegisterBenchmark("16384-adds-of-2048/floor", AddOnly, 2048);
    for (const Shape shape : {Shape{32, 512}, Shape{1, 16384}}) {
        const std::string size = "/" + std::to_string(shape.switches) + "x" + std::to_string(shape.ports);
        Pair("encode-warm" + size, shape, EncodeWarm, EncodeWarmFloor);
        Pair("encode-cold" + size, shape, EncodeCold, EncodeColdFloor);
        Pair("decode" + size, shape, Decode, DecodeFloor);
    }
    return ratio::Main(argc, argv, kGoals);
}
