// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>
#include <sys/types.h>
#include <vector>

#include "PlatformLibraries.h"
#include "PluginDirectory.h"
#include "PluginSource.h"

namespace Tovicli {

/// Loads the plug-ins of a directory into this process and calls their entry points. What is loaded stays loaded: the
/// tree holds objects whose code is there.
class PluginLoader : public PluginSource {
public:
    /// @param libraryDirectory where the platform's libraries lie
    /// @param user             who may own plug-ins besides root
    PluginLoader(std::string libraryDirectory, uid_t user);

    Registration registerInto(boost::shared_ptr<Plexa::AutoCli::Namespace> &root, std::string const &directory,
                              Environment &environment) override;
    std::optional<LastFailure> lastFailure() override;
    void clearLastFailure() override;
    ProgressFunction startProgress() override;
    void traceRequests(std::function<void(RequestDone const &)> receiver) override;

private:
    using EntryPoint = void (*)(boost::shared_ptr<Plexa::AutoCli::Namespace> &root);

    struct Plugin {
        std::string name;
        EntryPoint entry = nullptr;
        std::chrono::microseconds loading{0}; ///< 0 once it has been told
    };
    struct Directory {
        std::vector<Plugin> plugins;
        std::vector<std::string> troubles;
    };

    Directory &load(std::string const &path);
    /// @return why the file is not used; empty when its entry point is at hand
    std::string loadPlugin(PluginFile &file, EntryPoint &entry);
    void registerPlugin(Plugin &plugin, boost::shared_ptr<Plexa::AutoCli::Namespace> &root, Environment &environment,
                        Registration &registration);

    PlatformLibraries platform_;
    uid_t user_;
    std::map<std::string, Directory> directories_;
};

} // namespace Tovicli
