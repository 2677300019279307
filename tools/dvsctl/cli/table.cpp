/* SPDX-License-Identifier: Apache-2.0 */
// Layout of tables.

#include "tools/dvsctl/cli/table.h"

#include <algorithm>
#include <cctype>

#include <fmt/format.h>

#include "form/text.h"
#include "tools/dvsctl/cli/error.h"
#include "tools/dvsctl/cli/options.h"

namespace dvs::ctl {

namespace {

std::size_t FindColumn(std::span<const Column> columns, std::string_view name) {
    for (std::size_t i = 0; i < columns.size(); ++i)
        if (name == columns[i].name) return i;
    std::string known;
    for (const Column &column : columns)
        known += fmt::format("{}{}", known.empty() ? "" : ", ", column.name);
    throw Error(ErrorKind::Usage, fmt::format("there is no column \"{}\"", name))
        .Because("the columns are " + known);
}

std::string Heading(const char *name) {
    std::string heading = name;
    std::transform(heading.begin(), heading.end(), heading.begin(),
                   [](unsigned char c) { return static_cast<char>(std::toupper(c)); });
    return heading;
}

} // namespace

Table::Table(std::span<const Column> columns, const Options &options)
    : columns_(columns), headings_(!options.noHeadings) {
    if (!options.columns) {
        for (std::size_t i = 0; i < columns.size(); ++i)
            if (columns[i].byDefault) shown_.push_back(i);
        return;
    }
    std::string_view rest = *options.columns;
    for (bool more = true; more;) {
        const std::size_t comma = rest.find(',');
        more = comma != std::string_view::npos;
        shown_.push_back(FindColumn(columns, rest.substr(0, comma)));
        if (more) rest.remove_prefix(comma + 1);
    }
}

bool Table::Shows(std::string_view name) const {
    return std::any_of(shown_.begin(), shown_.end(), [&](std::size_t i) { return name == columns_[i].name; });
}

void Table::AddRow(std::span<Cell> row) {
    if (widths_.empty()) {
        for (const std::size_t i : shown_)
            widths_.push_back(headings_ ? Width(columns_[i].name) : 0);
    }
    for (std::size_t i = 0; i < shown_.size(); ++i) {
        Cell &cell = row[shown_[i]];
        const std::size_t width = Width(cell.text);
        widths_[i] = std::max(widths_[i], width);
        // A column may be shown twice.
        const bool isLast = std::find(shown_.begin() + static_cast<std::ptrdiff_t>(i) + 1, shown_.end(),
                                      shown_[i]) == shown_.end();
        cells_.push_back(
            {isLast ? std::move(cell.text) : cell.text, static_cast<std::uint32_t>(width), cell.style});
    }
}

void Table::WriteRow(std::span<const Kept> row, Output &out) const {
    std::string line;
    std::size_t gap = 0; // spaces owed before the next text: none are written at the end of a line
    for (std::size_t i = 0; i < row.size(); ++i) {
        if (row[i].text.empty()) {
            gap += widths_[i] + 2;
            continue;
        }
        const std::size_t fill = widths_[i] - row[i].width;
        const bool right = columns_[shown_[i]].right;
        line.append(gap + (right ? fill : 0), ' ');
        line += out.Paint(row[i].style, row[i].text);
        gap = (right ? 0 : fill) + 2;
    }
    out.Write(line + '\n');
}

void Table::Write(Output &out) {
    if (headings_) {
        std::vector<Cell> heading;
        for (const Column &column : columns_)
            heading.push_back({Heading(column.name), Style::Dim});
        const std::size_t rows = cells_.size();
        AddRow(heading);
        WriteRow(std::span(cells_).subspan(rows), out);
        cells_.resize(rows);
    }
    for (std::size_t at = 0; at < cells_.size(); at += shown_.size())
        WriteRow(std::span(cells_).subspan(at, shown_.size()), out);
}

} // namespace dvs::ctl
