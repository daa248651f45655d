// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "plexa/AutoCli.h"

namespace Plexa {

/// A command's help: usage line, description, options in declared order, fields of the result, examples. Everything
/// comes from the command's own declaration.
/// @param input "program" (a string, default "tovicli") and "width" (columns, an integer, default 80); may be empty.
std::string commandHelp(AutoCli::Command &command, boost::shared_ptr<CallSpec::Input> const &input);

} // namespace Plexa
