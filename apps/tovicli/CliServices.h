// SPDX-License-Identifier: Apache-2.0
//
// What the tool lends to its own namespace `cli`, whose commands look at the tool itself: its tree, its plug-ins, the
// settings of this run, and further runs in the same process.
//
// Those commands are a library of their own (cli/), loaded when the first word of the path is `cli` and at no other
// time, so that no other command pays for what they need. The library and the tool are installed together.
#pragma once

#include <string>
#include <vector>

#include "ExitStatus.h"
#include "PluginSource.h"
#include "Settings.h"
#include "plexa/AutoCli.h"
#include "plexa/Sink.h"

namespace Tovicli {

class CliServices {
public:
    virtual ~CliServices() = default;
    /// Those of this run.
    virtual Settings const &settings() const = 0;
    virtual std::string version() const = 0;
    /// Whether the user set TOVI_OFFLINE.
    virtual bool isOffline() const = 0;
    /// Runs with more rights than its caller has.
    virtual bool isPrivileged() const = 0;
    /// The tree that `cli` stands in.
    virtual boost::shared_ptr<Plexa::AutoCli::NamespaceNode> root() = 0;
    /// Hangs the plug-ins' subtrees into the tree, once. They are registered offline: no daemon is asked for.
    virtual Registration const &growPlugins() = 0;
    /// Something beside the matter, for standard error.
    virtual void warn(std::string const &text) = 0;
    /// Where results go; for a command that runs others.
    virtual Plexa::Sink &output() = 0;
    /// Runs a command line in this process, under this run's settings where it has none of its own. The plug-ins of one
    /// run serve the next one too. What it has to say goes to standard output and standard error.
    virtual ExitStatus runLine(std::vector<std::string> const &words) = 0;
    /// Whether this run is one of those itself.
    virtual bool isLine() const = 0;
    /// Tells that a line cannot be run at all. @return ExitStatus::Usage
    virtual ExitStatus refuseLine(std::string const &sentence) = 0;
    /// What this run ends with, whatever its command leaves; the command has told why.
    virtual void endWith(ExitStatus status) = 0;
};

/// How the library of `cli` is entered: hangs its commands into the namespace. The services outlive them.
/// @param completing the command line is one that only a shell's completion types: `cli complete`
using RegisterCli = void(boost::shared_ptr<Plexa::AutoCli::NamespaceNode> const &cli, CliServices &services,
                         bool completing);

} // namespace Tovicli

extern "C" PLEXA_EXPORT Tovicli::RegisterCli Tovicli_RegisterCli;
