// SPDX-License-Identifier: Apache-2.0
//
// One run of the tool, from words to exit status, without touching the process it runs in: output, environment,
// plug-ins and chance come through the context, so that a test runs the tool whole.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <vector>

#include "Activity.h"
#include "Call.h"
#include "CliHost.h"
#include "CommandLine.h"
#include "ErrorReport.h"
#include "ExitStatus.h"
#include "PluginSource.h"
#include "Settings.h"
#include "Trace.h"
#include "plexa/Display.h"
#include "plexa/FormatSettings.h"
#include "plexa/Formatter.h"

namespace Tovicli {

/// What a run meets outside itself. Everything referred to must outlive the run.
struct Context {
    Plexa::Sink &output;
    Plexa::Sink &errors;
    Environment &environment;
    PluginSource &plugins;
    std::function<std::string()> newRequestId;
    Defaults defaults;
    /// Columns of the terminal that help is read on.
    std::size_t width = 80;
    /// Runs with more rights than its caller has: what the caller put into the environment does not count.
    bool privileged = false;
    /// Told when a command begins and ends; null: nobody watches.
    Activity *activity = nullptr;
    /// Time for traces; empty: the process's own.
    Trace::Clock clock = {};
    /// Enters the library of the namespace `cli`; empty: there is no such namespace.
    CliEntry cli = {};
    /// What the output is read on.
    Plexa::Display display = {};
};

class Tool {
public:
    /// Whether the tree, and with it the plug-ins' sessions, is kept from one run to the next where it serves.
    enum class Tree { Fresh, Kept };
    explicit Tool(Context &context, Tree tree = Tree::Fresh);
    static std::string versionText();

    /// @param arguments as main gets them, the program's name first
    ExitStatus run(std::vector<std::string> const &arguments);

private:
    using Root = boost::shared_ptr<Plexa::AutoCli::Namespace>;

    ExitStatus runReported(std::vector<std::string> const &arguments);
    ExitStatus runWords(std::vector<std::string> const &words);
    ExitStatus misread(Misread const &mistake);
    ExitStatus showHelp(Plexa::AutoCli::NamespaceNode &node);
    ExitStatus showVersion();
    ExitStatus runCommand(Plexa::AutoCli::Command &command, CommandLine const &line);
    /// Calls the command, with whoever waits told that it is at work.
    Outcome work(Plexa::AutoCli::Command &command, CommandLine const &line);
    std::optional<LastFailure> causeOf(Outcome const &outcome) const;
    void tell(Outcome const &outcome);
    void traceParsed(CommandLine const &line);
    void startTrace(std::optional<std::string> const &logLevel);
    ExitStatus written(ExitStatus status, std::string const &whatWasDone);

    /// Whether errors are to be documents, as far as words that may not even be valid tell.
    bool looksMachine(std::vector<std::string> const &words) const;
    /// Makes the settings hold: for the platform's libraries through the environment.
    void apply(Settings const &settings);
    /// A fresh tree with every plug-in's subtree under these settings.
    Root grow(Settings const &settings);
    /// That of the run before where it is kept and serves these settings, a fresh one otherwise.
    Root treeFor(Settings const &settings);
    Plexa::FormatSettings formatSettings(Plexa::AutoCli::Command &command,
                                         boost::shared_ptr<Plexa::MetaObj::MetaObject> const &schema) const;
    std::string socketPath() const;
    std::string startHint() const;
    /// Why no daemon was to be had when the plug-ins were registered, with its socket's path; one line.
    std::string daemonSentence() const;

    Context &context_;
    ErrorReport report_;
    Trace trace_;
    Settings settings_;
    Registration registration_;
    std::string requestId_;
    bool offlineByUser_ = false;
    std::vector<std::string> path_; ///< words from the first one of the path on
    CliHost cli_;
    Tree const tree_;
    Root keptTree_;
    Settings keptFor_;
    bool keptOffline_ = false;
};

} // namespace Tovicli
