// SPDX-License-Identifier: Apache-2.0
#include "TableLayout.h"

#include <algorithm>

#include "plexa/Text.h"

namespace Plexa {

namespace {

constexpr std::size_t narrowest = 8;

bool mayShrink(Column const &column) {
    return !column.isNumber && column.width > narrowest;
}

/// The columns' widths if none that may shrink is wider than the limit.
std::size_t widthUnder(std::vector<Column> const &columns, std::size_t limit) {
    std::size_t width = columns.empty() ? 0 : columnGap * (columns.size() - 1);
    for (Column const &column : columns) {
        width += mayShrink(column) ? std::min(column.width, limit) : column.width;
    }
    return width;
}

/// Takes as many characters off the text as fit, one at least.
std::string takeWidth(std::string_view &text, std::size_t width) {
    std::string line;
    std::size_t used = 0;
    while (!text.empty()) {
        std::string_view rest = text;
        Character const character = takeCharacter(rest);
        std::size_t const columns = displayWidth(character.bytes);
        if (!line.empty() && used + columns > width) {
            break;
        }
        line += character.bytes;
        used += columns;
        text = rest;
    }
    return line;
}

} // namespace

void fitColumns(std::vector<Column> &columns, std::size_t room) {
    std::size_t limit = 0;
    for (Column const &column : columns) {
        limit = std::max(limit, column.width);
    }
    if (widthUnder(columns, limit) <= room) {
        return;
    }
    while (limit > narrowest && widthUnder(columns, limit) > room) {
        --limit;
    }
    std::size_t const used = widthUnder(columns, limit);
    std::size_t left = room > used ? room - used : 0; // a column each, less than would let all of them grow by one
    for (Column &column : columns) {
        if (mayShrink(column) && column.width > limit) {
            column.width = limit + (left > 0 ? 1 : 0);
            left -= left > 0 ? 1 : 0;
        }
    }
}

std::vector<std::string> brokenToWidth(std::string_view text, std::size_t width) {
    std::vector<std::string> lines;
    for (std::string const &line : wrapped(text, width)) {
        std::string_view rest = line;
        do {
            lines.push_back(takeWidth(rest, width));
        } while (!rest.empty());
    }
    return lines;
}

} // namespace Plexa
