/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVSCTL_TABLE_H
#define DVSCTL_TABLE_H

// Aligned columns. --columns chooses and orders them, --no-headings leaves the first line out.

#include <span>
#include <string>
#include <vector>

#include "tools/dvsctl/output.h"

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

    /// One cell per column, in the order of the columns, shown or not.
    void Add(std::vector<Cell> row);

    void Write(Output &out) const;

private:
    std::span<const Column> columns_;
    std::vector<std::size_t> shown_;
    std::vector<std::vector<Cell>> rows_; // shown cells only
    bool headings_;
};

} // namespace dvs::ctl

#endif
