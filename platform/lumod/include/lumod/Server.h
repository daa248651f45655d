// SPDX-License-Identifier: Apache-2.0
//
// The daemon's sockets. Accepts whom the admission admits, serves each connection by itself, and ends in an orderly
// way: nothing new, five seconds at most for what is under way.
#pragma once

#include <memory>

#include <kj/async-io.h>

#include "lumod/Admission.h"
#include "lumod/Daemon.h"
#include "wire/UniqueFd.h"

namespace Lumod {

class Server {
public:
    /// @param io of the thread's event loop; it and the daemon outlive the server
    Server(Daemon &daemon, kj::AsyncIoContext &io, Admission admission);
    ~Server();
    Server(Server const &) = delete;
    Server &operator=(Server const &) = delete;

    /// Serves a socket that is bound and listens.
    /// @param ordered whether changes of volumes that come over it wait for their turn
    void listen(Wire::UniqueFd socket, bool ordered);

    /// Takes no more connections or requests; resolves when the requests under way have been answered, or given up.
    kj::Promise<void> stop();

    std::size_t connections() const;

private:
    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

} // namespace Lumod
