// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>

#include "Directory.h"

namespace Kestrel {

/// The directories below a root in which mounts appear. Opened, and made, at the first use and then kept.
class Places {
public:
    explicit Places(std::string root);

    /// volumes/, one directory a mounted container.
    Directory const &volumes();
    /// lumos/, one directory a config volume that is put away; nobody else's business.
    Directory const &lumos();
    /// volumes/<container>; made anew when it is missing, because the store's record counts.
    Directory container(std::string const &name);
    /// The name of the container whose directory a path is, or is in; nothing when it lies elsewhere. The path need not
    /// exist; a relative one starts at the working directory.
    std::optional<std::string> containerOf(std::string const &path) const;

private:
    Directory const &root();

    std::string path_;
    Directory root_;
    Directory volumes_;
    Directory lumos_;
};

} // namespace Kestrel
