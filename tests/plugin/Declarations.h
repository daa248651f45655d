// SPDX-License-Identifier: Apache-2.0
//
// What each command class declares, written down a second time: the tests hold the classes against it.
#pragma once

#include <functional>
#include <ostream>
#include <string>
#include <utility>
#include <vector>

#include "plexa/AutoCli.h"

namespace PluginTest {

struct Declaration {
    std::string className;
    std::function<boost::shared_ptr<Plexa::AutoCli::Command>()> make;
    /// Where the tree has it; empty for a class that is in no tree.
    std::string path;
    std::string description;
    /// The metadata field "type".
    std::string type;
    /// Empty when the class names none.
    std::string formatter;
    std::vector<std::pair<std::string, std::string>> formatParameters;
    /// "name alias kind required: description", with "-" for no alias.
    std::vector<std::string> parameters;
    /// As Doubles::describe shows it.
    std::string result;
    /// The number that a failed constructor reports; 0 for a class whose constructor opens no session.
    unsigned sessionLine;
};

/// For the names that tests are listed under.
inline void PrintTo(Declaration const &declaration, std::ostream *stream) {
    *stream << declaration.className;
}

std::vector<Declaration> providerDeclarations();
/// Storage containers and config volumes.
std::vector<Declaration> containerDeclarations();
/// Daemon, fault injection, provider context, virtual volumes.
std::vector<Declaration> daemonDeclarations();
/// Consistency groups, which are in no tree.
std::vector<Declaration> groupDeclarations();

/// All of them.
std::vector<Declaration> allDeclarations();

} // namespace PluginTest
