// SPDX-License-Identifier: Apache-2.0
#include "DeclaredTree.h"

#include <cstdlib>
#include <dlfcn.h>
#include <stdexcept>

#include "CliHost.h"

namespace Tovicli::Manual {

using namespace Plexa;

namespace {

using Commands = std::vector<boost::shared_ptr<AutoCli::Command>>;

/// What commands of `cli` may ask for when they are executed, which these never are.
class NoServices : public CliServices {
public:
    Settings const &settings() const override {
        refuse();
    }
    std::string version() const override {
        refuse();
    }
    bool isOffline() const override {
        refuse();
    }
    bool isPrivileged() const override {
        refuse();
    }
    boost::shared_ptr<AutoCli::NamespaceNode> root() override {
        refuse();
    }
    Registration const &growPlugins() override {
        refuse();
    }
    void warn(std::string const &) override {
        refuse();
    }
    Sink &output() override {
        refuse();
    }
    ExitStatus runLine(std::vector<std::string> const &) override {
        refuse();
    }
    bool isLine() const override {
        refuse();
    }
    ExitStatus refuseLine(std::string const &) override {
        refuse();
    }
    void endWith(ExitStatus) override {
        refuse();
    }

private:
    [[noreturn]] static void refuse() {
        throw std::logic_error("a command that is only declared was executed");
    }
};

NoServices noServices;

void registerPlugin(boost::shared_ptr<AutoCli::Namespace> &root, std::string const &file) {
    void *const library = dlopen(file.c_str(), RTLD_LAZY | RTLD_LOCAL);
    void *const entry = library != nullptr ? dlsym(library, "AutoCli_RegisterNamespaces") : nullptr;
    if (entry == nullptr) {
        char const *const text = dlerror();
        throw std::runtime_error(text != nullptr ? text : file + " cannot be loaded");
    }
    reinterpret_cast<decltype(&AutoCli_RegisterNamespaces)>(entry)(root);
}

void collect(AutoCli::NamespaceNode &node, Commands &commands) {
    for (auto const &child : node.GetNamespaceNodes()) {
        if (auto const command = boost::dynamic_pointer_cast<AutoCli::Command>(child)) {
            commands.push_back(command);
        }
        collect(*child, commands);
    }
}

} // namespace

DeclaredTree::DeclaredTree(Libraries const &libraries)
    : platform_(libraries.directory)
    , root_(AutoCli::Namespace::New()) {
    setenv("TOVI_OFFLINE", "1", 1);
    auto const storage = AutoCli::Namespace::New();
    storage->SetDescription("Storage commands.");
    root_->RegisterNamespaceNode(storage, "storage");
    if (std::string const problem = platform_.provide({"liblumo.so.1", "libkestrel.so.1"}); !problem.empty()) {
        throw std::runtime_error(problem);
    }
    registerPlugin(root_, libraries.plugin);
    std::string const problem = cliLibrary(libraries.cli)(root_->SubNamespace("cli"), noServices, false);
    if (!problem.empty()) {
        throw std::runtime_error(problem);
    }
}

std::vector<boost::shared_ptr<AutoCli::Command>> DeclaredTree::commands() const {
    Commands commands;
    collect(*root_, commands);
    return commands;
}

} // namespace Tovicli::Manual
