// SPDX-License-Identifier: Apache-2.0
#include "plexa/OptionTable.h"

#include <algorithm>

#include "plexa/Text.h"

namespace Plexa {

void appendOptionTable(std::string &to, std::vector<OptionRow> const &rows, std::size_t width) {
    constexpr std::size_t indent = 2;
    constexpr std::size_t gap = 2;
    constexpr std::size_t widestName = 32;
    std::size_t nameWidth = 0;
    for (OptionRow const &row : rows) {
        std::size_t const needed = displayWidth(row.name);
        nameWidth = needed <= widestName ? std::max(nameWidth, needed) : nameWidth;
    }
    std::size_t const column = indent + nameWidth + gap;
    for (OptionRow const &row : rows) {
        to.append(indent, ' ');
        to += row.name;
        if (row.description.empty()) {
            to += '\n';
            continue;
        }
        std::string description;
        appendWrapped(description, row.description, column, width);
        std::size_t const used = indent + displayWidth(row.name);
        if (used + gap <= column) {
            to.append(column - used, ' ');
            to += std::string_view(description).substr(column); // its own indentation is already taken
        } else {
            to += '\n' + description;
        }
    }
}

void appendDeclaredOptions(std::string &to, std::vector<DeclaredOption> const &options, std::size_t width) {
    std::vector<OptionRow> rows;
    for (DeclaredOption const &option : options) {
        std::string text = option.notes() + option.description;
        if (option.description.empty() && !text.empty()) {
            text.pop_back(); // the blank behind the last note
        }
        rows.push_back({(option.alias.empty() ? "    " : option.alias + ", ") + option.form(), text});
    }
    appendOptionTable(to, rows, width);
}

} // namespace Plexa
