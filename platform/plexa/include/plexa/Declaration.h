// SPDX-License-Identifier: Apache-2.0
//
// A command's declaration as a reader wants it told: help and manual pages are both made of this, and so cannot differ.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "plexa/AutoCli.h"

namespace Plexa {

/// One parameter, in declared order.
struct DeclaredOption {
    std::string alias; ///< "-n", empty without one
    std::string name;  ///< "--vp-name"
    std::string value; ///< what stands for the value: "TEXT", "NUMBER", "true|false"; empty for a flag
    bool required = false;
    bool repeats = false;
    bool positional = false; ///< words without an option are values of it
    std::string description;

    /// "--vp-name TEXT"
    std::string form() const;
    /// What holds for the option beside its description: "Required. May be repeated. "
    std::string notes() const;
};

std::vector<DeclaredOption> declaredOptions(CallSpec::InputSpec const &spec);
/// Knows from the command's metadata which of them is positional.
std::vector<DeclaredOption> declaredOptions(AutoCli::Command &command);

/// A usage line in pieces that are not to be broken.
std::vector<std::string> usagePieces(AutoCli::Command &command, std::string const &program);

/// One field of a result; what a field holds follows it, a step deeper.
struct DeclaredField {
    std::size_t depth = 0;
    std::string name;
    std::string kind; ///< "text", "whole number, MB", "list of texts", "list, each element with:"
};

struct DeclaredResult {
    /// "a list, each element with the fields:", "true or false"; empty when nothing is declared.
    std::string what;
    std::vector<DeclaredField> fields;
};

DeclaredResult declaredResult(AutoCli::Command &command);

/// Appends pieces in lines of at most width columns, a blank between two of them.
/// @param indent     of the first line
/// @param nextIndent of the lines after it
/// @param broken     what ends a line that goes on: "" or " \\"
void appendPieces(std::string &to, std::vector<std::string> const &pieces, std::size_t indent, std::size_t nextIndent,
                  std::size_t width, std::string const &broken = "");

} // namespace Plexa
