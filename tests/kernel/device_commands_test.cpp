/* SPDX-License-Identifier: Apache-2.0 */
// Tests the table of device commands: lookups by number, and the copy of the table in docs/emulator.md.

#include <fstream>
#include <sstream>
#include <string>

#include <gtest/gtest.h>

#include "platform/device_commands.h"

namespace dvs::device {
namespace {

std::string DocumentedAs(const CommandRow &row) {
    static constexpr const char *kBuffers[] = {"", " value in", " value out", " text in, reply out"};
    std::ostringstream line;
    line << "| " << NumberOf(row.command) << " | " << row.name << " |"
         << kBuffers[static_cast<int>(row.transfer)] << " |"
         << (row.effect == Effect::ChangesState ? " yes |" : " |");
    return line.str();
}

TEST(DeviceCommands, AreFoundByTheirNumbersOnly) {
    std::size_t found = 0;
    for (int32_t number = -2; number < kCommandEnd + 2; number++) {
        const CommandRow *row = FindCommand(number);
        if (!row) {
            EXPECT_EQ(TransferOf(number), Transfer::None);
            continue;
        }
        EXPECT_EQ(NumberOf(row->command), number);
        EXPECT_EQ(TransferOf(number), row->transfer);
        found++;
    }
    EXPECT_EQ(found, kCommands.size());
    EXPECT_EQ(FindCommand(INT32_MIN), nullptr);
    EXPECT_EQ(FindCommand(INT32_MAX), nullptr);
}

TEST(DeviceCommands, MatchTheTableInTheEmulatorsDocument) {
    std::ostringstream document;
    document << std::ifstream(DVS_SOURCE_DIR "/docs/emulator.md").rdbuf();
    std::string table = "| number | command | buffers | changes the state |\n|---|---|---|---|\n";
    for (const CommandRow &row : kCommands)
        table += DocumentedAs(row) + '\n';
    // The empty line ends the table.
    EXPECT_NE(document.str().find(table + '\n'), std::string::npos) << "in docs/emulator.md, write\n"
                                                                    << table;
}

} // namespace
} // namespace dvs::device
