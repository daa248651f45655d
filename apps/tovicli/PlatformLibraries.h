// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "PluginSource.h"

namespace Tovicli {

/// Which name of ours another version of a library is told from; null for a library that is not the platform's.
char const *ourVersionOf(std::string_view needed);

/// The platform's libraries that plug-ins are built against. Their names carry the version of the binary interface.
/// They are loaded before a plug-in that needs them, by path, so that the plug-in needs none; one that is already in
/// the process under that name, linked or preloaded, is taken instead.
class PlatformLibraries {
public:
    explicit PlatformLibraries(std::string directory);

    /// Sees to it that a plug-in's needs are met.
    /// @return why they cannot be; empty when they are
    std::string provide(std::vector<std::string> const &needed);

    /// What the client library of the daemon noted; a substitute for it may keep nothing.
    std::optional<LastFailure> lastFailure() const;
    void clearLastFailure() const;
    ProgressFunction startProgress() const;
    void traceRequests(std::function<void(RequestDone const &)> receiver);

private:
    std::string load(std::string const &name);
    void *functionOf(char const *name) const;

    std::string directory_;
    std::map<std::string, void *> loaded_;
    std::function<void(RequestDone const &)> receiver_;
};

} // namespace Tovicli
