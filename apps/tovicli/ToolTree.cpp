// SPDX-License-Identifier: Apache-2.0
//
// The tree that a run works on: made afresh with every plug-in's subtree, or kept from the run before.
#include "Tool.h"

namespace Tovicli {

using namespace Plexa;

Tool::Root Tool::treeFor(Settings const &settings) {
    if (tree_ == Tree::Fresh || CliHost::isWanted(path_)) {
        return grow(settings);
    }
    // Plug-ins that found no daemon are asked again: there may be one by now.
    if (keptTree_ == nullptr || keptOffline_ || !settings.servesSamePlugins(keptFor_)) {
        keptTree_.reset(); // with the sessions that it holds
        keptTree_ = grow(settings);
        keptFor_ = settings;
        keptOffline_ = registration_.daemonMissing;
    } else {
        apply(settings);
        registration_ = Registration(); // whatever troubles there were have been told
    }
    return keptTree_;
}

Tool::Root Tool::grow(Settings const &settings) {
    apply(settings);
    if (!offlineByUser_) {
        context_.environment.unset("TOVI_OFFLINE");
    }
    Root root = AutoCli::Namespace::New();
    auto const storage = AutoCli::Namespace::New();
    storage->SetDescription("Storage commands.");
    root->RegisterNamespaceNode(storage, "storage");
    std::string const trouble = cli_.hangInto(root, settings, offlineByUser_, path_);
    if (CliHost::isWanted(path_)) {
        registration_ = Registration();
        if (!trouble.empty()) {
            registration_.troubles.push_back(trouble);
        }
        return root;
    }
    registration_ = context_.plugins.registerInto(root, settings.pluginDirectory, context_.environment);
    for (RegisteredPlugin const &plugin : registration_.plugins) {
        Trace::Event(trace_, "plugin")
            .text("name", plugin.name)
            .duration("loadMs", plugin.loading)
            .duration("registerMs", plugin.registering);
    }
    return root;
}

} // namespace Tovicli
