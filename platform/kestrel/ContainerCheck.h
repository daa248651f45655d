// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "lumolib/Client.h"

namespace Kestrel {

/// Whether the daemon knows a container, for whoever mounts one, or very many in a row. The first few are asked about
/// one by one. Then all containers are asked for at once, and what the daemon told of the next ones in its order
/// answers for them, each once; so most mounts of a long row need no round trip. A container that this does not answer
/// for is asked about by itself: a refusal always is the daemon's own, of this moment.
class ContainerCheck {
public:
    explicit ContainerCheck(LumoClient::Client &client);

    /// @param containerId canonical
    /// @param arrayIds    every one must hold the container
    /// Throws as LumoClient::Client::findStorageContainer does.
    void require(std::string const &containerId, std::vector<std::string> const &arrayIds);

private:
    bool isAnswered(std::string const &containerId, std::vector<std::string> const &arrayIds);
    void askForMany(std::string const &first);

    LumoClient::Client &client_;
    /// What the daemon told about containers that have not been required since: the arrays that hold them, by id.
    std::unordered_map<std::string, std::vector<std::string>> told_;
    /// How many were asked about one by one since all were asked for.
    int singly_ = 0;
};

} // namespace Kestrel
