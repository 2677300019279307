/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_CLI_TABLE_H
#define DVSCTL_CLI_TABLE_H

// Aligned columns. --columns chooses and orders them, --no-headings leaves the first line out.

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "tools/dvsctl/cli/output.h"

namespace dvs::ctl {

struct Column {
    const char *name;       ///< as --columns takes it; the heading is the same in capitals
    bool right = false;     ///< numbers
    bool byDefault = false; ///< shown without --columns
};

struct Cell {
    std::string text; ///< escaped
    Style style = Style::Plain;
};

class Table {
public:
    /// `columns` must outlive the table. Throws Error(Usage) for a name in --columns that is none of them.
    Table(std::span<const Column> columns, const Options &options);

    /// True when the column of that name is shown.
    bool Shows(std::string_view name) const;

    /// One cell per column, in the order of the columns, shown or not. Moves them.
    template <std::size_t N> void Add(Cell (&&row)[N]) { AddRow(row); }

    void Write(Output &out);

private:
    struct Kept {
        std::string text;
        std::uint32_t width;
        Style style;
    };

    void AddRow(std::span<Cell> row);
    void WriteRow(std::span<const Kept> row, Output &out) const;

    std::span<const Column> columns_;
    std::vector<std::size_t> shown_;
    std::vector<std::size_t> widths_; // of the shown columns
    std::vector<Kept> cells_;         // shown ones only, row by row
    bool headings_;
};

} // namespace dvs::ctl

#endif
