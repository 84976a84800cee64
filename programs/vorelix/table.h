/* Rows of texts as a table that fits a terminal. */
#pragma once

#include <string>
#include <vector>

#include "terminal.h"

namespace vorelix {

class Table {
  public:
    struct Column {
        std::string header;
        bool right = false;  // numbers stand at the right of their column
        bool cut = false;    // may be cut to make room; others are shown whole
        int rank = 0;        // where room is short, the highest rank is left out first; 0 stays
    };

    explicit Table(std::vector<Column> columns) : columns_(std::move(columns)) {}

    /* One text for each column, as it came: it is made printable here. */
    void addRow(std::vector<std::string> texts);

    /* A header line and a line for each row, none wider than the terminal as long as that has
     * room for the columns of rank 0. */
    std::string render(const Terminal &terminal) const;

  private:
    std::vector<Column> columns_;
    std::vector<std::vector<std::string>> rows_;
};

}  // namespace vorelix
