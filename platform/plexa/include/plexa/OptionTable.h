// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "plexa/Declaration.h"

namespace Plexa {

/// One line of a help list: a name or an option, and what it is.
struct OptionRow {
    std::string name;
    std::string description;
};

/// Appends the rows in two columns, descriptions wrapped to the width. A name too long for its column has its
/// description on the next line.
void appendOptionTable(std::string &to, std::vector<OptionRow> const &rows, std::size_t width);

/// The same for parameters: "-n, --name TEXT", what holds for it, its description.
void appendDeclaredOptions(std::string &to, std::vector<DeclaredOption> const &options, std::size_t width);

} // namespace Plexa
