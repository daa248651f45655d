// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <optional>

#include "CliServices.h"
#include "ErrorReport.h"

namespace Tovicli {

struct Context;
class Tool;

/// Enters the library of `cli`. @return why that cannot be; empty when it was entered
using CliEntry = std::function<std::string(boost::shared_ptr<Plexa::AutoCli::NamespaceNode> const &cli,
                                           CliServices &services, bool completing)>;

/// Loads the library from a file. It stays loaded.
CliEntry cliLibrary(std::string path);

/// The namespace `cli` in one run of the tool.
class CliHost final : public CliServices {
public:
    /// @param isLine the run is one that another one asked for
    CliHost(Context &context, ErrorReport &report, bool isLine);
    ~CliHost() override;
    CliHost(CliHost const &) = delete;
    CliHost &operator=(CliHost const &) = delete;

    /// Whether the words, from the first one of the path on, lead into `cli`.
    static bool isWanted(std::vector<std::string> const &path);
    /// Whether they are what a shell's completion types, which is answered in silence.
    static bool isCompletion(std::vector<std::string> const &path);

    /// Hangs the namespace into the tree; its commands too where they are wanted.
    /// @return why they cannot be had; empty when nothing is wrong
    std::string hangInto(boost::shared_ptr<Plexa::AutoCli::Namespace> const &root, Settings const &settings,
                         bool offlineByUser, std::vector<std::string> const &path);
    /// What a command asked the run to end with.
    std::optional<ExitStatus> status() const {
        return status_;
    }

    Settings const &settings() const override;
    std::string version() const override;
    bool isOffline() const override;
    bool isPrivileged() const override;
    boost::shared_ptr<Plexa::AutoCli::NamespaceNode> root() override;
    Registration const &growPlugins() override;
    void warn(std::string const &text) override;
    Plexa::Sink &output() override;
    ExitStatus runLine(std::vector<std::string> const &words) override;
    bool isLine() const override;
    ExitStatus refuseLine(std::string const &sentence) override;
    void endWith(ExitStatus status) override;

private:
    void restoreEnvironment();

    Context &context_;
    ErrorReport &report_;
    bool const isLine_;
    Settings settings_;
    bool offlineByUser_ = false;
    /// The run owns the tree; this object is a part of the run.
    boost::weak_ptr<Plexa::AutoCli::Namespace> root_;
    std::optional<Registration> plugins_;
    std::unique_ptr<Tool> lines_;
    std::optional<std::string> requestId_;
    std::optional<ExitStatus> status_;
};

} // namespace Tovicli
