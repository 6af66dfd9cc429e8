// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <iosfwd>
#include <string>
#include <vector>

namespace bench {

struct Column {
    std::string title;
    size_t width;
    bool is_text;  // to the left; numbers stand to the right
};

// A number with so many digits after the point.
std::string fixed(double value, int digits);

// A Markdown table that also reads well on a terminal.
class Table {
public:
    // Prints the head.
    Table(std::ostream& out, std::vector<Column> columns);

    void print_row(const std::vector<std::string>& cells);

private:
    std::ostream& out_;
    std::vector<Column> columns_;
};

}  // namespace bench
