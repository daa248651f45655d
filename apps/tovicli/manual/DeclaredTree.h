// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "PlatformLibraries.h"
#include "plexa/AutoCli.h"

namespace Tovicli::Manual {

/// Where what declares commands lies.
struct Libraries {
    std::string directory; ///< of the platform's libraries
    std::string plugin;    ///< file
    std::string cli;       ///< file of the namespace `cli`
};

/// The whole tree, declared and never executed: no daemon is asked, nothing on a host is read. Sets TOVI_OFFLINE.
class DeclaredTree {
public:
    /// @throws std::runtime_error when a library cannot be had
    explicit DeclaredTree(Libraries const &libraries);

    boost::shared_ptr<Plexa::AutoCli::Namespace> const &root() const {
        return root_;
    }
    /// Every command, in the order in which help lists them.
    std::vector<boost::shared_ptr<Plexa::AutoCli::Command>> commands() const;

private:
    PlatformLibraries platform_;
    boost::shared_ptr<Plexa::AutoCli::Namespace> root_;
};

} // namespace Tovicli::Manual
