// SPDX-License-Identifier: Apache-2.0
#include "table.h"

#include <iomanip>
#include <ostream>
#include <sstream>

namespace bench {

namespace {

std::string padded(const std::string& text, const Column& column) {
    const std::string space(column.width > text.size() ? column.width - text.size() : 0, ' ');
    return column.is_text ? text + space : space + text;
}

std::string rule_under(const Column& column) {
    const std::string line(column.width + 1, '-');
    return column.is_text ? "-" + line : line + ":";
}

}  // namespace

std::string fixed(double value, int digits) {
    std::ostringstream text;
    text << std::fixed << std::setprecision(digits) << value;
    return text.str();
}

Table::Table(std::ostream& out, std::vector<Column> columns)
    : out_(out), columns_(std::move(columns)) {
    std::vector<std::string> titles;
    for (const Column& column : columns_) titles.push_back(column.title);
    print_row(titles);
    for (const Column& column : columns_) out_ << '|' << rule_under(column);
    out_ << "|\n";
}

void Table::print_row(const std::vector<std::string>& cells) {
    for (size_t i = 0; i < cells.size(); ++i) out_ << "| " << padded(cells[i], columns_[i]) << ' ';
    out_ << "|\n" << std::flush;
}

}  // namespace bench
