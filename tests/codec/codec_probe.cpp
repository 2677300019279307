/* SPDX-License-Identifier: Apache-2.0 */
// The library's side of the comparison with dvscodec.py: reads requests from standard input, each a line of
// words with all bytes in hex ("-" for none), and answers each with one line.
//
//   decode MASK BUFFER           -> STATUS [name type value]...       through DVSData_DeserializeWithPropType
//   encode [name type value]...  -> STATUS BUFFER                     through DVSData_Append and DVSData_Serialize
//   value ROOM NAME BUFFER       -> STATUS [value bytes of ROOM]      through DVSData_DeserializeGetPropVal
//   view BUFFER                  -> STATUS OFFSET [name type value]...  through the read-only view
//
// Every buffer lies in a block of exactly its size.

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iostream>
#include <memory>
#include <sstream>
#include <string>

#include "dvs/data.h"
#include "dvsdata/buffer_view.h"

namespace {

void *Allocate(std::uint64_t size) { return std::malloc(size); }

std::string FromHex(const std::string &hex) {
    std::string bytes;
    if (hex == "-") return bytes;
    for (std::size_t i = 0; i + 1 < hex.size(); i += 2)
        bytes.push_back(static_cast<char>(std::stoul(hex.substr(i, 2), nullptr, 16)));
    return bytes;
}

std::string ToHex(const void *data, std::size_t size) {
    static const char digits[] = "0123456789abcdef";
    if (size == 0) return "-";
    std::string hex;
    for (std::size_t i = 0; i < size; ++i) {
        const unsigned byte = static_cast<const unsigned char *>(data)[i];
        hex += {digits[byte >> 4], digits[byte & 15]};
    }
    return hex;
}

struct Block {
    explicit Block(const std::string &bytes)
        : data(new std::uint8_t[bytes.size()]), size(static_cast<std::uint32_t>(bytes.size())) {
        if (size) std::memcpy(data.get(), bytes.data(), size);
    }
    std::unique_ptr<std::uint8_t[]> data;
    std::uint32_t size;
};

std::string Word(std::istream &in) {
    std::string word;
    in >> word;
    return word;
}

void PrintEntry(const char *name, std::size_t nameLen, std::uint32_t type, const void *data, std::size_t size) {
    std::cout << ' ' << ToHex(name, nameLen) << ' ' << type << ' ' << ToHex(data, size);
}

void Decode(std::istream &in) {
    const auto mask = static_cast<std::uint32_t>(std::stoul(Word(in)));
    const Block block(FromHex(Word(in)));
    DVSData *list = nullptr;
    std::cout << DVSData_DeserializeWithPropType(&list, block.data.get(), block.size, Allocate, std::free, mask);
    if (list)
        for (const DVSDataEntry *entry = list->head; entry; entry = entry->next)
            PrintEntry(entry->name, std::strlen(entry->name), entry->propType, entry->data, entry->dataLen);
    DVSData_Free(list);
}

void Encode(std::istream &in) {
    DVSData *list = nullptr;
    HYP_ReturnStatus status = DVSData_Alloc(&list, Allocate, std::free);
    std::string name, type, value;
    while (status == HYP_OK && in >> name >> type >> value) {
        const std::string bytes = FromHex(value);
        status = DVSData_Append(list, FromHex(name).c_str(), bytes.data(), static_cast<std::uint32_t>(bytes.size()),
                                static_cast<std::uint32_t>(std::stoul(type)));
    }
    void *buf = nullptr;
    std::uint32_t len = 0;
    if (status == HYP_OK) status = DVSData_Serialize(list, &buf, &len, 9);
    std::cout << status << ' ' << ToHex(buf, len);
    std::free(buf);
    DVSData_Free(list);
}

void Value(std::istream &in) {
    const Block room(std::string(std::stoul(Word(in)), '\xee'));
    const std::string name = FromHex(Word(in));
    const Block block(FromHex(Word(in)));
    const HYP_ReturnStatus status =
        DVSData_DeserializeGetPropVal(block.data.get(), block.size, name.c_str(), room.data.get(), room.size);
    std::cout << status;
    if (status == HYP_OK) std::cout << ' ' << ToHex(room.data.get(), room.size);
}

void View(std::istream &in) {
    const Block block(FromHex(Word(in)));
    dvs::data::BufferView view({block.data.get(), block.size});
    dvs::data::EntryView entry;
    while (view.Next(&entry)) {
    }
    std::cout << view.FirstFault().Status() << ' ' << view.FirstFault().offset;
    if (!view.Ok()) return;
    for (view.Rewind(); view.Next(&entry);)
        PrintEntry(entry.Name().data(), entry.Name().size(), entry.propType, entry.value.data(), entry.value.size());
}

} // namespace

int main() {
    std::string line;
    while (std::getline(std::cin, line)) {
        std::istringstream in(line);
        const std::string what = Word(in);
        if (what == "decode") Decode(in);
        if (what == "encode") Encode(in);
        if (what == "value") Value(in);
        if (what == "view") View(in);
        std::cout << '\n';
    }
    return std::cout.flush() ? 0 : 1;
}
