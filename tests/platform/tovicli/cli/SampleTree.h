// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include <boost/make_shared.hpp>

#include "Frame.h"

/// A command that declares what it is told to.
class DeclaringCommand : public virtual Plexa::AutoCli::Command {
public:
    explicit DeclaringCommand(Tovicli::Cli::InputSpecPtr spec)
        : spec_(std::move(spec)) {}
    Tovicli::Cli::InputSpecPtr GetInputSpecInternal() override {
        return spec_;
    }
    Tovicli::Cli::OutputSpecPtr GetOutputSpecInternal() override {
        return Tovicli::Cli::declareResult(nullptr);
    }
    void ExecuteInternal(Tovicli::Cli::InputPtr const &, Tovicli::Cli::OutputPtr const &) override {}

private:
    Tovicli::Cli::InputSpecPtr spec_;
};

/// Hangs a command into a tree, and the namespaces on the way.
inline void hang(boost::shared_ptr<Plexa::AutoCli::Namespace> const &root, std::vector<std::string> path,
                 boost::shared_ptr<DeclaringCommand> const &command) {
    std::string const name = path.back();
    path.pop_back();
    Tovicli::Cli::NodePtr node = root;
    for (std::string const &word : path) {
        node = node->SubNamespace(word);
    }
    node->RegisterNamespaceNode(command, name);
}
