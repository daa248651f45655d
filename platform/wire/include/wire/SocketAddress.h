// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include <sys/socket.h>
#include <sys/un.h>

#include "wire/UniqueFd.h"

namespace Wire {

/// The address of a Unix socket, for bind and connect. A path that is too long for the kernel's 107 bytes is reached
/// through a descriptor of its directory, which lives as long as this object: keep it until the call has returned.
class SocketAddress {
public:
    /// @throw Failure FileMissing or IoError when the directory of a long path cannot be opened, InvalidArgument when
    ///        the name alone is too long
    explicit SocketAddress(std::string const &path);

    sockaddr const *get() const;
    socklen_t size() const;

private:
    sockaddr_un address_{};
    UniqueFd directory_;
};

} // namespace Wire
