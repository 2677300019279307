/* SPDX-License-Identifier: Apache-2.0 */
// Layout of tables.

#include "tools/dvsctl/table.h"

#include <algorithm>
#include <cctype>

#include <fmt/format.h>

#include "tools/dvsctl/error.h"
#include "tools/dvsctl/options.h"
#include "tools/dvsctl/text.h"

namespace dvs::ctl {

namespace {

std::size_t FindColumn(std::span<const Column> columns, std::string_view name) {
    for (std::size_t i = 0; i < columns.size(); ++i)
        if (name == columns[i].name) return i;
    std::string known;
    for (const Column &column : columns)
        known += fmt::format("{}{}", known.empty() ? "" : ", ", column.name);
    throw Error(Exit::Usage, fmt::format("there is no column \"{}\"", name))
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

void Table::Add(std::vector<Cell> row) {
    std::vector<Cell> &kept = rows_.emplace_back();
    kept.reserve(shown_.size());
    for (const std::size_t i : shown_)
        kept.push_back(row[i]); // a column may be shown twice
}

void Table::Write(Output &out) const {
    std::vector<std::size_t> widths;
    for (const std::size_t i : shown_)
        widths.push_back(headings_ ? Width(columns_[i].name) : 0);
    for (const auto &row : rows_)
        for (std::size_t i = 0; i < row.size(); ++i)
            widths[i] = std::max(widths[i], Width(row[i].text));

    const auto writeRow = [&](const std::vector<Cell> &row) {
        std::string line;
        std::size_t gap = 0; // spaces owed before the next text: none are written at the end of a line
        for (std::size_t i = 0; i < row.size(); ++i) {
            const std::size_t fill = widths[i] - Width(row[i].text);
            const bool right = columns_[shown_[i]].right;
            if (!row[i].text.empty()) {
                line.append(gap + (right ? fill : 0), ' ');
                line += out.Paint(row[i].style, row[i].text);
                gap = (right ? 0 : fill) + 2;
            } else {
                gap += widths[i] + 2;
            }
        }
        out.Write(line + '\n');
    };
    if (headings_) {
        std::vector<Cell> heading;
        for (const std::size_t i : shown_)
            heading.push_back({Heading(columns_[i].name), Style::Dim});
        writeRow(heading);
    }
    for (const auto &row : rows_)
        writeRow(row);
}

} // namespace dvs::ctl
