// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "Activity.h"
#include "Environment.h"
#include "plexa/AutoCli.h"

namespace Tovicli {

/// The last failure that the platform's libraries noted.
struct LastFailure {
    int32_t code = 0;
    std::string sentence;
    std::string requestId;
};

/// A request to the daemon that is over.
struct RequestDone {
    std::string method;
    std::string requestId;
    std::string socketPath;
    uint64_t sentBytes = 0;
    uint64_t receivedBytes = 0;
    uint32_t replies = 0;
    int32_t code = 0; ///< 0: answered
    std::chrono::microseconds took{0};
};

/// A plug-in that was used.
struct RegisteredPlugin {
    std::string name;
    std::chrono::microseconds loading{0}; ///< 0 when it was loaded before
    std::chrono::microseconds registering{0};
};

/// What came of hanging the plug-ins' subtrees into a tree.
struct Registration {
    /// A line for each plug-in, or the whole directory, that was skipped or failed, with the reason.
    std::vector<std::string> troubles;
    /// A plug-in found no daemon. TOVI_OFFLINE is now set, and the plug-in was registered again under it.
    bool daemonMissing = false;
    /// Why, where the platform told.
    std::optional<LastFailure> daemonFailure;
    std::vector<RegisteredPlugin> plugins;
};

/// Where subtrees come from: a directory of plug-ins, or a test.
class PluginSource {
public:
    virtual ~PluginSource() = default;
    /// Calls every plug-in's entry point with this root, loading the directory's plug-ins first where that was not done
    /// yet. May be called again with another root. Never throws for what a plug-in does.
    virtual Registration registerInto(boost::shared_ptr<Plexa::AutoCli::Namespace> &root, std::string const &directory,
                                      Environment &environment) = 0;
    /// None when there was none since the last clear, or when the platform keeps none.
    virtual std::optional<LastFailure> lastFailure() = 0;
    virtual void clearLastFailure() = 0;

    // What a platform may tell beside that; none of it need be there.

    /// Forgets what was counted. @return who counts from now on, null for nobody
    virtual ProgressFunction startProgress() {
        return nullptr;
    }
    /// Each request from now on; an empty function ends it. The receiver must not throw.
    virtual void traceRequests(std::function<void(RequestDone const &)> receiver) {
        static_cast<void>(receiver);
    }
};

} // namespace Tovicli
