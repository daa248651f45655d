// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

#include <climits>
#include <dlfcn.h>
#include <string_view>
#include <unistd.h>

#include "plexa/UsageError.h"

namespace Tovicli::Cli {

using namespace Plexa;

namespace {

void collect(AutoCli::NamespaceNode &node, std::vector<KnownCommand> &commands) {
    if (auto const command = boost::dynamic_pointer_cast<AutoCli::Command>(node.GetThis())) {
        commands.push_back({command, node.GetPathString(' '), pluginOf(*command)});
        return;
    }
    for (NodePtr const &child : node.GetNamespaceNodes()) {
        collect(*child, commands);
    }
}

} // namespace

std::vector<KnownCommand> commandsBelow(AutoCli::NamespaceNode &node) {
    std::vector<KnownCommand> commands;
    collect(node, commands);
    return commands;
}

std::string pluginOf(AutoCli::Command &command) {
    // An object's first word leads to its class's table of functions, which lies in the library of that class.
    void const *const table = *static_cast<void *const *>(dynamic_cast<void *>(&command));
    Dl_info library{};
    if (dladdr(table, &library) == 0 || library.dli_fname == nullptr ||
        !std::string_view(library.dli_fname).starts_with("/proc/self/fd/")) {
        return {};
    }
    char path[PATH_MAX];
    ssize_t const length = readlink(library.dli_fname, path, sizeof(path));
    std::string_view file(path, length > 0 ? static_cast<std::size_t>(length) : 0);
    file.remove_prefix(file.rfind('/') + 1);
    constexpr std::string_view replaced = " (deleted)"; // another file has taken its name since it was loaded
    return std::string(file.ends_with(replaced) ? file.substr(0, file.size() - replaced.size()) : file);
}

void growAndWarn(CliServices &services) {
    for (std::string const &trouble : services.growPlugins().troubles) {
        services.warn(trouble);
    }
}

NodePtr nodeAt(NodePtr node, std::vector<std::string> const &words) {
    for (std::string const &word : words) {
        NodePtr const child = node->GetNamespaceNode(word);
        if (child == nullptr) {
            std::string const path = node->GetPathString(' ');
            throw UsageError("unknown word " + shownWord(word) + (path.empty() ? "" : " in '" + path + "'") +
                             didYouMean(nearNames(word, node->GetNamespaceNodeNames())));
        }
        node = child;
    }
    return node;
}

} // namespace Tovicli::Cli
