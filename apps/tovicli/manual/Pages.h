// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "DeclaredTree.h"

namespace Tovicli::Manual {

/// "tovicli-storage-internal-lumo-storagecontainer-load": a command's page, without its section.
std::string pageName(Plexa::AutoCli::Command &command);

/// @param siblings the commands that stand beside it
std::string commandPage(Plexa::AutoCli::Command &command,
                        std::vector<boost::shared_ptr<Plexa::AutoCli::NamespaceNode>> const &siblings,
                        std::string const &version);

std::string toolPage(DeclaredTree const &tree, std::string const &version);

/// A page that is a program's --help.
std::string helpPage(std::string const &program, int section, std::string const &summary, std::string const &help,
                     std::string const &version);

} // namespace Tovicli::Manual
