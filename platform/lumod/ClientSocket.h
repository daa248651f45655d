// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>

#include <kj/async-unix.h>
#include <kj/io.h>

namespace Lumod {

/// One client's socket. What the kernel gives or takes at once goes without a promise, so that a request that comes
/// whole and is answered at once costs the loop one event; only what has to be waited for is a promise.
///
/// Everything throws a kj::Exception of type DISCONNECTED when the peer has gone away in the middle.
class ClientSocket {
public:
    /// @param socket never waits; its descriptor is the only one of its connection
    ClientSocket(kj::UnixEventPort &port, kj::AutoCloseFd socket);

    /// Takes at most so many bytes of what has come. Descriptors that come with them are closed.
    /// @return how many; 0 when nothing is there, and when the peer has closed its end: see isOver()
    std::size_t receive(std::uint8_t *place, std::size_t bytes);
    /// Whether everything has been received that ever will be.
    bool isOver() const {
        return isOver_;
    }
    /// Only after receive() returned 0, in the same turn of the loop: the loop tells changes, not states.
    kj::Promise<void> readable();

    /// @return how many bytes the kernel took
    std::size_t send(kj::ArrayPtr<kj::byte const> bytes);
    /// Sends all of it. The caller keeps the bytes until then.
    kj::Promise<void> sendAll(kj::ArrayPtr<kj::byte const> bytes);

    /// When nobody can receive any more what is sent. Waited for by one at a time, and not while sendAll() is.
    kj::Promise<void> disconnected();

private:
    kj::Promise<void> writable();

    kj::UnixEventPort &port_;
    kj::AutoCloseFd socket_;
    bool isOver_ = false;
    bool observesWriting_ = false;
    kj::Own<kj::UnixEventPort::FdObserver> observer_; ///< before the socket that it observes
};

} // namespace Lumod
